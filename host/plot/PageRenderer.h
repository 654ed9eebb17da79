#pragma once
// Draws the drawing database into any QPaintDevice (PDF, image, metafile, a window): lines,
// polylines with widths and bulges, circles, arcs, ellipses, splines by their control
// points, solids, texts and attributes, multi-line texts, block references (nested, scaled,
// rotated, mirrored), hatches, with layer and entity colours and line weights. Entities on
// frozen or off layers are not drawn.
#include <QColor>
#include <QFont>
#include <QHash>
#include <QRectF>
#include <QTransform>

#include <span>
#include <string>
#include <string_view>
#include <unordered_map>

class QPainter;
class QPainterPath;

namespace zvdb {
class BlockRecord;
class Database;
class Entity;
}  // namespace zvdb

namespace zvplot {

struct RenderOptions {
    // Draw line weights; without them every line is as thin as the device allows.
    bool lineWeights = true;
    // Every colour black: the monochrome plot style.
    bool monochrome = false;
    // The paper: colour 7 (white on a dark screen) is drawn in the contrasting colour.
    QColor background = Qt::white;
};

class PageRenderer {
public:
    explicit PageRenderer(const zvdb::Database& database, RenderOptions options = {});

    // Draws the entities of model space that are visible, so that `window` (drawing
    // coordinates) fills `target` (the painter's device coordinates), the aspect kept and
    // the window centred. The target is filled with the background first.
    void render(QPainter& painter, const QRectF& target, const QRectF& window);
    // The same for a chosen list of model-space entities (a page's).
    void render(QPainter& painter, const QRectF& target, const QRectF& window,
                std::span<zvdb::Entity* const> entities);

    // The bounds of the visible model-space entities; empty when nothing shows.
    static QRectF visibleExtents(const zvdb::Database& database);
    // The bounds of these entities (a page's, already known to show).
    static QRectF extentsOf(std::span<zvdb::Entity* const> entities);
    // Drawing coordinates (y up) to device coordinates (y down), aspect kept, centred.
    static QTransform windowToTarget(const QRectF& window, const QRectF& target);
    // The colour of an index of the drawing's 256-colour palette.
    static QColor indexColor(int index);
    // The font that draws a text style: its TrueType face when the system has it, else the
    // fallback face (DejaVu Sans).
    QFont styleFont(std::string_view style);

private:
    struct Context;
    struct LayerLook {
        bool visible = true;
        QColor color;
        int weight = -3;  // hundredths of a millimetre; -3 the default
    };
    struct TextRun;

    void drawEntity(QPainter& painter, const zvdb::Entity& entity, const Context& context);
    void drawBlock(QPainter& painter, const zvdb::BlockRecord& block, const Context& context);
    void drawInsert(QPainter& painter, const zvdb::Entity& insert, const Context& context);
    void drawPolyline(QPainter& painter, const zvdb::Entity& polyline, const Context& context,
                      const QColor& color, double pen);
    void drawHatch(QPainter& painter, const zvdb::Entity& hatch, const Context& context,
                   const QColor& color);
    void drawText(QPainter& painter, const TextRun& run, const Context& context);
    void drawMText(QPainter& painter, const zvdb::Entity& mtext, const Context& context,
                   const QColor& color);

    const LayerLook& layerLook(std::string_view name);
    bool visible(const zvdb::Entity& entity, const Context& context);
    QColor colorOf(const zvdb::Entity& entity, const Context& context);
    int weightOf(const zvdb::Entity& entity, const Context& context);
    double penWidth(int weight) const;
    void strokePath(QPainter& painter, const QPainterPath& path, const QColor& color, double width);

    const zvdb::Database& database_;
    RenderOptions options_;
    double pixelsPerMm_ = 1.0;
    struct NameHash {
        using is_transparent = void;
        std::size_t operator()(std::string_view name) const {
            return std::hash<std::string_view>()(name);
        }
    };
    std::unordered_map<std::string, LayerLook, NameHash, std::equal_to<>> layers_;
    QHash<QString, QFont> fonts_;
};

}  // namespace zvplot
