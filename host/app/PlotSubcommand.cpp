#include "DrawingFiles.h"
#include "HostCli.h"
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "plot/PageIndex.h"
#include "plot/PagePlotter.h"

#include <QFileInfo>

namespace zvhost {

namespace {

const char* const kUsage =
    "usage: zvhost plot DRAWING --out FILE.pdf|.png|.emf [--page LAYER] [--paper W,H]\n"
    "       [--portrait] [--dpi N] [--monochrome] [--no-lineweights]\n";

}  // namespace

// zvhost plot DRAWING --out FILE [--page LAYER] ...: one page (or what shows) as a file.
int runPlotSubcommand(CliContext& context) {
    QString drawing, out, page, paper = "420,297";
    zvplot::PlotRequest request;
    const QStringList& a = context.args;
    for (int i = 0; i < a.size(); ++i) {
        const QString& arg = a[i];
        const bool hasValue = i + 1 < a.size();
        if (arg == "--out" && hasValue) {
            out = a[++i];
        } else if (arg == "--page" && hasValue) {
            page = a[++i];
        } else if (arg == "--paper" && hasValue) {
            paper = a[++i];
        } else if (arg == "--dpi" && hasValue) {
            request.dpi = a[++i].toInt();
        } else if (arg == "--portrait") {
            request.landscape = false;
        } else if (arg == "--monochrome") {
            request.render.monochrome = true;
        } else if (arg == "--no-lineweights") {
            request.render.lineWeights = false;
        } else if (!arg.startsWith("--") && drawing.isEmpty()) {
            drawing = arg;
        } else {
            context.err << kUsage;
            return kExitUsage;
        }
    }
    const QStringList sides = paper.split(',');
    bool okW = false, okH = false;
    const double w = sides.value(0).toDouble(&okW), h = sides.value(1).toDouble(&okH);
    if (drawing.isEmpty() || out.isEmpty() || !okW || !okH || w <= 0 || h <= 0 ||
        request.dpi <= 0) {
        context.err << kUsage;
        return kExitUsage;
    }
    request.paperMm = QSizeF(w, h);
    QString error;
    const auto database = readDrawing(drawing, &error);
    if (!database) {
        context.err << "zvhost: " << error << "\n";
        return kExitFailure;
    }
    const zvplot::PageIndex index(*database);
    std::vector<zvdb::Entity*> entities;
    if (!page.isEmpty()) {
        if (!database->layer(page.toStdString())) {
            context.err << "zvhost: no such page: " << page << "\n";
            return kExitFailure;
        }
        const auto layers = zvplot::PageIndex::pageLayers(*database, page.toStdString());
        // The page asked for is shown, as the product shows a page: its layers thawed, in
        // this copy of the drawing only.
        for (const auto& name : layers)
            if (zvdb::LayerRecord* layer = database->layer(name)) layer->setFrozen(false);
        entities = index.entitiesOn(layers);
    } else {
        entities = index.visibleEntities();
    }
    request.entities = &entities;
    const QString format = QFileInfo(out).suffix().toLower();
    bool written = false;
    if (format == "pdf")
        written = zvplot::PagePlotter::writePdf(*database, request, out, &error);
    else if (format == "png")
        written = zvplot::PagePlotter::writePng(*database, request, out, &error);
    else if (format == "emf")
        written = zvplot::PagePlotter::writeEmf(*database, request, out, &error);
    else
        error = "no plot format for ." + format + " (pdf, png or emf)";
    if (!written) {
        context.err << "zvhost: " << error << "\n";
        return kExitFailure;
    }
    return kExitOk;
}

}  // namespace zvhost
