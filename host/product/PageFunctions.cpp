// Pages and page groups: buscaListaGrupos, buscalistapaginas, getprimeirapagina,
// criarpagina, apagargrupo, atualizarpaginas, Descongela_as_layers_da_pagina,
// AtualizaModemacro.
#include "LispHelpers.h"
#include "PageAppender.h"
#include "PageRegistry.h"
#include "ProductLisp.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DeepCloner.h"
#include "drawing/DxfLoader.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"
#include "drawing/SymbolTable.h"

#include <QDir>
#include <QFileInfo>

#include <memory>
#include <string_view>
#include <typeinfo>
#include <unordered_set>

namespace zvproduct {

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::Value;

namespace {

const char* const kCompanions[] = {"$FORMATO", "$SELO", "$DE"};

zvdb::Database& databaseOf(Interpreter& lisp, const ProductContext& context) {
    zvdb::Database* database = context.database ? context.database() : nullptr;
    if (!database) lisp.fail("no drawing");
    return *database;
}

void ensureLayer(zvdb::Database& database, const std::string& name) {
    if (!database.layer(name)) database.createLayer(name);
}

// The product data's block drawing of `name` (DADOS/1/BLOCOS/NAME.dxf under
// *DIRETORIO_REDE*) copied into the drawing as a block; null when there is none.
zvdb::BlockRecord* productBlock(Interpreter& lisp, zvdb::Database& database,
                                const std::string& name) {
    if (zvdb::BlockRecord* block = database.block(name)) return block;
    const Value folder = lisp.global("*DIRETORIO_REDE*");
    if (!folder.isString()) return nullptr;
    QString path = QDir(QString(folder.asString()).replace('\\', '/'))
                       .filePath("DADOS/1/BLOCOS/" + QString::fromStdString(name) + ".dxf");
    if (!QFileInfo::exists(path)) return nullptr;
    try {
        auto source = zvdb::DxfLoader::loadFile(path.toStdString());
        return zvdb::DeepCloner(*source, database).cloneModelSpaceAsBlock(name);
    } catch (const std::exception&) {
        return nullptr;  // an unreadable block file leaves the page without a frame
    }
}

// The group's companion layers; its sheet frame, when the product data has one, goes on a
// frame layer made now (a group that has the layer keeps what it holds).
void addCompanions(Interpreter& lisp, zvdb::Database& database, const std::string& group) {
    const std::string frameLayer = group + "$FORMATO";
    const bool newFrameLayer = !database.layer(frameLayer);
    for (const char* suffix : kCompanions)
        ensureLayer(database, group + suffix);
    if (!newFrameLayer) return;
    if (zvdb::BlockRecord* frame = productBlock(lisp, database, "FORMATO_A3"))
        database.modelSpace()->addBlockReference(*frame, {}, {1, 1, 1}, 0, frameLayer);
}

std::string createPage(Interpreter& lisp, zvdb::Database& database, PageAppender& pages,
                       const std::string& group) {
    const PageAppender::Page page = pages.append(database, group);
    addCompanions(lisp, database, group);
    database.modelSpace()->addText({395, 14, 0}, 2.5, std::to_string(page.running), page.name);
    database.setCurrentLayer(page.name);
    pages.settle(database);
    return page.name;
}

void eraseGroup(zvdb::Database& database, const std::string& group) {
    PageRegistry registry(database);
    std::unordered_set<std::string> layers;
    if (PageGroup* entry = registry.group(group))
        layers.insert(entry->pages.begin(), entry->pages.end());
    for (const char* suffix : kCompanions)
        layers.insert(group + suffix);
    for (zvdb::Entity* entity : database.modelSpace()->entities())
        if (layers.count(std::string(entity->layer()))) entity->erase();
    if (layers.count(std::string(database.currentLayer()))) database.setCurrentLayer("0");
    for (const std::string& name : layers)
        if (zvdb::LayerRecord* layer = database.layer(name)) layer->erase();
    if (zvdb::SymbolTable* table = database.table("LAYER")) table->reindex();
    registry.removeGroup(group);
}

// The PAGINA_DE blocks of every group show the group's page count.
void refreshPageCounts(zvdb::Database& database) {
    PageRegistry registry(database);
    std::unordered_map<std::string, std::size_t> counts;
    // By length, whether a counted name has it: the length of a layer's name stands in its
    // tag, and a name of another length is passed without its text read from the file.
    std::vector<char> countedLength;
    for (const PageGroup& group : registry.groups()) {
        const std::string name = group.name + "$DE";
        if (name.size() >= countedLength.size()) countedLength.resize(name.size() + 1);
        countedLength[name.size()] = 1;
        counts[name] = group.pages.size();
    }
    // Walked in place: a list of a large drawing's entities would be made and freed for the
    // few title blocks.
    database.modelSpace()->forEachEntity([&counts, &countedLength](zvdb::Entity& entity) {
        // The kind first: it is read off the object, the layer off its tags. Nearly every
        // entity lies on a page: only a "$DE" layer's name is worth a copy.
        if (typeid(entity) != typeid(zvdb::BlockReference)) return;
        const std::string_view layer = entity.layer();
        if (layer.size() >= countedLength.size() || !countedLength[layer.size()]) return;
        if (!layer.ends_with("$DE")) return;
        auto count = counts.find(std::string(layer));
        if (count == counts.end()) return;
        auto& reference = static_cast<zvdb::BlockReference&>(entity);
        // A count that stands is left alone: the title block is not changed for nothing.
        zvdb::Attribute* total = reference.attribute("TOTAL");
        const std::string text = std::to_string(count->second);
        if (total && total->text(1) != text) total->setText(1, text);
    });
}

bool thawPage(zvdb::Database& database, const std::string& page) {
    zvdb::LayerRecord* layer = database.layer(page);
    if (!layer) return false;
    layer->setFrozen(false);
    const bool coverOrIndex = layer->hasXData("KVR_ZV_CAPA") || layer->hasXData("KVR_ZV_INDICE");
    const std::string group = PageRegistry::groupOf(page);
    for (const char* suffix : kCompanions) {
        zvdb::LayerRecord* companion = database.layer(group + suffix);
        if (!companion) continue;
        companion->setFrozen(coverOrIndex && std::string(suffix) == "$SELO");
    }
    return true;
}

Value structuredPages(const PageRegistry& registry) {
    zvlisp::ListBuilder groups;
    for (const PageGroup& group : registry.groups()) {
        zvlisp::ListBuilder one;
        one.add(lispText(group.name));
        for (const std::string& page : group.pages)
            one.add(lispText(page));
        groups.add(one.take());
    }
    return groups.take();
}

}  // namespace

void installPageFunctions(Interpreter& lisp, const ProductContext& context) {
    const auto pages = std::make_shared<PageAppender>();
    lisp.define(
        "buscaListaGrupos",
        [context](Interpreter& in, Args) {
            std::vector<std::string> names;
            const PageRegistry registry(databaseOf(in, context));
            for (const PageGroup& group : registry.groups())
                names.push_back(group.name);
            return lispTexts(names);
        },
        0, 0);
    lisp.define(
        "buscalistapaginas",
        [context](Interpreter& in, Args a) {
            PageRegistry registry(databaseOf(in, context));
            if (a.has(0) && !a[0].isNil()) return structuredPages(registry);
            return lispTexts(registry.pages());
        },
        0, 1);
    lisp.define(
        "getprimeirapagina",
        [context](Interpreter& in, Args) {
            const auto pages = PageRegistry(databaseOf(in, context)).pages();
            return pages.empty() ? Value() : lispText(pages.front());
        },
        0, 0);
    lisp.define(
        "criarpagina",
        [context, pages](Interpreter& in, Args a) {
            const std::string group = PageRegistry::groupOf(stdText(in, a[0]));
            if (group.empty()) in.fail("criarpagina: no group in \"" + in.toStr(a[0]) + "\"");
            return lispText(createPage(in, databaseOf(in, context), *pages, group));
        },
        1, 2);
    lisp.define(
        "apagargrupo",
        [context, pages](Interpreter& in, Args a) {
            pages->forget();
            eraseGroup(databaseOf(in, context), PageRegistry::groupOf(stdText(in, a[0])));
            return Value();
        },
        1, 1);
    lisp.define(
        "atualizarpaginas",
        [context](Interpreter& in, Args) {
            refreshPageCounts(databaseOf(in, context));
            return Value();
        },
        0, 0);
    lisp.define(
        "Descongela_as_layers_da_pagina",
        [context](Interpreter& in, Args a) {
            return in.boolean(thawPage(databaseOf(in, context), stdText(in, a[0])));
        },
        1, 1);
    lisp.define(
        "AtualizaModemacro",
        [context](Interpreter& in, Args) {
            zvdb::Database& database = databaseOf(in, context);
            const std::string layer(database.currentLayer());
            const int index = PageRegistry(database).pageIndex(layer);
            const QString text =
                index < 0 ? QString("ZV")
                          : QString("ZV %1 (%2)").arg(QString::fromStdString(layer)).arg(index + 1);
            in.setGlobal("*ZV_MODEMACRO*", Value::string(text));
            return Value();
        },
        0, 0);
}

}  // namespace zvproduct
