#include "CEConsultasCatalogo.h"

#include "CEConexaoCatalogo.h"
#include "settings/CIRegistro.h"

#include <QChar>
#include <QRegularExpression>

#include <initializer_list>

const char* const CEConsultasCatalogo::kTabelaComp = "BDUSER";
const char* const CEConsultasCatalogo::kChaveComp = "USER_KEY";
const char* const CEConsultasCatalogo::kTabelaFio = "BDWUSER";
const char* const CEConsultasCatalogo::kChaveFio = "WUSER_KEY";
const char* const CEConsultasCatalogo::kTabelaCabo = "BDCUSER";
const char* const CEConsultasCatalogo::kChaveCabo = "CUSER_KEY";

namespace {

const QChar kSeparador(0x000C);

// Keys come from drawings, and drawings from anyone. A value goes into its statement as it
// is, between single quotes; one that could end the quotes (a quote, or a backslash, which
// some engines read as an escape) or cut the text short is never sent: its look-up answers
// empty, as a key that breaks its statement always has.
bool Colavel(const QString& valor) {
    for (const QChar c : valor)
        if (c == '\'' || c == '\\' || c.unicode() == 0) return false;
    return true;
}

bool Colaveis(std::initializer_list<QString> valores) {
    for (const QString& valor : valores)
        if (!Colavel(valor)) return false;
    return true;
}

// A value pasted without quotes must be a whole number.
bool Numero(const QString& valor) {
    static const QRegularExpression numero("^ *[+-]?[0-9]+ *$");
    return numero.match(valor).hasMatch();
}

// Table and column names pasted into a statement.
bool Nome(const QString& valor) {
    static const QRegularExpression nome("^[A-Za-z_][A-Za-z0-9_]*$");
    return nome.match(valor).hasMatch();
}

}  // namespace

CEConsultasCatalogo::CEConsultasCatalogo() : conexao_(*CEConexaoCatalogo::ObterCatalogo()) {}

CEConsultasCatalogo::CEConsultasCatalogo(CEConexaoCatalogo& conexao) : conexao_(conexao) {}

QString CEConsultasCatalogo::Idioma() {
    return CIRegistro::LibLang();
}

QString CEConsultasCatalogo::Primeiro(const QString& instrucao, const QString& coluna) const {
    return conexao_.Consultar(instrucao, true).Primeiro(coluna);
}

CERegistrosCatalogo CEConsultasCatalogo::Consultar(const QString& modelo,
                                                   const QStringList& valores) const {
    // The statement as text: each `?` becomes its value between single quotes.
    QString instrucao;
    instrucao.reserve(modelo.size() + 16 * valores.size());
    int proximo = 0;
    for (const QChar c : modelo) {
        if (c == '?' && proximo < valores.size())
            instrucao += '\'' + valores[proximo++] + '\'';
        else
            instrucao += c;
    }
    return conexao_.ConsultarValores(modelo, valores, instrucao);
}

QString CEConsultasCatalogo::Primeiro(const QString& modelo, const QStringList& valores,
                                      const QString& coluna) const {
    return Consultar(modelo, valores).Primeiro(coluna);
}

QString CEConsultasCatalogo::DescricaoComp(const QString& chave) const {
    if (!Colaveis({chave, Idioma()})) return {};
    return Primeiro(
        "select rtrim(MENU_DESCR) as MENU_DESCR from BDMENUS where MENU_KEY = ? AND "
        "MENU_KEY_LANG = ?",
        {chave, Idioma()}, "MENU_DESCR");
}

QString CEConsultasCatalogo::DescricaoFio(const QString& chave) const {
    if (!Colaveis({chave, Idioma()})) return {};
    return Primeiro(
        "select rtrim(WENU_DESCR) as WENU_DESCR from BDWENUS where WENU_KEY = ? AND "
        "WENU_KEY_LANG = ?",
        {chave, Idioma()}, "WENU_DESCR");
}

QString CEConsultasCatalogo::DescricaoCabo(const QString& chave) const {
    if (!Colaveis({chave, Idioma()})) return {};
    return Primeiro(
        "select rtrim(CENU_DESCR) as CENU_DESCR from BDCENU where CENU_KEY = ? AND "
        "CENU_KEY_LANG = ?",
        {chave, Idioma()}, "CENU_DESCR");
}

QString CEConsultasCatalogo::ListaComp(const QString& chave, const QString& norma) const {
    if (!Colaveis({chave, norma})) return {};
    // The tab after "and" is part of the statement as it has always been sent.
    return Primeiro("select ZV_LISTA from BDZV where ZV_KEY=? and\tZV_KEY_NOR =?", {chave, norma},
                    "ZV_LISTA");
}

QString CEConsultasCatalogo::ListaFio(const QString& chave, const QString& norma) const {
    if (!Colaveis({chave, norma})) return {};
    return Primeiro("select WIRE_LISTA from BDWIRE where WIRE_KEY=? and WIRE_NORMA =?",
                    {chave, norma}, "WIRE_LISTA");
}

QString CEConsultasCatalogo::ListaCabo(const QString& chave, const QString& norma) const {
    if (!Colaveis({chave, norma})) return {};
    return Primeiro("select CABO_LISTA from BDCABO2 where CABO_KEY=? and CABO_NORMA =?",
                    {chave, norma}, "CABO_LISTA");
}

QStringList CEConsultasCatalogo::ColunasUsuario(const QString& tabela, const QString& colunaChave,
                                                const QString& chave) const {
    if (!(Nome(tabela) && Nome(colunaChave) && Colavel(chave))) return {};
    // Sent as text each time: a compiled "*" would keep the columns of its compiling when
    // another program changes the table.
    const CERegistrosCatalogo linhas = conexao_.Consultar(
        "SELECT * FROM " + tabela + " WHERE " + colunaChave + " = '" + chave + "'", true);
    QStringList colunas;
    if (linhas.Vazio()) return colunas;
    for (int i = 0; i < linhas.Colunas(); ++i)
        colunas << linhas.NomesColunas()[i] + kSeparador + linhas.Valor(0, i);
    return colunas;
}

QStringList CEConsultasCatalogo::ColunasComp(const QString& chave) const {
    return ColunasUsuario(kTabelaComp, kChaveComp, chave);
}

QStringList CEConsultasCatalogo::ColunasFio(const QString& chave) const {
    return ColunasUsuario(kTabelaFio, kChaveFio, chave);
}

QStringList CEConsultasCatalogo::ColunasCabo(const QString& chave) const {
    return ColunasUsuario(kTabelaCabo, kChaveCabo, chave);
}

QString CEConsultasCatalogo::MaterialSap(const QString& chave) const {
    if (!Colavel(chave)) return {};
    return Primeiro("select MATSAP_MAT from BDMATSAP where MATSAP_TIPO = 'C' AND MATSAP_ZVKEY = ?",
                    {chave}, "MATSAP_MAT");
}

QStringList CEConsultasCatalogo::AcessoriosDe(const QString& chave) const {
    if (!Colavel(chave)) return {};
    const CERegistrosCatalogo linhas =
        Consultar("select VL_KEY_B, VL_QTDE from BDVINCL where VL_KEY_A = ?", {chave});
    QStringList acessorios;
    for (int i = 0; i < linhas.Linhas(); ++i)
        acessorios << linhas.Valor(i, "VL_KEY_B") + "#" + linhas.Valor(i, "VL_QTDE");
    return acessorios;
}

QString CEConsultasCatalogo::TipoComp(const QString& chave) const {
    if (!Colavel(chave)) return {};
    return Primeiro(" select TIPO_KEY from BDTIPOCOMP where COMP_KEY=?", {chave}, "TIPO_KEY");
}

QString CEConsultasCatalogo::BlocoRepresentacao(const QString& chave, const QString& norma,
                                                const QString& representacao) const {
    if (!Colaveis({chave, norma, representacao})) return {};
    return Primeiro(
        "select BLK_BLOCO from BDBLOCOS where BLK_ZV_KEY=? and BLK_NORMA=? and "
        "BLK_REP_KEY=?",
        {chave, norma, representacao}, "BLK_BLOCO");
}

QString CEConsultasCatalogo::GrupoNome(const QString& grupo, const QString& idioma) const {
    if (!(Numero(grupo) && Numero(idioma))) return {};
    return Primeiro("select NAME from BDGROUP where GROUP_KEY=" + grupo + " and LANG=" + idioma,
                    "NAME");
}

QString CEConsultasCatalogo::GrupoDescricao(const QString& grupo, const QString& idioma) const {
    if (!(Numero(grupo) && Numero(idioma))) return {};
    return Primeiro("select DESC_ATT from BDPAGE, BDGROUP where PAGE_KEY=PAGE and GROUP_KEY=" +
                        grupo + " and LANG=" + idioma,
                    "DESC_ATT");
}

QString CEConsultasCatalogo::GrupoSequencial(const QString& grupo, const QString& idioma) const {
    if (!(Numero(grupo) && Numero(idioma))) return {};
    return Primeiro("select REF_SEQ from BDPAGE, BDGROUP where PAGE_KEY=PAGE and GROUP_KEY=" +
                        grupo + " and LANG=" + idioma,
                    "REF_SEQ");
}

QString CEConsultasCatalogo::PromptCampo(const QString& campo, bool fio) const {
    if (!Colavel(campo)) return campo;
    const QString prompt =
        fio ? Primeiro("SELECT WDIC_PROMP FROM BDWDIC WHERE WDIC_FIELD='" + campo + "'",
                       "WDIC_PROMP")
            : Primeiro("SELECT DIC_PROMPT FROM BDDIC WHERE DIC_FIELD='" + campo + "'",
                       "DIC_PROMPT");
    return prompt.trimmed().isEmpty() ? campo : prompt.trimmed();
}
