#include "LispListener.h"

#include "lisp/Interpreter.h"
#include "lisp/LispError.h"
#include "lisp/Printer.h"

namespace zvhost {

bool evaluateTyped(zvlisp::Interpreter& lisp, const QString& text,
                   const std::function<void(const QString&)>& print, bool last) {
    zvlisp::Value forms;
    try {
        forms = lisp.readAll(text);
    } catch (zvlisp::LispError& error) {
        if (error.incompleteInput && !last) return false;
        lisp.report(error);
        return true;
    }
    for (const zvlisp::Value* cell = &forms; cell->isCons(); cell = &cell->asCons()->cdr) {
        zvlisp::Value result;
        if (!lisp.evaluateForms(zvlisp::Value::cons(cell->asCons()->car, zvlisp::Value()), &result))
            continue;
        if (result.isSymbol() && result.asSymbol()->name.isEmpty()) continue;  // (princ)
        try {
            print(zvlisp::Printer::prin1(result) + "\n");
        } catch (zvlisp::LispError& error) {  // nested too deep to print
            lisp.report(error);
        }
    }
    return true;
}

}  // namespace zvhost
