#pragma once
// The HEADER section: the drawing's variables ($ACADVER, $CLAYER, $HANDSEED...) in file
// order, each with its value tags.
#include "Geometry.h"
#include "Tag.h"

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace zvdb {

class StringArena;

class HeaderVariables {
public:
    struct Variable {
        std::string_view name;  // with its '$'
        std::vector<Tag> values;
    };

    explicit HeaderVariables(StringArena& arena) : arena_(arena) {}

    // Names may be given with or without the leading '$'.
    const Variable* find(std::string_view name) const;
    bool has(std::string_view name) const { return find(name) != nullptr; }
    std::string_view text(std::string_view name, std::string_view fallback = {}) const;
    double real(std::string_view name, double fallback = 0.0) const;
    long long integer(std::string_view name, long long fallback = 0) const;
    Point3 point(std::string_view name, const Point3& fallback = {}) const;

    // Sets a variable to one value of the group code, adding it at the end when new.
    void setText(std::string_view name, int code, std::string_view value);
    void setInteger(std::string_view name, int code, long long value);
    void setReal(std::string_view name, int code, double value);
    void setPoint(std::string_view name, const Point3& p, bool withZ = true);
    void setValues(std::string_view name, std::vector<Tag> values);

    const std::vector<Variable>& variables() const { return variables_; }
    void clear();
    // Trades variables with another header whose values live in the arena traded alongside.
    void swap(HeaderVariables& other) {
        variables_.swap(other.variables_);
        index_.swap(other.index_);
    }

private:
    std::string key(std::string_view name) const;
    std::string_view stored(std::string_view text) const;

    StringArena& arena_;
    std::vector<Variable> variables_;
    std::unordered_map<std::string, std::size_t> index_;
};

}  // namespace zvdb
