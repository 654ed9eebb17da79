#include "ProductLisp.h"

namespace zvproduct {

void installProductFunctions(zvlisp::Interpreter& lisp, const ProductContext& context) {
    installPageFunctions(lisp, context);
    installConnectionFunctions(lisp, context);
    installPickerFunctions(lisp, context);
    installServiceFunctions(lisp, context);
}

}  // namespace zvproduct
