// Drawings that ezdxf writes, with foreign objects put in, go through our reader and writer
// and come out with every object, tag, layer, extended data and dictionary in place.
#include "PythonChecker.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>

using zvtest::PythonChecker;

namespace {

class DxfRoundTrip : public ::testing::TestWithParam<const char*> {
protected:
    void SetUp() override {
        const QString missing = PythonChecker::missing();
        ASSERT_TRUE(missing.isEmpty()) << missing.toStdString();
        QString log;
        folder_ = PythonChecker::fixtureFolder(&log);
        ASSERT_FALSE(folder_.isEmpty()) << "fixtures could not be made:\n" << log.toStdString();
    }
    QString folder_;
};

TEST_P(DxfRoundTrip, KeepsEveryObjectAndPassesAudit) {
    const QString input = folder_ + "/" + GetParam();
    const QString output = PythonChecker::scratchFolder() + "/" + GetParam();
    auto database = zvdb::DxfLoader::loadFile(input.toStdString());
    zvdb::DxfWriter::saveFile(*database, output.toStdString());
    QString report;
    const int status = PythonChecker::run("compare_dxf.py", {input, output}, &report);
    EXPECT_EQ(status, 0) << report.toStdString();
}

INSTANTIATE_TEST_SUITE_P(Versions, DxfRoundTrip,
                         ::testing::Values("fixture_R2000.dxf", "fixture_R2004.dxf",
                                           "fixture_R2007.dxf", "fixture_R2010.dxf",
                                           "fixture_R2013.dxf", "fixture_R2018.dxf",
                                           "binary_R2010.dxf"));

}  // namespace
