// The list pipeline run through zvhost with the test plug-in, and the drivers' template
// choice on the real module.
#include "QtPrinters.h"
#include "ZvhostRun.h"

#include <gtest/gtest.h>

#include <QProcess>
#include <QTemporaryDir>

namespace {

using Resultado = zvtest::HostRun;

class PipelineRunTest : public ::testing::Test {
protected:
    void SetUp() override { ASSERT_TRUE(dados_.isValid()); }

    Resultado zvhost(const QStringList& args) {
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert("ZV_DATA_DIR", dados_.path());
        return zvtest::runZvhost(args, env, dados_.path(), 60000);
    }
    Resultado plugin(const QString& comando) {
        return zvhost({"--module", ZV_TEST_PLUGIN, "--progress-log", "p.dxf", comando});
    }

    QTemporaryDir dados_;
};

TEST_F(PipelineRunTest, ARunReadsEveryPartMergesAndEndsWithMessage63) {
    const Resultado run = plugin("testePipeline");
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    // Two reads of three items each, the shared one kept once; the second part's pages
    // reach the reader.
    EXPECT_EQ(run.out,
              "\nitens=5 todas todas ESQ$0001$A,ESQ$0002$A ESQ$0001$A,ESQ$0002$A"
              "\nList created.\n");
    // Progress: opened, 0, the readers' own points, 95, 100, closed.
    const QStringList passos = run.err.split('\n', Qt::SkipEmptyParts);
    EXPECT_EQ(passos, QStringList({"progress: open ZVListas", "progress: 0% ZVListas",
                                   "progress: 40% ZVListas ( leitura 1 )",
                                   "progress: 80% ZVListas ( leitura 2 )", "progress: 95% ZVListas",
                                   "progress: 100% ZVListas", "progress: close"}));
}

TEST_F(PipelineRunTest, ATemplateThatDoesNotLoadStopsWithMessage88) {
    const Resultado run = plugin("testeModeloRuim");
    EXPECT_EQ(run.status, 3);
    EXPECT_EQ(run.out, "\nThe template could not be loaded.\n");
    EXPECT_FALSE(run.err.contains("progress"));
}

TEST_F(PipelineRunTest, AWriterThatStopsShowsItsTextAndNoEndMessage) {
    const Resultado run = plugin("testeEscritorPara");
    EXPECT_EQ(run.status, 3);
    EXPECT_TRUE(run.err.contains(": escritor parou\n")) << run.err.toStdString();
    EXPECT_FALSE(run.out.contains("List created."));
    EXPECT_TRUE(run.err.contains("progress: close"));
}

TEST_F(PipelineRunTest, ACancelledTemplateDialogEndsSilentlyAndStopsTheRun) {
    const Resultado run = zvhost({"novo.dxf", "gerarListaBornesGrf", "gerarListaBornesGrf"});
    EXPECT_EQ(run.status, 4);
    EXPECT_EQ(run.out, "");
    // The first cancel ends the run: the second command never asks.
    EXPECT_EQ(run.err.count("no answer for file dialog 'template'"), 1);
}

TEST_F(PipelineRunTest, UnknownCommandsAndBadOptionsAreUsageErrors) {
    Resultado run = zvhost({"novo.dxf", "naoExiste"});
    EXPECT_EQ(run.status, 2);
    EXPECT_TRUE(run.err.contains("unknown command: naoExiste"));
    run = zvhost({"--answer", "semigual", "novo.dxf"});
    EXPECT_EQ(run.status, 2);
    run = zvhost({});
    EXPECT_EQ(run.status, 2);
    run = zvhost({"--help"});
    EXPECT_EQ(run.status, 0);
    EXPECT_TRUE(run.out.contains("--answer NAME=VALUE"));
}

TEST_F(PipelineRunTest, NothingIsWrittenUnlessAsked) {
    const Resultado run = zvhost({"novo.dxf", "--eval", "(setq x 1)"});
    EXPECT_EQ(run.status, 0);
    EXPECT_FALSE(QFile::exists(dados_.filePath("novo.dxf")));
}

}  // namespace
