#include "DrawingFiles.h"
#include "HostCli.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"

#include <map>
#include <string>

namespace zvhost {

namespace {

QString text(std::string_view value) {
    return QString::fromUtf8(value.data(), static_cast<int>(value.size()));
}

void printDictionary(QTextStream& out, const zvdb::Dictionary& dictionary, int depth) {
    for (const auto& entry : dictionary.entries()) {
        const zvdb::DbObject* object = dictionary.database().objectByHandle(entry.handle);
        out << QString(depth * 2 + 2, ' ') << text(entry.name) << " (" << text(object->type())
            << ")\n";
        const auto* sub = dynamic_cast<const zvdb::Dictionary*>(object);
        if (sub && depth < 8) printDictionary(out, *sub, depth + 1);
    }
}

void printCounts(QTextStream& out, const zvdb::Database& database) {
    std::map<std::string, int> counts;
    database.modelSpace()->forEachEntity(
        [&](zvdb::Entity& entity) { ++counts[std::string(entity.type())]; });
    out << "model space entities:\n";
    for (const auto& [type, count] : counts)
        out << "  " << QString::fromStdString(type) << " " << count << "\n";
}

}  // namespace

// zvhost dxf-info DRAWING: a quick look at a drawing.
int runDxfInfoSubcommand(CliContext& context) {
    if (context.args.size() != 1) {
        context.err << "usage: zvhost dxf-info DRAWING\n";
        return kExitUsage;
    }
    QString error;
    const auto database = readDrawing(context.args.first(), &error);
    if (!database) {
        context.err << "zvhost: " << error << "\n";
        return kExitFailure;
    }
    QTextStream& out = context.out;
    out << "version: " << text(database->version()) << "\n";
    for (const std::string& warning : database->warnings())
        out << "repaired: " << QString::fromStdString(warning) << "\n";
    if (database->modelSpace()) printCounts(out, *database);
    out << "layers:\n";
    for (const zvdb::LayerRecord* layer : database->layers()) {
        out << "  " << text(layer->name()) << (layer->isFrozen() ? " frozen" : "")
            << (layer->isOff() ? " off" : "") << (layer->isLocked() ? " locked" : "") << "\n";
    }
    out << "blocks:\n";
    for (const zvdb::BlockRecord* block : database->blocks())
        out << "  " << text(block->name()) << " " << block->entityCount() << " entities\n";
    out << "dictionaries:\n";
    if (const zvdb::Dictionary* root = database->namedObjects()) printDictionary(out, *root, 0);
    return kExitOk;
}

}  // namespace zvhost
