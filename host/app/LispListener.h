#pragma once
// Typed LISP as a listener answers it (zvhost lisp, the desktop's console): each form of
// the text evaluated in turn and its value printed in prin1 form on a line of its own;
// (princ) prints nothing; errors are reported by the interpreter and the next form goes on.
#include <QString>

#include <functional>

namespace zvlisp {
class Interpreter;
}

namespace zvhost {

// False when the text needs more lines to be complete; with `last` set an incomplete text
// is reported as it is.
bool evaluateTyped(zvlisp::Interpreter& lisp, const QString& text,
                   const std::function<void(const QString&)>& print, bool last = false);

}  // namespace zvhost
