// The product functions on a generated sample project.
#include "ProductFixture.h"

#include "product/ConnectionFinder.h"
#include "sample/ProjectGenerator.h"

#include "drawing/Entity.h"

#include <set>

namespace zvproduct::testing {
namespace {

class GeneratedProjectTest : public ProductFixture {
protected:
    GeneratedProjectTest() {
        zvsample::ProjectGenerator generator({7, 200, 10});
        database = generator.generate();
        counts = generator.counts();
    }
    zvsample::GeneratedCounts counts;
};

TEST_F(GeneratedProjectTest, EveryWireAndCableIsFoundAndTheProjectChecks) {
    EXPECT_EQ(lisp.toInt(run("(length (getConexoesTodosFios))")), counts.wires);
    // A cable's connections go by core: each core has a key of its own.
    EXPECT_EQ(lisp.toInt(run("(length (getConexoesTodosCabos))")), counts.leads);
    // every wire joins at least two symbols, so the check passes
    EXPECT_EQ(show("(vl-every '(lambda (w) (>= (length w) 3)) (getConexoesTodosFios))"), "T");
    EXPECT_EQ(show("(zvBuild)"), "T") << printed.toStdString();
    EXPECT_EQ(lisp.toInt(run("(length (buscalistapaginas))")), counts.pages);
    // the first control page has wires of its own
    EXPECT_GT(lisp.toInt(run("(length (getFiosPorLayer \"COMANDO$0001$A\"))")), 0);
}

// The wire list keeps to the wires as the connection rule groups them: each wire's first
// polyline on the pages asked, wires in the order of their first polyline.
TEST_F(GeneratedProjectTest, WireListAnswersEachWiresFirstPolylineOnThePagesAsked) {
    const auto wires = ConnectionFinder(*database, 0.1).wires();
    auto expected = [&](const std::set<std::string>& pages) {
        std::vector<QString> handles;
        for (const WireConnections& wire : wires)
            for (std::uint64_t handle : wire.polylines)
                if (pages.empty() ||
                    pages.count(std::string(database->entityByHandle(handle)->layer()))) {
                    handles.push_back(QString::number(handle, 16).toUpper());
                    break;
                }
        return handles;
    };
    auto answered = [&](const QString& pages) {
        std::vector<QString> handles;
        for (const zvlisp::Value& text :
             lisp.toVector(run("(getListaFiosProj \"p.dxf\" " + pages + ")")))
            handles.push_back(text.asString());
        return handles;
    };
    const auto pages = lisp.toVector(run("(buscalistapaginas)"));
    ASSERT_GE(pages.size(), 6u);
    const std::string a = pages[3].asString().toStdString();
    const std::string b = pages[5].asString().toStdString();
    const std::string last = pages.back().asString().toStdString();
    EXPECT_EQ(answered("nil").size(), static_cast<std::size_t>(counts.wires));
    EXPECT_EQ(answered("nil"), expected({}));
    EXPECT_EQ(answered(QString::fromStdString("\"" + b + "\"")), expected({b}));
    EXPECT_EQ(answered(QString::fromStdString("\"" + last + ";" + a + "\" \"" + b + "\"")),
              expected({a, b, last}));
    // asked again, unchanged
    EXPECT_EQ(answered("nil"), expected({}));
}

}  // namespace
}  // namespace zvproduct::testing
