// One page of a generated project written as a drawing of its own: it opens and audits
// clean in an independent reader (ezdxf) and holds that page's entities and no other's.
#include "ZvhostRun.h"

#include <QFile>
#include <QProcess>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace zvtest {
namespace {

// Opens the file with ezdxf, audits it and prints the error count, then one line per layer
// used in model space with its entity count.
const char* const kAudit = R"(
import sys, collections, ezdxf
doc = ezdxf.readfile(sys.argv[1])
auditor = doc.audit()
print("errors", len(auditor.errors))
counts = collections.Counter(e.dxf.layer for e in doc.modelspace())
for layer, n in sorted(counts.items()):
    print("layer", layer, n)
print("blocks", sum(1 for b in doc.blocks if not b.name.startswith("*")))
)";

TEST(PageDxfExportTest, APageBecomesADrawingThatAuditsCleanWithOnlyThatPage) {
    QTemporaryDir folder;
    ASSERT_TRUE(folder.isValid());
    const QString project = folder.filePath("project.dxf");
    HostRun run = runZvhost(
        {"generate", "--out", project, "--seed", "3", "--terminals", "40", "--pages", "3"});
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    const QString out = folder.filePath("page.dxf");
    run = runZvhost({"--no-module", project, "--eval",
                     QString("(princ (zvExportaLayerDxf \"%1\" \"COMANDO$0001$A\"))").arg(out)});
    ASSERT_EQ(run.status, 0) << run.err.toStdString() << run.out.toStdString();
    EXPECT_TRUE(run.out.contains("T"));
    QProcess python;
    python.start("/usr/bin/python3", {"-c", kAudit, out});
    ASSERT_TRUE(python.waitForFinished(120000));
    const QString report = QString::fromUtf8(python.readAllStandardOutput());
    ASSERT_EQ(python.exitCode(), 0) << python.readAllStandardError().toStdString();
    EXPECT_TRUE(report.contains("errors 0\n")) << report.toStdString();
    EXPECT_TRUE(report.contains("layer COMANDO$0001$A ")) << report.toStdString();
    EXPECT_TRUE(report.contains("layer COMANDO$FORMATO ")) << report.toStdString();
    EXPECT_FALSE(report.contains("COMANDO$0002$A")) << report.toStdString();
    EXPECT_FALSE(report.contains("FORCA$0001$A")) << report.toStdString();
    EXPECT_FALSE(report.contains("blocks 0\n")) << report.toStdString();

    // A page that doesn't exist writes nothing and says so.
    const QString none = folder.filePath("none.dxf");
    run = runZvhost({"--no-module", project, "--eval",
                     QString("(princ (zvExportaLayerDxf \"%1\" \"NADA$0001$A\"))").arg(none)});
    EXPECT_TRUE(run.out.contains("no such page: NADA$0001$A")) << run.out.toStdString();
    EXPECT_FALSE(QFile::exists(none));
}

}  // namespace
}  // namespace zvtest
