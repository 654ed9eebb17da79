#include "ConnectionChains.h"

#include "DocumentLisp.h"

#include "product/ConnectionAnswers.h"
#include "product/ProductContext.h"

#include <string>
#include <string_view>

namespace zvhost {

using zvproduct::ConnectionAnswers;
using zvsdk::ResultBuffer;

namespace {

// Handles and most names are ASCII, which Latin-1 reads alike without the UTF-8 decoder.
QString qText(std::string_view text) {
    const auto size = static_cast<int>(text.size());
    for (char c : text)
        if (static_cast<unsigned char>(c) >= 0x80) return QString::fromUtf8(text.data(), size);
    return QString::fromLatin1(text.data(), size);
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
            text.clear();
            ConnectionAnswers::appendEntryText(touch, details, text);
            chain.push(zvsdk::newNode(zvsdk::RTLB));
            chain.push(zvsdk::newString(qText(text)));
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
}

}  // namespace zvhost
