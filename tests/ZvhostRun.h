#pragma once
// Runs the built zvhost as a user would, for the tests that drive it from outside.
#include <QFile>
#include <QProcess>
#include <QString>
#include <QStringList>
#include <QTemporaryDir>

namespace zvtest {

// AddressSanitizer reserves terabytes of address space for its shadow memory, so a child
// under an address-space limit (prlimit --as) cannot even start in a sanitizer build.
#if defined(__SANITIZE_ADDRESS__)
inline constexpr bool kAddressSanitizer = true;
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
inline constexpr bool kAddressSanitizer = true;
#else
inline constexpr bool kAddressSanitizer = false;
#endif
#else
inline constexpr bool kAddressSanitizer = false;
#endif

struct HostRun {
    int status = -1;  // -1 when it did not finish in time
    QString out;
    QString err;
};

// zvhost under resource limits of its own, as prlimit(1) takes them: "--fsize=300000"
// (bytes a file may reach), "--as=400000000" (bytes of address space).
struct Limits {
    QStringList prlimit;
};

// A font configuration that reads the system's and writes its cache files into a folder of
// the test run. A program short of memory finds no fonts it can open; run as the superuser,
// its font library would then write empty caches over the system's, and every later program
// would draw its texts without the fonts.
inline QString privateFontConfig() {
    static QTemporaryDir folder;
    static const QString file = [] {
        const QString path = folder.filePath("fonts.conf");
        QFile conf(path);
        if (!conf.open(QIODevice::WriteOnly)) return QString();
        conf.write(
            QStringLiteral("<?xml version=\"1.0\"?>\n<fontconfig>\n  <cachedir>%1</cachedir>\n"
                           "  <include ignore_missing=\"yes\">/etc/fonts/fonts.conf</include>\n"
                           "</fontconfig>\n")
                .arg(folder.filePath("cache"))
                .toUtf8());
        return path;
    }();
    return file;
}

inline void startZvhost(QProcess& process, const QStringList& arguments, const Limits& limits) {
    if (limits.prlimit.isEmpty()) {
        process.start(QStringLiteral(ZV_BIN_DIR "/zvhost"), arguments);
        return;
    }
    QProcessEnvironment environment = process.processEnvironment();
    if (environment.isEmpty()) environment = QProcessEnvironment::systemEnvironment();
    const QString fonts = privateFontConfig();
    if (!fonts.isEmpty()) environment.insert("FONTCONFIG_FILE", fonts);
    process.setProcessEnvironment(environment);
    process.start(QStringLiteral("/usr/bin/prlimit"),
                  QStringList(limits.prlimit) << "--" << ZV_BIN_DIR "/zvhost" << arguments);
}

inline HostRun runZvhost(
    const QStringList& arguments,
    const QProcessEnvironment& environment = QProcessEnvironment::systemEnvironment(),
    const QString& folder = QString(), int timeoutMs = 300000, const Limits& limits = {}) {
    QProcess process;
    process.setProcessEnvironment(environment);
    if (!folder.isEmpty()) process.setWorkingDirectory(folder);
    startZvhost(process, arguments, limits);
    process.closeWriteChannel();
    HostRun run;
    if (!process.waitForFinished(timeoutMs)) return run;
    run.status = process.exitStatus() == QProcess::CrashExit ? 128 : process.exitCode();
    run.out = QString::fromUtf8(process.readAllStandardOutput());
    run.err = QString::fromUtf8(process.readAllStandardError());
    return run;
}

// The demo catalogue built into `folder` (ZV_DATA_DIR of `environment`) and the settings
// there that name it. Empty on success, else what zvhost said.
inline QString buildDemoCatalogue(const QString& folder, const QProcessEnvironment& environment) {
    const QString sql = QString(ZV_SOURCE_DIR) + "/data/catalogue/";
    HostRun run = runZvhost({"catalogue", "--build", folder + "/catalogo.db",
                             sql + "catalogo-esquema.sql", sql + "catalogo-dados.sql"},
                            environment);
    if (run.status != 0) return run.err.isEmpty() ? "catalogue --build failed" : run.err;
    run = runZvhost({"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + folder + "/",
                     "DBName=catalogo.db", "libLang=1"},
                    environment);
    if (run.status != 0) return run.err.isEmpty() ? "catalogue --set failed" : run.err;
    return {};
}

}  // namespace zvtest
