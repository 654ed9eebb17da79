#include "Value.h"

#include <vector>

namespace zvlisp {

namespace {

// Objects waiting to be freed; only the outermost freeObject drains it.
thread_local std::vector<Object*> pending;
thread_local bool draining = false;

void dropChild(Object* object) {
    if (--object->refs == 0) pending.push_back(object);
}

}  // namespace

void freeObject(Object* object) {
    pending.push_back(object);
    if (draining) return;
    draining = true;
    while (!pending.empty()) {
        Object* next = pending.back();
        pending.pop_back();
        next->detachChildren(dropChild);
        delete next;
    }
    draining = false;
}

bool Value::same(const Value& other) const {
    if (type_ != other.type_) return false;
    switch (type_) {
        case Type::Nil:
            return true;
        case Type::Int:
            return u_.integer == other.u_.integer;
        case Type::Real:
            return u_.real == other.u_.real;
        case Type::Symbol:
            return u_.symbol == other.u_.symbol;
        default:
            return u_.object == other.u_.object;
    }
}

void ListBuilder::add(Value v) {
    Value cell = Value::cons(std::move(v), Value());
    Cons* added = cell.asCons();
    if (last_)
        last_->cdr = std::move(cell);
    else
        head_ = std::move(cell);
    last_ = added;
}

void ListBuilder::setTail(Value v) {
    if (last_)
        last_->cdr = std::move(v);
    else
        head_ = std::move(v);
}

Value ListBuilder::take() {
    last_ = nullptr;
    return std::move(head_);
}

}  // namespace zvlisp
