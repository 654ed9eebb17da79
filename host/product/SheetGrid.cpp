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

std::optional<QString> SheetGrid::Axis::at(double distance) const {
    if (labels.isEmpty()) return QString();
    if (!(distance >= 0 && distance <= ends.back())) return std::nullopt;
    const auto cell = std::upper_bound(ends.begin(), ends.end(), distance) - ends.begin();
    return labels[std::min<int>(static_cast<int>(cell), labels.size() - 1)];
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
    return grid;
}

SheetGrid SheetGrid::fixed() {
    return *fromModel("1;2;3;4;5;6;7;8;9;10;11;12", "35", "A;B;C;D;E;F;G;H", "37.125");
}

QString SheetGrid::position(double x, double y) const {
    const auto column = columns_.at(x);
    const auto row = rows_.at(kSheetTop - y);
    if (!column || !row) return QStringLiteral("??");
    return *row + *column;
}

}  // namespace zvproduct
