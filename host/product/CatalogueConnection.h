#pragma once
// A short read of the product catalogue from host code, opened from the product settings the
// way the module opens it: `Database` picks the engine (SQLITE: the file NetworkZV + DBName;
// MDB: that file through the MDB tools ODBC driver; SQLSERVER: FreeTDS to DBServer, DBName
// with DBUser and DBPass; ODBC: DBName as a data source or connection text). A catalogue that
// is not there, an engine this system lacks or a failed opening open nothing and say nothing:
// the module reports those when it opens the catalogue itself.
#include <QString>
#include <QStringList>

#include <vector>

namespace zvproduct {

class ProductSettings;

class CatalogueConnection {
public:
    explicit CatalogueConnection(const ProductSettings& settings);
    ~CatalogueConnection();
    CatalogueConnection(const CatalogueConnection&) = delete;
    CatalogueConnection& operator=(const CatalogueConnection&) = delete;

    bool isOpen() const { return open_; }
    // The rows of a statement, values as text in column order, padding trimmed; no rows when
    // the statement fails.
    std::vector<QStringList> rows(const QString& statement) const;

private:
    QString name_;
    bool open_ = false;
};

}  // namespace zvproduct
