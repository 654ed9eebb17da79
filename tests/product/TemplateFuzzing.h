#pragma once
// Shared by the template fuzzer and the template robustness test: any bytes as a list
// template, loaded by ZVCarregaTemplate into a document's LISP that has the product functions
// and a small generated project, with bounded work, no file written and a user who cancels
// every question.
#include "product/ProductLisp.h"

#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "lisp/Function.h"
#include "lisp/Interpreter.h"
#include "sample/ProjectGenerator.h"
#include "sdk/UserInterface.h"

#include <QByteArray>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QString>
#include <QTemporaryDir>

#include <memory>
#include <string>

class TemplateFuzzing {
public:
    struct Result {
        bool loaded = false;      // ZVCarregaTemplate answered T
        bool stillWorks = false;  // the document's LISP evaluates afterwards
        QString printed;          // the command line
    };

    // Evaluation stops with "Function cancelled" after about this many loop steps and calls.
    static constexpr int kStepBudget = 100000;

    Result run(const QByteArray& bytes) {
        Result result;
        QFile file(templatePath_);
        if (!file.open(QIODevice::WriteOnly | QIODevice::Truncate) ||
            file.write(bytes) != bytes.size())
            return result;
        file.close();

        // No settings file or catalogue of the machine is read.
        struct Restore {
            bool set = qEnvironmentVariableIsSet("ZV_DATA_DIR");
            QByteArray value = qgetenv("ZV_DATA_DIR");
            ~Restore() {
                if (set)
                    qputenv("ZV_DATA_DIR", value);
                else
                    qunsetenv("ZV_DATA_DIR");
            }
        } restore;
        qputenv("ZV_DATA_DIR", folder_.path().toUtf8());

        // The project is read when a function first asks for it: most inputs never do.
        std::unique_ptr<zvdb::Database> database;
        CancellingUser user;
        zvproduct::ProductContext context;
        context.database = [&database] {
            if (!database) database = zvdb::DxfLoader::load(project());
            return database.get();
        };
        context.userInterface = [&user] { return &user; };
        context.print = [&result](const QString& text) { result.printed += text; };
        context.fileName = [this] { return folder_.filePath("project.dxf"); };

        zvlisp::Interpreter lisp;
        lisp.setOutput([&result](const QString& text) { result.printed += text; });
        zvproduct::installProductFunctions(lisp, context);
        // Nothing outside the scratch folder is opened, loaded or written; a template loads
        // the product's templates by name, as the sequential terminal list loads bornes.grt.
        for (const char* name :
             {"open", "findfile", "close", "zvExportaLayerDxf", "zvExportaLayer"})
            lisp.setGlobal(name, {});
        lisp.define(
            "load",
            [this](zvlisp::Interpreter& in, zvlisp::Args a) {
                const QString name = QFileInfo(in.toStr(a[0])).fileName();
                if (!QFileInfo(folder_.filePath(name)).isFile()) in.fail("load: no file " + name);
                return in.load(folder_.filePath(name));
            },
            1, 2);
        lisp.setGlobal("*DIR_ZVCFG_TEMPL*", zvlisp::Value::string(folder_.path() + "/"));
        lisp.maxStringLength = 1 << 16;
        int polls = 0;
        // The interpreter polls every 4096 steps.
        lisp.setCancelCheck([&polls] { return ++polls > kStepBudget / 4096; });
        const zvlisp::Value plus = lisp.global("+");
        zvlisp::Value answer;
        lisp.evaluate("(ZVCarregaTemplate \"" + templatePath_ + "\")", &answer);
        result.loaded = !answer.isNil();
        lisp.setCancelCheck(nullptr);
        // A template may set any symbol, + too (what it set before an error stays): the
        // function taken before is what shows the interpreter still works.
        zvlisp::Value three;
        const zvlisp::Value args[] = {zvlisp::Value::integer(1), zvlisp::Value::integer(2)};
        result.stillWorks = lisp.applyTopLevel(plus, zvlisp::Args(args, 2), &three) &&
                            three.isInt() && three.asInt() == 3;
        return result;
    }

    // The product's templates beside the input, for the templates that load others.
    explicit TemplateFuzzing(const QString& templates) {
        for (const QFileInfo& file : QDir(templates).entryInfoList(QDir::Files))
            QFile::copy(file.filePath(), folder_.filePath(file.fileName()));
    }

    bool ready() const { return folder_.isValid(); }

private:
    class CancellingUser : public zvsdk::UserInterface {
    public:
        void messageBox(const QString&, const QString&) override {}
        bool askYesNo(const QString&, const QString&, bool cancel) override { return cancel; }
        QString fileDialog(const QString&, bool, const QString&, const QString&,
                           const QString&) override {
            return {};
        }
        std::optional<QString> answer(const QString&, const QString&) override {
            return std::nullopt;
        }
        void showProgress(const QString&) override {}
        void setProgress(int, const QString&) override {}
        void closeProgress() override {}
        void processEvents(int) override {}
        void enableMainWindow(bool) override {}
    };

    // A project of a page and a few terminals, wires and cables, made once.
    static const std::string& project() {
        static const std::string text = [] {
            zvsample::GeneratorOptions options;
            options.terminals = 8;
            options.pages = 1;
            return zvdb::DxfWriter::toText(*zvsample::ProjectGenerator(options).generate());
        }();
        return text;
    }

    QTemporaryDir folder_;
    QString templatePath_ = folder_.filePath("input.grt");
};
