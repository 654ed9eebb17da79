// The strip drawing's layout (strips in symbol order, jumper tracks, cuts, pages, points,
// detail runs) on generated item vectors of 20,000 and 80,000 terminals, as the strip reader
// would give them: strips of 10 to 400 terminals, a component for every three terminals,
// jumper chains of two to six terminals, some long ones across a strip's rows. Prints the
// times and their ratio; a layout that grows linearly stays near 4. Then the whole drawing
// written into a document of an in-process host, with the demo's template, blocks and
// catalogue, next to saving that document: the goal is a drawing within 3 times the save and
// a ratio under 4.5.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "cad/CICad.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "drawing/Database.h"
#include "drawing/DxfWriter.h"
#include "lists/CETemplateLisp.h"
#include "readers/VetorItens.h"
#include "strips/CCBorneDwgWriter.h"
#include "strips/CEModeloReguas.h"

#include <benchmark/benchmark.h>

#include <QCoreApplication>
#include <QDir>
#include <QProcess>
#include <QTemporaryDir>
#include <QTextStream>

#include <chrono>
#include <cstdio>
#include <ctime>
#include <random>
#include <tuple>

namespace {

struct Projeto {
    VetorItens itens;
    ~Projeto() { itens.destruirItens(); }
};

void Gera(Projeto& projeto, int terminais, unsigned semente) {
    std::mt19937 gerador(semente);
    auto uniforme = [&](int a, int b) { return std::uniform_int_distribution<int>(a, b)(gerador); };
    int regua = 0, restantes = 0, numero = 0, simbolo = 0;
    std::vector<CEItemLista*> cadeia;
    auto fechaCadeia = [&] {
        for (size_t i = 0; i + 1 < cadeia.size(); ++i) {
            cadeia[i]->proximo = cadeia[i + 1];
            cadeia[i + 1]->anterior = cadeia[i];
        }
        cadeia.clear();
    };
    int tamanhoCadeia = 0;
    CEItemLista* componente = nullptr;
    int ligacao = 0;
    for (int t = 0; t < terminais; ++t) {
        if (restantes == 0) {
            fechaCadeia();
            ++regua;
            restantes = uniforme(10, 400);
            numero = 0;
        }
        --restantes;
        auto* item = new CEItemLista;
        item->definirCampo("ZV_LISTA_TIPO", "BORNE");
        item->definirCampo("REGUA", "X" + QString::number(regua));
        item->definirCampo("NUMERO", QString::number(++numero));
        item->definirCampo("HANDLE", QString::number(0x100000 + t, 16));
        item->definirCampo("ZV_KEY", "1001");
        item->definirCampo("LAYER", "ESQ$" + QString::number(t / 40 + 1) + "$A");
        for (int c = 0; c < 20; ++c)
            item->definirCampo("CAMPO" + QString::number(c), "valor " + QString::number(c));
        if (t % 3 == 0) {
            componente = new CEItemLista;
            componente->definirCampo("ZV_LISTA_TIPO", "COMP");
            componente->definirCampo("HANDLE", QString::number(0x900000 + simbolo, 16));
            componente->definirCampo("RELACAO", "-K" + QString::number(++simbolo));
            componente->definirCampo("ZV_KEY", "2001");
            for (int l = 1; l <= 3; ++l)
                componente->definirCampo("LIGACAO_" + QString::number(l), QString::number(l));
            projeto.itens.push_back(componente);
            ligacao = 0;
        }
        const QString lig = QString::number(++ligacao);
        item->definirCampo("REL_INI", componente->valorCampo("RELACAO") + ":" + lig);
        item->definirCampo("RELACAO_INI", componente->valorCampo("RELACAO"));
        item->definirCampo("HANDLE_INI", componente->valorCampo("HANDLE"));
        item->definirCampo("LIG_INI", lig);
        projeto.itens.push_back(item);
        // Jumper chains: most short and next to each other, one in twenty long.
        if (tamanhoCadeia == 0 && uniforme(0, 9) < 3)
            tamanhoCadeia = uniforme(0, 19) == 0 ? uniforme(20, 60) : uniforme(2, 6);
        if (tamanhoCadeia > 0 && uniforme(0, 1) == 0) {
            cadeia.push_back(item);
            if (--tamanhoCadeia == 0) fechaCadeia();
        }
    }
    fechaCadeia();
}

double Mede(int terminais, size_t* paginas) {
    Projeto projeto;
    Gera(projeto, terminais, 7);
    CEModeloReguas::Parametros p;
    p.bornesPorRegua = 50;
    p.chavesQuebra = QStringList{"REGUA"};
    p.reguasPorPagina = 2;
    p.distanciaReguas = 135;
    p.refX = 50;
    p.refY = 90;
    p.camposDetalhe = QStringList{"RELACAO_INI"};
    double melhor = 1e300;
    for (int vez = 0; vez < 3; ++vez) {
        CEModeloReguas modelo;
        // Processor time: the machine may be shared.
        const std::clock_t inicio = std::clock();
        modelo.Monta(projeto.itens, p);
        melhor = std::min(melhor, double(std::clock() - inicio) / CLOCKS_PER_SEC);
        *paginas = modelo.paginas.size();
    }
    return melhor;
}

using Relogio = std::chrono::steady_clock;

double Segundos(Relogio::time_point inicio) {
    return std::chrono::duration<double>(Relogio::now() - inicio).count();
}

bool Zvhost(const QStringList& args) {
    QProcess processo;
    processo.start(QString(ZV_BIN_DIR) + "/zvhost", args);
    if (!processo.waitForFinished(600000) || processo.exitCode() != 0) {
        std::fprintf(stderr, "zvhost %s failed: %s\n", qPrintable(args.join(' ')),
                     processo.readAllStandardError().constData());
        return false;
    }
    return true;
}

// The drawing of `terminais` terminals into a new document, and the save of that document.
// Wall and processor seconds: the machine may be shared.
struct Tempo {
    double wall = 0, cpu = 0;
};

struct Cronometro {
    Relogio::time_point wall = Relogio::now();
    std::clock_t cpu = std::clock();
    Tempo Le() const { return {Segundos(wall), double(std::clock() - cpu) / CLOCKS_PER_SEC}; }
};

bool MedeEscrita(const QTemporaryDir& pasta, int terminais, Tempo* escrita, Tempo* gravacao) {
    QString console;
    QTextStream out(&console), err(&console);
    zvhost::Application app(std::make_unique<zvhost::ConsoleUserInterface>(out, err, false), out);
    app.setExecutableFolder(ZV_BIN_DIR);
    zvhost::HostDocument* documento = app.openDocument(pasta.filePath("reguas.dxf"));
    const QString produto = pasta.filePath("produto") + "/";
    CICad::SetStringLisp("*DIRETORIO_REDE*", produto);
    CETemplateLisp modelo(produto + "templates/reguas.grx");
    if (!modelo.Carregar()) return false;
    Projeto projeto;
    Gera(projeto, terminais, 11);
    Cronometro inicio;
    {
        CCBorneDwgWriter escritor;
        escritor.EscreverItens(projeto.itens, modelo);
    }
    *escrita = inicio.Le();
    inicio = Cronometro();
    zvdb::DxfWriter::saveFile(*documento->database(), pasta.filePath("reguas.dxf").toStdString());
    *gravacao = inicio.Le();
    CEConexaoCatalogo::LiberarCatalogo();
    return true;
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication aplicacao(argc, argv);
    size_t paginas20 = 0, paginas80 = 0;
    const double t20 = Mede(20000, &paginas20);
    const double t80 = Mede(80000, &paginas80);
    std::printf("strip drawing layout, 20000 terminals: %.3f s cpu (%zu pages)\n", t20, paginas20);
    std::printf("strip drawing layout, 80000 terminals: %.3f s cpu (%zu pages)\n", t80, paginas80);
    const double razao = t80 / t20;
    std::printf("ratio 80k/20k: %.2f (goal under 4.5): %s\n", razao, razao < 4.5 ? "PASS" : "FAIL");

    QTemporaryDir pasta;
    qputenv("ZV_DATA_DIR", pasta.path().toUtf8());
    qputenv("TMPDIR", pasta.path().toUtf8());
    const QString sql = QString(ZV_SOURCE_DIR) + "/data/catalogue/";
    const QString produto = pasta.filePath("produto") + "/";
    QDir().mkpath(produto + "templates");
    if (!Zvhost({"catalogue", "--build", pasta.filePath("catalogo.db"),
                 sql + "catalogo-esquema.sql", sql + "catalogo-dados.sql"}) ||
        !Zvhost({"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + pasta.path() + "/",
                 "DBName=catalogo.db", "libLang=1"}) ||
        !Zvhost({"generate", "--out", pasta.filePath("p.dxf"), "--terminals", "10", "--data",
                 produto}) ||
        !QFile::copy(QString(ZV_SOURCE_DIR) + "/data/templates/reguas.grx",
                     produto + "templates/reguas.grx"))
        return 1;
    Tempo e20, g20, e80, g80;
    if (!MedeEscrita(pasta, 20000, &e20, &g20) || !MedeEscrita(pasta, 80000, &e80, &g80)) {
        std::fprintf(stderr, "the strip template did not load\n");
        return 1;
    }
    for (const auto& [n, e, g] : {std::tuple{20000, e20, g20}, std::tuple{80000, e80, g80}})
        std::printf(
            "strip drawing written, %d terminals: %.3f s wall, %.3f s cpu "
            "(saving it: %.3f s wall, %.3f s cpu; %.2f times in cpu)\n",
            n, e.wall, e.cpu, g.wall, g.cpu, e.cpu / g.cpu);
    std::printf("ratio 80k/20k: %.2f wall, %.2f cpu (goal under 4.5): %s\n", e80.wall / e20.wall,
                e80.cpu / e20.cpu, e80.cpu / e20.cpu < 4.5 ? "PASS" : "FAIL");
    return 0;
}
