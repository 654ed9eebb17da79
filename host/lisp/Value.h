#pragma once
// A LISP value: nil, a 32-bit integer, a real, a symbol or a reference-counted heap object
// (string, cons, function, file, entity name, caught error). Lists never form cycles in
// this dialect (there are no destructive list operations), so counting references frees
// everything; freeing runs through a work list, so a long or deep list never recurses.
#include "sdk/ResultBuffer.h"

#include <QString>

#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace zvlisp {

enum class Type : std::uint8_t {
    Nil,
    Int,
    Real,
    Symbol,
    String,
    Cons,
    Native,
    User,
    File,
    Ename,
    Error,
    Pickset,
    Deferred
};

struct Symbol;
struct Object;
struct Cons;

// Frees an object whose count dropped to zero, and what only it held.
void freeObject(Object* object);
// The small-object pool of this thread: its chunk count, and giving back to the system the
// chunks whose blocks are all free (after a large list died). The trim only looks when the
// pool grew by some megabytes since its last look; it answers the chunks released.
std::size_t poolChunks();
std::size_t trimPool();

class Value {
public:
    Value() noexcept { u_.object = nullptr; }
    static Value integer(std::int32_t i) {
        Value v(Type::Int);
        v.u_.integer = i;
        return v;
    }
    static Value real(double r) {
        Value v(Type::Real);
        v.u_.real = r;
        return v;
    }
    static Value symbol(Symbol* s) {
        Value v(Type::Symbol);
        v.u_.symbol = s;
        return v;
    }
    // Takes a reference on a new or shared heap object.
    static Value object(Type type, Object* o);
    static Value string(const QString& text);
    static Value cons(Value car, Value cdr);

    Value(const Value& other) noexcept : type_(other.type_), u_(other.u_) { retain(); }
    Value(Value&& other) noexcept : type_(other.type_), u_(other.u_) { other.type_ = Type::Nil; }
    Value& operator=(const Value& other) noexcept {
        Value copy(other);
        swap(copy);
        return *this;
    }
    Value& operator=(Value&& other) noexcept {
        Value moved(std::move(other));
        swap(moved);
        return *this;
    }
    ~Value() { release(); }
    void swap(Value& other) noexcept {
        std::swap(type_, other.type_);
        std::swap(u_, other.u_);
    }

    Type type() const { return type_; }
    bool isNil() const { return type_ == Type::Nil; }
    bool isInt() const { return type_ == Type::Int; }
    bool isReal() const { return type_ == Type::Real; }
    bool isNumber() const { return type_ == Type::Int || type_ == Type::Real; }
    bool isSymbol() const { return type_ == Type::Symbol; }
    bool isString() const { return type_ == Type::String; }
    bool isCons() const { return type_ == Type::Cons; }
    bool isList() const { return type_ == Type::Nil || type_ == Type::Cons; }
    bool isFunction() const { return type_ == Type::Native || type_ == Type::User; }
    bool isHeap() const { return type_ >= Type::String; }

    std::int32_t asInt() const { return u_.integer; }
    double asReal() const { return u_.real; }
    double asNumber() const { return type_ == Type::Int ? double(u_.integer) : u_.real; }
    Symbol* asSymbol() const { return u_.symbol; }
    Object* asObject() const { return u_.object; }
    Cons* asCons() const { return reinterpret_cast<Cons*>(u_.object); }
    const QString& asString() const;
    // Heap objects by identity, immediates by type and value.
    bool same(const Value& other) const;

    // Empties the value without dropping its reference; the caller takes it over.
    Object* detach() {
        Object* o = isHeap() ? u_.object : nullptr;
        type_ = Type::Nil;
        return o;
    }

private:
    explicit Value(Type type) : type_(type) {}
    void retain() const;
    void release();

    Type type_ = Type::Nil;
    union {
        std::int32_t integer;
        double real;
        Symbol* symbol;
        Object* object;
    } u_;
};

// A heap object; its count says how many values refer to it. Small objects (conses,
// strings) come from a free list of the thread: a list run makes and drops thousands per
// item. Values belong to the thread that made them.
struct Object {
    // What values the object holds, so freeing can reach them: none, a cons's two, a
    // function's body.
    enum class Holds : std::uint8_t { Nothing, CarAndCdr, Body };
    explicit Object(Holds h = Holds::Nothing) : holds(h) {}
    std::uint32_t refs = 0;
    Holds holds;
    virtual ~Object() = default;
    static void* operator new(std::size_t size);
    static void operator delete(void* block, std::size_t size);
};

struct StringObject : Object {
    explicit StringObject(const QString& t) : text(t) {}
    QString text;
};

struct Cons : Object {
    Cons(Value a, Value d) : Object(Holds::CarAndCdr), car(std::move(a)), cdr(std::move(d)) {}
    Value car;
    Value cdr;
};

struct EnameObject : Object {
    explicit EnameObject(zvsdk::EntityName n) : name(n) {}
    zvsdk::EntityName name;
};

// A selection set: entity names in the order they were selected.
struct PicksetObject : Object {
    std::vector<zvsdk::EntityName> names;
};

// What vl-catch-all-apply gives back for a failed call.
struct ErrorObject : Object {
    explicit ErrorObject(const QString& m) : message(m) {}
    QString message;
};

// A list its maker fills in only when it is read. Only a symbol's value is ever one: reading
// the symbol gives the list (Interpreter::valueOf), and `(assoc "text" symbol)` may find its
// pair without the rest being made.
struct DeferredList : Object {
    // The whole list; the same list at each call.
    virtual Value list() = 0;
    // What `assoc` answers for a text key: the first pair whose key is that text, or nil.
    virtual Value assocText(const QString& key) = 0;
};

inline void Value::retain() const {
    if (isHeap()) ++u_.object->refs;
}

inline void Value::release() {
    if (isHeap() && --u_.object->refs == 0) freeObject(u_.object);
}

inline Value Value::object(Type type, Object* o) {
    Value v(type);
    v.u_.object = o;
    ++o->refs;
    return v;
}

inline Value Value::string(const QString& text) {
    return object(Type::String, new StringObject(text));
}

inline Value Value::cons(Value car, Value cdr) {
    return object(Type::Cons, new Cons(std::move(car), std::move(cdr)));
}

inline const QString& Value::asString() const {
    return static_cast<StringObject*>(u_.object)->text;
}

inline const Value& car(const Value& v) {
    static const Value nil;
    return v.isCons() ? v.asCons()->car : nil;
}

inline const Value& cdr(const Value& v) {
    static const Value nil;
    return v.isCons() ? v.asCons()->cdr : nil;
}

// Builds a proper list front to back without walking it again.
class ListBuilder {
public:
    void add(Value v);
    // A dotted tail; the list is done afterwards.
    void setTail(Value v);
    Value take();
    bool empty() const { return head_.isNil(); }

private:
    Value head_;
    Cons* last_ = nullptr;
};

}  // namespace zvlisp
