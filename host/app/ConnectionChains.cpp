#include "ConnectionChains.h"

#include "DocumentLisp.h"

#include "product/ConnectionAnswers.h"
#include "product/ProductContext.h"

#include <charconv>
#include <string>
#include <string_view>

namespace zvhost {

using zvproduct::ConnectionAnswers;
using zvsdk::ResultBuffer;

namespace {

bool isAscii(std::string_view text) {
    for (char c : text)
        if (static_cast<unsigned char>(c) >= 0x80) return false;
    return true;
}

// Handles and most names are ASCII, which Latin-1 reads alike without the UTF-8 decoder.
QString qText(std::string_view text) {
    const auto size = static_cast<int>(text.size());
    if (!isAscii(text)) return QString::fromUtf8(text.data(), size);
    return QString::fromLatin1(text.data(), size);
}

// An entry's text written straight into its QString when it is all ASCII, as it nearly
// always is; `scratch` holds it on the way through the UTF-8 decoder otherwise.
QString entryText(const zvproduct::Touch& touch, bool details, std::string& scratch) {
    if (details && !(isAscii(touch.connection) && isAscii(touch.block))) {
        scratch.clear();
        ConnectionAnswers::appendEntryText(touch, details, scratch);
        return QString::fromUtf8(scratch.data(), static_cast<int>(scratch.size()));
    }
    char digits[24];
    const auto end = std::to_chars(digits, digits + sizeof digits, touch.symbol, 16).ptr;
    const auto count = static_cast<std::size_t>(end - digits);
    const std::size_t size =
        count + (details ? 2 + touch.connection.size() + touch.block.size() : 0);
    QString text(static_cast<int>(size), Qt::Uninitialized);
    QChar* out = text.data();
    for (std::size_t i = 0; i < count; ++i)
        *out++ =
            QLatin1Char(digits[i] >= 'a' ? static_cast<char>(digits[i] - 'a' + 'A') : digits[i]);
    if (!details) return text;
    *out++ = QLatin1Char('#');
    for (char c : touch.connection)
        *out++ = QLatin1Char(c);
    *out++ = QLatin1Char('#');
    for (char c : touch.block)
        *out++ = QLatin1Char(c);
    return text;
}

// A chain under construction; what is built so far goes if the building stops half-way.
class ChainBuilder {
public:
    ~ChainBuilder() { zvsdk::releaseChain(head_); }
    void push(ResultBuffer* node) {
        *tail_ = node;
        tail_ = &node->rbnext;
    }
    ResultBuffer* take() {
        ResultBuffer* head = head_;
        head_ = nullptr;
        tail_ = &head_;
        return head;
    }

private:
    ResultBuffer* head_ = nullptr;
    ResultBuffer** tail_ = &head_;
};

}  // namespace

ResultBuffer* ConnectionChains::toChain(const std::vector<zvproduct::WireConnections>& wires,
                                        bool details) {
    if (wires.empty()) return zvsdk::newNode(zvsdk::RTNIL);
    ChainBuilder chain;
    std::string text;
    chain.push(zvsdk::newNode(zvsdk::RTLB));
    for (const zvproduct::WireConnections& wire : wires) {
        chain.push(zvsdk::newNode(zvsdk::RTLB));
        chain.push(zvsdk::newString(qText(wire.number)));
        for (const zvproduct::Touch& touch : wire.touches) {
            chain.push(zvsdk::newNode(zvsdk::RTLB));
            chain.push(zvsdk::newString(entryText(touch, details, text)));
            chain.push(zvsdk::newReal(touch.point.x));
            chain.push(zvsdk::newReal(touch.point.y));
            chain.push(zvsdk::newReal(touch.point.z));
            chain.push(zvsdk::newNode(zvsdk::RTLE));
        }
        chain.push(zvsdk::newNode(zvsdk::RTLE));
    }
    chain.push(zvsdk::newNode(zvsdk::RTLE));
    return chain.take();
}

void ConnectionChains::install(DocumentLisp& lisp, const zvproduct::ProductContext& context) {
    const std::shared_ptr<ConnectionAnswers> answers = context.connections;
    if (!answers) return;
    auto add = [&](const char* function, ConnectionAnswers::Kind kind, bool details) {
        lisp.addChainAnswer(function, [context, answers, kind, details](zvlisp::Interpreter& in,
                                                                        ResultBuffer** chain) {
            // without a drawing the usual road fails as the LISP function does
            if (!context.database || !context.database()) return false;
            *chain = toChain(answers->answer(in, context, kind, true), details);
            return true;
        });
    };
    add("getConexoesTodosFios", ConnectionAnswers::Kind::Wires, true);
    add("getConexoesTodosCabos", ConnectionAnswers::Kind::Cables, false);
    // A reader asks for the cables right after the wires or not at all: a call of anything
    // else lets the kept index go, so that it does not weigh on the rest of the run.
    lisp.addInvokeListener([answers](const QString& function) {
        if (answers->keepsIndex() && function != QLatin1String("getConexoesTodosFios") &&
            function != QLatin1String("getConexoesTodosCabos"))
            answers->release();
    });
}

}  // namespace zvhost
