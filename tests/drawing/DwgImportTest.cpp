// DWG drawings read through the converter, compared by handle with the DXF that the CAD
// program saved from the same drawing: layers, lines, polylines with their widths, texts,
// attributes, block references and extended data. These tests run the converter, so they
// need Node.js (they skip without it) and the converter package (`./zv deps`).
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DwgImport.h"
#include "drawing/DxfError.h"
#include "drawing/DxfLoader.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "drawing/SymbolTable.h"
#include "drawing/TagValues.h"

#include <gtest/gtest.h>

#include <QFileInfo>
#include <QStandardPaths>

#include <cmath>
#include <map>
#include <memory>
#include <set>

using namespace zvdb;

namespace {

const std::string kSamples = ZV_TEST_DIR "/dwg/";

bool nodeAbsent() {
    return qEnvironmentVariableIsEmpty("ZV_NODE") &&
           QStandardPaths::findExecutable("node").isEmpty();
}

DwgImport::Setup setup() {
    DwgImport::Setup s;
    s.converterDir = ZV_BIN_DIR "/dwg";
    return s;
}

// Each sample is converted once for all the tests.
const Database& imported(const std::string& name) {
    static std::map<std::string, std::unique_ptr<Database>> cache;
    auto& slot = cache[name];
    if (!slot) slot = DwgImport::loadFile(kSamples + name + ".dwg", setup());
    return *slot;
}

const Database& reference(const std::string& name) {
    static std::map<std::string, std::unique_ptr<Database>> cache;
    auto& slot = cache[name];
    if (!slot) slot = DxfLoader::loadFile(kSamples + name + ".dxf");
    return *slot;
}

// Every entity of every block (model and paper space included), with attributes.
std::vector<const Entity*> allEntities(const Database& database) {
    std::vector<const Entity*> all;
    for (BlockRecord* block : database.blocks())
        for (Entity* entity : block->entities()) {
            all.push_back(entity);
            for (Entity* sub : entity->liveSubEntities())
                all.push_back(sub);
        }
    return all;
}

bool near(double a, double b) {
    return std::abs(a - b) <= 1e-9 * std::max(1.0, std::max(std::abs(a), std::abs(b)));
}

bool near(const Point3& a, const Point3& b) {
    return near(a.x, b.x) && near(a.y, b.y) && near(a.z, b.z);
}

// Vertex widths of a lightweight polyline, (0, 0) where the file gives none.
std::vector<std::pair<double, double>> widths(const Entity& polyline) {
    std::vector<std::pair<double, double>> out;
    const std::size_t end = polyline.xdataStart();
    const auto tags = polyline.tags();
    for (std::size_t i = 0; i < end; ++i) {
        if (tags[i].code == 10) out.emplace_back(0.0, 0.0);
        if (out.empty()) continue;
        if (tags[i].code == 40) out.back().first = TagValues::toReal(tags[i].value);
        if (tags[i].code == 41) out.back().second = TagValues::toReal(tags[i].value);
    }
    return out;
}

// Text with the \U+XXXX escapes of the format written as UTF-8, as the converter writes it.
std::string decoded(std::string_view text) {
    std::string out;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text.substr(i, 3) == "\\U+" && i + 7 <= text.size()) {
            const QString code = QString::fromLatin1(text.data() + i + 3, 4);
            bool ok = false;
            const uint value = code.toUInt(&ok, 16);
            if (ok) {
                out += QString::fromUcs4(&value, 1).toStdString();
                i += 6;
                continue;
            }
        }
        out += text[i];
    }
    return out;
}

// A text's whole value: a multi-line text's code-3 pieces, then its code-1 one (where the
// pieces part is the writer's choice).
std::string wholeText(const Entity& text) {
    std::string whole, last;
    for (const Tag& tag : text.tags()) {
        if (tag.code == 3 && text.isType("MTEXT")) whole += tag.value;
        if (tag.code == 1) last = tag.value;
    }
    return whole + last;
}

// Extended data compared as values: numbers within rounding, the rest as text.
bool sameXData(const std::vector<Tag>& a, const std::vector<Tag>& b) {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        if (a[i].code != b[i].code) return false;
        const ValueKind kind = valueKind(a[i].code);
        if (kind == ValueKind::Real) {
            if (!near(TagValues::toReal(a[i].value), TagValues::toReal(b[i].value))) return false;
        } else if (kind == ValueKind::Int16 || kind == ValueKind::Int32) {
            if (TagValues::toInteger(a[i].value) != TagValues::toInteger(b[i].value)) return false;
        } else if (a[i].value != b[i].value) {
            return false;
        }
    }
    return true;
}

// An attribute that the converter's DXF left out and the import put back: the first
// attribute of its reference is kept by the converter, the others may not be.
bool restored(const Database& dwg, const DbObject& attribute) {
    const auto* reference =
        dynamic_cast<const BlockReference*>(dwg.objectByHandle(attribute.ownerHandle()));
    if (!reference) return false;
    const auto attributes = reference->attributes();
    return !attributes.empty() && attributes.front()->handle() != attribute.handle() &&
           dwg.version() == "AC1015";
}

class DwgImportTest : public ::testing::TestWithParam<std::string> {
protected:
    void SetUp() override {
        if (nodeAbsent()) GTEST_SKIP() << "Node.js is not installed; reading DWG drawings needs it";
        ASSERT_TRUE(QFileInfo::exists(ZV_BIN_DIR "/dwg/node_modules/@mlightcad/libredwg-web"))
            << "the DWG converter package is not installed: run ./zv deps";
    }
    // The reference's objects that the DWG holds: those it made when it saved the DXF
    // have handles above the DWG's handle seed.
    bool inDwg(const DbObject& object) const {
        return object.handle() < imported(GetParam()).handleSeed();
    }
};

}  // namespace

TEST_P(DwgImportTest, LayersKeepTheirNamesAndTheirFrozenAndOffStates) {
    const Database& dwg = imported(GetParam());
    std::size_t compared = 0, off = 0;
    for (LayerRecord* layer : reference(GetParam()).layers()) {
        if (!inDwg(*layer)) continue;
        auto* read = dynamic_cast<LayerRecord*>(dwg.objectByHandle(layer->handle()));
        ASSERT_TRUE(read) << "layer " << layer->name();
        EXPECT_EQ(read->name(), layer->name());
        EXPECT_EQ(read->isFrozen(), layer->isFrozen()) << layer->name();
        EXPECT_EQ(read->isOff(), layer->isOff()) << layer->name();
        // A true colour's nearest index colour is the writer's own choice.
        if (!layer->has(420)) {
            EXPECT_EQ(read->color(), layer->color()) << layer->name();
        } else {
            EXPECT_EQ(read->integer(420), layer->integer(420)) << layer->name();
        }
        ++compared;
        off += layer->isOff() ? 1 : 0;
    }
    // A layer the CAD program renumbered when it saved the DXF is there by name.
    for (LayerRecord* layer : dwg.layers()) {
        if (!reference(GetParam()).objectByHandle(layer->handle())) {
            EXPECT_TRUE(reference(GetParam()).layer(layer->name())) << layer->name();
        }
    }
    EXPECT_GE(compared + 2, dwg.layers().size());
    EXPECT_GE(compared, 2u);
    if (GetParam() != "xdata") {
        EXPECT_EQ(off, 1u);  // Layer_Off alone
        EXPECT_TRUE(dwg.layer("Layer_Freeze")->isFrozen());
    }
}

TEST_P(DwgImportTest, LinesPolylinesTextsAttributesAndReferencesMatchByHandle) {
    const Database& dwg = imported(GetParam());
    std::map<std::string, std::size_t> compared;
    std::size_t missing = 0;
    for (const Entity* entity : allEntities(reference(GetParam()))) {
        const std::string type(entity->type());
        static const std::set<std::string> kinds{"LINE",  "LWPOLYLINE", "TEXT",
                                                 "MTEXT", "ATTRIB",     "INSERT"};
        if (!kinds.count(type) || !inDwg(*entity)) continue;
        const Entity* read = dwg.entityByHandle(entity->handle());
        if (!read) {
            ADD_FAILURE() << type << " " << TagValues::fromHandle(entity->handle()) << " missing";
            ++missing;
            continue;
        }
        const std::string what = type + " " + TagValues::fromHandle(entity->handle());
        ASSERT_EQ(read->type(), entity->type()) << what;
        EXPECT_EQ(read->layer(), entity->layer()) << what;
        EXPECT_EQ(read->ownerHandle(), entity->ownerHandle()) << what;
        if (type == "LINE") {
            EXPECT_TRUE(near(read->point(10), entity->point(10))) << what;
            EXPECT_TRUE(near(read->point(11), entity->point(11))) << what;
        } else if (type == "LWPOLYLINE") {
            const auto a = static_cast<const Polyline*>(read)->vertices();
            const auto b = static_cast<const Polyline*>(entity)->vertices();
            ASSERT_EQ(a.size(), b.size()) << what;
            for (std::size_t i = 0; i < a.size(); ++i)
                EXPECT_TRUE(near(a[i], b[i])) << what << " vertex " << i;
            const auto wa = widths(*read), wb = widths(*entity);
            ASSERT_EQ(wa.size(), wb.size()) << what;
            for (std::size_t i = 0; i < wa.size(); ++i) {
                EXPECT_TRUE(near(wa[i].first, wb[i].first)) << what << " vertex " << i;
                EXPECT_TRUE(near(wa[i].second, wb[i].second)) << what << " vertex " << i;
            }
            EXPECT_EQ(read->integer(70) & 1, entity->integer(70) & 1) << what;
        } else if (type == "TEXT" || type == "MTEXT" || type == "ATTRIB") {
            EXPECT_EQ(decoded(wholeText(*read)), decoded(wholeText(*entity))) << what;
            EXPECT_TRUE(near(read->point(10), entity->point(10))) << what;
            EXPECT_TRUE(near(read->real(40), entity->real(40))) << what;
            if (type == "ATTRIB") {
                EXPECT_EQ(read->text(2), entity->text(2)) << what;
            }
        } else if (type == "INSERT") {
            const auto* a = static_cast<const BlockReference*>(read);
            const auto* b = static_cast<const BlockReference*>(entity);
            EXPECT_EQ(a->blockName(), b->blockName()) << what;
            EXPECT_TRUE(near(a->position(), b->position())) << what;
            std::vector<std::uint64_t> ha, hb;
            for (const Attribute* x : a->attributes())
                ha.push_back(x->handle());
            for (const Attribute* x : b->attributes())
                hb.push_back(x->handle());
            EXPECT_EQ(ha, hb) << what << ": its attributes";
        }
        ++compared[type];
    }
    EXPECT_EQ(missing, 0u);
    if (GetParam() != "xdata") {
        // The sample's content, as its DXF has it.
        EXPECT_GE(compared["LINE"], 90u);
        EXPECT_GE(compared["LWPOLYLINE"], 20u);
        EXPECT_GE(compared["TEXT"], 25u);
        EXPECT_GE(compared["ATTRIB"], 2u);
        EXPECT_GE(compared["INSERT"], 10u);
    } else {
        EXPECT_GE(compared["TEXT"], 13u);
    }
}

TEST_P(DwgImportTest, ExtendedDataMatchesByHandle) {
    const Database& dwg = imported(GetParam());
    std::vector<const DbObject*> carriers;
    for (const Entity* entity : allEntities(reference(GetParam())))
        carriers.push_back(entity);
    for (const DbObject* object : reference(GetParam()).objects())
        carriers.push_back(object);
    for (const auto& table : reference(GetParam()).tables())
        for (const DbObject* record : table->records())
            carriers.push_back(record);
    std::size_t compared = 0;
    for (const DbObject* object : carriers) {
        if (!inDwg(*object) || object->xdataApplications().empty()) continue;
        // Multi-line texts carry the CAD program's own text-editor state, which the
        // converter writes otherwise; it is no data of ours.
        if (object->isType("MTEXT") || object->isType("DIMENSION")) continue;
        const DbObject* read = dwg.objectByHandle(object->handle());
        ASSERT_TRUE(read) << TagValues::fromHandle(object->handle());
        const std::string what =
            std::string(object->type()) + " " + TagValues::fromHandle(object->handle());
        std::vector<std::string_view> applications = object->xdataApplications();
        // Attributes put back from the converter's model lack the CAD program's own
        // attribute data: the model's extended data can't be read.
        if (object->isType("ATTRIB") && restored(dwg, *object))
            std::erase(applications, std::string_view("AcDbAttr"));
        ASSERT_EQ(read->xdataApplications(), applications) << what;
        for (const std::string_view application : applications) {
            const auto a = read->xdataGroups(application);
            const auto b = object->xdataGroups(application);
            ASSERT_EQ(a.size(), b.size()) << what << " " << application;
            for (std::size_t i = 0; i < a.size(); ++i)
                EXPECT_TRUE(sameXData(a[i], b[i])) << what << " " << application;
        }
        ++compared;
    }
    if (GetParam() == "xdata") {
        EXPECT_GE(compared, 19u);
    }
    EXPECT_GT(compared, 0u);
}

INSTANTIATE_TEST_SUITE_P(Samples, DwgImportTest,
                         ::testing::Values("sample_AC1015", "sample_AC1032", "xdata"));
