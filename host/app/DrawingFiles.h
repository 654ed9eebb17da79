#pragma once
// Reading and writing drawing files for the host's documents.
#include <QString>

#include <memory>

namespace zvdb {
class Database;
}

namespace zvhost {

// The drawing in `path`, or null with `error` set when it can't be read.
std::unique_ptr<zvdb::Database> readDrawing(const QString& path, QString* error);
// Saves atomically (a temporary file in the same folder, then a rename): on failure the
// file at `path` is as it was.
bool writeDrawing(zvdb::Database& database, const QString& path, QString* error);

}  // namespace zvhost
