#include "ProjectCheck.h"

#include "ConnectionFinder.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Polyline.h"

#include <unordered_map>

namespace zvproduct {

namespace {

std::string firstAttribute(const zvdb::BlockReference& reference,
                           std::initializer_list<std::string_view> tags) {
    for (std::string_view tag : tags)
        if (zvdb::Attribute* attribute = reference.attribute(tag))
            return std::string(attribute->text(1));
    return {};
}

QString hex(std::uint64_t handle) {
    return QString::number(handle, 16).toUpper();
}

}  // namespace

QStringList ProjectCheck::run(zvdb::Database& database, double tolerance) {
    QStringList findings;
    duplicateTerminals(database, findings);
    openWires(database, tolerance, findings);
    return findings;
}

void ProjectCheck::duplicateTerminals(zvdb::Database& database, QStringList& findings) {
    std::unordered_map<std::string, std::uint64_t> seen;  // "STRIP:NUMBER" -> first handle
    for (zvdb::Entity* entity : database.modelSpace()->entities()) {
        auto* reference = dynamic_cast<zvdb::BlockReference*>(entity);
        if (!reference || !reference->blockName().starts_with("BORNE")) continue;
        const std::string strip = firstAttribute(*reference, {"REGUA", "STRIP", "REGLETA"});
        const std::string number = firstAttribute(*reference, {"NUMERO", "NUMBER"});
        if (strip.empty() || number.empty()) continue;
        auto [it, added] = seen.emplace(strip + ":" + number, reference->handle());
        if (!added)
            findings << QString("Terminal %1:%2 stands twice (%3 and %4)")
                            .arg(QString::fromStdString(strip), QString::fromStdString(number),
                                 hex(it->second), hex(reference->handle()));
    }
}

void ProjectCheck::openWires(zvdb::Database& database, double tolerance, QStringList& findings) {
    for (zvdb::Entity* entity : database.modelSpace()->entities()) {
        if (!entity->hasXData("KVR_ZV_WIRE")) continue;
        const auto items = entity->xdata("KVR_ZV_WIRE");
        if (items.size() < 2 || items[1].value.empty())
            findings << QString("Wire %1 has an incomplete numbering").arg(hex(entity->handle()));
    }
    for (const WireConnections& wire : ConnectionFinder(database, tolerance).wires()) {
        std::vector<std::uint64_t> symbols;
        for (const Touch& touch : wire.touches) {
            if (symbols.size() >= 2) break;
            if (std::find(symbols.begin(), symbols.end(), touch.symbol) == symbols.end())
                symbols.push_back(touch.symbol);
        }
        if (symbols.size() < 2)
            findings << QString("Wire %1 has %2 end")
                            .arg(QString::fromStdString(wire.number))
                            .arg(symbols.empty() ? "no" : "only one");
    }
}

}  // namespace zvproduct
