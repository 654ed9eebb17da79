#include "ProductSettings.h"

#include <QFile>
#include <QStandardPaths>
#include <QXmlStreamReader>

namespace zvproduct {

namespace {

const char16_t kPasswordKey[] = u"ZVListas";

QString commonDataFolder() {
    const QString set = qEnvironmentVariable("ZV_DATA_DIR");
    if (!set.isEmpty()) return set;
    const QString own = QStandardPaths::writableLocation(QStandardPaths::GenericDataLocation);
    for (const QString& folder :
         QStandardPaths::standardLocations(QStandardPaths::GenericDataLocation))
        if (folder != own) return folder;
    return QStringLiteral("/usr/local/share");
}

}  // namespace

QString ProductSettings::file() {
    QString folder = commonDataFolder();
    if (!folder.endsWith('/') && !folder.endsWith('\\')) folder += '/';
    return folder + "FV/FVREG2022SP0.xml";
}

ProductSettings::ProductSettings() {
    QFile input(file());
    if (!input.open(QIODevice::ReadOnly)) return;
    QXmlStreamReader xml(&input);
    while (!xml.atEnd()) {
        xml.readNext();
        if (!xml.isStartElement() || xml.name() != QLatin1String("registro")) continue;
        const auto attributes = xml.attributes();
        values_.insert(attributes.value("key").toString(), attributes.value("value").toString());
    }
    // a file that does not parse says nothing, as for the module
    if (xml.hasError()) values_.clear();
}

QString ProductSettings::password() const {
    const QByteArray bytes = QByteArray::fromHex(value("DBPass").toLatin1());
    QString text;
    for (int i = 0; i + 1 < bytes.size(); i += 2) {
        const auto unit = static_cast<char16_t>((uchar(bytes[i]) << 8) | uchar(bytes[i + 1]));
        text += QChar(static_cast<char16_t>(unit ^ kPasswordKey[(i / 2) % 8]));
    }
    return text;
}

}  // namespace zvproduct
