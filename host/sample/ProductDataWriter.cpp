#include "sample/ProductDataWriter.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfWriter.h"
#include "sample/XDataItems.h"

#include <filesystem>
#include <memory>
#include <string_view>

namespace zvsample {

namespace {

using zvdb::Point3;

// One column of a list row: the tag of its attribute, what the attribute holds (a field name
// for VARIAVEL tags, a LISP expression for FUNCAO tags), where it starts, and its title.
struct Cell {
    const char* tag;
    const char* value;
    double x;
    const char* title;
};

constexpr double kRow = 5.0;  // row height of every list (TAM_DETALHE)

// The front and strip views of the demo catalogue (BDBLOCOS), without their standard.
const char* const kViews[] = {"REGUA_BX2_5_BU",     "REGUA_BX2_5_GY",
                              "REGUA_BX4_GY",       "REGUA_BX6_GY",
                              "REGUA_BXD_6",        "REGUA_BXE",
                              "REGUA_BXJ10_5",      "REGUA_BXJ2_5",
                              "REGUA_BXM",          "REGUA_BXPE2_5",
                              "REGUA_BXPE6",        "REGUA_DK2_5_GY",
                              "REGUA_D_DK",         "REGUA_ST1_5_GY",
                              "REGUA_TF5_LED",      "REGUA_TS4_OG",
                              "TOPO_AE866",         "TOPO_AI8",
                              "TOPO_AUX11",         "TOPO_BA11",
                              "TOPO_BA22",          "TOPO_BL11",
                              "TOPO_BX2_5_BU",      "TOPO_BX2_5_GY",
                              "TOPO_BX4_GY",        "TOPO_BX6_GY",
                              "TOPO_BXD_6",         "TOPO_BXE",
                              "TOPO_BXJ10_5",       "TOPO_BXJ2_5",
                              "TOPO_BXM",           "TOPO_BXPE2_5",
                              "TOPO_BXPE6",         "TOPO_BXT10",
                              "TOPO_CA40_24DC",     "TOPO_CB01",
                              "TOPO_CB10",          "TOPO_CF15",
                              "TOPO_CM15",          "TOPO_CR4060",
                              "TOPO_CT09_10_24DC",  "TOPO_CT18_10_230AC",
                              "TOPO_CT32_11_230AC", "TOPO_CT65_11_230AC",
                              "TOPO_CU12_5",        "TOPO_CU20_5",
                              "TOPO_DI16",          "TOPO_DIN35",
                              "TOPO_DK2_5_GY",      "TOPO_DM12",
                              "TOPO_DM4",           "TOPO_DO16",
                              "TOPO_D_DK",          "TOPO_ES40",
                              "TOPO_ETH1",          "TOPO_F1038_2",
                              "TOPO_FC20",          "TOPO_HF16",
                              "TOPO_HM16",          "TOPO_IS12",
                              "TOPO_LC_1214",       "TOPO_LP",
                              "TOPO_M12F4",         "TOPO_M12M4",
                              "TOPO_M15_4P",        "TOPO_MB1C10",
                              "TOPO_MB2C6",         "TOPO_MB3C16",
                              "TOPO_PB_GN",         "TOPO_PB_RD",
                              "TOPO_PF1038",        "TOPO_PL_GN24",
                              "TOPO_PL_RD24",       "TOPO_PL_YE230",
                              "TOPO_PS24_10",       "TOPO_PS24_5",
                              "TOPO_R2_230AC",      "TOPO_RI1_24DC",
                              "TOPO_RT13",          "TOPO_S2",
                              "TOPO_SI3",           "TOPO_SR3_24",
                              "TOPO_SS2",           "TOPO_ST1_5_GY",
                              "TOPO_TF5_LED",       "TOPO_TH60",
                              "TOPO_TM_UNI",        "TOPO_TR100",
                              "TOPO_TS10",          "TOPO_TS4_OG",
                              "TOPO_VF22",          "TOPO_VF230"};

class BlockFile {
public:
    BlockFile() : db_(std::make_unique<zvdb::Database>()), model_(db_->modelSpace()) {}
    zvdb::BlockRecord& model() { return *model_; }
    void box(double x0, double y0, double x1, double y1) {
        model_->addLwPolyline({{x0, y0}, {x1, y0}, {x1, y1}, {x0, y1}}, true);
    }
    void save(const std::filesystem::path& path) {
        std::filesystem::create_directories(path.parent_path());
        zvdb::DxfWriter::saveFile(*db_, path.string());
    }

private:
    std::unique_ptr<zvdb::Database> db_;
    zvdb::BlockRecord* model_;
};

// A detail row: the row's frame from its insertion point down, one attribute per cell.
void detailRow(BlockFile& file, const std::vector<Cell>& cells, double width) {
    file.box(0, -kRow, width, 0);
    for (const Cell& cell : cells) {
        if (cell.x > 0) file.model().addLine({cell.x - 1, -kRow}, {cell.x - 1, 0});
        file.model().addAttributeDefinition(cell.tag, cell.title, cell.value, {cell.x, -kRow + 1.5},
                                            2.0);
    }
}

// A header: the sheet's list title and the column titles above the first row.
void headerRow(BlockFile& file, const char* title, const std::vector<Cell>& cells, double x0,
               double columnStep, int columns, double width) {
    file.model().addText({20, 278}, 5, title);
    file.model().addAttributeDefinition("CAB_DATA", "Date", "DATA", {250, 278}, 2.5);
    file.model().addAttributeDefinition("CAB_PAGINA", "Item", "PAGINA", {300, 278}, 2.5);
    file.model().addAttributeDefinition("CAB_QTD", "Count", "QTD", {330, 278}, 2.5);
    for (int c = 0; c < columns; ++c) {
        const double x = x0 + c * columnStep;
        file.box(x, 262, x + width, 270);
        for (const Cell& cell : cells)
            file.model().addText({x + cell.x, 264}, 2.2, cell.title);
    }
}

void footerRow(BlockFile& file) {
    file.model().addLine({15, 18}, {365, 18});
    file.model().addAttributeDefinition("ROD_PAGINA", "Item", "PAGINA", {20, 13}, 2.5);
    file.model().addAttributeDefinition("ROD_HORA", "Time", "HORA", {80, 13}, 2.5);
}

void totalRow(BlockFile& file, const std::vector<Cell>& sums, double width) {
    file.box(0, -kRow, width, 0);
    file.model().addText({2, -kRow + 1.5}, 2.2, "TOTAL");
    for (const Cell& cell : sums)
        file.model().addAttributeDefinition(cell.tag, cell.title, cell.value, {cell.x, -kRow + 1.5},
                                            2.2);
}

}  // namespace

std::vector<std::string> ProductDataWriter::writeAll() {
    written_.clear();
    writeListBlocks();
    writeStripBlocks();
    writeViews();
    writeFrames();
    return written_;
}

namespace {

std::string blockPath(const std::string& root, std::string_view standard, std::string_view name) {
    return (std::filesystem::path(root) / "DADOS" / std::string(standard) / "BLOCOS" /
            (std::string(name) + ".dxf"))
        .string();
}

// The rows of one list: cells of the detail row, optional first-row and accessory cells, and
// the fields the total sums.
struct ListSpec {
    const char* prefix;  // LST_BORNE, LST_FIO...
    const char* title;
    std::vector<Cell> detail;
    std::vector<Cell> first;
    std::vector<Cell> accessory;
    std::vector<Cell> totals;
    double width;
    int columns;
};

std::vector<ListSpec> listSpecs() {
    const std::vector<Cell> terminal = {
        {"VARIAVEL_NUMERO", "NUMERO", 10, "No."},
        {"VARIAVEL_REL_INI", "RELACAO_INI", 20, "Interno"},
        {"VARIAVEL_FIO_INI", "FIO_SEGINI", 60, "Fio"},
        {"VARIAVEL_FIO_FIM", "FIO_SEGFIM", 78, "Fio"},
        {"VARIAVEL_REL_FIM", "RELACAO_FIM", 96, "Externo"},
        {"VARIAVEL_CHAVE", "ZV_KEY", 136, "Codigo"},
        {"FUNCAO_INVERTIDO", "(if (= (cdr (assoc \"INVERTIDO\" reg)) \"S\") \"inv\" \"\")", 152,
         "Obs."}};
    const std::vector<Cell> wire = {{"VARIAVEL_FIO", "FIO", 2, "Fio"},
                                    {"VARIAVEL_REL_INI", "RELACAO_INI", 22, "De"},
                                    {"VARIAVEL_REL_FIM", "RELACAO_FIM", 72, "Para"},
                                    {"VARIAVEL_CHAVE", "ZV_KEY", 122, "Codigo"},
                                    {"VARIAVEL_DESCRICAO", "DESCRICAO", 140, "Descricao"},
                                    {"VARIAVEL_COMPRIMENTO", "COMPRIMENTO", 300, "mm"},
                                    {"VARIAVEL_CAMINHO", "CAMINHOFIO", 330, "Caminho"}};
    // A cable's first row on a page names the cable; every row shows one core and its two
    // ends, composed by the template's zvCaboLado.
    const std::vector<Cell> cable = {{"VARIAVEL_NOME", "NOME", 150, "Via"},
                                     {"FUNCAO_DE", "(zvCaboLado \"INI\")", 166, "De"},
                                     {"FUNCAO_PARA", "(zvCaboLado \"FIM\")", 216, "Para"},
                                     {"VARIAVEL_LAYER", "LAYER", 266, "Pagina"}};
    std::vector<Cell> cableFirst = {{"VARIAVEL_CABO", "CABO", 2, "Cabo"},
                                    {"VARIAVEL_CHAVE", "ZV_KEY", 18, "Codigo"},
                                    {"VARIAVEL_DESCRICAO", "DESCRICAO", 34, "Descricao"}};
    cableFirst.insert(cableFirst.end(), cable.begin(), cable.end());
    const std::vector<Cell> material = {
        {"VARIAVEL_QTD", "QTD", 2, "Qtd."},
        {"VARIAVEL_CHAVE", "ZV_KEY", 16, "Codigo"},
        {"VARIAVEL_DESCRICAO", "DESCRICAO", 36, "Descricao"},
        {"VARIAVEL_FABRICANTE", "FABRICANTE", 196, "Fabricante"},
        {"VARIAVEL_REFERENCIA", "REFERENCIA", 236, "Referencia"},
        {"VARIAVEL_MATERIAL", "SAP_MATERIAL", 290, "Material"},
        {"FUNCAO_RELACAO", "(cond ((cdr (assoc \"RELACAO\" reg))) (\"\"))", 320, "Relacao"}};
    const std::vector<Cell> accessory = {{"VARIAVEL_QTD", "QTD", 6, "Qtd."},
                                         {"VARIAVEL_CHAVE", "ZV_KEY", 20, "Codigo"},
                                         {"VARIAVEL_DESCRICAO", "DESCRICAO", 40, "Descricao"}};
    return {{"LST_BORNE",
             "LISTA DE BORNES",
             terminal,
             {},
             {},
             {{"VARIAVEL_QTD", "QTD", 30, "Qtd."}},
             170,
             2},
            {"LST_FIO",
             "LISTA DE FIOS",
             wire,
             {},
             {},
             {{"VARIAVEL_COMP", "COMPRIMENTO", 300, "mm"}},
             390,
             1},
            {"LST_CABO",
             "LISTA DE CABOS",
             cable,
             cableFirst,
             {},
             {{"VARIAVEL_QTD", "QTD", 30, "Qtd."}},
             300,
             1},
            {"LST_MAT",
             "LISTA DE MATERIAIS",
             material,
             {},
             accessory,
             {{"VARIAVEL_QTD", "QTD", 2, "Qtd."}},
             390,
             1}};
}

}  // namespace

void ProductDataWriter::writeListBlocks() {
    for (const ListSpec& spec : listSpecs()) {
        const std::string prefix = spec.prefix;
        auto store = [&](BlockFile& file, const std::string& suffix) {
            written_.push_back(blockPath(root_, "1", prefix + suffix));
            file.save(written_.back());
        };
        BlockFile header, detail, footer, total;
        // A first row shows more than the others: the header titles all its columns.
        const std::vector<Cell>& titles = spec.first.empty() ? spec.detail : spec.first;
        headerRow(header, spec.title, titles, 15, 180, spec.columns, spec.width);
        store(header, "_CAB");
        detailRow(detail, spec.detail, spec.width);
        store(detail, "_DET");
        footerRow(footer);
        store(footer, "_ROD");
        totalRow(total, spec.totals, spec.width);
        store(total, "_TOT");
        if (!spec.first.empty()) {
            BlockFile first;
            detailRow(first, spec.first, spec.width);
            store(first, "_PRIM");
        }
        if (!spec.accessory.empty()) {
            BlockFile accessory;
            detailRow(accessory, spec.accessory, spec.width);
            store(accessory, "_ACE");
        }
    }
    // Jumper marks: a bar drawn down the row, with a dot on a bridged terminal.
    struct Mark {
        const char* name;
        double top, bottom;
        bool dot;
    };
    for (const Mark& mark :
         {Mark{"JMP_INI", -kRow / 2, -kRow, true}, Mark{"JMP_MEIO", 0, -kRow, true},
          Mark{"JMP_CONT", 0, -kRow, false}, Mark{"JMP_FIM", 0, -kRow / 2, true}}) {
        BlockFile file;
        file.model().addLine({1.5, mark.top}, {1.5, mark.bottom});
        if (mark.dot) file.model().addCircle({1.5, -kRow / 2}, 0.6);
        written_.push_back(blockPath(root_, "1", mark.name));
        file.save(written_.back());
    }
}

namespace {

// An attribute definition of a strip piece; `vertical` writes it upwards, as the texts of a
// strip's narrow terminals stand.
void stripText(BlockFile& file, const char* tag, const char* value, zvdb::Point3 at, double height,
               bool vertical = false) {
    zvdb::Attribute* definition = file.model().addAttributeDefinition(tag, tag, value, at, height);
    if (vertical) definition->setReal(50, 90.0, "AcDbText");
}

}  // namespace

// The pieces of the strip drawing (reguas.grx), around a terminal step of 6 and jumper tracks
// 2 apart: each terminal's insertion point is the middle of its top jumper track.
void ProductDataWriter::writeStripBlocks() {
    auto store = [&](BlockFile& file, const char* name) {
        written_.push_back(blockPath(root_, "1", name));
        file.save(written_.back());
    };
    // The strip's name box at the left of its first terminal; the drawing writes the name
    // into REGUA (or STRIP, REGLETA).
    BlockFile header;
    header.box(-33, -12, -3, 14);
    header.model().addLine({-33, 8}, {-3, 8});
    header.model().addText({-31, 9.5}, 2.5, "REGUA");
    stripText(header, "REGUA", "", {-31, -2}, 6.0);
    store(header, "REGUA_CAB");
    // A terminal: number on top, the inner side's element and wire above, the outer side's
    // below, the jumper tracks in the middle.
    BlockFile terminal;
    terminal.box(-3, -12, 3, 14);
    terminal.model().addLine({-3, 8}, {3, 8});
    terminal.model().addLine({0, 14}, {0, 16});
    terminal.model().addLine({0, -12}, {0, -14});
    // The number in whichever language the terminal is tagged: the other one stays empty.
    stripText(terminal, "VARIAVEL_NUMERO", "NUMERO", {-2.2, 9.8}, 2.2);
    stripText(terminal, "VARIAVEL_NUMBER", "NUMBER", {-2.2, 9.8}, 2.2);
    stripText(terminal, "VARIAVEL_REL_INI", "RELACAO_INI", {1.0, 16.5}, 1.6, true);
    stripText(terminal, "VARIAVEL_FIO_INI", "FIO_SEGINI", {-1.2, 16.5}, 1.4, true);
    stripText(terminal, "VARIAVEL_REL_FIM", "RELACAO_FIM", {1.0, -38}, 1.6, true);
    stripText(terminal, "VARIAVEL_FIO_FIM", "FIO_SEGFIM", {-1.2, -38}, 1.4, true);
    store(terminal, "REGUA_BORNE");
    // A detail run's label above the strip (the element on the inner side of the run), and
    // the separator that closes the run's band.
    BlockFile detail;
    detail.model().addLine({-3, 36}, {3, 36});
    stripText(detail, "VARIAVEL_REL", "REL_INI", {-2.5, 38}, 2.5);
    store(detail, "REGUA_DET");
    BlockFile separator;
    separator.model().addLine({0, 34}, {0, 44});
    store(separator, "REGUA_SEP");
    // Jumper marks on a track: a bar to the neighbours, a dot on a bridged terminal.
    struct Mark {
        const char* name;
        double from, to;
        bool dot;
    };
    for (const Mark& mark :
         {Mark{"REGUA_PONTEI", 0, 3, true}, Mark{"REGUA_PONTE", -3, 3, false},
          Mark{"REGUA_PONTEF", -3, 0, true}, Mark{"REGUA_PONTEM", -3, 3, true}}) {
        BlockFile file;
        file.model().addLine({mark.from, 0}, {mark.to, 0});
        if (mark.dot) file.model().addCircle({0, 0}, 0.6);
        store(file, mark.name);
    }
    // The first page of the drawing.
    BlockFile warning;
    warning.box(60, 110, 360, 190);
    warning.model().addText({80, 165}, 10, "ATENCAO");
    warning.model().addText({80, 145}, 4, "Desenho de reguas gerado a partir do projeto:");
    warning.model().addText({80, 135}, 4, "altere o esquema e gere de novo, nao estas paginas.");
    store(warning, "REGUA_AVISO");
}

void ProductDataWriter::writeViews() {
    for (const char* standard : {"1", "2"}) {
        for (const char* name : kViews) {
            const std::string_view view(name);
            const bool terminal = view.starts_with("REGUA_") ||
                                  view.find("BX") != std::string_view::npos ||
                                  view.starts_with("TOPO_TS4") || view.starts_with("TOPO_TF5") ||
                                  view.starts_with("TOPO_DK") || view.starts_with("TOPO_ST1");
            const double width = terminal ? 6 : 18 + 6 * static_cast<double>(view.size() % 5);
            const double height = terminal ? 45 : 50 + 10 * static_cast<double>(view.size() % 3);
            BlockFile file;
            file.box(0, 0, width, height);
            const bool front = view.starts_with("TOPO_");
            if (front) {
                // A front view as the panel shows it: a device with its marker plate, or a
                // terminal with its two screws; the diagram fills the attributes named after
                // the symbol's fields.
                if (terminal) {
                    file.model().addCircle({width / 2, height - 4}, 1.5);
                    file.model().addCircle({width / 2, 4}, 1.5);
                    // The English library's terminals say NUMBER, as its symbols do.
                    const char* number = std::string_view(standard) == "2" ? "NUMBER" : "NUMERO";
                    file.model().addAttributeDefinition(number, "Number", "", {1, height / 2}, 1.5);
                } else {
                    file.box(2, height - 10, width - 2, height - 3);
                    file.box(4, 4, width - 4, height - 14);
                    file.model().addAttributeDefinition("RELACAO", "Tag", "", {3, height - 8}, 2.5);
                    file.model().addAttributeDefinition("ZV_KEY", "Key", "", {5, 6}, 1.8);
                }
            } else {
                file.model().addLine({0, 0}, {width, height});
                file.model().addAttributeDefinition("VARIAVEL_RELACAO", "Tag", "RELACAO",
                                                    {1, height + 1}, 2.0);
                file.model().addAttributeDefinition("CPOINT1", "Connection", "1",
                                                    {width / 2, height}, 1.0);
                file.model().addAttributeDefinition("CPOINT2", "Connection", "2", {width / 2, 0},
                                                    1.0);
            }
            // The step of a terminal in the topographic diagram's strips; hidden in a front
            // view, which shows only what the diagram fills from the symbol's fields.
            if (terminal)
                file.model()
                    .addAttributeDefinition("PASSO", "Step", realText(width), {0, -2}, 1.0)
                    ->setInvisible(front);
            written_.push_back(blockPath(root_, standard, view));
            file.save(written_.back());
        }
        // The strip drawing's view of a component (representation 2): a narrow box under the
        // first terminal it is wired to, tag and description written upwards.
        BlockFile component;
        component.box(-2.5, -28, 2.5, 0);
        component.model().addLine({0, 0}, {0, 8});
        stripText(component, "VARIAVEL_RELACAO", "RELACAO", {2.3, -26}, 2.0, true);
        stripText(component, "VARIAVEL_DESCRICAO", "DESCRICAO", {-0.2, -26}, 1.1, true);
        written_.push_back(blockPath(root_, standard, "REGUA_COMP"));
        component.save(written_.back());
    }
}

void ProductDataWriter::writeFrames() {
    BlockFile frame, title;
    frame.box(0, 0, 420, 297);
    frame.box(10, 10, 410, 287);
    written_.push_back(blockPath(root_, "1", "FORMATO_A3"));
    frame.save(written_.back());
    title.box(370, 10, 410, 287);
    const char* const fields[] = {"TITULO", "CLIENTE", "PROJETO", "DATA", "PAGINA"};
    double y = 270;
    for (const char* field : fields) {
        title.model().addAttributeDefinition(field, field, "", {372, y}, 2.5);
        y -= 10;
    }
    written_.push_back(blockPath(root_, "1", "SELO_A3"));
    title.save(written_.back());
}

}  // namespace zvsample
