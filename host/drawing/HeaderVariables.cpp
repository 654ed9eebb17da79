#include "HeaderVariables.h"

#include "StringArena.h"
#include "TagValues.h"

namespace zvdb {

std::string HeaderVariables::key(std::string_view name) const {
    std::string text = TagValues::upperName(name);
    if (text.empty() || text[0] != '$') text.insert(text.begin(), '$');
    return text;
}

std::string_view HeaderVariables::stored(std::string_view text) const {
    return arena_.store(text);
}

const HeaderVariables::Variable* HeaderVariables::find(std::string_view name) const {
    const auto it = index_.find(key(name));
    return it == index_.end() ? nullptr : &variables_[it->second];
}

std::string_view HeaderVariables::text(std::string_view name, std::string_view fallback) const {
    const Variable* v = find(name);
    return v && !v->values.empty() ? v->values.front().value : fallback;
}

double HeaderVariables::real(std::string_view name, double fallback) const {
    const Variable* v = find(name);
    return v && !v->values.empty() ? TagValues::toReal(v->values.front().value, fallback)
                                   : fallback;
}

long long HeaderVariables::integer(std::string_view name, long long fallback) const {
    const Variable* v = find(name);
    return v && !v->values.empty() ? TagValues::toInteger(v->values.front().value, fallback)
                                   : fallback;
}

Point3 HeaderVariables::point(std::string_view name, const Point3& fallback) const {
    const Variable* v = find(name);
    if (!v || v->values.empty()) return fallback;
    Point3 p;
    for (const Tag& tag : v->values) {
        const double value = TagValues::toReal(tag.value);
        if (tag.code == 10)
            p.x = value;
        else if (tag.code == 20)
            p.y = value;
        else if (tag.code == 30)
            p.z = value;
    }
    return p;
}

void HeaderVariables::setValues(std::string_view name, std::vector<Tag> values) {
    for (Tag& tag : values)
        tag.value = stored(tag.value);
    const std::string k = key(name);
    const auto it = index_.find(k);
    if (it != index_.end()) {
        variables_[it->second].values = std::move(values);
        return;
    }
    index_.emplace(k, variables_.size());
    variables_.push_back(Variable{stored(k), std::move(values)});
}

void HeaderVariables::setText(std::string_view name, int code, std::string_view value) {
    setValues(name, {Tag{static_cast<std::int16_t>(code), value}});
}

void HeaderVariables::setInteger(std::string_view name, int code, long long value) {
    setText(name, code, TagValues::fromInteger(value));
}

void HeaderVariables::setReal(std::string_view name, int code, double value) {
    setText(name, code, TagValues::fromReal(value));
}

void HeaderVariables::setPoint(std::string_view name, const Point3& p, bool withZ) {
    TagListBuilder builder(arena_);
    builder.point(10, p, withZ);
    setValues(name, builder.take());
}

void HeaderVariables::clear() {
    variables_.clear();
    index_.clear();
}

}  // namespace zvdb
