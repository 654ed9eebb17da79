// Drawings that ezdxf writes, with foreign objects put in, go through our reader and writer
// and come out with every object, tag, layer, extended data and dictionary in place.
#include "PythonChecker.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/LayerRecord.h"
#include "drawing/TagValues.h"
#include "drawing/TextEntity.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

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

// An R12 drawing is read as an R2000 one: handles, owners, block records and layouts.
TEST_F(DxfRoundTrip, R12DrawingBecomesR2000) {
    const QString input = folder_ + "/fixture_R12.dxf";
    auto db = zvdb::DxfLoader::loadFile(input.toStdString());
    EXPECT_EQ(db->version(), "AC1015");
    ASSERT_FALSE(db->warnings().empty());
    EXPECT_NE(db->warnings().back().find("converted to R2000"), std::string::npos);
    ASSERT_NE(db->layer("FROZEN"), nullptr);
    EXPECT_TRUE(db->layer("FROZEN")->isFrozen());
    const auto entities = db->modelSpace()->entities();
    ASSERT_EQ(entities.size(), 6u);
    for (const zvdb::Entity* entity : entities) {
        EXPECT_EQ(entity->ownerHandle(), db->modelSpace()->handle());
        EXPECT_EQ(db->objectByHandle(entity->handle()), entity);
    }
    auto* reference = dynamic_cast<zvdb::BlockReference*>(entities[1]);
    ASSERT_NE(reference, nullptr);
    ASSERT_NE(reference->attribute("REGUA"), nullptr);
    EXPECT_EQ(reference->attribute("REGUA")->textValue(), "X9");
    EXPECT_EQ(reference->definition()->basePoint(), (zvdb::Point3{1, 2, 0}));
    const auto xdata = reference->xdata("KVR_ZV");
    ASSERT_EQ(xdata.size(), 2u);
    EXPECT_EQ(zvdb::TagValues::toHandle(xdata[1].value), entities[0]->handle())
        << "a handle in extended data follows its object";
    EXPECT_EQ(static_cast<zvdb::TextEntity*>(entities[3])->content(), "Ação ñ € Ω");

    const QString output = PythonChecker::scratchFolder() + "/r12.dxf";
    zvdb::DxfWriter::saveFile(*db, output.toStdString());
    QString report;
    ASSERT_EQ(PythonChecker::run("inspect_dxf.py", {output}, &report), 0) << report.toStdString();
    const QJsonObject seen = QJsonDocument::fromJson(report.toUtf8()).object();
    EXPECT_EQ(seen["version"].toString(), "AC1015");
    EXPECT_TRUE(seen["layers"].toObject()["FROZEN"].toObject()["frozen"].toBool());
    const QJsonArray model = seen["modelspace"].toArray();
    ASSERT_EQ(model.size(), 6);
    EXPECT_EQ(model[1].toObject()["attribs"].toArray()[0].toArray()[1].toString(), "X9");
    EXPECT_EQ(model[2].toObject()["points"].toArray().size(), 3);
    EXPECT_EQ(seen["blocks"].toObject()["BORNE_X"].toArray().size(), 2);
}

}  // namespace
