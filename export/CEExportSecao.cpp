#include "CEExportSecao.h"

#include <QStringList>

CEExportSecao::CEExportSecao(QString nome) : Nome(std::move(nome)) {
    for (const auto& [chave, valor] : OpcoesPadrao())
        Opcoes.definir(chave, valor);
}

const std::vector<std::pair<QString, QString>>& CEExportSecao::OpcoesPadrao() {
    static const std::vector<std::pair<QString, QString>> padrao = {
        {"CSV_CABECALHO_SN", "S"},
        {"CSV_DELIM_CAMPO", ";"},
        {"CSV_DELIM_TEXTO", "\""},
        // An older spreadsheet format left these three; no writer reads them.
        {"XLS_CABECALHO_SN", "S"},
        {"XLS_TEMPLATE", ""},
        {"XLS_LINHA_INI_INT", ""},
        {"XLSX_CABECALHO_SN", "S"},
        {"XLSX_TEMPLATE", ""},
        {"XLSX_LINHA_INI_INT", ""},
        {"XML_VAZIAS_SN", "N"},
        {"XML_PROMPT_SN", "S"},
        {"HTML_CABECALHO_SN", "S"},
        {"HTML_CABE_NEG_SN", "S"},
        {"HTML_LARG_TABELA", "1"},
        {"PDF_SMART_SN", "S"},
        {"PDF_PAPER_SIZE_PZ", "ISO A4 (210 x 297 mm)"},
        {"PDF_ORIENTATION_LP", "L"},
        {"PDF_TABELA_ESTILO", ""},
        {"PDF_WATERMARK", ""},
        {"PDF_DPI", "300"},
        {"PDF_PESOLINHA_SN", "S"},
        {"DWG_SEPARADOR", "_"},
        {"DWG_NUMERO_DIGITOS", "3"},
        {"FLT_NOME_ORDENAR_POR", ""},
        {"FLT_TIPO_ORDEM", "C"},
    };
    return padrao;
}

const QStringList& CEExportSecao::NomesTipos() {
    static const QStringList nomes = {"BORNES",  "FIOS",  "COMPS", "FIOSECOMPS",
                                      "PAGINAS", "CABOS", "TUDO",  "ANILHAS"};
    return nomes;
}
