// Lists: access, building, search and the vl- list functions.
#include "Builtins.h"
#include "Equality.h"
#include "Interpreter.h"

#include <algorithm>

namespace zvlisp {

namespace {

const Value& carOf(Interpreter& in, const Value& v, bool wantCar) {
    if (v.isNil()) return v;
    if (!v.isCons()) in.badType("consp", v);
    return wantCar ? v.asCons()->car : v.asCons()->cdr;
}

// car, cdr and the compositions up to four letters (cadr, cdddr, caadar...).
void defineAccessors(Interpreter& in) {
    for (int length = 1; length <= 4; ++length) {
        for (int bits = 0; bits < (1 << length); ++bits) {
            QString letters;
            for (int i = 0; i < length; ++i)
                letters += (bits >> i) & 1 ? 'd' : 'a';
            in.define(
                "c" + letters + "r",
                [letters](Interpreter& in, Args a) {
                    Value v = a[0];
                    for (int i = letters.size() - 1; i >= 0; --i)
                        v = carOf(in, v, letters[i] == 'a');
                    return v;
                },
                1, 1);
        }
    }
}

Value append(Interpreter& in, Args a) {
    if (a.size() == 0) return Value();
    ListBuilder result;
    for (int i = 0; i + 1 < a.size(); ++i)
        for (const Value& item : in.toVector(a[i]))
            result.add(item);
    in.checkList(a[a.size() - 1]);
    result.setTail(a[a.size() - 1]);
    return result.take();
}

Value assoc(Interpreter& in, Args a) {
    const Value* c = &a[1];
    if (a[0].isString()) {
        // A text key, as templates look fields up in `reg`: only a text of the same length
        // can be equal, so most keys are passed over without comparing characters.
        const QString& key = a[0].asString();
        for (; c->isCons(); c = &c->asCons()->cdr) {
            const Value& pair = c->asCons()->car;
            if (!pair.isCons() || !pair.asCons()->car.isString()) continue;
            const QString& text = pair.asCons()->car.asString();
            if (text.size() == key.size() && text == key) return pair;
        }
        if (!c->isNil()) in.badType("listp", a[1]);
        return Value();
    }
    for (; c->isCons(); c = &c->asCons()->cdr) {
        const Value& pair = c->asCons()->car;
        if (pair.isCons() && Equality::equal(pair.asCons()->car, a[0])) return pair;
    }
    if (!c->isNil()) in.badType("listp", a[1]);
    return Value();
}

Value member(Interpreter& in, Args a) {
    const Value* c = &a[1];
    for (; c->isCons(); c = &c->asCons()->cdr)
        if (Equality::equal(c->asCons()->car, a[0])) return *c;
    if (!c->isNil()) in.badType("listp", a[1]);
    return Value();
}

Value nth(Interpreter& in, Args a) {
    std::int32_t n = in.toInt(a[0]);
    in.checkList(a[1]);
    if (n < 0) return Value();
    const Value* c = &a[1];
    for (; c->isCons() && n > 0; --n)
        c = &c->asCons()->cdr;
    return c->isCons() ? c->asCons()->car : Value();
}

Value lastOf(Interpreter& in, Args a) {
    in.checkList(a[0]);
    const Value* c = &a[0];
    while (c->isCons() && c->asCons()->cdr.isCons())
        c = &c->asCons()->cdr;
    return c->isCons() ? c->asCons()->car : Value();
}

// A merge sort: any comparison function, even an inconsistent one, ends well.
template <typename Less>
void mergeSort(std::vector<Value>& items, Less less) {
    std::vector<Value> buffer(items.size());
    for (size_t width = 1; width < items.size(); width *= 2) {
        for (size_t lo = 0; lo < items.size(); lo += 2 * width) {
            const size_t mid = std::min(lo + width, items.size());
            const size_t hi = std::min(lo + 2 * width, items.size());
            size_t i = lo, j = mid, k = lo;
            while (i < mid && j < hi)
                buffer[k++] = less(items[j], items[i]) ? items[j++] : items[i++];
            while (i < mid)
                buffer[k++] = items[i++];
            while (j < hi)
                buffer[k++] = items[j++];
        }
        items.swap(buffer);
    }
}

auto comparator(Interpreter& in, const Value& function) {
    return [&in, function](const Value& x, const Value& y) {
        const Value args[] = {x, y};
        return !in.apply(function, Args(args, 2)).isNil();
    };
}

// Equal elements come out last one first, as the dialect's documented results show: the
// list is sorted stably from its end.
Value sort(Interpreter& in, Args a) {
    std::vector<Value> items = in.toVector(a[0]);
    std::reverse(items.begin(), items.end());
    mergeSort(items, comparator(in, in.toFunction(a[1])));
    // Equal integers and symbols collapse into one, as the dialect has always done.
    std::vector<Value> kept;
    for (Value& item : items) {
        const bool duplicate =
            !kept.empty() && (item.isInt() || item.isSymbol()) && kept.back().same(item);
        if (!duplicate) kept.push_back(std::move(item));
    }
    return Interpreter::fromVector(kept);
}

Value sortIndices(Interpreter& in, Args a) {
    const std::vector<Value> items = in.toVector(a[0]);
    std::vector<Value> indices;
    for (size_t i = items.size(); i-- > 0;)
        indices.push_back(Value::integer(std::int32_t(i)));
    auto less = comparator(in, in.toFunction(a[1]));
    mergeSort(indices, [&](const Value& x, const Value& y) {
        return less(items[size_t(x.asInt())], items[size_t(y.asInt())]);
    });
    return Interpreter::fromVector(indices);
}

bool test(Interpreter& in, const Value& function, const Value& item) {
    return !in.apply(function, Args(&item, 1)).isNil();
}

Value removeIf(Interpreter& in, Args a, bool keepMatches) {
    const Value function = in.toFunction(a[0]);
    ListBuilder result;
    for (const Value& item : in.toVector(a[1]))
        if (test(in, function, item) == keepMatches) result.add(item);
    return result.take();
}

Value memberIf(Interpreter& in, Args a, bool wanted) {
    const Value function = in.toFunction(a[0]);
    in.checkList(a[1]);
    for (const Value* c = &a[1]; c->isCons(); c = &c->asCons()->cdr)
        if (test(in, function, c->asCons()->car) == wanted) return *c;
    return Value();
}

// vl-some and vl-every: the predicate over the lists in step, up to the shortest.
Value someOrEvery(Interpreter& in, Args a, bool every) {
    const Value function = in.toFunction(a[0]);
    std::vector<const Value*> lists;
    for (int i = 1; i < a.size(); ++i)
        lists.push_back(&a[i]);
    std::vector<Value> args(lists.size());
    for (;;) {
        for (size_t i = 0; i < lists.size(); ++i) {
            if (!lists[i]->isCons()) return every ? in.t() : Value();
            args[i] = lists[i]->asCons()->car;
            lists[i] = &lists[i]->asCons()->cdr;
        }
        Value result = in.apply(function, Args(args.data(), int(args.size())));
        if (every && result.isNil()) return Value();
        if (!every && !result.isNil()) return result;
    }
}

void defineBuilding(Interpreter& in) {
    in.define(
        "cons", [](Interpreter&, Args a) { return Value::cons(a[0], a[1]); }, 2, 2);
    in.define("list", [](Interpreter&, Args a) {
        ListBuilder list;
        for (const Value& v : a)
            list.add(v);
        return list.take();
    });
    in.define(
        "vl-list*",
        [](Interpreter&, Args a) {
            ListBuilder list;
            for (int i = 0; i + 1 < a.size(); ++i)
                list.add(a[i]);
            list.setTail(a[a.size() - 1]);
            return list.take();
        },
        1);
    in.define("append", append);
    in.define(
        "reverse",
        [](Interpreter& in, Args a) {
            Value result;
            for (const Value& item : in.toVector(a[0]))
                result = Value::cons(item, std::move(result));
            return result;
        },
        1, 1);
    in.define(
        "subst",
        [](Interpreter& in, Args a) {
            ListBuilder result;
            for (const Value& item : in.toVector(a[2]))
                result.add(Equality::equal(item, a[1]) ? a[0] : item);
            return result.take();
        },
        3, 3);
}

void defineSearch(Interpreter& in) {
    in.define("assoc", assoc, 2, 2);
    in.define("member", member, 2, 2);
    in.define("nth", nth, 2, 2);
    in.define("last", lastOf, 1, 1);
    in.define(
        "length",
        [](Interpreter& in, Args a) {
            return Value::integer(std::int32_t(in.toVector(a[0]).size()));
        },
        1, 1);
    in.define(
        "vl-position",
        [](Interpreter& in, Args a) {
            std::int32_t i = 0;
            for (const Value& item : in.toVector(a[1]))
                if (Equality::equal(item, a[0]))
                    return Value::integer(i);
                else
                    ++i;
            return Value();
        },
        2, 2);
    in.define(
        "vl-remove",
        [](Interpreter& in, Args a) {
            ListBuilder result;
            for (const Value& item : in.toVector(a[1]))
                if (!Equality::equal(item, a[0])) result.add(item);
            return result.take();
        },
        2, 2);
}

void defineFunctional(Interpreter& in) {
    in.define("vl-sort", sort, 2, 2);
    in.define("vl-sort-i", sortIndices, 2, 2);
    in.define(
        "vl-remove-if", [](Interpreter& in, Args a) { return removeIf(in, a, false); }, 2, 2);
    in.define(
        "vl-remove-if-not", [](Interpreter& in, Args a) { return removeIf(in, a, true); }, 2, 2);
    in.define(
        "vl-member-if", [](Interpreter& in, Args a) { return memberIf(in, a, true); }, 2, 2);
    in.define(
        "vl-member-if-not", [](Interpreter& in, Args a) { return memberIf(in, a, false); }, 2, 2);
    in.define(
        "vl-some", [](Interpreter& in, Args a) { return someOrEvery(in, a, false); }, 2);
    in.define(
        "vl-every", [](Interpreter& in, Args a) { return someOrEvery(in, a, true); }, 2);
    in.define(
        "acad_strlsort",
        [](Interpreter& in, Args a) {
            std::vector<Value> items = in.toVector(a[0]);
            for (const Value& item : items)
                in.toStr(item);
            mergeSort(items, [](const Value& x, const Value& y) {
                const int c = x.asString().compare(y.asString(), Qt::CaseInsensitive);
                return c != 0 ? c < 0 : x.asString() < y.asString();
            });
            return Interpreter::fromVector(items);
        },
        1, 1);
}

}  // namespace

void registerListBuiltins(Interpreter& in) {
    defineAccessors(in);
    defineBuilding(in);
    defineSearch(in);
    defineFunctional(in);
}

}  // namespace zvlisp
