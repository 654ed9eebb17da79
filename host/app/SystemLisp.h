#pragma once
// The host's LISP functions that reach the user and the system: alert, getcfg and setcfg
// (kept in the product settings file), startapp and help.
namespace zvlisp {
class Interpreter;
}

namespace zvhost {

void installSystemFunctions(zvlisp::Interpreter& lisp);

}  // namespace zvhost
