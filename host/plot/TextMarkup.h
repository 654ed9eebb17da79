#pragma once
// The plain lines of a multi-line text: its formatting codes taken out, its paragraph
// breaks as line breaks, and lines wrapped to a width.
#include <QString>
#include <QStringList>

#include <functional>

namespace zvplot {

class TextMarkup {
public:
    // "\P" breaks a line; "\~" is a fixed blank; "\\", "\{", "\}" stand for the character;
    // font, height, colour and the other codes ending in ";" are dropped, as are the
    // switches "\L", "\O", "\K" and their lower-case ends, and the braces that group them.
    // A stacked fraction "\S1/2;" shows as "1/2". "\U+00B0" is a character by number.
    static QStringList mtextLines(const QString& content);
    // Each line cut at blanks so that no piece is wider than `width`, as `measure` tells; a
    // single word wider than that stays whole.
    static QStringList wrap(const QStringList& lines, double width,
                            const std::function<double(const QString&)>& measure);
};

}  // namespace zvplot
