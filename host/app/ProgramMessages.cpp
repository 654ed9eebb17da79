#include "ProgramMessages.h"

#include <QCoreApplication>
#include <QFile>
#include <QXmlStreamReader>

namespace zvhost {

QString programMessage(int number, const QString& fallback, const QString& folder) {
    QString base = folder;
    if (base.isEmpty() && QCoreApplication::instance())
        base = QCoreApplication::applicationDirPath();
    QFile file(base + "/program/ZVListas.config");
    if (base.isEmpty() || !file.open(QIODevice::ReadOnly)) return fallback;
    // Languages come in order (1 Portuguese, 2 English, 3 Spanish); the host speaks English.
    constexpr int kEnglish = 2;
    QXmlStreamReader xml(&file);
    int language = 0;
    while (!xml.atEnd()) {
        if (!xml.readNextStartElement()) continue;
        if (xml.name() == QLatin1String("idioma")) {
            ++language;
        } else if (language == kEnglish && xml.name() == QLatin1String("msg")) {
            const auto attributes = xml.attributes();
            if (attributes.size() >= 2 && attributes.at(0).value().toInt() == number)
                return attributes.at(1).value().toString();
        }
    }
    return fallback;
}

}  // namespace zvhost
