// The same look-ups and upgrades on a real server: a throw-away PostgreSQL cluster on a
// loopback port, reached through unixODBC's PostgreSQL driver, stopped at the end.
#include "CatalogoTeste.h"

#include "catalogue/CEAtualizacaoCatalogo.h"
#include "catalogue/CECacheCatalogo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"
#include "catalogue/CEScriptSql.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <QDir>
#include <QFile>
#include <QProcess>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <pwd.h>
#include <sys/socket.h>
#include <unistd.h>

namespace {

const char* const kDriverOdbc = "/usr/lib/x86_64-linux-gnu/odbc/psqlodbcw.so";

// The newest server of Debian's packages that has both programs.
QString PastaServidor() {
    QStringList versoes = QDir("/usr/lib/postgresql").entryList(QDir::Dirs | QDir::NoDotAndDotDot);
    std::sort(versoes.begin(), versoes.end(),
              [](const QString& a, const QString& b) { return a.toInt() > b.toInt(); });
    for (const QString& versao : versoes) {
        const QString pasta = "/usr/lib/postgresql/" + versao + "/bin";
        if (QFile::exists(pasta + "/initdb") && QFile::exists(pasta + "/pg_ctl")) return pasta;
    }
    return {};
}

int PortaLivre() {
    const int s = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in endereco{};
    endereco.sin_family = AF_INET;
    endereco.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    socklen_t tamanho = sizeof(endereco);
    int porta = 0;
    if (bind(s, reinterpret_cast<sockaddr*>(&endereco), tamanho) == 0 &&
        getsockname(s, reinterpret_cast<sockaddr*>(&endereco), &tamanho) == 0)
        porta = ntohs(endereco.sin_port);
    close(s);
    return porta;
}

class Servidor {
public:
    // Starts the cluster; an empty text on success, else what went wrong.
    QString Iniciar(const QString& bin) {
        bin_ = bin;
        if (!base_.isValid()) return "no temporary folder";
        // The server refuses to run as root: it runs as the postgres user, in a folder of its own.
        QFile::setPermissions(base_.path(), QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner |
                                                QFile::ReadGroup | QFile::ExeGroup |
                                                QFile::ReadOther | QFile::ExeOther);
        pasta_ = base_.path() + "/pg";
        QDir().mkpath(pasta_);
        if (geteuid() == 0) {
            const passwd* usuario = getpwnam("postgres");
            if (!usuario) return "no postgres user to run the server as";
            if (chown(QFile::encodeName(pasta_).constData(), usuario->pw_uid, usuario->pw_gid) != 0)
                return "cannot hand the cluster folder to postgres";
        }
        porta_ = PortaLivre();
        QString saida;
        if (!Rodar("initdb",
                   {"-D", pasta_ + "/data", "-U", "zv", "-A", "trust", "-E", "UTF8", "--locale=C"},
                   &saida))
            return "initdb failed: " + saida;
        const QString opcoes =
            QString("-p %1 -k %2 -c listen_addresses=127.0.0.1").arg(porta_).arg(pasta_);
        if (!Rodar("pg_ctl",
                   {"-D", pasta_ + "/data", "-l", pasta_ + "/log", "-o", opcoes, "-w", "-t", "60",
                    "start"},
                   &saida))
            return "pg_ctl start failed: " + saida;
        iniciado_ = true;
        return {};
    }
    void Parar() {
        QString saida;
        if (iniciado_) Rodar("pg_ctl", {"-D", pasta_ + "/data", "-m", "immediate", "stop"}, &saida);
        iniciado_ = false;
    }
    QString TextoOdbc(const QString& banco) const {
        return QString("DRIVER=%1;SERVER=127.0.0.1;PORT=%2;DATABASE=%3;UID=zv;")
            .arg(kDriverOdbc)
            .arg(porta_)
            .arg(banco);
    }

private:
    bool Rodar(const QString& programa, const QStringList& argumentos, QString* saida) {
        QProcess processo;
        if (geteuid() == 0) {
            processo.setProgram("runuser");
            processo.setArguments(QStringList{"-u", "postgres", "--", bin_ + "/" + programa} +
                                  argumentos);
        } else {
            processo.setProgram(bin_ + "/" + programa);
            processo.setArguments(argumentos);
        }
        processo.setWorkingDirectory(pasta_);
        processo.setProcessChannelMode(QProcess::MergedChannels);
        processo.start();
        const bool ok = processo.waitForFinished(120000) &&
                        processo.exitStatus() == QProcess::NormalExit && processo.exitCode() == 0;
        *saida = QString::fromLocal8Bit(processo.readAll());
        return ok;
    }

    QTemporaryDir base_;
    QString bin_, pasta_;
    int porta_ = 0;
    bool iniciado_ = false;
};

class PostgresTest : public CatalogoTeste {
protected:
    static void SetUpTestSuite() {
        GarantirAplicacao();
        const QString bin = PastaServidor();
        if (bin.isEmpty()) return;
        servidor_ = new Servidor;
        erro_ = servidor_->Iniciar(bin);
    }
    static void TearDownTestSuite() {
        if (servidor_) servidor_->Parar();
        delete servidor_;
        servidor_ = nullptr;
    }
    void SetUp() override {
        CatalogoTeste::SetUp();
        if (!servidor_)
            GTEST_SKIP() << "PostgreSQL server programs (initdb, pg_ctl) are not installed: "
                            "install Debian's postgresql package (./zv deps) to run these tests";
        ASSERT_TRUE(erro_.isEmpty()) << erro_.toStdString();
        ASSERT_TRUE(QFile::exists(kDriverOdbc)) << "odbc-postgresql is not installed";
    }
    // Points the settings at a database of the cluster, made from the scripts the first time.
    void Usar(const QString& banco, const QStringList& scripts, const QString& idioma) {
        CIRegistro::SetDatabase("ODBC");
        CIRegistro::SetDBName(servidor_->TextoOdbc("postgres"));
        CIRegistro::SetLibLang(idioma);
        CEConexaoCatalogo* conexao = CEConexaoCatalogo::ObterCatalogo();
        if (!criados_.contains(banco)) {
            ASSERT_TRUE(conexao->Executar("create database " + banco))
                << conexao->UltimoErro().toStdString();
            CEConexaoCatalogo::LiberarCatalogo();
            CIRegistro::SetDBName(servidor_->TextoOdbc(banco));
            conexao = CEConexaoCatalogo::ObterCatalogo();
            for (const QString& script : scripts) {
                QStringList instrucoes;
                ASSERT_TRUE(CEScriptSql::LerArquivo(script, &instrucoes));
                for (const QString& instrucao : instrucoes)
                    ASSERT_TRUE(conexao->Executar(instrucao))
                        << conexao->UltimoErro().toStdString() << "\n"
                        << instrucao.toStdString();
            }
            criados_ << banco;
        }
        CEConexaoCatalogo::LiberarCatalogo();
        CIRegistro::SetDBName(servidor_->TextoOdbc(banco));
    }
    CEConexaoCatalogo& Conexao() { return *CEConexaoCatalogo::ObterCatalogo(); }

    static Servidor* servidor_;
    static QString erro_;
    static QStringList criados_;
};

Servidor* PostgresTest::servidor_ = nullptr;
QString PostgresTest::erro_;
QStringList PostgresTest::criados_;

TEST_F(PostgresTest, EveryLookUpAnswersThroughOdbc) {
    Usar("demo", ScriptsDemo(), "1");
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Fonte chaveada 24 Vcc 5 A");
    EXPECT_EQ(Conexao().Dialeto().familia(), CEDialetoCatalogo::Postgres);
    EXPECT_EQ(consultas.DescricaoFio("10008"), "Cabo flexível 2,5 mm² preto");
    EXPECT_EQ(consultas.DescricaoCabo("20003"), "Cabo de comando 7x0,75 mm² numerado");
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "S");
    EXPECT_EQ(consultas.ListaComp("8503", "2"), "N");
    EXPECT_EQ(consultas.ListaFio("10001", "1"), "S");
    EXPECT_EQ(consultas.ListaCabo("20004", "2"), "S");
    EXPECT_TRUE(
        consultas.ColunasComp("1001").contains("FABRICANTE" + QString(QChar(0x0C)) + "Bornax"));
    EXPECT_TRUE(consultas.ColunasFio("10013").contains("COR" + QString(QChar(0x0C)) + "GNYE"));
    EXPECT_TRUE(consultas.ColunasCabo("20006").contains("VIAS" + QString(QChar(0x0C)) + "12"));
    EXPECT_EQ(consultas.MaterialSap("7001"), "100070011");
    EXPECT_EQ(consultas.AcessoriosDe("6003"), (QStringList{"6202#2", "6203#0"}));
    EXPECT_EQ(consultas.TipoComp("1001"), "5");
    EXPECT_EQ(consultas.BlocoRepresentacao("1001", "1", "2"), "REGUA_BX2_5_GY");
    EXPECT_EQ(consultas.GrupoNome("3", "2"), "Power diagrams");
    EXPECT_EQ(consultas.GrupoDescricao("6", "1"), "TITULO_LISTA");
    EXPECT_EQ(consultas.GrupoSequencial("6", "1"), "1");
    EXPECT_EQ(consultas.PromptCampo("TENSAO", false), "Tensão");
    EXPECT_TRUE(CEAtualizacaoCatalogo(Conexao()).Pendentes().isEmpty());
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
}

TEST_F(PostgresTest, FallbacksAndTheCache) {
    Usar("demo", ScriptsDemo(), "2");
    CECacheCatalogo cache;
    EXPECT_EQ(cache.DescricaoComp("4242"), CIMensagens::Mensagem("ZVLISTAS", 108));
    const int antes = Conexao().InstrucoesEnviadas();
    for (int i = 0; i < 200; ++i)
        cache.ListaComp(i % 2 ? "1001" : "2001", "1");
    EXPECT_EQ(Conexao().InstrucoesEnviadas() - antes, 2);
    EXPECT_EQ(cache.Consultas().DescricaoComp("7001"), "Switch-mode power supply 24 V DC 5 A");
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
}

TEST_F(PostgresTest, KeysFromDrawingsNeverChangeAStatement) {
    Usar("chaves", ScriptsDemo(), "1");
    ConfereChavesDeDesenhos();
}

TEST_F(PostgresTest, UpgradesTouchOnlyACatalogueOrAnEmptyDatabase) {
    Usar("outro", {QString(ZV_TEST_DIR) + "/outro-programa.sql"}, "1");
    EXPECT_EQ(Conexao().Examinar(), CEConexaoCatalogo::Outro);
    EXPECT_EQ(CEConsultasCatalogo().TipoComp("7001"), "");
    EXPECT_EQ(Caixas().count("SQL ERROR: "), 1) << Caixas().toStdString();
    EXPECT_FALSE(Conexao().ExisteTabela("BDTIPOCOMP"));
    EXPECT_EQ(Conexao().Consultar("select count(*) as N from clientes").Primeiro("N"), "2");

    Usar("vazia", {}, "1");
    EXPECT_EQ(Conexao().Examinar(), CEConexaoCatalogo::Vazio);
    EXPECT_FALSE(CEAtualizacaoCatalogo(Conexao()).Pendentes().isEmpty());
}

TEST_F(PostgresTest, AnOldCatalogueIsUpgradedOnTheServer) {
    Usar("antigo", {QString(ZV_TEST_DIR) + "/catalogo-antigo.sql"}, "2");
    CEAtualizacaoCatalogo atualizacao(Conexao());
    const QStringList pendentes = atualizacao.Pendentes();
    EXPECT_TRUE(pendentes.contains("12: widen BDZV.ZV_DWG to 50"))
        << pendentes.join("\n").toStdString();
    EXPECT_TRUE(pendentes.contains("14: widen BDACCOUNTS.AC_SENHA to 255"));
    EXPECT_EQ(Conexao().LarguraColuna("BDZV", "ZV_DWG"), 20);

    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Switch-mode power supply 24 V DC 5 A");
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
    EXPECT_TRUE(atualizacao.Pendentes().isEmpty())
        << atualizacao.Pendentes().join("\n").toStdString();
    EXPECT_EQ(Conexao().LarguraColuna("BDZV", "ZV_DWG"), 50);
    EXPECT_EQ(Conexao().LarguraColuna("BDMENUS", "MENU_DESCR"), 255);
    EXPECT_EQ(consultas.GrupoNome("1", "2"), "Diagrams");
    EXPECT_EQ(consultas.GrupoSequencial("1", "1"), "0");
    EXPECT_EQ(consultas.DescricaoFio("10008"), "Flexible wire 2.5 mm² black");
}

}  // namespace
