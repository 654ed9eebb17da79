#include "DrawingFiles.h"

#include "drawing/Database.h"

namespace zvhost {

std::unique_ptr<zvdb::Database> readDrawing(const QString& path, QString* error) {
    *error = QStringLiteral("%1: reading drawing files is not available in this build").arg(path);
    return nullptr;
}

bool writeDrawing(zvdb::Database& database, const QString& path, QString* error) {
    Q_UNUSED(database);
    *error = QStringLiteral("%1: writing drawing files is not available in this build").arg(path);
    return false;
}

}  // namespace zvhost
