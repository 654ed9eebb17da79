// A zoom to extents shows what showed when it was asked for, however late the view is read:
// changes of the drawing after it, of shapes or of layers, never reach the view.
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>

namespace {

using View = zvhost::HostDocument::View;

class ZoomExtentsTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(folder_.isValid());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, out_, false);
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        document_ = app_->openDocument(folder_.filePath("zoom.dxf"));
        db().createLayer("P1");
        db().createLayer("P2")->setFrozen(true);
        line_ = db().modelSpace()->addLine({0, 0, 0}, {10, 5, 0}, "P1");
        db().modelSpace()->addLine({100, 100, 0}, {120, 130, 0}, "P2");
    }
    zvdb::Database& db() { return *document_->database(); }
    void zoomExtents() { ASSERT_TRUE(document_->runCommand({"_.zoom", "_E"})); }
    static void expectView(const View& got, const View& want) {
        EXPECT_DOUBLE_EQ(got.minX, want.minX);
        EXPECT_DOUBLE_EQ(got.minY, want.minY);
        EXPECT_DOUBLE_EQ(got.maxX, want.maxX);
        EXPECT_DOUBLE_EQ(got.maxY, want.maxY);
    }

    QTemporaryDir folder_;
    QString text_;
    QTextStream out_{&text_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::HostDocument* document_ = nullptr;
    zvdb::Entity* line_ = nullptr;
};

TEST_F(ZoomExtentsTest, ShapesAddedEditedOrErasedAfterTheZoomStayOutOfTheView) {
    const View shown{0, 0, 10, 5};
    zoomExtents();
    db().modelSpace()->addLine({-50, -50, 0}, {0, 0, 0}, "P1");
    expectView(document_->view(), shown);

    zoomExtents();
    line_->setPoint(11, {40, 40, 0});
    expectView(document_->view(), {-50, -50, 10, 5});

    zoomExtents();
    line_->erase();
    expectView(document_->view(), {-50, -50, 40, 40});
    // Read again with nothing pending: the view stays.
    db().modelSpace()->addLine({0, 0, 0}, {500, 500, 0}, "P1");
    expectView(document_->view(), {-50, -50, 40, 40});
}

TEST_F(ZoomExtentsTest, LayersShownAtTheZoomAreTheOnesMeasured) {
    zoomExtents();
    // The next page shows, the first goes: the view is still the first page's.
    db().layer("P2")->setFrozen(false);
    db().layer("P1")->setFrozen(true);
    expectView(document_->view(), {0, 0, 10, 5});
    // A second zoom before anything is read replaces the first.
    zoomExtents();
    db().layer("P1")->setFrozen(false);
    db().modelSpace()->addLine({-9, -9, 0}, {0, 0, 0}, "P2");
    expectView(document_->view(), {100, 100, 120, 130});
    zoomExtents();
    expectView(document_->view(), {-9, -9, 120, 130});
}

TEST_F(ZoomExtentsTest, AnEntitySpellingAHiddenLayerInOtherCaseStaysHidden) {
    db().modelSpace()->addLine({-70, -70, 0}, {-60, -60, 0}, "p2");
    db().modelSpace()->addLine({30, 30, 0}, {35, 36, 0}, "p1");
    zoomExtents();
    db().layer("P2")->setFrozen(false);
    expectView(document_->view(), {0, 0, 35, 36});
    // Measured when a shape is about to change, from the layer states of the zoom.
    db().layer("P2")->setFrozen(true);
    zoomExtents();
    db().layer("P2")->setFrozen(false);
    db().layer("P1")->setFrozen(true);
    line_->erase();
    expectView(document_->view(), {0, 0, 35, 36});
}

TEST_F(ZoomExtentsTest, AWindowAfterTheZoomWinsAndLaterChangesLeaveIt) {
    zoomExtents();
    ASSERT_TRUE(document_->runCommand({"_.zoom", "_W", "1,2", "3,4"}));
    db().modelSpace()->addLine({-50, -50, 0}, {0, 0, 0}, "P1");
    expectView(document_->view(), {1, 2, 3, 4});
    // Nothing showing gives the unit square.
    db().layer("P1")->setFrozen(true);
    zoomExtents();
    db().modelSpace()->addLine({7, 7, 0}, {8, 8, 0}, "P1");
    expectView(document_->view(), {0, 0, 1, 1});
}

}  // namespace
