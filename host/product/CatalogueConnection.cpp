#include "CatalogueConnection.h"

#include "ProductSettings.h"

#include <QFileInfo>
#include <QRegularExpression>
#include <QVariant>
#include <QtSql/QSqlDatabase>
#include <QtSql/QSqlQuery>
#include <QtSql/QSqlRecord>

#include <atomic>

namespace zvproduct {

namespace {

struct Opening {
    QString driver;
    QString text;
    QString file;  // for the file engines: must exist
    bool readOnly = false;
};

// A value of an ODBC connection text; braces keep separators inside it.
QString odbcValue(const QString& value) {
    if (!value.contains(QRegularExpression("[;{}=\\s]"))) return value;
    return "{" + QString(value).replace("}", "}}") + "}";
}

QString sqlServerText(const ProductSettings& settings) {
    // users write "host,port"; the driver wants the port apart
    const QString server = settings.value("DBServer");
    const int comma = server.indexOf(',');
    QString text =
        "DRIVER={FreeTDS};SERVER=" + odbcValue(comma < 0 ? server : server.left(comma).trimmed()) +
        ";";
    if (comma >= 0) text += "PORT=" + server.mid(comma + 1).trimmed() + ";";
    return text + "DATABASE=" + odbcValue(settings.value("DBName")) + ";TDS_Version=7.4;";
}

Opening openingFor(const ProductSettings& settings) {
    const QString engine = settings.value("Database");
    const QString file = settings.value("NetworkZV") + settings.value("DBName");
    if (engine == "SQLITE") return {"QSQLITE", file, file};
    if (engine == "MDB")
        return {"QODBC", "DRIVER={MDBTools};DBQ=" + odbcValue(file) + ";", file, true};
    if (engine == "SQLSERVER") return {"QODBC", sqlServerText(settings), {}};
    if (engine == "ODBC") return {"QODBC", settings.value("DBName"), {}};
    return {};  // LOCALDB has no engine here; an empty setting names none
}

QString textOf(const QVariant& value) {
    if (value.isNull()) return {};
    if (value.type() == QVariant::Bool) return value.toBool() ? "1" : "0";
    return value.toString().trimmed();
}

}  // namespace

CatalogueConnection::CatalogueConnection(const ProductSettings& settings) {
    static std::atomic<int> serial{0};
    name_ = QString("zvproduct-catalogue-%1").arg(++serial);
    const Opening opening = openingFor(settings);
    if (opening.driver.isEmpty() || !QSqlDatabase::isDriverAvailable(opening.driver)) return;
    if (!opening.file.isEmpty() && !QFileInfo(opening.file).isFile()) return;
    QSqlDatabase database = QSqlDatabase::addDatabase(opening.driver, name_);
    database.setDatabaseName(opening.text);
    if (opening.readOnly) database.setConnectOptions("SQL_ATTR_ACCESS_MODE=SQL_MODE_READ_ONLY");
    if (opening.driver == "QSQLITE") database.setConnectOptions("QSQLITE_OPEN_READONLY");
    const bool server = opening.file.isEmpty();
    open_ = server ? database.open(settings.value("DBUser"), settings.password()) : database.open();
}

CatalogueConnection::~CatalogueConnection() {
    if (!QSqlDatabase::contains(name_)) return;
    QSqlDatabase::database(name_, false).close();
    QSqlDatabase::removeDatabase(name_);
}

std::vector<QStringList> CatalogueConnection::rows(const QString& statement) const {
    std::vector<QStringList> out;
    if (!open_) return out;
    QSqlQuery query(QSqlDatabase::database(name_, false));
    query.setForwardOnly(true);
    if (!query.exec(statement)) return out;
    const int columns = query.record().count();
    while (query.next()) {
        QStringList row;
        for (int i = 0; i < columns; ++i)
            row << textOf(query.value(i));
        out.push_back(row);
    }
    return out;
}

}  // namespace zvproduct
