#pragma once
// A selection of project parts: each a database, kept open for the run, with an optional
// page list (none means all pages, an empty one no page).
#include <QStringList>

#include <memory>
#include <optional>
#include <vector>

namespace zvdb {
class Database;
}

struct CEParteSelecao {
    // The database read; `mantida` keeps one that is not the active drawing open.
    zvdb::Database* database = nullptr;
    std::shared_ptr<zvdb::Database> mantida;
    std::optional<QStringList> paginas;
};

using CESelecao = std::vector<CEParteSelecao>;
