#pragma once
// The CAD functions of the host LISP, on the document's drawing, with the argument and
// result shapes CAD users know: entget, entmod, entnext, tblsearch, getvar, ssget...
namespace zvlisp {
class Interpreter;
}

namespace zvhost {

class HostDocument;

void installCadFunctions(zvlisp::Interpreter& lisp, HostDocument& document);

}  // namespace zvhost
