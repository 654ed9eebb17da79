// zvhost with a DWG drawing: opened as the active document and saved as DXF; never saved
// over (no DWG writer); files it can't read, or a missing Node.js, end in status 1 with a
// message that names the file, and nothing is written.
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/LayerRecord.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QFileInfo>
#include <QStandardPaths>
#include <QTemporaryDir>

#include "ZvhostRun.h"

using zvtest::HostRun;

namespace {

const QString kSamples = ZV_TEST_DIR "/dwg/";

QByteArray contents(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

bool nodeAbsent() {
    return qEnvironmentVariableIsEmpty("ZV_NODE") &&
           QStandardPaths::findExecutable("node").isEmpty();
}

class ZvhostDwg : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(QFileInfo::exists(ZV_BIN_DIR "/zvhost")) << "build the zvhost target first";
        ASSERT_TRUE(folder_.isValid());
    }
    QString copy(const QString& sample, const QString& as) {
        const QString path = folder_.filePath(as);
        EXPECT_TRUE(QFile::copy(kSamples + sample, path));
        return path;
    }
    HostRun zvhost(const QStringList& arguments, const QProcessEnvironment& environment =
                                                     QProcessEnvironment::systemEnvironment()) {
        return zvtest::runZvhost(QStringList(arguments) << "--no-module"
                                                        << "--quiet",
                                 environment);
    }
    QTemporaryDir folder_;
};

}  // namespace

TEST_F(ZvhostDwg, InPlaceOnADwgIsRefusedAndTheFileStaysByteForByte) {
    const QString drawing = copy("xdata.dwg", "project.dwg");
    const QByteArray before = contents(drawing);
    const HostRun run = zvhost({drawing, "--in-place"});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains(drawing + ": This edition does not write DWG"))
        << run.err.toStdString();
    EXPECT_EQ(contents(drawing), before);

    // Nor to a new name ending in .dwg, nor over a DWG that is named otherwise.
    const QString target = folder_.filePath("copy.DWG");
    const HostRun named = zvhost({drawing, "-o", target});
    EXPECT_EQ(named.status, 1);
    EXPECT_TRUE(named.err.contains("does not write DWG")) << named.err.toStdString();
    EXPECT_FALSE(QFileInfo::exists(target));
    const QString disguised = copy("xdata.dwg", "disguised.dxf");
    const HostRun over = zvhost({drawing, "-o", disguised});
    EXPECT_EQ(over.status, 1);
    EXPECT_EQ(contents(disguised), before);
}

TEST_F(ZvhostDwg, ADwgOpensAsTheDocumentAndSavesAsDxf) {
    if (nodeAbsent()) GTEST_SKIP() << "Node.js is not installed; reading DWG drawings needs it";
    const QString drawing = copy("sample_AC1015.dwg", "sample.dwg");
    const QByteArray before = contents(drawing);
    const QString output = folder_.filePath("sample.dxf");
    const HostRun run = zvhost({drawing, "-o", output});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(contents(drawing), before);
    const auto saved = zvdb::DxfLoader::loadFile(output.toStdString());
    EXPECT_TRUE(saved->layer("Layer_Off")->isOff());
    EXPECT_FALSE(saved->layer("Layer1")->isOff());
    auto* reference = dynamic_cast<zvdb::BlockReference*>(saved->objectByHandle(0x79C));
    ASSERT_TRUE(reference);
    EXPECT_EQ(reference->attributes().size(), 3u);

    const HostRun info = zvtest::runZvhost({"dxf-info", drawing});
    ASSERT_EQ(info.status, 0) << info.err.toStdString();
    EXPECT_TRUE(info.out.contains("version: AC1015")) << info.out.toStdString();
    EXPECT_TRUE(info.out.contains("Layer_Freeze frozen")) << info.out.toStdString();
}

TEST_F(ZvhostDwg, UnreadableDwgFilesEndInStatusOneAndWriteNothing) {
    const QString output = folder_.filePath("out.dxf");
    // Text named .dwg.
    const QString text = folder_.filePath("text.dwg");
    {
        QFile file(text);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write("  0\nSECTION\n  2\nENTITIES\n  0\nENDSEC\n  0\nEOF\n");
    }
    HostRun run = zvhost({text, "-o", output});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains(text + ": not a DWG drawing")) << run.err.toStdString();
    EXPECT_FALSE(QFileInfo::exists(output));

    // A DWG cut short (the converter reads it when Node.js is there; else Node.js is asked for).
    const QString cut = folder_.filePath("cut.dwg");
    {
        QFile file(cut);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(contents(kSamples + "sample_AC1032.dwg").left(40000));
    }
    const QByteArray cutBefore = contents(cut);
    run = zvhost({cut, "-o", output});
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains(cut + ": ")) << run.err.toStdString();
    if (!nodeAbsent()) {
        EXPECT_TRUE(run.err.contains("may be damaged")) << run.err.toStdString();
    }
    EXPECT_FALSE(QFileInfo::exists(output));
    EXPECT_EQ(contents(cut), cutBefore);
}

TEST_F(ZvhostDwg, WithoutNodeOpeningADwgSaysWhatToInstall) {
    const QString drawing = copy("xdata.dwg", "project.dwg");
    const QString output = folder_.filePath("out.dxf");
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert("ZV_NODE", folder_.filePath("bin/node"));
    HostRun run = zvhost({drawing, "-o", output}, environment);
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains(drawing + ": reading a DWG drawing needs Node.js 20"))
        << run.err.toStdString();
    EXPECT_FALSE(QFileInfo::exists(output));

    // No node on the PATH either.
    environment.remove("ZV_NODE");
    environment.insert("PATH", folder_.filePath("bin"));
    run = zvhost({drawing, "-o", output}, environment);
    EXPECT_EQ(run.status, 1);
    EXPECT_TRUE(run.err.contains("was not found on the PATH: install it")) << run.err.toStdString();
    EXPECT_FALSE(QFileInfo::exists(output));
}
