#include "CatalogoTeste.h"

#include "catalogue/CEConexaoCatalogo.h"
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
