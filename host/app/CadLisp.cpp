#include "CadLisp.h"

#include "CadFunctions.h"
#include "HostDocument.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DbObject.h"
#include "drawing/Dictionary.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/Tag.h"
#include "drawing/TagValues.h"
#include "lisp/Function.h"
#include "lisp/Interpreter.h"
#include "lisp/Wildcard.h"

#include <QFileInfo>

#include <memory>
#include <unordered_map>

namespace zvhost {

namespace cadlisp {

Kind kindOf(int code) {
    if (zvdb::isPointerCode(code) && code != 1005) return Kind::Pointer;
    if ((code >= 10 && code <= 18) || (code >= 110 && code <= 112) || code == 210 ||
        (code >= 1010 && code <= 1013))
        return Kind::Point;
    switch (zvdb::valueKind(code)) {
        case zvdb::ValueKind::Real:
            return Kind::Real;
        case zvdb::ValueKind::Int16:
        case zvdb::ValueKind::Int32:
        case zvdb::ValueKind::Int64:
        case zvdb::ValueKind::Bool:
            return Kind::Integer;
        default:
            return Kind::Text;
    }
}

QString text(std::string_view v) {
    return QString::fromUtf8(v.data(), int(v.size()));
}

Value CadFunctions::xdata(const zvdb::DbObject& o, const Value& applications) {
    ListBuilder groups;
    std::vector<QString> patterns;
    for (Value v = applications; v.isCons(); v = v.asCons()->cdr)
        patterns.push_back(lisp_.toStr(v.asCons()->car));
    for (std::string_view app : o.xdataApplications()) {
        const QString name = text(app);
        bool wanted = false;
        // Application names are matched without regard to case.
        for (const QString& p : patterns)
            wanted = wanted || zvlisp::Wildcard(p.toUpper()).matches(name.toUpper());
        if (!wanted) continue;
        ListBuilder group;
        group.add(Value::string(name));
        const std::vector<zvdb::Tag> items = o.xdata(app);
        addGroups(group, items, 0, items.size());
        groups.add(group.take());
    }
    if (groups.empty()) return {};
    return Value::cons(Value::integer(-3), groups.take());
}

Value CadFunctions::entget(Args a) {
    zvdb::DbObject* o = object(a[0]);
    if (!o) return {};
    ListBuilder list;
    list.add(pair(-1, a[0]));
    list.add(pair(0, Value::string(text(o->type()))));
    addGroups(list, o->tags(), 1, o->xdataStart());
    if (a.has(1) && !a[1].isNil()) {
        Value x = xdata(*o, a[1]);
        if (!x.isNil()) list.add(x);
    }
    return list.take();
}

Value CadFunctions::entmod(Args a) {
    lisp_.checkList(a[0]);
    zvdb::DbObject* o = nullptr;
    for (Value v = a[0]; v.isCons(); v = v.asCons()->cdr) {
        const Value& group = v.asCons()->car;
        if (group.isCons() && group.asCons()->car.isInt() && group.asCons()->car.asInt() == -1)
            o = object(group.asCons()->cdr);
    }
    if (!o) return {};
    std::unordered_map<int, int> seen;
    for (Value v = a[0]; v.isCons(); v = v.asCons()->cdr) {
        const Value& group = v.asCons()->car;
        if (!group.isCons() || !group.asCons()->car.isInt()) continue;
        const int code = group.asCons()->car.asInt();
        const Value& value = group.asCons()->cdr;
        if (code == -3) {
            for (Value g = value; g.isCons(); g = g.asCons()->cdr) {
                const Value& app = g.asCons()->car;
                if (!app.isCons()) continue;
                std::vector<zvdb::Tag> items;
                for (Value it = app.asCons()->cdr; it.isCons(); it = it.asCons()->cdr) {
                    const Value& item = it.asCons()->car;
                    if (!item.isCons() || !item.asCons()->car.isInt()) continue;
                    const int c = item.asCons()->car.asInt();
                    const Value& iv = item.asCons()->cdr;
                    if (kindOf(c) == Kind::Point && iv.isCons()) {
                        std::vector<Value> xyz = lisp_.toVector(iv);
                        for (size_t k = 0; k < 3; ++k)
                            items.push_back({std::int16_t(c + 10 * int(k)),
                                             db().store(zvdb::TagValues::fromReal(
                                                 k < xyz.size() ? lisp_.toNumber(xyz[k]) : 0.0))});
                    } else if (iv.isString()) {
                        items.push_back({std::int16_t(c), db().store(iv.asString().toStdString())});
                    } else if (iv.isReal()) {
                        items.push_back(
                            {std::int16_t(c), db().store(zvdb::TagValues::fromReal(iv.asReal()))});
                    } else if (iv.isInt()) {
                        items.push_back({std::int16_t(c),
                                         db().store(zvdb::TagValues::fromInteger(iv.asInt()))});
                    }
                }
                o->setXData(lisp_.toStr(app.asCons()->car).toStdString(), items);
            }
            continue;
        }
        if (code < 1 || code == 5 || code == 100 || code == 102 || code == 330 || code == 360)
            continue;
        // The n-th group of a code goes to the n-th tag of it: a polyline's vertices.
        setGroup(*o, code, seen[code]++, value);
    }
    return a[0];
}

void CadFunctions::setGroup(zvdb::DbObject& o, int code, int occurrence, const Value& value) {
    int at = o.indexOf(code);
    for (int n = 0; n < occurrence && at >= 0; ++n)
        at = o.indexOf(code, std::size_t(at) + 1);
    if (at < 0) {
        // A later group that the object lacks is left out; a first one is added.
        if (occurrence > 0) return;
        if (kindOf(code) == Kind::Point && value.isCons()) {
            std::vector<Value> xyz = lisp_.toVector(value);
            o.setPoint(code, {xyz.size() > 0 ? lisp_.toNumber(xyz[0]) : 0,
                              xyz.size() > 1 ? lisp_.toNumber(xyz[1]) : 0,
                              xyz.size() > 2 ? lisp_.toNumber(xyz[2]) : 0});
        } else if (value.isString()) {
            o.setText(code, value.asString().toStdString());
        } else if (value.isReal()) {
            o.setReal(code, value.asReal());
        } else if (value.isInt()) {
            o.setInteger(code, value.asInt());
        }
        return;
    }
    auto& tags = o.editTags();
    std::size_t k = std::size_t(at);
    if (kindOf(code) == Kind::Point && value.isCons()) {
        // The coordinates the tag has are set; a 2-D vertex gets no z.
        const std::vector<Value> xyz = lisp_.toVector(value);
        for (std::size_t axis = 0; axis < 3 && axis < xyz.size(); ++axis) {
            const std::size_t i = k + axis;
            if (i >= tags.size() || tags[i].code != code + 10 * int(axis)) break;
            tags[i].value = db().store(zvdb::TagValues::fromReal(lisp_.toNumber(xyz[axis])));
        }
    } else if (value.isString()) {
        tags[k].value = db().store(value.asString().toStdString());
    } else if (value.isReal()) {
        tags[k].value = db().store(zvdb::TagValues::fromReal(value.asReal()));
    } else if (value.isInt()) {
        tags[k].value = db().store(zvdb::TagValues::fromInteger(value.asInt()));
    }
}

// Model space in order, each entity followed by its attributes or vertices and its end.
std::vector<zvdb::Entity*> CadFunctions::sequence() {
    std::vector<zvdb::Entity*> all;
    if (!db().modelSpace()) return all;
    for (zvdb::Entity* e : db().modelSpace()->entities()) {
        all.push_back(e);
        for (zvdb::Entity* sub : e->liveSubEntities())
            all.push_back(sub);
        if (e->seqend()) all.push_back(e->seqend());
    }
    return all;
}

Value CadFunctions::entnext(Args a) {
    const std::vector<zvdb::Entity*> all = sequence();
    if (!a.has(0) || a[0].isNil()) {
        for (zvdb::Entity* e : all)
            if (!e->parent()) return ename(e);
        return {};
    }
    zvdb::DbObject* current = object(a[0]);
    for (size_t i = 0; current && i + 1 < all.size(); ++i)
        if (all[i] == current) return ename(all[i + 1]);
    return {};
}

zvdb::SymbolTable* CadFunctions::table(const Value& name) {
    QString t = lisp_.toStr(name).toUpper();
    if (t == "BLOCK") t = "BLOCK_RECORD";
    return db().table(t.toStdString());
}

// A table record as tblsearch shows it: name, flags and its own groups.
Value CadFunctions::tblsearch(Args a, bool next) {
    zvdb::SymbolTable* t = table(a[0]);
    if (!t) return {};
    const std::vector<zvdb::DbObject*> records = t->records();
    const QString key = lisp_.toStr(a[0]).toUpper();
    zvdb::DbObject* found = nullptr;
    if (next) {
        int& cursor = tableCursor_[key];
        if (a.has(1) && !a[1].isNil()) cursor = 0;
        if (cursor < int(records.size())) found = records[size_t(cursor++)];
    } else {
        const QString name = lisp_.toStr(a[1]);
        for (zvdb::DbObject* r : records)
            if (text(r->text(2)).compare(name, Qt::CaseInsensitive) == 0) found = r;
        if (found && a.has(2) && !a[2].isNil()) {
            int& cursor = tableCursor_[key];
            cursor = int(std::find(records.begin(), records.end(), found) - records.begin()) + 1;
        }
    }
    if (!found) return {};
    ListBuilder list;
    list.add(pair(0, Value::string(key == "BLOCK_RECORD" ? "BLOCK" : key)));
    const auto tags = found->tags();
    for (size_t i = 1; i < found->xdataStart(); ++i) {
        const int code = tags[i].code;
        if (code == 5 || code == 100 || code == 102 || code == 330 || code == 360 || code == 105)
            continue;
        addGroups(list, tags, i, i + 1);
    }
    return list.take();
}

Value CadFunctions::getvar(Args a) {
    const QString name = lisp_.toStr(a[0]).toUpper();
    const QFileInfo file(document_.fileName());
    if (name == "CLAYER") return Value::string(text(db().currentLayer()));
    if (name == "DWGNAME") return Value::string(file.fileName());
    if (name == "DWGPREFIX") return Value::string(file.absolutePath() + "/");
    if (name == "SAVENAME") return Value::string(file.absoluteFilePath());
    if (name == "FILEDIA") return Value::integer(filedia_);
    if (name == "ROAMABLEROOTPREFIX") {
        QString folder = qEnvironmentVariable("ZV_DATA_DIR");
        if (!folder.isEmpty() && !folder.endsWith('/')) folder += '/';
        return Value::string(folder);
    }
    const std::string variable = QString("$" + name).toStdString();
    if (!db().header().has(variable)) return {};
    return Value::string(text(db().header().text(variable)));
}

Value CadFunctions::setvar(Args a) {
    const QString name = lisp_.toStr(a[0]).toUpper();
    if (name == "CLAYER") {
        if (!db().setCurrentLayer(lisp_.toStr(a[1]).toStdString())) lisp_.fail("setvar rejected");
    } else if (name == "FILEDIA") {
        filedia_ = lisp_.toInt(a[1]);
    } else {
        lisp_.fail("setvar rejected");
    }
    return a[1];
}

Value CadFunctions::dictsearch(Args a) {
    auto* dictionary = dynamic_cast<zvdb::Dictionary*>(object(a[0]));
    if (!dictionary) return {};
    zvdb::DbObject* entry = dictionary->get(lisp_.toStr(a[1]).toStdString());
    if (!entry) return {};
    const Value name = ename(entry);
    return entget(Args(&name, 1));
}

Value CadFunctions::dictnext(Args a) {
    auto* dictionary = dynamic_cast<zvdb::Dictionary*>(object(a[0]));
    if (!dictionary) return {};
    const auto entries = dictionary->entries();
    int& cursor = dictCursor_[dictionary->handle()];
    if (a.has(1) && !a[1].isNil()) cursor = 0;
    if (cursor >= int(entries.size())) return {};
    const Value name = ename(db().objectByHandle(entries[size_t(cursor++)].handle));
    return entget(Args(&name, 1));
}

// A filter list of (0 . "TYPE"), (8 . "LAYER"), (2 . "BLOCK") with wildcards, and
// (-3 ("APP")) for extended data; every pair must match.
bool CadFunctions::passes(const zvdb::Entity& e, const Value& filter) {
    for (Value v = filter; v.isCons(); v = v.asCons()->cdr) {
        const Value& group = v.asCons()->car;
        if (!group.isCons() || !group.asCons()->car.isInt()) continue;
        const int code = group.asCons()->car.asInt();
        const Value& want = group.asCons()->cdr;
        if (code == -3) {
            for (Value app = want; app.isCons(); app = app.asCons()->cdr) {
                const Value& name = app.asCons()->car.isCons() ? app.asCons()->car.asCons()->car
                                                               : app.asCons()->car;
                if (!name.isString() || xdata(e, Value::cons(name, Value())).isNil()) return false;
            }
            continue;
        }
        if (!want.isString()) continue;
        const QString have = code == 0 ? text(e.type()) : text(e.text(code));
        if (!zvlisp::Wildcard(want.asString().toUpper()).matches(have.toUpper())) return false;
    }
    return true;
}

Value CadFunctions::ssget(Args a) {
    const QString mode = a.has(0) && a[0].isString() ? a[0].asString().toUpper() : QString();
    Value filter;
    zvdb::BoundingBox window;
    const bool windowed = mode == "C" || mode == "W";
    if (mode == "X") {
        filter = a.has(1) ? a[1] : Value();
    } else if (windowed && a.has(2)) {
        for (int k : {1, 2}) {
            std::vector<Value> xyz = lisp_.toVector(a[k]);
            window.add(zvdb::Point3{xyz.size() > 0 ? lisp_.toNumber(xyz[0]) : 0,
                                    xyz.size() > 1 ? lisp_.toNumber(xyz[1]) : 0, 0});
        }
        filter = a.has(3) ? a[3] : Value();
    } else {
        return {};  // picking on screen: this host has no screen
    }
    auto* set = new zvlisp::PicksetObject;
    const Value result = Value::object(Type::Pickset, set);
    if (!db().modelSpace()) return {};
    for (zvdb::Entity* e : db().modelSpace()->entities()) {
        if (!passes(*e, filter)) continue;
        if (windowed) {
            // Windows see what shows: entities of thawed layers, inside (W) or touching (C).
            const zvdb::LayerRecord* layer = db().layer(e->layer());
            if (layer && layer->isFrozen()) continue;
            const zvdb::BoundingBox box = zvdb::Extents::ofEntity(*e, false);
            if (box.isEmpty()) continue;
            const bool inside = box.min.x >= window.min.x && box.max.x <= window.max.x &&
                                box.min.y >= window.min.y && box.max.y <= window.max.y;
            const bool touching = box.max.x >= window.min.x && box.min.x <= window.max.x &&
                                  box.max.y >= window.min.y && box.min.y <= window.max.y;
            if (mode == "W" ? !inside : !touching) continue;
        }
        set->names.push_back({&db(), e->handle()});
    }
    return set->names.empty() ? Value() : result;
}

zvlisp::PicksetObject* CadFunctions::pickset(const Value& v) {
    if (v.type() != Type::Pickset) lisp_.badType("lselsetp", v);
    return static_cast<zvlisp::PicksetObject*>(v.asObject());
}

void CadFunctions::install() {
    const std::shared_ptr<CadFunctions> self = shared_from_this();
    lisp_.define(
        "entget", [self](Interpreter&, Args a) { return self->entget(a); }, 1, 2);
    lisp_.define(
        "entmod", [self](Interpreter&, Args a) { return self->entmod(a); }, 1, 1);
    lisp_.define(
        "entupd", [](Interpreter&, Args a) { return a[0]; }, 1, 1);
    lisp_.define(
        "entnext", [self](Interpreter&, Args a) { return self->entnext(a); }, 0, 1);
    lisp_.define(
        "entlast",
        [self](Interpreter&, Args) {
            const auto all = self->db().modelSpace() ? self->db().modelSpace()->entities()
                                                     : std::vector<zvdb::Entity*>();
            return all.empty() ? Value() : self->ename(all.back());
        },
        0, 0);
    lisp_.define(
        "entdel",
        [self](Interpreter&, Args a) {
            zvdb::DbObject* o = self->object(a[0]);
            if (!o) return Value();
            o->erase();
            return a[0];
        },
        1, 1);
    lisp_.define(
        "handent",
        [self](Interpreter& in, Args a) {
            return self->ename(
                self->db().objectByHandle(zvdb::TagValues::toHandle(in.toStr(a[0]).toStdString())));
        },
        1, 1);
    lisp_.define(
        "tblsearch", [self](Interpreter&, Args a) { return self->tblsearch(a, false); }, 2, 3);
    lisp_.define(
        "tblnext", [self](Interpreter&, Args a) { return self->tblsearch(a, true); }, 1, 2);
    lisp_.define(
        "tblobjname",
        [self](Interpreter& in, Args a) {
            zvdb::SymbolTable* t = self->table(a[0]);
            if (!t) return Value();
            for (zvdb::DbObject* r : t->records())
                if (text(r->text(2)).compare(in.toStr(a[1]), Qt::CaseInsensitive) == 0)
                    return self->ename(r);
            return Value();
        },
        2, 2);
    lisp_.define(
        "regapp",
        [self](Interpreter& in, Args a) {
            return self->db().registerApplication(in.toStr(a[0]).toStdString()) ? a[0] : Value();
        },
        1, 1);
    lisp_.define(
        "getvar", [self](Interpreter&, Args a) { return self->getvar(a); }, 1, 1);
    lisp_.define(
        "setvar", [self](Interpreter&, Args a) { return self->setvar(a); }, 2, 2);
    lisp_.define(
        "namedobjdict",
        // A drawing without one gets its named-object dictionary, as a CAD program makes it.
        [self](Interpreter&, Args) { return self->ename(self->db().ensureNamedObjects()); }, 0, 0);
    lisp_.define(
        "dictsearch", [self](Interpreter&, Args a) { return self->dictsearch(a); }, 2, 3);
    lisp_.define(
        "dictnext", [self](Interpreter&, Args a) { return self->dictnext(a); }, 1, 2);
    lisp_.define(
        "ssget", [self](Interpreter&, Args a) { return self->ssget(a); }, 0, 4);
    lisp_.define(
        "sslength",
        [self](Interpreter&, Args a) {
            return Value::integer(std::int32_t(self->pickset(a[0])->names.size()));
        },
        1, 1);
    lisp_.define(
        "ssname",
        [self](Interpreter& in, Args a) {
            const auto& names = self->pickset(a[0])->names;
            const int i = in.toInt(a[1]);
            if (i < 0 || i >= int(names.size())) return Value();
            return self->ename(self->db().objectByHandle(names[size_t(i)].handle));
        },
        2, 2);
    lisp_.define(
        "ssadd",
        [self](Interpreter& in, Args a) {
            auto* set = new zvlisp::PicksetObject;
            Value result = Value::object(Type::Pickset, set);
            if (a.has(1)) {
                set->names = self->pickset(a[1])->names;
                result = a[1];
                set = self->pickset(a[1]);
            }
            if (a.has(0) && !a[0].isNil()) {
                if (a[0].type() != Type::Ename) in.badType("lentityp", a[0]);
                const auto name = static_cast<zvlisp::EnameObject*>(a[0].asObject())->name;
                if (std::find(set->names.begin(), set->names.end(), name) == set->names.end())
                    set->names.push_back(name);
            }
            return result;
        },
        0, 2);
    const zvlisp::NativeFn command = [self](Interpreter& in, Args a) {
        return self->command(in, a);
    };
    lisp_.define("command", command, 0, zvlisp::kVariadic);
    lisp_.define("command-s", command, 0, zvlisp::kVariadic);
}

// A command's tokens as a user types them: texts as they are, numbers, points as "x,y,z";
// nil adds nothing. An unknown command says so and answers nil, as CAD hosts do, so a
// start-up file goes on; a host command that fails is an error.
Value CadFunctions::command(Interpreter& in, Args a) {
    QStringList tokens;
    for (const Value& v : a) {
        if (v.isNil()) continue;
        if (v.isString()) {
            tokens << v.asString();
        } else if (v.isInt()) {
            tokens << QString::number(v.asInt());
        } else if (v.isReal()) {
            tokens << QString::number(v.asReal(), 'g', 17);
        } else if (v.isCons()) {
            QStringList xyz;
            for (const Value& c : in.toVector(v))
                xyz << QString::number(in.toNumber(c), 'g', 17);
            tokens << xyz.join(',');
        } else if (v.type() == Type::Ename) {
            const zvdb::DbObject* o = object(v);
            tokens << (o ? QString::fromStdString(zvdb::TagValues::fromHandle(o->handle()))
                         : QString());
        } else {
            in.badType("stringp", v);
        }
    }
    if (tokens.isEmpty()) return {};
    if (!document_.hasHostCommand(tokens.first())) {
        in.write("Unknown command \"" + tokens.first() + "\".\n");
        return {};
    }
    if (!document_.runCommand(tokens)) in.fail("Command failed: " + tokens.first());
    return {};
}

}  // namespace cadlisp

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::Value;

void installCadFunctions(Interpreter& lisp, HostDocument& document) {
    auto functions = std::make_shared<cadlisp::CadFunctions>(lisp, document);
    functions->install();
    functions->installObjects();
    functions->installSelection();
    functions->installInput();
    lisp.define(
        "vl-cmdf",
        [](Interpreter& in, Args a) {
            in.apply(in.global("command"), a);
            return in.t();
        },
        0, zvlisp::kVariadic);
}

}  // namespace zvhost
