#include "TextMarkup.h"

namespace zvplot {

QStringList TextMarkup::mtextLines(const QString& content) {
    QStringList lines;
    QString line;
    const int n = content.size();
    for (int i = 0; i < n; ++i) {
        const QChar c = content[i];
        if (c == '{' || c == '}') continue;
        if (c != '\\' || i + 1 >= n) {
            line += c;
            continue;
        }
        const QChar code = content[++i];
        switch (code.toLatin1()) {
            case 'P':
            case 'n':
                lines << line;
                line.clear();
                break;
            case '~':
                line += QChar(0x00A0);
                break;
            case '\\':
            case '{':
            case '}':
                line += code;
                break;
            case 'L':
            case 'l':
            case 'O':
            case 'o':
            case 'K':
            case 'k':
                break;
            case 'U':
                // \U+XXXX
                if (i + 5 < n && content[i + 1] == '+') {
                    bool ok = false;
                    const uint value = content.mid(i + 2, 4).toUInt(&ok, 16);
                    if (ok) {
                        line += QChar(value);
                        i += 5;
                        break;
                    }
                }
                line += code;
                break;
            case 'S': {
                // A stacked fraction: top and bottom with their separator, up to the ";".
                const int end = content.indexOf(';', i + 1);
                const QString stack = content.mid(i + 1, end < 0 ? -1 : end - i - 1);
                QString shown = stack;
                shown.replace('^', '/').replace('#', '/');
                line += shown;
                i = end < 0 ? n : end;
                break;
            }
            case 'f':
            case 'F':
            case 'H':
            case 'h':
            case 'W':
            case 'w':
            case 'C':
            case 'c':
            case 'T':
            case 't':
            case 'Q':
            case 'q':
            case 'A':
            case 'a':
            case 'p': {
                const int end = content.indexOf(';', i + 1);
                i = end < 0 ? n : end;
                break;
            }
            default:
                line += code;
        }
    }
    lines << line;
    return lines;
}

QStringList TextMarkup::wrap(const QStringList& lines, double width,
                             const std::function<double(const QString&)>& measure) {
    if (width <= 0) return lines;
    QStringList out;
    for (const QString& line : lines) {
        if (measure(line) <= width) {
            out << line;
            continue;
        }
        QString current;
        for (const QString& word : line.split(' ')) {
            const QString candidate = current.isEmpty() ? word : current + ' ' + word;
            if (!current.isEmpty() && measure(candidate) > width) {
                out << current;
                current = word;
            } else {
                current = candidate;
            }
        }
        out << current;
    }
    return out;
}

}  // namespace zvplot
