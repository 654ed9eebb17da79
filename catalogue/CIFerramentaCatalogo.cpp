#include "CIFerramentaCatalogo.h"

#include "CEAtualizacaoCatalogo.h"
#include "CECacheCatalogo.h"
#include "CEConexaoCatalogo.h"
#include "CEScriptSql.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QtSql/QSqlDatabase>
#include <QtSql/QSqlError>
#include <QtSql/QSqlQuery>

#include <cstdio>
#include <functional>
#include <map>

namespace {

struct Operacao {
    const char* argumentos;
    std::function<QStringList(CECacheCatalogo&, const QStringList&)> rodar;
    // The message that stands for a missing description; 0 for the other look-ups.
    int mensagem = 0;
};

// Look-ups by name, with what the readers' cache gives (fallback messages included).
const std::map<QString, Operacao>& TabelaOperacoes() {
    using C = CECacheCatalogo;
    using L = const QStringList&;
    static const std::map<QString, Operacao> tabela = {
        {"DescricaoComp",
         {"KEY", [](C& c, L a) { return QStringList{c.DescricaoComp(a[0])}; },
          C::kMsgSemDescricaoComp}},
        {"DescricaoFio",
         {"KEY", [](C& c, L a) { return QStringList{c.DescricaoFio(a[0])}; },
          C::kMsgSemDescricaoFio}},
        {"DescricaoCabo",
         {"KEY", [](C& c, L a) { return QStringList{c.DescricaoCabo(a[0])}; },
          C::kMsgSemDescricaoCabo}},
        {"ListaComp",
         {"KEY STANDARD", [](C& c, L a) { return QStringList{c.ListaComp(a[0], a[1])}; }}},
        {"ListaFio",
         {"KEY STANDARD", [](C& c, L a) { return QStringList{c.ListaFio(a[0], a[1])}; }}},
        {"ListaCabo",
         {"KEY STANDARD", [](C& c, L a) { return QStringList{c.ListaCabo(a[0], a[1])}; }}},
        {"ColunasUsuario",
         {"TABLE KEYCOLUMN KEY",
          [](C& c, L a) { return c.Consultas().ColunasUsuario(a[0], a[1], a[2]); }}},
        {"ColunasComp", {"KEY", [](C& c, L a) { return c.ColunasComp(a[0]); }}},
        {"ColunasFio", {"KEY", [](C& c, L a) { return c.ColunasFio(a[0]); }}},
        {"ColunasCabo", {"KEY", [](C& c, L a) { return c.ColunasCabo(a[0]); }}},
        {"MaterialSap", {"KEY", [](C& c, L a) { return QStringList{c.MaterialSap(a[0])}; }}},
        {"AcessoriosDe", {"KEY", [](C& c, L a) { return c.AcessoriosDe(a[0]); }}},
        {"TipoComp", {"KEY", [](C& c, L a) { return QStringList{c.TipoComp(a[0])}; }}},
        {"BlocoRepresentacao",
         {"KEY STANDARD REPRESENTATION",
          [](C& c, L a) { return QStringList{c.BlocoRepresentacao(a[0], a[1], a[2])}; }}},
        {"GrupoNome",
         {"GROUP LANGUAGE",
          [](C& c, L a) { return QStringList{c.Consultas().GrupoNome(a[0], a[1])}; }}},
        {"GrupoDescricao",
         {"GROUP LANGUAGE",
          [](C& c, L a) { return QStringList{c.Consultas().GrupoDescricao(a[0], a[1])}; }}},
        {"GrupoSequencial",
         {"GROUP LANGUAGE",
          [](C& c, L a) { return QStringList{c.Consultas().GrupoSequencial(a[0], a[1])}; }}},
        {"PromptCampo",
         {"FIELD", [](C& c, L a) { return QStringList{c.Consultas().PromptCampo(a[0], false)}; }}},
        {"PromptCampoFio",
         {"FIELD", [](C& c, L a) { return QStringList{c.Consultas().PromptCampo(a[0], true)}; }}},
    };
    return tabela;
}

const QStringList kChavesConfiguracao = {"Database", "NetworkZV", "DBName", "DBUser",
                                         "DBPass",   "DBServer",  "libLang"};

// Runs a script on a new SQLite file; the error text, empty on success.
QString RodaScript(const QString& arquivo, const QStringList& instrucoes) {
    const QString nome = "zvcatalogo-construcao";
    QString erro;
    {
        QSqlDatabase banco = QSqlDatabase::addDatabase("QSQLITE", nome);
        banco.setDatabaseName(arquivo);
        if (!banco.open()) erro = banco.lastError().text();
        QSqlQuery consulta(banco);
        if (erro.isEmpty()) banco.transaction();
        for (const QString& instrucao : instrucoes) {
            if (!erro.isEmpty()) break;
            if (!consulta.exec(instrucao))
                erro = consulta.lastError().databaseText() + "\n  in: " + instrucao.left(200);
        }
        if (erro.isEmpty() && !banco.commit()) erro = banco.lastError().text();
        consulta.finish();
        banco.close();
    }
    QSqlDatabase::removeDatabase(nome);
    return erro;
}

}  // namespace

CIFerramentaCatalogo::CIFerramentaCatalogo(Escrita escrita, void* contexto)
    : escrita_(escrita), contexto_(contexto) {}

void CIFerramentaCatalogo::Saida(const QString& linha) {
    if (escrita_) escrita_(contexto_, 1, (linha + "\n").toUtf8().constData());
}

void CIFerramentaCatalogo::Erro(const QString& linha) {
    if (escrita_)
        escrita_(contexto_, 2, ("zvhost catalogue: " + linha + "\n").toUtf8().constData());
}

QString CIFerramentaCatalogo::Uso() {
    return "usage: zvhost catalogue --check\n"
           "       zvhost catalogue --sql STATEMENT\n"
           "       zvhost catalogue --lookup OPERATION ARG...\n"
           "       zvhost catalogue --build FILE.db SCRIPT.sql...\n"
           "       zvhost catalogue --set KEY=VALUE...\n"
           "\n"
           "--check   the engine the settings name, whether it opens, the schema version and\n"
           "          the upgrades a failing statement would run\n"
           "--sql     runs one statement on the catalogue and prints its rows, tab-separated\n"
           "--lookup  runs one look-up as the lists do (upgrades and fallback texts included)\n"
           "--build   makes an SQLite catalogue from SQL scripts (the file is replaced only\n"
           "          when every statement ran)\n"
           "--set     writes catalogue settings: " +
           kChavesConfiguracao.join(", ") +
           "\n\n"
           "operations:\n  " +
           Operacoes().join("\n  ") + "\n";
}

QStringList CIFerramentaCatalogo::Operacoes() {
    QStringList nomes;
    for (const auto& [nome, operacao] : TabelaOperacoes())
        nomes << nome + " " + operacao.argumentos;
    return nomes;
}

int CIFerramentaCatalogo::Executar(const QStringList& argumentos) {
    const QString opcao = argumentos.value(0);
    const QStringList resto = argumentos.mid(1);
    if (opcao == "--check" && resto.isEmpty()) return Verificar();
    if (opcao == "--sql" && resto.size() == 1) return Sql(resto[0]);
    if (opcao == "--lookup" && !resto.isEmpty()) return Consulta(resto);
    if (opcao == "--build" && resto.size() >= 2) return Construir(resto);
    if (opcao == "--set" && !resto.isEmpty()) return Configurar(resto);
    if (escrita_) escrita_(contexto_, 2, Uso().toUtf8().constData());
    return 2;
}

int CIFerramentaCatalogo::Verificar() {
    const CEDialetoCatalogo configurado = CEDialetoCatalogo::DaConfiguracao();
    const QString palavra = CIRegistro::Database();
    Saida("settings: " + CIRegistro::ArquivoRegistro());
    const QString problema = CIRegistro::ProblemaArquivo();
    if (!problema.isEmpty()) Erro(problema);
    if (configurado.motor() == CEDialetoCatalogo::Nenhum) {
        Saida("engine: none (Database is \"" + palavra + "\")");
        Erro("no catalogue is configured: set Database to SQLITE, MDB, SQLSERVER, LOCALDB or ODBC");
        return 1;
    }
    Saida("engine: " + palavra);
    const CEDialetoCatalogo::Ligacao ligacao = configurado.LigacaoDaConfiguracao();
    Saida("connection: " + CEDialetoCatalogo::TextoSemSenha(ligacao.texto));
    CEConexaoCatalogo* conexao = CEConexaoCatalogo::ObterCatalogo();
    // It opens when a statement ran on it: an SQLite file opens whatever it holds.
    const CEConexaoCatalogo::Conteudo conteudo = conexao->Examinar();
    if (conteudo == CEConexaoCatalogo::SemConexao || conteudo == CEConexaoCatalogo::Ilegivel) {
        Saida("opens: no");
        if (!ligacao.arquivo.isEmpty() && !QFileInfo(ligacao.arquivo).isFile())
            Erro("the catalogue file does not exist: " + ligacao.arquivo);
        else if (conteudo == CEConexaoCatalogo::Ilegivel)
            Erro("no statement runs on the catalogue: " + conexao->UltimoErro());
        return 1;
    }
    Saida("opens: yes");
    Saida("SQL family: " + conexao->Dialeto().NomeFamilia());
    const CERegistrosCatalogo versao = conexao->Consultar("select VERSAO from BDVERSAO");
    Saida("schema version: " + (versao.Executada() ? versao.Primeiro("VERSAO").trimmed()
                                                   : QString("unknown (no BDVERSAO)")));
    Saida("catalogue language (libLang): " + CIRegistro::LibLang());
    if (conteudo == CEConexaoCatalogo::Outro) {
        Saida("upgrades to run: none (not a catalogue)");
        Erro("this database is not a ZVListas catalogue: it has none of the tables " +
             CEConexaoCatalogo::TabelasDoCatalogo().join(", ") + "; no upgrade will change it");
        return 1;
    }
    if (conteudo == CEConexaoCatalogo::Vazio) Saida("tables: none (an empty database)");
    const QStringList pendentes = CEAtualizacaoCatalogo(*conexao).Pendentes();
    Saida("upgrades to run: " + (pendentes.isEmpty() ? QString("none") : QString()));
    for (const QString& pendente : pendentes)
        Saida("  " + pendente);
    return 0;
}

int CIFerramentaCatalogo::Sql(const QString& instrucao) {
    CEConexaoCatalogo* conexao = CEConexaoCatalogo::ObterCatalogo();
    if (!conexao->Conectar()) {
        Erro("no catalogue opens; see zvhost catalogue --check");
        return 1;
    }
    const CERegistrosCatalogo linhas = conexao->Consultar(instrucao, false, true);
    if (!linhas.Executada()) return 1;
    if (linhas.Colunas() == 0) {
        Saida("statement ran");
        return 0;
    }
    Saida(linhas.NomesColunas().join('\t'));
    for (int i = 0; i < linhas.Linhas(); ++i) {
        QStringList valores;
        for (int j = 0; j < linhas.Colunas(); ++j)
            valores << linhas.Valor(i, j);
        Saida(valores.join('\t'));
    }
    Erro(QString("%1 row(s)").arg(linhas.Linhas()));
    return 0;
}

int CIFerramentaCatalogo::Consulta(const QStringList& argumentos) {
    const auto& tabela = TabelaOperacoes();
    const auto it = tabela.find(argumentos[0]);
    if (it == tabela.end()) {
        Erro("unknown look-up " + argumentos[0] + "; one of:\n  " + Operacoes().join("\n  "));
        return 2;
    }
    const int esperados = QString(it->second.argumentos).split(' ').size();
    if (argumentos.size() - 1 != esperados) {
        Erro("usage: --lookup " + it->first + " " + it->second.argumentos);
        return 2;
    }
    // Such values answer empty without a statement: the connection isn't even tried.
    bool recusada = false;
    for (const QString& argumento : argumentos.mid(1))
        recusada = recusada || argumento.contains('\'') || argumento.contains('\\');
    CECacheCatalogo cache;
    const QStringList resposta = it->second.rodar(cache, argumentos.mid(1));
    if (!recusada && !CEConexaoCatalogo::ObterCatalogo()->Conectado())
        Erro("no catalogue opens; the look-up answers as without a catalogue");
    const QChar separador(0x000C);
    for (QString linha : resposta)
        Saida(linha.replace(separador, '='));
    // A description the catalogue doesn't give shows as the lists' fallback text.
    const bool substituta = it->second.mensagem != 0 && resposta.size() == 1 &&
                            resposta[0] == CIMensagens::Mensagem("ZVLISTAS", it->second.mensagem);
    const bool vazia = resposta.isEmpty() || (resposta.size() == 1 && resposta[0].isEmpty());
    if (recusada && (vazia || substituta))
        Erro(
            "empty answer: a value holding a quote or a backslash is never sent to the "
            "catalogue");
    else if (vazia)
        Erro("empty answer");
    else if (substituta)
        Erro("empty answer; the lists print the text above in its place");
    return 0;
}

int CIFerramentaCatalogo::Construir(const QStringList& argumentos) {
    const QString destino = QFileInfo(argumentos[0]).absoluteFilePath();
    QStringList instrucoes;
    for (const QString& script : argumentos.mid(1)) {
        QStringList doScript;
        if (!CEScriptSql::LerArquivo(script, &doScript)) {
            Erro("cannot read " + script);
            return 1;
        }
        instrucoes << doScript;
    }
    QDir().mkpath(QFileInfo(destino).absolutePath());
    // Made beside the target and renamed over it: a failure leaves the old file as it was.
    const QString temporario = destino + ".part";
    QFile::remove(temporario);
    const QString erro = RodaScript(temporario, instrucoes);
    if (!erro.isEmpty()) {
        QFile::remove(temporario);
        Erro("the catalogue was not made: " + erro);
        return 1;
    }
    if (std::rename(QFile::encodeName(temporario).constData(),
                    QFile::encodeName(destino).constData()) != 0) {
        QFile::remove(temporario);
        Erro("cannot write " + destino);
        return 1;
    }
    Saida(QString("%1: %2 statements").arg(destino).arg(instrucoes.size()));
    return 0;
}

int CIFerramentaCatalogo::Configurar(const QStringList& atribuicoes) {
    for (const QString& atribuicao : atribuicoes) {
        const int igual = atribuicao.indexOf('=');
        const QString chave = atribuicao.left(igual);
        if (igual <= 0 || !kChavesConfiguracao.contains(chave)) {
            Erro("not a catalogue setting: " + atribuicao +
                 " (keys: " + kChavesConfiguracao.join(", ") + ")");
            return 2;
        }
    }
    QList<QPair<QString, QString>> valores;
    for (const QString& atribuicao : atribuicoes) {
        const int igual = atribuicao.indexOf('=');
        const QString chave = atribuicao.left(igual);
        const QString valor = atribuicao.mid(igual + 1);
        valores << qMakePair(chave, chave == "DBPass" ? CIRegistro::SenhaGuardada(valor) : valor);
    }
    // One save for all of them: either every setting is written or none.
    QString erro;
    if (!CIRegistro::GravarRegistros(valores, &erro)) {
        Erro(erro);
        return 1;
    }
    Saida("settings: " + CIRegistro::ArquivoRegistro());
    return 0;
}
