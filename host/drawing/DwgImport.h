#pragma once
// Reads a DWG drawing (R13 to 2018) through the DWG converter, a separate Node.js program
// (tools/dwg/dwg2dxf.mjs with its package, installed by `./zv deps`): it writes the drawing
// as DXF, which is read as any DXF, then DwgRepair puts right what the converter gets wrong.
// There is no DWG writer. Every failure throws DxfError with a message for the user;
// nothing is written but the converter's files in a temporary folder, removed afterwards.
#include "Database.h"

#include <memory>
#include <string>
#include <string_view>

namespace zvdb {

class DwgImport {
public:
    struct Setup {
        // The Node.js program; empty: $ZV_NODE, else `node` on the PATH.
        std::string node;
        // The folder with dwg2dxf.mjs and node_modules; empty: $ZV_DWG_CONVERTER.
        std::string converterDir;
        // The conversion is stopped after this long; 0: $ZV_DWG_TIMEOUT or 120 seconds.
        int timeoutSeconds = 0;
    };

    // The start of a DWG file: its version mark ("AC1015" and the like, or an older one).
    static bool looksLikeDwg(std::string_view head);
    // A file named .dwg, or one that starts like a DWG file.
    static bool isDwgFile(const std::string& path);
    // The release of a version mark ("AC1015" is "2000"), empty when unknown.
    static std::string_view releaseOf(std::string_view versionMark);

    static std::unique_ptr<Database> loadFile(const std::string& path, const Setup& setup);
};

}  // namespace zvdb
