// Data functions users' files call (vl-list-length, vl-string-mismatch, angtof, cvunit),
// the memory calls kept for old programs, the functions that need a screen or a registry,
// and special forms seen as values.
#include "LispFixture.h"

#include <QFile>
#include <QTemporaryDir>

namespace {

class SystemTest : public LispFixture {
protected:
    SystemTest() { lisp.unitTableFile = ZV_SOURCE_DIR "/data/program/units.txt"; }
};

TEST_F(SystemTest, ListLengthIsNilForADottedList) {
    EXPECT_EQ(ev("(vl-list-length '(1 2 3))"), "3");
    EXPECT_EQ(ev("(vl-list-length nil)"), "0");
    EXPECT_EQ(ev("(vl-list-length '(1 2 . 3))"), "nil");
    EXPECT_EQ(ev("(vl-list-length (cons 1 2))"), "nil");
    EXPECT_EQ(ev("(vl-list-length \"abc\")"), "ERROR: bad argument type: listp \"abc\"");
    EXPECT_EQ(ev("(vl-list-length)"), "ERROR: too few arguments");
}

TEST_F(SystemTest, StringMismatchCountsTheCommonPrefix) {
    EXPECT_EQ(ev("(vl-string-mismatch \"VL-FUN\" \"VL-VAR\")"), "3");
    EXPECT_EQ(ev("(vl-string-mismatch \"vl-fun\" \"avl-var\")"), "0");
    EXPECT_EQ(ev("(vl-string-mismatch \"vl-fun\" \"avl-var\" 0 1)"), "3");
    EXPECT_EQ(ev("(vl-string-mismatch \"VL-FUN\" \"Vl-vAR\")"), "1");
    EXPECT_EQ(ev("(vl-string-mismatch \"VL-FUN\" \"Vl-vAR\" 0 0 T)"), "3");
    EXPECT_EQ(ev("(vl-string-mismatch \"abc\" \"abc\")"), "3");
    EXPECT_EQ(ev("(vl-string-mismatch \"abc\" \"abc\" 5 0)"), "0");
    EXPECT_EQ(ev("(vl-string-mismatch 1 \"abc\")"), "ERROR: bad argument type: stringp 1");
    EXPECT_EQ(ev("(vl-string-mismatch \"a\" \"abc\" -1)"), "ERROR: bad argument value: -1");
}

TEST_F(SystemTest, AngtofReadsEveryAngleMode) {
    EXPECT_EQ(ev("(angtof \"45\" 0)"), "0.785398");
    EXPECT_EQ(ev("(angtof \"45d0'0\\\"\" 1)"), "0.785398");
    EXPECT_EQ(ev("(angtof \"90d30'\" 1)"), "1.57952");
    EXPECT_EQ(ev("(angtof \"50g\" 2)"), "0.785398");
    EXPECT_EQ(ev("(angtof \"0.785398r\" 3)"), "0.785398");
    EXPECT_EQ(ev("(angtof \"N 45d0'0\\\" E\" 4)"), "0.785398");
    EXPECT_EQ(ev("(angtof \"S 45d0'0\\\" W\" 4)"), "3.92699");
    EXPECT_EQ(ev("(angtof \"N\" 4)"), "1.5708");
    // Without a mode the drawing's angle units (degrees here) are used.
    EXPECT_EQ(ev("(angtof \"180\")"), "3.14159");
    // Round trips through angtos.
    EXPECT_EQ(ev("(angtos (angtof \"123.5\" 0) 0 1)"), "\"123.5\"");
    EXPECT_EQ(ev("(angtof \"abc\" 0)"), "nil");
    EXPECT_EQ(ev("(angtof \"45\" 9)"), "ERROR: bad argument value: 9");
    EXPECT_EQ(ev("(angtof 45)"), "ERROR: bad argument type: stringp 45");
}

TEST_F(SystemTest, CvunitConvertsWithTheShippedTable) {
    EXPECT_EQ(ev("(cvunit 1 \"inch\" \"cm\")"), "2.54");
    EXPECT_EQ(ev("(cvunit 1 \"minute\" \"second\")"), "60.0");
    EXPECT_EQ(ev("(cvunit 1 \"gallon\" \"furlong\")"), "nil");  // different dimensions
    EXPECT_EQ(ev("(cvunit 100 \"Celsius\" \"fahrenheit\")"), "212.0");
    EXPECT_EQ(ev("(cvunit 32 \"fahrenheit\" \"celsius\")"), "0.0");
    EXPECT_EQ(ev("(cvunit 1 \"sq ft\" \"square inches\")"), "144.0");
    EXPECT_EQ(ev("(cvunit 1 \"cu m\" \"litres\")"), "1000.0");
    EXPECT_EQ(ev("(cvunit 1 \"nautical mile\" \"m\")"), "1852.0");
    EXPECT_EQ(ev("(cvunit 180 \"degree\" \"radian\")"), "3.14159");
    EXPECT_EQ(ev("(cvunit '(1 2 3) \"ft\" \"in\")"), "(12.0 24.0 36.0)");
    EXPECT_EQ(ev("(cvunit 1 \"furlongs\" \"parsecs\")"), "nil");
    EXPECT_EQ(ev("(cvunit \"1\" \"in\" \"mm\")"), "ERROR: bad argument type: numberp: \"1\"");
    EXPECT_EQ(ev("(cvunit 1 \"in\")"), "ERROR: too few arguments");
}

TEST_F(SystemTest, CvunitReadsTheTableItIsGiven) {
    QTemporaryDir dir;
    const QString path = dir.filePath("units.txt");
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write("# a table of our own\nlength 1 metre m\nlength 0.5 half_metre\nmass 1 kg\n");
    file.close();
    lisp.unitTableFile = path;
    EXPECT_EQ(ev("(cvunit 3 \"half metre\" \"m\")"), "1.5");
    EXPECT_EQ(ev("(cvunit 1 \"inch\" \"m\")"), "nil");  // not in this table
    lisp.unitTableFile = dir.filePath("missing.txt");
    EXPECT_EQ(ev("(cvunit 1 \"m\" \"m\")"), "nil");
}

TEST_F(SystemTest, MemoryCallsAreHarmless) {
    EXPECT_EQ(ev("(gc)"), "nil");
    EXPECT_EQ(ev("(type (alloc 1000))"), "INT");
    EXPECT_EQ(ev("(alloc 2000)"), "1000");
    EXPECT_EQ(ev("(expand 3)"), "3");
    EXPECT_EQ(ev("(expand \"x\")"), "ERROR: bad argument type: fixnump: \"x\"");
    EXPECT_EQ(ev("(vl-load-com)"), "nil");
    EXPECT_EQ(ev("(mem)"), "nil");
    EXPECT_TRUE(output.contains("memory is managed automatically")) << output.toStdString();
    EXPECT_EQ(ev("(type (ver))"), "STR");
    EXPECT_EQ(ev("(wcmatch (ver) \"*LISP*\")"), "T");
}

TEST_F(SystemTest, ScreenAndRegistryFunctionsFailNamingThemselves) {
    EXPECT_EQ(ev("(grread T)"), "ERROR: grread: not available: this host has no screen");
    EXPECT_EQ(ev("(grdraw '(0 0) '(1 1) 1)"),
              "ERROR: grdraw: not available: this host has no screen");
    EXPECT_EQ(ev("(menucmd \"P1=*\")"), "ERROR: menucmd: not available: this host has no menus");
    EXPECT_EQ(ev("(tablet 0)"), "ERROR: tablet: not available: this host has no digitizing tablet");
    EXPECT_EQ(ev("(vl-registry-read \"HKEY_CURRENT_USER\\\\X\" \"Y\")"),
              "ERROR: vl-registry-read: not available: this system has no registry");
    // A program can test for it.
    EXPECT_EQ(ev("(vl-catch-all-error-message (vl-catch-all-apply 'vl-registry-write '(\"K\")))"),
              "\"vl-registry-write: not available: this system has no registry\"");
    EXPECT_EQ(ev("(vla-get-activedocument nil)"),
              "ERROR: no function definition: VLA-GET-ACTIVEDOCUMENT");
}

TEST_F(SystemTest, SpecialFormsAreSubrsAsValues) {
    for (const char* form : {"if", "setq", "cond", "while", "repeat", "foreach", "defun", "lambda",
                             "quote", "progn", "and", "or", "function", "defun-q"})
        EXPECT_EQ(ev(QString("(type %1)").arg(form)), "SUBR") << form;
    EXPECT_EQ(ev("(if (= (type if) 'SUBR) \"builtin\" \"other\")"), "\"builtin\"");
    EXPECT_EQ(ev("(boundp 'while)"), "T");
    // They still work as forms, and as values refuse evaluated arguments.
    EXPECT_EQ(ev("(if nil 1 2)"), "2");
    EXPECT_EQ(ev("(setq a 5)"), "5");
    EXPECT_EQ(ev("(apply 'if '(T 1 2))"), "ERROR: bad function: IF");
    EXPECT_EQ(ev("(apply 'and '(1 2))"), "T");
    // A user function of the same name still replaces it as a value.
    EXPECT_EQ(ev("(defun myif (x) x) (type myif)"), "USUBR");
}

}  // namespace
