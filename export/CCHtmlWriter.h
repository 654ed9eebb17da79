#pragma once
// A plain HTML table: an optional header row (bold cells when asked), one row an item.
// One byte a character, CR LF line ends, as the other text exports.
#include "CCExportWriter.h"

class CCHtmlWriter : public CCExportWriter {
public:
    using CCExportWriter::CCExportWriter;
    bool Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                 const QString& arquivo) override;
    std::string Conteudo(const VetorItens& itens, const std::vector<CEPropExport>& colunas) const;
    // Escapes markup characters, and accented capitals that went through UTF-8 twice.
    static QString EscapaHtml(const QString& texto);
};
