#pragma once
// An XML document of components and their properties: one comp element an item, with its
// object handle, and one prop element a visible column.
#include "CCExportWriter.h"

class CCXmlWriter : public CCExportWriter {
public:
    using CCExportWriter::CCExportWriter;
    bool Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                 const QString& arquivo) override;
    std::string Conteudo(const VetorItens& itens, const std::vector<CEPropExport>& colunas) const;
    // Quote first, then the ampersand: a quote in the data comes out as "&amp;quot;", which
    // is what readers of these files have always got.
    static QString EscapaXml(const QString& texto);
    // The item's object handle: its first drawing object, else its HANDLE field.
    static QString Handle(const CEItemLista& item);
};
