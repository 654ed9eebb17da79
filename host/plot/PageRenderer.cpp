#include "PageRenderer.h"

#include "TextMarkup.h"

#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/TextEntity.h"

#include <QFontDatabase>
#include <QFontMetricsF>
#include <QPaintDevice>
#include <QPainter>
#include <QPainterPath>

#include <algorithm>
#include <cmath>
#include <numbers>

namespace zvplot {

namespace {

constexpr double kPi = std::numbers::pi;
constexpr int kMaxNesting = 16;
constexpr int kDefaultWeight = 25;  // hundredths of a millimetre
constexpr int kFontPixels = 100;    // text is laid out at this size and scaled

double radians(double degrees) {
    return degrees * kPi / 180.0;
}

QTransform toQt(const zvdb::Transform& t) {
    // Only the drawing plane is plotted: the x and y rows of the linear part and the move.
    return QTransform(t.linear[0], t.linear[3], t.linear[1], t.linear[4], t.move.x, t.move.y);
}

// The entity's own coordinate system (its extrusion) as a plane transform; null when the
// entity lies in the world plane.
QTransform ocsOf(const zvdb::Entity& entity) {
    const zvdb::Point3 extrusion = entity.point(210, {0, 0, 1});
    if (std::abs(extrusion.x) < 1e-12 && std::abs(extrusion.y) < 1e-12 && extrusion.z > 0)
        return QTransform();
    return toQt(zvdb::Transform::fromOcs(extrusion));
}

double deviceScale(const QTransform& t) {
    return std::sqrt(std::abs(t.determinant()));
}

// Points of an arc around `c` from a0 to a1 (radians, in that direction), enough of them
// that the chords stay within a fraction of a device pixel.
int arcSteps(double radius, double sweep, const QTransform& t) {
    const double deviceRadius = radius * deviceScale(t);
    const int steps = static_cast<int>(std::abs(sweep) * std::sqrt(std::max(deviceRadius, 1.0)));
    return std::clamp(steps + 2, 4, 720);
}

void appendArc(QPainterPath& path, const QTransform& t, QPointF c, double rx, double ry,
               double rotation, double a0, double a1, bool start) {
    const int steps = arcSteps(std::max(rx, ry), a1 - a0, t);
    const double cr = std::cos(rotation), sr = std::sin(rotation);
    for (int i = 0; i <= steps; ++i) {
        const double a = a0 + (a1 - a0) * i / steps;
        const double x = rx * std::cos(a), y = ry * std::sin(a);
        const QPointF p = t.map(QPointF(c.x() + x * cr - y * sr, c.y() + x * sr + y * cr));
        if (i == 0 && start)
            path.moveTo(p);
        else
            path.lineTo(p);
    }
}

// The arc of a polyline segment with a bulge, without its first point.
void appendBulge(QPainterPath& path, const QTransform& t, QPointF p1, QPointF p2, double bulge) {
    const double chord = std::hypot(p2.x() - p1.x(), p2.y() - p1.y());
    if (std::abs(bulge) < 1e-9 || chord < 1e-12) {
        path.lineTo(t.map(p2));
        return;
    }
    const double theta = 4.0 * std::atan(bulge);
    const double radius = chord / (2.0 * std::sin(std::abs(theta) / 2.0));
    // The centre lies off the chord's middle, to the left for a positive bulge.
    const QPointF mid = (p1 + p2) / 2.0;
    const double dx = (p2.x() - p1.x()) / chord, dy = (p2.y() - p1.y()) / chord;
    const double sagitta = std::abs(bulge) * chord / 2.0;
    const double offset = radius - sagitta;
    const double side = bulge > 0 ? 1.0 : -1.0;
    const QPointF centre(mid.x() - dy * offset * side, mid.y() + dx * offset * side);
    const double a0 = std::atan2(p1.y() - centre.y(), p1.x() - centre.x());
    QPainterPath arc;
    appendArc(arc, t, centre, radius, radius, 0.0, a0, a0 + theta, true);
    for (int i = 1; i < arc.elementCount(); ++i)
        path.lineTo(arc.elementAt(i).x, arc.elementAt(i).y);
}

struct Vertex {
    QPointF p;
    double startWidth = 0, endWidth = 0, bulge = 0;
};

// The vertices of an LWPOLYLINE from its tags, or of a POLYLINE from its VERTEX entities.
std::vector<Vertex> polylineVertices(const zvdb::Entity& polyline) {
    std::vector<Vertex> out;
    if (polyline.isType("LWPOLYLINE")) {
        const auto tags = polyline.tags();
        const std::size_t end = polyline.xdataStart();
        const double constant = polyline.real(43, 0.0);
        for (std::size_t i = 1; i < end; ++i) {
            const zvdb::Tag& tag = tags[i];
            const double value = std::strtod(std::string(tag.value).c_str(), nullptr);
            if (tag.code == 10) {
                out.push_back({QPointF(value, 0), constant, constant, 0});
            } else if (out.empty()) {
                continue;
            } else if (tag.code == 20) {
                out.back().p.setY(value);
            } else if (tag.code == 40) {
                out.back().startWidth = value;
            } else if (tag.code == 41) {
                out.back().endWidth = value;
            } else if (tag.code == 42) {
                out.back().bulge = value;
            }
        }
        return out;
    }
    const double startWidth = polyline.real(40, 0.0), endWidth = polyline.real(41, 0.0);
    for (const zvdb::Entity* vertex : polyline.liveSubEntities()) {
        if (!vertex->isType("VERTEX")) continue;
        const zvdb::Point3 p = vertex->point(10);
        out.push_back({QPointF(p.x, p.y), vertex->real(40, startWidth), vertex->real(41, endWidth),
                       vertex->real(42, 0.0)});
    }
    return out;
}

// A cursor over an entity's tags, for the kinds whose groups repeat (hatches).
class TagCursor {
public:
    explicit TagCursor(const zvdb::Entity& entity)
        : tags_(entity.tags()), end_(entity.xdataStart()) {}
    bool atEnd() const { return index_ >= end_; }
    int code() const { return atEnd() ? -1 : tags_[index_].code; }
    double real() {
        return atEnd() ? 0.0 : std::strtod(std::string(tags_[index_++].value).c_str(), nullptr);
    }
    long integer() {
        return atEnd() ? 0 : std::strtol(std::string(tags_[index_++].value).c_str(), nullptr, 10);
    }
    void skip() { ++index_; }
    // Moves to the next tag with this code; false at the end.
    bool seek(int code) {
        while (!atEnd() && tags_[index_].code != code)
            ++index_;
        return !atEnd();
    }
    // The value of the tag with `code` if it comes next, else the fallback.
    double realIf(int code, double fallback) { return this->code() == code ? real() : fallback; }
    long integerIf(int code, long fallback) { return this->code() == code ? integer() : fallback; }
    QPointF point(int code) {
        const double x = realIf(code, 0.0);
        const double y = realIf(code + 10, 0.0);
        return {x, y};
    }

private:
    std::span<const zvdb::Tag> tags_;
    std::size_t end_;
    std::size_t index_ = 1;
};

void readHatchEdges(TagCursor& c, QPainterPath& path, const QTransform& t) {
    const long edges = c.integerIf(93, 0);
    bool first = true;
    for (long e = 0; e < edges && !c.atEnd(); ++e) {
        const long type = c.integerIf(72, 0);
        if (type == 1) {
            const QPointF a = c.point(10), b = c.point(11);
            if (first) path.moveTo(t.map(a));
            path.lineTo(t.map(a));
            path.lineTo(t.map(b));
        } else if (type == 2 || type == 3) {
            const QPointF centre = c.point(10);
            QPointF major(0, 0);
            if (type == 3) major = c.point(11);
            const double r = c.realIf(40, 0.0);
            double a0 = radians(c.realIf(50, 0.0)), a1 = radians(c.realIf(51, 360.0));
            const bool ccw = c.integerIf(73, 1) != 0;
            if (!ccw) a0 = -a0, a1 = -a1;
            if (ccw && a1 <= a0) a1 += 2 * kPi;
            if (!ccw && a1 >= a0) a1 -= 2 * kPi;
            double rx = r, ry = r, rotation = 0.0;
            if (type == 3) {
                rx = std::hypot(major.x(), major.y());
                ry = rx * r;
                rotation = std::atan2(major.y(), major.x());
            }
            QPainterPath arc;
            appendArc(arc, t, centre, rx, ry, rotation, a0, a1, true);
            for (int i = 0; i < arc.elementCount(); ++i) {
                const QPointF p(arc.elementAt(i).x, arc.elementAt(i).y);
                if (first && i == 0)
                    path.moveTo(p);
                else
                    path.lineTo(p);
            }
        } else if (type == 4) {
            // A spline edge is drawn through its control points.
            c.integerIf(94, 0);
            const bool rational = c.integerIf(73, 0) != 0;
            c.integerIf(74, 0);
            const long knots = c.integerIf(95, 0), controls = c.integerIf(96, 0);
            for (long k = 0; k < knots && c.code() == 40; ++k)
                c.real();
            for (long k = 0; k < controls && c.code() == 10; ++k) {
                const QPointF p = t.map(c.point(10));
                if (rational) c.realIf(42, 1.0);
                if (first && k == 0)
                    path.moveTo(p);
                else
                    path.lineTo(p);
            }
            if (c.code() == 97) {
                const long fits = c.integer();
                for (long k = 0; k < fits && c.code() == 11; ++k)
                    c.point(11);
            }
            if (c.code() == 12) c.point(12);
            if (c.code() == 13) c.point(13);
        } else {
            return;  // an edge we don't know: the rest of the loop can't be read
        }
        first = false;
    }
}

// The boundary loops of a hatch in device coordinates, and its pattern lines' angles and
// spacings in drawing units.
QPainterPath hatchBoundary(const zvdb::Entity& hatch, const QTransform& t) {
    QPainterPath path;
    path.setFillRule(Qt::OddEvenFill);
    TagCursor c(hatch);
    if (!c.seek(91)) return path;
    const long loops = c.integer();
    for (long loop = 0; loop < loops && c.seek(92); ++loop) {
        const long flags = c.integer();
        if (flags & 2) {
            const bool bulges = c.integerIf(72, 0) != 0;
            c.integerIf(73, 1);
            const long count = c.integerIf(93, 0);
            std::vector<Vertex> vertices;
            for (long k = 0; k < count && c.code() == 10; ++k) {
                Vertex v;
                v.p = c.point(10);
                if (bulges) v.bulge = c.realIf(42, 0.0);
                vertices.push_back(v);
            }
            for (std::size_t k = 0; k < vertices.size(); ++k) {
                if (k == 0)
                    path.moveTo(t.map(vertices[0].p));
                else
                    appendBulge(path, t, vertices[k - 1].p, vertices[k].p, vertices[k - 1].bulge);
            }
            if (vertices.size() > 1)
                appendBulge(path, t, vertices.back().p, vertices.front().p, vertices.back().bulge);
        } else {
            readHatchEdges(c, path, t);
        }
        path.closeSubpath();
        const long sources = c.integerIf(97, 0);
        for (long s = 0; s < sources && c.code() == 330; ++s)
            c.skip();
    }
    return path;
}

struct PatternLine {
    double angle = 45.0;   // degrees
    double spacing = 3.0;  // drawing units between parallel lines
    QPointF base;
};

std::vector<PatternLine> patternLines(const zvdb::Entity& hatch) {
    std::vector<PatternLine> lines;
    TagCursor c(hatch);
    if (c.seek(78)) {
        const long count = c.integer();
        for (long i = 0; i < count && c.seek(53); ++i) {
            PatternLine line;
            line.angle = c.real();
            const double bx = c.realIf(43, 0.0), by = c.realIf(44, 0.0);
            line.base = QPointF(bx, by);
            const double ox = c.realIf(45, 0.0), oy = c.realIf(46, 0.0);
            // The spacing is the offset's distance across the line's direction.
            const double a = radians(line.angle);
            line.spacing = std::abs(-ox * std::sin(a) + oy * std::cos(a));
            lines.push_back(line);
        }
    }
    if (lines.empty()) {
        PatternLine line;
        line.angle = 45.0 + hatch.real(52, 0.0);
        line.spacing = 3.0 * hatch.real(41, 1.0);
        lines.push_back(line);
    }
    return lines;
}

// TEXT's special codes: %%d degree, %%p plus-minus, %%c diameter, %%% percent, %%nnn a
// character by number; %%u and %%o (underline, overline) are dropped.
QString textCodes(const QString& in) {
    if (!in.contains(QLatin1String("%%"))) return in;
    QString out;
    out.reserve(in.size());
    for (int i = 0; i < in.size(); ++i) {
        if (in[i] != '%' || i + 2 >= in.size() || in[i + 1] != '%') {
            out += in[i];
            continue;
        }
        const QChar code = in[i + 2].toLower();
        if (code == 'd') {
            out += QChar(0x00B0);
        } else if (code == 'p') {
            out += QChar(0x00B1);
        } else if (code == 'c') {
            out += QChar(0x2300);
        } else if (code == '%') {
            out += '%';
        } else if (code == 'u' || code == 'o') {
        } else if (code.isDigit()) {
            int j = i + 2, number = 0;
            while (j < in.size() && j < i + 5 && in[j].isDigit())
                number = number * 10 + in[j++].digitValue();
            out += QChar(number);
            i = j - 1;
            continue;
        } else {
            out += in.mid(i, 3);
        }
        i += 2;
    }
    return out;
}

QString fromUtf8(std::string_view text) {
    return QString::fromUtf8(text.data(), static_cast<int>(text.size()));
}

}  // namespace

struct PageRenderer::Context {
    QTransform xf;  // drawing (or block) coordinates to device coordinates
    QColor blockColor = Qt::black;
    int blockWeight = -3;
    std::string_view blockLayer = "0";
    bool inBlock = false;
    int depth = 0;
};

struct PageRenderer::TextRun {
    QString text;
    QPointF position, alignment;
    double height = 1.0, rotation = 0.0, widthFactor = 1.0, oblique = 0.0;
    std::string_view style;
    int horizontal = 0, vertical = 0;
    bool backward = false, upsideDown = false;
    QColor color;
    QTransform ocs;
};

PageRenderer::PageRenderer(const zvdb::Database& database, RenderOptions options)
    : database_(database), options_(options) {}

QColor PageRenderer::indexColor(int index) {
    static const QRgb base[10] = {qRgb(0, 0, 0),      qRgb(255, 0, 0),     qRgb(255, 255, 0),
                                  qRgb(0, 255, 0),    qRgb(0, 255, 255),   qRgb(0, 0, 255),
                                  qRgb(255, 0, 255),  qRgb(255, 255, 255), qRgb(128, 128, 128),
                                  qRgb(192, 192, 192)};
    static const int grays[6] = {51, 91, 132, 173, 214, 255};
    index = std::abs(index);
    if (index < 10) return QColor(base[index]);
    if (index >= 250) {
        const int g = grays[std::min(index, 255) - 250];
        return QColor(g, g, g);
    }
    // 24 hues 15 degrees apart; in each, five values, each strong and then pale.
    static const double values[5] = {1.0, 0.8, 0.6, 0.5, 0.3};
    const int hue = (index - 10) / 10 * 15;
    const int step = (index - 10) % 10;
    return QColor::fromHsvF(hue / 360.0, step % 2 ? 0.5 : 1.0, values[step / 2]);
}

QTransform PageRenderer::windowToTarget(const QRectF& window, const QRectF& target) {
    const double w = std::max(window.width(), 1e-9), h = std::max(window.height(), 1e-9);
    const double scale = std::min(target.width() / w, target.height() / h);
    const double dx = target.center().x() - window.center().x() * scale;
    const double dy = target.center().y() + window.center().y() * scale;
    return QTransform(scale, 0, 0, -scale, dx, dy);
}

QRectF PageRenderer::visibleExtents(const zvdb::Database& database) {
    zvdb::BoundingBox box;
    if (!database.modelSpace()) return {};
    for (const zvdb::Entity* entity : database.modelSpace()->entities()) {
        const zvdb::LayerRecord* layer = database.layer(entity->layer());
        if (layer && (layer->isFrozen() || layer->isOff())) continue;
        box.add(zvdb::Extents::ofEntity(*entity, true));
    }
    if (box.isEmpty()) return {};
    return QRectF(QPointF(box.min.x, box.min.y), QPointF(box.max.x, box.max.y));
}

QRectF PageRenderer::extentsOf(std::span<zvdb::Entity* const> entities) {
    zvdb::BoundingBox box;
    for (const zvdb::Entity* entity : entities)
        box.add(zvdb::Extents::ofEntity(*entity, true));
    if (box.isEmpty()) return {};
    return QRectF(QPointF(box.min.x, box.min.y), QPointF(box.max.x, box.max.y));
}

const PageRenderer::LayerLook& PageRenderer::layerLook(std::string_view name) {
    auto it = layers_.find(name);
    if (it != layers_.end()) return it->second;
    LayerLook look;
    look.color = indexColor(7);
    if (const zvdb::LayerRecord* layer = database_.layer(name)) {
        look.visible = !layer->isFrozen() && !layer->isOff();
        look.color = layer->has(420) ? QColor(QRgb(layer->integer(420)))
                                     : indexColor(std::abs(layer->color()));
        look.weight = static_cast<int>(layer->integer(370, -3));
    }
    return layers_.emplace(std::string(name), look).first->second;
}

bool PageRenderer::visible(const zvdb::Entity& entity, const Context& context) {
    if (entity.integer(60, 0) == 1) return false;
    const std::string_view layer = entity.layer();
    // What lies on layer 0 in a block goes with the reference's layer, already checked.
    if (context.inBlock && layer == "0") return true;
    return layerLook(layer).visible;
}

QColor PageRenderer::colorOf(const zvdb::Entity& entity, const Context& context) {
    if (options_.monochrome) return Qt::black;
    QColor color;
    const int index = entity.color();
    if (entity.has(420)) {
        color = QColor(QRgb(entity.integer(420)));
    } else if (index == 0) {
        color = context.blockColor;
    } else if (index == 256 || index < 0) {
        std::string_view layer = entity.layer();
        if (context.inBlock && layer == "0") layer = context.blockLayer;
        color = layerLook(layer).color;
    } else {
        color = indexColor(index);
    }
    // White on white paper is drawn black, as on any plot.
    if (color.rgb() == options_.background.rgb()) color = Qt::black;
    return color;
}

int PageRenderer::weightOf(const zvdb::Entity& entity, const Context& context) {
    const int weight = static_cast<int>(entity.integer(370, -1));
    if (weight == -2) return context.blockWeight;
    if (weight == -1) {
        std::string_view layer = entity.layer();
        if (context.inBlock && layer == "0") layer = context.blockLayer;
        return layerLook(layer).weight;
    }
    return weight;
}

double PageRenderer::penWidth(int weight) const {
    if (!options_.lineWeights) return 0.0;
    const int w = weight < 0 ? kDefaultWeight : weight;
    return w / 100.0 * pixelsPerMm_;
}

void PageRenderer::strokePath(QPainter& painter, const QPainterPath& path, const QColor& color,
                              double width) {
    QPen pen(color, width, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin);
    painter.setTransform(QTransform());
    painter.setPen(pen);
    painter.setBrush(Qt::NoBrush);
    painter.drawPath(path);
}

QFont PageRenderer::styleFont(std::string_view style) {
    const QString key = fromUtf8(style).toUpper();
    auto it = fonts_.constFind(key);
    if (it != fonts_.constEnd()) return it.value();
    QString family;
    if (const zvdb::SymbolTable* styles = database_.table("STYLE")) {
        if (const zvdb::DbObject* record = styles->find(style)) {
            // The face a style names: its family in the extended data, else its file's name.
            const auto items = record->xdata("ACAD");
            if (!items.empty() && items.front().code == 1000)
                family = fromUtf8(items.front().value);
            if (family.isEmpty()) {
                QString file = fromUtf8(record->text(3));
                file = file.section('/', -1).section('\\', -1);
                family = file.section('.', 0, 0);
            }
        }
    }
    static const QStringList installed = QFontDatabase().families();
    QString chosen = QStringLiteral("DejaVu Sans");
    for (const QString& name : installed)
        if (!family.isEmpty() && name.compare(family, Qt::CaseInsensitive) == 0) chosen = name;
    QFont font(chosen);
    font.setPixelSize(kFontPixels);
    font.setHintingPreference(QFont::PreferNoHinting);
    font.setKerning(false);
    fonts_.insert(key, font);
    return font;
}

void PageRenderer::render(QPainter& painter, const QRectF& target, const QRectF& window) {
    std::vector<zvdb::Entity*> entities;
    if (database_.modelSpace()) entities = database_.modelSpace()->entities();
    render(painter, target, window, entities);
}

void PageRenderer::render(QPainter& painter, const QRectF& target, const QRectF& window,
                          std::span<zvdb::Entity* const> entities) {
    if (painter.device()) pixelsPerMm_ = painter.device()->logicalDpiX() / 25.4;
    painter.save();
    painter.setRenderHint(QPainter::Antialiasing, true);
    painter.setRenderHint(QPainter::TextAntialiasing, true);
    painter.setClipRect(target);
    painter.fillRect(target, options_.background);
    Context context;
    context.xf = windowToTarget(window, target);
    for (const zvdb::Entity* entity : entities)
        if (!entity->isErased() && !entity->inPaperSpace()) drawEntity(painter, *entity, context);
    painter.restore();
}

void PageRenderer::drawBlock(QPainter& painter, const zvdb::BlockRecord& block,
                             const Context& context) {
    for (const zvdb::Entity* entity : block.entities())
        drawEntity(painter, *entity, context);
}

void PageRenderer::drawInsert(QPainter& painter, const zvdb::Entity& insert,
                              const Context& context) {
    const zvdb::BlockRecord* block = database_.block(insert.text(2));
    if (block && context.depth < kMaxNesting) {
        Context inner;
        inner.blockColor = colorOf(insert, context);
        inner.blockWeight = weightOf(insert, context);
        inner.blockLayer =
            context.inBlock && insert.layer() == "0" ? context.blockLayer : insert.layer();
        inner.inBlock = true;
        inner.depth = context.depth + 1;
        const auto* reference = dynamic_cast<const zvdb::BlockReference*>(&insert);
        const QTransform placed = reference ? toQt(reference->transform()) : QTransform();
        // A multiple insert repeats the block in columns and rows.
        const long columns = std::max(1L, static_cast<long>(insert.integer(70, 1)));
        const long rows = std::max(1L, static_cast<long>(insert.integer(71, 1)));
        const double dx = insert.real(44, 0.0), dy = insert.real(45, 0.0);
        const double angle = radians(insert.real(50, 0.0));
        for (long r = 0; r < std::min(rows, 1000L); ++r) {
            for (long c = 0; c < std::min(columns, 1000L); ++c) {
                const double ox = c * dx * std::cos(angle) - r * dy * std::sin(angle);
                const double oy = c * dx * std::sin(angle) + r * dy * std::cos(angle);
                inner.xf = placed * QTransform::fromTranslate(ox, oy) * context.xf;
                drawBlock(painter, *block, inner);
            }
        }
    }
    for (const zvdb::Entity* sub : insert.liveSubEntities())
        if (sub->isType("ATTRIB")) drawEntity(painter, *sub, context);
}

void PageRenderer::drawEntity(QPainter& painter, const zvdb::Entity& entity,
                              const Context& context) {
    const std::string_view type = entity.type();
    if (type == "SEQEND" || type == "VERTEX") return;
    if (!visible(entity, context)) return;
    if (type == "ATTDEF" && (entity.integer(70, 0) & 2) == 0) return;  // only constant ones
    if (type == "ATTRIB" && (entity.integer(70, 0) & 1) != 0) return;  // invisible
    const QColor color = colorOf(entity, context);
    const double pen = penWidth(weightOf(entity, context));

    if (type == "INSERT") {
        drawInsert(painter, entity, context);
    } else if (type == "DIMENSION") {
        // A dimension is drawn by its block, already placed in the drawing's coordinates.
        if (const zvdb::BlockRecord* block = database_.block(entity.text(2))) {
            Context inner = context;
            inner.blockColor = color;
            inner.blockLayer = entity.layer();
            inner.inBlock = true;
            inner.depth = context.depth + 1;
            if (inner.depth < kMaxNesting) drawBlock(painter, *block, inner);
        }
    } else if (type == "LINE") {
        const zvdb::Point3 a = entity.point(10), b = entity.point(11);
        QPainterPath path(context.xf.map(QPointF(a.x, a.y)));
        path.lineTo(context.xf.map(QPointF(b.x, b.y)));
        strokePath(painter, path, color, pen);
    } else if (type == "LWPOLYLINE" || type == "POLYLINE") {
        drawPolyline(painter, entity, context, color, pen);
    } else if (type == "CIRCLE" || type == "ARC") {
        const QTransform t = ocsOf(entity) * context.xf;
        const zvdb::Point3 c = entity.point(10);
        const double r = entity.real(40, 0.0);
        double a0 = 0, a1 = 2 * kPi;
        if (type == "ARC") {
            a0 = radians(entity.real(50, 0.0));
            a1 = radians(entity.real(51, 360.0));
            if (a1 <= a0) a1 += 2 * kPi;
        }
        QPainterPath path;
        appendArc(path, t, QPointF(c.x, c.y), r, r, 0.0, a0, a1, true);
        strokePath(painter, path, color, pen);
    } else if (type == "ELLIPSE") {
        const zvdb::Point3 c = entity.point(10), major = entity.point(11);
        const zvdb::Point3 minor =
            zvdb::cross(entity.point(210, {0, 0, 1}), major) * entity.real(40, 1.0);
        double t0 = entity.real(41, 0.0), t1 = entity.real(42, 2 * kPi);
        if (t1 <= t0) t1 += 2 * kPi;
        QPainterPath path;
        const int steps = arcSteps(zvdb::length(major), t1 - t0, context.xf);
        for (int i = 0; i <= steps; ++i) {
            const double t = t0 + (t1 - t0) * i / steps;
            const zvdb::Point3 p = c + major * std::cos(t) + minor * std::sin(t);
            const QPointF d = context.xf.map(QPointF(p.x, p.y));
            if (i == 0)
                path.moveTo(d);
            else
                path.lineTo(d);
        }
        strokePath(painter, path, color, pen);
    } else if (type == "SPLINE") {
        // Drawn through its fit points when it has them, else its control points.
        QPainterPath path;
        const int code = entity.has(11) ? 11 : 10;
        const auto tags = entity.tags();
        bool first = true;
        for (std::size_t i = 1; i + 1 < entity.xdataStart(); ++i) {
            if (tags[i].code != code || tags[i + 1].code != code + 10) continue;
            const QPointF p = context.xf.map(
                QPointF(std::strtod(std::string(tags[i].value).c_str(), nullptr),
                        std::strtod(std::string(tags[i + 1].value).c_str(), nullptr)));
            if (first)
                path.moveTo(p);
            else
                path.lineTo(p);
            first = false;
        }
        strokePath(painter, path, color, pen);
    } else if (type == "SOLID" || type == "TRACE") {
        const QTransform t = ocsOf(entity) * context.xf;
        QPolygonF polygon;
        for (int code : {10, 11, 13, 12}) {
            const zvdb::Point3 p = entity.point(code);
            polygon << t.map(QPointF(p.x, p.y));
        }
        painter.setTransform(QTransform());
        painter.setPen(Qt::NoPen);
        painter.setBrush(color);
        painter.drawPolygon(polygon);
    } else if (type == "HATCH") {
        drawHatch(painter, entity, context, color);
    } else if (type == "TEXT" || type == "ATTRIB" || type == "ATTDEF") {
        TextRun run;
        run.text = textCodes(fromUtf8(entity.text(1)));
        const zvdb::Point3 p = entity.point(10), a = entity.point(11);
        run.position = QPointF(p.x, p.y);
        run.alignment = QPointF(a.x, a.y);
        run.height = entity.real(40, 1.0);
        run.rotation = entity.real(50, 0.0);
        run.oblique = entity.real(51, 0.0);
        run.style = entity.text(7, "Standard");
        run.widthFactor = entity.has(41) ? entity.real(41, 1.0) : 1.0;
        if (!entity.has(41))
            if (const zvdb::SymbolTable* styles = database_.table("STYLE"))
                if (const zvdb::DbObject* style = styles->find(run.style))
                    run.widthFactor = style->real(41, 1.0);
        run.horizontal = static_cast<int>(entity.integer(72, 0));
        run.vertical = static_cast<int>(entity.integer(type == "TEXT" ? 73 : 74, 0));
        const long mirror = entity.integer(71, 0);
        run.backward = (mirror & 2) != 0;
        run.upsideDown = (mirror & 4) != 0;
        run.color = color;
        run.ocs = type == "TEXT" ? ocsOf(entity) : QTransform();
        if (!run.text.isEmpty()) drawText(painter, run, context);
    } else if (type == "MTEXT") {
        drawMText(painter, entity, context, color);
    }
}

void PageRenderer::drawPolyline(QPainter& painter, const zvdb::Entity& polyline,
                                const Context& context, const QColor& color, double pen) {
    const std::vector<Vertex> vertices = polylineVertices(polyline);
    if (vertices.empty()) return;
    const bool closed = (polyline.integer(70, 0) & 1) != 0;
    const QTransform t =
        (polyline.isType("LWPOLYLINE") ? ocsOf(polyline) : QTransform()) * context.xf;
    const std::size_t segments = closed ? vertices.size() : vertices.size() - 1;
    bool widths = false, constant = true;
    for (std::size_t i = 0; i < segments; ++i) {
        const Vertex& v = vertices[i];
        if (v.startWidth > 0 || v.endWidth > 0) widths = true;
        if (v.startWidth != vertices[0].startWidth || v.endWidth != vertices[0].startWidth)
            constant = false;
    }
    QPainterPath path(t.map(vertices[0].p));
    for (std::size_t i = 0; i < segments; ++i) {
        const Vertex& a = vertices[i];
        const Vertex& b = vertices[(i + 1) % vertices.size()];
        appendBulge(path, t, a.p, b.p, a.bulge);
    }
    if (vertices.size() == 1) path.lineTo(t.map(vertices[0].p));
    if (!widths) {
        strokePath(painter, path, color, pen);
        return;
    }
    const double scale = deviceScale(t);
    if (constant) {
        QPen wide(color, vertices[0].startWidth * scale, Qt::SolidLine, Qt::FlatCap, Qt::MiterJoin);
        painter.setTransform(QTransform());
        painter.setPen(wide);
        painter.setBrush(Qt::NoBrush);
        painter.drawPath(path);
        return;
    }
    // Tapered segments: straight ones as filled quadrilaterals, arcs at their mean width.
    painter.setTransform(QTransform());
    for (std::size_t i = 0; i < segments; ++i) {
        const Vertex& a = vertices[i];
        const Vertex& b = vertices[(i + 1) % vertices.size()];
        if (std::abs(a.bulge) > 1e-9 || (a.startWidth == 0 && a.endWidth == 0)) {
            QPainterPath piece(t.map(a.p));
            appendBulge(piece, t, a.p, b.p, a.bulge);
            const double width = (a.startWidth + a.endWidth) / 2 * scale;
            painter.setPen(QPen(color, width > 0 ? width : pen, Qt::SolidLine, Qt::FlatCap));
            painter.setBrush(Qt::NoBrush);
            painter.drawPath(piece);
            continue;
        }
        const double length = std::hypot(b.p.x() - a.p.x(), b.p.y() - a.p.y());
        if (length < 1e-12) continue;
        const QPointF normal(-(b.p.y() - a.p.y()) / length, (b.p.x() - a.p.x()) / length);
        QPolygonF quad;
        quad << t.map(a.p + normal * (a.startWidth / 2)) << t.map(b.p + normal * (a.endWidth / 2))
             << t.map(b.p - normal * (a.endWidth / 2)) << t.map(a.p - normal * (a.startWidth / 2));
        painter.setPen(Qt::NoPen);
        painter.setBrush(color);
        painter.drawPolygon(quad);
    }
}

void PageRenderer::drawHatch(QPainter& painter, const zvdb::Entity& hatch, const Context& context,
                             const QColor& color) {
    const QTransform t = ocsOf(hatch) * context.xf;
    const QPainterPath boundary = hatchBoundary(hatch, t);
    if (boundary.isEmpty()) return;
    painter.setTransform(QTransform());
    if (hatch.integer(70, 0) & 1) {
        painter.setPen(Qt::NoPen);
        painter.setBrush(color);
        painter.drawPath(boundary);
        return;
    }
    // A pattern: its lines, without their dashes, clipped by the boundary.
    painter.save();
    painter.setClipPath(boundary, Qt::IntersectClip);
    painter.setPen(QPen(color, 0));
    const QRectF box = t.inverted().mapRect(boundary.boundingRect());
    const double reach = std::hypot(box.width(), box.height());
    for (const PatternLine& line : patternLines(hatch)) {
        const double spacing = std::max(line.spacing, reach / 2000.0);
        if (spacing <= 0) continue;
        const double a = radians(line.angle);
        const QPointF along(std::cos(a), std::sin(a)), across(-std::sin(a), std::cos(a));
        const QPointF centre = box.center();
        const double first = std::floor(((centre - line.base).x() * across.x() +
                                         (centre - line.base).y() * across.y() - reach) /
                                        spacing);
        const int count = static_cast<int>(std::min(2.0 * reach / spacing + 2, 20000.0));
        for (int k = 0; k <= count; ++k) {
            const QPointF origin = line.base + across * ((first + k) * spacing);
            // The point of this line nearest the centre, and the line through it.
            const double s = (centre - origin).x() * along.x() + (centre - origin).y() * along.y();
            const QPointF mid = origin + along * s;
            painter.drawLine(t.map(mid - along * reach), t.map(mid + along * reach));
        }
    }
    painter.restore();
}

void PageRenderer::drawText(QPainter& painter, const TextRun& run, const Context& context) {
    const QFont font = styleFont(run.style);
    const QFontMetricsF metrics(font);
    double cap = metrics.capHeight();
    if (cap <= 0) cap = metrics.ascent() * 0.72;
    double scale = run.height / cap;
    double width = run.widthFactor > 0 ? run.widthFactor : 1.0;
    const double advance = metrics.horizontalAdvance(run.text);
    double rotation = run.rotation;
    QPointF anchor = run.position;
    double x = 0.0, y = 0.0;
    const bool aligned = run.horizontal == 0 && run.vertical == 0;
    if (!aligned) anchor = run.alignment;
    const double textWidth = advance * scale * width;
    if (run.horizontal == 3 || run.horizontal == 5) {
        // Aligned and fitted texts run from the first point to the second.
        const QPointF span = run.alignment - run.position;
        const double length = std::hypot(span.x(), span.y());
        anchor = run.position;
        if (length > 1e-12 && textWidth > 0) {
            rotation = std::atan2(span.y(), span.x()) * 180.0 / kPi;
            if (run.horizontal == 3)
                scale *= length / textWidth;
            else
                width *= length / textWidth;
        }
    } else if (run.horizontal == 1 || run.horizontal == 4 || run.horizontal == 2) {
        // Centred and right texts go by their ink, without the bearings at their ends.
        const double inkLeft = metrics.leftBearing(run.text.front());
        const double inkRight = advance - metrics.rightBearing(run.text.back());
        const double anchorAt = run.horizontal == 2 ? inkRight : (inkLeft + inkRight) / 2;
        x = -anchorAt * scale * width;
    }
    if (run.horizontal == 4 && run.vertical == 0) y = -cap * scale / 2;
    if (run.vertical == 1) y = metrics.descent() * scale;
    if (run.vertical == 2) y = -cap * scale / 2;
    if (run.vertical == 3) y = -cap * scale;
    const double sx = scale * width * (run.backward ? -1 : 1);
    const double sy = -scale * (run.upsideDown ? -1 : 1);
    const double shear = std::tan(radians(run.oblique));
    if (run.backward) x = -x;
    const QTransform glyphs(sx, 0, sy * shear, sy, x, y);
    QTransform place;
    place.translate(anchor.x(), anchor.y());
    place.rotate(rotation);
    painter.setTransform(glyphs * place * run.ocs * context.xf);
    painter.setFont(font);
    painter.setPen(run.color);
    painter.drawText(QPointF(0, 0), run.text);
}

void PageRenderer::drawMText(QPainter& painter, const zvdb::Entity& mtext, const Context& context,
                             const QColor& color) {
    const auto* text = dynamic_cast<const zvdb::TextEntity*>(&mtext);
    QString content = text ? fromUtf8(text->content()) : fromUtf8(mtext.text(1));
    QStringList lines = TextMarkup::mtextLines(content);
    const double height = mtext.real(40, 1.0);
    const std::string_view style = mtext.text(7, "Standard");
    double rotation = mtext.real(50, 0.0);
    if (mtext.has(11)) {
        const zvdb::Point3 direction = mtext.point(11);
        rotation = std::atan2(direction.y, direction.x) * 180.0 / kPi;
    }
    // Lines wider than the box wrap at blanks.
    const double boxWidth = mtext.real(41, 0.0);
    if (boxWidth > 0) {
        const QFont font = styleFont(style);
        const QFontMetricsF metrics(font);
        const double cap = metrics.capHeight() > 0 ? metrics.capHeight() : metrics.ascent() * 0.72;
        const double perUnit = cap / height;
        lines = TextMarkup::wrap(lines, boxWidth * perUnit, [&metrics](const QString& piece) {
            return metrics.horizontalAdvance(piece);
        });
    }
    const int attachment = static_cast<int>(mtext.integer(71, 1));
    const int column = (attachment - 1) % 3, row = (attachment - 1) / 3;
    const double pitch = height * 5.0 / 3.0 * mtext.real(44, 1.0);
    const double total = height + (lines.size() - 1) * pitch;
    double firstBaseline = -height;
    if (row == 1) firstBaseline = total / 2 - height;
    if (row == 2) firstBaseline = total - height;
    const zvdb::Point3 p = mtext.point(10);
    const double a = radians(rotation);
    const QPointF down(std::sin(a), -std::cos(a));
    for (int i = 0; i < lines.size(); ++i) {
        if (lines[i].trimmed().isEmpty()) continue;
        TextRun run;
        run.text = lines[i];
        run.height = height;
        run.rotation = rotation;
        run.style = style;
        run.color = color;
        run.horizontal = column == 0 ? 0 : column;  // left, centre, right on the baseline
        const double offset = -(firstBaseline - i * pitch);
        run.position = QPointF(p.x, p.y) + down * offset;
        run.alignment = run.position;
        drawText(painter, run, context);
    }
}

}  // namespace zvplot
