#pragma once
// The product's BuscarCoordenadas answered to a module straight from the call's chain: a
// list asks it for every symbol and wire, and the answer is one short text. What the module
// gets is what the LISP function gives for the same arguments.
namespace zvproduct {
struct ProductContext;
}

namespace zvhost {

class DocumentLisp;

class PositionChains {
public:
    // The context's sheet grids must be set (the LISP function's own).
    static void install(DocumentLisp& lisp, const zvproduct::ProductContext& context);
};

}  // namespace zvhost
