#pragma once
// Reading and writing drawing files for the host's documents. Every program and command
// that opens a drawing as a document (zvhost, its subcommands, the desktop, the module's
// block and project files) goes through readDrawing: DXF, and DWG through the converter.
#include <QString>

#include <memory>

namespace zvdb {
class Database;
}

namespace zvhost {

// The drawing in `path`, or null with `error` set (naming the file) when it can't be read.
// A file named .dwg or that starts as a DWG is read through the DWG converter.
std::unique_ptr<zvdb::Database> readDrawing(const QString& path, QString* error);
// True when `path` names a DWG drawing (by name, or by content when it exists): there is no
// DWG writer, so such a file is never saved over.
bool isDwgDrawing(const QString& path);
// Saves atomically (a temporary file in the same folder, then a rename): on failure the
// file at `path` is as it was. A DWG target is refused (message 920).
bool writeDrawing(zvdb::Database& database, const QString& path, QString* error);
// The refusal to save over a DWG drawing, naming it.
QString dwgWriteRefusal(const QString& path);

}  // namespace zvhost
