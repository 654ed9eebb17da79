#include "NumberFormat.h"

#include <QRegularExpression>

#include <cmath>
#include <numeric>

namespace zvlisp {

namespace {

QString trimZeros(QString text, int dimzin) {
    if (dimzin & 8) {
        const int e = text.indexOf('E');
        QString mantissa = e < 0 ? text : text.left(e);
        const QString exponent = e < 0 ? QString() : text.mid(e);
        if (mantissa.contains('.')) {
            while (mantissa.endsWith('0'))
                mantissa.chop(1);
            if (mantissa.endsWith('.')) mantissa.chop(1);
        }
        text = mantissa + exponent;
    }
    if (dimzin & 4) {
        if (text.startsWith(QLatin1String("0.")) && text.size() > 2) text.remove(0, 1);
        if (text.startsWith(QLatin1String("-0.")) && text.size() > 3) text.remove(1, 1);
    }
    return text;
}

}  // namespace

QString NumberFormat::decimal(double value, int precision, int dimzin) {
    return trimZeros(QString::asprintf("%.*f", precision, value), dimzin);
}

// Whole part and a fraction in 1/2^precision steps, reduced: "17 1/2", "3/4", "5".
QString NumberFormat::fraction(double value, int precision, bool spaceBetween, bool* carried) {
    const long long denominator = 1LL << std::clamp(precision, 0, 8);
    long long steps = std::llround(value * double(denominator));
    long long whole = steps / denominator;
    long long numerator = steps % denominator;
    if (carried) *carried = false;
    if (numerator == 0) return QString::number(whole);
    const long long g = std::gcd(numerator, denominator);
    const QString part = QString::number(numerator / g) + '/' + QString::number(denominator / g);
    if (whole == 0) return part;
    return QString::number(whole) + (spaceBetween ? " " : "-") + part;
}

QString NumberFormat::feetAndInches(double value, int mode, int precision, int dimzin) {
    const double total = std::fabs(value);
    long long feet = (long long)(total / 12.0);
    double inches = total - double(feet) * 12.0;
    QString inchText;
    bool zeroInches = false;
    if (mode == 3) {
        inchText = QString::asprintf("%.*f", precision, inches);
        if (inchText.toDouble() >= 12.0) {
            ++feet;
            inchText = QString::asprintf("%.*f", precision, 0.0);
        }
        zeroInches = inchText.toDouble() == 0.0;
        inchText = trimZeros(inchText, dimzin & 8);
    } else {
        const long long denominator = 1LL << std::clamp(precision, 0, 8);
        long long steps = std::llround(inches * double(denominator));
        if (steps >= 12 * denominator) {
            ++feet;
            steps = 0;
        }
        zeroInches = steps == 0;
        inchText = fraction(double(steps) / double(denominator), precision, true, nullptr);
    }
    const bool suppressFeet = (dimzin & 3) == 0 || (dimzin & 3) == 3;
    const bool suppressInches = (dimzin & 3) == 0 || (dimzin & 3) == 2;
    QString text;
    if (feet == 0 && suppressFeet)
        text = inchText + '"';
    else if (zeroInches && suppressInches)
        text = QString::number(feet) + '\'';
    else
        text = QString::number(feet) + "'-" + inchText + '"';
    return value < 0 ? "-" + text : text;
}

QString NumberFormat::linear(double value, int mode, int precision, int dimzin) {
    precision = std::clamp(precision, 0, 8);
    switch (mode) {
        case 1:
            return trimZeros(QString::asprintf("%.*E", precision, value), dimzin);
        case 2:
            return decimal(value, precision, dimzin);
        case 3:
        case 4:
            return feetAndInches(value, mode, precision, dimzin);
        case 5: {
            const QString text = fraction(std::fabs(value), precision, true, nullptr);
            return value < 0 && text != QLatin1String("0") ? "-" + text : text;
        }
        default:
            return QString();
    }
}

QString NumberFormat::dms(double degrees, int precision) {
    if (precision <= 0) return QString::number(std::llround(degrees)) + 'd';
    if (precision <= 2) {
        long long minutes = std::llround(degrees * 60.0);
        return QString::number(minutes / 60) + 'd' + QString::number(minutes % 60) + '\'';
    }
    const int decimals = precision - 4 > 0 ? precision - 4 : 0;
    const double scale = std::pow(10.0, decimals);
    const long long units = std::llround(degrees * 3600.0 * scale);
    const long long wholeSeconds = units / (long long)scale;
    const long long d = wholeSeconds / 3600, m = (wholeSeconds / 60) % 60;
    const double s = double(wholeSeconds % 60) + double(units % (long long)scale) / scale;
    return QString::number(d) + 'd' + QString::number(m) + '\'' +
           QString::asprintf("%.*f", decimals, s) + '"';
}

QString NumberFormat::angle(double radians, int mode, int precision) {
    precision = std::clamp(precision, 0, 8);
    double a = std::fmod(radians, 2 * M_PI);
    if (a < 0) a += 2 * M_PI;
    const double degrees = a * 180.0 / M_PI;
    switch (mode) {
        case 0:
            return QString::asprintf("%.*f", precision, degrees);
        case 1:
            return dms(degrees, precision);
        case 2:
            return QString::asprintf("%.*fg", precision, a * 200.0 / M_PI);
        case 3:
            return QString::asprintf("%.*fr", precision, a);
        case 4: {
            if (std::fabs(degrees - 90.0) < 1e-9) return QStringLiteral("N");
            if (std::fabs(degrees - 270.0) < 1e-9) return QStringLiteral("S");
            if (degrees < 1e-9 || degrees > 360.0 - 1e-9) return QStringLiteral("E");
            if (std::fabs(degrees - 180.0) < 1e-9) return QStringLiteral("W");
            const bool north = degrees < 180.0;
            const bool east = degrees < 90.0 || degrees > 270.0;
            const double off = std::fabs((north ? 90.0 : 270.0) - degrees);
            return QString(north ? "N " : "S ") + dms(off, precision) + (east ? " E" : " W");
        }
        default:
            return QString();
    }
}

std::optional<double> NumberFormat::parseLinear(const QString& input) {
    const QString text = input.trimmed();
    bool ok = false;
    const double plain = text.toDouble(&ok);
    if (ok) return plain;
    // [-] [feet '] [-] [whole] [n/d] ["]
    static const QRegularExpression pattern(
        QStringLiteral("^([+-])?\\s*(?:(\\d+(?:\\.\\d*)?)\\s*')?\\s*-?\\s*(\\d+(?:\\.\\d*)?)?"
                       "\\s*(?:(\\d+)\\s*/\\s*(\\d+))?\\s*(\")?$"));
    const QRegularExpressionMatch m = pattern.match(text);
    if (!m.hasMatch()) return std::nullopt;
    const bool hasFeet = !m.captured(2).isEmpty();
    const bool hasWhole = !m.captured(3).isEmpty();
    const bool hasFraction = !m.captured(4).isEmpty();
    if (!hasFeet && !hasWhole && !hasFraction) return std::nullopt;
    double value = hasFeet ? m.captured(2).toDouble() * 12.0 : 0.0;
    if (hasWhole) value += m.captured(3).toDouble();
    if (hasFraction) {
        const double denominator = m.captured(5).toDouble();
        if (denominator == 0.0) return std::nullopt;
        value += m.captured(4).toDouble() / denominator;
    }
    return m.captured(1) == QLatin1String("-") ? -value : value;
}

}  // namespace zvlisp
