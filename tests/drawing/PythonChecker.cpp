#include "PythonChecker.h"

#include <QDir>
#include <QProcess>
#include <QTemporaryDir>

#include <memory>

namespace zvtest {

namespace {
const char* const kPython = "/usr/bin/python3";

QTemporaryDir& runFolder() {
    static QTemporaryDir folder;
    return folder;
}
}  // namespace

QString PythonChecker::missing() {
    QProcess process;
    process.start(kPython, {"-c", "import ezdxf"});
    if (!process.waitForFinished(60000) || process.exitStatus() != QProcess::NormalExit)
        return QStringLiteral("%1 could not be run; install python3 and python3-ezdxf (./zv deps)")
            .arg(kPython);
    if (process.exitCode() != 0)
        return QStringLiteral("%1 has no ezdxf module; install python3-ezdxf (./zv deps)")
            .arg(kPython);
    return {};
}

int PythonChecker::run(const QString& script, const QStringList& arguments, QString* output) {
    QProcess process;
    process.setProcessChannelMode(QProcess::MergedChannels);
    process.start(kPython, QStringList{QStringLiteral(ZV_TEST_DIR "/") + script} + arguments);
    const bool finished = process.waitForFinished(120000);
    if (output) *output = QString::fromUtf8(process.readAll());
    if (!finished || process.exitStatus() != QProcess::NormalExit) return -1;
    return process.exitCode();
}

QString PythonChecker::fixtureFolder(QString* output) {
    static QString folder;
    static QString log;
    static bool tried = false;
    if (!tried) {
        tried = true;
        const QString target = runFolder().path() + "/fixtures";
        if (run("make_fixtures.py", {target}, &log) == 0) folder = target;
    }
    if (output) *output = log;
    return folder;
}

QString PythonChecker::scratchFolder() {
    static int counter = 0;
    const QString path = runFolder().path() + QStringLiteral("/scratch%1").arg(++counter);
    QDir().mkpath(path);
    return path;
}

}  // namespace zvtest
