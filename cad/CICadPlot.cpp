// The facade's part for printing pages: what shows and where.
#include "CICad.h"

#include "CICadInterno.h"

#include "app/HostDocument.h"
#include "plot/PageIndex.h"
#include "sdk/SystemServices.h"

#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/Entity.h"
#include "drawing/Extents.h"
#include "drawing/LayerRecord.h"

bool CICad::ExtensaoVisivel(double& xMin, double& yMin, double& xMax, double& yMax) {
    zvdb::Database* database = GetDatabase();
    if (!database || !database->modelSpace()) return false;
    zvdb::BoundingBox box;
    auto* documento = dynamic_cast<zvhost::HostDocument*>(zvsdk::activeDocument());
    if (documento && documento->database() == database) {
        // The host's index by layer walks only the layers that show, and measures a set of
        // them once while the drawing's shapes stay as they are.
        box = documento->plotIndex().visibleBounds();
    } else {
        for (const zvdb::Entity* entity : database->modelSpace()->entities()) {
            const zvdb::LayerRecord* layer = database->layer(entity->layer());
            if (layer && (layer->isFrozen() || layer->isOff())) continue;
            box.add(zvdb::Extents::ofEntity(*entity, true));
        }
    }
    if (box.isEmpty()) return false;
    xMin = box.min.x, yMin = box.min.y, xMax = box.max.x, yMax = box.max.y;
    return true;
}
