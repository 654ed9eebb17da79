#include "sample/SymbolLibrary.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"

namespace zvsample {

namespace {

bool startsWith(std::string_view text, std::string_view prefix) {
    return text.substr(0, prefix.size()) == prefix;
}

void rectangle(zvdb::BlockRecord& block, double x0, double y0, double x1, double y1) {
    block.addLwPolyline({{x0, y0}, {x1, y0}, {x1, y1}, {x0, y1}}, true);
}

}  // namespace

SymbolLibrary::SymbolLibrary(zvdb::Database& database) : db_(database) {}

zvdb::BlockRecord& SymbolLibrary::block(std::string_view name) {
    const std::string key(name);
    auto found = blocks_.find(key);
    if (found != blocks_.end()) return *found->second;
    zvdb::BlockRecord* record = db_.createBlock(name);
    define(*record, name);
    blocks_.emplace(key, record);
    return *record;
}

zvdb::BlockReference* SymbolLibrary::insert(std::string_view name, const zvdb::Point3& position,
                                            std::string_view layer,
                                            const std::vector<SymbolAttribute>& attributes) {
    zvdb::BlockRecord& definition = block(name);
    zvdb::BlockReference* reference =
        db_.modelSpace()->addBlockReference(definition, position, {1, 1, 1}, 0, layer);
    for (const SymbolAttribute& attribute : attributes)
        reference->addAttribute(attribute.tag, attribute.value, position + attribute.offset, 2.0);
    return reference;
}

void SymbolLibrary::define(zvdb::BlockRecord& block, std::string_view name) {
    if (startsWith(name, "BORNE") || startsWith(name, "BOR-")) return defineTerminal(block);
    if (startsWith(name, "NA-") || startsWith(name, "BT-")) return defineContact(block, false);
    if (startsWith(name, "NF-") || startsWith(name, "NAF-")) return defineContact(block, true);
    if (name == "FORMATO_A3") return defineFrame(block);
    if (name == "SELO_A3") return defineTitleBlock(block);
    if (startsWith(name, "PIN-") || name == "ANILHA_FIO" || name == "CONEX_BLIND" ||
        name == "TRANSICAO")
        return defineBox(block, 1.5, 1.5);
    if (startsWith(name, "BUS")) {
        block.addLine({0, 0}, {300, 0});
        block.addLine({0, 1}, {300, 1});
        return;
    }
    if (startsWith(name, "TOPO_")) return defineBox(block, 6, 12);
    // Wide enough that its cable's four cores, 10 apart, end on it.
    if (name == "MOTOR_TRIFASICO") return defineBox(block, 16, 5);
    if (name == "PAGINA_DE") {
        block.addAttributeDefinition("TOTAL", "Pages", "1", {0, 0}, 2.5);
        return;
    }
    defineBox(block, 5, 5);
}

void SymbolLibrary::defineTerminal(zvdb::BlockRecord& block) {
    rectangle(block, -2, -kTerminalLength, 2, 0);
    block.addCircle({0, -kTerminalLength / 2}, 1.0);
    block.addAttributeDefinition("REGUA", "Strip", "", {3, -3}, 2.0);
    block.addAttributeDefinition("NUMERO", "Number", "", {3, -6}, 2.0);
    block.addAttributeDefinition("JUMPER", "Jumper", "", {3, -9}, 1.5);
    block.addAttributeDefinition("INVERTIDO", "Inverted", "N", {3, -12}, 1.5);
}

void SymbolLibrary::defineContact(zvdb::BlockRecord& block, bool closed) {
    block.addLine({0, 0}, {0, -3});
    block.addLine({0, -3}, {-3, -7});
    if (closed) block.addLine({-3, -7}, {0, -7});
    block.addLine({0, -7}, {0, -kContactLength});
    block.addAttributeDefinition("RELACAO", "Tag", "", {2, -4}, 2.0);
}

void SymbolLibrary::defineBox(zvdb::BlockRecord& block, double halfWidth, double halfHeight) {
    rectangle(block, -halfWidth, -halfHeight, halfWidth, halfHeight);
}

void SymbolLibrary::defineFrame(zvdb::BlockRecord& block) {
    rectangle(block, 0, 0, 420, 297);
    rectangle(block, 10, 10, 410, 287);
    for (int i = 1; i < 10; ++i)
        block.addLine({10.0 + i * 40, 287}, {10.0 + i * 40, 292});
}

void SymbolLibrary::defineTitleBlock(zvdb::BlockRecord& block) {
    rectangle(block, 370, 10, 410, 287);
    block.addAttributeDefinition("TITULO", "Title", "", {372, 270}, 2.5);
    block.addAttributeDefinition("CLIENTE", "Client", "", {372, 260}, 2.0);
    block.addAttributeDefinition("PROJETO", "Project", "", {372, 250}, 2.0);
    block.addAttributeDefinition("DATA", "Date", "", {372, 240}, 2.0);
}

}  // namespace zvsample
