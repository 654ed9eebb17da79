// The CAD functions of the host LISP against what a CAD user would see for the same drawing.
#include "QtPrinters.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/DocumentLisp.h"
#include "app/HostDocument.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "drawing/TagValues.h"
#include "lisp/Printer.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>

namespace {

class CadLispTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(pasta_.isValid());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, out_, false);
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        documento_ = app_->openDocument(pasta_.filePath("projeto.dxf"));
        zvdb::Database& db = *documento_->database();
        db.createLayer("ESQ$0001$A");
        db.createLayer("ESQ$0002$A")->setFrozen(true);
        zvdb::BlockRecord* borne = db.createBlock("BORNE_A");
        borne->addCircle({0, 0, 0}, 1);
        borne->addAttributeDefinition("REGUA", "Strip", "", {0, -2, 0}, 1);
        ref_ = db.modelSpace()->addBlockReference(*borne, {10, 20, 0}, {1, 1, 1}, 0, "ESQ$0001$A");
        ref_->addAttributeFromDefinition(*borne->attributeDefinitions().front())
            ->setTextValue("X1");
        const zvdb::Tag chave{1000, db.store("7001\f1")};
        ref_->setXData("KVR_ZV", std::span<const zvdb::Tag>(&chave, 1));
        db.modelSpace()->addLine({100, 100, 0}, {110, 100, 0}, "ESQ$0002$A");
        db.modelSpace()->addLine({0, 0, 0}, {5, 5, 0}, "ESQ$0001$A");
        handle_ = QString::fromStdString(zvdb::TagValues::fromHandle(ref_->handle()));
    }
    // The printed value of a LISP expression.
    QString lisp(const QString& expressao) {
        auto* documentLisp = static_cast<zvhost::DocumentLisp*>(documento_->lisp());
        zvlisp::Value valor;
        EXPECT_TRUE(documentLisp->interpreter().evaluate(expressao, &valor))
            << expressao.toStdString() << ": " << saida_.toStdString();
        return zvlisp::Printer::prin1(valor);
    }

    QTemporaryDir pasta_;
    QString saida_;
    QTextStream out_{&saida_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::HostDocument* documento_ = nullptr;
    zvdb::BlockReference* ref_ = nullptr;
    QString handle_;
};

TEST_F(CadLispTest, EntgetShowsGroupsPointsAndRequestedExtendedData) {
    lisp("(setq e (handent \"" + handle_ + "\") d (entget e))");
    EXPECT_EQ(lisp("(cdr (assoc 0 d))"), "\"INSERT\"");
    EXPECT_EQ(lisp("(cdr (assoc 8 d))"), "\"ESQ$0001$A\"");
    EXPECT_EQ(lisp("(cdr (assoc 2 d))"), "\"BORNE_A\"");
    EXPECT_EQ(lisp("(cdr (assoc 10 d))"), "(10.0 20.0 0.0)");
    EXPECT_EQ(lisp("(eq (type (cdr (assoc 330 d))) 'ENAME)"), "T");
    EXPECT_EQ(lisp("(assoc -3 d)"), "nil");
    EXPECT_EQ(lisp("(cadr (assoc -3 (entget e '(\"KVR*\"))))"),
              "(\"KVR_ZV\" (1000 . \"7001\\0141\"))");
    // The attribute follows its reference.
    EXPECT_EQ(lisp("(cdr (assoc 1 (entget (entnext e))))"), "\"X1\"");
    EXPECT_EQ(lisp("(cdr (assoc 0 (entget (entnext (entnext e)))))"), "\"SEQEND\"");
}

TEST_F(CadLispTest, EntmodWritesTheDrawing) {
    lisp("(setq e (handent \"" + handle_ + "\") d (entget e))");
    lisp("(entmod (subst (cons 8 \"ESQ$0002$A\") (assoc 8 d) d))");
    EXPECT_EQ(ref_->layer(), "ESQ$0002$A");
    lisp(
        "(entmod (list (cons -1 e) (list 10 1.5 2.5 0.0) (list -3 (list \"ZV_TESTE\" (cons 1000 "
        "\"a\")))))");
    EXPECT_EQ(ref_->position().x, 1.5);
    EXPECT_EQ(ref_->xdata("ZV_TESTE").size(), 1u);
    EXPECT_EQ(lisp("(entdel e)"), lisp("e"));
    EXPECT_TRUE(ref_->isErased());
    EXPECT_EQ(lisp("(entget e)"), "nil");
}

TEST_F(CadLispTest, EntmodSetsEachVertexOfAPolylineInItsOwnPlace) {
    zvdb::Polyline* fio = documento_->database()->modelSpace()->addLwPolyline(
        {{0, 0, 0}, {10, 0, 0}, {10, 5, 0}}, false, "ESQ$0001$A");
    lisp("(setq e (handent \"" +
         QString::fromStdString(zvdb::TagValues::fromHandle(fio->handle())) + "\"))");
    // The whole entget list back, with its second vertex moved.
    lisp(
        "(setq d (entget e) n 0 d (mapcar '(lambda (g) (if (= (car g) 10) (progn (setq n (1+ n))"
        " (if (= n 2) (list 10 20.0 1.0) g)) g)) d))");
    lisp("(entmod d)");
    EXPECT_EQ(lisp("(vl-remove-if-not '(lambda (g) (= (car g) 10)) (entget e))"),
              "((10 0.0 0.0 0.0) (10 20.0 1.0 0.0) (10 10.0 5.0 0.0))");
    // entget shows a z, but a 2-D vertex stays 2-D in the drawing.
    EXPECT_EQ(fio->indexOf(30), -1);
}

TEST_F(CadLispTest, TablesAndVariables) {
    EXPECT_EQ(lisp("(cdr (assoc 70 (tblsearch \"LAYER\" \"esq$0002$a\")))"), "1");
    EXPECT_EQ(lisp("(tblsearch \"LAYER\" \"NAO\")"), "nil");
    EXPECT_EQ(lisp("(progn (setq n 0) (tblnext \"LAYER\" T) (setq n 1)"
                   " (while (tblnext \"LAYER\") (setq n (1+ n))) n)"),
              "3");
    EXPECT_EQ(lisp("(cdr (assoc 0 (entget (tblobjname \"BLOCK\" \"BORNE_A\"))))"),
              "\"BLOCK_RECORD\"");
    EXPECT_EQ(lisp("(getvar \"DWGNAME\")"), "\"projeto.dxf\"");
    EXPECT_EQ(lisp("(setvar \"CLAYER\" \"ESQ$0001$A\")"), "\"ESQ$0001$A\"");
    EXPECT_EQ(lisp("(getvar \"clayer\")"), "\"ESQ$0001$A\"");
    EXPECT_EQ(lisp("(regapp \"ZV_NOVA\")"), "\"ZV_NOVA\"");
    EXPECT_EQ(lisp("(regapp \"ZV_NOVA\")"), "nil");
    EXPECT_EQ(lisp("(vl-catch-all-error-p (vl-catch-all-apply 'setvar '(\"CLAYER\" \"NAO\")))"),
              "T");
}

TEST_F(CadLispTest, SelectionSetsByFilterAndByWindow) {
    EXPECT_EQ(lisp("(sslength (ssget \"X\" '((0 . \"LINE\"))))"), "2");
    EXPECT_EQ(lisp("(sslength (ssget \"X\" '((0 . \"INSERT\") (2 . \"BORNE*\"))))"), "1");
    EXPECT_EQ(lisp("(sslength (ssget \"X\" '((-3 (\"KVR_ZV\")))))"), "1");
    EXPECT_EQ(lisp("(ssget \"X\" '((8 . \"NADA\")))"), "nil");
    // Windows see only what shows: the line on the frozen page stays out.
    EXPECT_EQ(lisp("(sslength (ssget \"C\" '(-50 -50) '(500 500)))"), "2");
    EXPECT_EQ(lisp("(sslength (ssget \"W\" '(-1 -1) '(6 6)))"), "1");
    EXPECT_EQ(lisp("(type (ssadd))"), "PICKSET");
    EXPECT_EQ(lisp("(progn (setq s (ssadd)) (ssadd (handent \"" + handle_ +
                   "\") s) (ssadd (handent \"" + handle_ + "\") s) (sslength s))"),
              "1");
    EXPECT_EQ(lisp("(equal (ssname s 0) (handent \"" + handle_ + "\"))"), "T");
    EXPECT_EQ(lisp("(ssname s 5)"), "nil");
}

TEST_F(CadLispTest, DictionariesAndCommands) {
    documento_->database()->namedObjects()->getOrCreateDictionary("ZV_CABOS");
    EXPECT_EQ(lisp("(cdr (assoc 0 (dictsearch (namedobjdict) \"ZV_CABOS\")))"), "\"DICTIONARY\"");
    EXPECT_EQ(lisp("(dictsearch (namedobjdict) \"NAO\")"), "nil");
    lisp("(command \"_.zoom\" \"_W\" \"0,0\" \"2,3\")");
    EXPECT_EQ(documento_->view().maxY, 3.0);
    EXPECT_EQ(lisp("(vl-cmdf \"_.zoom\" \"_E\")"), "T");
    // A print that can't be made fails and says why, as an unknown command would not.
    auto* documentLisp = static_cast<zvhost::DocumentLisp*>(documento_->lisp());
    zvlisp::Value valor;
    EXPECT_FALSE(documentLisp->interpreter().evaluate("(command \"_-PRINT\" \"pagina\")", &valor));
    EXPECT_TRUE(saida_.contains("-PRINT: only the detailed configuration is answered by this host"))
        << saida_.toStdString();
    EXPECT_TRUE(saida_.contains("Command failed: _-PRINT")) << saida_.toStdString();
    // An unknown command says so and answers nil: the program goes on.
    EXPECT_EQ(lisp("(list (command \"_.NAOEXISTE\" 1) 2)"), "(nil 2)");
    EXPECT_TRUE(saida_.contains("Unknown command \"_.NAOEXISTE\".")) << saida_.toStdString();
    // The reference at (10, 20) with its attribute shows; the line of the frozen page not.
    EXPECT_GE(documento_->view().maxX, 11.0);
    EXPECT_LT(documento_->view().maxX, 100.0);
}

}  // namespace
