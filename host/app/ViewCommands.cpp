#include "ViewCommands.h"

#include "Application.h"
#include "HostDocument.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"

#include <QStringList>

namespace zvhost {

namespace {

// "x,y[,z]" as a point; false when it is not one.
bool parsePoint(const QString& text, double& x, double& y) {
    const QStringList parts = text.split(',');
    bool okX = false, okY = false;
    if (parts.size() < 2) return false;
    x = parts[0].trimmed().toDouble(&okX);
    y = parts[1].trimmed().toDouble(&okY);
    return okX && okY;
}

bool zoomWindow(HostDocument& document, const QStringList& corners) {
    double x1, y1, x2, y2;
    if (corners.size() < 2 || !parsePoint(corners[0], x1, y1) || !parsePoint(corners[1], x2, y2))
        return false;
    document.setView({qMin(x1, x2), qMin(y1, y2), qMax(x1, x2), qMax(y1, y2)});
    return true;
}

// What shows: model-space entities on layers that are not frozen.
bool zoomExtents(HostDocument& document) {
    zvdb::Database* db = document.database();
    if (!db || !db->modelSpace()) return false;
    document.showExtents();
    return true;
}

// Window and extents set the view; all shows the extents; the other ways (previous,
// centre, scale...) leave it, as there is no screen whose view they would change.
bool zoom(HostDocument& document, const QStringList& args) {
    const QString option = args.value(0).toUpper().remove('_');
    if (option == "W" || option == "WINDOW") return zoomWindow(document, args.mid(1));
    if (option == "E" || option == "EXTENTS" || option == "A" || option == "ALL")
        return zoomExtents(document);
    return true;
}

}  // namespace

void registerViewCommands(Application& app) {
    app.registerHostCommand("ZOOM", zoom);
    // Nothing is drawn on screen by this host: what a start-up file asks of the display
    // (regenerations, redraws, resolution, pans, visual styles) has nothing to change.
    for (const char* name : {"REGEN", "REGENALL", "REDRAW", "REDRAWALL", "VIEWRES", "PAN", "-PAN",
                             "VSCURRENT", "-VSCURRENT", "SHADEMODE", "UCSICON"})
        app.registerHostCommand(name, [](HostDocument&, const QStringList&) { return true; });
}

}  // namespace zvhost
