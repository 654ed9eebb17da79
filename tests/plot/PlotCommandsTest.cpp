// The host's print and export commands as the module drives them, from outside: the files
// they write, their paper sizes and texts, and what happens when they can't.
#include "PlotFixture.h"
#include "ZvhostRun.h"

#include "app/PlotCommands.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"

#include <QDir>
#include <QFile>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

namespace zvtest {
namespace {

QString tool(const QString& program, const QStringList& arguments, int* status = nullptr) {
    QProcess process;
    process.start(program, arguments);
    process.waitForFinished(60000);
    if (status) *status = process.exitCode();
    return QString::fromUtf8(process.readAllStandardOutput() + process.readAllStandardError());
}

// The print command's answers, in the order the module gives them.
QString printCall(const QString& paper, bool landscape, const QString& file,
                  const QString& extra = "\"_N\"") {
    const QStringList sides = paper.split(',');
    return QString(
               "(command \"_-PRINT\" \"_Y\" \"Model\" \"PDF\" \"FV PDF\" \"M\" \"%1\" \"%2\" "
               "\"0.0\" \"0.0\" \"0.0\" \"0.0\" \"%3\" \"_N\" \"_A\" \"_F\" \"_C\" %4 \"_Y\" "
               "\"_D\" \"%5\" \"_N\" \"_Y\")")
        .arg(sides.value(1), sides.value(0), landscape ? "_L" : "_P", extra, file);
}

class PlotCommandsTest : public PlotTest {
protected:
    void SetUp() override {
        ASSERT_TRUE(folder.isValid());
        model().addLine({0, 0}, {400, 0});
        model().addLine({400, 0}, {400, 280});
        model().addText({20, 140}, 10, "QUADRO GERAL");
        drawing = folder.filePath("page.dxf");
        zvdb::DxfWriter::saveFile(db, drawing.toStdString());
    }
    HostRun run(const QStringList& evals, const Limits& limits = {}) {
        QStringList args{"--no-module", drawing};
        for (const QString& e : evals)
            args << "--eval" << e;
        return runZvhost(args, QProcessEnvironment::systemEnvironment(), folder.path(), 60000,
                         limits);
    }
    QStringList leftovers() const {
        return QDir(folder.path()).entryList(QStringList{"*zvsave*"}, QDir::Files | QDir::Hidden);
    }
    QTemporaryDir folder;
    QString drawing;
};

TEST_F(PlotCommandsTest, EveryPaperOfTheTablePrintsAtItsSizeAndOrientation) {
    const QStringList papers{"1189,841", "841,1189", "594,841", "841,594", "420,594",
                             "594,420",  "297,420",  "420,297", "210,297", "297,210"};
    QStringList evals;
    for (int i = 0; i < papers.size(); ++i) {
        // Landscape for the rows whose first side is the longer, as the user's choice goes.
        const QStringList s = papers[i].split(',');
        const bool landscape = s[0].toDouble() > s[1].toDouble();
        evals << printCall(papers[i], landscape, folder.filePath(QString("p%1.pdf").arg(i)));
    }
    const HostRun result = run(evals);
    ASSERT_EQ(result.status, 0) << result.err.toStdString() << result.out.toStdString();
    for (int i = 0; i < papers.size(); ++i) {
        const QString pdf = folder.filePath(QString("p%1.pdf").arg(i));
        int status = -1;
        tool("qpdf", {"--check", pdf}, &status);
        EXPECT_EQ(status, 0) << pdf.toStdString();
        const QString info = tool("pdfinfo", {pdf});
        const auto match =
            QRegularExpression("Page size:\\s+([0-9.]+) x ([0-9.]+) pts").match(info);
        ASSERT_TRUE(match.hasMatch()) << info.toStdString();
        const QStringList s = papers[i].split(',');
        // Millimetres to points.
        EXPECT_NEAR(match.captured(1).toDouble(), s[0].toDouble() / 25.4 * 72, 1.0) << i;
        EXPECT_NEAR(match.captured(2).toDouble(), s[1].toDouble() / 25.4 * 72, 1.0) << i;
    }
    EXPECT_TRUE(tool("pdftotext", {folder.filePath("p9.pdf"), "-"}).contains("QUADRO GERAL"));
}

TEST_F(PlotCommandsTest, AnswersAreReadAsTheModuleGivesThem) {
    zvhost::PrintAnswers answers;
    QString error;
    QStringList tokens{"_Y",
                       "Model",
                       "PDF",
                       "FV PDF",
                       "M",
                       "297.0",
                       "420.0",
                       "0.0",
                       "0.0",
                       "0.0",
                       "0.0",
                       "_P",
                       "_N",
                       "_S",
                       "400,280",
                       "10,5",
                       "_R",
                       "50",
                       "_F",
                       "_C",
                       "_Y",
                       "monochrome.ctb",
                       "_Y",
                       "_D",
                       "C:\\\\tmp\\\\x.pdf",
                       "_N",
                       "_Y"};
    ASSERT_TRUE(zvhost::parsePrintAnswers(tokens, answers, &error)) << error.toStdString();
    EXPECT_FALSE(answers.landscape);
    EXPECT_FALSE(answers.extents);
    EXPECT_EQ(answers.x1, 10);
    EXPECT_EQ(answers.y1, 5);
    EXPECT_EQ(answers.x2, 400);
    EXPECT_EQ(answers.y2, 280);
    EXPECT_EQ(answers.dpi, 100);  // 50 is raised to the least resolution
    EXPECT_EQ(answers.styleTable, "monochrome.ctb");
    EXPECT_TRUE(answers.lineWeights);
    EXPECT_EQ(answers.file, "C:/tmp/x.pdf");
    tokens[17] = "1000";
    ASSERT_TRUE(zvhost::parsePrintAnswers(tokens, answers, &error));
    EXPECT_EQ(answers.dpi, 600);
    // Without a resolution answer the scale comes next.
    tokens.removeAt(17);
    tokens.removeAt(16);
    zvhost::PrintAnswers plain;
    ASSERT_TRUE(zvhost::parsePrintAnswers(tokens, plain, &error)) << error.toStdString();
    EXPECT_EQ(plain.dpi, 300);
    EXPECT_FALSE(zvhost::parsePrintAnswers(tokens.mid(0, 12), plain, &error));
    EXPECT_TRUE(error.startsWith("missing answer")) << error.toStdString();
    tokens[5] = "A4";
    EXPECT_FALSE(zvhost::parsePrintAnswers(tokens, answers, &error));
    EXPECT_TRUE(error.contains("A4"));
}

TEST_F(PlotCommandsTest, AFailedPrintFailsAndWritesNothing) {
    const QString target = folder.filePath("bad.pdf");
    QString call = printCall("210,297", true, target);
    call.replace("\"PDF\" \"FV PDF\"", "\"PLOTTER\" \"FV PDF\"");
    HostRun result = run({call});
    EXPECT_NE(result.status, 0);
    EXPECT_TRUE(result.out.contains("no such output device")) << result.out.toStdString();
    EXPECT_FALSE(QFile::exists(target));
    // A window whose corners are not points.
    call = printCall("210,297", true, target);
    call.replace("\"_A\"", "\"_S\" \"upper\" \"lower\"");
    result = run({call});
    EXPECT_NE(result.status, 0);
    EXPECT_FALSE(QFile::exists(target));
}

TEST_F(PlotCommandsTest, AMissingPlotStyleIsSaidAndThePrintGoesOnInColour) {
    const QString target = folder.filePath("styled.pdf");
    const HostRun result = run({printCall("420,297", true, target, "\"_Y\" \"nowhere.ctb\"")});
    ASSERT_EQ(result.status, 0) << result.err.toStdString();
    EXPECT_TRUE(result.out.contains("plot style table nowhere.ctb not found"));
    EXPECT_TRUE(QFile::exists(target));
}

TEST_F(PlotCommandsTest, AFullDiskLeavesTheOldFileAndNoTemporaryFile) {
    const QString target = folder.filePath("kept.pdf");
    {
        QFile old(target);
        ASSERT_TRUE(old.open(QIODevice::WriteOnly));
        old.write("the old file");
    }
    Limits limits;
    limits.prlimit << "--fsize=3000";
    const HostRun result = run({printCall("420,297", true, target)}, limits);
    EXPECT_NE(result.status, 0);
    EXPECT_TRUE(result.out.contains("could not save")) << result.out.toStdString();
    QFile kept(target);
    ASSERT_TRUE(kept.open(QIODevice::ReadOnly));
    EXPECT_EQ(kept.readAll(), QByteArray("the old file"));
    EXPECT_TRUE(leftovers().isEmpty()) << leftovers().join(' ').toStdString();
}

TEST_F(PlotCommandsTest, ExportWritesImagesAndMetafilesOfTheViewAndRefusesOtherFormats) {
    const QString png = folder.filePath("view.png"), emf = folder.filePath("view.emf");
    const QString dwf = folder.filePath("view.dwf");
    HostRun result = run({"(command \"_.zoom\" \"_E\")",
                          QString("(command \"_.export\" \"PNG\" \"%1\")").arg(png),
                          QString("(command \"_.export\" \"EMF\" \"%1\")").arg(emf)});
    ASSERT_EQ(result.status, 0) << result.out.toStdString() << result.err.toStdString();
    QImage image(png);
    ASSERT_FALSE(image.isNull());
    // The view is 400 by 280 units: the image has its shape and the line along the bottom.
    EXPECT_NEAR(double(image.width()) / image.height(), 400.0 / 280.0, 0.02);
    EXPECT_GT(inkCount(image.scaled(400, 280)), 200);
    QFile metafile(emf);
    ASSERT_TRUE(metafile.open(QIODevice::ReadOnly));
    const QByteArray bytes = metafile.readAll();
    ASSERT_GT(bytes.size(), 88);
    auto u32 = [&](int at) {
        return quint32(quint8(bytes[at])) | quint32(quint8(bytes[at + 1])) << 8 |
               quint32(quint8(bytes[at + 2])) << 16 | quint32(quint8(bytes[at + 3])) << 24;
    };
    EXPECT_EQ(u32(0), 1u);  // the header record comes first
    EXPECT_EQ(bytes.mid(40, 4), QByteArray(" EMF"));
    EXPECT_EQ(u32(48), quint32(bytes.size()));  // the header's byte count is the file's
    // The records chain to the end, the last one the end-of-file record.
    quint32 at = 0, last = 0, records = 0;
    while (at + 8 <= quint32(bytes.size())) {
        last = u32(int(at));
        const quint32 size = u32(int(at) + 4);
        ASSERT_GE(size, 8u);
        at += size;
        ++records;
    }
    EXPECT_EQ(at, quint32(bytes.size()));
    EXPECT_EQ(last, 14u);
    EXPECT_EQ(records, u32(52));  // the header counts them
    // An independent reader: the imaging library of Debian's Python opens the metafile.
    const QString seen = tool("/usr/bin/python3",
                              {"-c",
                               "import sys; from PIL import Image; im = Image.open(sys.argv[1]); "
                               "print(im.format, im.size[0] > 0 and im.size[1] > 0)",
                               emf});
    EXPECT_EQ(seen.trimmed(), "WMF True") << seen.toStdString();
    result = run({QString("(command \"_.export\" \"DWF\" \"%1\")").arg(dwf)});
    EXPECT_NE(result.status, 0);
    EXPECT_TRUE(result.out.contains("not available in this edition"));
    EXPECT_FALSE(QFile::exists(dwf));
}

}  // namespace
}  // namespace zvtest

namespace zvtest {
namespace {

// A saved project shows one page; the plot of another page shows that one, as the product
// shows a page before it prints it.
TEST_F(PlotCommandsTest, APageAskedForIsDrawnEvenWhenTheDrawingKeepsItFrozen) {
    db.createLayer("ESQ$0002$A")->setFrozen(true);
    model().addLine({0, 0}, {400, 280}, "ESQ$0002$A");
    zvdb::DxfWriter::saveFile(db, drawing.toStdString());
    const QString png = folder.filePath("p2.png");
    const HostRun result =
        runZvhost({"plot", drawing, "--page", "ESQ$0002$A", "--out", png},
                  QProcessEnvironment::systemEnvironment(), folder.path(), 60000);
    ASSERT_EQ(result.status, 0) << result.err.toStdString();
    const QImage image(png);
    ASSERT_FALSE(image.isNull());
    EXPECT_GT(inkCount(image), 100);
    // The page's line only: the frozen page stays frozen in the file.
    const auto saved = zvdb::DxfLoader::loadFile(drawing.toStdString());
    ASSERT_TRUE(saved);
    EXPECT_TRUE(saved->layer("ESQ$0002$A")->isFrozen());
}

}  // namespace
}  // namespace zvtest
