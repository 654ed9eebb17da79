// Data conversions (angtof, cvunit, vl-string-mismatch, vl-list-length), the version, the
// memory calls of old programs (harmless: memory is automatic here), and the functions that
// need a screen, a tablet or a Windows service, which fail naming themselves.
#include "Builtins.h"
#include "Interpreter.h"
#include "NumberFormat.h"
#include "UnitTable.h"

#include <cmath>

namespace zvlisp {

namespace {

// The segment size that alloc reports: the one it was last given.
thread_local int segmentSize = 514;

Value listLength(Interpreter& in, Args a) {
    in.checkList(a[0]);
    std::int32_t n = 0;
    const Value* cell = &a[0];
    for (; cell->isCons(); cell = &cell->asCons()->cdr)
        ++n;
    return cell->isNil() ? Value::integer(n) : Value();
}

Value stringMismatch(Interpreter& in, Args a) {
    const QString& one = in.toStr(a[0]);
    const QString& two = in.toStr(a[1]);
    const int from1 = a.has(2) && !a[2].isNil() ? in.toInt(a[2]) : 0;
    const int from2 = a.has(3) && !a[3].isNil() ? in.toInt(a[3]) : 0;
    const bool ignoreCase = a.has(4) && !a[4].isNil();
    if (from1 < 0) in.fail("bad argument value: " + QString::number(from1));
    if (from2 < 0) in.fail("bad argument value: " + QString::number(from2));
    int n = 0;
    while (from1 + n < one.size() && from2 + n < two.size()) {
        QChar c1 = one[from1 + n], c2 = two[from2 + n];
        if (ignoreCase) c1 = c1.toUpper(), c2 = c2.toUpper();
        if (c1 != c2) break;
        ++n;
    }
    return Value::integer(n);
}

Value angtof(Interpreter& in, Args a) {
    const QString& text = in.toStr(a[0]);
    const int mode = a.has(1) && !a[1].isNil() ? in.toInt(a[1]) : in.units.aunits;
    if (mode < 0 || mode > 4) in.fail("bad argument value: " + QString::number(mode));
    const std::optional<double> radians = NumberFormat::parseAngle(text, mode);
    return radians ? Value::real(*radians) : Value();
}

// A number or a point of numbers, converted one coordinate at a time.
Value cvunit(Interpreter& in, Args a) {
    const QString& from = in.toStr(a[1]);
    const QString& to = in.toStr(a[2]);
    const UnitTable& table = UnitTable::cached(in.unitTableFile);
    auto one = [&](const Value& v) -> std::optional<double> {
        return table.convert(in.toNumber(v), from, to);
    };
    if (a[0].isNumber()) {
        const std::optional<double> r = one(a[0]);
        return r ? Value::real(*r) : Value();
    }
    if (!a[0].isCons()) in.badType("numberp:", a[0]);
    ListBuilder point;
    for (const Value& v : in.toVector(a[0])) {
        const std::optional<double> r = one(v);
        if (!r) return Value();
        point.add(Value::real(*r));
    }
    return point.take();
}

// What fails here because the host has no such thing.
void unavailable(Interpreter& in, const char* name, const char* reason) {
    const QString text =
        QLatin1String(name) + QLatin1String(": not available: ") + QLatin1String(reason);
    in.define(
        name, [text](Interpreter& in, Args) -> Value { in.fail(text); }, 0, kVariadic);
}

void defineMemory(Interpreter& in) {
    in.define(
        "gc", [](Interpreter&, Args) { return Value(); }, 0, 0);
    in.define(
        "mem",
        [](Interpreter& in, Args) {
            in.write(QStringLiteral("; memory is managed automatically: %1 blocks of 64 KiB in "
                                    "the pool of small objects\n")
                         .arg(poolChunks()));
            return Value();
        },
        0, 0);
    in.define(
        "alloc",
        [](Interpreter& in, Args a) {
            const int previous = segmentSize;
            segmentSize = in.toInt(a[0]);
            return Value::integer(previous);
        },
        1, 1);
    in.define(
        "expand", [](Interpreter& in, Args a) { return Value::integer(in.toInt(a[0])); }, 1, 1);
    in.define(
        "vl-load-com", [](Interpreter&, Args) { return Value(); }, 0, 0);
    in.define(
        "ver",
        [](Interpreter&, Args) { return Value::string(QStringLiteral("ZVListas LISP 2026 (en)")); },
        0, 0);
}

}  // namespace

void registerSystemBuiltins(Interpreter& in) {
    in.define("vl-list-length", listLength, 1, 1);
    in.define("vl-string-mismatch", stringMismatch, 2, 5);
    in.define("angtof", angtof, 1, 2);
    in.define("cvunit", cvunit, 3, 3);
    defineMemory(in);
    for (const char* name : {"grread", "grdraw", "grvecs", "grtext", "grclear"})
        unavailable(in, name, "this host has no screen");
    for (const char* name : {"menucmd", "menugroup"})
        unavailable(in, name, "this host has no menus");
    unavailable(in, "tablet", "this host has no digitizing tablet");
    for (const char* name :
         {"vl-registry-read", "vl-registry-write", "vl-registry-delete", "vl-registry-descendents"})
        unavailable(in, name, "this system has no registry");
}

}  // namespace zvlisp
