// Objects made from lists of groups: entmake and entmakex (entities, table records,
// dictionaries and Xrecords), the dictionary edits and the extended-data room.
#include "CadFunctions.h"

#include "drawing/BlockRecord.h"
#include "drawing/Dictionary.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"
#include "drawing/XRecord.h"
#include "lisp/Printer.h"

#include <QHash>

#include <unordered_set>

namespace zvhost::cadlisp {

namespace {

// Extended data an entity may carry, in bytes.
constexpr int kXDataRoom = 16383;

// The groups of the common entity part, which go before the type's own subclass.
bool isCommonEntityCode(int code) {
    switch (code) {
        case 6:
        case 48:
        case 60:
        case 62:
        case 284:
        case 347:
        case 370:
        case 390:
        case 420:
        case 430:
        case 440:
            return true;
        default:
            return false;
    }
}

struct EntityKind {
    const char* subclass;
    std::vector<int> required;
};

// The entity types entmake makes, their subclass marker and the groups they need.
const QHash<QString, EntityKind>& entityKinds() {
    static const QHash<QString, EntityKind> kinds{
        {"LINE", {"AcDbLine", {10, 11}}},           {"CIRCLE", {"AcDbCircle", {10, 40}}},
        {"ARC", {"AcDbCircle", {10, 40, 50, 51}}},  {"POINT", {"AcDbPoint", {10}}},
        {"TEXT", {"AcDbText", {10, 40, 1}}},        {"MTEXT", {"AcDbMText", {10}}},
        {"LWPOLYLINE", {"AcDbPolyline", {10}}},     {"INSERT", {"AcDbBlockReference", {2, 10}}},
        {"ELLIPSE", {"AcDbEllipse", {10, 11, 40}}}, {"SOLID", {"AcDbTrace", {10, 11, 12}}},
    };
    return kinds;
}

struct TableKind {
    const char* table;
    const char* subclass;
};

const QHash<QString, TableKind>& tableKinds() {
    static const QHash<QString, TableKind> kinds{
        {"LAYER", {"LAYER", "AcDbLayerTableRecord"}},
        {"LTYPE", {"LTYPE", "AcDbLinetypeTableRecord"}},
        {"STYLE", {"STYLE", "AcDbTextStyleTableRecord"}},
        {"APPID", {"APPID", "AcDbRegAppTableRecord"}},
        {"DIMSTYLE", {"DIMSTYLE", "AcDbDimStyleTableRecord"}},
        {"UCS", {"UCS", "AcDbUCSTableRecord"}},
        {"VIEW", {"VIEW", "AcDbViewTableRecord"}},
    };
    return kinds;
}

bool has(const std::vector<zvdb::Tag>& tags, int code) {
    return std::any_of(tags.begin(), tags.end(),
                       [&](const zvdb::Tag& t) { return t.code == code; });
}

std::string_view valueOf(const std::vector<zvdb::Tag>& tags, int code) {
    for (const zvdb::Tag& t : tags)
        if (t.code == code) return t.value;
    return {};
}

// What entmake rejects in a name: empty, or characters no table record name may hold.
bool validName(std::string_view name) {
    if (name.empty()) return false;
    for (char c : name)
        if (std::string_view("<>/\\\":;?*|,=`").find(c) != std::string_view::npos) return false;
    return true;
}

}  // namespace

// The list's groups as tags, each value held by the drawing; points give their three
// coordinate groups. False for a group of no known form (the list is invalid then).
bool CadFunctions::toTags(const Value& list, std::vector<zvdb::Tag>* tags) {
    for (Value v = list; !v.isNil(); v = v.asCons()->cdr) {
        if (!v.isCons()) return false;
        const Value& group = v.asCons()->car;
        if (!group.isCons() || !group.asCons()->car.isInt()) return false;
        const int code = group.asCons()->car.asInt();
        const Value& value = group.asCons()->cdr;
        if (code == -1 || code == -3 || code == 5 || code == 102 || code == 105) continue;
        if (code < 0 || code > 1071) return false;
        const auto c = std::int16_t(code);
        if (kindOf(code) == Kind::Point) {
            if (!value.isCons()) return false;
            const std::vector<Value> xyz = lisp_.toVector(value);
            if (xyz.size() < 2 || xyz.size() > 3) return false;
            for (size_t k = 0; k < 3; ++k) {
                if (k < xyz.size() && !xyz[k].isNumber()) return false;
                const double coordinate = k < xyz.size() ? xyz[k].asNumber() : 0.0;
                tags->push_back({std::int16_t(c + 10 * int(k)),
                                 db().store(zvdb::TagValues::fromReal(coordinate))});
            }
        } else if (value.isString()) {
            tags->push_back({c, db().store(value.asString().toStdString())});
        } else if (value.isReal()) {
            tags->push_back({c, db().store(zvdb::TagValues::fromReal(value.asReal()))});
        } else if (value.isInt()) {
            tags->push_back({c, db().store(kindOf(code) == Kind::Real
                                               ? zvdb::TagValues::fromReal(value.asInt())
                                               : zvdb::TagValues::fromInteger(value.asInt()))});
        } else if (value.type() == Type::Ename) {
            const zvdb::DbObject* o = object(value);
            if (!o) return false;
            tags->push_back({c, db().store(zvdb::TagValues::fromHandle(o->handle()))});
        } else {
            return false;
        }
    }
    return true;
}

zvdb::DbObject* CadFunctions::makeEntity(const QString& type,
                                         const std::vector<zvdb::Tag>& groups) {
    const auto kind = entityKinds().constFind(type);
    if (kind == entityKinds().constEnd()) return nullptr;
    for (int code : kind->required)
        if (!has(groups, code)) return nullptr;
    const long long colour = zvdb::TagValues::toInteger(valueOf(groups, 62), 256);
    if (colour < 0 || colour > 256) return nullptr;
    if (has(groups, 40) && zvdb::TagValues::toReal(valueOf(groups, 40)) <= 0.0 &&
        (type == "CIRCLE" || type == "ARC" || type == "TEXT"))
        return nullptr;
    if (has(groups, 6)) {
        zvdb::SymbolTable* linetypes = db().table("LTYPE");
        const std::string_view name = valueOf(groups, 6);
        if (!zvdb::TagValues::sameName(name, "BYLAYER") &&
            !zvdb::TagValues::sameName(name, "BYBLOCK") && (!linetypes || !linetypes->find(name)))
            return nullptr;
    }
    if (type == "INSERT") {
        const zvdb::BlockRecord* block = db().block(valueOf(groups, 2));
        if (!block || block->isLayout()) return nullptr;
    }
    std::string layer(has(groups, 8) ? valueOf(groups, 8) : db().currentLayer());
    if (!validName(layer)) return nullptr;
    db().createLayer(layer);
    std::vector<zvdb::Tag> body;
    for (const zvdb::Tag& t : groups)
        if (isCommonEntityCode(t.code)) body.push_back(t);
    body.push_back({100, kind->subclass});
    std::vector<zvdb::Tag> own;
    for (const zvdb::Tag& t : groups)
        if (!isCommonEntityCode(t.code) && t.code != 0 && t.code != 8 && t.code != 67 &&
            t.code != 100 && t.code != 330 && !(type == "LWPOLYLINE" && t.code == 90))
            own.push_back(t);
    if (type == "LWPOLYLINE") {
        // The vertex count goes first; the list may leave it out or give it wrong.
        const auto vertices =
            std::count_if(own.begin(), own.end(), [](const zvdb::Tag& t) { return t.code == 10; });
        body.push_back({90, db().store(zvdb::TagValues::fromInteger(vertices))});
        if (!has(own, 70)) body.push_back({70, "0"});
    }
    for (const zvdb::Tag& t : own) {
        // An arc's angles and a text's vertical alignment sit in a second subclass.
        if (type == "ARC" && t.code == 50) body.push_back({100, "AcDbArc"});
        if (type == "TEXT" && t.code == 73) body.push_back({100, "AcDbText"});
        body.push_back(t);
    }
    if (type == "TEXT" && !has(own, 73)) body.push_back({100, "AcDbText"});
    zvdb::BlockRecord* space = zvdb::TagValues::toInteger(valueOf(groups, 67)) == 1
                                   ? db().paperSpace()
                                   : db().modelSpace();
    if (!space) return nullptr;
    return db().addEntity(*space, type.toStdString(), body, layer);
}

zvdb::DbObject* CadFunctions::makeTableRecord(const QString& type,
                                              const std::vector<zvdb::Tag>& groups) {
    const TableKind kind = tableKinds().value(type);
    const std::string_view name = valueOf(groups, 2);
    if (!validName(name)) return nullptr;
    if (zvdb::SymbolTable* t = db().table(kind.table); t && t->find(name)) return nullptr;
    std::vector<zvdb::Tag> more;
    for (const zvdb::Tag& t : groups)
        if (t.code != 0 && t.code != 2 && t.code != 70 && t.code != 100 && t.code != 330)
            more.push_back(t);
    if (type == "LAYER") {
        const long long colour = zvdb::TagValues::toInteger(valueOf(groups, 62), 7);
        if (colour == 0 || colour < -255 || colour > 255) return nullptr;
        if (!has(groups, 62)) more.push_back({62, "7"});
        if (!has(groups, 6)) more.push_back({6, "Continuous"});
        db().ensureTable("LTYPE");
        zvdb::SymbolTable* linetypes = db().table("LTYPE");
        if (!linetypes || !linetypes->find(valueOf(more, 6))) return nullptr;
    }
    zvdb::DbObject* record = db().createTableRecord(kind.table, name, kind.subclass, more);
    if (record && has(groups, 70))
        record->setInteger(70, zvdb::TagValues::toInteger(valueOf(groups, 70)));
    return record;
}

// Dictionaries and Xrecords, owned by the 330 group's object when it is a dictionary (not
// an entry of it: dictadd makes one), else by the named-objects dictionary.
zvdb::DbObject* CadFunctions::makeObject(const QString& type,
                                         const std::vector<zvdb::Tag>& groups) {
    zvdb::DbObject* owner = nullptr;
    if (has(groups, 330))
        owner = db().objectByHandle(zvdb::TagValues::toHandle(valueOf(groups, 330)));
    if (!owner || owner->isErased()) owner = db().ensureNamedObjects();
    if (type == "XRECORD") {
        std::vector<zvdb::Tag> data;
        for (const zvdb::Tag& t : groups)
            if (t.code != 0 && t.code != 100 && t.code != 330 && t.code != 280) data.push_back(t);
        zvdb::XRecord* record = db().createXRecord(*owner);
        record->setData(data);
        return record;
    }
    // A dictionary's entries come as (3 . name) (350 . ename) pairs.
    std::vector<std::pair<std::string_view, zvdb::DbObject*>> entries;
    std::string_view pending;
    for (const zvdb::Tag& t : groups) {
        if (t.code == 3) pending = t.value;
        if ((t.code == 350 || t.code == 360) && !pending.empty()) {
            zvdb::DbObject* entry = db().objectByHandle(zvdb::TagValues::toHandle(t.value));
            if (!entry || entry->isErased()) return nullptr;
            entries.push_back({pending, entry});
            pending = {};
        }
    }
    const bool hardOwner = zvdb::TagValues::toInteger(valueOf(groups, 280)) == 1;
    zvdb::Dictionary* dictionary = db().createDictionary(*owner, hardOwner);
    for (const auto& [name, entry] : entries)
        dictionary->setAt(name, *entry);
    return dictionary;
}

zvdb::DbObject* CadFunctions::makeFromList(const Value& list) {
    if (!list.isCons()) return nullptr;
    // The type is the first group, or the second after the entity name.
    Value first = list.asCons()->car;
    if (first.isCons() && first.asCons()->car.isInt() && first.asCons()->car.asInt() == -1)
        first = car(list.asCons()->cdr);
    if (!first.isCons() || !first.asCons()->car.isInt() || first.asCons()->car.asInt() != 0 ||
        !first.asCons()->cdr.isString())
        return nullptr;
    const QString type = first.asCons()->cdr.asString().toUpper();
    std::vector<zvdb::Tag> groups;
    if (!toTags(list, &groups)) return nullptr;
    // Extended data: every application registered, every item of a known form.
    Value xdataGroups;
    for (Value v = list; v.isCons(); v = v.asCons()->cdr) {
        const Value& group = v.asCons()->car;
        if (group.asCons()->car.asInt() == -3) xdataGroups = group.asCons()->cdr;
    }
    std::vector<std::pair<std::string, std::vector<zvdb::Tag>>> xdata;
    for (Value g = xdataGroups; !g.isNil(); g = cdr(g)) {
        const Value& app = car(g);
        if (!g.isCons() || !app.isCons() || !app.asCons()->car.isString()) return nullptr;
        const std::string name = app.asCons()->car.asString().toStdString();
        if (!db().isApplicationRegistered(name)) return nullptr;
        std::vector<zvdb::Tag> items;
        if (!toTags(app.asCons()->cdr, &items)) return nullptr;
        xdata.push_back({name, std::move(items)});
    }
    zvdb::DbObject* made = nullptr;
    if (tableKinds().contains(type))
        made = makeTableRecord(type, groups);
    else if (type == "DICTIONARY" || type == "XRECORD")
        made = makeObject(type, groups);
    else
        made = makeEntity(type, groups);
    if (!made) return nullptr;
    for (const auto& [name, items] : xdata)
        made->setXData(name, items);
    return made;
}

Value CadFunctions::entmake(Args a, bool returnName) {
    if (!a.has(0) || a[0].isNil()) return {};
    lisp_.checkList(a[0]);
    zvdb::DbObject* made = makeFromList(a[0]);
    if (!made) return {};
    return returnName ? ename(made) : a[0];
}

// The bytes a list of extended data takes: per item its group code's two bytes and its
// value (a text its UTF-8 bytes and a length byte, a real 8, a point 24, a 16-bit integer 2,
// a 32-bit one 4, a handle 8, binary data its bytes); -1 for an invalid list.
int CadFunctions::xdataSize(const Value& list) {
    // ((-3 (APP ...) ...)), (-3 (APP ...) ...) or ((APP ...) ...).
    Value apps = list;
    if (car(apps).isInt() && car(apps).asInt() == -3) apps = cdr(apps);
    if (car(car(apps)).isInt() && car(car(apps)).asInt() == -3) apps = cdr(car(apps));
    int size = 0;
    for (Value g = apps; !g.isNil(); g = cdr(g)) {
        const Value& app = car(g);
        if (!g.isCons() || !app.isCons() || !app.asCons()->car.isString()) return -1;
        const QByteArray name = app.asCons()->car.asString().toUtf8();
        if (!db().isApplicationRegistered(name.toStdString())) {
            lisp_.write("Invalid application name in 1001 group\n");
            return -1;
        }
        size += 2 + 1 + int(name.size());
        int braces = 0;
        for (Value it = app.asCons()->cdr; !it.isNil(); it = cdr(it)) {
            const Value& item = car(it);
            if (!it.isCons() || !item.isCons() || !item.asCons()->car.isInt()) return -1;
            const int code = item.asCons()->car.asInt();
            const Value& value = item.asCons()->cdr;
            size += 2;
            if (code == 1002) {
                if (!value.isString()) return -1;
                braces += value.asString() == "{" ? 1 : -1;
                if (braces < 0) return -1;
                size += 1;
            } else if (code == 1000 || code == 1003) {
                if (!value.isString()) return -1;
                size += 1 + int(value.asString().toUtf8().size());
            } else if (code == 1004) {
                if (!value.isString()) return -1;
                size += int(value.asString().size()) / 2;
            } else if (code == 1005) {
                size += 8;
            } else if (code >= 1010 && code <= 1013) {
                if (!value.isCons()) return -1;
                size += 24;
            } else if (code >= 1040 && code <= 1042) {
                if (!value.isNumber()) return -1;
                size += 8;
            } else if (code == 1070) {
                if (!value.isInt()) return -1;
                size += 2;
            } else if (code == 1071) {
                if (!value.isNumber()) return -1;
                size += 4;
            } else {
                return -1;
            }
        }
        if (braces != 0) return -1;
    }
    return size;
}

void CadFunctions::installObjects() {
    const std::shared_ptr<CadFunctions> self = shared_from_this();
    lisp_.define(
        "entmake", [self](Interpreter&, Args a) { return self->entmake(a, false); }, 0, 1);
    lisp_.define(
        "entmakex", [self](Interpreter&, Args a) { return self->entmake(a, true); }, 0, 1);
    lisp_.define(
        "dictadd",
        [self](Interpreter& in, Args a) {
            auto* dictionary = dynamic_cast<zvdb::Dictionary*>(self->object(a[0]));
            const std::string name = in.toStr(a[1]).toStdString();
            zvdb::DbObject* entry = self->object(a[2]);
            if (!dictionary || !entry || name.empty() || dictionary->get(name)) return Value();
            dictionary->setAt(name, *entry);
            return a[2];
        },
        3, 3);
    lisp_.define(
        "dictremove",
        [self](Interpreter& in, Args a) {
            auto* dictionary = dynamic_cast<zvdb::Dictionary*>(self->object(a[0]));
            if (!dictionary) return Value();
            const std::string name = in.toStr(a[1]).toStdString();
            zvdb::DbObject* entry = dictionary->get(name);
            if (!entry || !dictionary->remove(name)) return Value();
            return self->ename(entry);
        },
        2, 2);
    lisp_.define(
        "dictrename",
        [self](Interpreter& in, Args a) {
            auto* dictionary = dynamic_cast<zvdb::Dictionary*>(self->object(a[0]));
            if (!dictionary) return Value();
            const std::string from = in.toStr(a[1]).toStdString();
            const std::string to = in.toStr(a[2]).toStdString();
            zvdb::DbObject* entry = dictionary->get(from);
            if (!entry || to.empty() || dictionary->get(to)) return Value();
            dictionary->remove(from);
            dictionary->setAt(to, *entry);
            return a[2];
        },
        3, 3);
    lisp_.define(
        "xdsize",
        [self](Interpreter& in, Args a) {
            in.checkList(a[0]);
            const int size = self->xdataSize(a[0]);
            return size < 0 ? Value() : Value::integer(size);
        },
        1, 1);
    lisp_.define(
        "xdroom",
        [self](Interpreter&, Args a) {
            zvdb::DbObject* o = self->object(a[0]);
            if (!o) return Value();
            const Value x = self->xdata(*o, Value::cons(Value::string("*"), Value()));
            const int used = x.isNil() ? 0 : self->xdataSize(x);
            return Value::integer(kXDataRoom - std::max(used, 0));
        },
        1, 1);
}

}  // namespace zvhost::cadlisp
