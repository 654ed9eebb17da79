// Selection sets beyond ssget (ssdel, ssmemb, ssnamex, ssgetfirst), coordinate systems
// (trans), text boxes and the display calls that have nothing to repaint here.
#include "CadFunctions.h"

#include "drawing/BlockRecord.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/Geometry.h"
#include "drawing/LayerRecord.h"
#include "lisp/Printer.h"

#include <cmath>

namespace zvhost::cadlisp {

namespace {

// A right-handed frame: an origin and three unit axes, in world coordinates.
struct Frame {
    zvdb::Point3 origin;
    zvdb::Point3 x{1, 0, 0}, y{0, 1, 0}, z{0, 0, 1};

    zvdb::Point3 toWorld(const zvdb::Point3& p, bool displacement) const {
        const zvdb::Point3 v = x * p.x + y * p.y + z * p.z;
        return displacement ? v : origin + v;
    }
    zvdb::Point3 fromWorld(const zvdb::Point3& p, bool displacement) const {
        const zvdb::Point3 d = displacement ? p : p - origin;
        return {dot(d, x), dot(d, y), dot(d, z)};
    }
    static double dot(const zvdb::Point3& a, const zvdb::Point3& b) {
        return a.x * b.x + a.y * b.y + a.z * b.z;
    }
};

// The object coordinate system of an extrusion direction (the arbitrary axis rule).
Frame ocs(const zvdb::Point3& extrusion) {
    const zvdb::Transform t = zvdb::Transform::fromOcs(extrusion);
    Frame f;
    f.x = t.applyVector({1, 0, 0});
    f.y = t.applyVector({0, 1, 0});
    f.z = t.applyVector({0, 0, 1});
    return f;
}

double distanceToSegment(const zvdb::Point3& p, const zvdb::Point3& a, const zvdb::Point3& b) {
    const double dx = b.x - a.x, dy = b.y - a.y;
    const double length2 = dx * dx + dy * dy;
    double t = length2 > 0 ? ((p.x - a.x) * dx + (p.y - a.y) * dy) / length2 : 0.0;
    t = std::clamp(t, 0.0, 1.0);
    return std::hypot(p.x - (a.x + t * dx), p.y - (a.y + t * dy));
}

}  // namespace

zvdb::Entity* CadFunctions::entityAt(const zvdb::Point3& point, double tolerance) {
    zvdb::BlockRecord* space = db().modelSpace();
    if (!space) return nullptr;
    const std::vector<zvdb::Entity*> entities = space->entities();
    for (auto it = entities.rbegin(); it != entities.rend(); ++it) {
        zvdb::Entity* e = *it;
        const zvdb::LayerRecord* layer = db().layer(e->layer());
        if (layer && layer->isFrozen()) continue;
        if (e->isType("LINE")) {
            if (distanceToSegment(point, e->point(10), e->point(11)) <= tolerance) return e;
            continue;
        }
        if (e->isType("CIRCLE") || e->isType("ARC")) {
            const zvdb::Point3 c = e->point(10);
            if (std::fabs(std::hypot(point.x - c.x, point.y - c.y) - e->real(40)) <= tolerance)
                return e;
            continue;
        }
        const zvdb::BoundingBox box = zvdb::Extents::ofEntity(*e, true);
        if (box.isEmpty()) continue;
        if (point.x >= box.min.x - tolerance && point.x <= box.max.x + tolerance &&
            point.y >= box.min.y - tolerance && point.y <= box.max.y + tolerance)
            return e;
    }
    return nullptr;
}

// How each entity of a set was selected: here always by no particular method, 0.
Value CadFunctions::ssnamex(Args a) {
    const auto& names = pickset(a[0])->names;
    size_t from = 0, to = names.size();
    if (a.has(1) && !a[1].isNil()) {
        const int i = lisp_.toInt(a[1]);
        if (i < 0 || i >= int(names.size())) return {};
        from = size_t(i);
        to = from + 1;
    }
    ListBuilder list;
    for (size_t i = from; i < to; ++i) {
        ListBuilder item;
        item.add(Value::integer(0));
        item.add(ename(db().objectByHandle(names[i].handle)));
        item.add(Value::integer(0));
        list.add(item.take());
    }
    return list.take();
}

// From one coordinate system to another: 0 world, 1 user (the drawing's UCS, the world
// when it names none), 2 display and 3 paper-space display (both the world: this host
// shows the plan view), an entity name (its object system) or an extrusion direction.
Value CadFunctions::trans(Args a) {
    const std::vector<Value> xyz = lisp_.toVector(a[0]);
    if (xyz.size() < 2 || xyz.size() > 3) lisp_.badType("2D/3D point:", a[0]);
    const zvdb::Point3 p{lisp_.toNumber(xyz[0]), lisp_.toNumber(xyz[1]),
                         xyz.size() > 2 ? lisp_.toNumber(xyz[2]) : 0.0};
    auto frameOf = [&](const Value& system) -> Frame {
        if (system.isInt()) {
            const int code = system.asInt();
            if (code < 0 || code > 3) lisp_.fail("bad argument value: " + QString::number(code));
            Frame f;
            if (code == 1 && db().header().has("$UCSXDIR")) {
                const zvdb::Point3 ux = db().header().point("$UCSXDIR", {1, 0, 0});
                const zvdb::Point3 uy = db().header().point("$UCSYDIR", {0, 1, 0});
                if (zvdb::length(ux) > 0 && zvdb::length(uy) > 0) {
                    f.origin = db().header().point("$UCSORG");
                    f.x = zvdb::normalized(ux);
                    f.y = zvdb::normalized(uy);
                    f.z = zvdb::normalized(zvdb::cross(f.x, f.y));
                }
            }
            return f;
        }
        if (system.type() == Type::Ename) {
            const zvdb::DbObject* o = object(system);
            if (!o) lisp_.fail("bad argument value: " + zvlisp::Printer::prin1(system));
            return ocs(o->point(210, {0, 0, 1}));
        }
        const std::vector<Value> v = lisp_.toVector(system);
        if (v.size() != 3) lisp_.badType("3D point:", system);
        const zvdb::Point3 direction{lisp_.toNumber(v[0]), lisp_.toNumber(v[1]),
                                     lisp_.toNumber(v[2])};
        if (zvdb::length(direction) == 0)
            lisp_.fail("bad argument value: " + zvlisp::Printer::prin1(system));
        return ocs(direction);
    };
    const bool displacement = a.has(3) && !a[3].isNil();
    const Frame from = frameOf(a[1]);
    const Frame to = frameOf(a[2]);
    const zvdb::Point3 r = to.fromWorld(from.toWorld(p, displacement), displacement);
    ListBuilder point;
    point.add(Value::real(r.x));
    point.add(Value::real(r.y));
    point.add(Value::real(r.z));
    return point.take();
}

// The box of a text in its own coordinates, from the host's text metrics (characters 0.6
// of the height wide, times the width factor): ((0 0 0) (width height 0)).
Value CadFunctions::textbox(Args a) {
    QString content;
    double height = db().header().real("$TEXTSIZE", 2.5);
    double widthFactor = 1.0;
    for (Value v = a[0]; v.isCons(); v = v.asCons()->cdr) {
        const Value& group = v.asCons()->car;
        if (!group.isCons() || !group.asCons()->car.isInt()) continue;
        const int code = group.asCons()->car.asInt();
        const Value& value = group.asCons()->cdr;
        if (code == 1 && value.isString()) content = value.asString();
        if (code == 40 && value.isNumber()) height = value.asNumber();
        if (code == 41 && value.isNumber()) widthFactor = value.asNumber();
    }
    if (!a[0].isCons()) lisp_.badType("consp", a[0]);
    auto point = [](double x, double y) {
        ListBuilder p;
        p.add(Value::real(x));
        p.add(Value::real(y));
        p.add(Value::real(0.0));
        return p.take();
    };
    ListBuilder box;
    box.add(point(0.0, 0.0));
    box.add(point(height * 0.6 * double(content.size()) * widthFactor, height));
    return box.take();
}

void CadFunctions::installSelection() {
    const std::shared_ptr<CadFunctions> self = shared_from_this();
    lisp_.define(
        "ssdel",
        [self](Interpreter& in, Args a) {
            if (a[0].type() != Type::Ename) in.badType("lentityp", a[0]);
            auto& names = self->pickset(a[1])->names;
            const auto name = static_cast<zvlisp::EnameObject*>(a[0].asObject())->name;
            const auto it = std::find(names.begin(), names.end(), name);
            if (it == names.end()) return Value();
            names.erase(it);
            return a[1];
        },
        2, 2);
    lisp_.define(
        "ssmemb",
        [self](Interpreter& in, Args a) {
            if (a[0].type() != Type::Ename) in.badType("lentityp", a[0]);
            const auto& names = self->pickset(a[1])->names;
            const auto name = static_cast<zvlisp::EnameObject*>(a[0].asObject())->name;
            return std::find(names.begin(), names.end(), name) == names.end() ? Value() : a[0];
        },
        2, 2);
    lisp_.define(
        "ssnamex", [self](Interpreter&, Args a) { return self->ssnamex(a); }, 1, 2);
    lisp_.define(
        "ssgetfirst",
        // No screen, so nothing is gripped and no set was picked first.
        [](Interpreter&, Args) { return Value::cons(Value(), Value::cons(Value(), Value())); }, 0,
        0);
    lisp_.define(
        "trans", [self](Interpreter&, Args a) { return self->trans(a); }, 3, 4);
    lisp_.define(
        "textbox", [self](Interpreter&, Args a) { return self->textbox(a); }, 1, 1);
    lisp_.define(
        "redraw",
        [self](Interpreter& in, Args a) {
            if (a.has(0) && !a[0].isNil()) self->object(a[0]);
            if (a.has(1)) in.toInt(a[1]);
            return Value();
        },
        0, 2);
}

}  // namespace zvhost::cadlisp
