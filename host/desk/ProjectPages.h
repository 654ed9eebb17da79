#pragma once
// What the desktop needs to know of a project drawing: its pages in registry order, its
// terminal strips, and showing one page as the product shows it.
#include <QRectF>
#include <QString>
#include <QStringList>

#include <string>
#include <vector>

namespace zvdb {
class Database;
class Entity;
}  // namespace zvdb

namespace zvdesk {

// The page registry's pages, all groups in order.
QStringList pageNames(zvdb::Database& database);
// The names of the terminal strips (the REGUA, STRIP or REGLETA of the BORNE blocks in model
// space), sorted, each once.
QStringList stripNames(const zvdb::Database& database);
bool isCoverOrIndex(const zvdb::Database& database, const std::string& page, bool* cover);
// Freezes every layer but the page's own ones (its "$SELO" stays frozen on a cover or an
// index) and makes the page current. False when the drawing has no such layer.
bool showPage(zvdb::Database& database, const std::string& page);
// The bounds of these entities; empty when they draw nothing.
QRectF extentsOf(const std::vector<zvdb::Entity*>& entities);

}  // namespace zvdesk
