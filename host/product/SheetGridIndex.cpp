#include "SheetGridIndex.h"

#include "CatalogueConnection.h"
#include "PageRegistry.h"
#include "ProductSettings.h"

#include <map>

namespace zvproduct {

namespace {

std::string upper(const std::string& text) {
    return QString::fromStdString(text).toUpper().toStdString();
}

bool erased(const QString& flag) {
    return flag == "1" || flag.compare("true", Qt::CaseInsensitive) == 0;
}

}  // namespace

void SheetGridIndex::readCatalogue() {
    const ProductSettings settings;
    const CatalogueConnection catalogue(settings);
    readCatalogue(catalogue, settings.value("libLang").toInt());
}

void SheetGridIndex::readCatalogue(const CatalogueConnection& catalogue, int language) {
    catalogueRead_ = true;
    byKey_.clear();
    asked_.clear();
    lastGrid_ = nullptr;
    std::map<int, SheetGrid> models;
    for (const QStringList& row : catalogue.rows(
             "select PAGE_KEY, ERASED, COL_LABEL, COL_INT, ROW_LABEL, ROW_INT from BDPAGE")) {
        if (row.size() < 6 || erased(row[1])) continue;
        if (auto grid = SheetGrid::fromModel(row[2], row[3], row[4], row[5]))
            models.emplace(row[0].toInt(), *grid);
    }
    // per group key: the language asked for, else the lowest one
    std::map<int, std::pair<int, int>> modelOf;  // key to (rank of the language, model)
    for (const QStringList& row :
         catalogue.rows("select GROUP_KEY, LANG, PAGE, ERASED from BDGROUP")) {
        if (row.size() < 4 || erased(row[3])) continue;
        const int lang = row[1].toInt();
        const int rank = lang == language ? -1 : lang;
        auto [it, added] = modelOf.emplace(row[0].toInt(), std::make_pair(rank, row[2].toInt()));
        if (!added && rank < it->second.first) it->second = {rank, row[2].toInt()};
    }
    for (const auto& [key, chosen] : modelOf) {
        auto model = models.find(chosen.second);
        if (model != models.end()) byKey_.emplace(key, model->second);
    }
}

void SheetGridIndex::readRegistry(zvdb::Database& database) {
    keyOf_.clear();
    asked_.clear();
    lastGrid_ = nullptr;
    const PageRegistry registry(database);
    for (const PageGroup& group : registry.groups())
        keyOf_.emplace(upper(group.name), group.key);
    stamp_ = DrawingStamp::ofShapes(database);
}

const SheetGrid& SheetGridIndex::gridOf(zvdb::Database* database, const QString& group) {
    if (!catalogueRead_) readCatalogue();
    if (!database || byKey_.empty()) return fixed_;
    // The registry is Xrecords: a page swap's layer edits leave it as it was.
    if (!(stamp_ == DrawingStamp::ofShapes(*database))) readRegistry(*database);
    // Held here, the text stays what it was: the same text is the same group.
    if (lastGrid_ && group.isSharedWith(lastGroup_)) return *lastGrid_;
    const SheetGrid* grid = asked_.value(group);
    if (!grid) grid = askedFirst(group);
    // A literal's text may be another's once its module is gone: never taken for the same.
    const bool literal = const_cast<QString&>(group).data_ptr()->ref.isStatic();
    lastGroup_ = literal ? QString() : group;
    lastGrid_ = literal ? nullptr : grid;
    return *grid;
}

const SheetGrid* SheetGridIndex::askedFirst(const QString& group) {
    const SheetGrid* grid = &fixed_;
    auto key = keyOf_.find(group.toUpper().toStdString());
    if (key != keyOf_.end()) {
        auto model = byKey_.find(key->second);
        if (model != byKey_.end()) grid = &model->second;
    }
    // Not a text the caller may take away (a module's constant): a copy of its own.
    asked_.insert(QString(group.constData(), group.size()), grid);
    return grid;
}

QString SheetGridIndex::position(zvdb::Database* database, const std::string& group, double x,
                                 double y) {
    return position(database, QString::fromStdString(group), x, y);
}

QString SheetGridIndex::position(zvdb::Database* database, const QString& group, double x,
                                 double y) {
    return gridOf(database, group).position(x, y);
}

}  // namespace zvproduct
