#pragma once
// A document of the command-line host with its LISP environment: scripted answers, the
// command line and the user-interface messages captured, and a shorthand that evaluates
// text and gives the result as prin1 shows it, or "ERROR: message".
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/DocumentLisp.h"
#include "app/HostDocument.h"
#include "lisp/Printer.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>

class LispHostFixture : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(folder.isValid());
        auto console = std::make_unique<zvhost::ConsoleUserInterface>(out, err, false);
        ui = console.get();
        app = std::make_unique<zvhost::Application>(std::move(console), out);
        document = app->openDocument(folder.filePath("projeto.dxf"));
    }
    zvlisp::Interpreter& interpreter() {
        return static_cast<zvhost::DocumentLisp*>(document->lisp())->interpreter();
    }
    std::string ev(const QString& text) {
        zvlisp::Value result;
        try {
            result = interpreter().evalText(text);
        } catch (zvlisp::LispError& error) {
            return "ERROR: " + error.message().toStdString();
        }
        return zvlisp::Printer::prin1(result).toStdString();
    }

    QTemporaryDir folder;
    QString commandLine;
    QString messages;
    QTextStream out{&commandLine};
    QTextStream err{&messages};
    zvhost::ConsoleUserInterface* ui = nullptr;
    std::unique_ptr<zvhost::Application> app;
    zvhost::HostDocument* document = nullptr;
};
