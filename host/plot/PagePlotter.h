#pragma once
// One page of the drawing as a file: a PDF page at a paper size, a PNG image, an enhanced
// metafile. Every file is written whole to a temporary file beside the target and renamed
// over it only when all went well (zvsdk::AtomicFile); a failure leaves the target as it
// was and says why.
#include "PageRenderer.h"

#include <QRectF>
#include <QSizeF>
#include <QString>

#include <vector>

namespace zvdb {
class Database;
class Entity;
}  // namespace zvdb

namespace zvplot {

struct PlotRequest {
    // What is plotted, in drawing coordinates; an empty window plots the visible extents.
    QRectF window;
    // The two sides of the paper in millimetres, in either order: the orientation says
    // which side runs across.
    QSizeF paperMm{420, 297};
    bool landscape = true;
    // Resolution of the PDF's device and of images.
    int dpi = 300;
    RenderOptions render;
    // The entities to draw (a page's); null draws all of model space.
    const std::vector<zvdb::Entity*>* entities = nullptr;
};

class PagePlotter {
public:
    // The paper as it lies: landscape puts the longer side across.
    static QSizeF orientedPaper(const QSizeF& sides, bool landscape);

    static bool writePdf(const zvdb::Database& database, const PlotRequest& request,
                         const QString& path, QString* error);
    // An image of the paper at the request's resolution.
    static bool writePng(const zvdb::Database& database, const PlotRequest& request,
                         const QString& path, QString* error);
    static bool writeEmf(const zvdb::Database& database, const PlotRequest& request,
                         const QString& path, QString* error);
    // The page in memory, for callers that join pages themselves.
    static QByteArray pdfBytes(const zvdb::Database& database, const PlotRequest& request);

private:
    static QRectF windowOf(const zvdb::Database& database, const PlotRequest& request);
};

}  // namespace zvplot
