#pragma once
// Shared by the robustness test and the libFuzzer target: a sandboxed run of any text
// (no files, bounded work) and generators of random and mutated programs.
#include "lisp/Interpreter.h"

#include <QByteArray>
#include <QString>

#include <random>

class LispFuzzing {
public:
    struct Result {
        bool ok = false;          // evaluated without error
        bool stillWorks = false;  // + (as it was before) still gives 3 afterwards
    };

    static Result run(const QByteArray& bytes) {
        zvlisp::Interpreter lisp;
        lisp.setOutput([](const QString&) {});
        for (const char* name :
             {"open", "load", "findfile", "close", "vl-file-copy", "vl-file-delete",
              "vl-file-rename", "vl-file-size", "vl-file-systime", "vl-file-directory-p",
              "vl-directory-files", "vl-filename-mktemp"})
            lisp.setGlobal(name, {});
        lisp.maxStringLength = 1 << 16;
        int polls = 0;
        lisp.setCancelCheck([&polls] { return ++polls > 25; });  // about 100,000 steps
        const zvlisp::Value plus = lisp.global("+");
        Result result;
        result.ok = lisp.evaluate(QString::fromUtf8(bytes));
        lisp.setCancelCheck(nullptr);
        // The program may have set + itself: the function taken before shows that the
        // interpreter still works.
        zvlisp::Value three;
        const zvlisp::Value args[] = {zvlisp::Value::integer(1), zvlisp::Value::integer(2)};
        result.stillWorks = lisp.applyTopLevel(plus, zvlisp::Args(args, 2), &three) &&
                            three.isInt() && three.asInt() == 3;
        return result;
    }

    static QString randomProgram(std::mt19937& random) {
        QString text;
        for (int i = 0; i < 4; ++i)
            text += form(random, 0) + "\n";
        return text;
    }

    // Deletes, duplicates or swaps a few slices of the text.
    static QString mutate(QString text, std::mt19937& random) {
        for (int edits = pick(random, 1, 6); edits > 0 && !text.isEmpty(); --edits) {
            const int at = pick(random, 0, int(text.size()) - 1);
            const int length = pick(random, 1, 40);
            switch (pick(random, 0, 3)) {
                case 0:
                    text.remove(at, length);
                    break;
                case 1:
                    text.insert(at, text.mid(pick(random, 0, int(text.size()) - 1), length));
                    break;
                case 2:
                    text.insert(at, QChar(pick(random, 1, 127)));
                    break;
                default:
                    text.insert(at, form(random, 2));
            }
        }
        return text +
               "\n(str-split \"a,b\" \",\") (csv-parse-line \"1,\\\"2\\\"\") (flatten '(1 (2)))";
    }

private:
    static int pick(std::mt19937& random, int lo, int hi) {
        return std::uniform_int_distribution<int>(lo, std::max(lo, hi))(random);
    }

    static QString atom(std::mt19937& random) {
        static const char* const atoms[] = {
            "0",     "1",    "-7",          "2147483647", "3.5",      "-0.0",
            "1e300", "\"\"", "\"abc\"",     "\"X1\"",     "\"#*\"",   "nil",
            "t",     "x",    "y",           "lst",        "'(1 2 3)", "'((\"A\" . \"B\"))",
            "'a",    "pi",   "\"\\\\\\n\"", "'(1 . 2)",   "'(nil)",   "\"ç€\"",
            "reg"};
        return atoms[pick(random, 0, int(std::size(atoms)) - 1)];
    }

    static QString form(std::mt19937& random, int depth) {
        static const char* const heads[] = {"+",
                                            "-",
                                            "*",
                                            "/",
                                            "rem",
                                            "=",
                                            "<",
                                            "and",
                                            "or",
                                            "if",
                                            "cond",
                                            "setq x",
                                            "setq lst",
                                            "list",
                                            "cons",
                                            "car",
                                            "cdr",
                                            "cadr",
                                            "append",
                                            "assoc",
                                            "member",
                                            "nth",
                                            "reverse",
                                            "length",
                                            "strcat",
                                            "substr",
                                            "strlen",
                                            "wcmatch",
                                            "rtos",
                                            "distof",
                                            "angtos",
                                            "itoa",
                                            "atoi",
                                            "atof",
                                            "read",
                                            "vl-sort",
                                            "vl-sort-i",
                                            "mapcar 'abs",
                                            "apply '+",
                                            "foreach y lst",
                                            "while nil",
                                            "repeat 3",
                                            "progn",
                                            "vl-catch-all-apply 'car",
                                            "vl-string-search",
                                            "vl-string-subst",
                                            "eval",
                                            "equal",
                                            "vl-position",
                                            "princ",
                                            "vl-prin1-to-string",
                                            "fix",
                                            "expt",
                                            "sqrt",
                                            "lsh",
                                            "boole 7",
                                            "inters",
                                            "polar",
                                            "distance",
                                            "defun f (a / b)",
                                            "lambda (a)",
                                            "f",
                                            "exit",
                                            "*error*",
                                            "vl-remove-if 'numberp",
                                            "acad_strlsort",
                                            "snvalid"};
        if (depth > 3 || pick(random, 0, 3) == 0) return atom(random);
        QString text = QString("(") + heads[pick(random, 0, int(std::size(heads)) - 1)];
        for (int i = pick(random, 0, 3); i > 0; --i)
            text += " " + form(random, depth + 1);
        return text + ")";
    }
};
