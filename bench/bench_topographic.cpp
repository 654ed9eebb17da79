// The topographic diagram timed from opening the drawing to saving it, next to opening and
// saving the same drawing with no command, on a generated project of 20,000 terminals (or
// the sizes given), with the demo catalogue, product data and diagram template. Each run is
// a child process; its processor time comes from the children's resource usage. Huge pages
// stay off unless ZV_HUGE_PAGES is set. Goal: the diagram within 3 times open-and-save.
// The pair (open-and-save, then the diagram) runs `--runs` times (3 unless given), and each
// side's fastest run is kept: load from elsewhere on a shared machine only ever adds time.
#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <sys/resource.h>

#include <cstdio>
#include <vector>

namespace {

struct Medida {
    bool ok = false;
    double wall = 0, cpu = 0;
    QString saida;
};

double CpuFilhos() {
    rusage uso{};
    getrusage(RUSAGE_CHILDREN, &uso);
    auto segundos = [](const timeval& t) { return double(t.tv_sec) + double(t.tv_usec) / 1e6; };
    return segundos(uso.ru_utime) + segundos(uso.ru_stime);
}

Medida Roda(const QStringList& args, const QProcessEnvironment& env, const QString& pasta) {
    QProcess processo;
    processo.setProcessEnvironment(env);
    processo.setWorkingDirectory(pasta);
    Medida m;
    const double cpu = CpuFilhos();
    QElapsedTimer relogio;
    relogio.start();
    processo.start(QString(ZV_BIN_DIR) + "/zvhost", args);
    processo.closeWriteChannel();
    if (!processo.waitForFinished(-1)) return m;
    m.wall = double(relogio.nsecsElapsed()) / 1e9;
    m.cpu = CpuFilhos() - cpu;
    m.saida = QString::fromUtf8(processo.readAllStandardOutput());
    m.ok = processo.exitStatus() == QProcess::NormalExit && processo.exitCode() == 0;
    if (!m.ok)
        std::fprintf(stderr, "zvhost %s failed:\n%s\n", qPrintable(args.join(' ')),
                     processo.readAllStandardError().constData());
    return m;
}

// The fastest of the runs, or the first that failed.
Medida Melhor(const std::vector<Medida>& runs) {
    Medida m;
    for (const Medida& r : runs) {
        if (!r.ok) return r;
        if (!m.ok || r.wall < m.wall) m = r;
    }
    return m;
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QStringList tamanhos = app.arguments().mid(1);
    int vezes = 3;
    const int opcao = int(tamanhos.indexOf("--runs"));
    if (opcao >= 0) {
        vezes = opcao + 1 < tamanhos.size() ? tamanhos[opcao + 1].toInt() : 0;
        if (vezes < 1) {
            std::fprintf(stderr, "usage: bench_topographic [--runs N] [SIZE...]\n");
            return 2;
        }
        tamanhos.erase(tamanhos.begin() + opcao, tamanhos.begin() + opcao + 2);
    }
    if (tamanhos.isEmpty()) tamanhos = QStringList{"20000"};
    QTemporaryDir pasta;
    const QString dados = pasta.filePath("data"), produto = pasta.filePath("product") + "/";
    QDir().mkpath(dados);
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert("ZV_DATA_DIR", dados);
    env.insert("ZV_PRODUCT_DIR", produto);
    if (!env.contains("ZV_HUGE_PAGES")) env.insert("ZV_HUGE_PAGES", "0");
    const QString fonte = ZV_SOURCE_DIR;
    for (const char* sub : {"templates", "config"}) {
        QDir().mkpath(produto + sub);
        for (const QString& f : QDir(fonte + "/data/" + sub).entryList(QDir::Files))
            QFile::copy(fonte + "/data/" + sub + "/" + f, produto + sub + "/" + f);
    }
    const QString catalogo = fonte + "/data/catalogue/";
    if (!Roda({"catalogue", "--build", dados + "/catalogo.db", catalogo + "catalogo-esquema.sql",
               catalogo + "catalogo-dados.sql"},
              env, pasta.path())
             .ok ||
        !Roda({"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + dados + "/",
               "DBName=catalogo.db", "libLang=1"},
              env, pasta.path())
             .ok)
        return 1;
    bool passa = true;
    std::printf("%8s %10s %9s %9s %11s %9s %7s %7s %12s %9s\n", "terms", "blocks", "diagram s",
                "cpu s", "open+save s", "cpu s", "ratio", "cpu rat", "result o+s s", "cpu s");
    for (const QString& tamanho : tamanhos) {
        const QString projeto = pasta.filePath("p" + tamanho + ".dxf");
        if (!Roda({"generate", "--out", projeto, "--seed", "7", "--terminals", tamanho, "--numbers",
                   "project", "--data", produto},
                  env, pasta.path())
                 .ok)
            return 1;
        const QString saida = pasta.filePath("out.dxf");
        std::vector<Medida> bases, diagramas;
        for (int vez = 0; vez < vezes; ++vez) {
            // Back to back, so that both see the same load on the machine.
            bases.push_back(Roda({"--quiet", projeto, "-o", saida}, env, pasta.path()));
            diagramas.push_back(
                Roda({"--quiet", "--load", produto + "config/zvconfig.lsp", "--answer",
                      "template=" + produto + "templates/topografico.dtp", projeto, "-o", saida,
                      "diagramaTopografico"},
                     env, pasta.path()));
            if (!bases.back().ok || !diagramas.back().ok) return 1;
        }
        const Medida base = Melhor(bases), diagrama = Melhor(diagramas);
        // The result is larger than the project: opening and saving it, for scale.
        const QString copia = pasta.filePath("copy.dxf");
        const Medida resultado = Roda({"--quiet", saida, "-o", copia}, env, pasta.path());
        if (!base.ok || !diagrama.ok || !resultado.ok) return 1;
        // The run's last line counts what it drew: "... inserted / pages made: N / P".
        const QRegularExpressionMatch contagem =
            QRegularExpression("(\\d+) / (\\d+)\\s*$").match(diagrama.saida.trimmed());
        const QString blocos = contagem.hasMatch()
                                   ? contagem.captured(1) + "/" + contagem.captured(2) + "p"
                                   : QString("?");
        const double razao = diagrama.wall / base.wall;
        std::printf("%8s %10s %9.2f %9.2f %11.2f %9.2f %7.2f %7.2f %12.2f %9.2f\n",
                    qPrintable(tamanho), qPrintable(blocos), diagrama.wall, diagrama.cpu, base.wall,
                    base.cpu, razao, diagrama.cpu / base.cpu, resultado.wall, resultado.cpu);
        std::fflush(stdout);
        if (razao > 3.0) passa = false;
        QFile::remove(projeto);
        QFile::remove(saida);
        QFile::remove(copia);
    }
    std::printf("%s: the diagram within 3x open+save\n", passa ? "PASS" : "FAIL");
    return 0;
}
