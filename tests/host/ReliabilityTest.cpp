// zvhost as a user meets it when things go wrong: a full disk, a failing or cancelled
// command, memory that runs out, Ctrl+C. The exit status says what happened, and the
// user's files stay as they were.
#include "ProductFolder.h"

#include <gtest/gtest.h>

#include <QFile>

#include <csignal>

namespace {

using zvtest::HostRun;
using zvtest::Limits;

QByteArray contentOf(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

void writeText(const QString& path, const QByteArray& text) {
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(text);
}

class Reliability : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        product_ = new zvtest::ProductFolder;
        const QString problem = product_->prepare();
        ASSERT_TRUE(problem.isEmpty()) << problem.toStdString();
    }
    static void TearDownTestSuite() { delete product_; }

    // A copy of the generated project under a new name.
    static QString copyOfProject(const QString& name) {
        const QString path = product_->path(name);
        QFile::remove(path);
        EXPECT_TRUE(QFile::copy(product_->project(), path));
        return path;
    }
    static QString path(const QString& name) { return product_->path(name); }
    static HostRun zvhost(const QStringList& args, const Limits& limits = {}) {
        return product_->zvhost(args, limits);
    }
    // Runs zvhost until it prints "ready", then sends it Ctrl+C.
    static HostRun interrupted(const QStringList& args) {
        QProcess process;
        process.setProcessEnvironment(product_->environment());
        process.setWorkingDirectory(product_->path("."));
        zvtest::startZvhost(process, args, {});
        HostRun run;
        QByteArray out;
        while (!out.contains("ready") && process.waitForReadyRead(30000))
            out += process.readAllStandardOutput();
        if (!out.contains("ready")) return run;
        ::kill(pid_t(process.processId()), SIGINT);
        if (!process.waitForFinished(30000)) return run;
        run.status = process.exitStatus() == QProcess::CrashExit ? 128 : process.exitCode();
        run.out = QString::fromUtf8(out + process.readAllStandardOutput());
        run.err = QString::fromUtf8(process.readAllStandardError());
        return run;
    }

    static zvtest::ProductFolder* product_;
};

zvtest::ProductFolder* Reliability::product_ = nullptr;

TEST_F(Reliability, AFullDiskNeverTruncatesTheDrawing) {
    // -o over an older file: the limit lets a third of the drawing through.
    const qint64 size = QFile(product_->project()).size();
    const Limits third{{"--fsize=" + QString::number(size / 3)}};
    const QString target = path("target.dxf");
    writeText(target, "the user's older file");
    HostRun run = zvhost({product_->project(), "-o", target}, third);
    EXPECT_EQ(run.status, 1) << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("could not save " + target + ": File too large"))
        << run.err.toStdString();
    EXPECT_EQ(contentOf(target), "the user's older file");

    // --in-place after the terminal list: the list makes the drawing grow past the limit.
    const QString project = copyOfProject("in-place.dxf");
    const QByteArray before = contentOf(project);
    const Limits sameSize{{"--fsize=" + QString::number(size)}};
    QStringList args = product_->terminalList(project, "unused.dxf");
    args.replace(args.indexOf("-o"), "--in-place");
    args.removeAll("unused.dxf");
    run = zvhost(args, sameSize);
    EXPECT_EQ(run.status, 1) << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("could not save " + project + ": File too large"));
    EXPECT_EQ(contentOf(project), before);
    EXPECT_EQ(QDir(path(".")).entryList({".in-place.dxf*"}, QDir::Files | QDir::Hidden),
              QStringList());

    // Without the limit the same run saves the list.
    run = zvhost(args);
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_GT(contentOf(project).size(), before.size());
}

TEST_F(Reliability, AFileWrittenFromLispFailsLoudlyOnAFullDisk) {
    const QString file = path("notes.txt");
    writeText(file, "kept");
    const QString program =
        "(progn (setq f (open \"" + file +
        "\" \"w\"))"
        " (repeat 2000 (write-line \"a line of forty characters, more or less\" f))"
        " (close f))";
    HostRun run =
        zvhost({"--no-module", path("empty.dxf"), "--eval", program}, Limits{{"--fsize=20000"}});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.out.contains("; error: could not save " + file + ": File too large"))
        << run.out.toStdString();
    EXPECT_EQ(contentOf(file), "kept");
}

TEST_F(Reliability, AFailedCommandExitsWithThreeAndSavesNothing) {
    const QString out = path("failed.dxf");
    QStringList args = product_->terminalList(product_->project(), out);
    // A template that is not there.
    HostRun run = zvhost(QStringList{"--answer", "template=" + path("missing.grt")} << args.mid(3));
    EXPECT_EQ(run.status, 3) << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("gerarListaBornesGrf failed; the drawing is not saved"));
    EXPECT_FALSE(QFile::exists(out));

    // An empty template loads nothing: refused, and no "list created" message.
    writeText(path("empty.grt"), "; nothing but a comment\n");
    run = zvhost(QStringList{"--answer", "template=" + path("empty.grt")} << args.mid(3));
    EXPECT_EQ(run.status, 3);
    EXPECT_TRUE(run.out.contains("the template is empty")) << run.out.toStdString();
    EXPECT_FALSE(run.out.contains("List created.") || run.out.contains("Lista gerada."));
    EXPECT_FALSE(QFile::exists(out));

    // A template whose LISP fails.
    writeText(path("broken.grt"), "(setq *LISTA_DE_SORT* (car 1))\n");
    run = zvhost(QStringList{"--answer", "template=" + path("broken.grt")} << args.mid(3));
    EXPECT_EQ(run.status, 3);
    EXPECT_FALSE(QFile::exists(out));

    // A diagram template that names no representation: said so, and nothing saved.
    writeText(path("norep.dtp"), "(setq PBLTOPO_GRUPO \"TOPO\")\n");
    run = zvhost({"--quiet", "--load", product_->path("produto/config/zvconfig.lsp"), "--answer",
                  "template=" + path("norep.dtp"), product_->project(), "-o", out,
                  "diagramaTopografico"});
    EXPECT_EQ(run.status, 3);
    EXPECT_TRUE(run.out.contains("names no representation")) << run.out.toStdString();
    EXPECT_FALSE(QFile::exists(out));
}

TEST_F(Reliability, ACancelledQuestionExitsWithFourAndLaterCommandsDoNotRun) {
    const QString out = path("cancelled.dxf");
    // No user configuration: the template comes from a file dialog nobody answers.
    const HostRun run = zvhost(
        {"--quiet", product_->project(), "-o", out, "gerarListaBornesGrf", "gerarListaBornesGrf"});
    EXPECT_EQ(run.status, 4);
    EXPECT_EQ(run.err.count("no answer for file dialog"), 1) << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("gerarListaBornesGrf was cancelled"));
    EXPECT_FALSE(QFile::exists(out));
}

TEST_F(Reliability, ADirectoryIsNoDrawing) {
    const HostRun run = zvhost({path(".")});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains("is a directory")) << run.err.toStdString();
    EXPECT_FALSE(run.err.contains("memory"));
}

TEST_F(Reliability, RunawayLispEndsWithAMessageUnderAMemoryLimit) {
    if (zvtest::kAddressSanitizer)
        GTEST_SKIP() << "an address-space limit leaves AddressSanitizer no room for its shadow "
                        "memory; this test runs in the normal build";
    const Limits memory{{"--as=600000000"}};
    // Strings stop at their limit long before the memory does.
    HostRun run = zvhost({"--no-module", path("empty.dxf"), "--eval",
                          "(progn (setq s \"x\") (repeat 40 (setq s (strcat s s))))"},
                         memory);
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.out.contains("; error: string too long: strcat")) << run.out.toStdString();

    // A list that eats all memory ends the evaluation, not the program.
    run = zvhost({"--no-module", path("empty.dxf"), "-o", path("oom.dxf"), "--eval",
                  "(repeat 200000000 (setq l (cons 1 l)))"},
                 memory);
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains("out of memory")) << run.err.toStdString();
    EXPECT_FALSE(QFile::exists(path("oom.dxf")));

    // The same in a template: the command says so and nothing is saved.
    writeText(path("greedy.grt"), "(repeat 200000000 (setq l (cons 1 l)))\n");
    const QString out = path("greedy.dxf");
    QStringList args = product_->terminalList(product_->project(), out);
    run = zvhost(QStringList{"--answer", "template=" + path("greedy.grt")} << args.mid(3), memory);
    EXPECT_EQ(run.status, 1) << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("gerarListaBornesGrf ran out of memory"));
    EXPECT_FALSE(QFile::exists(out));
}

TEST_F(Reliability, CtrlCCancelsAnEndlessLoop) {
    const QString out = path("interrupted.dxf");
    HostRun run = interrupted({"--no-module", path("empty.dxf"), "-o", out, "--eval",
                               "(progn (princ \"ready\") (while t))"});
    EXPECT_EQ(run.status, 4) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("Function cancelled"));
    EXPECT_FALSE(QFile::exists(out));

    // An endless template: the list command is cancelled and nothing is saved.
    writeText(path("endless.grt"), "(princ \"ready\") (while t)\n");
    QStringList args = product_->terminalList(product_->project(), out);
    run = interrupted(QStringList{"--answer", "template=" + path("endless.grt")} << args.mid(3));
    EXPECT_EQ(run.status, 4) << run.err.toStdString();
    EXPECT_TRUE(run.err.contains("gerarListaBornesGrf was cancelled"));
    EXPECT_FALSE(QFile::exists(out));
}

}  // namespace
