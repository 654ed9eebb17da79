#include "SheetGrid.h"

#include <algorithm>
#include <cmath>

namespace zvproduct {

namespace {

constexpr double kSheetTop = 297.0;

QStringList parts(const QString& text) {
    QStringList out;
    for (const QString& part : text.split(';')) {
        const QString trimmed = part.trimmed();
        if (!trimmed.isEmpty()) out << trimmed;
    }
    return out;
}

// A catalogue may keep a decimal comma.
std::optional<double> interval(const QString& text) {
    bool ok = false;
    const double value = QString(text).replace(',', '.').toDouble(&ok);
    if (!ok || !std::isfinite(value) || value <= 0) return std::nullopt;
    return value;
}

}  // namespace

bool SheetGrid::Axis::parse(const QString& labelText, const QString& intervalText) {
    labels = parts(labelText);
    ends.clear();
    if (labels.isEmpty()) return true;
    const QStringList widths = parts(intervalText);
    if (widths.isEmpty()) return false;
    double end = 0;
    for (int i = 0; i < labels.size(); ++i) {
        const auto width = interval(widths[std::min<int>(i, widths.size() - 1)]);
        if (!width) return false;
        end += *width;
        ends.push_back(end);
    }
    return true;
}

std::optional<int> SheetGrid::Axis::at(double distance) const {
    if (labels.isEmpty()) return 0;
    if (!(distance >= 0 && distance <= ends.back())) return std::nullopt;
    const auto cell = std::upper_bound(ends.begin(), ends.end(), distance) - ends.begin();
    return std::min<int>(static_cast<int>(cell), labels.size() - 1);
}

int SheetGrid::Axis::cells() const {
    return std::max<int>(1, labels.size());
}

QString SheetGrid::Axis::label(int cell) const {
    return labels.isEmpty() ? QString() : labels[cell];
}

std::optional<SheetGrid> SheetGrid::fromModel(const QString& columnLabels,
                                              const QString& columnInterval,
                                              const QString& rowLabels,
                                              const QString& rowInterval) {
    SheetGrid grid;
    if (!grid.columns_.parse(columnLabels, columnInterval) ||
        !grid.rows_.parse(rowLabels, rowInterval))
        return std::nullopt;
    if (grid.columns_.labels.isEmpty() && grid.rows_.labels.isEmpty()) return std::nullopt;
    // every cell's text made once: a list asks for thousands of positions
    for (int row = 0; row < grid.rows_.cells(); ++row)
        for (int column = 0; column < grid.columns_.cells(); ++column)
            grid.cells_ << grid.rows_.label(row) + grid.columns_.label(column);
    return grid;
}

SheetGrid SheetGrid::fixed() {
    return *fromModel("1;2;3;4;5;6;7;8;9;10;11;12", "35", "A;B;C;D;E;F;G;H", "37.125");
}

QString SheetGrid::position(double x, double y) const {
    const auto column = columns_.at(x);
    const auto row = rows_.at(kSheetTop - y);
    if (!column || !row) return QStringLiteral("??");
    return cells_[*row * columns_.cells() + *column];
}

}  // namespace zvproduct
