#pragma once
// One page of the drawing on screen, drawn by the page renderer: the wheel zooms about the
// cursor, a drag pans, fit shows the whole page. The picture is kept until the view, the
// size or the drawing changes.
#include <QImage>
#include <QPoint>
#include <QRectF>
#include <QWidget>

#include <string>
#include <vector>

namespace zvdb {
class Entity;
}

namespace zvhost {
class HostDocument;
}

namespace zvdesk {

class PageView : public QWidget {
public:
    explicit PageView(QWidget* parent = nullptr);

    // The document whose page is shown; null shows nothing.
    void setDocument(zvhost::HostDocument* document);
    // Shows a page (its layers as the page registry has them); empty shows what is visible.
    void setPage(const QString& page);
    const QString& page() const { return page_; }
    // The window of the drawing that shows, in drawing units.
    QRectF window() const { return window_; }
    void fit();
    // Zooms by `factor` (above 1 closer) about a point of the widget.
    void zoom(double factor, const QPointF& about);
    void zoom(double factor) { zoom(factor, rect().center()); }
    void pan(const QPointF& pixels);
    // Drops the picture: the drawing changed.
    void refresh();
    // While held (a command runs and changes the drawing) the last picture stays and the
    // view does not move; the drawing is read again when let go.
    void hold(bool held);
    bool held() const { return held_; }
    // How many entities the page has.
    std::size_t entityCount() const { return entities_.size(); }

protected:
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;
    void wheelEvent(QWheelEvent* event) override;
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;
    void mouseDoubleClickEvent(QMouseEvent* event) override;

private:
    void collect();
    void render();

    zvhost::HostDocument* document_ = nullptr;
    QString page_;
    std::vector<zvdb::Entity*> entities_;
    QRectF extents_;
    QRectF window_;
    QImage picture_;
    bool dirty_ = true;
    bool held_ = false;
    bool dragging_ = false;
    QPoint dragFrom_;
    QPoint dragOffset_;
};

}  // namespace zvdesk
