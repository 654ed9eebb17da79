#pragma once
// Delimited text: an optional header line, then one line an item; every field between text
// delimiters, fields between field separators, CR LF line ends, one byte a character.
#include "CCExportWriter.h"

class CCCsvWriter : public CCExportWriter {
public:
    using CCExportWriter::CCExportWriter;
    bool Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                 const QString& arquivo) override;
    // The bytes of the file.
    std::string Conteudo(const VetorItens& itens, const std::vector<CEPropExport>& colunas) const;
};
