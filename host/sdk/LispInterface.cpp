#include "LispInterface.h"

#include <charconv>
#include <vector>

namespace zvsdk {

namespace {

bool isAscii(std::string_view text) {
    for (char c : text)
        if (static_cast<unsigned char>(c) >= 0x80) return false;
    return true;
}

}  // namespace

// Written straight into its QString when the names are ASCII, as they nearly always are.
QString symbolEntryText(std::uint64_t handle, bool details, std::string_view connection,
                        std::string_view block) {
    char digits[24];
    const auto end = std::to_chars(digits, digits + sizeof digits, handle, 16).ptr;
    for (char* c = digits; c != end; ++c)
        if (*c >= 'a') *c = static_cast<char>(*c - 'a' + 'A');
    const auto count = static_cast<std::size_t>(end - digits);
    if (details && !(isAscii(connection) && isAscii(block))) {
        std::string text(digits, count);
        text.append(1, '#').append(connection).append(1, '#').append(block);
        return QString::fromUtf8(text.data(), static_cast<int>(text.size()));
    }
    const std::size_t size = count + (details ? 2 + connection.size() + block.size() : 0);
    QString text(static_cast<int>(size), Qt::Uninitialized);
    QChar* out = text.data();
    for (std::size_t i = 0; i < count; ++i)
        *out++ = QLatin1Char(digits[i]);
    if (!details) return text;
    *out++ = QLatin1Char('#');
    for (char c : connection)
        *out++ = QLatin1Char(c);
    *out++ = QLatin1Char('#');
    for (char c : block)
        *out++ = QLatin1Char(c);
    return text;
}

void ConnectionReceiver::symbolEntry(std::uint64_t handle, bool details,
                                     std::string_view connection, std::string_view block, double x,
                                     double y, double z) {
    entry(symbolEntryText(handle, details, connection, block), x, y, z);
}

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
