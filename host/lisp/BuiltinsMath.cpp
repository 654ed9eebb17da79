// Arithmetic (integers stay 32-bit and wrap, any real makes the result real), comparison,
// bits and the plane geometry of points given as lists of two or three numbers.
#include "Builtins.h"
#include "Equality.h"
#include "Interpreter.h"
#include "Printer.h"

#include <cmath>
#include <numeric>

namespace zvlisp {

namespace {

enum class Op { Add, Sub, Mul, Div, Rem };

std::int32_t wrap(std::uint32_t v) {
    return std::int32_t(v);
}

std::int32_t intOp(Interpreter& in, Op op, std::int32_t x, std::int32_t y) {
    const auto ux = std::uint32_t(x), uy = std::uint32_t(y);
    switch (op) {
        case Op::Add:
            return wrap(ux + uy);
        case Op::Sub:
            return wrap(ux - uy);
        case Op::Mul:
            return wrap(ux * uy);
        case Op::Div:
            if (y == 0) in.fail("divide by zero");
            return y == -1 ? wrap(0u - ux) : x / y;
        case Op::Rem:
            if (y == 0) in.fail("divide by zero");
            return y == -1 ? 0 : x % y;
    }
    return 0;
}

double realOp(Interpreter& in, Op op, double x, double y) {
    switch (op) {
        case Op::Add:
            return x + y;
        case Op::Sub:
            return x - y;
        case Op::Mul:
            return x * y;
        case Op::Div:
            if (y == 0.0) in.fail("divide by zero");
            return x / y;
        case Op::Rem:
            if (y == 0.0) in.fail("divide by zero");
            return std::fmod(x, y);
    }
    return 0.0;
}

Value arithmetic(Interpreter& in, Args a, Op op) {
    if (a.size() == 0) return Value::integer(0);
    Value acc = a[0];
    in.toNumber(acc);
    if (a.size() == 1 && op == Op::Sub)
        return acc.isInt() ? Value::integer(wrap(0u - std::uint32_t(acc.asInt())))
                           : Value::real(-acc.asReal());
    for (int i = 1; i < a.size(); ++i) {
        const Value& next = a[i];
        in.toNumber(next);
        if (acc.isInt() && next.isInt())
            acc = Value::integer(intOp(in, op, acc.asInt(), next.asInt()));
        else
            acc = Value::real(realOp(in, op, acc.asNumber(), next.asNumber()));
    }
    return acc;
}

Value extreme(Interpreter& in, Args a, bool wantMax) {
    if (a.size() == 0) return Value::integer(0);
    bool real = false;
    double best = in.toNumber(a[0]);
    for (const Value& v : a) {
        const double x = in.toNumber(v);
        real = real || v.isReal();
        if (wantMax ? x > best : x < best) best = x;
    }
    return real ? Value::real(best) : Value::integer(std::int32_t(best));
}

[[noreturn]] void undefinedFor(Interpreter& in, const Value& v) {
    in.fail("function undefined for argument: " + Printer::prin1(v));
}

Value power(Interpreter& in, Args a) {
    const double base = in.toNumber(a[0]), exponent = in.toNumber(a[1]);
    if (!a[0].isInt() || !a[1].isInt()) return Value::real(std::pow(base, exponent));
    std::int32_t b = a[0].asInt(), e = a[1].asInt();
    if (e < 0) return Value::integer(b == 1 ? 1 : b == -1 ? (e % 2 ? -1 : 1) : 0);
    std::uint32_t result = 1, square = std::uint32_t(b);
    for (; e > 0; e >>= 1, square *= square)
        if (e & 1) result *= square;
    return Value::integer(wrap(result));
}

Value fix(Interpreter& in, Args a) {
    if (a[0].isInt()) return a[0];
    const double t = std::trunc(in.toNumber(a[0]));
    if (t >= -2147483648.0 && t <= 2147483647.0) return Value::integer(std::int32_t(t));
    return Value::real(t);  // beyond 32 bits: a truncated real
}

Value boole(Interpreter& in, Args a) {
    const std::int32_t op = in.toInt(a[0]);
    std::uint32_t acc = std::uint32_t(in.toInt(a[1]));
    for (int i = 2; i < a.size(); ++i) {
        const std::uint32_t y = std::uint32_t(in.toInt(a[i]));
        std::uint32_t r = 0;
        if (op & 1) r |= acc & y;
        if (op & 2) r |= acc & ~y;
        if (op & 4) r |= ~acc & y;
        if (op & 8) r |= ~acc & ~y;
        acc = r;
    }
    return Value::integer(wrap(acc));
}

Value bitwise(Interpreter& in, Args a, bool isAnd) {
    std::uint32_t acc = isAnd ? ~0u : 0u;
    if (a.size() == 0) return Value::integer(0);
    for (const Value& v : a) {
        const auto x = std::uint32_t(in.toInt(v));
        acc = isAnd ? acc & x : acc | x;
    }
    return Value::integer(wrap(acc));
}

Value shift(Interpreter& in, Args a) {
    const auto x = std::uint32_t(a.has(0) ? in.toInt(a[0]) : 0);
    const std::int32_t n = a.has(1) ? in.toInt(a[1]) : 0;
    if (n >= 32 || n <= -32) return Value::integer(0);
    return Value::integer(wrap(n >= 0 ? x << n : x >> -n));
}

// = and /= compare neighbours; < > <= >= chain.
Value comparison(Interpreter& in, Args a, int mode) {
    for (int i = 0; i + 1 < a.size(); ++i) {
        if (mode == 0 || mode == 1) {
            const bool same = Equality::numericEqual(a[i], a[i + 1]);
            if (mode == 0 && !same) return Value();
            if (mode == 1 && same) return Value();
            continue;
        }
        const int c = Equality::compare(in, a[i], a[i + 1]);
        const bool ok = mode == 2 ? c < 0 : mode == 3 ? c > 0 : mode == 4 ? c <= 0 : c >= 0;
        if (!ok) return Value();
    }
    if (a.size() == 1) in.toNumber(a[0].isString() ? Value::integer(0) : a[0]);
    return in.t();
}

struct Point {
    double v[3] = {0, 0, 0};
    bool threeD = false;
};

Point toPoint(Interpreter& in, const Value& list) {
    Point p;
    int n = 0;
    const Value* c = &list;
    for (; c->isCons() && n < 4; c = &c->asCons()->cdr, ++n) {
        if (!c->asCons()->car.isNumber() || n == 3) in.badType("2D/3D point:", list);
        p.v[n] = c->asCons()->car.asNumber();
    }
    if (n < 2 || !c->isNil()) in.badType("2D/3D point:", list);
    p.threeD = n == 3;
    return p;
}

Value fromPoint(const Point& p) {
    ListBuilder list;
    for (int i = 0; i < (p.threeD ? 3 : 2); ++i)
        list.add(Value::real(p.v[i]));
    return list.take();
}

Value distance(Interpreter& in, Args a) {
    const Point p = toPoint(in, a[0]), q = toPoint(in, a[1]);
    const double dz = p.threeD && q.threeD ? q.v[2] - p.v[2] : 0.0;
    return Value::real(
        std::sqrt(std::pow(q.v[0] - p.v[0], 2) + std::pow(q.v[1] - p.v[1], 2) + dz * dz));
}

Value angle(Interpreter& in, Args a) {
    const Point p = toPoint(in, a[0]), q = toPoint(in, a[1]);
    double r = std::atan2(q.v[1] - p.v[1], q.v[0] - p.v[0]);
    if (r < 0) r += 2 * M_PI;
    return Value::real(r);
}

Value polar(Interpreter& in, Args a) {
    Point p = toPoint(in, a[0]);
    const double ang = in.toNumber(a[1]), dist = in.toNumber(a[2]);
    p.v[0] += dist * std::cos(ang);
    p.v[1] += dist * std::sin(ang);
    return fromPoint(p);
}

Value inters(Interpreter& in, Args a) {
    const Point p1 = toPoint(in, a[0]), p2 = toPoint(in, a[1]);
    const Point p3 = toPoint(in, a[2]), p4 = toPoint(in, a[3]);
    const bool onSegments = !a.has(4) || !a[4].isNil();
    const double d1x = p2.v[0] - p1.v[0], d1y = p2.v[1] - p1.v[1];
    const double d2x = p4.v[0] - p3.v[0], d2y = p4.v[1] - p3.v[1];
    const double den = d1x * d2y - d1y * d2x;
    if (std::fabs(den) < 1e-12) return Value();
    const double t = ((p3.v[0] - p1.v[0]) * d2y - (p3.v[1] - p1.v[1]) * d2x) / den;
    const double u = ((p3.v[0] - p1.v[0]) * d1y - (p3.v[1] - p1.v[1]) * d1x) / den;
    constexpr double eps = 1e-10;
    if (onSegments && (t < -eps || t > 1 + eps || u < -eps || u > 1 + eps)) return Value();
    Point r;
    r.threeD = p1.threeD && p2.threeD;
    for (int i = 0; i < 3; ++i)
        r.v[i] = p1.v[i] + t * (p2.v[i] - p1.v[i]);
    return fromPoint(r);
}

void defineArithmetic(Interpreter& in) {
    in.define("+", [](Interpreter& in, Args a) { return arithmetic(in, a, Op::Add); });
    in.define("-", [](Interpreter& in, Args a) { return arithmetic(in, a, Op::Sub); });
    in.define("*", [](Interpreter& in, Args a) { return arithmetic(in, a, Op::Mul); });
    in.define("/", [](Interpreter& in, Args a) { return arithmetic(in, a, Op::Div); });
    in.define("rem", [](Interpreter& in, Args a) { return arithmetic(in, a, Op::Rem); });
    in.define(
        "1+",
        [](Interpreter& in, Args a) {
            const Value one = Value::integer(1), args[] = {a[0], one};
            return arithmetic(in, Args(args, 2), Op::Add);
        },
        1, 1);
    in.define(
        "1-",
        [](Interpreter& in, Args a) {
            const Value one = Value::integer(1), args[] = {a[0], one};
            return arithmetic(in, Args(args, 2), Op::Sub);
        },
        1, 1);
    in.define(
        "abs",
        [](Interpreter& in, Args a) {
            in.toNumber(a[0]);
            if (a[0].isInt())
                return Value::integer(a[0].asInt() < 0 ? wrap(0u - std::uint32_t(a[0].asInt()))
                                                       : a[0].asInt());
            return Value::real(std::fabs(a[0].asReal()));
        },
        1, 1);
    in.define("max", [](Interpreter& in, Args a) { return extreme(in, a, true); });
    in.define("min", [](Interpreter& in, Args a) { return extreme(in, a, false); });
    in.define(
        "gcd",
        [](Interpreter& in, Args a) {
            std::int64_t g = std::abs(std::int64_t(in.toInt(a[0])));
            for (int i = 1; i < a.size(); ++i)
                g = std::gcd(g, std::abs(std::int64_t(in.toInt(a[i]))));
            return Value::integer(std::int32_t(g));
        },
        2);
    in.define("fix", fix, 1, 1);
    in.define(
        "float", [](Interpreter& in, Args a) { return Value::real(in.toNumber(a[0])); }, 1, 1);
    in.define("expt", power, 2, 2);
}

void defineFunctions(Interpreter& in) {
    in.define(
        "sqrt",
        [](Interpreter& in, Args a) {
            const double x = in.toNumber(a[0]);
            if (x < 0) undefinedFor(in, a[0]);
            return Value::real(std::sqrt(x));
        },
        1, 1);
    in.define(
        "exp", [](Interpreter& in, Args a) { return Value::real(std::exp(in.toNumber(a[0]))); }, 1,
        1);
    in.define(
        "log",
        [](Interpreter& in, Args a) {
            const double x = in.toNumber(a[0]);
            if (x <= 0) undefinedFor(in, a[0]);
            return Value::real(std::log(x));
        },
        1, 1);
    in.define(
        "sin", [](Interpreter& in, Args a) { return Value::real(std::sin(in.toNumber(a[0]))); }, 1,
        1);
    in.define(
        "cos", [](Interpreter& in, Args a) { return Value::real(std::cos(in.toNumber(a[0]))); }, 1,
        1);
    in.define(
        "atan",
        [](Interpreter& in, Args a) {
            const double y = in.toNumber(a[0]);
            return Value::real(a.has(1) ? std::atan2(y, in.toNumber(a[1])) : std::atan(y));
        },
        1, 2);
    in.setGlobal("pi", Value::real(M_PI));
}

void defineBits(Interpreter& in) {
    in.define("logand", [](Interpreter& in, Args a) { return bitwise(in, a, true); });
    in.define("logior", [](Interpreter& in, Args a) { return bitwise(in, a, false); });
    in.define("lsh", shift, 0, 2);
    in.define("boole", boole, 2);
    in.define(
        "~", [](Interpreter& in, Args a) { return Value::integer(~in.toInt(a[0])); }, 1, 1);
}

void defineComparison(Interpreter& in) {
    const char* const names[] = {"=", "/=", "<", ">", "<=", ">="};
    for (int mode = 0; mode < 6; ++mode)
        in.define(
            names[mode], [mode](Interpreter& in, Args a) { return comparison(in, a, mode); }, 1);
}

void defineGeometry(Interpreter& in) {
    in.define("distance", distance, 2, 2);
    in.define("angle", angle, 2, 2);
    in.define("polar", polar, 3, 3);
    in.define("inters", inters, 4, 5);
}

}  // namespace

void registerMathBuiltins(Interpreter& in) {
    defineArithmetic(in);
    defineFunctions(in);
    defineBits(in);
    defineComparison(in);
    defineGeometry(in);
}

}  // namespace zvlisp
