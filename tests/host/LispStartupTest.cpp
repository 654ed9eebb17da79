// A user's start-up file loaded by zvhost into a drawing, its questions answered by the
// script; and the same questions unanswered, which cancel the load.
#include "QtPrinters.h"
#include "ZvhostRun.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"
#include "drawing/XRecord.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

namespace {

class LispStartupTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(folder.isValid());
        ASSERT_TRUE(QFile::copy(ZV_TEST_DIR "/data/inicio.lsp", folder.filePath("inicio.lsp")));
        environment.insert("ZV_DATA_DIR", folder.path());
        environment.insert("ZV_HUGE_PAGES", "0");
    }
    QStringList answers() const {
        return {"--answer", "prompt:Número de cópias=2",          "--answer", "prompt:Origem=10,20",
                "--answer", "prompt:Continuar? [Sim/Nao] <Sim>=n"};
    }

    QTemporaryDir folder;
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
};

TEST_F(LispStartupTest, LoadsIntoADrawingWithScriptedAnswers) {
    const QString output = folder.filePath("saida.dxf");
    const zvtest::HostRun run =
        zvtest::runZvhost(QStringList{"--no-module", "--quiet", "--load", "inicio.lsp"} +
                              answers() + QStringList{folder.filePath("projeto.dxf"), "-o", output},
                          environment, folder.path());
    ASSERT_EQ(run.status, 0) << run.out.toStdString() << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("Pronto: 2 (10.0 20.0 0.0) Nao ok 25.4 zv000"))
        << run.out.toStdString();
    EXPECT_TRUE(run.out.contains("Unknown command \"_.DESCONHECIDO\".")) << run.out.toStdString();
    auto db = zvdb::DxfLoader::loadFile(output.toStdString());
    ASSERT_NE(db, nullptr);
    ASSERT_NE(db->layer("ZV_NOTAS"), nullptr);
    int texts = 0;
    for (const zvdb::Entity* e : db->modelSpace()->entities())
        if (e->isType("TEXT") && e->text(1) == "Revisao A" && e->hasXData("ZVUSER")) ++texts;
    EXPECT_EQ(texts, 1);
    const std::string path[] = {"ZV_USUARIO"};
    const zvdb::XRecord* record = db->xrecordAt(path, false);
    ASSERT_NE(record, nullptr);
    EXPECT_EQ(record->text(1), "v1");
}

TEST_F(LispStartupTest, AnUnansweredQuestionStopsTheLoad) {
    const QString output = folder.filePath("saida.dxf");
    const zvtest::HostRun run = zvtest::runZvhost({"--no-module", "--quiet", "--load", "inicio.lsp",
                                                   folder.filePath("projeto.dxf"), "-o", output},
                                                  environment, folder.path());
    EXPECT_NE(run.status, 0);
    EXPECT_TRUE(run.err.contains("no answer for prompt 'prompt:Número de cópias'"))
        << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("Function cancelled")) << run.out.toStdString();
    EXPECT_FALSE(QFile::exists(output));
}

TEST_F(LispStartupTest, TheLispSubcommandTakesAnswersToo) {
    const zvtest::HostRun run = zvtest::runZvhost(
        QStringList{"lisp"} + answers() + QStringList{"inicio.lsp"}, environment, folder.path());
    ASSERT_EQ(run.status, 0) << run.out.toStdString() << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("Pronto: 2 (10.0 20.0 0.0) Nao ok 25.4")) << run.out.toStdString();
    const zvtest::HostRun usage = zvtest::runZvhost({"lisp", "a.lsp", "b.lsp"}, environment);
    EXPECT_EQ(usage.status, 2);
}

}  // namespace
