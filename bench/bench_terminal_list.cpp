// Each list command timed from opening the drawing to saving it, next to opening and saving
// the same drawing with no command, on generated projects of 20,000 and 80,000 terminals (or
// the sizes given), with the demo catalogue and product data. Each run is a child process;
// its wall time, processor time (program and system) and peak resident memory come from
// wait4. Huge pages stay off unless ZV_HUGE_PAGES is set, so that the figures show how the
// program itself scales. The table at the end holds every figure and a PASS or FAIL line
// against the goals: a list within 3 times open-and-save at every size, the terminal list's
// peak memory at the largest size within 1.4 times open-and-save's, and the largest/smallest
// wall time ratio under 4.5 for sizes 4 times apart (scaled for other sizes). `--commands`
// takes some of the commands only.
//
// The machine may be shared: the processor time is printed next to the wall time, split into
// the program's own (user) and the kernel's (system), with the page faults; on a virtual machine
// first touches of memory can cost more in the kernel than the program spends itself, so the
// user time ratio shows the program apart from that. Each pair (open-and-save, then the list) runs
// `--runs` times (3 unless given), in rounds that take every command and size in turn: a load
// that comes and goes falls on one run of several commands and sizes, not on every run of one.
// The figures kept are each side's fastest run, as load from elsewhere only ever adds time,
// and the highest peak memory of its runs.
#include <QCoreApplication>
#include <QDir>
#include <QProcess>
#include <QTemporaryDir>

#include <fcntl.h>
#include <spawn.h>
#include <sys/resource.h>
#include <sys/wait.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <string>
#include <vector>

extern char** environ;

namespace {

QString zvhost() {
    return QString(ZV_BIN_DIR) + "/zvhost";
}

struct Medida {
    bool ok = false;
    double wall = 0, user = 0, system = 0;
    double rssGb = 0;
    long faults = 0;  // minor page faults: first touches of memory
};

// The fastest run's times and the highest peak memory of all runs.
Medida Melhor(const std::vector<Medida>& runs) {
    Medida m;
    for (const Medida& r : runs) {
        if (!r.ok) return r;
        const double rss = std::max(m.rssGb, r.rssGb);
        if (!m.ok || r.wall < m.wall) m = r;
        m.rssGb = rss;
    }
    return m;
}

// Runs zvhost with the arguments in the folder and the environment; output is discarded
// unless the run fails.
Medida run(const QStringList& args, const QProcessEnvironment& env, const QString& folder) {
    std::vector<std::string> textos{zvhost().toStdString()};
    for (const QString& a : args)
        textos.push_back(a.toStdString());
    std::vector<std::string> ambiente;
    for (const QString& kv : env.toStringList())
        ambiente.push_back(kv.toStdString());
    std::vector<char*> argv, envp;
    for (std::string& t : textos)
        argv.push_back(t.data());
    argv.push_back(nullptr);
    for (std::string& t : ambiente)
        envp.push_back(t.data());
    envp.push_back(nullptr);
    const std::string erros = QDir(folder).filePath("stderr.txt").toStdString();
    posix_spawn_file_actions_t acoes;
    posix_spawn_file_actions_init(&acoes);
    posix_spawn_file_actions_addopen(&acoes, 0, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&acoes, 1, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_addopen(&acoes, 2, erros.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    posix_spawn_file_actions_addchdir_np(&acoes, folder.toLocal8Bit().constData());
    Medida m;
    const auto inicio = std::chrono::steady_clock::now();
    pid_t pid = 0;
    const int falha = posix_spawn(&pid, argv[0], &acoes, nullptr, argv.data(), envp.data());
    posix_spawn_file_actions_destroy(&acoes);
    if (falha != 0) {
        std::fprintf(stderr, "cannot start %s\n", argv[0]);
        return m;
    }
    int status = 0;
    rusage uso{};
    while (wait4(pid, &status, 0, &uso) < 0 && errno == EINTR) {
    }
    m.wall = std::chrono::duration<double>(std::chrono::steady_clock::now() - inicio).count();
    auto segundos = [](const timeval& t) { return double(t.tv_sec) + double(t.tv_usec) / 1e6; };
    m.user = segundos(uso.ru_utime);
    m.system = segundos(uso.ru_stime);
    m.rssGb = double(uso.ru_maxrss) / (1024.0 * 1024.0);
    m.faults = uso.ru_minflt;
    m.ok = WIFEXITED(status) && WEXITSTATUS(status) == 0;
    if (!m.ok) {
        QFile f(QString::fromStdString(erros));
        f.open(QIODevice::ReadOnly);
        std::fprintf(stderr, "zvhost %s failed:\n%s\n", qPrintable(args.join(' ')),
                     f.readAll().constData());
    }
    return m;
}

struct Linha {
    QString comando;
    int terminais = 0;
    Medida lista, base;
};

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QStringList sizes = app.arguments().mid(1);
    int vezes = 3;
    const int opcao = int(sizes.indexOf("--runs"));
    if (opcao >= 0) {
        vezes = opcao + 1 < sizes.size() ? sizes[opcao + 1].toInt() : 0;
        if (vezes < 1) {
            std::fprintf(stderr,
                         "usage: bench_terminal_list [--runs N] [--commands A,B] [SIZE...]\n");
            return 2;
        }
        sizes.erase(sizes.begin() + opcao, sizes.begin() + opcao + 2);
    }
    // Every list command the module has today, or those named after --commands.
    // The wire list measures along the generated projects' layout routes.
    QStringList comandos{"gerarListaBornesGrf", "gerarListaFiosGrf", "gerarListaMateriaisGrf",
                         "gerarListaCabosGrf", "gerarListaBornesDwg"};
    if (const int escolha = int(sizes.indexOf("--commands")); escolha >= 0) {
        const QStringList nomes = escolha + 1 < sizes.size()
                                      ? sizes[escolha + 1].split(',', Qt::SkipEmptyParts)
                                      : QStringList();
        if (nomes.isEmpty() || std::any_of(nomes.begin(), nomes.end(), [&](const QString& n) {
                return !comandos.contains(n);
            })) {
            std::fprintf(stderr,
                         "usage: bench_terminal_list [--runs N] [--commands A,B] [SIZE...]\n"
                         "commands: %s\n",
                         qPrintable(comandos.join(',')));
            return 2;
        }
        comandos = nomes;
        sizes.erase(sizes.begin() + escolha, sizes.begin() + escolha + 2);
    }
    if (sizes.isEmpty()) sizes = QStringList{"20000", "80000"};
    QTemporaryDir folder;
    const QString data = folder.filePath("data"), product = folder.filePath("product") + "/";
    QDir().mkpath(data);
    QDir().mkpath(product + "config");
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert("ZV_DATA_DIR", data);
    env.insert("ZV_PRODUCT_DIR", product);
    if (!env.contains("ZV_HUGE_PAGES")) env.insert("ZV_HUGE_PAGES", "0");
    const QString source = ZV_SOURCE_DIR;
    for (const char* sub : {"templates", "config"}) {
        QDir().mkpath(product + sub);
        for (const QString& f : QDir(source + "/data/" + sub).entryList(QDir::Files))
            QFile::copy(source + "/data/" + sub + "/" + f, product + sub + "/" + f);
    }
    const QString catalogue = source + "/data/catalogue/";
    if (!run({"catalogue", "--build", data + "/catalogo.db", catalogue + "catalogo-esquema.sql",
              catalogue + "catalogo-dados.sql"},
             env, folder.path())
             .ok ||
        !run({"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + data + "/",
              "DBName=catalogo.db", "libLang=1"},
             env, folder.path())
             .ok)
        return 1;
    // Every project first: the runs then take the sizes in turn.
    std::vector<QString> projetos;
    for (const QString& size : sizes) {
        projetos.push_back(folder.filePath("p" + size + ".dxf"));
        // Numbers run on through the project, so that the jumpers are linked.
        if (!run({"generate", "--out", projetos.back(), "--seed", "7", "--terminals", size,
                  "--numbers", "project", "--data", product},
                 env, folder.path())
                 .ok)
            return 1;
    }
    const QString saida = folder.filePath("out.dxf");
    // Runs by rounds: each round takes every command and every size in turn, so that a spell
    // of load on the machine falls on one run of many commands, not on every run of one.
    const std::size_t n = std::size_t(comandos.size()) * projetos.size();
    std::vector<std::vector<Medida>> bases(n), listas(n);
    for (int vez = 1; vez <= vezes; ++vez) {
        for (qsizetype c = 0; c < comandos.size(); ++c) {
            for (std::size_t t = 0; t < projetos.size(); ++t) {
                const std::size_t k = std::size_t(c) * projetos.size() + t;
                // Back to back, so that both see the same load on the machine.
                bases[k].push_back(run({"--quiet", projetos[t], "-o", saida}, env, folder.path()));
                listas[k].push_back(run({"--quiet", "--load", product + "config/zvconfig.lsp",
                                         projetos[t], "-o", saida, comandos[c]},
                                        env, folder.path()));
                if (!bases[k].back().ok || !listas[k].back().ok) return 1;
                const Medida& a = listas[k].back();
                const Medida& b = bases[k].back();
                std::printf(
                    "%s, %s terminals, run %d: %.2f s (user %.2f, sys %.2f, %ldk faults), "
                    "open+save %.2f s (user %.2f, sys %.2f, %ldk faults)\n",
                    qPrintable(comandos[c]), qPrintable(sizes[qsizetype(t)]), vez, a.wall, a.user,
                    a.system, a.faults / 1000, b.wall, b.user, b.system, b.faults / 1000);
                std::fflush(stdout);
            }
        }
    }
    std::vector<Linha> linhas;
    for (qsizetype c = 0; c < comandos.size(); ++c)
        for (std::size_t t = 0; t < projetos.size(); ++t) {
            const std::size_t k = std::size_t(c) * projetos.size() + t;
            linhas.push_back(
                {comandos[c], sizes[qsizetype(t)].toInt(), Melhor(listas[k]), Melhor(bases[k])});
        }
    for (const QString& projeto : projetos)
        QFile::remove(projeto);
    QFile::remove(saida);
    // The table by size, then by command.
    std::stable_sort(linhas.begin(), linhas.end(),
                     [](const Linha& a, const Linha& b) { return a.terminais < b.terminais; });

    std::printf("\n%-22s %6s %7s %7s %6s %7s %7s %6s %6s %6s %8s %8s %6s %6s %5s\n", "command",
                "terms", "list s", "o+s s", "ratio", "list us", "o+s us", "us rat", "lst sy",
                "o+s sy", "lst kflt", "o+s kflt", "lst GB", "o+s GB", "mem");
    for (const Linha& l : linhas)
        std::printf(
            "%-22s %6d %7.2f %7.2f %6.2f %7.2f %7.2f %6.2f %6.2f %6.2f %8ld %8ld %6.2f %6.2f "
            "%5.2f\n",
            qPrintable(l.comando), l.terminais, l.lista.wall, l.base.wall,
            l.lista.wall / l.base.wall, l.lista.user, l.base.user, l.lista.user / l.base.user,
            l.lista.system, l.base.system, l.lista.faults / 1000, l.base.faults / 1000,
            l.lista.rssGb, l.base.rssGb, l.lista.rssGb / l.base.rssGb);
    bool passa = true;
    for (const QString& comando : comandos) {
        const Linha *menor = nullptr, *maior = nullptr;
        for (const Linha& l : linhas) {
            if (l.comando != comando) continue;
            if (l.lista.wall > 3 * l.base.wall) passa = false;
            if (!menor || l.terminais < menor->terminais) menor = &l;
            if (!maior || l.terminais > maior->terminais) maior = &l;
        }
        if (!maior) continue;
        // The memory goal is the terminal list's; the others' ratios are in the table.
        if (comando == "gerarListaBornesGrf" && maior->lista.rssGb > 1.4 * maior->base.rssGb)
            passa = false;
        if (menor != maior) {
            // Linear growth plus 12.5%: 4.5 for sizes 4 times apart.
            const double escala = double(maior->terminais) / menor->terminais;
            const double limite = 1.125 * escala;
            const double razao = maior->lista.wall / menor->lista.wall;
            std::printf(
                "%s %d/%d: wall ratio %.2f (goal under %.2f), user ratio %.2f, "
                "faults ratio %.2f\n",
                qPrintable(comando), maior->terminais, menor->terminais, razao, limite,
                maior->lista.user / menor->lista.user,
                double(maior->lista.faults) / double(menor->lista.faults));
            if (razao >= limite) passa = false;
        }
    }
    std::printf(
        "%s: every list within 3x open+save, the terminal list's peak memory at the largest "
        "size within 1.4x, size ratio within 1.125x linear\n",
        passa ? "PASS" : "FAIL");
    return 0;
}
