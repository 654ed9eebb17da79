#pragma once
// An interpreter with its command line captured, and a shorthand that evaluates text and
// gives the result as prin1 shows it, or "ERROR: message".
#include "lisp/Interpreter.h"
#include "lisp/Printer.h"

#include <gtest/gtest.h>

#include <ostream>

inline void PrintTo(const QString& text, std::ostream* out) {
    *out << text.toStdString();
}

class LispFixture : public ::testing::Test {
protected:
    LispFixture() {
        lisp.setOutput([this](const QString& text) { output += text; });
    }

    std::string ev(const QString& text) {
        zvlisp::Value result;
        try {
            result = lisp.evalText(text);
        } catch (zvlisp::LispError& error) {
            return "ERROR: " + error.message().toStdString();
        }
        return zvlisp::Printer::prin1(result).toStdString();
    }

    zvlisp::Interpreter lisp;
    QString output;
};
