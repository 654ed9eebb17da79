#pragma once
// A small project drawing built with the drawing API, a LISP environment with the product's
// functions on it, and a scripted user interface.
#include "product/ProductLisp.h"
#include "sample/XDataItems.h"

#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/Polyline.h"
#include "drawing/XRecord.h"
#include "lisp/Interpreter.h"
#include "lisp/Printer.h"
#include "sdk/UserInterface.h"

#include <QHash>

#include <gtest/gtest.h>

#include <memory>
#include <optional>

namespace zvproduct::testing {

// Answers by name from a table; a missing name is a cancel.
class ScriptedUserInterface : public zvsdk::UserInterface {
public:
    QHash<QString, QString> answers;
    QStringList asked;
    void messageBox(const QString&, const QString&) override {}
    bool askYesNo(const QString& name, const QString&, bool cancel) override {
        asked << name;
        return answers.contains(name) ? answers.value(name) == "yes" : cancel;
    }
    QString fileDialog(const QString& name, bool, const QString&, const QString&,
                       const QString&) override {
        asked << name;
        return answers.value(name);
    }
    std::optional<QString> answer(const QString& name, const QString&) override {
        asked << name;
        if (!answers.contains(name)) return std::nullopt;
        return answers.value(name);
    }
    void showProgress(const QString&) override {}
    void setProgress(int, const QString&) override {}
    void closeProgress() override {}
    void processEvents(int) override {}
    void enableMainWindow(bool) override {}
};

class ProductFixture : public ::testing::Test {
protected:
    ProductFixture() : database(std::make_unique<zvdb::Database>()) {
        ProductContext context;
        context.database = [this] { return database.get(); };
        context.userInterface = [this] { return &ui; };
        context.print = [this](const QString& text) { printed += text; };
        context.fileName = [] { return QString("/tmp/proj.dxf"); };
        lisp.setOutput([this](const QString& text) { printed += text; });
        installProductFunctions(lisp, context);
    }

    // Registry entry of a group with its pages; the page layers are made.
    void addGroup(const std::string& name, int key, const std::vector<std::string>& pages) {
        zvsample::XDataItems data;
        data.add(70, std::to_string(key)).add(1, name);
        for (const std::string& page : pages) {
            data.add(8, page);
            if (!database->layer(page)) database->createLayer(page);
        }
        const std::string path[] = {"ZV_PAGINAS"};
        database->dictionaryAt(path, true)->getOrCreateXRecord(name)->setData(data.tags());
    }

    zvdb::BlockRecord& block(const std::string& name) {
        if (zvdb::BlockRecord* found = database->block(name)) return *found;
        zvdb::BlockRecord* made = database->createBlock(name);
        made->addLine({0, 0, 0}, {0, -10, 0});
        return *made;
    }

    // A two-point symbol (terminal, contact) at `at`, its cut point 10 below.
    zvdb::BlockReference* twoPoint(const std::string& blockName, const std::string& layer,
                                   zvdb::Point3 at) {
        auto* reference =
            database->modelSpace()->addBlockReference(block(blockName), at, {1, 1, 1}, 0, layer);
        reference->setXData("KVR_ZV", zvsample::XDataItems().text("1001\f1").tags());
        reference->setXData("KVR_ZV_PTS_CORTE",
                            zvsample::XDataItems().point(at).point({at.x, at.y - 10, at.z}).tags());
        return reference;
    }

    zvdb::BlockReference* terminal(const std::string& layer, zvdb::Point3 at,
                                   const std::string& strip, const std::string& number) {
        auto* reference = twoPoint("BORNE_1", layer, at);
        reference->addAttribute("REGUA", strip, at, 2.5);
        reference->addAttribute("NUMERO", number, at, 2.5);
        return reference;
    }

    zvdb::Polyline* wire(const std::string& layer, const std::vector<zvdb::Point3>& points,
                         const std::string& number) {
        auto* line = database->modelSpace()->addLwPolyline(points, false, layer);
        line->setXData(
            "KVR_ZV_WIRE",
            zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f" + number).tags());
        return line;
    }

    zvlisp::Value run(const QString& text) { return lisp.evalText(text); }
    std::string show(const QString& text) {
        return zvlisp::Printer::prin1(run(text)).toStdString();
    }

    std::unique_ptr<zvdb::Database> database;
    ScriptedUserInterface ui;
    zvlisp::Interpreter lisp;
    QString printed;
};

}  // namespace zvproduct::testing
