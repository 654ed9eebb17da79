#include "UnitTable.h"

#include <QFile>
#include <QRegularExpression>
#include <QStringList>
#include <QTextStream>

#include <cmath>
#include <map>

namespace zvlisp {

namespace {

QString key(const QString& name) {
    return name.simplified().toLower().replace(' ', '_');
}

}  // namespace

bool UnitTable::load(const QString& path) {
    units_.clear();
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly | QIODevice::Text)) return false;
    QTextStream in(&file);
    static const QRegularExpression blanks(QStringLiteral("\\s+"));
    while (!in.atEnd()) {
        const QString line = in.readLine().section('#', 0, 0).trimmed();
        if (line.isEmpty()) continue;
        QStringList words = line.split(blanks, Qt::SkipEmptyParts);
        if (words.size() < 3) continue;
        Unit unit;
        unit.dimension = words.takeFirst().toLower();
        bool ok = false;
        unit.factor = words.takeFirst().toDouble(&ok);
        if (!ok || unit.factor == 0.0 || !std::isfinite(unit.factor)) continue;
        if (words.first().startsWith('+') || words.first().startsWith('-')) {
            unit.offset = words.takeFirst().toDouble(&ok);
            if (!ok) continue;
        }
        for (const QString& name : words)
            units_.insert(key(name), unit);
    }
    return !units_.isEmpty();
}

const UnitTable& UnitTable::cached(const QString& path) {
    static thread_local std::map<QString, UnitTable> tables;
    auto it = tables.find(path);
    if (it == tables.end()) {
        it = tables.emplace(path, UnitTable()).first;
        it->second.load(path);
    }
    return it->second;
}

std::optional<UnitTable::Unit> UnitTable::find(const QString& name) const {
    const QString k = key(name);
    if (auto it = units_.constFind(k); it != units_.constEnd()) return it.value();
    // Areas and volumes of a length unit.
    static const std::pair<const char*, int> powers[] = {
        {"sq_", 2}, {"square_", 2}, {"cu_", 3}, {"cubic_", 3}};
    for (const auto& [prefix, power] : powers) {
        if (!k.startsWith(QLatin1String(prefix))) continue;
        auto it = units_.constFind(k.mid(int(qstrlen(prefix))));
        if (it == units_.constEnd() || it->dimension != QLatin1String("length")) continue;
        Unit unit;
        unit.dimension = power == 2 ? QStringLiteral("area") : QStringLiteral("volume");
        unit.factor = std::pow(it->factor, power);
        return unit;
    }
    return std::nullopt;
}

std::optional<double> UnitTable::convert(double value, const QString& from,
                                         const QString& to) const {
    const std::optional<Unit> a = find(from);
    const std::optional<Unit> b = find(to);
    if (!a || !b || a->dimension != b->dimension) return std::nullopt;
    const double base = value * a->factor + a->offset;
    const double result = (base - b->offset) / b->factor;
    // Through an offset scale, a zero comes out as rounding noise: 32 F is 0 C, not 6e-14.
    if (b->offset != 0.0 && std::fabs(result) < 1e-9 * std::fabs(b->offset / b->factor)) return 0.0;
    return result;
}

}  // namespace zvlisp
