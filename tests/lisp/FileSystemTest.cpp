// File names and file operations in a temporary folder: vl-filename-*, vl-file-* and
// vl-directory-files. vl-file-copy never overwrites, and a copy that can't be written whole
// leaves the target as it was.
#include "LispFixture.h"
#include "lisp/Printer.h"

#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QTemporaryDir>

#include <csignal>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

class FileSystemTest : public LispFixture {
protected:
    void writeFile(const QString& relative, const QByteArray& bytes) {
        const QString path = dir.filePath(relative);
        QDir().mkpath(QFileInfo(path).absolutePath());
        QFile file(path);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(bytes);
    }
    QByteArray readFile(const QString& relative) {
        QFile file(dir.filePath(relative));
        return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray("<missing>");
    }
    QString q(const QString& relative) { return zvlisp::Printer::quoted(dir.filePath(relative)); }
    QString path(const QString& relative) {
        return zvlisp::Printer::quoted(dir.filePath(relative));
    }

    QTemporaryDir dir;
};

TEST_F(FileSystemTest, FileNameParts) {
    EXPECT_EQ(ev("(vl-filename-base \"c:\\\\zv\\\\bin\\\\zvhost.exe\")"), "\"zvhost\"");
    EXPECT_EQ(ev("(vl-filename-directory \"c:\\\\zv\\\\bin\\\\zvhost.exe\")"),
              "\"c:\\\\zv\\\\bin\"");
    EXPECT_EQ(ev("(vl-filename-extension \"c:\\\\zv\\\\bin\\\\zvhost.exe\")"), "\".exe\"");
    EXPECT_EQ(ev("(vl-filename-base \"/home/u/projeto.v2.dxf\")"), "\"projeto.v2\"");
    EXPECT_EQ(ev("(vl-filename-directory \"/home/u/projeto.dxf\")"), "\"/home/u\"");
    EXPECT_EQ(ev("(vl-filename-directory \"projeto.dxf\")"), "\"\"");
    EXPECT_EQ(ev("(vl-filename-directory \"/x\")"), "\"/\"");
    EXPECT_EQ(ev("(vl-filename-extension \"/home/u/LEIAME\")"), "nil");
    EXPECT_EQ(ev("(vl-filename-extension \"/home/u/.profile\")"), "nil");
    EXPECT_EQ(ev("(vl-filename-base \"/home/u.d/LEIAME\")"), "\"LEIAME\"");
    EXPECT_EQ(ev("(vl-filename-base 12)"), "ERROR: bad argument type: stringp 12");
}

TEST_F(FileSystemTest, MktempNamesAFileNotYetThere) {
    const QString folder = zvlisp::Printer::quoted(dir.path());
    const std::string first = ev("(vl-filename-mktemp \"rel\" " + folder + " \".txt\")");
    const QString name = QString::fromStdString(first.substr(1, first.size() - 2));
    EXPECT_TRUE(name.startsWith(dir.path() + "/rel")) << first;
    EXPECT_TRUE(name.endsWith(".txt")) << first;
    EXPECT_FALSE(QFile::exists(name));
    // Nothing is made: the next call names the same file until it exists.
    EXPECT_EQ(ev("(vl-filename-mktemp \"rel\" " + folder + " \".txt\")"), first);
    QFile(name).open(QIODevice::WriteOnly);
    const std::string second = ev("(vl-filename-mktemp \"rel\" " + folder + " \".txt\")");
    EXPECT_NE(second, first);
    // A pattern with a folder and an extension of its own.
    const std::string third = ev("(vl-filename-mktemp " + q("tmp.lsp") + ")");
    EXPECT_NE(third.find("/tmp"), std::string::npos) << third;
    EXPECT_EQ(third.substr(third.size() - 5), ".lsp\"");
    EXPECT_EQ(ev("(type (vl-filename-mktemp))"), "STR");
}

TEST_F(FileSystemTest, CopyNeverOverwrites) {
    writeFile("a.txt", "alpha\n");
    writeFile("b.txt", "beta\n");
    EXPECT_EQ(ev("(vl-file-copy " + q("a.txt") + " " + q("c.txt") + ")"), "6");
    EXPECT_EQ(readFile("c.txt"), "alpha\n");
    EXPECT_EQ(ev("(vl-file-copy " + q("a.txt") + " " + q("b.txt") + ")"), "nil");
    EXPECT_EQ(readFile("b.txt"), "beta\n");
    // Appending is asked for explicitly.
    EXPECT_EQ(ev("(vl-file-copy " + q("a.txt") + " " + q("b.txt") + " T)"), "6");
    EXPECT_EQ(readFile("b.txt"), "beta\nalpha\n");
    EXPECT_EQ(ev("(vl-file-copy " + q("a.txt") + " " + q("a.txt") + " T)"), "nil");
    EXPECT_EQ(readFile("a.txt"), "alpha\n");
    EXPECT_EQ(ev("(vl-file-copy " + q("missing.txt") + " " + q("d.txt") + ")"), "nil");
    EXPECT_FALSE(QFile::exists(dir.filePath("d.txt")));
    EXPECT_EQ(ev("(vl-file-copy " + q("a.txt") + " " + q("no/folder/d.txt") + ")"), "nil");
    EXPECT_EQ(ev("(vl-file-copy " + q("a.txt") + ")"), "ERROR: too few arguments");
}

// Under a file-size limit the append can't be written whole: nil, and the target keeps its
// bytes. Run in a child process so the limit stays there.
TEST_F(FileSystemTest, CopyBeyondAFileSizeLimitLeavesTheTargetAsItWas) {
    writeFile("big.bin", QByteArray(200000, 'x'));
    writeFile("target.txt", "kept\n");
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
        std::signal(SIGXFSZ, SIG_IGN);
        const rlimit limit{100000, 100000};
        setrlimit(RLIMIT_FSIZE, &limit);
        zvlisp::Interpreter in;
        zvlisp::Value result;
        const bool ok = in.evaluate(
            "(vl-file-copy " + path("big.bin") + " " + path("target.txt") + " T)", &result);
        _exit(ok && result.isNil() ? 0 : 1);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(WEXITSTATUS(status), 0);
    EXPECT_EQ(readFile("target.txt"), "kept\n");
    // No temporary file is left beside it.
    EXPECT_EQ(QDir(dir.path()).entryList(QDir::Files).size(), 2);
}

TEST_F(FileSystemTest, DeleteRenameSizeAndTime) {
    writeFile("a.txt", "12345");
    writeFile("b.txt", "b");
    QDir(dir.path()).mkdir("sub");
    EXPECT_EQ(ev("(vl-file-size " + q("a.txt") + ")"), "5");
    EXPECT_EQ(ev("(vl-file-size " + q("sub") + ")"), "0");
    EXPECT_EQ(ev("(vl-file-size " + q("none") + ")"), "nil");
    EXPECT_EQ(ev("(vl-file-directory-p " + q("sub") + ")"), "T");
    EXPECT_EQ(ev("(vl-file-directory-p " + q("a.txt") + ")"), "nil");
    EXPECT_EQ(ev("(vl-file-rename " + q("a.txt") + " " + q("b.txt") + ")"), "nil");
    EXPECT_EQ(readFile("b.txt"), "b");
    EXPECT_EQ(ev("(vl-file-rename " + q("a.txt") + " " + q("c.txt") + ")"), "T");
    EXPECT_EQ(readFile("c.txt"), "12345");
    EXPECT_FALSE(QFile::exists(dir.filePath("a.txt")));
    const QDateTime modified = QFileInfo(dir.filePath("c.txt")).lastModified();
    const QString expected = QString("(%1 %2 %3 %4 %5 %6 %7)")
                                 .arg(modified.date().year())
                                 .arg(modified.date().month())
                                 .arg(modified.date().dayOfWeek() % 7)
                                 .arg(modified.date().day())
                                 .arg(modified.time().hour())
                                 .arg(modified.time().minute())
                                 .arg(modified.time().second());
    EXPECT_EQ(ev("(vl-file-systime " + q("c.txt") + ")"), expected.toStdString());
    EXPECT_EQ(ev("(vl-file-systime " + q("none") + ")"), "nil");
    EXPECT_EQ(ev("(vl-file-delete " + q("c.txt") + ")"), "T");
    EXPECT_EQ(ev("(vl-file-delete " + q("c.txt") + ")"), "nil");
    EXPECT_EQ(ev("(vl-file-delete " + q("sub") + ")"), "nil");  // not a folder
    EXPECT_TRUE(QFileInfo(dir.filePath("sub")).isDir());
}

TEST_F(FileSystemTest, DirectoryFilesByPatternAndKind) {
    writeFile("a.txt", "a");
    writeFile("B.lsp", "b");
    writeFile("sub/c.txt", "c");
    const QString folder = zvlisp::Printer::quoted(dir.path());
    EXPECT_EQ(ev("(vl-directory-files " + folder + " \"*.txt\" 1)"), "(\"a.txt\")");
    EXPECT_EQ(ev("(vl-directory-files " + folder + " nil 1)"), "(\"a.txt\" \"B.lsp\")");
    EXPECT_EQ(ev("(vl-directory-files " + folder + " nil -1)"), "(\".\" \"..\" \"sub\")");
    EXPECT_EQ(ev("(vl-directory-files " + folder + ")"),
              "(\".\" \"..\" \"sub\" \"a.txt\" \"B.lsp\")");
    EXPECT_EQ(ev("(vl-directory-files " + folder + " \"*.dwg\")"), "nil");
    EXPECT_EQ(ev("(vl-directory-files " + q("missing") + ")"), "nil");
    EXPECT_EQ(ev("(vl-directory-files " + folder + " \"*\" \"x\")"),
              "ERROR: bad argument type: fixnump: \"x\"");
}

}  // namespace
