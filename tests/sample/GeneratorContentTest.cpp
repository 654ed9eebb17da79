// What a generated project holds, read back through the drawing API: the counts that were
// asked for, the page registry, terminals in three tag languages, the connection rule of
// wires, contacts tied to masters, cables, virtual objects, the layout and the settings.
#include "SampleProject.h"

#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Dictionary.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "drawing/XRecord.h"

#include <gtest/gtest.h>

#include <cmath>
#include <map>
#include <set>

using namespace zvtest;

namespace {

bool startsWith(std::string_view text, std::string_view prefix) {
    return text.substr(0, prefix.size()) == prefix;
}

std::string stripOf(const zvdb::DbObject& terminal) {
    for (const char* tag : {"REGUA", "STRIP", "REGLETA"}) {
        std::string value = attributeValue(terminal, tag);
        if (!value.empty()) return value;
    }
    return {};
}

std::string numberOf(const zvdb::DbObject& terminal) {
    const std::string value = attributeValue(terminal, "NUMERO");
    return value.empty() ? attributeValue(terminal, "NUMBER") : value;
}

std::vector<zvdb::BlockReference*> references(const zvdb::Database& db, std::string_view prefix) {
    std::vector<zvdb::BlockReference*> found;
    db.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        auto* insert = dynamic_cast<zvdb::BlockReference*>(&entity);
        if (insert && startsWith(insert->blockName(), prefix)) found.push_back(insert);
    });
    return found;
}

std::vector<zvdb::BlockReference*> terminals(const zvdb::Database& db) {
    auto all = references(db, "BORNE");
    for (auto* bor : references(db, "BOR-"))
        all.push_back(bor);
    return all;
}

std::vector<zvdb::Polyline*> polylinesWith(const zvdb::Database& db, std::string_view app) {
    std::vector<zvdb::Polyline*> found;
    db.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        auto* line = dynamic_cast<zvdb::Polyline*>(&entity);
        if (line && line->hasXData(app)) found.push_back(line);
    });
    return found;
}

std::string wireNumber(const zvdb::Polyline& wire) {
    for (const std::string& item : xdataTexts(wire, "KVR_ZV_WIRE"))
        if (startsWith(item, "FIO\f")) return item.substr(4);
    return {};
}

double distance(const zvdb::Point3& a, const zvdb::Point3& b) {
    return std::hypot(a.x - b.x, a.y - b.y, a.z - b.z);
}

const SampleProject& demo() {
    return sampleProject(5, 400, 24);
}

}  // namespace

TEST(SampleCounts, TerminalsWiresCablesAndPagesAreWhatWasAsked) {
    for (auto [terminalsAsked, pagesAsked] : {std::pair{120, 10}, {400, 24}, {30, 5}}) {
        const SampleProject& project = sampleProject(1, terminalsAsked, pagesAsked);
        const zvdb::Database& db = *project.db;
        const zvdb::Dictionary* virtuals = db.namedObjects()->getDictionary("ESQ_VIRTUAL_ZV");
        int virtualTerminals = 0;
        for (const auto& entry : virtuals->entries())
            virtualTerminals += startsWith(entry.name, "BORNE") ? 1 : 0;
        EXPECT_EQ(static_cast<int>(terminals(db).size()) + virtualTerminals, terminalsAsked);
        EXPECT_EQ(project.counts.terminals, terminalsAsked);
        int pages = 0;
        for (const zvdb::LayerRecord* layer : db.layers())
            pages += isPageLayer(layer->name()) ? 1 : 0;
        EXPECT_EQ(pages, pagesAsked);
        EXPECT_EQ(project.counts.pages, pagesAsked);
        std::set<std::string> numbers;
        for (const zvdb::Polyline* wire : polylinesWith(db, "KVR_ZV_WIRE"))
            numbers.insert(wireNumber(*wire));
        EXPECT_EQ(static_cast<int>(numbers.size()), project.counts.wires);
        EXPECT_EQ(static_cast<int>(db.namedObjects()->getDictionary("ZV_CABOS")->size()),
                  project.counts.cables);
        EXPECT_EQ(static_cast<int>(polylinesWith(db, "KVR_ZV_CABO").size()), project.counts.leads);
    }
}

TEST(SampleCounts, PagesGrowWhenTheTerminalsNeedThem) {
    const SampleProject& project = sampleProject(2, 2000, 5);
    // 24 terminal columns a page at most, beside the four fixed pages.
    EXPECT_GE(project.counts.pages, 4 + (2000 - 8 - 20) / 24);
    EXPECT_EQ(project.counts.terminals, 2000);
}

TEST(SamplePages, RegistryListsEveryPageInOrderAndMarksCoverAndIndex) {
    const zvdb::Database& db = *demo().db;
    const zvdb::Dictionary* registry = db.namedObjects()->getDictionary("ZV_PAGINAS");
    ASSERT_NE(registry, nullptr);
    std::vector<std::string> groups, pages;
    for (const auto& entry : registry->entries()) {
        groups.emplace_back(entry.name);
        for (const zvdb::Tag& tag : registry->getXRecord(entry.name)->data())
            if (tag.code == 8) pages.emplace_back(tag.value);
    }
    EXPECT_EQ(groups, (std::vector<std::string>{"CAPA", "INDICE", "FORCA", "COMANDO", "LAYOUT"}));
    ASSERT_EQ(static_cast<int>(pages.size()), 24);
    EXPECT_EQ(pages.front(), "CAPA$0001$A");
    EXPECT_EQ(pages[3], "COMANDO$0001$A");
    EXPECT_EQ(pages[4], "COMANDO$0002$A");
    for (const std::string& page : pages) {
        EXPECT_TRUE(isPageLayer(page)) << page;
        EXPECT_NE(db.layer(page), nullptr) << page;
    }
    EXPECT_EQ(xdataTexts(*db.layer("CAPA$0001$A"), "KVR_ZV_CAPA"),
              std::vector<std::string>{"CAPA"});
    EXPECT_EQ(xdataTexts(*db.layer("INDICE$0001$A"), "KVR_ZV_INDICE"),
              std::vector<std::string>{"INDICE"});
    EXPECT_FALSE(db.layer("COMANDO$0001$A")->hasXData("KVR_ZV_CAPA"));
    for (const char* companion : {"COMANDO$FORMATO", "COMANDO$SELO", "COMANDO$DE"})
        EXPECT_NE(db.layer(companion), nullptr) << companion;
}

TEST(SampleTerminals, StripsUseAllThreeTagSetsWithGapsJumpersAndDuplicates) {
    const zvdb::Database& db = *demo().db;
    std::set<std::string> stripTags;
    std::map<std::string, std::vector<int>> numbersByStrip;
    std::map<std::pair<std::string, std::string>, int> count;
    int inverted = 0, withJumper = 0;
    for (const zvdb::BlockReference* t : terminals(db)) {
        for (const char* tag : {"REGUA", "STRIP", "REGLETA"})
            if (!attributeValue(*t, tag).empty()) stripTags.insert(tag);
        const std::string strip = stripOf(*t), number = numberOf(*t);
        ASSERT_FALSE(strip.empty());
        ASSERT_FALSE(number.empty());
        numbersByStrip[strip].push_back(std::stoi(number));
        ++count[{strip, number}];
        inverted += attributeValue(*t, "INVERTIDO") == "S" ? 1 : 0;
        withJumper += attributeValue(*t, "JUMPER").empty() ? 0 : 1;
        const auto cut = xdataPoints(*t, "KVR_ZV_PTS_CORTE");
        ASSERT_EQ(cut.size(), 2u);
        EXPECT_EQ(cut[0], t->position());
        EXPECT_DOUBLE_EQ(cut[1].y, t->position().y - 10);
    }
    EXPECT_EQ(stripTags.size(), 3u);
    EXPECT_GT(inverted, 0);
    EXPECT_GT(withJumper, 0);
    int startAbove1 = 0, gaps = 0;
    std::map<int, int> stripsWithNumber;
    for (auto& [strip, numbers] : numbersByStrip) {
        std::sort(numbers.begin(), numbers.end());
        startAbove1 += numbers.front() > 1 ? 1 : 0;
        for (std::size_t i = 1; i < numbers.size(); ++i)
            gaps += numbers[i] > numbers[i - 1] + 1 ? 1 : 0;
        for (int n : numbers)
            ++stripsWithNumber[n];
    }
    EXPECT_GT(startAbove1, 0);
    EXPECT_GT(gaps, 0);
    EXPECT_GT(stripsWithNumber[3], 1) << "the same number on different strips";
    for (const auto& [where, n] : count)
        EXPECT_EQ(n, 1) << where.first << ":" << where.second << " twice on one strip";
    EXPECT_GT(demo().counts.borTerminals, 0);
    EXPECT_EQ(static_cast<int>(references(db, "BOR-").size()), demo().counts.borTerminals);
}

// Jumper texts name terminals of their own strip, some groups one way only and some texts
// with a trailing comma, as users write them.
TEST(SampleTerminals, JumpersNameTerminalsOfTheSameStripWhateverTheSeed) {
    int oneWay = 0, trailingComma = 0;
    for (std::uint64_t seed = 1; seed <= 8; ++seed) {
        const zvdb::Database& db = *sampleProject(seed, 300, 10).db;
        std::map<std::pair<std::string, std::string>, std::string> jumpers;
        for (const zvdb::BlockReference* t : terminals(db))
            jumpers[{stripOf(*t), numberOf(*t)}] = attributeValue(*t, "JUMPER");
        int checked = 0;
        for (const auto& [where, jumper] : jumpers) {
            trailingComma += !jumper.empty() && jumper.back() == ',' ? 1 : 0;
            std::size_t start = 0;
            while (start < jumper.size()) {
                const std::size_t comma = std::min(jumper.find(',', start), jumper.size());
                const std::string number = jumper.substr(start, comma - start);
                start = comma + 1;
                if (number.empty()) continue;
                const auto named = jumpers.find({where.first, number});
                ASSERT_NE(named, jumpers.end()) << where.first << " jumper " << jumper;
                oneWay += named->second.empty() ? 1 : 0;
                ++checked;
            }
        }
        EXPECT_GT(checked, 0);
    }
    EXPECT_GT(oneWay, 0);
    EXPECT_GT(trailingComma, 0);
}

// Numbers that run on through the project: drawn and virtual terminals all differ, jumpers
// still name terminals of their own strip, and the strips are those of the same seed
// numbered strip by strip.
TEST(SampleTerminals, ProjectNumbersStandOnceAndChangeNothingElse) {
    zvsample::GeneratorOptions options{5, 400, 24};
    options.projectNumbers = true;
    zvsample::ProjectGenerator generator(options);
    const auto db = generator.generate();
    std::map<std::string, int> seen;
    std::map<std::string, int> perStrip, perStripByStrip;
    std::set<std::pair<std::string, std::string>> present;
    int withJumper = 0;
    for (const zvdb::BlockReference* t : terminals(*db)) {
        ++seen[numberOf(*t)];
        ++perStrip[stripOf(*t)];
        present.insert({stripOf(*t), numberOf(*t)});
    }
    for (const zvdb::BlockReference* t : terminals(*db)) {
        const std::string jumper = attributeValue(*t, "JUMPER");
        if (jumper.empty()) continue;
        ++withJumper;
        const std::string first = jumper.substr(0, jumper.find(','));
        EXPECT_TRUE(present.count({stripOf(*t), first})) << stripOf(*t) << " jumper " << jumper;
    }
    const auto* virtuals = db->namedObjects()->getDictionary("ESQ_VIRTUAL_ZV");
    for (const auto& entry : virtuals->entries()) {
        if (!startsWith(entry.name, "BORNE")) continue;
        const auto items = xdataTexts(*virtuals->get(entry.name), "KVR_ZV_ATT_VIRTUAL");
        ASSERT_GE(items.size(), 2u);
        const std::string number = items[1].substr(items[1].find('\f') + 1);
        ++seen[number.substr(0, number.find('\f'))];
    }
    EXPECT_GT(withJumper, 0);
    for (const auto& [number, n] : seen)
        EXPECT_EQ(n, 1) << "number " << number << " stands " << n << " times";
    for (const zvdb::BlockReference* t : terminals(*demo().db))
        ++perStripByStrip[stripOf(*t)];
    EXPECT_EQ(perStrip, perStripByStrip);
}

TEST(SampleWires, EveryTerminalTouchesAWireOnItsPageAndWiresHaveCompleteKeys) {
    const zvdb::Database& db = *demo().db;
    std::map<std::string, std::vector<zvdb::Point3>> verticesByLayer;
    std::map<std::string, std::set<std::string>> layersOfNumber;
    for (const zvdb::Polyline* wire : polylinesWith(db, "KVR_ZV_WIRE")) {
        const auto items = xdataTexts(*wire, "KVR_ZV_WIRE");
        ASSERT_GE(items.size(), 3u);
        EXPECT_NE(items[0].find('\f'), std::string::npos) << "key and standard";
        EXPECT_FALSE(items[1].empty());
        layersOfNumber[wireNumber(*wire)].insert(std::string(wire->layer()));
        for (const zvdb::Point3& p : wire->vertices())
            verticesByLayer[std::string(wire->layer())].push_back(p);
    }
    for (const zvdb::BlockReference* t : terminals(db)) {
        bool touched = false;
        for (const zvdb::Point3& p : verticesByLayer[std::string(t->layer())])
            touched = touched || distance(p, t->position()) < 0.1;
        EXPECT_TRUE(touched) << stripOf(*t) << ":" << numberOf(*t);
    }
    EXPECT_GT(layersOfNumber["L+"].size(), 1u) << "the feed runs over several pages";
    int unlisted = 0;
    for (const zvdb::Polyline* wire : polylinesWith(db, "KVR_ZV_WIRE"))
        unlisted += xdataTexts(*wire, "KVR_ZV_WIRE")[0] == "10099\f1" ? 1 : 0;
    EXPECT_GT(unlisted, 0);
}

TEST(SampleWires, FerrulesSitOnWiresOfTheirNumber) {
    const zvdb::Database& db = *demo().db;
    const auto ferrules = references(db, "ANILHA_FIO");
    ASSERT_FALSE(ferrules.empty());
    for (const zvdb::BlockReference* ferrule : ferrules) {
        const auto items = xdataTexts(*ferrule, "KVR_ZV_ANILHAFIO");
        ASSERT_EQ(items.size(), 1u);
        const auto* wire = dynamic_cast<const zvdb::Polyline*>(
            db.objectByHandle(std::stoull(items[0], nullptr, 16)));
        ASSERT_NE(wire, nullptr);
        EXPECT_EQ(wireNumber(*wire), attributeValue(*ferrule, "FIO"));
    }
}

TEST(SampleComponents, ContactsNameADrawnMasterOnAnotherPage) {
    const zvdb::Database& db = *demo().db;
    std::map<std::string, const zvdb::BlockReference*> masters;
    db.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        auto* insert = dynamic_cast<zvdb::BlockReference*>(&entity);
        if (!insert || !insert->hasXData("KVR_ZV")) return;
        const std::string_view name = insert->blockName();
        for (const char* prefix : {"NA-", "NF-", "NAF-", "BORNE", "BOR-", "PIN-"})
            if (startsWith(name, prefix)) return;
        masters[attributeValue(*insert, "RELACAO")] = insert;
    });
    int otherPage = 0;
    const auto contacts = references(db, "N");
    int seen = 0;
    for (const zvdb::BlockReference* contact : contacts) {
        if (!startsWith(contact->blockName(), "NA-") && !startsWith(contact->blockName(), "NF-") &&
            !startsWith(contact->blockName(), "NAF-"))
            continue;
        ++seen;
        const std::string relation = attributeValue(*contact, "RELACAO");
        EXPECT_EQ(attributeValue(*contact, "PARENT"), relation);
        ASSERT_TRUE(masters.count(relation)) << relation;
        otherPage += masters[relation]->layer() != contact->layer() ? 1 : 0;
        EXPECT_EQ(xdataPoints(*contact, "KVR_ZV_PTS_CORTE").size(), 2u);
    }
    EXPECT_EQ(seen, demo().counts.contacts);
    EXPECT_GT(otherPage, seen / 2);
    int equipments = 0, circuits = 0, additives = 0, misses = 0;
    for (const auto& [relation, master] : masters) {
        misses += startsWith(xdataTexts(*master, "KVR_ZV")[0], "6999\f") ? 1 : 0;
        equipments += master->hasXData("KVR_ZV_EQUIPO") ? 1 : 0;
        circuits += master->hasXData("KVR_ZV_CIRCLOC") ? 1 : 0;
        additives += master->hasXData("ZV_VINC_ADITIVO") ? 1 : 0;
    }
    EXPECT_EQ(equipments, 20) << "one PLC card on each control page";
    EXPECT_GT(circuits, 0);
    EXPECT_GT(additives, 0);
    EXPECT_EQ(misses, 1) << "one key the catalogue lacks, on purpose";
    EXPECT_FALSE(references(db, "BUS").empty());
    for (const zvdb::BlockReference* pin : references(db, "PIN-"))
        EXPECT_EQ(xdataTexts(*pin, "ZV_PINO").size(), 1u);
}

TEST(SampleCables, LeadsPointAtCableRecordsAndBlindConnectionsAtLeads) {
    const zvdb::Database& db = *demo().db;
    const zvdb::Dictionary* cables = db.namedObjects()->getDictionary("ZV_CABOS");
    std::set<std::uint64_t> records;
    for (const auto& entry : cables->entries()) {
        records.insert(entry.handle);
        const zvdb::DbObject* record = db.objectByHandle(entry.handle);
        EXPECT_EQ(xdataTexts(*record, "KVR_ZV_CABO").size(), 1u);
        const auto fields = xdataTexts(*record, "KVR_ZV_ATT_VIRTUAL");
        ASSERT_FALSE(fields.empty());
        EXPECT_EQ(fields[0], "CABO\f" + std::string(entry.name) + "\fN");
    }
    std::set<std::uint64_t> leads;
    for (const zvdb::Polyline* lead : polylinesWith(db, "KVR_ZV_CABO")) {
        const auto items = xdataTexts(*lead, "KVR_ZV_CABO");
        ASSERT_EQ(items.size(), 3u);
        EXPECT_TRUE(records.count(std::stoull(items[1], nullptr, 16)));
        leads.insert(lead->handle());
    }
    const auto blinds = polylinesWith(db, "KVR_ZV_CONEX_BLIND");
    EXPECT_EQ(static_cast<int>(blinds.size()), demo().counts.blindConnections);
    ASSERT_FALSE(blinds.empty());
    for (const zvdb::Polyline* blind : blinds) {
        const auto items = xdataTexts(*blind, "KVR_ZV_CONEX_BLIND");
        ASSERT_EQ(items.size(), 2u);
        const std::uint64_t lead = std::stoull(items[1], nullptr, 16);
        EXPECT_TRUE(leads.count(lead));
        EXPECT_NE(db.entityByHandle(lead)->layer(), blind->layer());
    }
}

TEST(SampleProjectData, VirtualObjectsLayoutRoutesSettingsAndVersion) {
    const zvdb::Database& db = *demo().db;
    const zvdb::Dictionary* virtuals = db.namedObjects()->getDictionary("ESQ_VIRTUAL_ZV");
    ASSERT_NE(virtuals, nullptr);
    const zvdb::XRecord* first = virtuals->getXRecord("BORNE_XV_1");
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(xdataTexts(*first, "KVR_ZV"), std::vector<std::string>{"1001\f1"});
    EXPECT_EQ(xdataTexts(*first, "KVR_ZV_ATT_VIRTUAL")[0], "STRIP\fXV\fN");
    EXPECT_NE(virtuals->getXRecord("COMP_-E1"), nullptr);

    int linked = 0;
    db.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        const auto items = xdataTexts(entity, "KVR_LAYOUT_PAINEL");
        if (items.empty()) return;
        const zvdb::DbObject* master = db.objectByHandle(std::stoull(items[0], nullptr, 16));
        ASSERT_NE(master, nullptr);
        const auto back = xdataTexts(*master, "KVR_LAYOUT_ESQUEMA");
        ASSERT_EQ(back.size(), 3u);
        EXPECT_EQ(std::stoull(back[0], nullptr, 16), entity.handle());
        EXPECT_EQ(back[2], back[0]);
        EXPECT_EQ(entity.layer(), "LAYOUT$0001$A");
        ++linked;
    });
    EXPECT_GT(linked, 40);
    EXPECT_GT(polylinesWith(db, "KVR_ZV_WIRE_LAYOUT").size(), 1u);
    EXPECT_EQ(references(db, "TRANSICAO").size(), 2u);

    const std::string path[] = {"ZV_DATA_MGR", "CELayoutRotasFios"};
    zvdb::Dictionary* routes = const_cast<zvdb::Database&>(db).dictionaryAt(path, false);
    ASSERT_NE(routes, nullptr);
    EXPECT_EQ(static_cast<int>(routes->size()), demo().counts.routes);
    for (const auto& entry : routes->entries()) {
        const auto* object = dynamic_cast<const zvdb::Dictionary*>(db.objectByHandle(entry.handle));
        ASSERT_NE(object, nullptr);
        const auto data = object->getXRecord("strRotaData")->data();
        ASSERT_EQ(data.size(), 1u);
        EXPECT_EQ(data[0].code, 1000);
        EXPECT_GE(std::count(data[0].value.begin(), data[0].value.end(), '-'), 2);
        EXPECT_EQ(object->getXRecord("strKeyFio")->data().size(), 1u);
    }

    const zvdb::Entity* settings = nullptr;
    db.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        if (!settings && entity.layer() == "ZV_FREEZE" && entity.isType("POINT"))
            settings = &entity;
    });
    ASSERT_NE(settings, nullptr);
    EXPECT_EQ(xdataTexts(*settings, "KVR_ZV_CFG"), std::vector<std::string>{"demo.cfg"});
    EXPECT_EQ(xdataTexts(*settings, "ZV_NUM_PAG"), std::vector<std::string>{"1"});
    const zvdb::DbObject* version = db.namedObjects()->get("ZV_VERSAO");
    ASSERT_NE(version, nullptr);
    EXPECT_EQ(xdataTexts(*version, "ZV_VERSAO"), (std::vector<std::string>{"ZVListas", "2022.0"}));
}
