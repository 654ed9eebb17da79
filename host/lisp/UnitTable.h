#pragma once
// The units table of cvunit: a text file shipped with the program (program/units.txt beside
// the host), one unit a line: DIMENSION FACTOR [+OFFSET] NAME [OTHER NAMES...]. A value in
// a unit is FACTOR * value + OFFSET in its dimension's base unit; "sq NAME", "square NAME",
// "cu NAME" and "cubic NAME" of a length are areas and volumes. Names ignore case, and a
// space in a name stands for the file's underscore ("nautical mile").
#include <QHash>
#include <QString>

#include <optional>

namespace zvlisp {

class UnitTable {
public:
    // Reads the file; false (and an empty table) when it can't be read.
    bool load(const QString& path);
    // The table of a file, read once per path and thread; empty for a missing file.
    static const UnitTable& cached(const QString& path);

    bool isEmpty() const { return units_.isEmpty(); }
    int size() const { return int(units_.size()); }
    // `value` in unit `from` expressed in unit `to`; none for an unknown unit or units of
    // different dimensions.
    std::optional<double> convert(double value, const QString& from, const QString& to) const;

private:
    struct Unit {
        QString dimension;
        double factor = 1.0;
        double offset = 0.0;
    };
    std::optional<Unit> find(const QString& name) const;

    QHash<QString, Unit> units_;
};

}  // namespace zvlisp
