#pragma once
// Pages drawn into small images, and the ways the tests look at them: where the ink is,
// how much of it, and whether two drawings put their ink in the same places.
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "plot/PageRenderer.h"

#include <QGuiApplication>
#include <QImage>
#include <QPainter>

#include <gtest/gtest.h>

#include <memory>

namespace zvtest {

// Painting text needs the GUI library's application; the tests run without a screen. It is
// never destroyed: at exit the GUI library's own statics may already be gone.
inline void ensureGuiApplication() {
    if (QCoreApplication::instance()) return;
    if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
    static int argc = 1;
    static char name[] = "plot_tests";
    static char* argv[] = {name, nullptr};
    new QGuiApplication(argc, argv);  // it registers itself as the instance
}

// The drawing window of every scene: 100 by 100 units on a 200 by 200 pixel image, so a
// drawing point (x, y) lands on pixel (2x, 200 - 2y).
inline QPointF px(double x, double y) {
    return {2 * x, 200 - 2 * y};
}

inline QImage renderScene(const zvdb::Database& database, zvplot::RenderOptions options = {},
                          int dotsPerMeter = 3780) {
    QImage image(200, 200, QImage::Format_RGB32);
    image.setDotsPerMeterX(dotsPerMeter);
    image.setDotsPerMeterY(dotsPerMeter);
    QPainter painter(&image);
    zvplot::PageRenderer(database, options)
        .render(painter, QRectF(0, 0, 200, 200), QRectF(0, 0, 100, 100));
    return image;
}

// A white image to draw what is expected on, with the renderer's antialiasing.
inline QImage blankImage() {
    QImage image(200, 200, QImage::Format_RGB32);
    image.fill(Qt::white);
    return image;
}

inline bool isInk(QRgb pixel) {
    return qRed(pixel) < 200 || qGreen(pixel) < 200 || qBlue(pixel) < 200;
}

inline int inkCount(const QImage& image) {
    int count = 0;
    for (int y = 0; y < image.height(); ++y)
        for (int x = 0; x < image.width(); ++x)
            count += isInk(image.pixel(x, y));
    return count;
}

// The box around all ink; null when there is none.
inline QRect inkBox(const QImage& image) {
    QRect box;
    for (int y = 0; y < image.height(); ++y)
        for (int x = 0; x < image.width(); ++x)
            if (isInk(image.pixel(x, y))) box = box.united(QRect(x, y, 1, 1));
    return box;
}

// The share of `a`'s ink farther than `tolerance` pixels from any ink of `b`.
inline double strayInk(const QImage& a, const QImage& b, int tolerance) {
    int ink = 0, stray = 0;
    for (int y = 0; y < a.height(); ++y) {
        for (int x = 0; x < a.width(); ++x) {
            if (!isInk(a.pixel(x, y))) continue;
            ++ink;
            bool near = false;
            for (int dy = -tolerance; dy <= tolerance && !near; ++dy)
                for (int dx = -tolerance; dx <= tolerance && !near; ++dx) {
                    const int u = x + dx, v = y + dy;
                    near =
                        u >= 0 && v >= 0 && u < b.width() && v < b.height() && isInk(b.pixel(u, v));
                }
            stray += !near;
        }
    }
    return ink ? double(stray) / ink : 1.0;
}

// The two images put their ink in the same places, within two pixels, both ways.
inline void expectSameDrawing(const QImage& actual, const QImage& expected) {
    ASSERT_GT(inkCount(expected), 0);
    EXPECT_GT(inkCount(actual), 0);
    EXPECT_LT(strayInk(actual, expected, 2), 0.02) << "ink where none is expected";
    EXPECT_LT(strayInk(expected, actual, 2), 0.02) << "expected ink missing";
}

// A painter on the expected image, with the renderer's thin black pen.
inline std::unique_ptr<QPainter> expectedPainter(QImage& image) {
    auto painter = std::make_unique<QPainter>(&image);
    painter->setRenderHint(QPainter::Antialiasing);
    painter->setPen(QPen(Qt::black, 0));
    return painter;
}

class PlotTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() { ensureGuiApplication(); }
    zvdb::BlockRecord& model() { return *db.modelSpace(); }
    zvplot::RenderOptions thin() {
        zvplot::RenderOptions options;
        options.lineWeights = false;
        return options;
    }
    zvdb::Database db;
};

}  // namespace zvtest
