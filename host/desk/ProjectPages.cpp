#include "ProjectPages.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"
#include "plot/PageIndex.h"
#include "product/PageRegistry.h"

#include <set>
#include <unordered_set>

namespace zvdesk {

QStringList pageNames(zvdb::Database& database) {
    QStringList names;
    for (const std::string& page : zvproduct::PageRegistry(database).pages())
        names << QString::fromStdString(page);
    return names;
}

QStringList stripNames(const zvdb::Database& database) {
    std::set<QString> strips;
    const zvdb::BlockRecord* model = database.modelSpace();
    if (!model) return {};
    for (zvdb::Entity* entity : model->entities()) {
        auto* reference = dynamic_cast<zvdb::BlockReference*>(entity);
        if (!reference ||
            !QString::fromUtf8(reference->blockName().data(), int(reference->blockName().size()))
                 .startsWith(QLatin1String("BORNE"), Qt::CaseInsensitive))
            continue;
        // The strip's tag in Portuguese, English or Spanish, the first one found.
        for (const char* tag : {"REGUA", "STRIP", "REGLETA"}) {
            const zvdb::Attribute* strip = reference->attribute(tag);
            if (!strip) continue;
            const std::string_view value = strip->textValue();
            if (!value.empty()) strips.insert(QString::fromUtf8(value.data(), int(value.size())));
            break;
        }
    }
    return QStringList(strips.begin(), strips.end());
}

bool isCoverOrIndex(const zvdb::Database& database, const std::string& page, bool* cover) {
    const zvdb::LayerRecord* layer = database.layer(page);
    const bool isCover = layer && layer->hasXData("KVR_ZV_CAPA");
    if (cover) *cover = isCover;
    return isCover || (layer && layer->hasXData("KVR_ZV_INDICE"));
}

bool showPage(zvdb::Database& database, const std::string& page) {
    if (page == "0" || !database.layer(page)) return false;
    // A current layer can't be frozen: stand on "0" while the layers change.
    if (zvdb::LayerRecord* zero = database.layer("0")) {
        zero->setFrozen(false);
        database.setCurrentLayer("0");
    }
    const std::vector<std::string> own = zvplot::PageIndex::pageLayers(database, page);
    const std::unordered_set<std::string> shown(own.begin(), own.end());
    for (zvdb::LayerRecord* layer : database.layers()) {
        const std::string name(layer->name());
        const bool frozen = name != "0" && !shown.count(name);
        if (layer->isFrozen() != frozen) layer->setFrozen(frozen);
    }
    database.setCurrentLayer(page);
    return true;
}

QRectF extentsOf(const std::vector<zvdb::Entity*>& entities) {
    zvdb::BoundingBox box;
    for (const zvdb::Entity* entity : entities)
        box.add(zvdb::Extents::ofEntity(*entity, true));
    if (box.isEmpty()) return {};
    return QRectF(QPointF(box.min.x, box.min.y), QPointF(box.max.x, box.max.y));
}

}  // namespace zvdesk
