#include "DrawingFiles.h"

#include "ProgramMessages.h"
#include "drawing/Database.h"
#include "drawing/DwgImport.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"

#include <QCoreApplication>

namespace zvhost {

namespace {

// The converter lies beside the programs (bin/dwg), unless ZV_DWG_CONVERTER names it.
zvdb::DwgImport::Setup dwgSetup() {
    zvdb::DwgImport::Setup setup;
    if (qEnvironmentVariableIsEmpty("ZV_DWG_CONVERTER") && QCoreApplication::instance())
        setup.converterDir = QString(QCoreApplication::applicationDirPath() + "/dwg").toStdString();
    return setup;
}

}  // namespace

std::unique_ptr<zvdb::Database> readDrawing(const QString& path, QString* error) {
    try {
        const std::string file = path.toStdString();
        if (zvdb::DwgImport::isDwgFile(file)) return zvdb::DwgImport::loadFile(file, dwgSetup());
        return zvdb::DxfLoader::loadFile(file);
    } catch (const zvdb::DxfError& e) {
        *error = path + ": " + QString::fromStdString(e.what());
    } catch (const std::bad_alloc&) {
        *error = path + ": not enough memory to read the drawing";
    }
    return nullptr;
}

bool isDwgDrawing(const QString& path) {
    return zvdb::DwgImport::isDwgFile(path.toStdString());
}

QString dwgWriteRefusal(const QString& path) {
    return path + ": " +
           programMessage(kMessageNoDwgWriter,
                          "This edition does not write DWG: the drawing was not saved and the "
                          "DWG file is as it was. Save it as DXF.");
}

bool writeDrawing(zvdb::Database& database, const QString& path, QString* error) {
    if (isDwgDrawing(path)) {
        *error = dwgWriteRefusal(path);
        return false;
    }
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
