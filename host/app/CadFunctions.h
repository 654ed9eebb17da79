#pragma once
// The state and helpers of the CAD functions of the host LISP (CadLisp.h), shared by the
// sources that define them: entities and tables (CadLisp.cpp), objects made from lists
// (CadLispObjects.cpp), selection sets and coordinates (CadLispSelection.cpp).
#include "HostDocument.h"
#include "drawing/Database.h"
#include "drawing/DbObject.h"
#include "drawing/Tag.h"
#include "drawing/TagValues.h"
#include "lisp/Function.h"
#include "lisp/Interpreter.h"

#include <QHash>

#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace zvdb {
class Entity;
class SymbolTable;
}  // namespace zvdb

namespace zvhost::cadlisp {

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::ListBuilder;
using zvlisp::Type;
using zvlisp::Value;

// How a group code's value reads in LISP.
enum class Kind { Text, Real, Integer, Point, Pointer };
Kind kindOf(int code);
QString text(std::string_view v);

class CadFunctions : public std::enable_shared_from_this<CadFunctions> {
public:
    CadFunctions(Interpreter& lisp, HostDocument& document) : lisp_(lisp), document_(document) {}
    // Each function holds the shared state, so it lives as long as the interpreter.
    void install();
    void installObjects();
    void installSelection();
    void installInput();

    // The entity a pick at a point finds: the last drawn whose shape passes within
    // `tolerance`, among the model space entities of thawed layers; null when none.
    zvdb::Entity* entityAt(const zvdb::Point3& point, double tolerance);
    Value ename(const zvdb::DbObject* object) {
        if (!object) return {};
        return Value::object(Type::Ename,
                             new zvlisp::EnameObject({&object->database(), object->handle()}));
    }
    // The live object of an entity name of this drawing; null for an erased one.
    zvdb::DbObject* object(const Value& v) {
        if (v.type() != Type::Ename) lisp_.badType("lentityp", v);
        const auto name = static_cast<zvlisp::EnameObject*>(v.asObject())->name;
        if (name.database != document_.database()) return nullptr;
        zvdb::DbObject* o = db().objectByHandle(name.handle);
        return o && !o->isErased() ? o : nullptr;
    }

private:
    zvdb::Database& db() { return *document_.database(); }
    Value pair(int code, Value v) { return Value::cons(Value::integer(code), std::move(v)); }
    Value point(int code, const zvdb::Point3& p) {
        ListBuilder list;
        list.add(Value::integer(code));
        list.add(Value::real(p.x));
        list.add(Value::real(p.y));
        list.add(Value::real(p.z));
        return list.take();
    }
    Value groupValue(int code, std::string_view raw) {
        switch (kindOf(code)) {
            case Kind::Real:
                return Value::real(zvdb::TagValues::toReal(raw));
            case Kind::Integer:
                return Value::integer(std::int32_t(zvdb::TagValues::toInteger(raw)));
            case Kind::Pointer:
                return ename(db().objectByHandle(zvdb::TagValues::toHandle(raw)));
            default:
                return Value::string(text(raw));
        }
    }
    // The tags of a range as dotted pairs, points gathered from their three groups.
    void addGroups(ListBuilder& list, std::span<const zvdb::Tag> tags, size_t from, size_t to) {
        for (size_t i = from; i < to; ++i) {
            const int code = tags[i].code;
            if (code == 102) {  // application groups stay out, as CAD users see them
                while (i + 1 < to && !(tags[i + 1].code == 102))
                    ++i;
                ++i;
                continue;
            }
            if (kindOf(code) == Kind::Point) {
                zvdb::Point3 p{zvdb::TagValues::toReal(tags[i].value), 0, 0};
                if (i + 1 < to && tags[i + 1].code == code + 10)
                    p.y = zvdb::TagValues::toReal(tags[++i].value);
                if (i + 1 < to && tags[i + 1].code == code + 20)
                    p.z = zvdb::TagValues::toReal(tags[++i].value);
                list.add(point(code, p));
            } else {
                list.add(pair(code, groupValue(code, tags[i].value)));
            }
        }
    }
    Value xdata(const zvdb::DbObject& o, const Value& applications);
    Value entget(Args a);
    Value entmod(Args a);
    void setGroup(zvdb::DbObject& o, int code, int occurrence, const Value& value);
    Value entnext(Args a);
    Value tblsearch(Args a, bool next);
    Value getvar(Args a);
    Value setvar(Args a);
    Value dictsearch(Args a);
    Value dictnext(Args a);
    std::vector<zvdb::Entity*> sequence();
    Value ssget(Args a);
    bool passes(const zvdb::Entity& e, const Value& filter);
    zvlisp::PicksetObject* pickset(const Value& v);
    zvdb::SymbolTable* table(const Value& name);
    // Objects made from lists (CadLispObjects.cpp).
    Value entmake(Args a, bool returnName);
    zvdb::DbObject* makeFromList(const Value& list);
    zvdb::DbObject* makeEntity(const QString& type, const std::vector<zvdb::Tag>& groups);
    zvdb::DbObject* makeTableRecord(const QString& type, const std::vector<zvdb::Tag>& groups);
    zvdb::DbObject* makeObject(const QString& type, const std::vector<zvdb::Tag>& groups);
    bool toTags(const Value& list, std::vector<zvdb::Tag>* tags);
    int xdataSize(const Value& list);
    // Selection sets and coordinates (CadLispSelection.cpp).
    Value command(Interpreter& in, Args a);
    Value ssnamex(Args a);
    Value trans(Args a);
    Value textbox(Args a);
    // User input (CadLispInput.cpp).
    struct Keyword {
        QString local, global;
    };
    // What the user answered a prompt; cancels the evaluation when the user cancels.
    QString ask(const QString& prompt);
    // Asks until an answer is accepted: Enter gives nil (unless initget forbids it), a
    // keyword of initget gives its name, else `accept` gives the value or a complaint. The
    // same rejected answer twice cancels (a script answers alike every time).
    using Accept =
        std::function<std::optional<Value>(const QString& answer, int bits, QString* complaint)>;
    Value input(const QString& prompt, const Accept& accept, bool keywordsAllowed = true);
    Value getNumber(Args a, bool integer);
    Value getString(Args a);
    Value getKeyword(Args a);
    Value getPoint(Args a, bool corner);
    Value getDistance(Args a);
    Value getAngle(Args a);
    Value entsel(Args a, bool nested);
    // The point an answer gives, "x,y[,z]" or "@dx,dy[,dz]" from `base`.
    std::optional<zvdb::Point3> parsePoint(const QString& answer, const zvdb::Point3* base) const;
    // The two ends of a distance or direction given as points: the answer is the second
    // point from `base`, or, with no base, the first of two (the second is asked for).
    // Nothing, and `complaint` set, when the answer or the second point is not a point.
    std::optional<std::pair<zvdb::Point3, zvdb::Point3>> pointPair(
        const QString& answer, const std::optional<zvdb::Point3>& base, QString* complaint);

    Interpreter& lisp_;
    HostDocument& document_;
    QHash<QString, int> tableCursor_;
    QHash<quint64, int> dictCursor_;
    int filedia_ = 1;
    // What the last initget set up for the next input function only.
    int initBits_ = 0;
    std::vector<Keyword> keywords_;
};

}  // namespace zvhost::cadlisp
