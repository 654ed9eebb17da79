#include "DrawingFiles.h"

#include "drawing/Database.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"

namespace zvhost {

std::unique_ptr<zvdb::Database> readDrawing(const QString& path, QString* error) {
    try {
        return zvdb::DxfLoader::loadFile(path.toStdString());
    } catch (const zvdb::DxfError& e) {
        *error = path + ": " + QString::fromStdString(e.what());
    } catch (const std::bad_alloc&) {
        *error = path + ": not enough memory to read the drawing";
    }
    return nullptr;
}

bool writeDrawing(zvdb::Database& database, const QString& path, QString* error) {
    try {
        zvdb::DxfWriter::saveFile(database, path.toStdString());
        return true;
    } catch (const zvdb::DxfError& e) {
        *error = QString::fromStdString(e.what());
    } catch (const std::bad_alloc&) {
        *error = "could not save " + path + ": not enough memory";
    }
    return false;
}

}  // namespace zvhost
