#include "LispInterface.h"

#include <string>
#include <vector>

namespace zvsdk {

// Written straight into its QString, the handle's digits from its last, while the names are
// ASCII, as they nearly always are; made again through the UTF-8 decoder otherwise.
QString symbolEntryText(std::uint64_t handle, bool details, std::string_view connection,
                        std::string_view block) {
    int digits = 1;
    for (std::uint64_t rest = handle >> 4; rest != 0; rest >>= 4)
        ++digits;
    const std::size_t size =
        std::size_t(digits) + (details ? 2 + connection.size() + block.size() : 0);
    QString text(static_cast<int>(size), Qt::Uninitialized);
    QChar* const first = text.data();
    for (int i = digits - 1; i >= 0; --i, handle >>= 4)
        first[i] = QLatin1Char("0123456789ABCDEF"[handle & 0xF]);
    if (!details) return text;
    QChar* out = first + digits;
    unsigned char high = 0;  // any byte of 0x80 and above
    auto put = [&out, &high](std::string_view name) {
        *out++ = QLatin1Char('#');
        for (const char c : name) {
            high |= static_cast<unsigned char>(c);
            *out++ = QLatin1Char(c);
        }
    };
    put(connection);
    put(block);
    if (high < 0x80) return text;
    std::string bytes = text.left(digits).toStdString();
    bytes.append(1, '#').append(connection).append(1, '#').append(block);
    return QString::fromUtf8(bytes.data(), static_cast<int>(bytes.size()));
}

void ConnectionReceiver::wireNumber(std::string_view number) {
    wire(QString::fromUtf8(number.data(), static_cast<int>(number.size())));
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

bool LispInterface::lispPrepareConnections(const QString&) {
    return false;
}

int LispInterface::lispInvokePolylines(const QString&, const QString&, PolylineReceiver&) {
    return RTNONE;
}

}  // namespace zvsdk
