// The terminal list command timed from opening the drawing to saving it, on generated
// projects of 20,000 and 80,000 terminals (or the sizes given), with the demo catalogue and
// product data. Prints the seconds of each run, the processor time it took in the program
// and in the system, and the ratios. The system's part is mostly the first touch of fresh
// memory, whose cost per page grows with the footprint on some virtual machines: the user
// time's ratio is the one that tells how the program scales.
#include <QCoreApplication>
#include <QDir>
#include <QElapsedTimer>
#include <QProcess>
#include <QTemporaryDir>

#include <sys/resource.h>

#include <cstdio>

namespace {

QString zvhost() {
    return QString(ZV_BIN_DIR) + "/zvhost";
}

bool run(const QStringList& args, const QProcessEnvironment& env, const QString& folder) {
    QProcess process;
    process.setProcessEnvironment(env);
    process.setWorkingDirectory(folder);
    process.start(zvhost(), args);
    process.closeWriteChannel();
    process.waitForFinished(-1);
    if (process.exitCode() != 0)
        std::fprintf(stderr, "%s\n", process.readAllStandardError().constData());
    return process.exitCode() == 0;
}

// Processor seconds of the finished child processes so far, in the program and the system.
std::pair<double, double> childTimes() {
    rusage usage{};
    getrusage(RUSAGE_CHILDREN, &usage);
    auto seconds = [](const timeval& t) { return double(t.tv_sec) + t.tv_usec / 1e6; };
    return {seconds(usage.ru_utime), seconds(usage.ru_stime)};
}

}  // namespace

int main(int argc, char** argv) {
    QCoreApplication app(argc, argv);
    QStringList sizes = app.arguments().mid(1);
    if (sizes.isEmpty()) sizes = QStringList{"20000", "80000"};
    QTemporaryDir folder;
    const QString data = folder.filePath("data"), product = folder.filePath("product") + "/";
    QDir().mkpath(data);
    QDir().mkpath(product + "config");
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert("ZV_DATA_DIR", data);
    env.insert("ZV_PRODUCT_DIR", product);
    const QString source = ZV_SOURCE_DIR;
    for (const char* sub : {"templates", "config"}) {
        QDir().mkpath(product + sub);
        for (const QString& f : QDir(source + "/data/" + sub).entryList(QDir::Files))
            QFile::copy(source + "/data/" + sub + "/" + f, product + sub + "/" + f);
    }
    const QString catalogue = source + "/data/catalogue/";
    if (!run({"catalogue", "--build", data + "/catalogo.db", catalogue + "catalogo-esquema.sql",
              catalogue + "catalogo-dados.sql"},
             env, folder.path()) ||
        !run({"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + data + "/",
              "DBName=catalogo.db", "libLang=1"},
             env, folder.path()))
        return 1;
    std::vector<double> seconds, user;
    for (const QString& size : sizes) {
        const QString project = folder.filePath("p" + size + ".dxf");
        // Numbers run on through the project, so that the jumpers are linked.
        if (!run({"generate", "--out", project, "--seed", "7", "--terminals", size, "--numbers",
                  "project", "--data", product},
                 env, folder.path()))
            return 1;
        const auto [userBefore, systemBefore] = childTimes();
        QElapsedTimer timer;
        timer.start();
        if (!run({"--quiet", "--load", product + "config/zvconfig.lsp", project, "-o",
                  folder.filePath("l" + size + ".dxf"), "gerarListaBornesGrf"},
                 env, folder.path()))
            return 1;
        seconds.push_back(timer.elapsed() / 1000.0);
        const auto [userNow, systemNow] = childTimes();
        user.push_back(userNow - userBefore);
        std::printf("gerarListaBornesGrf, %s terminals: %.2f s (user %.2f s, system %.2f s)\n",
                    qPrintable(size), seconds.back(), user.back(), systemNow - systemBefore);
        QFile::remove(project);
    }
    if (seconds.size() == 2 && seconds[0] > 0 && user[0] > 0)
        std::printf("ratio: %.2f (goal: under 5), user time ratio: %.2f\n", seconds[1] / seconds[0],
                    user[1] / user[0]);
    return 0;
}
