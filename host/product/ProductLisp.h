#pragma once
// The product's LISP side: native functions of the host LISP for pages and groups,
// connections, pickers, templates and the services the module calls. They are plain global
// functions, so a user's defun of the same name replaces them. See docs/product-lisp.md.
#include "ProductContext.h"

namespace zvlisp {
class Interpreter;
}

namespace zvproduct {

// All families below.
void installProductFunctions(zvlisp::Interpreter& lisp, const ProductContext& context);

void installPageFunctions(zvlisp::Interpreter& lisp, const ProductContext& context);
void installConnectionFunctions(zvlisp::Interpreter& lisp, const ProductContext& context);
void installPickerFunctions(zvlisp::Interpreter& lisp, const ProductContext& context);
void installServiceFunctions(zvlisp::Interpreter& lisp, const ProductContext& context);

}  // namespace zvproduct
