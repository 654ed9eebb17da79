#include "Tag.h"

namespace zvdb {

ValueKind valueKind(int code) {
    if (code < 0) return ValueKind::Int32;
    if (code <= 4 || (code >= 6 && code <= 9)) return ValueKind::String;
    if (code == 5 || code == 105) return ValueKind::Handle;
    if (code < 60) return ValueKind::Real;
    if (code < 80) return ValueKind::Int16;
    if (code >= 90 && code < 100) return ValueKind::Int32;
    if (code >= 100 && code < 110) return ValueKind::String;
    if (code >= 110 && code < 150) return ValueKind::Real;
    if (code >= 160 && code < 170) return ValueKind::Int64;
    if (code >= 170 && code < 180) return ValueKind::Int16;
    if (code >= 210 && code < 240) return ValueKind::Real;
    if (code >= 270 && code < 290) return ValueKind::Int16;
    if (code >= 290 && code < 300) return ValueKind::Bool;
    if (code >= 300 && code < 310) return ValueKind::String;
    if (code >= 310 && code < 320) return ValueKind::Binary;
    if (code >= 320 && code < 370) return ValueKind::Handle;
    if (code >= 370 && code < 390) return ValueKind::Int16;
    if (code >= 390 && code < 400) return ValueKind::Handle;
    if (code >= 400 && code < 410) return ValueKind::Int16;
    if (code >= 410 && code < 420) return ValueKind::String;
    if (code >= 420 && code < 430) return ValueKind::Int32;
    if (code >= 430 && code < 440) return ValueKind::String;
    if (code >= 440 && code < 460) return ValueKind::Int32;
    if (code >= 460 && code < 470) return ValueKind::Real;
    if (code >= 470 && code < 480) return ValueKind::String;
    if (code >= 480 && code < 482) return ValueKind::Handle;
    if (code == 1004) return ValueKind::Binary;
    if (code == 1005) return ValueKind::Handle;
    if (code >= 1000 && code < 1010) return ValueKind::String;
    if (code >= 1010 && code < 1060) return ValueKind::Real;
    if (code >= 1060 && code < 1071) return ValueKind::Int16;
    if (code == 1071) return ValueKind::Int32;
    return ValueKind::String;
}

bool isPointerCode(int code) {
    return (code >= 320 && code < 370) || (code >= 390 && code < 400) || code == 480 ||
           code == 481 || code == 1005;
}

}  // namespace zvdb
