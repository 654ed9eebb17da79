#pragma once
// LISP values as result-buffer chains and back, for the document's LISP interface:
//   string 5005; integer 5003 when it fits 16 bits, else 5010; real 5001; nil 5019; T 5021;
//   entity name 5006; a list 5016 ... 5017 with 5018 before the tail of a dotted pair.
//   A list of exactly three numbers of which one at least is a real is a point: 5009.
//   Any other symbol goes out as its name (5005); functions and files as their printed form.
// Coming in, 5002 and 5009 become lists of two or three reals and 5010 an integer.
#include "lisp/Interpreter.h"
#include "sdk/ResultBuffer.h"

#include <vector>

namespace zvhost {

class LispChains {
public:
    // Never null: nil is one 5019 node. A structure nested too deep throws a LispError.
    static zvsdk::ResultBuffer* toChain(const zvlisp::Value& value);
    // Each value at the top level of the chain, in order (a call's arguments).
    static std::vector<zvlisp::Value> values(zvlisp::Interpreter& lisp,
                                             const zvsdk::ResultBuffer* chain);
    // The value of a chain: nil for none, the value for one, a list for several.
    static zvlisp::Value value(zvlisp::Interpreter& lisp, const zvsdk::ResultBuffer* chain);

private:
    // Calls `emit` with each top-level value of the chain.
    template <typename Emit>
    static void read(zvlisp::Interpreter& lisp, const zvsdk::ResultBuffer* chain, Emit emit);
    static void append(const zvlisp::Value& value, zvsdk::ResultBuffer**& tail, int depth);
    static zvlisp::Value atom(zvlisp::Interpreter& lisp, const zvsdk::ResultBuffer& node);
};

}  // namespace zvhost
