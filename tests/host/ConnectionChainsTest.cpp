// The connection answers reach the module as chains made straight from the product's data:
// node for node what the LISP lists would give, and only while the functions are the
// product's own. Result-buffer nodes are made in blocks that go with their last node.
#include "LispHostFixture.h"

#include "app/ConnectionChains.h"
#include "app/DocumentLisp.h"
#include "app/LispChains.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/LayerRecord.h"
#include "drawing/Polyline.h"
#include "product/ConnectionAnswers.h"
#include "product/ProductContext.h"
#include "product/ProductLisp.h"
#include "sample/ProjectGenerator.h"
#include "sdk/NodeChains.h"
#include "sdk/ResultBuffer.h"

#include <algorithm>
#include <random>
#include <thread>

namespace {

using zvsdk::ResultBuffer;

// One line per node: type and value.
std::string dump(const ResultBuffer* chain) {
    std::string text;
    for (; chain; chain = chain->rbnext) {
        text += std::to_string(chain->restype);
        if (chain->restype == zvsdk::RTSTR || chain->restype == zvsdk::RTREAL ||
            chain->restype == zvsdk::RTSHORT)
            text += ' ';
        if (chain->restype == zvsdk::RTSTR) text += chain->rstring.toStdString();
        if (chain->restype == zvsdk::RTREAL) text += std::to_string(chain->rreal);
        if (chain->restype == zvsdk::RTSHORT) text += std::to_string(chain->rint);
        text += '\n';
    }
    return text;
}

struct Chain {
    ResultBuffer* head;
    explicit Chain(ResultBuffer* chain) : head(chain) {}
    ~Chain() { zvsdk::releaseChain(head); }
    Chain(const Chain&) = delete;
    Chain& operator=(const Chain&) = delete;
    std::string text() const { return dump(head); }
};

class ConnectionChainsTest : public LispHostFixture {
protected:
    void SetUp() override {
        LispHostFixture::SetUp();
        zvsample::ProjectGenerator generator({3, 120, 6});
        project = app->openDocument(folder.filePath("generated.dxf"), generator.generate());
        app->setActiveDocument(project);
    }
    zvhost::DocumentLisp& lisp() { return *static_cast<zvhost::DocumentLisp*>(project->lisp()); }
    // What the module's call gets.
    std::string invoked(const char* function) {
        Chain call(zvsdk::newString(function));
        return Chain(lisp().lispInvoke(call.head)).text();
    }
    // What the LISP value of the call gives as a chain.
    std::string throughLisp(const char* function) {
        const zvlisp::Value value = lisp().interpreter().evalText(QString("(%1)").arg(function));
        return Chain(zvhost::LispChains::toChain(value)).text();
    }

    zvhost::HostDocument* project = nullptr;
};

TEST_F(ConnectionChainsTest, TheChainsAreTheNodesOfTheLispAnswers) {
    for (const char* function : {"getConexoesTodosFios", "getConexoesTodosCabos"}) {
        const std::string chain = invoked(function);
        EXPECT_GT(std::count(chain.begin(), chain.end(), '\n'), 100) << function;
        EXPECT_EQ(chain, throughLisp(function)) << function;
    }
    // a pair in a row, as a reader asks, and another tolerance
    lisp().interpreter().evalText("(setq *ESPESSURA_BARRAMENTO* 4.0)");
    const std::string wires = invoked("getConexoesTodosFios");
    const std::string cables = invoked("getConexoesTodosCabos");
    EXPECT_EQ(wires, throughLisp("getConexoesTodosFios"));
    EXPECT_EQ(cables, throughLisp("getConexoesTodosCabos"));
    // an empty drawing answers nil, one node
    app->setActiveDocument(document);
    EXPECT_EQ(Chain(zvhost::ConnectionChains::toChain({}, true)).text(), "5019\n");
    Chain call(zvsdk::newString("getConexoesTodosFios"));
    EXPECT_EQ(
        Chain(static_cast<zvhost::DocumentLisp*>(document->lisp())->lispInvoke(call.head)).text(),
        "5019\n");
}

// Writes the values it is given as `dump` writes the chain of the same answer.
class Recorder : public zvsdk::ConnectionReceiver {
public:
    void begin(std::size_t wires, std::size_t entries) override {
        ++begun;
        wiresTold = wires;
        entriesTold = entries;
    }
    void wire(QString number) override {
        closeWire();
        text += "5016\n5005 " + number.toStdString() + "\n";
        ++wires;
    }
    void entry(QString entry, double x, double y, double z) override {
        text += "5016\n5005 " + entry.toStdString() + "\n";
        for (double v : {x, y, z})
            text += "5001 " + std::to_string(v) + "\n";
        text += "5017\n";
        ++entries;
    }
    std::string chainText() {
        closeWire();
        return wires == 0 ? "5019\n" : "5016\n" + text + "5017\n";
    }

    std::string text;
    int begun = 0;
    std::size_t wiresTold = 0, entriesTold = 0, wires = 0, entries = 0;

private:
    void closeWire() {
        if (wires > closed) text += "5017\n";
        closed = wires;
    }
    std::size_t closed = 0;
};

// The module's other road: the same answers value by value, while the functions are the
// product's own.
TEST_F(ConnectionChainsTest, TheAnswersWithoutChainsAreTheChainsValues) {
    for (const char* function : {"getConexoesTodosFios", "getConexoesTodosCabos"}) {
        Recorder recorder;
        ASSERT_EQ(lisp().lispInvokeConnections(function, recorder), zvsdk::RTNORM) << function;
        EXPECT_EQ(recorder.begun, 1);
        EXPECT_EQ(recorder.wiresTold, recorder.wires);
        EXPECT_EQ(recorder.entriesTold, recorder.entries);
        EXPECT_GT(recorder.entries, 20u) << function;
        EXPECT_EQ(recorder.chainText(), invoked(function)) << function;
    }
    // a user's defun takes over: no answer this way, nothing given
    lisp().interpreter().evalText("(defun getConexoesTodosFios () nil)");
    Recorder taken;
    EXPECT_EQ(lisp().lispInvokeConnections("getConexoesTodosFios", taken), zvsdk::RTNONE);
    EXPECT_EQ(taken.begun, 0);
    EXPECT_EQ(lisp().lispInvokeConnections("getFiosPorLayer", taken), zvsdk::RTNONE);
    // an empty drawing: nothing, as its nil chain
    app->setActiveDocument(document);
    Recorder empty;
    EXPECT_EQ(static_cast<zvhost::DocumentLisp*>(document->lisp())
                  ->lispInvokeConnections("getConexoesTodosCabos", empty),
              zvsdk::RTNORM);
    EXPECT_EQ(empty.chainText(), "5019\n");
    EXPECT_EQ(empty.wiresTold, 0u);
}

// A page's wires as the module asks for them, page after page: the LISP answer's nodes, nil
// for a layer without any; another shape of call goes the LISP way.
TEST_F(ConnectionChainsTest, APagesWiresAreTheNodesOfTheLispAnswer) {
    int withWires = 0;
    std::vector<std::string> layers{"NO SUCH LAYER"};
    for (zvdb::LayerRecord* layer : project->database()->layers())
        layers.emplace_back(layer->name());
    for (const std::string& layer : layers) {
        Chain call(zvsdk::newString("getFiosPorLayer"));
        call.head->rbnext = zvsdk::newString(QString::fromStdString(layer));
        const std::string chain = Chain(lisp().lispInvoke(call.head)).text();
        EXPECT_EQ(chain, throughLisp(("getFiosPorLayer \"" + layer + "\"").c_str())) << layer;
        withWires += chain != "5019\n";
    }
    EXPECT_GT(withWires, 3);
    Chain numberCall(zvsdk::newString("getFiosPorLayer"));
    numberCall.head->rbnext = zvsdk::newNode(zvsdk::RTSHORT);
    EXPECT_EQ(lisp().lispInvoke(numberCall.head), nullptr);  // the LISP error: no answer
}

// Writes each polyline it is given with its vertices, one line each.
class PolylineRecorder : public zvsdk::PolylineReceiver {
public:
    void polyline(std::uint64_t handle, const double* xyz, std::size_t count) override {
        text += std::to_string(handle);
        for (std::size_t i = 0; i < 3 * count; ++i)
            text += ' ' + std::to_string(xyz[i]);
        text += '\n';
    }
    std::string text;
};

// A page's wires with their vertices, as the reader reads them next: the polylines of the
// chain's handles, in its order, each with the vertices the drawing holds as it stands.
TEST_F(ConnectionChainsTest, APagesWiresWithTheirVerticesAreTheChainsPolylinesAsTheyStand) {
    zvdb::Database& database = *project->database();
    const auto asTheyStand = [&](const std::string& layer) {
        Chain call(zvsdk::newString("getFiosPorLayer"));
        call.head->rbnext = zvsdk::newString(QString::fromStdString(layer));
        Chain chain(lisp().lispInvoke(call.head));
        PolylineRecorder expected;
        for (const ResultBuffer* node = chain.head; node; node = node->rbnext) {
            if (node->restype != zvsdk::RTSTR) continue;
            const std::uint64_t handle = node->rstring.toULongLong(nullptr, 16);
            auto* polyline = dynamic_cast<zvdb::Polyline*>(database.objectByHandle(handle));
            std::vector<double> xyz;
            for (const zvdb::Point3& p : polyline->vertices())
                xyz.insert(xyz.end(), {p.x, p.y, p.z});
            expected.polyline(handle, xyz.data(), xyz.size() / 3);
        }
        return expected.text;
    };
    const auto given = [&](const std::string& layer) {
        PolylineRecorder recorder;
        EXPECT_EQ(
            lisp().lispInvokePolylines("getFiosPorLayer", QString::fromStdString(layer), recorder),
            zvsdk::RTNORM);
        return recorder.text;
    };
    std::vector<std::string> layers{"NO SUCH LAYER"};
    for (zvdb::LayerRecord* layer : database.layers())
        layers.emplace_back(layer->name());
    // from the connections' walk, and from a walk of its own
    std::string page;
    for (const bool fromConnections : {true, false}) {
        if (fromConnections) invoked("getConexoesTodosFios");
        int withWires = 0;
        for (const std::string& layer : layers) {
            const std::string wires = given(layer);
            EXPECT_EQ(wires, asTheyStand(layer)) << layer;
            withWires += !wires.empty();
            if (!wires.empty()) page = layer;
        }
        EXPECT_GT(withWires, 3);
        lisp().interpreter().evalText("(entmod (entget (entlast)))");
    }
    // a LISP edit moves a vertex of a wire the connections' walk read
    invoked("getConexoesTodosFios");
    const std::string before = given(page);
    EXPECT_EQ(given(page), before);  // asked again, read from the drawing
    const std::string first = before.substr(0, before.find(' '));
    lisp().interpreter().evalText(QString("(setq d (entget (handent \"%1\")))"
                                          "(entmod (subst (list 10 -7.25 3.5) (assoc 10 d) d))")
                                      .arg(QString::number(std::stoull(first), 16).toUpper()));
    const std::string after = given(page);
    EXPECT_EQ(after, asTheyStand(page));
    EXPECT_NE(after, before);
    EXPECT_NE(after.find(first + " -7.250000 3.500000"), std::string::npos);
    // a user's defun takes over: no answer this way
    lisp().interpreter().evalText("(defun getFiosPorLayer (layer) nil)");
    PolylineRecorder taken;
    EXPECT_EQ(lisp().lispInvokePolylines("getFiosPorLayer", QString::fromStdString(page), taken),
              zvsdk::RTNONE);
    EXPECT_EQ(taken.text, "");
}

TEST(ConnectionChainTexts, NamesOutsideAsciiAreReadAsUtf8) {
    const std::string number =
        "F\xC3\x87"
        "1";                                         // FÇ1
    const std::string block = "A\xC3\x87\xC3\x83O";  // AÇÃO
    const std::string connection =
        "\xC2\xB5"
        "2";  // µ2
    zvproduct::WireConnections wire{number, {}, {}};
    wire.touches.push_back({0x1F, connection, block, {1, 2, 3}});
    wire.touches.push_back({0x20, {}, "BORNE", {4, 5, 6}});
    Chain chain(zvhost::ConnectionChains::toChain({wire}, true));
    EXPECT_EQ(chain.text(), "5016\n5016\n5005 " + number + "\n5016\n5005 1F#" + connection + "#" +
                                block + "\n5001 1.000000\n5001 2.000000\n5001 3.000000\n5017\n" +
                                "5016\n5005 20##BORNE\n5001 4.000000\n5001 5.000000\n" +
                                "5001 6.000000\n5017\n5017\n5017\n");
    EXPECT_EQ(chain.head->rbnext->rbnext->rstring, QString::fromUtf8("F\xC3\x87"
                                                                     "1"));
    EXPECT_EQ(chain.head->rbnext->rbnext->rstring.size(), 3);
    Chain cables(zvhost::ConnectionChains::toChain({wire}, false));
    EXPECT_EQ(cables.head->rbnext->rbnext->rbnext->rbnext->rstring, "1F");
}

// A receiver that takes the numbers only as QStrings gets them from the host's UTF-8 texts.
TEST(ConnectionChainTexts, AWiresNumberInUtf8ReachesAReceiverOfTextsDecoded) {
    struct Numbers : zvsdk::ConnectionReceiver {
        void begin(std::size_t, std::size_t) override {}
        void wire(QString number) override { numbers << number; }
        void entry(QString, double, double, double) override {}
        QStringList numbers;
    } receiver;
    receiver.wireNumber(
        "F\xC3\x87"
        "1");
    receiver.wireNumber("7");
    receiver.wireNumber({});
    EXPECT_EQ(receiver.numbers, QStringList({QString::fromUtf8("F\xC3\x87"
                                                               "1"),
                                             "7", ""}));
    EXPECT_EQ(receiver.numbers[0].size(), 3);
}

TEST_F(ConnectionChainsTest, AUsersDefunOfTheFunctionTakesOver) {
    lisp().interpreter().evalText(
        "(defun getConexoesTodosFios () '((\"X\" (\"1A#2#B\" 1.5 2.0 3.0))))");
    EXPECT_EQ(invoked("getConexoesTodosFios"),
              "5016\n5016\n5005 X\n5016\n5005 1A#2#B\n5001 1.500000\n5001 2.000000\n"
              "5001 3.000000\n5017\n5017\n5017\n");
    // the other function is still the product's
    EXPECT_EQ(invoked("getConexoesTodosCabos"), throughLisp("getConexoesTodosCabos"));
}

TEST(ConnectionChainIndex, KeptForTheCablesRightAfterTheWiresAndLetGoAtAnyOtherCall) {
    zvsample::ProjectGenerator generator({5, 60, 4});
    std::unique_ptr<zvdb::Database> drawing = generator.generate();
    zvhost::DocumentLisp lisp([](const QString&) {});
    auto answers = std::make_shared<zvproduct::ConnectionAnswers>();
    zvproduct::ProductContext context;
    context.database = [&drawing] { return drawing.get(); };
    context.connections = answers;
    zvproduct::installProductFunctions(lisp.interpreter(), context);
    zvhost::ConnectionChains::install(lisp, context);
    auto invoke = [&lisp](const char* function, const char* argument = nullptr) {
        Chain call(zvsdk::newString(function));
        if (argument) call.head->rbnext = zvsdk::newString(argument);
        return Chain(lisp.lispInvoke(call.head)).text();
    };
    const std::string wires = invoke("getConexoesTodosFios");
    EXPECT_TRUE(answers->keepsIndex());
    const std::string cables = invoke("getConexoesTodosCabos");
    EXPECT_FALSE(answers->keepsIndex());
    EXPECT_GT(std::count(cables.begin(), cables.end(), '\n'), 10);
    // the wires alone, then the reader goes on with other questions
    EXPECT_EQ(invoke("getConexoesTodosFios"), wires);
    EXPECT_TRUE(answers->keepsIndex());
    invoke("getFiosPorLayer", "ESQ$0001$A");
    EXPECT_FALSE(answers->keepsIndex());
    // the cables asked later are worked out again, alike, and the index kept for the wires
    EXPECT_EQ(invoke("getConexoesTodosCabos"), cables);
    EXPECT_TRUE(answers->keepsIndex());
    EXPECT_EQ(invoke("getConexoesTodosFios"), wires);
    EXPECT_FALSE(answers->keepsIndex());
    // the same without chains, and a call of anything else lets the index go as well
    Recorder viaWires, viaCables, again;
    EXPECT_EQ(lisp.lispInvokeConnections("getConexoesTodosFios", viaWires), zvsdk::RTNORM);
    EXPECT_TRUE(answers->keepsIndex());
    EXPECT_EQ(lisp.lispInvokeConnections("getConexoesTodosCabos", viaCables), zvsdk::RTNORM);
    EXPECT_FALSE(answers->keepsIndex());
    EXPECT_EQ(viaWires.chainText(), wires);
    EXPECT_EQ(viaCables.chainText(), cables);
    EXPECT_EQ(lisp.lispInvokeConnections("getConexoesTodosFios", again), zvsdk::RTNORM);
    EXPECT_TRUE(answers->keepsIndex());
    invoke("getFiosPorLayer", "ESQ$0001$A");
    EXPECT_FALSE(answers->keepsIndex());
    // the wires' vertices are held for the pages while the drawing stays as it was read
    EXPECT_TRUE(answers->wireLayers().holdsVertices());
    invoke("NO SUCH FUNCTION");
    EXPECT_TRUE(answers->wireLayers().holdsVertices());
    for (zvdb::Entity* entity : drawing->modelSpace()->entities())
        if (auto* polyline = dynamic_cast<zvdb::Polyline*>(entity)) {
            polyline->setVertices(polyline->vertices());
            break;
        }
    invoke("NO SUCH FUNCTION");
    EXPECT_FALSE(answers->wireLayers().holdsVertices());
}

TEST(ResultBufferBlocks, BlocksGoWithTheirLastNodeInAnyOrderAndFromAnyThread) {
    const std::size_t before = zvsdk::nodeBlocksInUse();
    std::vector<ResultBuffer*> nodes;
    for (int i = 0; i < 3000; ++i)
        nodes.push_back(zvsdk::newShort(static_cast<short>(i)));
    EXPECT_GE(zvsdk::nodeBlocksInUse(), before + 2);
    EXPECT_EQ(nodes[2999]->rint, 2999);
    std::shuffle(nodes.begin(), nodes.end(), std::mt19937(7));
    for (ResultBuffer* node : nodes)
        zvsdk::releaseChain(node);  // each a chain of one
    EXPECT_LE(zvsdk::nodeBlocksInUse(), before + 1);

    // made on a thread that ends, freed here
    const std::size_t here = zvsdk::nodeBlocksInUse();
    ResultBuffer* chain = nullptr;
    std::thread([&chain] {
        ResultBuffer** tail = &chain;
        for (int i = 0; i < 2048; ++i, tail = &(*tail)->rbnext)
            *tail = zvsdk::newReal(i);
    }).join();
    EXPECT_EQ(zvsdk::nodeBlocksInUse(), here + 2);
    zvsdk::releaseChain(chain);
    EXPECT_EQ(zvsdk::nodeBlocksInUse(), here);
}

TEST(ResultBufferBlocks, AChainMadeAtOnceSpansBlocksAndGoesInAnyPieces) {
    const std::size_t here = zvsdk::nodeBlocksInUse();
    ResultBuffer* chain = nullptr;
    // a thread of its own starts with no block: 2500 nodes take three
    std::thread([&chain] { chain = zvsdk::newChain(2500); }).join();
    EXPECT_EQ(zvsdk::nodeBlocksInUse(), here + 3);
    std::vector<ResultBuffer*> nodes;
    for (ResultBuffer* node = chain; node; node = node->rbnext)
        nodes.push_back(node);
    ASSERT_EQ(nodes.size(), 2500u);
    EXPECT_EQ(nodes[1234]->restype, zvsdk::RTNONE);
    EXPECT_TRUE(nodes[1234]->rstring.isNull());
    EXPECT_EQ(nodes[2499]->rpoint[2], 0.0);
    nodes[6]->rstring = QStringLiteral("freed with its node");
    auto relink = [](std::vector<ResultBuffer*> piece) {
        for (std::size_t i = 0; i < piece.size(); ++i)
            piece[i]->rbnext = i + 1 < piece.size() ? piece[i + 1] : nullptr;
        zvsdk::releaseChain(piece.front());
    };
    // The even nodes of the first two blocks shuffled, with a node of its own among them:
    // the block changes at nearly every node, and none of the blocks is done with.
    std::vector<ResultBuffer*> even, odd, last;
    for (std::size_t i = 0; i < 2048; ++i)
        (i % 2 ? odd : even).push_back(nodes[i]);
    last.assign(nodes.begin() + 2048, nodes.end());
    std::shuffle(even.begin(), even.end(), std::mt19937(3));
    auto* own = new ResultBuffer;
    own->restype = zvsdk::RTSTR;
    own->rstring = QStringLiteral("own");
    even.insert(even.begin() + 100, own);
    relink(even);
    EXPECT_EQ(zvsdk::nodeBlocksInUse(), here + 3);
    // the odd ones backwards: the first two blocks go
    std::reverse(odd.begin(), odd.end());
    relink(odd);
    EXPECT_EQ(zvsdk::nodeBlocksInUse(), here + 1);
    relink(last);
    EXPECT_EQ(zvsdk::nodeBlocksInUse(), here);
}

TEST(ResultBufferBlocks, CopiesAndAssignedNodesKeepTheirOwnPlace) {
    ResultBuffer* chain = zvsdk::newPoint(1, 2, 3, true);
    chain->rbnext = zvsdk::newEntity({nullptr, 0x2A});
    chain->rbnext->rbnext = zvsdk::newString("text");
    ResultBuffer* copy = zvsdk::copyChain(chain);
    // a node of its own assigned over a block's node: the block's node stays freeable
    ResultBuffer own;
    own.restype = zvsdk::RTLONG;
    own.rlong = 70000;
    *chain->rbnext->rbnext = own;
    ResultBuffer onItsOwn(*chain);
    EXPECT_EQ(onItsOwn.rpoint[2], 3.0);
    zvsdk::releaseChain(chain);
    EXPECT_EQ(dump(copy), "5009\n5006\n5005 text\n");
    EXPECT_EQ(copy->rpoint[1], 2.0);
    EXPECT_EQ(copy->rbnext->rlname.handle, 0x2Au);
    zvsdk::releaseChain(copy);
    EXPECT_EQ(own.rlong, 70000);
}

}  // namespace
