// zvhost opens a drawing and saves it with -o: the input stays as it was, the output is
// complete or absent, and a broken input writes nothing.
#include "PythonChecker.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QProcess>

#include "ZvhostRun.h"

using zvtest::PythonChecker;

namespace {

using zvtest::HostRun;

HostRun zvhost(const QStringList& arguments) {
    return zvtest::runZvhost(arguments);
}

QByteArray contents(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

class ZvhostDrawing : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(QFileInfo::exists(ZV_BIN_DIR "/zvhost")) << "build the zvhost target first";
        const QString missing = PythonChecker::missing();
        ASSERT_TRUE(missing.isEmpty()) << missing.toStdString();
        fixtures_ = PythonChecker::fixtureFolder();
        ASSERT_FALSE(fixtures_.isEmpty());
        folder_ = PythonChecker::scratchFolder();
        input_ = folder_ + "/in.dxf";
        ASSERT_TRUE(QFile::copy(fixtures_ + "/fixture_R2010.dxf", input_));
    }
    QString fixtures_, folder_, input_;
};

TEST_F(ZvhostDrawing, SavesACopyAndLeavesTheInputAlone) {
    const QByteArray before = contents(input_);
    const QString output = folder_ + "/out.dxf";
    const HostRun run = zvhost({input_, "-o", output, "--quiet"});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(contents(input_), before);
    QString report;
    EXPECT_EQ(PythonChecker::run("compare_dxf.py", {input_, output}, &report), 0)
        << report.toStdString();
    EXPECT_EQ(QDir(folder_).entryList(QDir::Files).size(), 2) << "no temporary file is left";
}

TEST_F(ZvhostDrawing, BrokenInputWritesNothing) {
    QFile broken(folder_ + "/broken.dxf");
    ASSERT_TRUE(broken.open(QIODevice::WriteOnly));
    broken.write(contents(input_).left(5000));
    broken.close();
    const QString output = folder_ + "/out.dxf";
    QFile existing(output);
    ASSERT_TRUE(existing.open(QIODevice::WriteOnly));
    existing.write("previous contents\n");
    existing.close();
    const HostRun run = zvhost({broken.fileName(), "-o", output, "--quiet"});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains("broken.dxf: line")) << run.err.toStdString();
    EXPECT_EQ(contents(output), QByteArray("previous contents\n"));
}

TEST_F(ZvhostDrawing, UnwritableTargetFailsCleanly) {
    const HostRun run = zvhost({input_, "-o", folder_ + "/no/such/folder/out.dxf", "--quiet"});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains("could not save")) << run.err.toStdString();
}

TEST_F(ZvhostDrawing, DxfInfoGivesAQuickLook) {
    const HostRun run = zvhost({"dxf-info", input_});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains("version: AC1024"));
    EXPECT_TRUE(run.out.contains("  INSERT 5\n"));
    EXPECT_TRUE(run.out.contains("  ACME_WIDGET 1\n"));
    EXPECT_TRUE(run.out.contains("  PAGE$2$SELO frozen\n"));
    EXPECT_TRUE(run.out.contains("  BORNE_X 5 entities\n"));
    EXPECT_TRUE(run.out.contains("      41 (DICTIONARY)\n"));
    EXPECT_EQ(zvhost({"dxf-info", folder_ + "/missing.dxf"}).status, 1);
}

}  // namespace
