// Files, load, findfile and getenv; paths written for Windows ("DADOS\\x") work too.
#include "LispFixture.h"
#include "lisp/Printer.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

namespace {

class FilesTest : public LispFixture {
protected:
    FilesTest() { lisp.searchPaths() << dir.path(); }

    void writeFile(const QString& relative, const QByteArray& bytes) {
        const QString path = dir.filePath(relative);
        QDir().mkpath(QFileInfo(path).absolutePath());
        QFile file(path);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(bytes);
    }
    QString quoted(const QString& relative) {
        return zvlisp::Printer::quoted(dir.filePath(relative));
    }

    QTemporaryDir dir;
};

}  // namespace

TEST_F(FilesTest, WriteThenReadLines) {
    const QString f = quoted("out.txt");
    EXPECT_EQ(ev("(setq h (open " + f + " \"w\")) (type h)"), "FILE");
    EXPECT_EQ(ev("(write-line \"first\" h)"), "\"first\"");
    ev("(write-line \"ção\" h)");
    EXPECT_FALSE(QFile::exists(dir.filePath("out.txt")));  // replaced only when closed
    EXPECT_EQ(ev("(close h)"), "nil");
    const std::string printed = ev("(vl-princ-to-string h)");
    EXPECT_EQ(ev("(write-line \"late\" h)"),
              "ERROR: bad argument type: streamp " + printed.substr(1, printed.size() - 2));
    ev("(setq h (open " + f + " \"a\")) (princ 42 h) (close h)");
    EXPECT_EQ(ev("(setq h (open " + f +
                 " \"r\")) (list (read-line h) (read-line h) "
                 "(read-line h) (read-line h))"),
              "(\"first\" \"ção\" \"42\" nil)");
    ev("(close h)");
    EXPECT_EQ(ev("(open " + quoted("missing.txt") + " \"r\")"), "nil");
    EXPECT_EQ(ev("(open " + quoted("x.txt") + " \"q\")"), "ERROR: bad argument value: q");
}

TEST_F(FilesTest, ReadsWindowsLineEndsAndLegacyEncoding) {
    writeFile("legacy.txt", "ma\xe7\xe3o\r\nsecond\r\n");
    EXPECT_EQ(ev("(setq h (open " + quoted("legacy.txt") +
                 " \"r\")) (list (read-line h) "
                 "(read-line h) (read-line h))"),
              "(\"mação\" \"second\" nil)");
}

TEST_F(FilesTest, FindfileAndLoadAcceptBackslashesAndAnyCase) {
    writeFile("Dados/Util.lsp", "(setq loaded 'yes)\n(defun util () \"util\")\n'last");
    EXPECT_EQ(ev("(findfile \"DADOS\\\\util.LSP\")"), quoted("Dados/Util.lsp").toStdString());
    EXPECT_EQ(ev("(findfile \"nothing.lsp\")"), "nil");
    EXPECT_EQ(ev("(load \"dados\\\\util\")"), "LAST");
    EXPECT_EQ(ev("(list loaded (util))"), "(YES \"util\")");
    EXPECT_EQ(ev("(load \"absent\" 'fallback)"), "FALLBACK");
    EXPECT_EQ(ev("(load \"absent\")"), "ERROR: LOAD failed: \"absent\"");
}

TEST_F(FilesTest, NestedLoadFindsFilesBesideTheLoadingOne) {
    writeFile("lib/a.lsp", "(load \"b\") (setq from-a b-value)");
    writeFile("lib/b.lsp", "(setq b-value 7)");
    EXPECT_EQ(ev("(load " + quoted("lib/a.lsp") + ") from-a"), "7");
}

TEST_F(FilesTest, LoadErrorsNameTheFileAndLine) {
    writeFile("bad.lsp", "(setq ok 1)\n\n(car 5)\n(setq after 1)\n");
    EXPECT_FALSE(lisp.evaluate("(load " + quoted("bad.lsp") + ")"));
    EXPECT_EQ(output, "; error: bad argument type: consp 5\n; in " + dir.filePath("bad.lsp") +
                          ", line 3\n");
    EXPECT_EQ(ev("(list ok after)"), "(1 nil)");
    writeFile("open.lsp", "(setq x 1)\n(defun f (\n");
    EXPECT_EQ(ev("(load " + quoted("open.lsp") + ")"), "ERROR: malformed list on input");
}

TEST_F(FilesTest, Getenv) {
    qputenv("ZV_LISP_TEST_VAR", "valor");
    EXPECT_EQ(ev("(getenv \"ZV_LISP_TEST_VAR\")"), "\"valor\"");
    EXPECT_EQ(ev("(getenv \"ZV_LISP_TEST_UNSET_VAR\")"), "nil");
}

TEST_F(FilesTest, OutputGoesToTheCommandLine) {
    EXPECT_EQ(ev("(princ \"a\\nb\")"), "\"a\\nb\"");
    ev("(prin1 \"q\") (print 'x) (terpri) (prompt \"p\") (princ 1.5)");
    EXPECT_EQ(output, "a\nb\"q\"\nX \np1.5");
    output.clear();
    EXPECT_EQ(ev("(princ)"), "");
    EXPECT_EQ(output, "");
}
