#include "CatalogoTeste.h"

#include "catalogue/CECacheCatalogo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"
#include "catalogue/ZVCatalogoTool.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

#include <QDir>

void GarantirAplicacao() {
    static int argc = 1;
    static char nome[] = "catalogue_tests";
    static char* argv[] = {nome, nullptr};
    if (!QCoreApplication::instance()) new QCoreApplication(argc, argv);
}

void CatalogoTeste::SetUp() {
    GarantirAplicacao();
    ASSERT_TRUE(pasta_.isValid());
    qputenv("ZV_DATA_DIR", pasta_.path().toUtf8());
    // The log file lies in the temporary folder: keep it inside the test's own.
    tmpAntigo_ = qgetenv("TMPDIR");
    QDir().mkpath(pasta_.path() + "/tmp");
    qputenv("TMPDIR", (pasta_.path() + "/tmp").toUtf8());
    auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
    app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
    app_->setExecutableFolder(ZV_BIN_DIR);
    app_->openDocument(pasta_.path() + "/projeto.dxf");
}

void CatalogoTeste::TearDown() {
    CEConexaoCatalogo::LiberarCatalogo();
    CIMensagens::Descarregar();
    app_.reset();
    qputenv("TMPDIR", tmpAntigo_);
    if (tmpAntigo_.isEmpty()) qunsetenv("TMPDIR");
}

QStringList CatalogoTeste::ScriptsDemo() {
    return {QString(ZV_SOURCE_DIR) + "/data/catalogue/catalogo-esquema.sql",
            QString(ZV_SOURCE_DIR) + "/data/catalogue/catalogo-dados.sql"};
}

bool CatalogoTeste::Construir(const QString& arquivo, const QStringList& scripts) {
    QString saida, erros;
    const int estado = Ferramenta(QStringList{"--build", arquivo} + scripts, &saida, &erros);
    EXPECT_EQ(estado, 0) << erros.toStdString();
    return estado == 0;
}

void CatalogoTeste::UsarSqlite(const QString& nome, const QString& idioma) {
    CIRegistro::SetDatabase("SQLITE");
    CIRegistro::SetNetworkZV(pasta_.path() + "/");
    CIRegistro::SetDBName(nome);
    CIRegistro::SetLibLang(idioma);
}

void CatalogoTeste::UsarDemo(const QString& idioma) {
    ASSERT_TRUE(Construir(pasta_.path() + "/catalogo.db", ScriptsDemo()));
    UsarSqlite("catalogo.db", idioma);
}

namespace {
struct Captura {
    QString* saida;
    QString* erros;
};
void Escreve(void* contexto, int canal, const char* texto) {
    auto* captura = static_cast<Captura*>(contexto);
    *(canal == 2 ? captura->erros : captura->saida) += QString::fromUtf8(texto);
}
}  // namespace

int CatalogoTeste::Ferramenta(const QStringList& argumentos, QString* saida, QString* erros) {
    QString descarte;
    Captura captura{saida, erros ? erros : &descarte};
    std::vector<QByteArray> bytes;
    for (const QString& argumento : argumentos)
        bytes.push_back(argumento.toUtf8());
    std::vector<const char*> argv;
    for (const QByteArray& b : bytes)
        argv.push_back(b.constData());
    return zvCatalogueTool(int(argv.size()), argv.data(), Escreve, &captura);
}

void CatalogoTeste::ConfereChavesDeDesenhos() {
    CEConexaoCatalogo& conexao = *CEConexaoCatalogo::ObterCatalogo();
    const QStringList linhas = {
        "insert into BDMENUS (MENU_KEY, MENU_NIVEL, MENU_DESCR, MENU_KEY_LANG) values "
        "('--7001', '17', 'Dois traços', '1'), ('70%1', '17', 'Por cento', '1'), "
        "('70_1', '17', 'Sublinhado', '1'), ('Çã€1', '17', 'Não ASCII', '1'), "
        "(';7001', '17', 'Ponto e vírgula', '1'), ('70''01', '17', 'Aspas', '1'), "
        "('70\\01', '17', 'Barra', '1')",
        "insert into BDZV (ZV_KEY, ZV_KEY_NOR, ZV_LISTA) values ('--7001', '1', 'S'), "
        "('70%1', '1', 'S'), ('70_1', '1', 'N'), ('Çã€1', '1', 'S')",
        "insert into BDTIPOCOMP (COMP_KEY, TIPO_KEY) values ('70_1', '5')",
        "insert into BDVINCL (VL_KEY_A, VL_KEY_B, VL_QTDE) values ('Çã€1', '1001', 2)",
        "insert into BDUSER (USER_KEY, FABRICANTE) values ('70%1', 'Percentx')"};
    for (const QString& linha : linhas)
        ASSERT_TRUE(conexao.Executar(linha)) << conexao.UltimoErro().toStdString();
    CIRegistro::SetLibLang("1");

    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("--7001"), "Dois traços");
    EXPECT_EQ(consultas.DescricaoComp("70%1"), "Por cento");
    EXPECT_EQ(consultas.DescricaoComp("70_1"), "Sublinhado");
    EXPECT_EQ(consultas.DescricaoComp("Çã€1"), "Não ASCII");
    EXPECT_EQ(consultas.DescricaoComp(";7001"), "Ponto e vírgula");
    // "%" and "_" are no wildcards in an equality: they find their own row only.
    EXPECT_EQ(consultas.DescricaoComp("70%"), "");
    EXPECT_EQ(consultas.DescricaoComp("7_01"), "");
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Fonte chaveada 24 Vcc 5 A");
    EXPECT_EQ(consultas.ListaComp("--7001", "1"), "S");
    EXPECT_EQ(consultas.ListaComp("70_1", "1"), "N");
    EXPECT_EQ(consultas.ListaComp("Çã€1", "1"), "S");
    EXPECT_EQ(consultas.TipoComp("70_1"), "5");
    EXPECT_EQ(consultas.AcessoriosDe("Çã€1"), QStringList{"1001#2"});
    EXPECT_TRUE(
        consultas.ColunasComp("70%1").contains("FABRICANTE" + QString(QChar(0x0C)) + "Percentx"));
    EXPECT_EQ(consultas.GrupoNome(" 3", "2"), "Power diagrams");
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();

    const int enviadas = conexao.InstrucoesEnviadas();
    const QStringList perigosas = {"70'01", "NOPE' OR '1'='1", "x'; DROP TABLE BDZV; --", "70\\01",
                                   "\\'",   "' OR ''='"};
    CECacheCatalogo cache;
    for (const QString& k : perigosas) {
        const std::string nome = k.toStdString();
        EXPECT_EQ(consultas.DescricaoComp(k), "") << nome;
        EXPECT_EQ(consultas.DescricaoFio(k), "") << nome;
        EXPECT_EQ(consultas.DescricaoCabo(k), "") << nome;
        EXPECT_EQ(consultas.ListaComp(k, "1"), "") << nome;
        EXPECT_EQ(consultas.ListaComp("7001", k), "") << nome;
        EXPECT_EQ(consultas.ListaFio(k, "1"), "") << nome;
        EXPECT_EQ(consultas.ListaCabo("20004", k), "") << nome;
        EXPECT_TRUE(consultas.ColunasComp(k).isEmpty()) << nome;
        EXPECT_TRUE(consultas.ColunasFio(k).isEmpty()) << nome;
        EXPECT_EQ(consultas.MaterialSap(k), "") << nome;
        EXPECT_TRUE(consultas.AcessoriosDe(k).isEmpty()) << nome;
        EXPECT_EQ(consultas.TipoComp(k), "") << nome;
        EXPECT_EQ(consultas.BlocoRepresentacao(k, "1", "1"), "") << nome;
        EXPECT_EQ(consultas.BlocoRepresentacao("1001", "1", k), "") << nome;
        EXPECT_EQ(consultas.PromptCampo(k, false), k) << nome;
        EXPECT_EQ(cache.DescricaoComp(k), CIMensagens::Mensagem("ZVLISTAS", 108)) << nome;
    }
    // Values pasted without quotes: numbers and names only.
    EXPECT_EQ(consultas.GrupoNome("3 OR 1=1", "2"), "");
    EXPECT_EQ(consultas.GrupoDescricao("3", "1; DROP TABLE BDZV"), "");
    EXPECT_EQ(consultas.GrupoSequencial("3--", "1"), "");
    EXPECT_TRUE(consultas.ColunasUsuario("BDUSER WHERE 1=1 --", "USER_KEY", "1001").isEmpty());
    EXPECT_TRUE(consultas.ColunasUsuario("BDUSER", "USER_KEY=USER_KEY OR 1", "1001").isEmpty());
    // The catalogue language is pasted too.
    CIRegistro::SetLibLang("1' OR '1'='1");
    EXPECT_EQ(consultas.DescricaoComp("7001"), "");
    CIRegistro::SetLibLang("1");
    EXPECT_EQ(conexao.InstrucoesEnviadas(), enviadas);
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
    // Nothing was run: the table is whole and the good keys still answer.
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "S");
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Fonte chaveada 24 Vcc 5 A");
}
