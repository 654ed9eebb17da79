#include "HostCli.h"

#include <QGuiApplication>

#include <memory>
#include <string>

#include <csignal>
#include <cstdio>

int main(int argc, char** argv) {
    // A file-size limit makes a write fail with an error the save reports, instead of
    // ending the program halfway through a file.
    std::signal(SIGXFSZ, SIG_IGN);
    // Pages are drawn without a screen (fonts and painting need the GUI library's
    // application), unless a display platform is asked for.
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    // Without a session's runtime folder the platform says so on every start; that is no news
    // for a command-line program.
    static QtMessageHandler previous = nullptr;
    previous = qInstallMessageHandler(
        [](QtMsgType type, const QMessageLogContext& context, const QString& message) {
            if (message.startsWith(QLatin1String("QStandardPaths: XDG_RUNTIME_DIR not set")))
                return;
            if (previous)
                previous(type, context, message);
            else
                std::fprintf(stderr, "%s\n", qPrintable(qFormatLogMessage(type, context, message)));
        });
    // The subcommands that never draw a page start without the GUI library.
    const std::string first = argc > 1 ? argv[1] : "";
    const bool drawing =
        first != "lisp" && first != "dxf-info" && first != "catalogue" && first != "generate";
    std::unique_ptr<QCoreApplication> app;
    if (drawing)
        app = std::make_unique<QGuiApplication>(argc, argv);
    else
        app = std::make_unique<QCoreApplication>(argc, argv);
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
