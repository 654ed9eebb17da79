#pragma once
// What the product's LISP functions reach of their document: its drawing, its user
// interface, its command line and its file name. Every getter may answer null or empty.
#include <QString>

#include <functional>
#include <memory>

namespace zvdb {
class Database;
}
namespace zvsdk {
class UserInterface;
}

namespace zvproduct {

class ConnectionAnswers;
class SheetGridIndex;

struct ProductContext {
    std::function<zvdb::Database*()> database;
    std::function<zvsdk::UserInterface*()> userInterface;
    std::function<void(const QString&)> print;
    std::function<QString()> fileName;
    // The connection answers of the document, for a host that also hands them out without
    // LISP in between; installConnectionFunctions makes its own when null.
    std::shared_ptr<ConnectionAnswers> connections;
    // The sheet grids behind BuscarCoordenadas, likewise; installServiceFunctions makes its
    // own when null.
    std::shared_ptr<SheetGridIndex> sheetGrids;
};

}  // namespace zvproduct
