#include "LispInterface.h"

#include <vector>

namespace zvsdk {

int LispInterface::lispPutStringPairs(const QString& name, const StringPair* pairs, int count) {
    // ( ( key . value ) ... ): five nodes a pair, and the outer brackets.
    std::vector<ResultBuffer> nodes(size_t(count) * 5 + 2);
    size_t i = 0;
    auto add = [&nodes, &i](short type, const QString* text = nullptr) {
        ResultBuffer& node = nodes[i];
        node.restype = type;
        if (text) node.rstring = *text;
        if (i > 0) nodes[i - 1].rbnext = &node;
        ++i;
    };
    add(RTLB);
    for (int p = 0; p < count; ++p) {
        add(RTLB);
        add(RTSTR, pairs[p].key);
        add(RTDOTE);
        add(RTSTR, pairs[p].value);
        add(RTLE);
    }
    add(RTLE);
    return lispPutSymbol(name, nodes.data());
}

int LispInterface::lispGetSymbolFirst(const QString& name, ResultBuffer& first) {
    ResultBuffer* chain = nullptr;
    const int status = lispGetSymbol(name, &chain);
    if (status == RTNORM && chain) {
        first = *chain;
        first.rbnext = nullptr;
    }
    releaseResultBuffer(chain);
    return status == RTNORM && chain ? RTNORM : RTERROR;
}

int LispInterface::lispInvokeConnections(const QString&, ConnectionReceiver&) {
    return RTNONE;
}

}  // namespace zvsdk
