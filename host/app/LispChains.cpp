#include "LispChains.h"

#include "lisp/Printer.h"
#include "lisp/SmallVector.h"

namespace zvhost {

using zvlisp::Type;
using zvlisp::Value;
using zvsdk::ResultBuffer;

namespace {

constexpr int kMaxDepth = 2000;

void push(ResultBuffer**& tail, ResultBuffer* node) {
    *tail = node;
    tail = &node->rbnext;
}

// Three numbers, one of them real: a 3-D point.
bool isPoint(const Value& list) {
    int count = 0;
    bool real = false;
    const Value* cell = &list;
    for (; cell->isCons(); cell = &cell->asCons()->cdr, ++count) {
        const Value& item = cell->asCons()->car;
        if (!item.isNumber() || count == 3) return false;
        real = real || item.isReal();
    }
    return cell->isNil() && count == 3 && real;
}

}  // namespace

ResultBuffer* LispChains::toChain(const Value& value) {
    ResultBuffer* head = nullptr;
    ResultBuffer** tail = &head;
    try {
        append(value, tail, 0);
    } catch (...) {
        zvsdk::releaseChain(head);
        throw;
    }
    return head;
}

void LispChains::append(const Value& value, ResultBuffer**& tail, int depth) {
    if (depth > kMaxDepth) throw zvlisp::LispError("stack overflow");
    switch (value.type()) {
        case Type::Nil:
            return push(tail, zvsdk::newNode(zvsdk::RTNIL));
        case Type::Int: {
            const std::int32_t i = value.asInt();
            if (i >= -32768 && i <= 32767) return push(tail, zvsdk::newShort(short(i)));
            return push(tail, zvsdk::newLong(i));
        }
        case Type::Real:
            return push(tail, zvsdk::newReal(value.asReal()));
        case Type::String:
            return push(tail, zvsdk::newString(value.asString()));
        case Type::Symbol:
            if (value.asSymbol()->name == QLatin1String("T"))
                return push(tail, zvsdk::newNode(zvsdk::RTT));
            return push(tail, zvsdk::newString(value.asSymbol()->name));
        case Type::Ename:
            return push(
                tail, zvsdk::newEntity(static_cast<zvlisp::EnameObject*>(value.asObject())->name));
        case Type::Cons:
            break;
        case Type::Deferred:
            return append(static_cast<zvlisp::DeferredList*>(value.asObject())->list(), tail,
                          depth);
        default:
            return push(tail, zvsdk::newString(zvlisp::Printer::prin1(value)));
    }
    if (isPoint(value)) {
        const Value& x = zvlisp::car(value);
        const Value& y = zvlisp::car(zvlisp::cdr(value));
        const Value& z = zvlisp::car(zvlisp::cdr(zvlisp::cdr(value)));
        return push(tail, zvsdk::newPoint(x.asNumber(), y.asNumber(), z.asNumber(), true));
    }
    push(tail, zvsdk::newNode(zvsdk::RTLB));
    const Value* cell = &value;
    for (; cell->isCons(); cell = &cell->asCons()->cdr)
        append(cell->asCons()->car, tail, depth + 1);
    if (!cell->isNil()) {
        push(tail, zvsdk::newNode(zvsdk::RTDOTE));
        append(*cell, tail, depth + 1);
    }
    push(tail, zvsdk::newNode(zvsdk::RTLE));
}

Value LispChains::atom(zvlisp::Interpreter& lisp, const ResultBuffer& node) {
    switch (node.restype) {
        case zvsdk::RTSHORT:
            return Value::integer(node.rint);
        case zvsdk::RTLONG:
            return Value::integer(node.rlong);
        case zvsdk::RTREAL:
            return Value::real(node.rreal);
        case zvsdk::RTSTR:
            return Value::string(node.rstring);
        case zvsdk::RTT:
            return lisp.t();
        case zvsdk::RTENAME:
            return Value::object(Type::Ename, new zvlisp::EnameObject(node.rlname));
        case zvsdk::RTPOINT:
        case zvsdk::RT3DPOINT: {
            zvlisp::ListBuilder point;
            for (int i = 0; i < (node.restype == zvsdk::RT3DPOINT ? 3 : 2); ++i)
                point.add(Value::real(node.rpoint[i]));
            return point.take();
        }
        default:
            return Value();  // 5019 and anything unknown
    }
}

template <typename Emit>
void LispChains::read(zvlisp::Interpreter& lisp, const ResultBuffer* chain, Emit emitTop) {
    struct Level {
        zvlisp::ListBuilder list;
        bool dotted = false;
    };
    zvlisp::SmallVector<Level, 8> open;
    auto emit = [&](Value v) {
        if (open.empty())
            emitTop(std::move(v));
        else if (open.back().dotted)
            open.back().list.setTail(std::move(v));
        else
            open.back().list.add(std::move(v));
    };
    auto close = [&] {
        Value list = open.back().list.take();
        open.pop_back();
        emit(std::move(list));
    };
    for (const ResultBuffer* node = chain; node; node = node->rbnext) {
        switch (node->restype) {
            case zvsdk::RTLB:
                open.push_back(Level());
                break;
            case zvsdk::RTDOTE:
                if (!open.empty() && !open.back().list.empty()) open.back().dotted = true;
                break;
            case zvsdk::RTLE:
                if (!open.empty()) close();  // an unmatched end is ignored
                break;
            case zvsdk::RTNONE:
                break;
            default:
                emit(atom(lisp, *node));
        }
    }
    while (!open.empty())
        close();  // unclosed lists end with the chain
}

std::vector<Value> LispChains::values(zvlisp::Interpreter& lisp, const ResultBuffer* chain) {
    std::vector<Value> top;
    read(lisp, chain, [&](Value v) { top.push_back(std::move(v)); });
    return top;
}

Value LispChains::value(zvlisp::Interpreter& lisp, const ResultBuffer* chain) {
    Value first;
    zvlisp::ListBuilder several;
    int count = 0;
    read(lisp, chain, [&](Value v) {
        if (++count == 1) {
            first = std::move(v);
            return;
        }
        if (count == 2) several.add(first);
        several.add(std::move(v));
    });
    return count > 1 ? several.take() : first;
}

}  // namespace zvhost
