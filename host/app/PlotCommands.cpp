#include "PlotCommands.h"

#include "Application.h"
#include "HostDocument.h"
#include "drawing/Database.h"
#include "plot/PageIndex.h"
#include "plot/PagePlotter.h"

#include <QDir>
#include <QFileInfo>

#include <memory>

namespace zvhost {

namespace {

// An answer as the prompt takes it: "_" (the global name) and case don't count.
QString word(const QString& token) {
    QString w = token.trimmed().toUpper();
    while (w.startsWith('_') || w.startsWith('.'))
        w.remove(0, 1);
    return w;
}

bool point(const QString& text, double& x, double& y) {
    const QStringList parts = text.split(',');
    bool okX = false, okY = false;
    if (parts.size() < 2) return false;
    x = parts[0].trimmed().toDouble(&okX);
    y = parts[1].trimmed().toDouble(&okY);
    return okX && okY;
}

// The file name as the module passes it: backslashes doubled, folders in either style.
QString fileName(QString name) {
    name.replace(QLatin1String("\\\\"), QLatin1String("/"));
    name.replace('\\', '/');
    return QDir::cleanPath(name);
}

// Plot styles this host knows by name; others must be files in the plot style folder.
bool knownStyle(const QString& name) {
    const QString lower = name.toLower();
    return lower == "monochrome.ctb" || lower == "monochrome.stb" || lower == "default.stb";
}

QString styleFolder() {
    const QString data = qEnvironmentVariable("ZV_DATA_DIR");
    return data.isEmpty() ? QString() : data + "/plotstyles";
}

bool fail(HostDocument& document, const QString& command, const QString& why) {
    document.printMessage("\n" + command + ": " + why + "\n");
    document.reportCommandResult(zvsdk::CommandResult::Failed);
    return false;
}

bool plot(HostDocument& document, const QString& command, const QString& format,
          zvplot::PlotRequest& request, const QString& path) {
    zvdb::Database* database = document.database();
    if (!database) return fail(document, command, "no drawing");
    if (path.isEmpty()) return fail(document, command, "no file name");
    const std::vector<zvdb::Entity*> entities = document.plotIndex().visibleEntities();
    request.entities = &entities;
    QString error;
    bool written = false;
    if (format == "PDF")
        written = zvplot::PagePlotter::writePdf(*database, request, path, &error);
    else if (format == "PNG")
        written = zvplot::PagePlotter::writePng(*database, request, path, &error);
    else if (format == "EMF")
        written = zvplot::PagePlotter::writeEmf(*database, request, path, &error);
    else
        return fail(document, command, format + " is not available in this edition");
    if (!written) return fail(document, command, error);
    return true;
}

bool print(HostDocument& document, const QStringList& tokens) {
    PrintAnswers answers;
    QString error;
    if (!parsePrintAnswers(tokens, answers, &error)) return fail(document, "-PRINT", error);
    zvplot::PlotRequest request;
    request.paperMm = QSizeF(answers.paperA, answers.paperB);
    request.landscape = answers.landscape;
    request.dpi = answers.dpi;
    request.render.lineWeights = answers.lineWeights;
    if (!answers.extents)
        request.window = QRectF(QPointF(answers.x1, answers.y1), QPointF(answers.x2, answers.y2));
    if (!answers.styleTable.isEmpty()) {
        const QString style = answers.styleTable;
        const bool found = knownStyle(style) || (!styleFolder().isEmpty() &&
                                                 QFileInfo(styleFolder() + "/" + style).isFile());
        // As a missing table does in any plot: the objects' own colours, and a word about it.
        if (!found)
            document.printMessage("\n-PRINT: plot style table " + style +
                                  " not found; plotting with the objects' colours\n");
        request.render.monochrome = style.toLower().startsWith("monochrome");
    }
    return plot(document, "-PRINT", answers.device, request, answers.file);
}

// "_.export FORMAT FILE": the view the document shows, on a sheet of its shape.
bool exportView(HostDocument& document, const QStringList& tokens) {
    if (tokens.size() < 2) return fail(document, "EXPORT", "a format and a file name are needed");
    const QString format = word(tokens[0]);
    const HostDocument::View& view = document.view();
    zvplot::PlotRequest request;
    request.window = QRectF(QPointF(view.minX, view.minY), QPointF(view.maxX, view.maxY));
    // A sheet 420 mm on its longer side, shaped like the view.
    const double w = std::max(view.maxX - view.minX, 1e-9),
                 h = std::max(view.maxY - view.minY, 1e-9);
    request.landscape = w >= h;
    request.paperMm = w >= h ? QSizeF(420, 420 * h / w) : QSizeF(420 * w / h, 420);
    request.dpi = 150;
    return plot(document, "EXPORT", format, request, fileName(tokens[1]));
}

}  // namespace

bool parsePrintAnswers(const QStringList& tokens, PrintAnswers& answers, QString* error) {
    int at = 0;
    auto next = [&](const char* what, QString& out) {
        if (at >= tokens.size()) {
            *error = QString("missing answer: %1").arg(QLatin1String(what));
            return false;
        }
        out = tokens[at++];
        return true;
    };
    auto number = [&](const char* what, double& out) {
        QString text;
        if (!next(what, text)) return false;
        bool ok = false;
        out = text.trimmed().toDouble(&ok);
        if (!ok) *error = QString("%1 is not a number: %2").arg(QLatin1String(what), text);
        return ok;
    };
    QString t;
    if (!next("detailed configuration", t)) return false;
    if (word(t) != "Y") {
        *error = "only the detailed configuration is answered by this host";
        return false;
    }
    if (!next("layout", t)) return false;
    if (!next("output device", t)) return false;
    const QString device = word(t);
    if (device.contains("PDF"))
        answers.device = "PDF";
    else if (device.contains("PNG"))
        answers.device = "PNG";
    else if (device.contains("EMF"))
        answers.device = "EMF";
    else {
        *error = "no such output device: " + t;
        return false;
    }
    // The device's name as the user sees it: it says nothing more here.
    if (!next("device name", t)) return false;
    if (!next("paper units", t)) return false;
    if (!number("paper height", answers.paperA) || !number("paper width", answers.paperB))
        return false;
    if (answers.paperA <= 0 || answers.paperB <= 0 || answers.paperA > 5000 ||
        answers.paperB > 5000) {
        *error = QString("no such paper: %1 x %2 mm").arg(answers.paperA).arg(answers.paperB);
        return false;
    }
    double margin = 0;
    for (int i = 0; i < 4; ++i)
        if (!number("margin", margin)) return false;
    if (!next("orientation", t)) return false;
    if (word(t) != "L" && word(t) != "P") {
        *error = "orientation is L or P, not " + t;
        return false;
    }
    answers.landscape = word(t) == "L";
    if (!next("upside down", t)) return false;
    if (!next("plot area", t)) return false;
    const QString area = word(t);
    if (area == "S" || area == "W") {
        QString a, b;
        if (!next("upper corner", a) || !next("lower corner", b)) return false;
        if (!point(a, answers.x2, answers.y2) || !point(b, answers.x1, answers.y1)) {
            *error = "the window's corners are not points: " + a + " " + b;
            return false;
        }
        answers.extents = false;
    } else if (area != "A" && area != "E" && area != "D") {
        *error = "no such plot area: " + t;
        return false;
    }
    if (!next("scale", t)) return false;
    if (word(t) == "R") {
        QString dpi;
        if (!next("resolution", dpi)) return false;
        answers.dpi = std::clamp(dpi.trimmed().toInt(), 100, 600);
        if (!next("scale", t)) return false;
    }
    if (!next("centre", t)) return false;
    if (!next("plot style", t)) return false;
    if (word(t) == "Y" && !next("plot style name", answers.styleTable)) return false;
    if (!next("line weights", t)) return false;
    answers.lineWeights = word(t) == "Y";
    if (!next("destination", t)) return false;
    if (!next("file name", t)) return false;
    answers.file = fileName(t);
    return true;
}

void registerPlotCommands(Application& app) {
    app.registerHostCommand("-PRINT", print);
    app.registerHostCommand("PRINT", print);
    app.registerHostCommand("EXPORT", exportView);
}

}  // namespace zvhost
