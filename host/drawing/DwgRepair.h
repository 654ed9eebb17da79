#pragma once
// Puts right what the DWG converter's DXF writer is known to get wrong. Some repairs need
// facts from the converter's object model of the same drawing, a JSON text that the
// converter script writes beside the DXF:
//   {"layers": [{"handle": "10", "off": false}, ...],
//    "polylineWidths": [{"handle": "35B", "widths": [[start, end], ...]}, ...],
//    "attributes": [{"handle": "79C", "attributes": [{"handle": "79D", "tag": ..., "value":
//        ..., "layer": ..., "color": ..., "position": [x, y, z], "alignment": [x, y, z],
//        "height": ..., "rotation": radians, "widthFactor": ..., "oblique": radians,
//        "style": ..., "halign": ..., "valign": ..., "flags": ...}, ...]}, ...],
//    "xrecordAngles": [{"handle": "309", "angles": [radians, ...]}, ...],
//    "longTexts": [{"handle": "779", "text": ...}, ...]}
// Attributes, long multi-line texts and extended data are mended in the DXF text before it is read
// (they keep their handles that way); the rest in the drawing read from it.
#include <QJsonObject>

#include <cstddef>
#include <string>
#include <string_view>

namespace zvdb {

class Database;

class DwgRepair {
public:
    // What was changed, by kind.
    struct Counts {
        std::size_t layersOff = 0;       // layers whose off state was set from the model
        std::size_t polylineWidths = 0;  // lightweight polylines given their vertex widths
        std::size_t attributes = 0;      // attributes put back under their block reference
        std::size_t xrecordAngles = 0;   // angles of Xrecords put back in radians
        std::size_t xdataIntegers = 0;   // 1070 values read back as signed 16-bit numbers
        std::size_t xdataLayers = 0;     // 1003 values put back as layer names
        std::size_t longTexts = 0;       // long multi-line texts written from the model
        std::size_t trueColors = 0;      // true colours cut to their 24 bits of RGB
    };

    // Throws DxfError when the facts are not a JSON object.
    explicit DwgRepair(std::string_view factsJson);

    // The ASCII DXF text with the missing attributes and the extended data mended.
    std::string repairText(std::string_view dxf);
    // The drawing read from that text: layer states, vertex widths, Xrecord angles.
    void repairDrawing(Database& database);

    const Counts& counts() const { return counts_; }

private:
    QJsonObject facts_;
    Counts counts_;
};

}  // namespace zvdb
