#pragma once
// The product settings file as the host reads it: FV/FVREG2022SP0.xml in the folder for all
// users' application data ($ZV_DATA_DIR, else the first of the system's shared data folders),
// a list of <registro key="..." value="..."/>. Read once, at construction; a missing or
// unreadable file reads as empty.
#include <QHash>
#include <QString>

namespace zvproduct {

class ProductSettings {
public:
    ProductSettings();

    static QString file();
    QString value(const QString& key) const { return values_.value(key); }
    // Sets one record of the file (added when missing) and saves it atomically; false with
    // `error` set when the file does not parse (it is never replaced then) or the save fails.
    static bool store(const QString& key, const QString& value, QString* error);
    // DBPass is kept as the hex of its UTF-16 code units, each mixed with a fixed key.
    QString password() const;

private:
    QHash<QString, QString> values_;
};

}  // namespace zvproduct
