#pragma once
// Numbers as the drawing's unit formats show them (rtos, angtos) and back (distof).
//   linear modes: 1 scientific, 2 decimal, 3 engineering (feet and decimal inches),
//                 4 architectural (feet and fractional inches), 5 fractional
//   angle modes:  0 degrees, 1 degrees/minutes/seconds, 2 grads, 3 radians, 4 surveyor's
// `dimzin` follows the system variable: 0 keeps trailing zeros and drops zero feet and
// zero inches, 8 drops trailing zeros, 4 drops a leading zero.
#include <QString>

#include <optional>

namespace zvlisp {

class NumberFormat {
public:
    // Empty for an unknown mode.
    static QString linear(double value, int mode, int precision, int dimzin);
    static QString angle(double radians, int mode, int precision);
    // The value of a text in any linear format; none when it is no number.
    static std::optional<double> parseLinear(const QString& text);
    // The radians of a text in an angle mode as angtos writes it (a bare number reads in
    // the mode's unit); none when the text is no angle of that mode.
    static std::optional<double> parseAngle(const QString& text, int mode);

private:
    static QString decimal(double value, int precision, int dimzin);
    static QString fraction(double value, int precision, bool spaceBetween, bool* carried);
    static QString feetAndInches(double value, int mode, int precision, int dimzin);
    static QString dms(double degrees, int precision);
    static std::optional<double> parseDms(const QString& text);
};

}  // namespace zvlisp
