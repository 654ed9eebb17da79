#include "ConnectionChains.h"

#include "DocumentLisp.h"

#include "product/ConnectionAnswers.h"
#include "product/ProductContext.h"
#include "sdk/NodeChains.h"

#include <charconv>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

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

// Handles as the product's LISP functions give them: upper-case hexadecimal texts.
QString handleText(std::uint64_t handle) {
    char digits[24];
    const auto end = std::to_chars(digits, digits + sizeof digits, handle, 16).ptr;
    for (char* c = digits; c != end; ++c)
        if (*c >= 'a') *c = static_cast<char>(*c - 'a' + 'A');
    return QString::fromLatin1(digits, static_cast<int>(end - digits));
}

// Fills in the nodes of a chain made beforehand, one after the other.
class ChainFiller {
public:
    explicit ChainFiller(ResultBuffer* chain) : node_(chain) {}
    ResultBuffer& next(short type) {
        ResultBuffer& node = *node_;
        node_ = node_->rbnext;
        node.restype = type;
        return node;
    }
    void mark(short type) { next(type); }
    void real(double value) { next(zvsdk::RTREAL).rreal = value; }
    void text(QString&& value) { next(zvsdk::RTSTR).rstring = std::move(value); }

private:
    ResultBuffer* node_;
};

}  // namespace

ResultBuffer* ConnectionChains::toChain(const std::vector<zvproduct::WireConnections>& wires,
                                        bool details) {
    if (wires.empty()) return zvsdk::newNode(zvsdk::RTNIL);
    // All the nodes at once: the answer's two list marks, three nodes a wire, six an entry.
    std::size_t nodes = 2;
    for (const zvproduct::WireConnections& wire : wires)
        nodes += 3 + 6 * wire.touches.size();
    ResultBuffer* chain = zvsdk::newChain(nodes);
    ChainFiller fill(chain);
    // the nodes go if the filling stops half-way
    std::unique_ptr<ResultBuffer, void (*)(ResultBuffer*)> owner(chain, zvsdk::releaseChain);
    fill.mark(zvsdk::RTLB);
    for (const zvproduct::WireConnections& wire : wires) {
        fill.mark(zvsdk::RTLB);
        fill.text(qText(wire.number));
        for (const zvproduct::Touch& touch : wire.touches) {
            fill.mark(zvsdk::RTLB);
            fill.text(zvsdk::symbolEntryText(touch.symbol, details, touch.connection, touch.block));
            fill.real(touch.point.x);
            fill.real(touch.point.y);
            fill.real(touch.point.z);
            fill.mark(zvsdk::RTLE);
        }
        fill.mark(zvsdk::RTLE);
    }
    fill.mark(zvsdk::RTLE);
    return owner.release();
}

void ConnectionChains::deliver(const zvproduct::ConnectionTable& table, bool details,
                               zvsdk::ConnectionReceiver& receiver) {
    receiver.begin(table.numbers.size(), table.entries.size());
    std::size_t touch = 0;
    for (std::size_t w = 0; w < table.numbers.size(); ++w) {
        receiver.wireNumber(table.numbers[w]);
        for (; touch < table.ends[w]; ++touch) {
            const zvproduct::Touch entry = table.touch(touch);
            receiver.symbolEntry(entry.symbol, details, entry.connection, entry.block,
                                 entry.point.x, entry.point.y, entry.point.z);
        }
    }
}

ResultBuffer* ConnectionChains::handleChain(const std::vector<std::uint64_t>& handles) {
    if (handles.empty()) return zvsdk::newNode(zvsdk::RTNIL);
    ResultBuffer* chain = zvsdk::newChain(handles.size() + 2);
    ChainFiller fill(chain);
    fill.mark(zvsdk::RTLB);
    for (std::uint64_t handle : handles)
        fill.text(handleText(handle));
    fill.mark(zvsdk::RTLE);
    return chain;
}

void ConnectionChains::install(DocumentLisp& lisp, const zvproduct::ProductContext& context) {
    const std::shared_ptr<ConnectionAnswers> answers = context.connections;
    if (!answers) return;
    auto add = [&](const char* function, ConnectionAnswers::Kind kind, bool details) {
        // without a drawing the usual road fails as the LISP function does
        auto hasDrawing = [context] { return context.database && context.database(); };
        lisp.addChainAnswer(function, [context, answers, kind, details, hasDrawing](
                                          zvlisp::Interpreter& in, ResultBuffer** chain) {
            if (!hasDrawing()) return false;
            *chain = toChain(answers->answer(in, context, kind, true), details);
            return true;
        });
        lisp.addConnectionAnswer(
            function,
            [context, answers, kind, details, hasDrawing](zvlisp::Interpreter& in,
                                                          zvsdk::ConnectionReceiver& receiver) {
                if (!hasDrawing()) return false;
                answers->table(in, context, kind, true,
                               [&](const zvproduct::ConnectionTable& table) {
                                   deliver(table, details, receiver);
                               });
                return true;
            },
            [context, answers, kind](zvlisp::Interpreter& in) {
                return answers->prepare(in, context, kind);
            });
    };
    add("getConexoesTodosFios", ConnectionAnswers::Kind::Wires, true);
    add("getConexoesTodosCabos", ConnectionAnswers::Kind::Cables, false);
    // (getFiosPorLayer LAYER), asked page after page: the list of the handles' texts, or nil
    lisp.addChainCall(
        "getFiosPorLayer",
        [context, answers](zvlisp::Interpreter&, const ResultBuffer* args, ResultBuffer** chain) {
            // any other shape takes the usual road, with its errors
            if (!args || args->rbnext || args->restype != zvsdk::RTSTR) return false;
            zvdb::Database* database = context.database ? context.database() : nullptr;
            if (!database) return false;
            zvproduct::WireLayerIndex& byLayer = answers->wireLayersOf(*database);
            const std::vector<std::uint64_t>& handles =
                byLayer.polylinesOn(*database, args->rstring.toStdString());
            *chain = handleChain(handles);
            return true;
        });
    // The same with each polyline's vertices, which the reader reads next.
    lisp.addPolylineAnswer(
        "getFiosPorLayer", [context, answers](zvlisp::Interpreter&, const QString& layer,
                                              zvsdk::PolylineReceiver& receiver) {
            zvdb::Database* database = context.database ? context.database() : nullptr;
            if (!database) return false;
            std::vector<double> xyz;
            answers->wireLayersOf(*database).eachOn(
                *database, layer.toStdString(),
                [&](std::uint64_t handle, std::span<const zvdb::Point3> points) {
                    xyz.clear();
                    for (const zvdb::Point3& p : points)
                        xyz.insert(xyz.end(), {p.x, p.y, p.z});
                    receiver.polyline(handle, xyz.data(), points.size());
                });
            return true;
        });
    // A reader asks for the cables right after the wires or not at all: a call of anything
    // else lets the kept index go, so that it does not weigh on the rest of the run.
    // The wires' vertices serve the pages read after them while the drawing stays the same.
    lisp.addInvokeListener([answers, context](const QString& function) {
        if (answers->keepsIndex() && function != QLatin1String("getConexoesTodosFios") &&
            function != QLatin1String("getConexoesTodosCabos"))
            answers->release();
        if (!answers->wireLayers().holdsVertices()) return;
        zvdb::Database* database = context.database ? context.database() : nullptr;
        if (database) answers->wireLayers().releaseStaleVertices(*database);
    });
}

}  // namespace zvhost
