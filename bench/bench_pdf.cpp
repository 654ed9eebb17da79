// The PDF of all pages of the bench project (20,000 terminals, or the sizes given): each
// page printed by the host and joined, as the PDF export does it. Prints the time per page,
// the size per page, and the joined file against the sum of the single pages.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/DrawingFiles.h"
#include "app/HostDocument.h"
#include "drawing/Database.h"
#include "export/CEExportaPdf.h"

#include <QElapsedTimer>
#include <QFileInfo>
#include <QGuiApplication>
#include <QProcess>
#include <QTemporaryDir>

#include <cstdio>

int main(int argc, char** argv) {
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    qInstallMessageHandler([](QtMsgType, const QMessageLogContext&, const QString& message) {
        if (!message.startsWith(QLatin1String("QStandardPaths: XDG_RUNTIME_DIR not set")))
            std::fprintf(stderr, "%s\n", qPrintable(message));
    });
    QGuiApplication app(argc, argv);
    QStringList sizes = QCoreApplication::arguments().mid(1);
    if (sizes.isEmpty()) sizes = QStringList{"20000"};
    QTemporaryDir folder;
    qputenv("TMPDIR", folder.path().toUtf8());
    bool pass = true;
    for (const QString& size : sizes) {
        const QString project = folder.filePath("bench-" + size + ".dxf");
        QProcess generate;
        generate.start(ZV_BIN_DIR "/zvhost", {"generate", "--out", project, "--seed", "7",
                                              "--terminals", size, "--numbers", "project"});
        if (!generate.waitForFinished(600000) || generate.exitCode() != 0) {
            std::printf("could not generate the %s-terminal project\n", qPrintable(size));
            return 1;
        }
        QString error;
        auto database = zvhost::readDrawing(project, &error);
        if (!database) {
            std::printf("%s\n", qPrintable(error));
            return 1;
        }
        QString log;
        QTextStream out(&log), err(&log);
        zvhost::Application host(std::make_unique<zvhost::ConsoleUserInterface>(out, err, false),
                                 out);
        host.setExecutableFolder(ZV_BIN_DIR);
        host.openDocument(project, std::move(database));
        CEExportaPdf exporta({{"PDF_PAPER_SIZE_PZ", "A3 (420 x 297 mm)"},
                              {"PDF_ORIENTATION_LP", "L"},
                              {"PDF_SMART_SN", "N"},
                              {"PDF_PESOLINHA_SN", "S"}},
                             nullptr);
        const QString target = folder.filePath("bench-" + size + ".pdf");
        QElapsedTimer timer;
        timer.start();
        const bool written = exporta.Exporta(target);
        const double seconds = timer.elapsed() / 1000.0;
        const int pages = exporta.PaginasImpressas.size();
        const qint64 joined = QFileInfo(target).size();
        if (!written || pages == 0) {
            std::printf("%s terminals: the PDF was not written\n%s", qPrintable(size),
                        qPrintable(log));
            return 1;
        }
        const double perPage = seconds * 1000.0 / pages;
        const double ratio = double(joined) / double(std::max<qint64>(exporta.BytesPaginas, 1));
        std::printf(
            "%s terminals: %d pages in %.2f s, %.1f ms a page; joined PDF %.1f KiB, "
            "%.1f KiB a page; single pages %.1f KiB together, joined/single %.2f\n",
            qPrintable(size), pages, seconds, perPage, joined / 1024.0, joined / 1024.0 / pages,
            exporta.BytesPaginas / 1024.0, ratio);
        const bool ok = perPage < 50.0 && ratio <= 1.5;
        std::printf("%s: %s (goals: under 50 ms a page, joined within 1.5 times the pages)\n",
                    ok ? "PASS" : "FAIL", qPrintable(size));
        pass = pass && ok;
    }
    return pass ? 0 : 1;
}
