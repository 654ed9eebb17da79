// One drawing per kind of entity, rendered small and compared with what is expected, drawn
// here with plain painter calls at the points the geometry says, within two pixels.
#include "PlotFixture.h"

#include "drawing/Attribute.h"
#include "drawing/BlockReference.h"
#include "drawing/LayerRecord.h"
#include "drawing/TextEntity.h"

#include <QPainterPath>

#include <cmath>

namespace zvtest {
namespace {

using zvdb::Point3;
using zvdb::Tag;

class RendererGoldenTest : public PlotTest {};

TEST_F(RendererGoldenTest, LinesArcsCirclesAndEllipsesLieWhereTheirGeometrySays) {
    model().addLine({10, 10}, {90, 30});
    model().addCircle({30, 70}, 15);
    model().addArc({70, 70}, 20, 0, 90);
    db.addEntity(model(), "ELLIPSE",
                 {{100, "AcDbEllipse"},
                  {10, "60"},
                  {20, "30"},
                  {30, "0"},
                  {11, "0"},
                  {21, "12"},
                  {31, "0"},
                  {40, "0.5"},
                  {41, "0"},
                  {42, "6.283185307179586"}},
                 "0");
    QImage expected = blankImage();
    auto p = expectedPainter(expected);
    p->drawLine(px(10, 10), px(90, 30));
    p->drawEllipse(px(30, 70), 30, 30);
    p->drawArc(QRectF(px(50, 90), px(90, 50)), 0, 90 * 16);
    // Major axis upright, 12 long; the minor half as long, across.
    p->drawEllipse(px(60, 30), 12, 24);
    p.reset();
    expectSameDrawing(renderScene(db, thin()), expected);
}

TEST_F(RendererGoldenTest, PolylineBulgesAreArcsAndClosedPolylinesReturnToTheStart) {
    // From (10,50) to (50,50) with bulge 1: a half circle turning left, so below the chord.
    db.addEntity(model(), "LWPOLYLINE",
                 {{100, "AcDbPolyline"},
                  {90, "2"},
                  {70, "0"},
                  {10, "10"},
                  {20, "50"},
                  {42, "1"},
                  {10, "50"},
                  {20, "50"}},
                 "0");
    model().addLwPolyline({{60, 60}, {90, 60}, {90, 90}}, true);
    QImage expected = blankImage();
    auto p = expectedPainter(expected);
    p->drawArc(QRectF(px(10, 70), px(50, 30)), 180 * 16, 180 * 16);
    p->drawPolygon(QPolygonF({px(60, 60), px(90, 60), px(90, 90)}));
    p.reset();
    expectSameDrawing(renderScene(db, thin()), expected);
}

TEST_F(RendererGoldenTest, PolylineWidthsFillTheirBand) {
    db.addEntity(model(), "LWPOLYLINE",
                 {{100, "AcDbPolyline"},
                  {90, "2"},
                  {70, "0"},
                  {43, "10"},
                  {10, "20"},
                  {20, "70"},
                  {10, "80"},
                  {20, "70"}},
                 "0");
    // A taper from 0 to 20 units wide: a triangle.
    db.addEntity(model(), "LWPOLYLINE",
                 {{100, "AcDbPolyline"},
                  {90, "2"},
                  {70, "0"},
                  {10, "20"},
                  {20, "25"},
                  {40, "0"},
                  {41, "20"},
                  {10, "80"},
                  {20, "25"}},
                 "0");
    QImage expected = blankImage();
    QPainter p(&expected);
    p.setRenderHint(QPainter::Antialiasing);
    p.setPen(Qt::NoPen);
    p.setBrush(Qt::black);
    p.drawRect(QRectF(px(20, 75), px(80, 65)));
    p.drawPolygon(QPolygonF({px(20, 25), px(80, 35), px(80, 15)}));
    p.end();
    const QImage actual = renderScene(db, thin());
    expectSameDrawing(actual, expected);
    // 120 by 20 pixels of band and a triangle of 120 by 40 / 2.
    EXPECT_NEAR(inkCount(actual), 2400 + 2400, 300);
}

TEST_F(RendererGoldenTest, BlockReferencesAreMovedScaledRotatedMirroredAndNested) {
    // An L: a long leg along x, a short one up y, so every turn and mirror shows.
    zvdb::BlockRecord* ell = db.createBlock("ELL");
    ell->addLine({0, 0}, {10, 0});
    ell->addLine({0, 0}, {0, 5});
    model().addBlockReference(*ell, {20, 20}, {2, 2, 1}, 0);
    model().addBlockReference(*ell, {70, 20}, {1, 1, 1}, 90);
    model().addBlockReference(*ell, {40, 50}, {-2, 1, 1}, 0);
    zvdb::BlockRecord* outer = db.createBlock("OUTER");
    outer->addBlockReference(*ell, {5, 5}, {1, 1, 1}, 0);
    model().addBlockReference(*outer, {60, 60}, {2, 2, 1}, 0);
    QImage expected = blankImage();
    auto p = expectedPainter(expected);
    p->drawLine(px(20, 20), px(40, 20));
    p->drawLine(px(20, 20), px(20, 30));
    // Turned a quarter: the long leg goes up, the short one to the left.
    p->drawLine(px(70, 20), px(70, 30));
    p->drawLine(px(70, 20), px(65, 20));
    // Mirrored in x and twice as long: the long leg goes left.
    p->drawLine(px(40, 50), px(20, 50));
    p->drawLine(px(40, 50), px(40, 55));
    // Nested: (5,5) inside OUTER, scaled by 2 with it.
    p->drawLine(px(70, 70), px(90, 70));
    p->drawLine(px(70, 70), px(70, 80));
    p.reset();
    expectSameDrawing(renderScene(db, thin()), expected);
}

TEST_F(RendererGoldenTest, SolidHatchesFillTheirBoundaryAndLeaveItsHoles) {
    // Outer square 40 x 40 as a polyline loop, an inner 20 x 20 hole as line edges.
    db.addEntity(
        model(), "HATCH",
        {{100, "AcDbHatch"}, {10, "0"},  {20, "0"},  {30, "0"},  {210, "0"}, {220, "0"}, {230, "1"},
         {2, "SOLID"},       {70, "1"},  {71, "0"},  {91, "2"},  {92, "2"},  {72, "0"},  {73, "1"},
         {93, "4"},          {10, "10"}, {20, "10"}, {10, "50"}, {20, "10"}, {10, "50"}, {20, "50"},
         {10, "10"},         {20, "50"}, {97, "0"},  {92, "1"},  {93, "4"},  {72, "1"},  {10, "20"},
         {20, "20"},         {11, "40"}, {21, "20"}, {72, "1"},  {10, "40"}, {20, "20"}, {11, "40"},
         {21, "40"},         {72, "1"},  {10, "40"}, {20, "40"}, {11, "20"}, {21, "40"}, {72, "1"},
         {10, "20"},         {20, "40"}, {11, "20"}, {21, "20"}, {97, "0"},  {75, "1"},  {76, "1"},
         {98, "0"}},
        "0");
    // A circle as one arc edge.
    db.addEntity(model(), "HATCH",
                 {{100, "AcDbHatch"}, {10, "0"},  {20, "0"}, {30, "0"},   {2, "SOLID"}, {70, "1"},
                  {71, "0"},          {91, "1"},  {92, "1"}, {93, "1"},   {72, "2"},    {10, "75"},
                  {20, "70"},         {40, "15"}, {50, "0"}, {51, "360"}, {73, "1"},    {97, "0"},
                  {75, "1"},          {76, "1"},  {98, "0"}},
                 "0");
    const QImage actual = renderScene(db, thin());
    QImage expected = blankImage();
    QPainter p(&expected);
    p.setRenderHint(QPainter::Antialiasing);
    p.setPen(Qt::NoPen);
    p.setBrush(Qt::black);
    QPainterPath ring;
    ring.setFillRule(Qt::OddEvenFill);
    ring.addRect(QRectF(px(10, 50), px(50, 10)));
    ring.addRect(QRectF(px(20, 40), px(40, 20)));
    p.drawPath(ring);
    p.drawEllipse(px(75, 70), 30, 30);
    p.end();
    expectSameDrawing(actual, expected);
    const double expectedInk = 80 * 80 - 40 * 40 + M_PI * 30 * 30;
    EXPECT_NEAR(inkCount(actual), expectedInk, expectedInk * 0.05);
    // The hole's middle is paper.
    EXPECT_FALSE(isInk(actual.pixel(px(30, 30).toPoint())));
}

TEST_F(RendererGoldenTest, PatternHatchesDrawLinesOnlyInsideTheBoundary) {
    db.addEntity(
        model(), "HATCH",
        {{100, "AcDbHatch"}, {10, "0"},      {20, "0"},  {30, "0"},  {2, "ANSI31"}, {70, "0"},
         {71, "0"},          {91, "1"},      {92, "2"},  {72, "0"},  {73, "1"},     {93, "4"},
         {10, "20"},         {20, "20"},     {10, "80"}, {20, "20"}, {10, "80"},    {20, "80"},
         {10, "20"},         {20, "80"},     {97, "0"},  {75, "1"},  {76, "1"},     {52, "0"},
         {41, "1"},          {77, "0"},      {78, "1"},  {53, "45"}, {43, "0"},     {44, "0"},
         {45, "-3.5355"},    {46, "3.5355"}, {79, "0"},  {98, "0"}},
        "0");
    const QImage actual = renderScene(db, thin());
    const QRect box = inkBox(actual);
    EXPECT_GE(box.left(), 38);
    EXPECT_LE(box.right(), 162);
    EXPECT_GE(box.top(), 38);
    EXPECT_LE(box.bottom(), 162);
    // Lines 5 units apart across a 60-unit square: some 17 lines, far from a full fill.
    const int ink = inkCount(actual);
    EXPECT_GT(ink, 1200);
    EXPECT_LT(ink, 120 * 120 / 2);
}

// The box of a text's ink, rendered alone.
QRect textBox(const std::vector<Tag>& body) {
    zvdb::Database db;
    db.addEntity(*db.modelSpace(), "TEXT", body, "0");
    zvplot::RenderOptions options;
    options.lineWeights = false;
    return inkBox(renderScene(db, options));
}

TEST_F(RendererGoldenTest, TextsStandOnTheirAlignmentPointAtTheirHeight) {
    const QRect left = textBox(
        {{100, "AcDbText"}, {10, "20"}, {20, "40"}, {40, "10"}, {1, "HHHH"}, {100, "AcDbText"}});
    // Capitals stand on the baseline (pixel 120) and reach the height (pixel 100).
    EXPECT_NEAR(left.bottom(), 120, 2);
    EXPECT_NEAR(left.top(), 100, 2);
    EXPECT_NEAR(left.left(), 40, 4);
    const QRect centred = textBox({{100, "AcDbText"},
                                   {10, "0"},
                                   {20, "0"},
                                   {40, "10"},
                                   {1, "HHHH"},
                                   {72, "1"},
                                   {11, "50"},
                                   {21, "40"},
                                   {100, "AcDbText"},
                                   {73, "0"}});
    EXPECT_NEAR(centred.center().x(), 100, 3);
    EXPECT_NEAR(centred.width(), left.width(), 2);
    const QRect right = textBox({{100, "AcDbText"},
                                 {10, "0"},
                                 {20, "0"},
                                 {40, "10"},
                                 {1, "HHHH"},
                                 {72, "2"},
                                 {11, "90"},
                                 {21, "40"},
                                 {100, "AcDbText"},
                                 {73, "3"}});
    EXPECT_NEAR(right.right(), 180, 3);
    // Aligned at the top: the capitals hang from the point.
    EXPECT_NEAR(right.top(), 120, 2);
    const QRect middle = textBox({{100, "AcDbText"},
                                  {10, "0"},
                                  {20, "0"},
                                  {40, "10"},
                                  {1, "HHHH"},
                                  {72, "4"},
                                  {11, "50"},
                                  {21, "50"},
                                  {100, "AcDbText"}});
    EXPECT_NEAR(middle.center().x(), 100, 3);
    EXPECT_NEAR(middle.center().y(), 100, 3);
}

TEST_F(RendererGoldenTest, TextWidthFactorRotationAndMirrorChangeTheShape) {
    const QRect plain = textBox(
        {{100, "AcDbText"}, {10, "10"}, {20, "40"}, {40, "8"}, {1, "HHH"}, {100, "AcDbText"}});
    const QRect wide = textBox({{100, "AcDbText"},
                                {10, "10"},
                                {20, "40"},
                                {40, "8"},
                                {41, "2"},
                                {1, "HHH"},
                                {100, "AcDbText"}});
    EXPECT_NEAR(wide.width(), 2 * plain.width(), 4);
    EXPECT_NEAR(wide.height(), plain.height(), 2);
    // A quarter turn: the text runs upwards from its point, to the left of it.
    const QRect turned = textBox({{100, "AcDbText"},
                                  {10, "50"},
                                  {20, "20"},
                                  {40, "8"},
                                  {50, "90"},
                                  {1, "HHH"},
                                  {100, "AcDbText"}});
    EXPECT_NEAR(turned.height(), plain.width(), 3);
    EXPECT_NEAR(turned.width(), plain.height(), 3);
    EXPECT_NEAR(turned.bottom(), 160, 3);
    EXPECT_LE(turned.right(), 101);
    // Backwards: the text runs to the left of its point.
    const QRect backwards = textBox({{100, "AcDbText"},
                                     {10, "50"},
                                     {20, "40"},
                                     {40, "8"},
                                     {71, "2"},
                                     {1, "HHH"},
                                     {100, "AcDbText"}});
    EXPECT_NEAR(backwards.right(), 100, 3);
    EXPECT_NEAR(backwards.width(), plain.width(), 2);
}

TEST_F(RendererGoldenTest, MultiLineTextsBreakAtParagraphsAndHangFromTheirPoint) {
    model().addMText({10, 90}, 5, "{\\fArial|b0;HHH}\\PHHH\\PHHH");
    const QImage image = renderScene(db, thin());
    const QRect box = inkBox(image);
    // Attached at the top left: the first capitals start at the point.
    EXPECT_NEAR(box.top(), 20, 2);
    EXPECT_NEAR(box.left(), 20, 3);
    // Three lines 5 * 5/3 units apart: the last one's baseline 2 pitches lower.
    const double pitch = 5 * 5.0 / 3.0 * 2;
    EXPECT_NEAR(box.bottom(), 20 + 10 + 2 * pitch, 3);
    int bands = 0;
    bool inBand = false;
    for (int y = 0; y < 200; ++y) {
        bool ink = false;
        for (int x = 0; x < 200 && !ink; ++x)
            ink = isInk(image.pixel(x, y));
        if (ink && !inBand) ++bands;
        inBand = ink;
    }
    EXPECT_EQ(bands, 3);
}

TEST_F(RendererGoldenTest, AttributesShowUnlessInvisible) {
    zvdb::BlockRecord* block = db.createBlock("SYM");
    block->addLine({0, 0}, {1, 0});
    auto* reference = model().addBlockReference(*block, {10, 10});
    reference->addAttribute("TAG", "HHH", {10, 50}, 10);
    zvdb::Attribute* hidden = reference->addAttribute("HIDE", "HHH", {10, 20}, 10);
    hidden->setInvisible(true);
    const QRect box = inkBox(renderScene(db, thin()));
    // Only the visible one (pixels 80 to 100) and the short line at pixel 180.
    EXPECT_NEAR(box.top(), 80, 2);
    int textInk = 0;
    const QImage image = renderScene(db, thin());
    for (int y = 130; y < 170; ++y)
        for (int x = 0; x < 200; ++x)
            textInk += isInk(image.pixel(x, y));
    EXPECT_EQ(textInk, 0);
}

TEST_F(RendererGoldenTest, ColoursComeFromEntityLayerAndBlock) {
    db.createLayer("BLUE")->setColor(5);
    model().addLine({10, 90}, {90, 90})->setColor(1);
    model().addLine({10, 70}, {90, 70}, "BLUE");
    zvdb::BlockRecord* block = db.createBlock("BYBLOCK");
    block->addLine({0, 0}, {80, 0})->setColor(0);
    model().addBlockReference(*block, {10, 50})->setColor(3);
    model().addLine({10, 30}, {90, 30})->setColor(7);
    zvdb::Entity* trueColour = model().addLine({10, 10}, {90, 10});
    trueColour->setInteger(420, 0xFF8000, "AcDbEntity");
    zvplot::RenderOptions options = thin();
    options.lineWeights = true;  // a line a few pixels wide shows its colour cleanly
    const QImage image = renderScene(db, options, 3780 * 4);
    auto at = [&](double y) { return QColor(image.pixel(px(50, y).toPoint())); };
    EXPECT_EQ(at(90), QColor(Qt::red));
    EXPECT_EQ(at(70), QColor(Qt::blue));
    EXPECT_EQ(at(50), QColor(Qt::green));
    EXPECT_EQ(at(30), QColor(Qt::black));  // white on white paper is drawn black
    EXPECT_EQ(at(10), QColor(0xFF, 0x80, 0x00));
    zvplot::RenderOptions mono = options;
    mono.monochrome = true;
    const QImage black = renderScene(db, mono, 3780 * 4);
    EXPECT_EQ(QColor(black.pixel(px(50, 90).toPoint())), QColor(Qt::black));
}

// How many rows of ink a horizontal line at y = 50 has in the image's middle column.
int thickness(const QImage& image) {
    int rows = 0;
    for (int y = 0; y < image.height(); ++y)
        rows += isInk(image.pixel(100, y));
    return rows;
}

TEST_F(RendererGoldenTest, LineWeightsAreMillimetresOnTheDevice) {
    zvdb::Entity* line = model().addLine({0, 50}, {100, 50});
    line->setInteger(370, 100, "AcDbEntity");
    // 10 pixels to the millimetre: a 1 mm line is 10 pixels thick.
    zvplot::RenderOptions weights;
    EXPECT_NEAR(thickness(renderScene(db, weights, 10000)), 10, 2);
    EXPECT_LE(thickness(renderScene(db, thin(), 10000)), 2);
    // By layer: the layer's weight, 0.5 mm.
    zvdb::LayerRecord* layer = db.createLayer("HEAVY");
    layer->setInteger(370, 50, "AcDbLayerTableRecord");
    line->setLayer("HEAVY");
    line->setInteger(370, -1, "AcDbEntity");
    EXPECT_NEAR(thickness(renderScene(db, weights, 10000)), 5, 2);
}

TEST_F(RendererGoldenTest, FrozenAndOffLayersAreNotDrawn) {
    db.createLayer("FROZEN")->setFrozen(true);
    db.createLayer("OFF")->setOff(true);
    model().addLine({10, 90}, {90, 90}, "FROZEN");
    model().addLine({10, 70}, {90, 70}, "OFF");
    zvdb::BlockRecord* block = db.createBlock("MIXED");
    block->addLine({0, 0}, {80, 0}, "0");
    block->addLine({0, 10}, {80, 10}, "FROZEN");
    model().addBlockReference(*block, {10, 20}, {1, 1, 1}, 0, "FROZEN");
    model().addBlockReference(*block, {10, 40});
    const QImage image = renderScene(db, thin());
    // Only the layer-0 line of the reference on a visible layer shows.
    const QRect box = inkBox(image);
    EXPECT_NEAR(box.top(), 120, 2);
    EXPECT_NEAR(box.bottom(), 120, 2);
    db.layer("FROZEN")->setFrozen(false);
    EXPECT_NEAR(inkBox(renderScene(db, thin())).top(), 20, 2);
}

}  // namespace
}  // namespace zvtest
