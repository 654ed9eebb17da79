// Positions on the sheet grid: the grid of a page model alone, and BuscarCoordenadas on the
// demo catalogue, on a catalogue made here, and with no catalogue.
#include "ProductFixture.h"
#include "ZvhostRun.h"
#include "drawing/LayerRecord.h"

#include "product/ProductSettings.h"
#include "product/SheetGrid.h"
#include "product/SheetGridIndex.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>
#include <QtSql/QSqlDatabase>
#include <QtSql/QSqlQuery>

namespace zvproduct::testing {
namespace {

std::string at(const SheetGrid& grid, double x, double y) {
    return grid.position(x, y).toStdString();
}

TEST(SheetGrid, ModelCellsRunRightFromTheLeftEdgeAndDownFromTheTopEdge) {
    // the demo's diagram model: ten columns of 42, six rows of 46 below y = 297
    const auto grid = SheetGrid::fromModel("0;1;2;3;4;5;6;7;8;9", "42", "A;B;C;D;E;F", "46");
    ASSERT_TRUE(grid);
    EXPECT_EQ(at(*grid, 10, 290), "A0");
    EXPECT_EQ(at(*grid, 100, 200), "C2");
    EXPECT_EQ(at(*grid, 250, 150), "D5");
    EXPECT_EQ(at(*grid, 126, 251), "B3") << "a cell's near edges belong to it";
    EXPECT_EQ(at(*grid, 0, 297), "A0");
    EXPECT_EQ(at(*grid, 420, 21), "F9") << "the far edges belong to the last cells";
    EXPECT_EQ(at(*grid, 10, 20), "??") << "below the last row";
    EXPECT_EQ(at(*grid, -0.1, 100), "??");
    EXPECT_EQ(at(*grid, 420.1, 100), "??");
    EXPECT_EQ(at(*grid, 100, 297.1), "??");
}

TEST(SheetGrid, IntervalsPerCellDecimalCommaOneAxisAndBadModels) {
    const auto columns = SheetGrid::fromModel(" A ; B ;C", "10;20", "", "");
    ASSERT_TRUE(columns);
    EXPECT_EQ(at(*columns, 5, -500), "A") << "no rows: any height";
    EXPECT_EQ(at(*columns, 15, 900), "B");
    EXPECT_EQ(at(*columns, 35, 0), "C") << "the last interval repeats";
    EXPECT_EQ(at(*columns, 50, 0), "C");
    EXPECT_EQ(at(*columns, 50.5, 0), "??");
    const auto comma = SheetGrid::fromModel("", "", "1;2", "12,5");
    ASSERT_TRUE(comma);
    EXPECT_EQ(at(*comma, 1000, 297 - 12.4), "1");
    EXPECT_EQ(at(*comma, 1000, 297 - 12.6), "2");
    EXPECT_FALSE(SheetGrid::fromModel("", "", "", ""));
    EXPECT_FALSE(SheetGrid::fromModel("1;2", "", "A", "10")) << "labels without an interval";
    EXPECT_FALSE(SheetGrid::fromModel("1;2", "0", "", ""));
    EXPECT_FALSE(SheetGrid::fromModel("1;2", "10;wide", "", ""));
}

TEST(SheetGrid, FixedGridCoversTheA3SheetInTwelveColumnsAndEightRows) {
    const SheetGrid grid = SheetGrid::fixed();
    EXPECT_EQ(at(grid, 10, 290), "A1");
    EXPECT_EQ(at(grid, 419, 1), "H12");
    EXPECT_EQ(at(grid, 420, 0), "H12");
    EXPECT_EQ(at(grid, 35, 297 - 37.125), "B2");
    EXPECT_EQ(at(grid, 500, 10), "??");
}

// A document whose product settings live in a folder of its own.
class SheetGridCatalogueTest : public ProductFixture {
protected:
    void SetUp() override {
        saved = qgetenv("ZV_DATA_DIR");
        qputenv("ZV_DATA_DIR", data.path().toUtf8());
    }
    void TearDown() override {
        if (saved.isEmpty())
            qunsetenv("ZV_DATA_DIR");
        else
            qputenv("ZV_DATA_DIR", saved);
    }

    void writeSettings(const QString& dbName, const QString& language) {
        ASSERT_TRUE(QDir(data.path()).mkpath("FV"));
        QFile file(data.path() + "/FV/FVREG2022SP0.xml");
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(QString("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<registros>\n"
                           "  <registro key=\"Database\" value=\"SQLITE\"/>\n"
                           "  <registro key=\"NetworkZV\" value=\"%1/\"/>\n"
                           "  <registro key=\"DBName\" value=\"%2\"/>\n"
                           "  <registro key=\"libLang\" value=\"%3\"/>\n</registros>\n")
                       .arg(data.path(), dbName, language)
                       .toUtf8());
    }

    void makeCatalogue(const QString& dbName, const QStringList& statements) {
        {
            QSqlDatabase db = QSqlDatabase::addDatabase("QSQLITE", "sheet-grid-test");
            db.setDatabaseName(data.path() + "/" + dbName);
            ASSERT_TRUE(db.open());
            QSqlQuery query(db);
            for (const QString& statement : statements)
                ASSERT_TRUE(query.exec(statement)) << statement.toStdString();
        }
        QSqlDatabase::removeDatabase("sheet-grid-test");
    }

    // "own.db" with the page and group tables, and these statements' rows in them.
    void makeGridCatalogue(const QStringList& rows) {
        makeCatalogue("own.db",
                      QStringList{"create table BDPAGE (ERASED SMALLINT, PAGE_KEY INTEGER, "
                                  "COL_LABEL varchar(200), COL_INT varchar(200), ROW_LABEL "
                                  "varchar(200), ROW_INT varchar(200))",
                                  "create table BDGROUP (ERASED SMALLINT, GROUP_KEY INTEGER, "
                                  "LANG INTEGER, PAGE INTEGER)"} +
                          rows);
    }

    // Two grids in language 1: group key 7 has columns A;B and rows X;Y, key 8 columns 1;2;3
    // and row R.
    void makeTwoGrids() {
        makeGridCatalogue(
            {"insert into BDPAGE values (0, 1, 'A;B', '210', 'X;Y', '100'), "
             "(0, 2, '1;2;3', '10;20', 'R', '297')",
             "insert into BDGROUP values (0, 7, 1, 1), (0, 8, 1, 2)"});
        writeSettings("own.db", "1");
    }

    std::string position(const char* group, double x, double y) {
        return show(QString("(BuscarCoordenadas nil \"%1\" \"0001\" %2 %3)")
                        .arg(group)
                        .arg(x, 0, 'f', 3)
                        .arg(y, 0, 'f', 3));
    }

    QTemporaryDir data;
    QByteArray saved;
};

TEST_F(SheetGridCatalogueTest, DemoCatalogueGivesEachGroupItsPageModelGrid) {
    const QString sql = QString(ZV_SOURCE_DIR) + "/data/catalogue/";
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert("ZV_DATA_DIR", data.path());
    ASSERT_EQ(zvtest::runZvhost({"catalogue", "--build", data.path() + "/catalogo.db",
                                 sql + "catalogo-esquema.sql", sql + "catalogo-dados.sql"},
                                environment)
                  .status,
              0);
    ASSERT_EQ(zvtest::runZvhost(
                  {"catalogue", "--set", "Database=SQLITE", "NetworkZV=" + data.path() + "/",
                   "DBName=catalogo.db", "libLang=1", "DBPass=s3cr;t"},
                  environment)
                  .status,
              0);
    EXPECT_EQ(ProductSettings().password(), "s3cr;t") << "the settings as the module writes them";
    addGroup("COMANDO", 4, {"COMANDO$0001$A"});
    addGroup("LISTAS", 6, {"LISTAS$0001$A"});
    addGroup("ESQ", 0, {"ESQ$0001$A"});

    // control diagrams use the A3 diagram model: columns 0-9 of 42, rows A-F of 46
    EXPECT_EQ(position("COMANDO", 10, 290), "\"A0\"");
    EXPECT_EQ(position("COMANDO", 100, 200), "\"C2\"");
    EXPECT_EQ(position("COMANDO", 250, 150), "\"D5\"");
    EXPECT_EQ(position("COMANDO", 419, 22), "\"F9\"");
    EXPECT_EQ(position("comando", 10, 290), "\"A0\"") << "group names ignore case";
    EXPECT_EQ(position("COMANDO", 10, 10), "\"??\"") << "below the model's rows";
    EXPECT_EQ(position("COMANDO", 430, 100), "\"??\"");
    EXPECT_EQ(show("(BuscarCoordenadas nil \"COMANDO\" \"0001\" \"x\" 1.0)"), "\"??\"");
    // the list model has no grid; key 0 and unknown groups reach no model: the fixed grid
    EXPECT_EQ(position("LISTAS", 10, 10), "\"H1\"");
    EXPECT_EQ(position("ESQ", 419, 290), "\"A12\"");
    EXPECT_EQ(position("NOPE", 100, 200), "\"C3\"");
    // a group given another key since is read again
    addGroup("LISTAS", 4, {"LISTAS$0001$A"});
    EXPECT_EQ(position("LISTAS", 10, 10), "\"??\"");
    EXPECT_EQ(position("LISTAS", 100, 200), "\"C2\"");
}

TEST_F(SheetGridCatalogueTest, LanguageRowsErasedRowsAndOneCatalogueReadPerDocument) {
    makeGridCatalogue(
        {"insert into BDPAGE values (0, 1, 'A;B', '210', 'X;Y', '100'), "
         "(0, 2, '1;2;3', '10;20', 'R', '297'), (1, 3, 'Z', '420', 'Z', '297')",
         "insert into BDGROUP values (0, 7, 1, 1), (0, 7, 2, 2), (1, 8, 2, 1), "
         "(0, 8, 3, 3), (0, 9, 3, 1), (0, 9, 1, 2)"});
    writeSettings("own.db", "2");
    addGroup("G7", 7, {"G7$0001$A"});
    addGroup("G8", 8, {"G8$0001$A"});
    addGroup("G9", 9, {"G9$0001$A"});
    // key 7 in language 2: model 2, columns of 10, 20 and 20, one row over the sheet
    EXPECT_EQ(position("G7", 5, 100), "\"R1\"");
    EXPECT_EQ(position("G7", 25, 100), "\"R2\"");
    EXPECT_EQ(position("G7", 45, 1), "\"R3\"");
    EXPECT_EQ(position("G7", 55, 100), "\"??\"");
    // key 8: its language-2 row is erased, its other row names an erased model
    EXPECT_EQ(position("G8", 10, 290), "\"A1\"");
    // key 9 has no language-2 row: the lowest language, 1, gives model 2
    EXPECT_EQ(position("G9", 25, 100), "\"R2\"");

    // the document keeps what it read; a new document reads the settings again
    writeSettings("own.db", "1");
    EXPECT_EQ(position("G7", 5, 100), "\"R1\"");
    zvlisp::Interpreter second;
    ProductContext context;
    context.database = [this] { return database.get(); };
    installProductFunctions(second, context);
    auto ask = [&second](const char* text) {
        return zvlisp::Printer::prin1(second.evalText(text)).toStdString();
    };
    EXPECT_EQ(ask("(BuscarCoordenadas nil \"G7\" \"0001\" 5.0 250.0)"), "\"XA\"");
    EXPECT_EQ(ask("(BuscarCoordenadas nil \"G7\" \"0001\" 300.0 150.0)"), "\"YB\"");
    EXPECT_EQ(ask("(BuscarCoordenadas nil \"G7\" \"0001\" 5.0 50.0)"), "\"??\"");

    // settings that name a missing catalogue: the fixed grid
    writeSettings("missing.db", "1");
    zvlisp::Interpreter third;
    installProductFunctions(third, context);
    EXPECT_EQ(zvlisp::Printer::prin1(third.evalText("(BuscarCoordenadas nil \"G7\" \"0001\" "
                                                    "5.0 250.0)"))
                  .toStdString(),
              "\"B1\"");
}

TEST_F(SheetGridCatalogueTest, OneTextAskedAgainFollowsTheRegistryAndOtherGroups) {
    makeTwoGrids();
    addGroup("G7", 7, {"G7$0001$A"});
    addGroup("G8", 8, {"G8$0001$A"});
    SheetGridIndex index;
    // The same text each time, as a list passes its layer's group for every symbol.
    const QString g7 = QString::fromUtf8("G7");
    const QString g8 = QString::fromUtf8("G8");
    EXPECT_EQ(index.position(database.get(), g7, 5, 250), "XA");
    EXPECT_EQ(index.position(database.get(), g7, 300, 150), "YB");
    EXPECT_EQ(index.position(database.get(), g8, 25, 100), "R2");
    EXPECT_EQ(index.position(database.get(), g7, 5, 250), "XA");
    // Another text of the same name, and a literal, answer alike.
    EXPECT_EQ(index.position(database.get(), QStringLiteral("G7"), 300, 150), "YB");
    EXPECT_EQ(index.position(database.get(), QStringLiteral("G8"), 5, 100), "R1");
    EXPECT_EQ(index.position(database.get(), g8, 45, 1), "R3");
    // The group now has the other key: the held text gives the other grid.
    addGroup("G7", 8, {"G7$0001$A"});
    EXPECT_EQ(index.position(database.get(), g7, 25, 100), "R2");
    addGroup("G7", 99, {"G7$0001$A"});
    EXPECT_EQ(index.position(database.get(), g7, 35, 297 - 37.125), "B2") << "the fixed grid";
}

// A list that swaps pages freezes and thaws layers between its questions: the grid of a
// group stays, and a change of the registry after such edits is still seen.
TEST_F(SheetGridCatalogueTest, LayerEditsKeepTheGroupsGridAndLaterRegistryChangesAreSeen) {
    makeTwoGrids();
    addGroup("G7", 7, {"G7$0001$A", "G7$0002$A"});
    SheetGridIndex index;
    const QString g7 = QString::fromUtf8("G7");
    EXPECT_EQ(index.position(database.get(), g7, 5, 250), "XA");
    database->layer("G7$0001$A")->setFrozen(true);
    database->layer("G7$0002$A")->setFrozen(false);
    EXPECT_EQ(index.position(database.get(), g7, 300, 150), "YB");
    EXPECT_EQ(index.position(database.get(), QStringLiteral("G7"), 5, 250), "XA");
    // The registry gives the group another key after the layer edits, then a layer is made.
    addGroup("G7", 8, {"G7$0001$A", "G7$0002$A"});
    EXPECT_EQ(index.position(database.get(), g7, 25, 100), "R2");
    database->layer("G7$0002$A")->setFrozen(true);
    addGroup("G7", 7, {"G7$0001$A", "G7$0002$A", "G7$0003$A"});
    EXPECT_EQ(index.position(database.get(), g7, 300, 150), "YB");
}

}  // namespace
}  // namespace zvproduct::testing
