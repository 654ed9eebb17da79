#include "PositionChains.h"

#include "DocumentLisp.h"

#include "product/ProductContext.h"
#include "product/SheetGridIndex.h"

namespace zvhost {

using zvsdk::ResultBuffer;

namespace {

bool isNumber(const ResultBuffer& node) {
    return node.restype == zvsdk::RTREAL || node.restype == zvsdk::RTSHORT ||
           node.restype == zvsdk::RTLONG;
}

double number(const ResultBuffer& node) {
    if (node.restype == zvsdk::RTREAL) return node.rreal;
    return node.restype == zvsdk::RTSHORT ? node.rint : node.rlong;
}

// A node that makes one LISP value of its own (no list, no point).
bool isAtom(const ResultBuffer& node) {
    switch (node.restype) {
        case zvsdk::RTLB:
        case zvsdk::RTLE:
        case zvsdk::RTDOTE:
        case zvsdk::RTPOINT:
        case zvsdk::RT3DPOINT:
            return false;
        default:
            return true;
    }
}

}  // namespace

void PositionChains::install(DocumentLisp& lisp, const zvproduct::ProductContext& context) {
    const std::shared_ptr<zvproduct::SheetGridIndex> grids = context.sheetGrids;
    if (!grids) return;
    lisp.addChainCall("BuscarCoordenadas", [context, grids](zvlisp::Interpreter&,
                                                            const ResultBuffer* args,
                                                            ResultBuffer** chain) {
        // (BuscarCoordenadas ENAME GROUP PAGE X Y); any other shape takes the usual road,
        // with its errors
        const ResultBuffer* node[5];
        int count = 0;
        for (const ResultBuffer* n = args; n; n = n->rbnext) {
            if (count == 5 || !isAtom(*n)) return false;
            node[count++] = n;
        }
        if (count != 5) return false;
        if (!isNumber(*node[3]) || !isNumber(*node[4])) {
            *chain = zvsdk::newString(QStringLiteral("??"));
            return true;
        }
        zvdb::Database* database = context.database ? context.database() : nullptr;
        const QString group = node[1]->restype == zvsdk::RTSTR ? node[1]->rstring : QString();
        *chain =
            zvsdk::newString(grids->position(database, group, number(*node[3]), number(*node[4])));
        return true;
    });
}

}  // namespace zvhost
