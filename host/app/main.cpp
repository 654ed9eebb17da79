#include "HostCli.h"

#include <QCoreApplication>

#include <csignal>
#include <cstdio>

int main(int argc, char** argv) {
    // A file-size limit makes a write fail with an error the save reports, instead of
    // ending the program halfway through a file.
    std::signal(SIGXFSZ, SIG_IGN);
    QCoreApplication app(argc, argv);
    QCoreApplication::setApplicationName("zvhost");
    QTextStream out(stdout);
    QTextStream err(stderr);
    QTextStream in(stdin);
    out.setCodec("UTF-8");
    err.setCodec("UTF-8");
    in.setCodec("UTF-8");
    QStringList args = QCoreApplication::arguments();
    args.removeFirst();
    const int status = zvhost::runHost(args, out, err, in);
    out.flush();
    err.flush();
    return status;
}
