// zvexport DRAWING --pdf FILE [--smart] [--paper NAME] [--portrait] [--pages P1;P2...]
// zvexport DRAWING --png|--emf|--dxf FILE [--pages P1;P2...]
// The pages of a project as files, as the export command makes them for the kind PAGINAS.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/DrawingFiles.h"
#include "app/HostDocument.h"
#include "drawing/Database.h"
#include "export/CEExportaPaginas.h"
#include "export/CEExportaPdf.h"
#include "module/CIProgress.h"

#include <QFileInfo>
#include <QGuiApplication>
#include <QTextStream>

#include <csignal>
#include <cstdio>

int main(int argc, char** argv) {
    std::signal(SIGXFSZ, SIG_IGN);
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    // No session runtime folder is no news for a command-line program.
    qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString& message) {
        if (!message.startsWith(QLatin1String("QStandardPaths: XDG_RUNTIME_DIR not set")))
            std::fprintf(stderr, "%s\n", qPrintable(message));
    });
    QGuiApplication app(argc, argv);
    QTextStream out(stdout), err(stderr);
    const QStringList args = QCoreApplication::arguments().mid(1);
    QString drawing, target, format;
    CEExportaPdf::Opcoes options{{"PDF_PAPER_SIZE_PZ", "A3 (420 x 297 mm)"},
                                 {"PDF_ORIENTATION_LP", "L"},
                                 {"PDF_SMART_SN", "N"},
                                 {"PDF_PESOLINHA_SN", "S"}};
    for (int i = 0; i < args.size(); ++i) {
        const QString& a = args[i];
        const bool value = i + 1 < args.size();
        if ((a == "--pdf" || a == "--png" || a == "--emf" || a == "--dxf") && value) {
            format = a.mid(2);
            target = args[++i];
        } else if (a == "--pages" && value) {
            options["PAGINAS"] = args[++i];
        } else if (a == "--paper" && value) {
            options["PDF_PAPER_SIZE_PZ"] = args[++i];
        } else if (a == "--portrait") {
            options["PDF_ORIENTATION_LP"] = "P";
        } else if (a == "--smart") {
            options["PDF_SMART_SN"] = "S";
        } else if (!a.startsWith("--") && drawing.isEmpty()) {
            drawing = a;
        } else {
            drawing.clear();
            break;
        }
    }
    if (drawing.isEmpty() || target.isEmpty()) {
        err << "usage: zvexport DRAWING --pdf FILE [--smart] [--paper NAME] [--portrait]"
               " [--pages P1;P2...]\n"
               "       zvexport DRAWING --png|--emf|--dxf FILE [--pages P1;P2...]\n";
        return 2;
    }
    QString error;
    auto database = zvhost::readDrawing(drawing, &error);
    if (!database) {
        err << "zvexport: " << error << "\n";
        return 1;
    }
    auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out, err, false);
    zvhost::Application host(std::move(ui), out);
    host.setExecutableFolder(QCoreApplication::applicationDirPath());
    host.openDocument(QFileInfo(drawing).absoluteFilePath(), std::move(database));
    bool written = false;
    if (format == "pdf") {
        CIProgress progress;
        written = CEExportaPdf(options, &progress).Exporta(target);
    } else {
        const int kind = format == "png"   ? CEExportaPaginas::PNG
                         : format == "emf" ? CEExportaPaginas::EMF
                                           : CEExportaPaginas::DXF;
        written = CEExportaPaginas(options).Exporta(kind, target);
    }
    out.flush();
    if (!written) {
        err << "zvexport: " << target << " was not written\n";
        return 3;
    }
    return 0;
}
