#include "CEAtualizacaoCatalogo.h"

#include "CEConexaoCatalogo.h"
#include "cad/CICad.h"
#include "settings/CIRegistro.h"

namespace {

struct ColunaIdioma {
    const char* tabela;
    const char* coluna;
};
const ColunaIdioma kColunasIdioma[] = {
    {"BDMENUS", "MENU_KEY_LANG"}, {"BDWENUS", "WENU_KEY_LANG"}, {"BDCENU", "CENU_KEY_LANG"}};

struct ColunaOrdem {
    const char* tabela;
    const char* coluna;
};
const ColunaOrdem kColunasOrdem[] = {{"BDDIC", "DIC_ORDEM"},    {"BDWDIC", "WDIC_ORDEM"},
                                     {"BDCDIC", "CDIC_ORDEM"},  {"BDTAGS", "TAG_ORDER"},
                                     {"BDSEGM", "SEG_ORDER"},   {"BDEQUIP", "EQU_ORDER"},
                                     {"BDNUMBORN", "BOR_ORDER"}};

// "create table NAME (COLUMN TYPE, ...)" from name-type pairs; "%T(n)" is a text column.
QString CriaTabela(const CEDialetoCatalogo& d, const QString& tabela,
                   const QList<QPair<QString, QString>>& colunas) {
    QStringList partes;
    for (const auto& [nome, tipo] : colunas) {
        QString texto = tipo;
        if (tipo.startsWith("T")) texto = d.Texto(tipo.mid(1).toInt());
        if (tipo == "BIT") texto = d.Logico();
        partes << nome + " " + texto;
    }
    return "create table " + tabela + " (" + partes.join(", ") + ")";
}

// The rows of a new page-group table: one model of diagram pages and its group, in the
// three catalogue languages.
QStringList PaginasIniciais() {
    return {
        "insert into BDPAGE (ERASED, PAGE_KEY, PAGE_TYPE, NAME, DESC_ATT, REF_SEQ, COL_LABEL, "
        "COL_INT, ROW_LABEL, ROW_INT) values (0, 1, 1, 'A3', 'TITULO', 0, '1;2;3;4;5;6;7;8', "
        "'50', 'A;B;C;D;E;F', '45')",
        "insert into BDPAGEBLOCKS (PAGE_KEY, BLOCK, PATH) values (1, 1, 'FORMATO_A3')",
        "insert into BDGROUP (ERASED, GROUP_KEY, LANG, NAME, SHORT_NAME, NUM_ORDER, AUTO_NUM, "
        "HIDDEN, PAGE, PAGECOVER, PAGEINDEX, TOTAL_TARGET) values "
        "(0, 1, 1, 'Esquemas', 'ESQ', 1, 1, 0, 1, 0, 0, 0), "
        "(0, 1, 2, 'Diagrams', 'DIA', 1, 1, 0, 1, 0, 0, 0), "
        "(0, 1, 3, 'Esquemas', 'ESQ', 1, 1, 0, 1, 0, 0, 0)"};
}

}  // namespace

CEAtualizacaoCatalogo::CEAtualizacaoCatalogo(CEConexaoCatalogo& conexao) : conexao_(conexao) {}

bool CEAtualizacaoCatalogo::Atualizavel() {
    const CEConexaoCatalogo::Conteudo conteudo = conexao_.Examinar();
    return conteudo == CEConexaoCatalogo::Vazio || conteudo == CEConexaoCatalogo::Catalogo;
}

QStringList CEAtualizacaoCatalogo::Executar() {
    QStringList feitas;
    // Tables are made only in a catalogue, or in an empty database: never inside someone
    // else's data, nor in a file that is no database.
    if (!Atualizavel()) {
        if (conexao_.Conectado())
            CICad::Log("Catalogue upgrades skipped: " + conexao_.TextoConexao() +
                       " is no catalogue");
        return feitas;
    }
    for (const Alteracao& alteracao : Alteracoes(conexao_.Dialeto())) {
        if (!alteracao.necessaria()) continue;
        const bool ok = alteracao.aplicar();
        const QString linha = QString("%1: %2").arg(alteracao.passo).arg(alteracao.descricao);
        CICad::Log("Catalogue upgrade " + linha + (ok ? "" : " failed"));
        feitas << linha + (ok ? "" : " (failed)");
    }
    return feitas;
}

QStringList CEAtualizacaoCatalogo::Pendentes() {
    QStringList pendentes;
    if (!Atualizavel()) return pendentes;
    for (const Alteracao& alteracao : Alteracoes(conexao_.Dialeto()))
        if (alteracao.necessaria())
            pendentes << QString("%1: %2").arg(alteracao.passo).arg(alteracao.descricao);
    return pendentes;
}

std::vector<CEAtualizacaoCatalogo::Alteracao> CEAtualizacaoCatalogo::Alteracoes(
    const CEDialetoCatalogo& d) {
    std::vector<Alteracao> lista;
    Estrutura(lista, d);
    Colunas(lista, d);
    Paginas(lista, d);
    return lista;
}

// Steps 1 to 10: the tables and columns that came with newer component data.
void CEAtualizacaoCatalogo::Estrutura(std::vector<Alteracao>& lista, const CEDialetoCatalogo& d) {
    lista.push_back(Coluna(1, "BDVINCL", "VL_USAR_REP",
                           "ALTER TABLE BDVINCL ADD  VL_USAR_REP " + d.Texto(1) + " "));
    lista.push_back(Tabela(
        2, "BDTIPOCOMP", {CriaTabela(d, "BDTIPOCOMP", {{"COMP_KEY", "T6"}, {"TIPO_KEY", "T6"}})}));
    lista.push_back(Tabela(3, "BDEQUIP",
                           {CriaTabela(d, "BDEQUIP",
                                       {{"EQU_KEY", "T6"},
                                        {"EQU_DESCR", "T30"},
                                        {"EQU_PREFIX", "T10"},
                                        {"EQU_POSFIX", "T10"},
                                        {"EQU_DIGITS", "T1"},
                                        {"EQU_INC", "T5"}})}));
    lista.push_back(
        Coluna(4, "BDWIRE", "WIRE_SEG", "ALTER TABLE BDWIRE ADD WIRE_SEG " + d.Texto(6) + " "));
    lista.push_back(Tabela(
        5, "BDCENU",
        {"create table BDCENU (CENU_KEY CHAR(6), CENU_NIVEL CHAR(6), CENU_DESCR CHAR(80))"}));
    lista.push_back(Tabela(5, "BDCABO2",
                           {CriaTabela(d, "BDCABO2",
                                       {{"CABO_KEY", "T6"},
                                        {"CABO_NORMA", "T6"},
                                        {"CABO_TIPO", "T6"},
                                        {"CABO_TAG", "T6"},
                                        {"CABO_COR", "T6"},
                                        {"CABO_WIDTH", "T6"},
                                        {"CABO_BLOCO", "T40"},
                                        {"CABO_LTYPE", "T40"},
                                        {"CABO_LISTA", "T6"}})}));
    lista.push_back(Tabela(5, "BDCUSER", {CriaTabela(d, "BDCUSER", {{"CUSER_KEY", "T6"}})}));
    lista.push_back(Tabela(5, "BDCDIC",
                           {CriaTabela(d, "BDCDIC",
                                       {{"CDIC_KEY", "T6"},
                                        {"CDIC_FIELD", "T80"},
                                        {"CDIC_PROMPT", "T80"},
                                        {"CDIC_WIDTH", "T80"}})}));
    lista.push_back(Tabela(6, "BDPINOS",
                           {CriaTabela(d, "BDPINOS",
                                       {{"PINO_KEY", "T6"},
                                        {"PINO_CONECTOR", "T6"},
                                        {"PINO_PINO", "T6"},
                                        {"PINO_ID", "T100"}})}));
    lista.push_back(Tabela(
        7, "BDCONTRAPECAS",
        {CriaTabela(d, "BDCONTRAPECAS",
                    {{"CONTRA_KEY", "T6"}, {"CONTRA_CON_A", "T6"}, {"CONTRA_CON_B", "T6"}})}));
    lista.push_back(Idiomas(d));
    lista.push_back(
        Tabela(9, "BDREP", {CriaTabela(d, "BDREP", {{"REP_KEY", "T8"}, {"REP_DESCR", "T200"}})}));
    lista.push_back(Tabela(9, "BDBLOCOS",
                           {CriaTabela(d, "BDBLOCOS",
                                       {{"BLK_ZV_KEY", "T8"},
                                        {"BLK_NORMA", "T8"},
                                        {"BLK_REP_KEY", "T8"},
                                        {"BLK_BLOCO", "T200"}})}));
    lista.push_back(Tabela(
        10, "BDNUMBORN",
        {CriaTabela(d, "BDNUMBORN",
                    {{"BOR_KEY", "T6"},
                     {"BOR_DESCR", "T29"},
                     {"BOR_PREFIX", "T40"},
                     {"BOR_POSFIX", "T40"},
                     {"BOR_DIGITS", "T1"},
                     {"BOR_INC", "T5"}}),
         "insert into BDNUMBORN (BOR_KEY, BOR_DESCR, BOR_PREFIX, BOR_POSFIX, BOR_DIGITS, BOR_INC) "
         "values ('1', 'Sequencial', '', '', '1', '1')"}));
}

// Steps 11 to 17: order columns, widths, and the settings tables.
void CEAtualizacaoCatalogo::Colunas(std::vector<Alteracao>& lista, const CEDialetoCatalogo& d) {
    for (const ColunaOrdem& c : kColunasOrdem)
        lista.push_back(Coluna(11, c.tabela, c.coluna,
                               QString("ALTER TABLE %1 ADD %2 INTEGER").arg(c.tabela, c.coluna)));
    for (const char* coluna : {"ZV_DWG", "ZV_DWG_2D", "ZV_DWG_3D", "ZV_DWG_UN"})
        lista.push_back(Largura(12, "BDZV", coluna, 50, d));
    lista.push_back(Largura(13, "BDMENUS", "MENU_DESCR", 255, d));
    lista.push_back(Largura(14, "BDACCOUNTS", "AC_SENHA", 255, d));
    lista.push_back(
        Tabela(15, "BDSAPCFG",
               {CriaTabela(d, "BDSAPCFG",
                           {{"SAP_KEY", "T16"}, {"SAP_VAL", "T200"}, {"SAP_USER", "T200"}})}));
    lista.push_back(
        Coluna(15, "BDSAPCFG", "SAP_USER", "ALTER TABLE BDSAPCFG ADD SAP_USER " + d.Texto(200)));
    lista.push_back(
        Tabela(16, "BDCFG", {CriaTabela(d, "BDCFG", {{"CFGKEY", "T8"}, {"CFGVAL", "T200"}})}));
    lista.push_back(Tabela(17, "BDBARRAMENTO",
                           {CriaTabela(d, "BDBARRAMENTO",
                                       {{"BARRA_KEY", "T6"},
                                        {"ZV_KEY", "T8"},
                                        {"ZV_KEY_NOR", "T6"},
                                        {"BARRA_COR", "T6"},
                                        {"BARRA_WIDTH", "T8"},
                                        {"BARRA_LINETYPE", "T50"}})}));
}

// Steps 18 and 19: page groups and page models.
void CEAtualizacaoCatalogo::Paginas(std::vector<Alteracao>& lista, const CEDialetoCatalogo& d) {
    const QString grupo = CriaTabela(d, "BDGROUP",
                                     {{"ERASED", "BIT"},
                                      {"GROUP_KEY", "INTEGER"},
                                      {"LANG", "INTEGER"},
                                      {"NAME", "T200"},
                                      {"SHORT_NAME", "T200"},
                                      {"NUM_ORDER", "INTEGER"},
                                      {"AUTO_NUM", "BIT"},
                                      {"HIDDEN", "BIT"},
                                      {"PAGE", "INTEGER"},
                                      {"PAGECOVER", "INTEGER"},
                                      {"PAGEINDEX", "INTEGER"},
                                      {"TOTAL_TARGET", "INTEGER"}});
    const QString pagina = CriaTabela(d, "BDPAGE",
                                      {{"ERASED", "BIT"},
                                       {"PAGE_KEY", "INTEGER"},
                                       {"PAGE_TYPE", "INTEGER"},
                                       {"NAME", "T200"},
                                       {"DESC_ATT", "T200"},
                                       {"REF_SEQ", "BIT"},
                                       {"COL_LABEL", "T200"},
                                       {"COL_INT", "T200"},
                                       {"ROW_LABEL", "T200"},
                                       {"ROW_INT", "T200"}});
    const QString blocos = CriaTabela(
        d, "BDPAGEBLOCKS", {{"PAGE_KEY", "INTEGER"}, {"BLOCK", "INTEGER"}, {"PATH", "T200"}});
    const QStringList linhas = PaginasIniciais();
    lista.push_back(Tabela(18, "BDPAGE", {pagina, linhas[0]}));
    lista.push_back(Tabela(18, "BDPAGEBLOCKS", {blocos, linhas[1]}));
    lista.push_back(Tabela(18, "BDGROUP", {grupo, linhas[2]}));
    lista.push_back(Coluna(19, "BDGROUP", "NUM_INIT", "ALTER TABLE BDGROUP ADD NUM_INIT INTEGER"));
}

CEAtualizacaoCatalogo::Alteracao CEAtualizacaoCatalogo::Tabela(int passo, const QString& tabela,
                                                               const QStringList& instrucoes) {
    return {passo, "create table " + tabela,
            [this, tabela] { return !conexao_.ExisteTabela(tabela); },
            [this, instrucoes] { return ExecutarTodas(instrucoes); }};
}

CEAtualizacaoCatalogo::Alteracao CEAtualizacaoCatalogo::Coluna(int passo, const QString& tabela,
                                                               const QString& coluna,
                                                               const QString& instrucao) {
    return {passo, "add column " + tabela + "." + coluna,
            [this, tabela, coluna] {
                return conexao_.ExisteTabela(tabela) && !conexao_.ExisteColuna(tabela, coluna);
            },
            [this, instrucao] { return conexao_.Executar(instrucao); }};
}

CEAtualizacaoCatalogo::Alteracao CEAtualizacaoCatalogo::Largura(int passo, const QString& tabela,
                                                                const QString& coluna, int largura,
                                                                const CEDialetoCatalogo& d) {
    const QString instrucao = d.AlargarColuna(tabela, coluna, d.Texto(largura));
    return {passo, QString("widen %1.%2 to %3").arg(tabela, coluna).arg(largura),
            [this, tabela, coluna, largura, instrucao] {
                if (instrucao.isEmpty() || !conexao_.ExisteColuna(tabela, coluna)) return false;
                const int atual = conexao_.LarguraColuna(tabela, coluna);
                return atual > 0 && atual < largura;
            },
            [this, instrucao] { return conexao_.Executar(instrucao); }};
}

CEAtualizacaoCatalogo::Alteracao CEAtualizacaoCatalogo::Idiomas(const CEDialetoCatalogo& d) {
    auto faltando = [this](const ColunaIdioma& c) {
        return conexao_.ExisteTabela(c.tabela) && !conexao_.ExisteColuna(c.tabela, c.coluna);
    };
    auto necessaria = [faltando] {
        for (const ColunaIdioma& c : kColunasIdioma)
            if (faltando(c)) return true;
        return false;
    };
    const QString tipo = d.Texto(6);
    auto aplicar = [this, faltando, tipo] {
        // Rows without a language are taken to be in the catalogue's language in use.
        const QString idioma = IdiomaDoCatalogo();
        QString erro;
        if (!CIRegistro::GravarRegistro("libLang", idioma, &erro))
            CICad::Log("Catalogue language not saved: " + erro);
        bool ok = true;
        for (const ColunaIdioma& c : kColunasIdioma) {
            if (!faltando(c)) continue;
            ok = ExecutarTodas(
                     {QString("ALTER TABLE %1 ADD %2 %3").arg(c.tabela, c.coluna, tipo),
                      QString("UPDATE %1 SET %2 = '%3'").arg(c.tabela, c.coluna, idioma)}) &&
                 ok;
        }
        return ok;
    };
    return {8, "add the language columns MENU_KEY_LANG, WENU_KEY_LANG, CENU_KEY_LANG", necessaria,
            aplicar};
}

QString CEAtualizacaoCatalogo::IdiomaDoCatalogo() {
    const CERegistrosCatalogo linhas = conexao_.Consultar(
        "select LANG_KEY , LANG_DESCR from BDLANGUAGE where LANG_USE = '1' ORDER BY LANG_KEY");
    const QString idioma = linhas.Primeiro("LANG_KEY").trimmed();
    return idioma.isEmpty() ? QStringLiteral("1") : idioma;
}

bool CEAtualizacaoCatalogo::ExecutarTodas(const QStringList& instrucoes) {
    for (const QString& instrucao : instrucoes)
        if (!conexao_.Executar(instrucao)) return false;
    return true;
}
