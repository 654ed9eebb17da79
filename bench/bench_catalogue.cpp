// Catalogue look-ups against the demo catalogue in SQLite: ten thousand look-ups of forty
// distinct keys through a run's cache, and the same without it. Prints look-ups per second
// and the statements each way sent to the engine.
#include "catalogue/CECacheCatalogo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"
#include "catalogue/ZVCatalogoTool.h"
#include "settings/CIRegistro.h"

#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QTemporaryDir>

#include <cstdio>
#include <functional>

namespace {

const int kConsultas = 10000;

void Silencio(void*, int canal, const char* texto) {
    if (canal == 2) std::fputs(texto, stderr);
}

bool ConstruirDemo(const QString& pasta) {
    const QByteArray arquivo = (pasta + "/catalogo.db").toUtf8();
    const QByteArray esquema = QByteArray(ZV_SOURCE_DIR) + "/data/catalogue/catalogo-esquema.sql";
    const QByteArray dados = QByteArray(ZV_SOURCE_DIR) + "/data/catalogue/catalogo-dados.sql";
    const char* argv[] = {"--build", arquivo.constData(), esquema.constData(), dados.constData()};
    return zvCatalogueTool(4, argv, Silencio, nullptr) == 0;
}

// Runs the look-ups and prints their rate and the statements they cost.
void Medir(const char* nome, const QStringList& chaves,
           const std::function<QString(const QString&)>& consulta) {
    CEConexaoCatalogo* conexao = CEConexaoCatalogo::ObterCatalogo();
    conexao->Conectar();
    const int antes = conexao->InstrucoesEnviadas();
    QElapsedTimer relogio;
    relogio.start();
    qsizetype total = 0;
    for (int i = 0; i < kConsultas; ++i)
        total += consulta(chaves[i % chaves.size()]).size();
    const double segundos = relogio.nsecsElapsed() / 1e9;
    std::printf("  %-28s %12.0f look-ups/s  %6d queries  (%.3f s, %lld chars)\n", nome,
                kConsultas / segundos, conexao->InstrucoesEnviadas() - antes, segundos,
                static_cast<long long>(total));
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QTemporaryDir pasta;
    if (!pasta.isValid()) return 1;
    qputenv("ZV_DATA_DIR", pasta.path().toUtf8());
    qputenv("TMPDIR", pasta.path().toUtf8());
    if (!ConstruirDemo(pasta.path())) return 1;
    CIRegistro::SetDatabase("SQLITE");
    CIRegistro::SetNetworkZV(pasta.path() + "/");
    CIRegistro::SetDBName("catalogo.db");
    CIRegistro::SetLibLang("2");

    const CERegistrosCatalogo tipos = CEConexaoCatalogo::ObterCatalogo()->Consultar(
        "select distinct COMP_KEY from BDTIPOCOMP order by COMP_KEY");
    QStringList chaves;
    for (int i = 0; i < tipos.Linhas() && chaves.size() < 40; ++i)
        chaves << tipos.Valor(i, 0);
    if (chaves.size() < 40) return 1;

    std::printf("catalogue look-ups, SQLite demo catalogue: %d look-ups of %lld distinct keys\n",
                kConsultas, static_cast<long long>(chaves.size()));
    CECacheCatalogo cache;
    CEConsultasCatalogo consultas;
    Medir("ListaComp cached", chaves, [&](const QString& k) { return cache.ListaComp(k, "1"); });
    Medir("ListaComp uncached", chaves,
          [&](const QString& k) { return consultas.ListaComp(k, "1"); });
    Medir("DescricaoComp cached", chaves, [&](const QString& k) { return cache.DescricaoComp(k); });
    Medir("DescricaoComp uncached", chaves,
          [&](const QString& k) { return consultas.DescricaoComp(k); });
    Medir("ColunasComp cached", chaves,
          [&](const QString& k) { return cache.ColunasComp(k).join(';'); });
    Medir("ColunasComp uncached", chaves,
          [&](const QString& k) { return consultas.ColunasComp(k).join(';'); });
    CEConexaoCatalogo::LiberarCatalogo();
    return 0;
}
