#include "LayerRecord.h"

#include <cstdlib>

namespace zvdb {

void LayerRecord::setFlag(int bit, bool on) {
    const long long flags = integer(70);
    setInteger(70, on ? (flags | bit) : (flags & ~static_cast<long long>(bit)),
               "AcDbLayerTableRecord");
}

void LayerRecord::setOff(bool off) {
    const int value = color();
    setInteger(62, off ? -value : value, "AcDbLayerTableRecord");
}

int LayerRecord::color() const {
    const int value = static_cast<int>(std::llabs(integer(62, 7)));
    return value == 0 ? 7 : value;
}

void LayerRecord::setColor(int color) {
    setInteger(62, isOff() ? -std::abs(color) : std::abs(color), "AcDbLayerTableRecord");
}

}  // namespace zvdb
