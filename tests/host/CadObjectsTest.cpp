// Objects made from lists (entmake, entmakex: entities, layers, dictionaries, Xrecords),
// the dictionary edits, extended-data room, selection sets, coordinate systems, text boxes
// and the commands a start-up file sends.
#include "LispHostFixture.h"
#include "QtPrinters.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"

namespace {

class CadObjectsTest : public LispHostFixture {};

TEST_F(CadObjectsTest, EntmakeMakesEntitiesAsListed) {
    EXPECT_EQ(ev("(entmake '((0 . \"LINE\") (8 . \"NOVA\") (10 1.0 2.0 0.0) (11 4 6)))"),
              "((0 . \"LINE\") (8 . \"NOVA\") (10 1.0 2.0 0.0) (11 4 6))");
    EXPECT_EQ(ev("(cdr (assoc 0 (entget (entlast))))"), "\"LINE\"");
    EXPECT_EQ(ev("(cdr (assoc 11 (entget (entlast))))"), "(4.0 6.0 0.0)");
    EXPECT_EQ(ev("(cdr (assoc 8 (entget (entlast))))"), "\"NOVA\"");
    // The layer it names is made.
    EXPECT_NE(document->database()->layer("NOVA"), nullptr);
    EXPECT_EQ(ev("(cdr (assoc 62 (entget (entmakex '((0 . \"CIRCLE\") (62 . 1) (10 4.0 3.0 0.0) "
                 "(40 . 1.0))))))"),
              "1");
    EXPECT_EQ(ev("(type (entmakex '((0 . \"CIRCLE\") (10 0 0) (40 . 2.0))))"), "ENAME");
    ev("(entmake '((0 . \"TEXT\") (10 0 0) (40 . 2.5) (1 . \"X1\") (72 . 1) (11 5 5) "
       "(73 . 2)))");
    EXPECT_EQ(ev("(cdr (assoc 1 (entget (entlast))))"), "\"X1\"");
    EXPECT_EQ(ev("(cdr (assoc 73 (entget (entlast))))"), "2");
    ev("(entmake '((0 . \"LWPOLYLINE\") (90 . 7) (10 0 0) (10 5 0) (10 5 5)))");
    EXPECT_EQ(ev("(cdr (assoc 90 (entget (entlast))))"), "3");
    EXPECT_EQ(ev("(length (vl-remove-if-not '(lambda (g) (= (car g) 10)) (entget (entlast))))"),
              "3");
    // The entity name and handle of a copied list are ignored: a new entity is made.
    ev("(setq old (entget (entlast)))");
    EXPECT_EQ(ev("(equal (cdr (assoc -1 (entget (entmakex old)))) (cdr (assoc -1 old)))"), "nil");
    // Written and read back, each entity keeps what it was given.
    auto reread = zvdb::DxfLoader::load(zvdb::DxfWriter::toText(*document->database()));
    ASSERT_NE(reread, nullptr);
    QStringList made;
    for (const zvdb::Entity* e : reread->modelSpace()->entities())
        made << QString::fromStdString(std::string(e->type())) + " " +
                    QString::fromStdString(std::string(e->layer())) + " " +
                    QString::number(e->point(10).x);
    EXPECT_EQ(made, QStringList({"LINE NOVA 1", "CIRCLE 0 4", "CIRCLE 0 0", "TEXT 0 0",
                                 "LWPOLYLINE 0 0", "LWPOLYLINE 0 0"}));
}

TEST_F(CadObjectsTest, EntmakeMakesArcsBlocksReferencesAndPaperSpaceEntities) {
    document->database()->createBlock("BORNE")->addCircle({0, 0, 0}, 1);
    ev("(setq r (entmakex '((0 . \"INSERT\") (2 . \"BORNE\") (10 5 5) (41 . 2.0) (50 . 0.5))))");
    EXPECT_EQ(ev("(cdr (assoc 2 (entget r)))"), "\"BORNE\"");
    EXPECT_EQ(ev("(cdr (assoc 41 (entget r)))"), "2.0");
    ev("(setq a (entmakex '((0 . \"ARC\") (10 0 0) (40 . 3.0) (50 . 0.0) (51 . 1.5))))");
    EXPECT_EQ(ev("(mapcar '(lambda (c) (cdr (assoc c (entget a)))) '(40 50 51))"), "(3.0 0.0 1.5)");
    EXPECT_EQ(ev("(cdr (assoc 1 (entget (entmakex '((0 . \"MTEXT\") (10 0 0) (40 . 2.0) (1 . "
                 "\"Nota\"))))))"),
              "\"Nota\"");
    ev("(setq p (entmakex '((0 . \"POINT\") (67 . 1) (10 1 1))))");
    EXPECT_EQ(ev("(cdr (assoc 67 (entget p)))"), "1");
    // Model space holds the others, in the order made.
    EXPECT_EQ(ev("(equal (entlast) p)"), "nil");
    const auto entities = document->database()->modelSpace()->entities();
    ASSERT_EQ(entities.size(), 3u);
    EXPECT_EQ(entities[0]->type(), "INSERT");
    EXPECT_EQ(entities[1]->type(), "ARC");
}

TEST_F(CadObjectsTest, EntmakeAnswersNilForAnInvalidList) {
    const int before = int(document->database()->modelSpace()->entities().size());
    EXPECT_EQ(ev("(entmake)"), "nil");
    EXPECT_EQ(ev("(entmake '((8 . \"0\") (10 0 0) (11 1 1)))"), "nil");         // no type
    EXPECT_EQ(ev("(entmake '((0 . \"NADA\") (10 0 0)))"), "nil");               // unknown
    EXPECT_EQ(ev("(entmake '((0 . \"LINE\") (10 0 0)))"), "nil");               // no end
    EXPECT_EQ(ev("(entmake '((0 . \"CIRCLE\") (10 0 0) (40 . 0.0)))"), "nil");  // radius
    EXPECT_EQ(ev("(entmake '((0 . \"CIRCLE\") (10 0 0) (40 . 1.0) (62 . 300)))"), "nil");
    EXPECT_EQ(ev("(entmake '((0 . \"LINE\") (6 . \"NAOHA\") (10 0 0) (11 1 1)))"), "nil");
    EXPECT_EQ(ev("(entmake '((0 . \"LINE\") (10 0) (11 1 1)))"), "nil");  // point
    EXPECT_EQ(ev("(entmake '((0 . \"INSERT\") (2 . \"SEMBLOCO\") (10 0 0)))"), "nil");
    EXPECT_EQ(ev("(entmake '(1 2 3))"), "nil");
    EXPECT_EQ(ev("(entmake '((0 . \"LINE\") (10 0 0) (11 1 1) (-3 (\"SEMREGISTRO\" (1000 . "
                 "\"x\")))))"),
              "nil");
    EXPECT_EQ(ev("(entmake \"LINE\")"), "ERROR: bad argument type: listp \"LINE\"");
    EXPECT_EQ(int(document->database()->modelSpace()->entities().size()), before);
}

TEST_F(CadObjectsTest, EntmakeMakesLayersOnce) {
    EXPECT_EQ(ev("(entmake '((0 . \"LAYER\") (100 . \"AcDbSymbolTableRecord\") (100 . "
                 "\"AcDbLayerTableRecord\") (2 . \"CABOS\") (70 . 0) (62 . 3) (6 . "
                 "\"Continuous\")))"),
              "((0 . \"LAYER\") (100 . \"AcDbSymbolTableRecord\") (100 . \"AcDbLayerTableRecord\") "
              "(2 . \"CABOS\") (70 . 0) (62 . 3) (6 . \"Continuous\"))");
    EXPECT_EQ(ev("(cdr (assoc 62 (tblsearch \"LAYER\" \"CABOS\")))"), "3");
    ASSERT_NE(document->database()->layer("CABOS"), nullptr);
    EXPECT_EQ(ev("(entmake '((0 . \"LAYER\") (2 . \"cabos\") (62 . 1)))"), "nil");  // exists
    EXPECT_EQ(ev("(entmake '((0 . \"LAYER\") (2 . \"A<B\")))"), "nil");
    EXPECT_EQ(ev("(entmake '((0 . \"LAYER\") (70 . 0)))"), "nil");
    EXPECT_EQ(ev("(entmake '((0 . \"LAYER\") (2 . \"L2\") (6 . \"TRACO\")))"), "nil");
    EXPECT_EQ(ev("(cdr (assoc 2 (entget (entmakex '((0 . \"LAYER\") (2 . \"FROZEN\") (70 . "
                 "1))))))"),
              "\"FROZEN\"");
    EXPECT_TRUE(document->database()->layer("FROZEN")->isFrozen());
}

TEST_F(CadObjectsTest, XrecordsAndDictionaries) {
    ev("(setq x (entmakex '((0 . \"XRECORD\") (100 . \"AcDbXrecord\") (1 . \"dados\") (70 . 4))))");
    EXPECT_EQ(ev("(type x)"), "ENAME");
    EXPECT_EQ(ev("(equal (dictadd (namedobjdict) \"ZV_TESTE\" x) x)"), "T");
    EXPECT_EQ(ev("(cdr (assoc 1 (dictsearch (namedobjdict) \"ZV_TESTE\")))"), "\"dados\"");
    EXPECT_EQ(ev("(cdr (assoc 70 (dictsearch (namedobjdict) \"zv_teste\")))"), "4");
    // A name is taken once.
    EXPECT_EQ(ev("(dictadd (namedobjdict) \"ZV_TESTE\" (entmakex '((0 . \"XRECORD\"))))"), "nil");
    EXPECT_EQ(ev("(dictrename (namedobjdict) \"ZV_TESTE\" \"ZV_NOVO\")"), "\"ZV_NOVO\"");
    EXPECT_EQ(ev("(dictsearch (namedobjdict) \"ZV_TESTE\")"), "nil");
    EXPECT_EQ(ev("(cdr (assoc 1 (dictsearch (namedobjdict) \"ZV_NOVO\")))"), "\"dados\"");
    EXPECT_EQ(ev("(dictrename (namedobjdict) \"NADA\" \"OUTRO\")"), "nil");
    EXPECT_EQ(ev("(equal (dictremove (namedobjdict) \"ZV_NOVO\") x)"), "T");
    EXPECT_EQ(ev("(dictremove (namedobjdict) \"ZV_NOVO\")"), "nil");
    // A dictionary of one's own with an Xrecord inside.
    ev("(setq d (entmakex '((0 . \"DICTIONARY\") (100 . \"AcDbDictionary\"))))");
    ev("(dictadd (namedobjdict) \"ZV_CONFIG\" d)");
    ev("(dictadd d \"COR\" (entmakex '((0 . \"XRECORD\") (1 . \"azul\"))))");
    EXPECT_EQ(ev("(cdr (assoc 1 (dictsearch (cdr (assoc -1 (dictsearch (namedobjdict) "
                 "\"ZV_CONFIG\"))) \"COR\")))"),
              "\"azul\"");
    EXPECT_EQ(ev("(dictadd x \"A\" d)"), "nil");  // an Xrecord is no dictionary
    EXPECT_EQ(ev("(dictadd (namedobjdict) \"B\" 5)"), "ERROR: bad argument type: lentityp 5");
    // They reach the file.
    auto reread = zvdb::DxfLoader::load(zvdb::DxfWriter::toText(*document->database()));
    ASSERT_NE(reread, nullptr);
    const std::string names[] = {"ZV_CONFIG", "COR"};
    EXPECT_NE(reread->xrecordAt(names, false), nullptr);
}

TEST_F(CadObjectsTest, ExtendedDataSizeAndRoom) {
    EXPECT_EQ(ev("(regapp \"ZVT\")"), "\"ZVT\"");
    // 6 for the application, 6 for the text, 4 for the integer.
    EXPECT_EQ(ev("(xdsize '((-3 (\"ZVT\" (1000 . \"abc\") (1070 . 1)))))"), "16");
    EXPECT_EQ(ev("(xdsize '(-3 (\"ZVT\" (1000 . \"abc\") (1070 . 1))))"), "16");
    EXPECT_EQ(ev("(xdsize '((\"ZVT\" (1002 . \"{\") (1040 . 1.0) (1002 . \"}\"))))"), "22");
    EXPECT_EQ(ev("(xdsize '((\"ZVT\" (1002 . \"{\"))))"), "nil");  // braces must balance
    EXPECT_EQ(ev("(xdsize '((\"NAOREG\" (1000 . \"x\"))))"), "nil");
    EXPECT_TRUE(commandLine.contains("Invalid application name in 1001 group"));
    ev("(setq e (entmakex '((0 . \"LINE\") (10 0 0) (11 1 1) (-3 (\"ZVT\" (1000 . \"abc\") "
       "(1070 . 1))))))");
    EXPECT_EQ(ev("(cdr (assoc -3 (entget e '(\"ZVT\"))))"),
              "((\"ZVT\" (1000 . \"abc\") (1070 . 1)))");
    EXPECT_EQ(ev("(xdroom e)"), "16367");
    EXPECT_EQ(ev("(xdroom (entmakex '((0 . \"POINT\") (10 0 0))))"), "16383");
}

TEST_F(CadObjectsTest, SelectionSetEdits) {
    ev("(setq a (entmakex '((0 . \"POINT\") (10 0 0))) b (entmakex '((0 . \"POINT\") (10 1 1))))");
    ev("(setq s (ssadd a (ssadd b (ssadd))))");
    EXPECT_EQ(ev("(sslength s)"), "2");
    EXPECT_EQ(ev("(equal (ssmemb a s) a)"), "T");
    EXPECT_EQ(ev("(ssnamex s 0)"), ev("(list (list 0 b 0))"));
    EXPECT_EQ(ev("(length (ssnamex s))"), "2");
    EXPECT_EQ(ev("(ssnamex s 9)"), "nil");
    EXPECT_EQ(ev("(eq (ssdel a s) s)"), "T");
    EXPECT_EQ(ev("(list (sslength s) (ssmemb a s))"), "(1 nil)");
    EXPECT_EQ(ev("(ssdel a s)"), "nil");
    EXPECT_EQ(ev("(ssgetfirst)"), "(nil nil)");
    EXPECT_EQ(ev("(ssdel a 1)"), "ERROR: bad argument type: lselsetp 1");
    EXPECT_EQ(ev("(ssmemb 1 s)"), "ERROR: bad argument type: lentityp 1");
}

TEST_F(CadObjectsTest, TransBetweenWorldUserAndObjectSystems) {
    // Without a UCS in the drawing the user system is the world.
    EXPECT_EQ(ev("(trans '(1 2 3) 0 1)"), "(1.0 2.0 3.0)");
    EXPECT_EQ(ev("(trans '(1 2) 1 2)"), "(1.0 2.0 0.0)");
    // An extrusion of -Z: the object X axis points to world -X.
    EXPECT_EQ(ev("(trans '(1 0 0) '(0 0 -1) 0)"), "(-1.0 0.0 0.0)");
    EXPECT_EQ(ev("(trans '(-1 0 0) 0 '(0 0 -1))"), "(1.0 0.0 0.0)");
    ev("(setq c (entmakex '((0 . \"CIRCLE\") (10 0 0 0) (40 . 1.0) (210 0.0 0.0 -1.0))))");
    EXPECT_EQ(ev("(trans '(2 0 0) c 0)"), "(-2.0 0.0 0.0)");
    // A UCS moved to (10, 0) and turned a quarter.
    zvdb::HeaderVariables& header = document->database()->header();
    header.setPoint("$UCSORG", {10, 0, 0});
    header.setPoint("$UCSXDIR", {0, 1, 0});
    header.setPoint("$UCSYDIR", {-1, 0, 0});
    EXPECT_EQ(ev("(trans '(1 0 0) 1 0)"), "(10.0 1.0 0.0)");
    EXPECT_EQ(ev("(trans '(10 1 0) 0 1)"), "(1.0 0.0 0.0)");
    EXPECT_EQ(ev("(trans '(1 0 0) 1 0 T)"), "(0.0 1.0 0.0)");  // a displacement
    EXPECT_EQ(ev("(trans '(1 2 3) 7 0)"), "ERROR: bad argument value: 7");
    EXPECT_EQ(ev("(trans 5 0 1)"), "ERROR: bad argument type: listp 5");
    EXPECT_EQ(ev("(trans '(1 2 3) 0)"), "ERROR: too few arguments");
}

TEST_F(CadObjectsTest, TextboxAndDisplayCalls) {
    EXPECT_EQ(ev("(textbox '((1 . \"ABCD\") (40 . 2.0)))"), "((0.0 0.0 0.0) (4.8 2.0 0.0))");
    EXPECT_EQ(ev("(textbox '((1 . \"AB\") (40 . 1.0) (41 . 2.0)))"),
              "((0.0 0.0 0.0) (2.4 1.0 0.0))");
    EXPECT_EQ(ev("(textbox 5)"), "ERROR: bad argument type: consp 5");
    ev("(setq e (entmakex '((0 . \"POINT\") (10 0 0))))");
    EXPECT_EQ(ev("(redraw)"), "nil");
    EXPECT_EQ(ev("(redraw e 3)"), "nil");
    EXPECT_EQ(ev("(equal (entupd e) e)"), "T");
}

TEST_F(CadObjectsTest, DisplayCommandsAreHarmlessAndUnknownOnesSaySo) {
    EXPECT_EQ(ev("(command \"_.VIEWRES\" \"_Y\" 2000)"), "nil");
    EXPECT_EQ(ev("(command \"_.REGENALL\")"), "nil");
    EXPECT_EQ(ev("(command-s \"_.REDRAW\")"), "nil");
    EXPECT_EQ(ev("(command \"_.VSCURRENT\" \"_2\")"), "nil");
    EXPECT_EQ(ev("(command \"_.ZOOM\" \"_P\")"), "nil");
    EXPECT_FALSE(commandLine.contains("Unknown command")) << commandLine.toStdString();
    ev("(command-s \"_.ZOOM\" \"_W\" '(0 0) '(2 3))");
    EXPECT_EQ(document->view().maxY, 3.0);
    EXPECT_EQ(ev("(progn (command \"_.SEMNOME\" \"x\") \"went on\")"), "\"went on\"");
    EXPECT_TRUE(commandLine.contains("Unknown command \"_.SEMNOME\"."))
        << commandLine.toStdString();
    EXPECT_EQ(ev("(command \"_.ZOOM\" (ssadd))")
                  .rfind("ERROR: bad argument type: stringp <Selection set: ", 0),
              0u);
}

}  // namespace
