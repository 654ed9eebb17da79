#include "PagePlotter.h"

#include "EmfPaintDevice.h"

#include "drawing/Database.h"
#include "sdk/AtomicFile.h"

#include <QBuffer>
#include <QImage>
#include <QPageLayout>
#include <QPainter>
#include <QPdfWriter>

#include <algorithm>

namespace zvplot {

namespace {

void draw(QPainter& painter, const zvdb::Database& database, const PlotRequest& request,
          const QRectF& target, const QRectF& window) {
    PageRenderer renderer(database, request.render);
    if (request.entities)
        renderer.render(painter, target, window, *request.entities);
    else
        renderer.render(painter, target, window);
}

bool failWith(QString* error, const QString& text) {
    if (error) *error = text;
    return false;
}

bool save(const QString& path, const QByteArray& bytes, QString* error) {
    QString reason;
    if (zvsdk::saveFileAtomically(path, std::string_view(bytes.data(), size_t(bytes.size())),
                                  &reason))
        return true;
    return failWith(error, reason);
}

}  // namespace

QSizeF PagePlotter::orientedPaper(const QSizeF& sides, bool landscape) {
    const double longer = std::max(sides.width(), sides.height());
    const double shorter = std::min(sides.width(), sides.height());
    return landscape ? QSizeF(longer, shorter) : QSizeF(shorter, longer);
}

QRectF PagePlotter::windowOf(const zvdb::Database& database, const PlotRequest& request) {
    QRectF window = request.window.normalized();
    // A page's own entities give its extents without walking the whole drawing.
    if (window.isEmpty())
        window = request.entities ? PageRenderer::extentsOf(*request.entities)
                                  : PageRenderer::visibleExtents(database);
    if (window.isEmpty()) window = QRectF(0, 0, 1, 1);
    return window;
}

QByteArray PagePlotter::pdfBytes(const zvdb::Database& database, const PlotRequest& request) {
    QByteArray bytes;
    QBuffer buffer(&bytes);
    buffer.open(QIODevice::WriteOnly);
    {
        QPdfWriter writer(&buffer);
        writer.setCreator(QStringLiteral("ZVListas"));
        writer.setResolution(std::clamp(request.dpi, 72, 2400));
        const QSizeF paper = orientedPaper(request.paperMm, request.landscape);
        writer.setPageLayout(
            QPageLayout(QPageSize(paper, QPageSize::Millimeter, QString(), QPageSize::ExactMatch),
                        QPageLayout::Portrait, QMarginsF()));
        QPainter painter(&writer);
        const QRectF target(0, 0, writer.width(), writer.height());
        draw(painter, database, request, target, windowOf(database, request));
    }
    return bytes;
}

bool PagePlotter::writePdf(const zvdb::Database& database, const PlotRequest& request,
                           const QString& path, QString* error) {
    const QByteArray bytes = pdfBytes(database, request);
    if (bytes.isEmpty()) return failWith(error, "could not draw the page as PDF");
    return save(path, bytes, error);
}

bool PagePlotter::writePng(const zvdb::Database& database, const PlotRequest& request,
                           const QString& path, QString* error) {
    const QSizeF paper = orientedPaper(request.paperMm, request.landscape);
    const double perMm = std::clamp(request.dpi, 10, 1200) / 25.4;
    const QSize pixels(std::max(1, int(paper.width() * perMm)),
                       std::max(1, int(paper.height() * perMm)));
    // Some 40,000 by 40,000 pixels is as far as an image goes.
    if (qint64(pixels.width()) * pixels.height() > qint64(1) << 30)
        return failWith(error, "the image would be too large");
    QImage image(pixels, QImage::Format_RGB32);
    if (image.isNull()) return failWith(error, "not enough memory for the image");
    image.setDotsPerMeterX(int(perMm * 1000));
    image.setDotsPerMeterY(int(perMm * 1000));
    {
        QPainter painter(&image);
        draw(painter, database, request, QRectF(QPointF(0, 0), QSizeF(pixels)),
             windowOf(database, request));
    }
    QByteArray bytes;
    QBuffer buffer(&bytes);
    buffer.open(QIODevice::WriteOnly);
    if (!image.save(&buffer, "PNG")) return failWith(error, "could not encode the image");
    return save(path, bytes, error);
}

bool PagePlotter::writeEmf(const zvdb::Database& database, const PlotRequest& request,
                           const QString& path, QString* error) {
    zvsdk::AtomicFile file(path);
    if (!file.open()) return failWith(error, file.errorString());
    const QSizeF paper = orientedPaper(request.paperMm, request.landscape);
    {
        EmfPaintDevice device(file.temporaryPath(), paper.width(), paper.height());
        if (!device.isOpen()) return failWith(error, "could not save " + path + ": cannot write");
        {
            QPainter painter(&device);
            draw(painter, database, request, QRectF(0, 0, device.width(), device.height()),
                 windowOf(database, request));
        }
        if (!device.finish())
            return failWith(error,
                            "could not save " + path + ": the metafile was not written whole");
    }
    if (!file.commit()) return failWith(error, file.errorString());
    return true;
}

}  // namespace zvplot
