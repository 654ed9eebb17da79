// A whole terminal list as one step of undo, through zvhost's UNDO and REDO commands.
#include "ProductFolder.h"
#include "QtPrinters.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/UndoJournal.h"
#include "plot/PageIndex.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QRegularExpression>

namespace {

QByteArray bytes(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

// Empty when equal, else the first line that differs, for a readable failure. The list's
// header carries the time of its run, which two runs do not share.
std::string diferenca(const QByteArray& a, const QByteArray& b) {
    const QList<QByteArray> la = a.split('\n'), lb = b.split('\n');
    const QRegularExpression hora("^\\d\\d:\\d\\d:\\d\\d$");
    for (int i = 0; i < std::max(la.size(), lb.size()); ++i)
        if (la.value(i) != lb.value(i) &&
            !(hora.match(la.value(i)).hasMatch() && hora.match(lb.value(i)).hasMatch()))
            return "line " + std::to_string(i + 1) + ": '" + la.value(i).toStdString() +
                   "' against '" + lb.value(i).toStdString() + "'";
    return {};
}

class UndoCommandTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new zvtest::ProductFolder;
        const QString problema = pasta_->prepare({"--seed", "5", "--terminals", "40"});
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    }
    static void TearDownTestSuite() { delete pasta_; }

    // The project saved after the given commands, run with the undo journal on.
    static QByteArray depois(const QString& saida, const QStringList& comandos,
                             QString* erros = nullptr) {
        QStringList args = {"--quiet",          "--undo",
                            "--load",           pasta_->path("produto/config/zvconfig.lsp"),
                            pasta_->project(),  "-o",
                            pasta_->path(saida)};
        const zvtest::HostRun run = pasta_->zvhost(args << comandos);
        if (erros) *erros = run.err + run.out;
        EXPECT_EQ(run.status, 0) << run.err.toStdString();
        return bytes(pasta_->path(saida));
    }

    static zvtest::ProductFolder* pasta_;
};

zvtest::ProductFolder* UndoCommandTest::pasta_ = nullptr;

TEST_F(UndoCommandTest, UndoTakesTheWholeListBackOutAndRedoPutsItBack) {
    const QByteArray intacto = depois("intacto.dxf", {});
    const QByteArray lista = depois("lista.dxf", {"gerarListaBornesGrf"});
    ASSERT_FALSE(intacto.isEmpty());
    ASSERT_NE(lista, intacto);
    ASSERT_TRUE(lista.contains("LISTAS$0001$A"));

    // Pages, rows, group registry and layer states all go.
    EXPECT_EQ(diferenca(depois("desfeito.dxf", {"gerarListaBornesGrf", "UNDO"}), intacto), "");
    EXPECT_EQ(diferenca(depois("refeito.dxf", {"gerarListaBornesGrf", "UNDO", "REDO"}), lista), "");
    // Two lists, two steps: the wire list replaced the terminal list's pages, and taking it
    // back brings them back.
    EXPECT_EQ(diferenca(depois("dois.dxf", {"--answer", "question:89=yes", "gerarListaBornesGrf",
                                            "gerarListaFiosGrf", "UNDO"}),
                        lista),
              "");
}

TEST_F(UndoCommandTest, NothingToUndoOrUndoOffIsAFailedCommandAndNothingIsSaved) {
    QStringList args = {"--quiet", pasta_->project(), "-o", pasta_->path("x.dxf"), "UNDO"};
    zvtest::HostRun run = pasta_->zvhost(args);
    EXPECT_EQ(run.status, 3);
    EXPECT_TRUE(run.out.contains("Undo is off")) << run.out.toStdString();
    EXPECT_FALSE(QFile::exists(pasta_->path("x.dxf")));

    run = pasta_->zvhost(
        {"--quiet", "--undo", pasta_->project(), "-o", pasta_->path("y.dxf"), "REDO"});
    EXPECT_EQ(run.status, 3);
    EXPECT_TRUE(run.out.contains("Nothing to redo.")) << run.out.toStdString();
    EXPECT_FALSE(QFile::exists(pasta_->path("y.dxf")));
}

TEST_F(UndoCommandTest, TheGroupOptionsOfStartUpFilesAreAcceptedAndBracketAStep) {
    // A routine's own group is one step; the options that set nothing pass quietly.
    const QString rotina =
        "(progn (command \"_.UNDO\" \"_BE\")"
        " (entmake '((0 . \"LINE\") (8 . \"X\") (10 0.0 0.0 0.0) (11 1.0 1.0 0.0)))"
        " (entmake '((0 . \"LINE\") (8 . \"X\") (10 0.0 0.0 0.0) (11 2.0 1.0 0.0)))"
        " (command \"_.UNDO\" \"_E\") (command \"_.UNDO\" \"_M\")";
    const QByteArray feito = depois("feito.dxf", {"--eval", rotina + ")"});
    ASSERT_EQ(feito.count("\nLINE\n") - depois("sem.dxf", {}).count("\nLINE\n"), 2);
    EXPECT_EQ(diferenca(depois("g.dxf", {"--eval", rotina + " (command \"_.UNDO\" \"1\"))"}),
                        depois("sem.dxf", {})),
              "")
        << "both lines went in one step";
}

TEST(UndoAndIndexes, AnIndexOfTheDrawingMadeBeforeAStepIsStaleAfterUndo) {
    zvdb::Database db;
    db.modelSpace()->addLine({0, 0, 0}, {1, 1, 0}, "P$0001$A");
    zvdb::UndoJournal journal;
    journal.beginGroup(db);
    db.modelSpace()->addLine({0, 0, 0}, {2, 2, 0}, "P$0001$A");
    journal.endGroup(db);
    ASSERT_TRUE(journal.undo(db));
    // Same database object, same handle seed as when this index is made: only the content
    // differs from what the next undo or redo brings.
    const zvplot::PageIndex index(db);
    EXPECT_TRUE(index.matches(db));
    ASSERT_EQ(index.visibleEntities().size(), 1u);
    ASSERT_TRUE(journal.redo(db));
    ASSERT_TRUE(journal.undo(db));
    EXPECT_FALSE(index.matches(db)) << "its entities were the drawing's before the swap";
}

}  // namespace
