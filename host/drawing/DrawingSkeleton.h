#pragma once
// The DXF text of a new, empty drawing (AC1027).
#include <string>

namespace zvdb {

class DrawingSkeleton {
public:
    static std::string text();
};

}  // namespace zvdb
