#include "ProductSettings.h"

#include "sdk/AtomicFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStandardPaths>
#include <QXmlStreamReader>
#include <QXmlStreamWriter>

#include <utility>
#include <vector>

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

bool ProductSettings::store(const QString& key, const QString& value, QString* error) {
    const QString path = file();
    std::vector<std::pair<QString, QString>> records;
    QFile input(path);
    if (input.exists()) {
        if (!input.open(QIODevice::ReadOnly)) {
            *error = "could not read " + path + ": " + input.errorString();
            return false;
        }
        const QByteArray content = input.readAll();
        QXmlStreamReader xml(content);
        while (!content.trimmed().isEmpty() && !xml.atEnd()) {
            xml.readNext();
            if (!xml.isStartElement() || xml.name() != QLatin1String("registro")) continue;
            const auto attributes = xml.attributes();
            records.emplace_back(attributes.value("key").toString(),
                                 attributes.value("value").toString());
        }
        // Other modules keep their settings here too: a file that does not read is kept.
        if (!content.trimmed().isEmpty() && xml.hasError()) {
            *error = "could not read " + path + ": " + xml.errorString() + "; nothing was saved";
            return false;
        }
    }
    bool found = false;
    for (auto& [k, v] : records)
        if (k == key) v = value, found = true;
    if (!found) records.emplace_back(key, value);
    QByteArray bytes;
    QXmlStreamWriter xml(&bytes);
    xml.setAutoFormatting(true);
    xml.setAutoFormattingIndent(2);
    xml.writeStartDocument();
    xml.writeStartElement("registros");
    for (const auto& [k, v] : records) {
        xml.writeEmptyElement("registro");
        xml.writeAttribute("key", k);
        xml.writeAttribute("value", v);
    }
    xml.writeEndElement();
    xml.writeEndDocument();
    if (!QDir().mkpath(QFileInfo(path).absolutePath())) {
        *error = "could not save " + path + ": cannot make its folder";
        return false;
    }
    return zvsdk::saveFileAtomically(path, std::string_view(bytes.data(), size_t(bytes.size())),
                                     error);
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
