// Huge pages for runs on large drawings: when the host asks for them, and its restart with the
// same arguments and the tunable added.
#include "app/HugePages.h"

#include "ZvhostRun.h"

#include <QFile>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

class HugePages : public ::testing::Test {
protected:
    void SetUp() override {
        if (!zvhost::kernelOffersHugePages()) GTEST_SKIP() << "the kernel offers no huge pages";
        qunsetenv("ZV_HUGE_PAGES");
        qunsetenv("GLIBC_TUNABLES");
        small = folder.filePath("small.dxf");
        large = folder.filePath("large.dxf");
        QFile smallFile(small), largeFile(large);
        ASSERT_TRUE(smallFile.open(QIODevice::WriteOnly) && largeFile.open(QIODevice::WriteOnly));
        smallFile.write("0\nEOF\n");
        ASSERT_TRUE(largeFile.resize(zvhost::kLargeDrawingBytes));  // sparse: no disk taken
    }
    void TearDown() override {
        qunsetenv("ZV_HUGE_PAGES");
        qunsetenv("GLIBC_TUNABLES");
    }
    // What a run's LISP sees of the tunables, and how often its --eval ran.
    zvtest::HostRun tunablesSeen(const QProcessEnvironment& environment) {
        return zvtest::runZvhost({"--no-module", small, "--eval",
                                  "(princ (strcat \"[\" (vl-princ-to-string (getenv "
                                  "\"GLIBC_TUNABLES\")) \"]\"))"},
                                 environment);
    }
    QTemporaryDir folder;
    QString small, large;
};

TEST_F(HugePages, LargeDrawingsOnlyUnlessAskedOrTurnedOff) {
    EXPECT_FALSE(zvhost::wantsHugePages(small));
    EXPECT_TRUE(zvhost::wantsHugePages(large));
    EXPECT_FALSE(zvhost::wantsHugePages(folder.filePath("missing.dxf")));
    qputenv("ZV_HUGE_PAGES", "1");
    EXPECT_TRUE(zvhost::wantsHugePages(small));
    qputenv("ZV_HUGE_PAGES", "0");
    EXPECT_FALSE(zvhost::wantsHugePages(large));
    qunsetenv("ZV_HUGE_PAGES");
    qputenv("GLIBC_TUNABLES", "glibc.malloc.hugetlb=0");
    EXPECT_FALSE(zvhost::wantsHugePages(large)) << "a choice already made stands";
}

TEST_F(HugePages, TheRestartedHostRunsOnceWithTheTunableAddedToThoseGiven) {
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.remove("GLIBC_TUNABLES");
    environment.insert("ZV_HUGE_PAGES", "1");
    zvtest::HostRun run = tunablesSeen(environment);
    EXPECT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_EQ(run.out, "[glibc.malloc.hugetlb=1]");

    environment.insert("GLIBC_TUNABLES", "glibc.malloc.perturb=0");
    run = tunablesSeen(environment);
    EXPECT_EQ(run.out, "[glibc.malloc.perturb=0:glibc.malloc.hugetlb=1]");

    environment.insert("ZV_HUGE_PAGES", "0");
    run = tunablesSeen(environment);
    EXPECT_EQ(run.out, "[glibc.malloc.perturb=0]");
    environment.remove("ZV_HUGE_PAGES");
    environment.remove("GLIBC_TUNABLES");
    run = tunablesSeen(environment);
    EXPECT_EQ(run.out, "[nil]") << "a small drawing runs as it was started";
}

}  // namespace
