#pragma once
// A workbook: a new one, or a copy of the user's template workbook whose first sheet is
// filled from a start row on; the template itself is never written.
#include "CCExportWriter.h"

class CCXlsxWriter : public CCExportWriter {
public:
    using CCExportWriter::CCExportWriter;
    bool Escreve(const VetorItens& itens, std::vector<CEPropExport> colunas,
                 const QString& arquivo) override;
    // The zero-based first row of `XLSX_LINHA_INI_INT` (counted from 1; 0, 1 and no number
    // are the first row).
    static int LinhaInicial(const QString& opcao);
};
