// The product functions in zvhost's documents: scripted answers, cancels, a saved new page.
#include <QFileInfo>
#include <QProcess>

#include <QTemporaryDir>
#include "ZvhostRun.h"

#include <gtest/gtest.h>

namespace {

using zvtest::HostRun;

HostRun zvhost(const QStringList& arguments) {
    return zvtest::runZvhost(arguments);
}

class ProductInHost : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(QFileInfo::exists(ZV_BIN_DIR "/zvhost")) << "build the zvhost target first";
        drawing = folder.path() + "/proj.dxf";
        ASSERT_EQ(zvhost({"generate", "--out", drawing, "--terminals", "40"}).status, 0);
    }
    QTemporaryDir folder;
    QString drawing;
};

TEST_F(ProductInHost, AnswersComeFromTheCommandLineAndMissingOnesCancel) {
    const HostRun run =
        zvhost({"--no-module", drawing, "--answer", "strips=X1,X2", "--eval",
                "(progn (prin1 (zvSelecionaReguas)) (prin1 (zv_seleciona_paginas 0)))"});
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("(\"X1\" \"X2\")nil")) << run.out.toStdString();
    EXPECT_TRUE(run.err.contains("pages")) << run.err.toStdString();
}

TEST_F(ProductInHost, NewPageIsSavedWithTheDrawing) {
    const QString saved = folder.path() + "/saved.dxf";
    EXPECT_EQ(zvhost({"--no-module", drawing, "--eval", "(criarpagina \"COMANDO\" 0)", "-o", saved})
                  .status,
              0);
    // the new page is the current layer of the saved drawing
    const HostRun run = zvhost({"--no-module", saved, "--eval",
                                "(progn (AtualizaModemacro) (princ *ZV_MODEMACRO*) (princ \"|\") "
                                "(princ (last (assoc \"COMANDO\" (buscalistapaginas T)))))"});
    const QStringList parts = run.out.trimmed().split('|');
    ASSERT_EQ(parts.size(), 2) << run.out.toStdString();
    EXPECT_TRUE(parts[1].startsWith("COMANDO$")) << run.out.toStdString();
    EXPECT_TRUE(parts[0].contains(parts[1])) << run.out.toStdString();
    const HostRun before = zvhost({"--no-module", drawing, "--eval",
                                   "(prin1 (length (assoc \"COMANDO\" (buscalistapaginas T))))"});
    const HostRun after = zvhost({"--no-module", saved, "--eval",
                                  "(prin1 (length (assoc \"COMANDO\" (buscalistapaginas T))))"});
    EXPECT_EQ(after.out.toInt(), before.out.toInt() + 1)
        << before.out.toStdString() << after.out.toStdString();
}

}  // namespace
