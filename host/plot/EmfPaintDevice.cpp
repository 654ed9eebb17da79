#include "EmfPaintDevice.h"

#include "EmfCanvas.h"

#include <QFile>
#include <QPaintEngine>
#include <QPainterPath>
#include <QTextItem>

#include <cmath>

namespace zvplot {

class EmfPaintEngine : public QPaintEngine {
public:
    explicit EmfPaintEngine(EmfCanvas& canvas) : QPaintEngine(AllFeatures), canvas_(canvas) {}

    bool begin(QPaintDevice*) override { return true; }
    bool end() override { return true; }
    Type type() const override { return User; }
    void updateState(const QPaintEngineState& state) override {
        const DirtyFlags flags = state.state();
        if (flags & DirtyPen) pen_ = state.pen();
        if (flags & DirtyBrush) brush_ = state.brush();
        if (flags & DirtyTransform) transform_ = state.transform();
    }
    void drawPixmap(const QRectF&, const QPixmap&, const QRectF&) override {}

    void drawPath(const QPainterPath& path) override {
        const QList<QPolygonF> shapes = path.toSubpathPolygons(transform_);
        const bool fill = brush_.style() != Qt::NoBrush;
        const bool stroke = pen_.style() != Qt::NoPen;
        if (fill) {
            std::vector<EmfCanvas::Point> points;
            std::vector<int> counts;
            for (const QPolygonF& shape : shapes) {
                for (const QPointF& p : shape)
                    points.push_back(toDevice(p));
                counts.push_back(shape.size());
            }
            canvas_.setBrush(brush_.color().rgb());
            setPen(stroke);
            canvas_.polyPolygon(points, counts);
            return;
        }
        if (!stroke) return;
        setPen(true);
        for (const QPolygonF& shape : shapes) {
            std::vector<EmfCanvas::Point> points;
            for (const QPointF& p : shape)
                points.push_back(toDevice(p));
            canvas_.polyline(points);
        }
    }

    void drawPolygon(const QPointF* points, int count, PolygonDrawMode mode) override {
        QPainterPath path;
        if (count <= 0) return;
        path.moveTo(points[0]);
        for (int i = 1; i < count; ++i)
            path.lineTo(points[i]);
        if (mode != PolylineMode) path.closeSubpath();
        if (mode == PolylineMode) {
            const QBrush kept = brush_;
            brush_ = Qt::NoBrush;
            drawPath(path);
            brush_ = kept;
            return;
        }
        drawPath(path);
    }

    void drawTextItem(const QPointF& p, const QTextItem& item) override {
        const QFont font = item.font();
        const QPointF at = transform_.map(p);
        const QPointF x = transform_.map(QPointF(1, 0)) - transform_.map(QPointF(0, 0));
        const QPointF y = transform_.map(QPointF(0, 1)) - transform_.map(QPointF(0, 0));
        const double size = font.pixelSize() > 0 ? font.pixelSize() : font.pointSizeF();
        const int height = static_cast<int>(std::lround(size * std::hypot(y.x(), y.y())));
        // Device y grows downwards: a counter-clockwise angle turns x towards negative y.
        const int angle = static_cast<int>(std::lround(-std::atan2(x.y(), x.x()) * 1800 / M_PI));
        const QString text = item.text();
        const QString face = font.family();
        canvas_.text(static_cast<int>(std::lround(at.x())), static_cast<int>(std::lround(at.y())),
                     std::u16string(reinterpret_cast<const char16_t*>(text.utf16()), text.size()),
                     std::max(height, 1), (angle % 3600 + 3600) % 3600, pen_.color().rgb(),
                     std::u16string(reinterpret_cast<const char16_t*>(face.utf16()), face.size()));
    }

private:
    EmfCanvas::Point toDevice(const QPointF& p) const {
        return {static_cast<int>(std::lround(p.x())), static_cast<int>(std::lround(p.y()))};
    }
    void setPen(bool stroke) {
        if (!stroke) {
            canvas_.setPen(0, 0, true);
            return;
        }
        const double width = pen_.widthF() * std::sqrt(std::abs(transform_.determinant()));
        canvas_.setPen(pen_.color().rgb(), static_cast<int>(std::lround(width)));
    }

    EmfCanvas& canvas_;
    QPen pen_;
    QBrush brush_;
    QTransform transform_;
};

EmfPaintDevice::EmfPaintDevice(const QString& path, double widthMm, double heightMm)
    : canvas_(std::make_unique<EmfCanvas>()), widthMm_(widthMm), heightMm_(heightMm) {
    open_ = canvas_->open(QFile::encodeName(path).toStdString(), widthMm, heightMm);
    engine_ = std::make_unique<EmfPaintEngine>(*canvas_);
}

EmfPaintDevice::~EmfPaintDevice() = default;

bool EmfPaintDevice::finish() {
    if (!open_) return false;
    open_ = false;
    return canvas_->close();
}

QPaintEngine* EmfPaintDevice::paintEngine() const {
    return engine_.get();
}

int EmfPaintDevice::metric(PaintDeviceMetric metric) const {
    const double perMm = canvas_->unitsPerMm();
    switch (metric) {
        case PdmWidth:
            return static_cast<int>(widthMm_ * perMm);
        case PdmHeight:
            return static_cast<int>(heightMm_ * perMm);
        case PdmWidthMM:
            return static_cast<int>(widthMm_);
        case PdmHeightMM:
            return static_cast<int>(heightMm_);
        case PdmNumColors:
            return 0x1000000;
        case PdmDepth:
            return 24;
        case PdmDpiX:
        case PdmDpiY:
        case PdmPhysicalDpiX:
        case PdmPhysicalDpiY:
            return static_cast<int>(std::lround(perMm * 25.4));
        case PdmDevicePixelRatio:
            return 1;
        case PdmDevicePixelRatioScaled:
            return static_cast<int>(devicePixelRatioFScale());
    }
    return 0;
}

}  // namespace zvplot
