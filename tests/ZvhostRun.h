#pragma once
// Runs the built zvhost as a user would, for the tests that drive it from outside.
#include <QProcess>
#include <QString>
#include <QStringList>

namespace zvtest {

struct HostRun {
    int status = -1;  // -1 when it did not finish in time
    QString out;
    QString err;
};

inline HostRun runZvhost(
    const QStringList& arguments,
    const QProcessEnvironment& environment = QProcessEnvironment::systemEnvironment(),
    const QString& folder = QString(), int timeoutMs = 300000) {
    QProcess process;
    process.setProcessEnvironment(environment);
    if (!folder.isEmpty()) process.setWorkingDirectory(folder);
    process.start(QStringLiteral(ZV_BIN_DIR "/zvhost"), arguments);
    process.closeWriteChannel();
    HostRun run;
    if (!process.waitForFinished(timeoutMs)) return run;
    run.status = process.exitCode();
    run.out = QString::fromUtf8(process.readAllStandardOutput());
    run.err = QString::fromUtf8(process.readAllStandardError());
    return run;
}

}  // namespace zvtest
