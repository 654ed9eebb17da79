// A generated project as a file: the same seed gives the same bytes, our reader and ezdxf
// both read it without complaint, and zvhost saves it back unchanged.
#include "SampleProject.h"

#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QProcess>
#include <QTemporaryDir>

using namespace zvtest;

namespace {

std::string generatedText(std::uint64_t seed, int terminals, int pages) {
    zvsample::ProjectGenerator generator({seed, terminals, pages});
    auto db = generator.generate();
    return zvdb::DxfWriter::toText(*db);
}

struct ProcessRun {
    int status = -1;
    QString out, err;
};

ProcessRun run(const QString& program, const QStringList& arguments) {
    QProcess process;
    process.start(program, arguments);
    ProcessRun result;
    if (!process.waitForFinished(300000)) return result;
    result.status = process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1;
    result.out = QString::fromUtf8(process.readAllStandardOutput());
    result.err = QString::fromUtf8(process.readAllStandardError());
    return result;
}

QByteArray contents(const QString& path) {
    QFile file(path);
    return file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
}

const QString kHost = QStringLiteral(ZV_BIN_DIR "/zvhost");

}  // namespace

TEST(SampleFile, SameSeedSameBytesOtherSeedOtherBytes) {
    const std::string a = generatedText(11, 300, 12);
    EXPECT_EQ(a, generatedText(11, 300, 12));
    EXPECT_NE(a, generatedText(12, 300, 12));
    EXPECT_NE(a, generatedText(11, 301, 12));
}

TEST(SampleFile, OurReaderReadsItBackWithoutRepairsAndWritesTheSameText) {
    const std::string text = generatedText(3, 500, 10);
    auto db = zvdb::DxfLoader::load(text);
    ASSERT_NE(db, nullptr);
    EXPECT_TRUE(db->warnings().empty()) << db->warnings().front();
    EXPECT_EQ(zvdb::DxfWriter::toText(*db), text);
}

TEST(SampleFile, EzdxfAuditFindsNoErrors) {
    QTemporaryDir dir;
    const QString path = dir.filePath("sample.dxf");
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(QByteArray::fromStdString(generatedText(4, 200, 8)));
    file.close();
    const QString script =
        "import sys, ezdxf\n"
        "doc = ezdxf.readfile(sys.argv[1])\n"
        "a = doc.audit()\n"
        "msp = doc.modelspace()\n"
        "print(len(a.errors), len(a.fixes), len(msp.query('INSERT')), len(doc.layers))\n"
        "for e in a.errors[:5]: print(e)\n";
    const ProcessRun checked = run("/usr/bin/python3", {"-c", script, path});
    ASSERT_EQ(checked.status, 0) << checked.err.toStdString();
    const QStringList figures = checked.out.split('\n').first().split(' ');
    ASSERT_EQ(figures.size(), 4) << checked.out.toStdString();
    EXPECT_EQ(figures[0], "0") << checked.out.toStdString();
    EXPECT_EQ(figures[1], "0") << checked.out.toStdString();
    EXPECT_GT(figures[2].toInt(), 200);
}

TEST(SampleFile, ZvhostGeneratesAndSavesTheProjectByteForByte) {
    QTemporaryDir dir;
    const QString generated = dir.filePath("demo.dxf"), saved = dir.filePath("saved.dxf");
    const ProcessRun made = run(kHost, {"generate", "--out", generated, "--seed", "9",
                                        "--terminals", "150", "--pages", "10"});
    ASSERT_EQ(made.status, 0) << made.err.toStdString();
    EXPECT_TRUE(made.out.contains("terminals: 150")) << made.out.toStdString();
    EXPECT_TRUE(made.out.contains("pages: 10")) << made.out.toStdString();
    EXPECT_EQ(contents(generated).toStdString(), generatedText(9, 150, 10));
    // Without and with the module loaded: opening and saving changes nothing.
    for (const QStringList& mode : {QStringList{"--no-module"}, QStringList{}}) {
        const ProcessRun roundTrip =
            run(kHost, QStringList{"--quiet"} + mode + QStringList{generated, "-o", saved});
        ASSERT_EQ(roundTrip.status, 0) << roundTrip.err.toStdString();
        EXPECT_EQ(contents(saved), contents(generated)) << mode.join(' ').toStdString();
        QFile::remove(saved);
    }
}

TEST(SampleFile, ZvhostGenerateRefusesBadOptionsAndLeavesNoFile) {
    QTemporaryDir dir;
    const QString out = dir.filePath("x.dxf");
    for (const QStringList& bad :
         {QStringList{"generate"}, QStringList{"generate", "--out", out, "--terminals", "-3"},
          QStringList{"generate", "--out", out, "--pages", "zero"},
          QStringList{"generate", "--out", out, "--colour", "red"},
          QStringList{"generate", "--out", out, "--numbers", "page"},
          QStringList{"generate", "--out"}}) {
        const ProcessRun refused = run(kHost, bad);
        EXPECT_EQ(refused.status, 2) << bad.join(' ').toStdString();
        EXPECT_TRUE(refused.err.contains("usage")) << refused.err.toStdString();
        EXPECT_FALSE(QFile::exists(out));
    }
    const ProcessRun unwritable =
        run(kHost, {"generate", "--out", dir.filePath("missing/folder/x.dxf")});
    EXPECT_EQ(unwritable.status, 1);
}
