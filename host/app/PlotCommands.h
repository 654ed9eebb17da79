#pragma once
// The host's print and export commands, drawn by the page renderer (host/plot).
#include <QString>
#include <QStringList>

namespace zvplot {
struct PlotRequest;
}

namespace zvhost {

class Application;
class HostDocument;

void registerPlotCommands(Application& app);

// What "-PRINT" was asked, read from its answers. False with `error` set when they don't
// make a plot this host can do.
struct PrintAnswers {
    QString device;  // "PDF", "PNG" or "EMF", from the device name
    double paperA = 0, paperB = 0;
    bool landscape = true;
    bool extents = true;  // the drawing's extents, else the window below
    double x1 = 0, y1 = 0, x2 = 0, y2 = 0;
    int dpi = 300;
    QString styleTable;
    bool lineWeights = false;
    QString file;
};
bool parsePrintAnswers(const QStringList& tokens, PrintAnswers& answers, QString* error);

}  // namespace zvhost
