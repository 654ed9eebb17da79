#pragma once
// The project check run before lists and exports: terminal numbers given twice on one
// strip, wires that end at a single symbol or at none, wires whose numbering is
// incomplete. Each finding is one line of text.
#include <QStringList>

namespace zvdb {
class Database;
}

namespace zvproduct {

class ProjectCheck {
public:
    static QStringList run(zvdb::Database& database, double tolerance);

private:
    static void duplicateTerminals(zvdb::Database& database, QStringList& findings);
    static void openWires(zvdb::Database& database, double tolerance, QStringList& findings);
};

}  // namespace zvproduct
