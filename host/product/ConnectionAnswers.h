#pragma once
// The answers of getConexoesTodosFios and getConexoesTodosCabos for one document. Both come
// from one index of the drawing (ConnectionFinder), and a reader of the module asks for the
// two in a row: so its call works out both kinds and keeps the one not asked for the next
// call. The kept answer serves only while the drawing and the tolerance are the same, and
// the next call drops it in any case: nothing big stays behind between commands.
#include "ConnectionFinder.h"
#include "DrawingStamp.h"

#include <optional>
#include <string>
#include <vector>

namespace zvlisp {
class Interpreter;
}

namespace zvproduct {

struct ProductContext;

class ConnectionAnswers {
public:
    enum class Kind { Wires, Cables };

    // `keepOther` works out the other kind too and keeps it for the next call.
    std::vector<WireConnections> answer(zvdb::Database& database, double tolerance, Kind kind,
                                        bool keepOther = true);
    // The same for a call on the context's drawing, at the tolerance that
    // *ESPESSURA_BARRAMENTO* sets (0.1 unless a positive number); fails the LISP way when
    // there is no drawing.
    std::vector<WireConnections> answer(zvlisp::Interpreter& lisp, const ProductContext& context,
                                        Kind kind, bool keepOther);

    // The text of an entry: the symbol's handle in upper-case hexadecimal, with
    // "#CONNECTION#BLOCK" behind it for `details`; appended to `out`.
    static void appendEntryText(const Touch& touch, bool details, std::string& out);
    // What the tolerance of a LISP call is.
    static double tolerance(zvlisp::Interpreter& lisp);

private:
    DrawingStamp stamp_;
    double tolerance_ = 0;
    Kind keptKind_ = Kind::Wires;
    std::optional<std::vector<WireConnections>> kept_;
};

}  // namespace zvproduct
