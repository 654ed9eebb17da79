#include "PageView.h"

#include "ProjectPages.h"

#include "app/HostDocument.h"
#include "drawing/Database.h"
#include "plot/PageIndex.h"
#include "plot/PageRenderer.h"

#include <QMouseEvent>
#include <QPainter>
#include <QWheelEvent>

#include <cmath>

namespace zvdesk {

namespace {
const QColor kDesk(0x5a, 0x5f, 0x66);
constexpr double kMargin = 0.03;
}  // namespace

PageView::PageView(QWidget* parent) : QWidget(parent) {
    setObjectName("pageView");
    setMinimumSize(320, 240);
    setMouseTracking(false);
    setFocusPolicy(Qt::StrongFocus);
}

void PageView::setDocument(zvhost::HostDocument* document) {
    document_ = document;
    page_.clear();
    entities_.clear();
    extents_ = {};
    window_ = {};
    refresh();
}

void PageView::setPage(const QString& page) {
    page_ = page;
    collect();
    fit();
}

void PageView::collect() {
    entities_.clear();
    extents_ = {};
    if (!document_ || !document_->database()) return;
    const zvplot::PageIndex& index = document_->plotIndex();
    if (page_.isEmpty())
        entities_ = index.visibleEntities();
    else
        entities_ = index.entitiesOn(
            zvplot::PageIndex::pageLayers(*document_->database(), page_.toStdString()));
    extents_ = extentsOf(entities_);
}

void PageView::hold(bool held) {
    held_ = held;
    dragging_ = false;
    dragOffset_ = {};
    if (!held) refresh();
}

void PageView::refresh() {
    if (document_ && document_->database()) {
        // Entities added or erased since: gather the page again, keep the view.
        const QRectF window = window_;
        collect();
        window_ = window.isValid() ? window : extents_;
    }
    dirty_ = true;
    update();
}

void PageView::fit() {
    if (held_) return;
    if (extents_.isEmpty()) {
        window_ = QRectF(0, 0, 420, 297);
    } else {
        const double mx = extents_.width() * kMargin, my = extents_.height() * kMargin;
        window_ = extents_.adjusted(-mx, -my, mx, my);
        if (window_.width() <= 0) window_.setWidth(1);
        if (window_.height() <= 0) window_.setHeight(1);
    }
    dirty_ = true;
    update();
}

void PageView::zoom(double factor, const QPointF& about) {
    if (held_ || !window_.isValid() || factor <= 0) return;
    const QTransform toScreen = zvplot::PageRenderer::windowToTarget(window_, QRectF(rect()));
    bool invertible = false;
    const QTransform toDrawing = toScreen.inverted(&invertible);
    if (!invertible) return;
    const QPointF fixed = toDrawing.map(about);
    // Neither closer than a micron a pixel nor farther than a kilometre a pixel.
    const double width = std::clamp(window_.width() / factor, 1e-3, 1e9);
    const double height = window_.height() * width / window_.width();
    const double fx = (fixed.x() - window_.left()) / window_.width();
    const double fy = (fixed.y() - window_.top()) / window_.height();
    window_ = QRectF(fixed.x() - fx * width, fixed.y() - fy * height, width, height);
    dirty_ = true;
    update();
}

void PageView::pan(const QPointF& pixels) {
    if (held_ || !window_.isValid() || width() <= 0 || height() <= 0) return;
    const QTransform toScreen = zvplot::PageRenderer::windowToTarget(window_, QRectF(rect()));
    const double scale = std::hypot(toScreen.m11(), toScreen.m12());
    if (scale <= 0) return;
    // Screen y runs down, drawing y up.
    window_.translate(-pixels.x() / scale, pixels.y() / scale);
    dirty_ = true;
    update();
}

void PageView::render() {
    picture_ = QImage(size() * devicePixelRatioF(), QImage::Format_RGB32);
    picture_.setDevicePixelRatio(devicePixelRatioF());
    picture_.fill(kDesk);
    dirty_ = false;
    if (!document_ || !document_->database() || !window_.isValid()) return;
    QPainter painter(&picture_);
    painter.setRenderHint(QPainter::Antialiasing);
    // White paper, as the page prints: colour 7 then draws black.
    zvplot::PageRenderer renderer(*document_->database());
    renderer.render(painter, QRectF(rect()), window_, entities_);
}

void PageView::paintEvent(QPaintEvent*) {
    // The entities the picture was made of may be changing under a running command.
    if (!held_ && (dirty_ || picture_.size() != size() * devicePixelRatioF())) render();
    QPainter painter(this);
    if (!dragOffset_.isNull()) painter.fillRect(rect(), kDesk);
    painter.drawImage(dragOffset_, picture_);
}

void PageView::resizeEvent(QResizeEvent*) {
    dirty_ = true;
}

void PageView::wheelEvent(QWheelEvent* event) {
    const double steps = event->angleDelta().y() / 120.0;
    if (steps != 0) zoom(std::pow(1.25, steps), event->position());
    event->accept();
}

void PageView::mousePressEvent(QMouseEvent* event) {
    if (held_) return;
    if (event->button() != Qt::LeftButton && event->button() != Qt::MiddleButton) return;
    dragging_ = true;
    dragFrom_ = event->pos();
    setCursor(Qt::ClosedHandCursor);
}

void PageView::mouseMoveEvent(QMouseEvent* event) {
    if (!dragging_) return;
    // The picture moves with the mouse; it is drawn again when the button is let go.
    dragOffset_ = event->pos() - dragFrom_;
    update();
}

void PageView::mouseReleaseEvent(QMouseEvent* event) {
    if (!dragging_) return;
    dragging_ = false;
    unsetCursor();
    const QPoint moved = event->pos() - dragFrom_;
    dragOffset_ = {};
    if (!moved.isNull()) pan(moved);
    update();
}

void PageView::mouseDoubleClickEvent(QMouseEvent*) {
    if (!held_) fit();
}

}  // namespace zvdesk
