// Templates and the other services: ZVCarregaTemplate, zvBuild, BuscarCoordenadas,
// zvGetCircuitoLocalInfo, zvsolution_load, zvsolution_isloaded, zvsolution_getProjFile,
// zv_interno_get_idioma_corrente, atualizarMacros, atualizaTopografico,
// zvAlternaStatusBloqueioPalette, zvExportaLayerDxf, zvExportaLayer.
#include "DrawingStamp.h"
#include "LispHelpers.h"
#include "ProductLisp.h"
#include "ProjectCheck.h"
#include "SheetGridIndex.h"

#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DeepCloner.h"
#include "drawing/DxfWriter.h"
#include "drawing/Entity.h"
#include "drawing/LayerRecord.h"
#include "lisp/LispFile.h"
#include "plot/PageIndex.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>

#include <cmath>
#include <memory>

namespace zvproduct {

using zvlisp::Args;
using zvlisp::Interpreter;
using zvlisp::Value;

namespace {

void print(const ProductContext& context, const QString& text) {
    if (context.print) context.print(text);
}

double tolerance(Interpreter& lisp) {
    const Value value = lisp.global("*ESPESSURA_BARRAMENTO*");
    return value.isNumber() && lisp.toNumber(value) > 0 ? lisp.toNumber(value) : 0.1;
}

Value loadTemplate(Interpreter& lisp, const ProductContext& context, const QString& path) {
    // The module names files the way the product always has, with backslashes between folders.
    const QString file = zvlisp::LispFile::find(path, {});
    QString text;
    if (!QFileInfo(file).isFile() || !zvlisp::LispFile::readText(file, &text)) {
        print(context, "\n; error: template not found: " + path + "\n");
        return Value();
    }
    QString message;
    // A template that sets nothing makes no list: it is refused like a broken one.
    const Value forms = lisp.catching([&] { return lisp.readAll(text); }, &message);
    if (message.isEmpty() && forms.isNil()) message = "the template is empty";
    if (message.isEmpty()) lisp.catching([&] { return lisp.evalText(text, file); }, &message);
    if (!message.isEmpty()) {
        print(context, "\n; error: " + message + "\n; in template " + path + "\n");
        return Value();
    }
    return lisp.t();
}

// (BuscarCoordenadas ENAME GROUP PAGE X Y): the position on the group's sheet grid.
Value gridPosition(Interpreter& lisp, const ProductContext& context, SheetGridIndex& grids,
                   Args a) {
    if (!a[3].isNumber() || !a[4].isNumber()) return Value::string("??");
    zvdb::Database* database = context.database ? context.database() : nullptr;
    const QString group = a[1].isString() ? a[1].asString() : QString();
    return Value::string(grids.position(database, group, lisp.toNumber(a[3]), lisp.toNumber(a[4])));
}

// The first panel named on the project settings point (KVR_ZV_PAINEL); empty.
QString findFirstPanel(zvdb::Database& database) {
    QString panel;
    bool found = false;
    // Walked in place: a list of the entities first would touch each one an extra time.
    database.modelSpace()->forEachEntity([&](zvdb::Entity& entity) {
        // The type stands first among the tags; the layer is looked for among them.
        if (found || !entity.isType("POINT") || entity.layer() != "ZV_FREEZE") return;
        const auto items = entity.xdata("KVR_ZV_PAINEL");
        if (items.empty()) return;
        panel = QString::fromUtf8(items.front().value.data(),
                                  static_cast<int>(items.front().value.size()));
        found = true;
    });
    return panel;
}

// The readers ask for every local circuit: the panel is looked for once per drawing change.
struct PanelCache {
    DrawingStamp stamp;
    QString panel;
};

QString firstPanel(zvdb::Database* database, PanelCache& cache) {
    if (!database) return {};
    // The point is an entity: the freezes and thaws of page swaps leave it as it was.
    if (!(cache.stamp == DrawingStamp::ofShapes(*database))) {
        cache.panel = findFirstPanel(*database);
        cache.stamp = DrawingStamp::ofShapes(*database);
    }
    return cache.panel;
}

// From *ZV_CIRCUITOS_LOCAIS*, ((N "circuit" "panel" "third") ...); otherwise the number, the
// project's first panel and an empty text.
Value localCircuit(Interpreter& lisp, const QString& panel, int number) {
    for (Value rest = lisp.global("*ZV_CIRCUITOS_LOCAIS*"); rest.isCons();
         rest = zvlisp::cdr(rest)) {
        const Value entry = zvlisp::car(rest);
        const Value key = zvlisp::car(entry);
        if (key.isInt() && key.asInt() == number) {
            QStringList texts;
            for (Value f = zvlisp::cdr(entry); f.isCons() && texts.size() < 3; f = zvlisp::cdr(f))
                texts << (zvlisp::car(f).isString() ? zvlisp::car(f).asString() : QString());
            while (texts.size() < 3)
                texts << QString();
            return lispTexts(texts);
        }
    }
    return lispTexts(QStringList{QString::number(number), panel, QString()});
}

QStringList solutionFiles(Interpreter& lisp) {
    std::vector<std::string> files;
    collectTexts(lisp.global("*ZV_SOLUCAO*"), files);
    QStringList out;
    for (const std::string& file : files)
        out << QString::fromStdString(file);
    return out;
}

// The solution's file whose name, with or without its extension, is the project key.
Value projectFile(Interpreter& lisp, const QString& key) {
    for (const QString& file : solutionFiles(lisp)) {
        const QFileInfo info(QString(file).replace('\\', '/'));
        if (info.fileName().compare(key, Qt::CaseInsensitive) == 0 ||
            info.completeBaseName().compare(key, Qt::CaseInsensitive) == 0)
            return Value::string(file);
    }
    return Value();
}

// A solution file: one project drawing a line, relative to the file's folder; blank lines
// and lines that begin with ";" say nothing. The projects become *ZV_SOLUCAO*.
Value loadSolution(Interpreter& lisp, const ProductContext& context, const QString& path) {
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        print(context, "\nzvsolution_load: can't read " + path + "\n");
        return Value();
    }
    const QDir folder = QFileInfo(path).absoluteDir();
    QStringList projects;
    for (const QString& raw : QString::fromUtf8(file.readAll()).split('\n')) {
        QString line = raw.trimmed();
        if (line.isEmpty() || line.startsWith(';')) continue;
        line.replace('\\', '/');
        projects << QDir::cleanPath(folder.absoluteFilePath(line));
    }
    if (projects.isEmpty()) {
        print(context, "\nzvsolution_load: " + path + " names no project drawing\n");
        return Value();
    }
    const Value list = lispTexts(projects);
    lisp.setGlobal("*ZV_SOLUCAO*", list);
    return list;
}

QString currentLanguage(Interpreter& lisp) {
    const Value set = lisp.global("*_ZV_IDIOMA_ATUAL_*");
    if (set.isString() && !set.asString().isEmpty()) return set.asString();
    const QString locale = qEnvironmentVariable("LANG").left(2).toLower();
    if (locale == "en") return "EN";
    if (locale == "es") return "ES";
    return "PT";
}

// The page as it shows (its layer and its frame, title block and page-count layers) in a
// new drawing with what its entities use: blocks, layers, linetypes, text styles and their
// extension dictionaries. The page's own layer comes along even when it is empty, with its
// cover or index mark.
bool exportPageDxf(zvdb::Database& database, const std::string& page, const QString& path,
                   QString* error) {
    const zvdb::LayerRecord* pageLayer = database.layer(page);
    if (!pageLayer) {
        *error = "no such page: " + QString::fromStdString(page);
        return false;
    }
    const zvplot::PageIndex index(database);
    const std::vector<zvdb::Entity*> entities =
        index.entitiesOn(zvplot::PageIndex::pageLayers(database, page));
    try {
        zvdb::Database target;
        zvdb::DeepCloner(database, target).cloneEntities(entities, *target.modelSpace());
        zvdb::LayerRecord* copy = target.createLayer(page);
        for (const char* mark : {"KVR_ZV_CAPA", "KVR_ZV_INDICE"}) {
            const std::vector<zvdb::Tag> items = pageLayer->xdata(mark);
            if (!items.empty()) copy->setXData(mark, items);
        }
        target.setCurrentLayer(page);
        zvdb::DxfWriter::saveFile(target, path.toStdString());
    } catch (const std::exception& failure) {
        *error = QString::fromUtf8(failure.what());
        return false;
    }
    return true;
}

}  // namespace

void installServiceFunctions(Interpreter& lisp, const ProductContext& context) {
    lisp.define(
        "ZVCarregaTemplate",
        [context](Interpreter& in, Args a) { return loadTemplate(in, context, in.toStr(a[0])); }, 1,
        1);
    lisp.define(
        "zvBuild",
        [context](Interpreter& in, Args) {
            zvdb::Database* database = context.database ? context.database() : nullptr;
            if (!database) return Value();
            const QStringList findings = ProjectCheck::run(*database, tolerance(in));
            const int shown = std::min<int>(findings.size(), 100);
            for (int i = 0; i < shown; ++i)
                print(context, "\n" + findings[i]);
            if (findings.size() > shown)
                print(context, QString("\n... %1 more").arg(findings.size() - shown));
            if (!findings.isEmpty())
                print(context, QString("\nProject check: %1 finding(s)\n").arg(findings.size()));
            return in.boolean(findings.isEmpty());
        },
        0, 0);
    lisp.define(
        "BuscarCoordenadas",
        [context,
         grids = context.sheetGrids ? context.sheetGrids : std::make_shared<SheetGridIndex>()](
            Interpreter& in, Args a) { return gridPosition(in, context, *grids, a); },
        5, 5);
    lisp.define(
        "zvGetCircuitoLocalInfo",
        [context, panels = std::make_shared<PanelCache>()](Interpreter& in, Args a) {
            zvdb::Database* database = context.database ? context.database() : nullptr;
            return localCircuit(in, firstPanel(database, *panels), in.toInt(a[0]));
        },
        1, 1);
    lisp.define(
        "zvsolution_load",
        [context](Interpreter& in, Args a) { return loadSolution(in, context, in.toStr(a[0])); }, 1,
        1);
    lisp.define(
        "zvsolution_isloaded",
        [](Interpreter& in, Args) { return in.boolean(!solutionFiles(in).isEmpty()); }, 0, 0);
    lisp.define(
        "zvsolution_getProjFile",
        [](Interpreter& in, Args a) { return projectFile(in, in.toStr(a[0])); }, 1, 1);
    lisp.define(
        "zv_interno_get_idioma_corrente",
        [](Interpreter& in, Args) {
            const Value language = Value::string(currentLanguage(in));
            in.setGlobal("*_ZV_IDIOMA_ATUAL_*", language);
            return language;
        },
        0, 0);
    // Nothing of this edition's drawing depends on the material list or the topographic
    // diagram, so the two hooks have nothing to refresh; they exist for the module's calls.
    lisp.define(
        "atualizarMacros", [](Interpreter&, Args) { return Value(); }, 0, 0);
    lisp.define(
        "atualizaTopografico", [](Interpreter&, Args) { return Value(); }, 0, 0);
    lisp.define(
        "zvAlternaStatusBloqueioPalette",
        [](Interpreter& in, Args) {
            const bool locked = in.global("*ZV_PALETTE_BLOQUEADA*").isNil();
            in.setGlobal("*ZV_PALETTE_BLOQUEADA*", in.boolean(locked));
            return in.boolean(locked);
        },
        0, 0);
    lisp.define(
        "zvExportaLayerDxf",
        [context](Interpreter& in, Args a) {
            zvdb::Database* database = context.database ? context.database() : nullptr;
            QString error = "no drawing";
            // (zvExportaLayerDxf FILE PAGE), as the page export calls it; the file name comes
            // with its backslashes doubled.
            QString file = in.toStr(a[0]);
            file.replace(QLatin1String("\\\\"), QLatin1String("/")).replace('\\', '/');
            if (database && exportPageDxf(*database, stdText(in, a[1]), file, &error))
                return in.t();
            print(context, "\nzvExportaLayerDxf: " + error + "\n");
            return Value();
        },
        2, 2);
    lisp.define("zvExportaLayer", [context](Interpreter&, Args) {
        print(context,
              "\nzvExportaLayer: DWG export is not available in this edition; "
              "use zvExportaLayerDxf\n");
        return Value();
    });
}

}  // namespace zvproduct
