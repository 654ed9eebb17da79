// The product functions on a generated sample project.
#include "ProductFixture.h"

#include "sample/ProjectGenerator.h"

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
    EXPECT_EQ(lisp.toInt(run("(length (getConexoesTodosCabos))")), counts.cables);
    // every wire joins at least two symbols, so the check passes
    EXPECT_EQ(show("(vl-every '(lambda (w) (>= (length w) 3)) (getConexoesTodosFios))"), "T");
    EXPECT_EQ(show("(zvBuild)"), "T") << printed.toStdString();
    EXPECT_EQ(lisp.toInt(run("(length (buscalistapaginas))")), counts.pages);
    // the first control page has wires of its own
    EXPECT_GT(lisp.toInt(run("(length (getFiosPorLayer \"COMANDO$0001$A\"))")), 0);
}

}  // namespace
}  // namespace zvproduct::testing
