#include "Attribute.h"

namespace zvdb {

void Attribute::setInvisible(bool invisible) {
    const int value = invisible ? (flags() | 1) : (flags() & ~1);
    setInteger(70, value, isDefinition() ? "AcDbAttributeDefinition" : "AcDbAttribute");
}

}  // namespace zvdb
