#pragma once
// The product's connection answers (getConexoesTodosFios, getConexoesTodosCabos) handed to a
// module as chains built straight from the product's data: the very nodes that
// LispChains::toChain makes of the functions' LISP lists, without making the lists; or, to
// a module that asks so, as those nodes' values without the chain.
#include "product/ConnectionFinder.h"
#include "sdk/LispInterface.h"
#include "sdk/ResultBuffer.h"

#include <cstdint>
#include <vector>

namespace zvproduct {
struct ProductContext;
}

namespace zvhost {

class DocumentLisp;

class ConnectionChains {
public:
    // ((NUMBER (TEXT x y z) ...) ...); one nil node (5019) when there is nothing. The text
    // of an entry is the symbol's handle, with "#CONNECTION#BLOCK" for `details`.
    static zvsdk::ResultBuffer* toChain(const std::vector<zvproduct::WireConnections>& wires,
                                        bool details);
    // (HANDLE ...) of the handles' texts, as getFiosPorLayer answers; nil without any.
    static zvsdk::ResultBuffer* handleChain(const std::vector<std::uint64_t>& handles);
    // The values that toChain's chain of the same answer holds, one after the other, into
    // `receiver`.
    static void deliver(const zvproduct::ConnectionTable& table, bool details,
                        zvsdk::ConnectionReceiver& receiver);
    // Lets the document's two connection functions answer the module as chains, and
    // without chains (DocumentLisp::addConnectionAnswer), from the same answers as their
    // LISP side (the context's, which must be set); getFiosPorLayer with a layer's name too.
    static void install(DocumentLisp& lisp, const zvproduct::ProductContext& context);
};

}  // namespace zvhost
