// DWG files that can't be read, and a converter that is missing, hangs or breaks: each ends
// in a DxfError that says what to do, and never in a hang.
#include "drawing/DwgImport.h"
#include "drawing/DxfError.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QElapsedTimer>
#include <QFile>
#include <QStandardPaths>
#include <QTemporaryDir>

using namespace zvdb;

namespace {

const std::string kSamples = ZV_TEST_DIR "/dwg/";

void write(const QString& path, const QByteArray& bytes, bool executable = false) {
    QDir().mkpath(QFileInfo(path).path());
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(bytes);
    file.close();
    if (executable)
        file.setPermissions(file.permissions() | QFileDevice::ExeOwner | QFileDevice::ExeUser);
}

// The message of the DxfError that reading `path` throws; empty when it reads.
std::string failure(const std::string& path, const DwgImport::Setup& setup) {
    try {
        DwgImport::loadFile(path, setup);
    } catch (const DxfError& e) {
        return e.what();
    }
    return {};
}

bool contains(const std::string& text, const std::string& part) {
    return text.find(part) != std::string::npos;
}

// A converter folder that looks installed, and a stand-in for node that runs `script`.
class FakeConverter : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(folder_.isValid());
        write(folder_.filePath("dwg/dwg2dxf.mjs"), "// stand-in\n");
        write(folder_.filePath("dwg/node_modules/@mlightcad/libredwg-web/package.json"), "{}\n");
        setup_.converterDir = folder_.filePath("dwg").toStdString();
        input_ = folder_.filePath("drawing.dwg").toStdString();
        write(QString::fromStdString(input_), QByteArray("AC1015") + QByteArray(200, '\0'));
    }
    void node(const QByteArray& script) {
        write(folder_.filePath("node"), "#!/bin/sh\n" + script + "\n", true);
        setup_.node = folder_.filePath("node").toStdString();
    }
    QTemporaryDir folder_;
    DwgImport::Setup setup_;
    std::string input_;
};

}  // namespace

TEST(DwgImportFiles, VersionMarksTellWhatCanBeRead) {
    EXPECT_TRUE(DwgImport::looksLikeDwg("AC1015\x00\x00"));
    EXPECT_TRUE(DwgImport::looksLikeDwg("AC1009"));
    EXPECT_TRUE(DwgImport::looksLikeDwg("AC2.10"));
    EXPECT_FALSE(DwgImport::looksLikeDwg("AC10"));
    EXPECT_FALSE(DwgImport::looksLikeDwg("AC10xx"));
    EXPECT_FALSE(DwgImport::looksLikeDwg("  0\nSECTION\n"));
    EXPECT_EQ(DwgImport::releaseOf("AC1012"), "R13");
    EXPECT_EQ(DwgImport::releaseOf("AC1015"), "2000");
    EXPECT_EQ(DwgImport::releaseOf("AC1032"), "2018");
    EXPECT_EQ(DwgImport::releaseOf("AC1009"), "");
    EXPECT_EQ(DwgImport::releaseOf("AC1040"), "");
}

TEST(DwgImportFiles, DwgFilesAreKnownByNameOrByContent) {
    QTemporaryDir folder;
    ASSERT_TRUE(folder.isValid());
    const QString named = folder.filePath("Project.DWG");
    const QString renamed = folder.filePath("project.bin");
    const QString dxf = folder.filePath("project.dxf");
    write(named, "  0\nEOF\n");
    ASSERT_TRUE(QFile::copy(QString::fromStdString(kSamples + "xdata.dwg"), renamed));
    write(dxf, "  0\nSECTION\n  2\nENTITIES\n  0\nENDSEC\n  0\nEOF\n");
    EXPECT_TRUE(DwgImport::isDwgFile(named.toStdString()));
    EXPECT_TRUE(DwgImport::isDwgFile(renamed.toStdString()));
    EXPECT_FALSE(DwgImport::isDwgFile(dxf.toStdString()));
    EXPECT_TRUE(DwgImport::isDwgFile(folder.filePath("absent.dwg").toStdString()));
    EXPECT_FALSE(DwgImport::isDwgFile(folder.filePath("absent.dxf").toStdString()));
}

TEST(DwgImportFiles, TextNamedDwgAndOldOrNewVersionsAreRefusedBeforeAnyConversion) {
    QTemporaryDir folder;
    ASSERT_TRUE(folder.isValid());
    // No converter is set up: the refusals come before it would be needed.
    DwgImport::Setup none;
    none.converterDir = folder.filePath("nowhere").toStdString();
    const QString text = folder.filePath("text.dwg");
    write(text, "  0\nSECTION\n  2\nHEADER\n  0\nENDSEC\n  0\nEOF\n");
    EXPECT_TRUE(contains(failure(text.toStdString(), none), "not a DWG drawing"));
    const QString empty = folder.filePath("empty.dwg");
    write(empty, "");
    EXPECT_TRUE(contains(failure(empty.toStdString(), none), "not a DWG drawing"));
    const QString old = folder.filePath("r12.dwg");
    write(old, QByteArray("AC1009") + QByteArray(100, '\0'));
    const std::string oldMessage = failure(old.toStdString(), none);
    EXPECT_TRUE(contains(oldMessage, "older than R13")) << oldMessage;
    EXPECT_TRUE(contains(oldMessage, "AC1009")) << oldMessage;
    const QString newer = folder.filePath("future.dwg");
    write(newer, QByteArray("AC1040") + QByteArray(100, '\0'));
    EXPECT_TRUE(contains(failure(newer.toStdString(), none), "newer than 2018"));
    EXPECT_TRUE(
        contains(failure(folder.filePath("absent.dwg").toStdString(), none), "cannot be opened"));
}

TEST_F(FakeConverter, AMissingPackageSaysHowToInstallIt) {
    QTemporaryDir empty;
    ASSERT_TRUE(empty.isValid());
    setup_.converterDir = empty.path().toStdString();
    const std::string message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "not installed")) << message;
    EXPECT_TRUE(contains(message, "./zv deps")) << message;
    EXPECT_TRUE(contains(message, "@mlightcad/libredwg-web 0.7.14")) << message;
}

TEST_F(FakeConverter, AMissingNodeSaysWhatToInstall) {
    setup_.node = folder_.filePath("no-such-node").toStdString();
    std::string message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "needs Node.js")) << message;
    EXPECT_TRUE(contains(message, "install")) << message;

    // Neither ZV_NODE nor the PATH finds one.
    const QByteArray path = qgetenv("PATH");
    const QByteArray zvNode = qgetenv("ZV_NODE");
    qputenv("PATH", folder_.filePath("empty-bin").toUtf8());
    qunsetenv("ZV_NODE");
    setup_.node.clear();
    message = failure(input_, setup_);
    qputenv("PATH", path);
    if (!zvNode.isEmpty()) qputenv("ZV_NODE", zvNode);
    EXPECT_TRUE(contains(message, "was not found on the PATH")) << message;
    EXPECT_TRUE(contains(message, "apt-get install nodejs")) << message;
}

TEST_F(FakeConverter, AConverterThatHangsIsStoppedAtTheTimeLimit) {
    node("exec sleep 60");
    setup_.timeoutSeconds = 1;
    QElapsedTimer clock;
    clock.start();
    const std::string message = failure(input_, setup_);
    EXPECT_LT(clock.elapsed(), 20000);
    EXPECT_TRUE(contains(message, "took more than 1 s")) << message;
}

TEST_F(FakeConverter, AConverterThatTrapsOrFailsIsReported) {
    node("echo 'RuntimeError: table index is out of bounds' >&2; exit 3");
    std::string message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "could not read it")) << message;
    EXPECT_TRUE(contains(message, "table index is out of bounds")) << message;

    node("kill -SEGV $$");
    message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "stopped while reading")) << message;

    // Says it succeeded but wrote nothing.
    node("exit 0");
    message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "wrote no drawing")) << message;
}

TEST_F(FakeConverter, ConverterOutputThatIsNoDrawingIsRefused) {
    // The stand-in writes a broken DXF and facts into the folder it is given (its 5th
    // argument, after --liftoff-only, the script and the converter folder).
    node(
        "printf '  0\\nSECTION\\n  2\\nENTITIES\\n999x\\n' > \"$5/drawing.dxf\"; echo '{}' > "
        "\"$5/facts.json\"");
    std::string message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "the DWG converter's drawing can't be read")) << message;
    node("printf '  0\\nEOF\\n' > \"$5/drawing.dxf\"; echo 'nonsense' > \"$5/facts.json\"");
    message = failure(input_, setup_);
    EXPECT_TRUE(contains(message, "facts are not readable")) << message;
}

TEST(DwgImportConverter, ATruncatedDwgIsReportedAsDamaged) {
    if (qEnvironmentVariableIsEmpty("ZV_NODE") && QStandardPaths::findExecutable("node").isEmpty())
        GTEST_SKIP() << "Node.js is not installed; reading DWG drawings needs it";
    QTemporaryDir folder;
    ASSERT_TRUE(folder.isValid());
    QFile sample(QString::fromStdString(kSamples + "sample_AC1032.dwg"));
    ASSERT_TRUE(sample.open(QIODevice::ReadOnly));
    const QString cut = folder.filePath("cut.dwg");
    write(cut, sample.read(40000));
    DwgImport::Setup setup;
    setup.converterDir = ZV_BIN_DIR "/dwg";
    const std::string message = failure(cut.toStdString(), setup);
    EXPECT_TRUE(contains(message, "may be damaged")) << message;
}
