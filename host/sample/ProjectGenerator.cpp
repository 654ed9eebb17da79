#include "sample/ProjectGenerator.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "drawing/XRecord.h"
#include "sample/SampleRandom.h"
#include "sample/StripPlanner.h"
#include "sample/SymbolLibrary.h"
#include "sample/XDataItems.h"

#include <algorithm>
#include <cstdio>
#include <string>
#include <unordered_set>
#include <vector>

namespace zvsample {

namespace {

using zvdb::Point3;

constexpr int kFixedPages = 4;  // cover, index, power, panel layout
constexpr double kBusY = 235;   // the 24 V feed of a control page
constexpr double kCoilY = 175;
constexpr double kPlcY = 150;
constexpr double kTerminalY = 70;
constexpr double kPinY = 30;
constexpr double kBlindX = 360;
constexpr double kPowerBusY[4] = {270, 265, 260, 255};  // L1, L2, L3, PE

double motorX(int motor) {
    return 40.0 + motor * 120;
}

std::string pageName(const std::string& group, int number) {
    char digits[16];
    std::snprintf(digits, sizeof digits, "%04d", number);
    return group + "$" + digits + "$A";
}

// Catalogue keys of cable cores: 20101 is core 1.
std::string coreKey(int core) {
    return std::to_string(20100 + core);
}

std::string keyText(const std::string& key, const std::string& standard) {
    return key + kSep + standard;
}

double columnX(int column) {
    return 25.0 + 14.0 * column;
}

struct Group {
    std::string name;
    int catalogueKey;
    std::string title;
    std::vector<std::string> pages;
};

struct Master {
    std::string relation;
    zvdb::BlockReference* reference;
    std::string key;
    std::string standard;
    std::string topBlock;  // front view
    int page;
};

// A terminal placed in the schematic, for the panel layout.
struct PlacedTerminal {
    zvdb::BlockReference* reference;
    std::string key;
    std::string standard;
};

// A wire between a master and a terminal that the layout can route.
struct RoutableWire {
    std::string number;
    std::size_t master;
    std::size_t terminal;
};

// A core that leaves its page: its blind connection goes on the next control page.
struct PendingBlind {
    std::string cable;
    std::uint64_t lead;
};

struct CoilKind {
    const char* key;
    const char* block;
    const char* prefix;
    const char* front;
};
const CoilKind kCoils[] = {{"2001", "BOBINA_CONTATOR", "-K", "TOPO_CT09_10_24DC"},
                           {"2005", "BOBINA_CONTATOR", "-K", "TOPO_CA40_24DC"},
                           {"4001", "BOBINA_RELE", "-K", "TOPO_RI1_24DC"},
                           {"4004", "BOBINA_TEMPORIZADOR", "-KT", "TOPO_TM_UNI"}};
const CoilKind kLamps[] = {{"6101", "SINALEIRO", "-H", "TOPO_PL_GN24"},
                           {"6102", "SINALEIRO", "-H", "TOPO_PL_RD24"}};
const CoilKind kButtons[] = {{"6001", "BT-BOTAO_NA", "-S", "TOPO_PB_GN"},
                             {"6002", "BT-BOTAO_NF", "-S", "TOPO_PB_RD"},
                             {"6003", "BT-BOTAO_EMERGENCIA", "-S", "TOPO_ES40"}};
const char* const kContactBlocks[] = {"NA-CONTATO", "NA-CONTATO", "NF-CONTATO", "NAF-CONTATO"};

}  // namespace

class ProjectGenerator::Impl {
public:
    explicit Impl(const GeneratorOptions& options)
        : options_(options), random_(options.seed), planner_(random_, "X", 1, projectNumbers()) {}

    std::unique_ptr<zvdb::Database> run();
    GeneratedCounts counts;

private:
    // Pages and frames.
    void planPages(int controlPages);
    std::string addPage(Group& group);
    void drawFrames();
    void drawCover();
    void drawIndex();
    void writeRegistry();
    void writeSettings();
    // Schematic.
    void drawControlPage(int pageIndex, int page, std::vector<PlannedTerminal> terminals);
    void drawColumn(int page, const std::string& layer, int column, const PlannedTerminal& t,
                    std::vector<SymbolAttribute>& equipmentPins);
    zvdb::BlockReference* drawTerminal(const std::string& layer, Point3 at,
                                       const PlannedTerminal& t);
    std::size_t drawMaster(const CoilKind& kind, const std::string& standard, Point3 at,
                           const std::string& layer, int page,
                           const std::vector<SymbolAttribute>& pins);
    void drawContact(int page, const std::string& layer, Point3 at, const std::string& standard);
    zvdb::Polyline* drawWire(const std::string& layer, const std::string& number,
                             const std::vector<Point3>& points, const std::string& key,
                             const std::string& standard);
    void drawFerrule(const std::string& layer, zvdb::Polyline& wire, const std::string& number,
                     Point3 at);
    void drawCables(const std::string& layer, const std::vector<double>& xs,
                    const std::vector<std::string>& strips, bool blindLast);
    std::uint64_t addCableRecord(const std::string& name, const std::string& key, int cores,
                                 const std::string& from);
    zvdb::Polyline* drawLead(const std::string& layer, const std::vector<Point3>& points,
                             std::uint64_t record, int core);
    void drawPendingBlind(const std::string& layer);
    void drawFieldSensor(const std::string& layer, int page, double x, const std::string& standard);
    void drawPowerPage();
    void drawBusBar(const std::string& layer, const std::string& relation, double y,
                    const std::vector<SymbolAttribute>& taps);
    void drawMotorCircuit(const std::string& layer, int m, const std::string& contactor,
                          std::vector<PlannedTerminal> terminals);
    void drawPhase(const std::string& layer, double x, int phase, const std::string& contactor);
    void addVirtualObjects(int virtualTerminals);
    void drawLayout();
    void addRoute(const RoutableWire& wire, const Point3& from, const Point3& to, bool split);
    // The name of a master's n-th connection (LIGACAOn), "An" when it has none.
    static std::string connectionOf(const Master& master, int n);
    void setXData(zvdb::DbObject& object, std::string_view application, const XDataItems& items) {
        object.setXData(application, items.tags());
    }
    std::string nextWire() { return std::to_string(wireCounter_++); }
    void countWire(const std::string& number) {
        if (wireNumbers_.insert(number).second) ++counts.wires;
    }

    GeneratorOptions options_;
    SampleRandom random_;
    // The next terminal number of the project, when numbers run on through it.
    int nextNumber_ = 1;
    int* projectNumbers() { return options_.projectNumbers ? &nextNumber_ : nullptr; }
    StripPlanner planner_;
    std::unique_ptr<zvdb::Database> db_;
    std::unique_ptr<SymbolLibrary> symbols_;
    std::vector<Group> groups_;
    std::vector<Master> masters_;
    std::vector<PlacedTerminal> placedTerminals_;
    std::vector<RoutableWire> routable_;
    std::vector<PendingBlind> pendingBlinds_;
    std::unordered_set<std::string> wireNumbers_;
    std::size_t mastersBeforePage_ = 0;
    int wireCounter_ = 100;
    int cableCounter_ = 1;
    int connectorCounter_ = 1;
    int routeKey_ = 1000;
    int relationCounter_ = 1;
};

std::unique_ptr<zvdb::Database> ProjectGenerator::Impl::run() {
    db_ = std::make_unique<zvdb::Database>();
    symbols_ = std::make_unique<SymbolLibrary>(*db_);
    const int total = std::max(options_.terminals, 0);
    const int power = total >= 16 ? 8 : 0;
    const int virtuals = total >= 50 ? total / 100 : 0;
    const int control = total - power - virtuals;
    const int needed = (control + kColumnsPerPage - 1) / kColumnsPerPage;
    const int controlPages = std::max({options_.pages - kFixedPages, needed, 1});
    planPages(controlPages);
    drawFrames();
    drawCover();
    for (int p = 0; p < controlPages; ++p) {
        const int share = control / controlPages + (p < control % controlPages ? 1 : 0);
        drawControlPage(p, 4 + p, planner_.plan(share));
    }
    drawPowerPage();
    addVirtualObjects(virtuals);
    drawLayout();
    drawIndex();
    writeRegistry();
    writeSettings();
    counts.terminals += virtuals;
    return std::move(db_);
}

// ---- pages

void ProjectGenerator::Impl::planPages(int controlPages) {
    groups_ = {{"CAPA", 1, "Capa", {}},
               {"INDICE", 2, "Indice", {}},
               {"FORCA", 3, "Diagramas de forca", {}},
               {"COMANDO", 4, "Diagramas de comando", {}},
               {"LAYOUT", 5, "Layout do painel", {}}};
    addPage(groups_[0]);
    addPage(groups_[1]);
    addPage(groups_[2]);
    for (int p = 0; p < controlPages; ++p)
        addPage(groups_[3]);
    addPage(groups_[4]);
    db_->layer(groups_[0].pages[0])->setXData("KVR_ZV_CAPA", XDataItems().text("CAPA").tags());
    db_->layer(groups_[1].pages[0])->setXData("KVR_ZV_INDICE", XDataItems().text("INDICE").tags());
}

std::string ProjectGenerator::Impl::addPage(Group& group) {
    const std::string name = pageName(group.name, static_cast<int>(group.pages.size()) + 1);
    db_->createLayer(name);
    group.pages.push_back(name);
    ++counts.pages;
    db_->modelSpace()->addText({395, 14}, 3.0, std::to_string(counts.pages), name);
    return name;
}

void ProjectGenerator::Impl::drawFrames() {
    for (const Group& group : groups_) {
        const std::string base = group.name;
        for (const char* companion : {"$FORMATO", "$SELO", "$DE"})
            db_->createLayer(base + companion);
        symbols_->insert("FORMATO_A3", {}, base + "$FORMATO");
        symbols_->insert("SELO_A3", {}, base + "$SELO",
                         {{"TITULO", group.title, {372, 270}},
                          {"CLIENTE", "Fabrica Demonstracao", {372, 260}},
                          {"PROJETO", "Painel de comando PC-01", {372, 250}},
                          {"DATA", "22/11/26", {372, 240}}});
        symbols_->insert("PAGINA_DE", {380, 14}, base + "$DE",
                         {{"TOTAL", std::to_string(group.pages.size()), {0, 0}}});
    }
}

void ProjectGenerator::Impl::drawCover() {
    const std::string& layer = groups_[0].pages[0];
    zvdb::BlockRecord* model = db_->modelSpace();
    model->addText({60, 200}, 10, "PAINEL DE COMANDO PC-01", layer);
    model->addText({60, 180}, 5, "Projeto de demonstracao ZVListas", layer);
    model->addText({60, 170}, 4, "Semente " + std::to_string(options_.seed), layer);
}

void ProjectGenerator::Impl::drawIndex() {
    const std::string& layer = groups_[1].pages[0];
    double y = 270;
    int shown = 0;
    for (const Group& group : groups_) {
        for (const std::string& page : group.pages) {
            if (shown++ == 40) {
                db_->modelSpace()->addText({30, y}, 3, "...", layer);
                return;
            }
            db_->modelSpace()->addText({30, y}, 3, page + "  " + group.title, layer);
            y -= 6;
        }
    }
}

void ProjectGenerator::Impl::writeRegistry() {
    const std::string path[] = {"ZV_PAGINAS"};
    zvdb::Dictionary* registry = db_->dictionaryAt(path, true);
    for (const Group& group : groups_) {
        XDataItems data;
        data.add(70, std::to_string(group.catalogueKey)).add(1, group.title);
        for (const std::string& page : group.pages)
            data.add(8, page);
        registry->getOrCreateXRecord(group.name)->setData(data.tags());
    }
}

void ProjectGenerator::Impl::writeSettings() {
    db_->createLayer("ZV_FREEZE");
    zvdb::Entity* point = db_->modelSpace()->addPoint({}, "ZV_FREEZE");
    setXData(*point, "ZV_ORDEM_GRU", XDataItems().text("0"));
    for (const Group& group : groups_)
        setXData(*point, "ZV_ORDEM_PAG_" + group.name, XDataItems().text("0"));
    setXData(*point, "ZV_NUM_PAG", XDataItems().text("1"));
    setXData(*point, "KVR_ZV_CFG", XDataItems().text("demo.cfg"));
    setXData(*point, "KVR_ZV_PAINEL", XDataItems().text("PAINEL_1"));
    zvdb::Dictionary* root = db_->namedObjects();
    zvdb::Dictionary* stamp = root->getOrCreateDictionary("ZV_VERSAO");
    setXData(*stamp, "ZV_VERSAO", XDataItems().text("ZVListas").text("2022.0"));
}

// ---- control pages

void ProjectGenerator::Impl::drawControlPage(int pageIndex, int page,
                                             std::vector<PlannedTerminal> terminals) {
    const std::string layer = groups_[3].pages[static_cast<std::size_t>(pageIndex)];
    mastersBeforePage_ = masters_.size();
    drawPendingBlind(layer);
    std::vector<SymbolAttribute> pins = {{"LIGACAO1", "L+", {-8, 95}},
                                         {"LIGACAO2", "L+.", {-8, 85}}};
    std::vector<double> xs;
    std::vector<std::string> strips;
    for (std::size_t c = 0; c < terminals.size(); ++c) {
        drawColumn(page, layer, static_cast<int>(c), terminals[c], pins);
        const double x = columnX(static_cast<int>(c));
        if (random_.chance(20)) {  // a field wire to a sensor instead of a cable core
            drawFieldSensor(layer, page, x, terminals[c].standard);
            continue;
        }
        xs.push_back(x);
        strips.push_back(terminals[c].strip);
    }
    // The PLC card of the page: its supply pins take the feed in and out.
    const CoilKind card{"5002", "CLP_ENTRADAS", "-A", "TOPO_DI16"};
    drawMaster(card, "1", {20, kPlcY}, layer, page, pins);
    zvdb::BlockReference* equipment = masters_.back().reference;
    setXData(*equipment, "KVR_ZV_EQUIPO", XDataItems().text("EQUIPO"));
    std::vector<Point3> feed = {{12, 245}, {12, kBusY}};
    for (double x : xs)
        feed.push_back({x, kBusY});
    drawWire(layer, "L+", feed, "10003", "1");
    const bool blind = pageIndex + 1 < static_cast<int>(groups_[3].pages.size()) &&
                       pageIndex % 3 == 0 && !xs.empty();
    drawCables(layer, xs, strips, blind);
}

void ProjectGenerator::Impl::drawColumn(int page, const std::string& layer, int column,
                                        const PlannedTerminal& t,
                                        std::vector<SymbolAttribute>& equipmentPins) {
    const double x = columnX(column);
    const Point3 terminalAt{x, kTerminalY};
    zvdb::BlockReference* terminal = drawTerminal(layer, terminalAt, t);
    placedTerminals_.push_back({terminal, t.key, t.standard});
    const int kind = random_.below(100);
    const std::string wire = nextWire();
    const bool unlisted = random_.chance(2);
    const std::string wireKey = unlisted ? "10099" : "10006";
    if (kind < 50) {  // contact, coil or lamp, terminal
        drawContact(page, layer, {x, kBusY}, t.standard);
        const bool lamp = kind >= 35;
        const CoilKind& coil = lamp ? kLamps[random_.below(2)] : kCoils[random_.below(4)];
        const std::size_t master =
            drawMaster(coil, t.standard, {x, kCoilY}, layer, page,
                       {{"LIGACAO1", lamp ? "X1" : "A1", {0, SymbolLibrary::kCoilReach}},
                        {"LIGACAO2", lamp ? "X2" : "A2", {0, -SymbolLibrary::kCoilReach}}});
        const double top = kCoilY + SymbolLibrary::kCoilReach;
        drawWire(layer, nextWire(), {{x, kBusY - SymbolLibrary::kContactLength}, {x, top}}, "10003",
                 t.standard);
        const double bottom = kCoilY - SymbolLibrary::kCoilReach;
        zvdb::Polyline* w = drawWire(layer, wire, {{x, bottom}, terminalAt}, wireKey, t.standard);
        drawFerrule(layer, *w, wire, {x + 3, bottom - 6});
        if (routable_.size() < 30) routable_.push_back({wire, master, placedTerminals_.size() - 1});
    } else if (kind < 85) {  // PLC input pin
        const std::string pin = "LIGACAO" + std::to_string(equipmentPins.size() + 1);
        equipmentPins.push_back({pin, "I" + std::to_string(column), {x - 20, 0}});
        zvdb::Polyline* w =
            drawWire(layer, wire, {{x, kPlcY}, {x, 110}, terminalAt}, wireKey, t.standard);
        drawFerrule(layer, *w, wire, {x + 3, kPlcY - 6});
    } else {  // push button, terminal
        drawMaster(
            kButtons[random_.below(3)], t.standard, {x, kBusY}, layer, page,
            {{"LIGACAO1", "13", {0, 0}}, {"LIGACAO2", "14", {0, -SymbolLibrary::kContactLength}}});
        masters_.pop_back();  // buttons have no contacts elsewhere
        drawWire(layer, wire, {{x, kBusY - SymbolLibrary::kContactLength}, terminalAt}, wireKey,
                 t.standard);
    }
}

zvdb::BlockReference* ProjectGenerator::Impl::drawTerminal(const std::string& layer, Point3 at,
                                                           const PlannedTerminal& t) {
    const TagSet& tags = tagSet(t.language);
    zvdb::BlockReference* terminal =
        symbols_->insert(t.block, at, layer,
                         {{tags.strip, t.strip, {3, -3}},
                          {tags.number, std::to_string(t.number), {3, -6}},
                          {"JUMPER", t.jumper, {3, -9}},
                          {"INVERTIDO", t.inverted ? "S" : "N", {3, -12}}});
    setXData(*terminal, "KVR_ZV", XDataItems().text(keyText(t.key, t.standard)));
    const Point3 cut{at.x, at.y - SymbolLibrary::kTerminalLength};
    setXData(*terminal, "KVR_ZV_PTS_CORTE", XDataItems().point(at).point(cut));
    ++counts.terminals;
    if (t.block.rfind("BOR-", 0) == 0) ++counts.borTerminals;
    return terminal;
}

std::size_t ProjectGenerator::Impl::drawMaster(const CoilKind& kind, const std::string& standard,
                                               Point3 at, const std::string& layer, int page,
                                               const std::vector<SymbolAttribute>& pins) {
    const std::string relation = kind.prefix + std::to_string(relationCounter_++);
    std::vector<SymbolAttribute> attributes = {{"RELACAO", relation, {6, 2}}};
    attributes.insert(attributes.end(), pins.begin(), pins.end());
    zvdb::BlockReference* reference = symbols_->insert(kind.block, at, layer, attributes);
    // One symbol in four hundred carries a key the catalogue lacks, on purpose.
    const std::string key = masters_.size() % 400 == 39 ? "6999" : kind.key;
    setXData(*reference, "KVR_ZV", XDataItems().text(keyText(key, standard)));
    if (random_.chance(10))
        setXData(*reference, "KVR_ZV_CIRCLOC", XDataItems().integer32(random_.between(2, 3)));
    if (random_.chance(10))
        setXData(*reference, "ZV_VINC_ADITIVO", XDataItems().text("1").text("2103"));
    masters_.push_back({relation, reference, kind.key, standard, kind.front, page});
    ++counts.masters;
    return masters_.size() - 1;
}

void ProjectGenerator::Impl::drawContact(int page, const std::string& layer, Point3 at,
                                         const std::string& standard) {
    const std::size_t pool = mastersBeforePage_ > 0 ? mastersBeforePage_ : masters_.size();
    if (pool == 0) {  // the very first column: a button stands in for the contact
        drawMaster(
            kButtons[0], standard, at, layer, page,
            {{"LIGACAO1", "13", {0, 0}}, {"LIGACAO2", "14", {0, -SymbolLibrary::kContactLength}}});
        masters_.pop_back();
        return;
    }
    const Master& master =
        masters_[static_cast<std::size_t>(random_.below(static_cast<int>(pool)))];
    const char* block = kContactBlocks[random_.below(4)];
    zvdb::BlockReference* contact =
        symbols_->insert(block, at, layer,
                         {{"RELACAO", master.relation, {2, -4}},
                          {"PARENT", master.relation, {2, -7}},
                          {"POSICAO_CTT", "13-14", {2, -10}},
                          {"LIGACAO1", "13", {0, 0}},
                          {"LIGACAO2", "14", {0, -SymbolLibrary::kContactLength}}});
    setXData(*contact, "KVR_ZV", XDataItems().text(keyText("2101", standard)));
    const Point3 cut{at.x, at.y - SymbolLibrary::kContactLength};
    setXData(*contact, "KVR_ZV_PTS_CORTE", XDataItems().point(at).point(cut));
    ++counts.contacts;
}

zvdb::Polyline* ProjectGenerator::Impl::drawWire(const std::string& layer,
                                                 const std::string& number,
                                                 const std::vector<Point3>& points,
                                                 const std::string& key,
                                                 const std::string& standard) {
    zvdb::Polyline* wire = db_->modelSpace()->addLwPolyline(points, false, layer);
    XDataItems items;
    items.text(keyText(key, standard)).text("1").text(std::string("FIO") + kSep + number);
    if (key == "10099") items.text(std::string("WIRE_LISTA") + kSep + "N");
    setXData(*wire, "KVR_ZV_WIRE", items);
    if (wireNumbers_.size() % 7 == 3)
        setXData(*wire, "KVR_ZV_ATT_VIRTUAL",
                 XDataItems().text(std::string("COR") + kSep + "BK" + kSep + "N"));
    ++counts.wirePolylines;
    countWire(number);
    return wire;
}

void ProjectGenerator::Impl::drawFerrule(const std::string& layer, zvdb::Polyline& wire,
                                         const std::string& number, Point3 at) {
    zvdb::BlockReference* ferrule =
        symbols_->insert("ANILHA_FIO", at, layer, {{"FIO", number, {2, 0}}});
    setXData(*ferrule, "KVR_ZV_ANILHAFIO", XDataItems().handle(wire.handle()));
}

void ProjectGenerator::Impl::drawFieldSensor(const std::string& layer, int page, double x,
                                             const std::string& standard) {
    const CoilKind sensor{"6301", "SENSOR_PNP", "-B", "TOPO_IS12"};
    drawMaster(sensor, standard, {x, kPinY + 5}, layer, page,
               {{"LIGACAO1", "BN", {0, 10}}, {"LIGACAO2", "BU", {0, -5}}});
    const double cut = kTerminalY - SymbolLibrary::kTerminalLength;
    drawWire(layer, nextWire(), {{x, cut}, {x, kPinY + 15}}, "10014", standard);
}

// ---- cables

void ProjectGenerator::Impl::drawCables(const std::string& layer, const std::vector<double>& xs,
                                        const std::vector<std::string>& strips, bool blindLast) {
    std::size_t i = 0;
    while (i < xs.size()) {
        std::size_t end = i + 1;
        const std::size_t most = static_cast<std::size_t>(random_.between(2, 11));
        while (end < xs.size() && end - i < most && strips[end] == strips[i])
            ++end;
        const int cores = static_cast<int>(end - i);
        const std::string key = cores <= 2 ? "20004" : cores <= 6 ? "20003" : "20006";
        const std::string name = "W" + std::to_string(cableCounter_++);
        const std::uint64_t record = addCableRecord(name, key, cores, strips[i]);
        const std::string connector = "-XS" + std::to_string(connectorCounter_++);
        zvdb::BlockReference* plug =
            symbols_->insert("CONECTOR", {xs[i], 15}, layer, {{"RELACAO", connector, {6, 0}}});
        setXData(*plug, "KVR_ZV", XDataItems().text(keyText("9001", "1")));
        for (std::size_t c = i; c < end; ++c) {
            const int core = static_cast<int>(c - i) + 1;
            const bool blind = blindLast && c + 1 == xs.size();
            const Point3 from{xs[c], kTerminalY - SymbolLibrary::kTerminalLength};
            const Point3 to{xs[c], blind ? 40.0 : kPinY};
            zvdb::Polyline* lead = drawLead(layer, {from, to}, record, core);
            if (blind) {
                pendingBlinds_.push_back({name, lead->handle()});
                continue;
            }
            zvdb::BlockReference* pin = symbols_->insert(
                "PIN-CONTATO", to, layer, {{"ID_PINO", std::to_string(core), {2, -2}}});
            setXData(*pin, "KVR_ZV", XDataItems().text(keyText("9011", "1")));
            setXData(*pin, "ZV_PINO", XDataItems().text(connector));
        }
        i = end;
    }
}

std::uint64_t ProjectGenerator::Impl::addCableRecord(const std::string& name,
                                                     const std::string& key, int cores,
                                                     const std::string& from) {
    const std::string path[] = {"ZV_CABOS"};
    zvdb::XRecord* record = db_->dictionaryAt(path, true)->getOrCreateXRecord(name);
    record->setData(XDataItems().add(1, name).tags());
    setXData(*record, "KVR_ZV_CABO", XDataItems().text(keyText(key, "1")));
    XDataItems fields;
    fields.text("CABO" + std::string(1, kSep) + name + kSep + "N");
    fields.text("ORIGEM" + std::string(1, kSep) + from + kSep + "N");
    fields.text("DESTINO" + std::string(1, kSep) + "CAMPO" + kSep + "N");
    fields.text("VIAS_USADAS" + std::string(1, kSep) + std::to_string(cores) + kSep + "S");
    setXData(*record, "KVR_ZV_ATT_VIRTUAL", fields);
    ++counts.cables;
    return record->handle();
}

zvdb::Polyline* ProjectGenerator::Impl::drawLead(const std::string& layer,
                                                 const std::vector<Point3>& points,
                                                 std::uint64_t record, int core) {
    zvdb::Polyline* lead = db_->modelSpace()->addLwPolyline(points, false, layer);
    // A lead's key is its core's: the catalogue names the core ("1", "2"...).
    setXData(*lead, "KVR_ZV_CABO",
             XDataItems().text(keyText(coreKey(core), "1")).handle(record).handle(record));
    setXData(*lead, "KVR_ZV_ATT_VIRTUAL",
             XDataItems().text("NOME" + std::string(1, kSep) + std::to_string(core) + kSep + "N"));
    ++counts.leads;
    return lead;
}

void ProjectGenerator::Impl::drawPendingBlind(const std::string& layer) {
    for (const PendingBlind& blind : pendingBlinds_) {
        zvdb::Polyline* line =
            db_->modelSpace()->addLwPolyline({{kBlindX, 45}, {kBlindX, kPinY}}, false, layer);
        setXData(*line, "KVR_ZV_CONEX_BLIND", XDataItems().text(blind.cable).handle(blind.lead));
        zvdb::BlockReference* pin =
            symbols_->insert("PIN-CONTATO", {kBlindX, kPinY}, layer, {{"ID_PINO", "1", {2, -2}}});
        setXData(*pin, "KVR_ZV", XDataItems().text(keyText("9011", "1")));
        setXData(*pin, "ZV_PINO", XDataItems().text("-XS0"));
        ++counts.blindConnections;
    }
    pendingBlinds_.clear();
}

// ---- power page

void ProjectGenerator::Impl::drawPowerPage() {
    const std::string& layer = groups_[2].pages[0];
    const int motors = options_.terminals >= 16 ? 2 : 0;
    for (int i = 0; i < 4; ++i) {
        std::vector<SymbolAttribute> taps;
        for (int m = 0; m < motors; ++m)
            taps.push_back({"LIGACAO" + std::to_string(m + 1),
                            i < 3 ? "T" : "PE",
                            {motorX(m) + (i < 3 ? i * 10 : 30) - 20, 0}});
        drawBusBar(layer, i < 3 ? "-WL" + std::to_string(i + 1) : "-WPE", kPowerBusY[i], taps);
    }
    std::vector<std::size_t> coils;
    for (std::size_t k = 0; k < masters_.size() && coils.size() < 2; ++k)
        if (masters_[k].key == "2001" || masters_[k].key == "2005") coils.push_back(k);
    StripPlanner powerStrip(random_, "X", 0, projectNumbers());
    for (int m = 0; m < motors; ++m) {
        // A copy: drawing the circuit adds masters and moves the vector.
        const std::string contactor =
            coils.empty() ? std::string()
                          : masters_[coils[static_cast<std::size_t>(m) % coils.size()]].relation;
        drawMotorCircuit(layer, m, contactor, powerStrip.plan(4));
    }
}

void ProjectGenerator::Impl::drawBusBar(const std::string& layer, const std::string& relation,
                                        double y, const std::vector<SymbolAttribute>& taps) {
    std::vector<SymbolAttribute> attributes = {{"RELACAO", relation, {0, 2}}};
    attributes.insert(attributes.end(), taps.begin(), taps.end());
    zvdb::BlockReference* bar = symbols_->insert("BUS_BARRAMENTO", {20, y}, layer, attributes);
    setXData(*bar, "KVR_ZV", XDataItems().text(keyText("8001", "1")));
    setXData(*bar, "KVR_ZV_PTS_CORTE", XDataItems().point({20, y}).point({320, y}));
}

// Breaker, main contacts of a contactor, overload relay, terminals and the motor with its
// cable, three phases and earth.
void ProjectGenerator::Impl::drawMotorCircuit(const std::string& layer, int m,
                                              const std::string& contactor,
                                              std::vector<PlannedTerminal> terminals) {
    const int page = 3;
    const double base = motorX(m);
    std::vector<SymbolAttribute> pins, motorPins;
    for (int i = 0; i < 3; ++i) {
        const double x = base + i * 10, dx = x - (base + 10);
        const std::string n = std::to_string(2 * i + 1), n2 = std::to_string(2 * i + 2);
        pins.push_back({"LIGACAO" + n, n, {dx, 10}});
        pins.push_back({"LIGACAO" + n2, n2, {dx, -10}});
        motorPins.push_back({"LIGACAO" + n, std::string(1, "UVW"[i]), {x - (base + 15), 5}});
    }
    motorPins.push_back({"LIGACAO7", "PE", {15, 5}});
    const CoilKind breaker{"3001", "DISJUNTOR_MOTOR", "-Q", "TOPO_DM4"};
    const CoilKind thermal{"3007", "RELE_TERMICO", "-F", "TOPO_RT13"};
    const CoilKind motor{"7401", "MOTOR_TRIFASICO", "-M", ""};
    const std::size_t q = drawMaster(breaker, "1", {base + 10, 230}, layer, page, pins);
    setXData(*masters_[q].reference, "ZV_VINC_ADITIVO", XDataItems().text("1").text("3006"));
    drawMaster(thermal, "1", {base + 10, 165}, layer, page, pins);
    const std::size_t mm = drawMaster(motor, "1", {base + 15, 35}, layer, page, motorPins);
    setXData(*masters_[mm].reference, "KVR_ZV_CIRCLOC", XDataItems().integer32(2));
    const std::string cable = "W" + std::to_string(cableCounter_++);
    const std::uint64_t record = addCableRecord(cable, "20005", 4, "X0");
    for (int i = 0; i < 4; ++i) {
        const double x = i < 3 ? base + i * 10 : base + 30;
        PlannedTerminal& t = terminals[static_cast<std::size_t>(i)];
        t.language = 0;
        t.block = i < 3 ? "BORNE_PASSAGEM" : "BORNE_TERRA";
        t.key = i < 3 ? "1002" : "1006";
        t.standard = "1";
        drawTerminal(layer, {x, 80}, t);
        drawLead(layer, {{x, 70}, {x, 40}}, record, i + 1);
        if (i == 3)
            drawWire(layer, "PE", {{x, kPowerBusY[3]}, {x, 80}}, "10015", "1");
        else
            drawPhase(layer, x, i, contactor);
    }
}

// One phase from its bus bar through breaker, main contact and overload relay to the terminal.
void ProjectGenerator::Impl::drawPhase(const std::string& layer, double x, int phase,
                                       const std::string& contactor) {
    drawWire(layer, "L" + std::to_string(phase + 1), {{x, kPowerBusY[phase]}, {x, 240}}, "10011",
             "1");
    if (!contactor.empty()) {
        const std::string position =
            std::to_string(2 * phase + 1) + "-" + std::to_string(2 * phase + 2);
        zvdb::BlockReference* contact = symbols_->insert("NA-CONTATO_POTENCIA", {x, 200}, layer,
                                                         {{"RELACAO", contactor, {2, -4}},
                                                          {"PARENT", contactor, {2, -7}},
                                                          {"POSICAO_CTT", position, {2, -10}}});
        setXData(*contact, "KVR_ZV", XDataItems().text(keyText("2101", "1")));
        setXData(*contact, "KVR_ZV_PTS_CORTE", XDataItems().point({x, 200}).point({x, 190}));
        ++counts.contacts;
    }
    drawWire(layer, nextWire(), {{x, 220}, {x, 200}}, "10011", "1");
    drawWire(layer, nextWire(), {{x, 190}, {x, 175}}, "10011", "1");
    drawWire(layer, nextWire(), {{x, 155}, {x, 80}}, "10011", "1");
}

// ---- virtual objects

void ProjectGenerator::Impl::addVirtualObjects(int virtualTerminals) {
    const std::string path[] = {"ESQ_VIRTUAL_ZV"};
    zvdb::Dictionary* store = db_->dictionaryAt(path, true);
    for (int n = 1; n <= virtualTerminals; ++n) {
        const int language = n % 3;
        const TagSet& tags = tagSet(language);
        zvdb::XRecord* record = store->getOrCreateXRecord("BORNE_XV_" + std::to_string(n));
        record->setData(XDataItems().add(1, "XV:" + std::to_string(n)).tags());
        setXData(*record, "KVR_ZV", XDataItems().text(keyText("1001", "1")));
        XDataItems fields;
        fields.text(std::string(tags.strip) + kSep + "XV" + kSep + "N");
        const int number = options_.projectNumbers ? nextNumber_++ : n;
        fields.text(std::string(tags.number) + kSep + std::to_string(number) + kSep + "N");
        fields.text(std::string("JUMPER") + kSep + kSep + "N");
        setXData(*record, "KVR_ZV_ATT_VIRTUAL", fields);
    }
    struct VirtualComponent {
        const char* relation;
        const char* key;
    };
    for (const VirtualComponent& c :
         {VirtualComponent{"-E1", "8601"}, {"-B1", "8602"}, {"-X99", "8502"}}) {
        zvdb::XRecord* record = store->getOrCreateXRecord(std::string("COMP_") + c.relation);
        record->setData(XDataItems().add(1, c.relation).tags());
        setXData(*record, "KVR_ZV", XDataItems().text(keyText(c.key, "1")));
        setXData(*record, "KVR_ZV_ATT_VIRTUAL",
                 XDataItems().text(std::string("RELACAO") + kSep + c.relation + kSep + "N"));
    }
    counts.virtualTerminals = virtualTerminals;
}

// ---- panel layout

std::string ProjectGenerator::Impl::connectionOf(const Master& master, int n) {
    const zvdb::Attribute* connection = master.reference->attribute("LIGACAO" + std::to_string(n));
    return connection ? std::string(connection->textValue()) : "A" + std::to_string(n);
}

void ProjectGenerator::Impl::drawLayout() {
    const std::string& layer = groups_[4].pages[0];
    zvdb::BlockRecord* model = db_->modelSpace();
    model->addLwPolyline({{20, 20}, {360, 20}, {360, 280}, {20, 280}}, true, layer);
    model->addLine({20, 150}, {360, 150}, layer);  // the middle duct
    std::vector<zvdb::BlockReference*> ofMaster(masters_.size(), nullptr);
    std::vector<Point3> terminalAt(placedTerminals_.size());
    auto place = [&](zvdb::BlockReference& master, const std::string& key,
                     const std::string& standard, const std::string& front, Point3 at,
                     const std::vector<SymbolAttribute>& points) {
        zvdb::BlockReference* view = symbols_->insert(front + "_" + standard, at, layer, points);
        setXData(*view, "KVR_LAYOUT_ZV", XDataItems().text(keyText(key, standard)));
        setXData(*view, "KVR_LAYOUT_PAINEL", XDataItems().handle(master.handle()));
        setXData(master, "KVR_LAYOUT_ESQUEMA",
                 XDataItems().handle(view->handle()).text("PAINEL_1").handle(view->handle()));
        return view;
    };
    int slot = 0;
    for (std::size_t k = 0; k < masters_.size() && slot < 40; ++k) {
        if (masters_[k].topBlock.empty()) continue;
        const Point3 at{30.0 + (slot % 20) * 16, slot < 20 ? 250.0 : 200.0};
        // The view's connection points carry the master's own connection names.
        ofMaster[k] = place(*masters_[k].reference, masters_[k].key, masters_[k].standard,
                            masters_[k].topBlock, at,
                            {{"CPOINT1", connectionOf(masters_[k], 1), {0, 10}},
                             {"CPOINT2", connectionOf(masters_[k], 2), {0, -10}}});
        ++slot;
    }
    for (std::size_t k = 0; k < placedTerminals_.size() && k < 40; ++k) {
        terminalAt[k] = {30.0 + static_cast<double>(k) * 7, 100};
        place(*placedTerminals_[k].reference, placedTerminals_[k].key, placedTerminals_[k].standard,
              "TOPO_BX2_5_GY", terminalAt[k], {});
    }
    bool split = true;
    for (const RoutableWire& wire : routable_) {
        if (wire.master >= ofMaster.size() || !ofMaster[wire.master] || wire.terminal >= 40 ||
            wire.terminal >= placedTerminals_.size())
            continue;
        const Point3 from = ofMaster[wire.master]->position() + Point3{0, -10};
        addRoute(wire, from, terminalAt[wire.terminal], split);
        split = false;
    }
}

void ProjectGenerator::Impl::addRoute(const RoutableWire& wire, const Point3& from,
                                      const Point3& to, bool split) {
    const std::string& layer = groups_[4].pages[0];
    zvdb::BlockRecord* model = db_->modelSpace();
    const std::vector<Point3> path = {from, {from.x, 150}, {to.x, 150}, to};
    if (split) {  // one route in two pieces, joined by a transition between ducts
        const Point3 mid{(from.x + to.x) / 2, 150};
        for (const auto& piece : {std::vector<Point3>{from, {from.x, 150}, mid},
                                  std::vector<Point3>{mid, {to.x, 150}, to}}) {
            zvdb::Polyline* route = model->addLwPolyline(piece, false, layer);
            setXData(*route, "KVR_ZV_WIRE_LAYOUT", XDataItems().text(wire.number));
        }
        zvdb::BlockReference* a = symbols_->insert("TRANSICAO", mid, layer);
        zvdb::BlockReference* b = symbols_->insert("TRANSICAO", mid + Point3{0, -4}, layer);
        setXData(*a, "KVR_ZV_REPRESENTACAO", XDataItems().text("-50").handle(b->handle()));
        setXData(*b, "KVR_ZV_REPRESENTACAO", XDataItems().text("-50").handle(a->handle()));
        setXData(*a, "KVR_ZV_TRANSITION", XDataItems().handle(b->handle()));
        setXData(*b, "KVR_ZV_TRANSITION", XDataItems().handle(a->handle()));
    } else {
        zvdb::Polyline* route = model->addLwPolyline(path, false, layer);
        setXData(*route, "KVR_ZV_WIRE_LAYOUT", XDataItems().text(wire.number));
    }
    const std::string key = std::to_string(routeKey_);
    routeKey_ += 1 + random_.below(50);
    const std::string base[] = {"ZV_DATA_MGR", "CELayoutRotasFios", key};
    const std::string data = handleText(masters_[wire.master].reference->handle()) + ":" +
                             connectionOf(masters_[wire.master], 2) + "-" +
                             handleText(placedTerminals_[wire.terminal].reference->handle()) +
                             "-C1-C2" + (split ? "-T1-C3" : "");
    const std::pair<const char*, std::string> fields[] = {{"strKeyFio", wire.number},
                                                          {"strRotaData", data}};
    zvdb::Dictionary* object = db_->dictionaryAt(base, true);
    for (const auto& [name, value] : fields)
        object->getOrCreateXRecord(name)->setData(XDataItems().text(value).tags());
    ++counts.routes;
}

// ---- the public face

ProjectGenerator::ProjectGenerator(const GeneratorOptions& options)
    : impl_(std::make_unique<Impl>(options)) {}

ProjectGenerator::~ProjectGenerator() = default;

std::unique_ptr<zvdb::Database> ProjectGenerator::generate() {
    return impl_->run();
}

const GeneratedCounts& ProjectGenerator::counts() const {
    return impl_->counts;
}

}  // namespace zvsample
