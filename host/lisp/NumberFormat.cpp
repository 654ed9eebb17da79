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

namespace zvlisp {

// 45d30'15.5" with minutes and seconds optional; a bare number is degrees.
std::optional<double> NumberFormat::parseDms(const QString& input) {
    static const QRegularExpression pattern(
        QStringLiteral("^(\\d+(?:\\.\\d*)?)(?:d(?:(\\d+(?:\\.\\d*)?)')?"
                       "(?:(\\d+(?:\\.\\d*)?)\")?)?$"));
    const QRegularExpressionMatch m = pattern.match(input.trimmed());
    if (!m.hasMatch()) return std::nullopt;
    return m.captured(1).toDouble() + m.captured(2).toDouble() / 60.0 +
           m.captured(3).toDouble() / 3600.0;
}

std::optional<double> NumberFormat::parseAngle(const QString& input, int mode) {
    QString text = input.trimmed();
    if (text.isEmpty()) return std::nullopt;
    bool negative = false;
    if (mode != 4 && (text.startsWith('-') || text.startsWith('+'))) {
        negative = text.startsWith('-');
        text = text.mid(1).trimmed();
    }
    const double toRadians = M_PI / 180.0;
    std::optional<double> result;
    bool ok = false;
    switch (mode) {
        case 0: {
            const double degrees = text.toDouble(&ok);
            if (ok) result = degrees * toRadians;
            break;
        }
        case 1:
            if (const auto degrees = parseDms(text)) result = *degrees * toRadians;
            break;
        case 2: {
            if (text.endsWith('g', Qt::CaseInsensitive)) text.chop(1);
            const double grads = text.toDouble(&ok);
            if (ok) result = grads * M_PI / 200.0;
            break;
        }
        case 3: {
            if (text.endsWith('r', Qt::CaseInsensitive)) text.chop(1);
            const double radians = text.toDouble(&ok);
            if (ok) result = radians;
            break;
        }
        case 4: {
            // N, S, E, W, or N 45d0'0" E: an angle off north or south toward east or west.
            const QString upper = text.toUpper().simplified();
            if (upper == "E") return 0.0;
            if (upper == "N") return M_PI / 2;
            if (upper == "W") return M_PI;
            if (upper == "S") return 3 * M_PI / 2;
            if (upper.size() < 3) return std::nullopt;
            const QChar from = upper.front(), toward = upper.back();
            if ((from != 'N' && from != 'S') || (toward != 'E' && toward != 'W'))
                return std::nullopt;
            const auto off = parseDms(upper.mid(1, upper.size() - 2).toLower().trimmed());
            if (!off) return std::nullopt;
            const double o = *off;
            double degrees = 0;
            if (from == 'N')
                degrees = toward == 'E' ? 90.0 - o : 90.0 + o;
            else
                degrees = toward == 'E' ? 270.0 + o : 270.0 - o;
            return degrees * toRadians;
        }
        default:
            return std::nullopt;
    }
    if (!result) return std::nullopt;
    return negative ? -*result : *result;
}

}  // namespace zvlisp
