#pragma once
// The sheet grid of each page group, for BuscarCoordenadas. A page's group (its layer's first
// "$" token) is looked up by name, case ignored, in the page registry, which gives the group's
// catalogue key (code 70); the catalogue's BDGROUP row of that key (the language of the
// setting libLang, else the lowest language; erased rows left out) names the page model
// (PAGE), and the model's BDPAGE row gives the grid. A group not in the registry, a key or a
// model the catalogue lacks, a model without a grid or no catalogue at all: the fixed grid.
//
// The catalogue is read once per document, at the first question; the registry again only
// when an object other than a layer record has changed.
#include "DrawingStamp.h"
#include "SheetGrid.h"

#include <QHash>
#include <QString>

#include <string>
#include <unordered_map>

namespace zvproduct {

class CatalogueConnection;

class SheetGridIndex {
public:
    // The position of (x, y) on a page of `group`; "??" outside its grid.
    QString position(zvdb::Database* database, const std::string& group, double x, double y);
    QString position(zvdb::Database* database, const QString& group, double x, double y);

private:
    const SheetGrid& gridOf(zvdb::Database* database, const QString& group);
    const SheetGrid* askedFirst(const QString& group);
    void readCatalogue();
    void readCatalogue(const CatalogueConnection& catalogue, int language);
    void readRegistry(zvdb::Database& database);

    bool catalogueRead_ = false;
    std::unordered_map<int, SheetGrid> byKey_;  // groups whose page model has a grid
    DrawingStamp stamp_;
    std::unordered_map<std::string, int> keyOf_;  // upper-case group name to catalogue key
    // The grid of each group as it was asked for (a list asks for every symbol), until the
    // registry is read again.
    QHash<QString, const SheetGrid*> asked_;
    // The last group asked for and its grid: a list asks for one page's symbols in a row,
    // with the very text of the layer each time.
    QString lastGroup_;
    const SheetGrid* lastGrid_ = nullptr;
    SheetGrid fixed_ = SheetGrid::fixed();
};

}  // namespace zvproduct
