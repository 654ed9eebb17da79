#include "Printer.h"

#include "Function.h"
#include "LispError.h"
#include "Symbol.h"

#include <cmath>

namespace zvlisp {

namespace {
// A structure nested deeper than this is reported instead of overflowing the stack.
constexpr int kMaxDepth = 2000;

QString address(const void* p) {
    return QString::number(quintptr(p), 16).rightJustified(8, '0');
}
}  // namespace

QString Printer::real(double value) {
    if (std::isnan(value)) return QStringLiteral("1.#QNAN");
    if (std::isinf(value)) return value > 0 ? QStringLiteral("1.#INF") : QStringLiteral("-1.#INF");
    QString text = QString::asprintf("%.6g", value);
    const int e = text.indexOf('e');
    const QString mantissa = e < 0 ? text : text.left(e);
    if (!mantissa.contains('.')) text.insert(mantissa.size(), QStringLiteral(".0"));
    return text;
}

QString Printer::quoted(const QString& text) {
    QString out;
    out.reserve(text.size() + 2);
    out += '"';
    for (QChar c : text) {
        switch (c.unicode()) {
            case '"':
                out += QLatin1String("\\\"");
                break;
            case '\\':
                out += QLatin1String("\\\\");
                break;
            case '\n':
                out += QLatin1String("\\n");
                break;
            case '\r':
                out += QLatin1String("\\r");
                break;
            case '\t':
                out += QLatin1String("\\t");
                break;
            case 27:
                out += QLatin1String("\\e");
                break;
            default:
                if (c.unicode() < 32)
                    out += '\\' + QString::number(c.unicode(), 8).rightJustified(3, '0');
                else
                    out += c;
        }
    }
    out += '"';
    return out;
}

QString Printer::toText(const Value& value, bool escape) {
    QString out;
    append(out, value, escape, 0);
    return out;
}

void Printer::append(QString& out, const Value& value, bool escape, int depth) {
    if (depth > kMaxDepth) throw LispError("stack overflow");
    switch (value.type()) {
        case Type::Nil:
            out += QLatin1String("nil");
            return;
        case Type::Int:
            out += QString::number(value.asInt());
            return;
        case Type::Real:
            out += real(value.asReal());
            return;
        case Type::Symbol:
            out += value.asSymbol()->name;
            return;
        case Type::String:
            out += escape ? quoted(value.asString()) : value.asString();
            return;
        case Type::Native: {
            auto* f = static_cast<NativeFunction*>(value.asObject());
            out += "#<SUBR @" + address(f) + ' ' + f->name + '>';
            return;
        }
        case Type::User: {
            auto* f = static_cast<UserFunction*>(value.asObject());
            out += "#<USUBR @" + address(f) + ' ' + f->name + '>';
            return;
        }
        case Type::File:
            out += "#<FILE @" + address(value.asObject()) + '>';
            return;
        case Type::Ename: {
            const auto* e = static_cast<EnameObject*>(value.asObject());
            out += "<Entity name: " + QString::number(e->name.handle, 16) + '>';
            return;
        }
        case Type::Error:
            out += "#<%catch-all-apply-error%>";
            return;
        case Type::Pickset:
            out += "<Selection set: " + QString::number(quintptr(value.asObject()), 16) + '>';
            return;
        case Type::Deferred:
            return append(out, static_cast<DeferredList*>(value.asObject())->list(), escape, depth);
        case Type::Cons:
            break;
    }
    out += '(';
    const Value* cell = &value;
    bool first = true;
    while (cell->isCons()) {
        if (!first) out += ' ';
        first = false;
        append(out, cell->asCons()->car, escape, depth + 1);
        cell = &cell->asCons()->cdr;
    }
    if (!cell->isNil()) {
        out += QLatin1String(" . ");
        append(out, *cell, escape, depth + 1);
    }
    out += ')';
}

}  // namespace zvlisp
