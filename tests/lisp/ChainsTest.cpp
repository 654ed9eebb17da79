// Values as result-buffer chains and back, at the edges: 16/32-bit integers, points,
// dotted tails, unbalanced chains; and zvhost lisp running a file and a prompt session.
#include "LispFixture.h"
#include "app/HostCli.h"
#include "app/LispChains.h"

#include <QTemporaryDir>

using zvhost::LispChains;

namespace {

QString types(const zvsdk::ResultBuffer* chain) {
    QStringList codes;
    for (; chain; chain = chain->rbnext)
        codes << QString::number(chain->restype);
    return codes.join(' ');
}

class ChainsTest : public LispFixture {
protected:
    QString out(const QString& expression) {
        zvsdk::ResultBuffer* chain = LispChains::toChain(lisp.evalText(expression));
        const QString codes = types(chain);
        zvsdk::releaseChain(chain);
        return codes;
    }
    std::string roundTrip(const QString& expression) {
        zvsdk::ResultBuffer* chain = LispChains::toChain(lisp.evalText(expression));
        const zvlisp::Value back = LispChains::value(lisp, chain);
        zvsdk::releaseChain(chain);
        return zvlisp::Printer::prin1(back).toStdString();
    }
};

}  // namespace

TEST_F(ChainsTest, IntegersChooseTheirWidth) {
    EXPECT_EQ(out("32767"), "5003");
    EXPECT_EQ(out("-32768"), "5003");
    EXPECT_EQ(out("32768"), "5010");
    EXPECT_EQ(out("-40000"), "5010");
    EXPECT_EQ(roundTrip("40000"), "40000");
}

TEST_F(ChainsTest, ListsPairsAndPoints) {
    EXPECT_EQ(out("nil"), "5019");
    EXPECT_EQ(out("t"), "5021");
    EXPECT_EQ(out("'(\"a\" 1.5)"), "5016 5005 5001 5017");
    EXPECT_EQ(out("'((\"K\" . \"V\"))"), "5016 5016 5005 5018 5005 5017 5017");
    EXPECT_EQ(out("'(1.0 2.0 3.0)"), "5009");
    EXPECT_EQ(out("'(1 2 3)"), "5016 5003 5003 5003 5017");
    EXPECT_EQ(out("'(1.0 2.0)"), "5016 5001 5001 5017");
    EXPECT_EQ(out("'sym"), "5005");
    EXPECT_EQ(roundTrip("'((\"K\" . \"V\") (1 2 . 3) nil (\"x\" (\"y\")))"),
              "((\"K\" . \"V\") (1 2 . 3) nil (\"x\" (\"y\")))");
    EXPECT_EQ(roundTrip("'((0.5 1 2))"), "((0.5 1.0 2.0))");
}

TEST_F(ChainsTest, ChainsComingInAreReadLeniently) {
    zvsdk::ResultBuffer* chain = zvsdk::newNode(zvsdk::RTLB);
    chain->rbnext = zvsdk::newString("open");
    chain->rbnext->rbnext = zvsdk::newNode(zvsdk::RTLE);
    chain->rbnext->rbnext->rbnext = zvsdk::newNode(zvsdk::RTLE);          // one end too many
    chain->rbnext->rbnext->rbnext->rbnext = zvsdk::newNode(zvsdk::RTLB);  // never closed
    chain->rbnext->rbnext->rbnext->rbnext->rbnext = zvsdk::newShort(7);
    EXPECT_EQ(zvlisp::Printer::prin1(LispChains::value(lisp, chain)), "((\"open\") (7))");
    zvsdk::releaseChain(chain);
    EXPECT_TRUE(LispChains::value(lisp, nullptr).isNil());
    EXPECT_EQ(
        lisp.evalText("(setq deep nil) (repeat 3000 (setq deep (list deep))) 'ok").asSymbol()->name,
        "OK");
    EXPECT_THROW(LispChains::toChain(lisp.global("deep")), zvlisp::LispError);
}

TEST(LispSubcommandTest, RunsAFileAndReportsFailure) {
    QTemporaryDir dir;
    QFile file(dir.filePath("run.lsp"));
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write("(princ (strcat \"ok \" (itoa (/ 7 2))))\n");
    file.close();
    QString outText, errText, inText;
    QTextStream out(&outText), err(&errText), in(&inText);
    EXPECT_EQ(zvhost::runHost({"lisp", file.fileName()}, out, err, in), zvhost::kExitOk);
    EXPECT_EQ(outText, "ok 3");
    outText.clear();
    EXPECT_EQ(zvhost::runHost({"lisp", dir.filePath("none.lsp")}, out, err, in),
              zvhost::kExitFailure);
    EXPECT_TRUE(outText.contains("; error: LOAD failed"));
    EXPECT_EQ(zvhost::runHost({"lisp", "a.lsp", "b.lsp"}, out, err, in), zvhost::kExitUsage);
}

TEST(LispSubcommandTest, PromptSessionGoesOnAfterErrors) {
    QString outText, errText;
    QString inText =
        "(setq a 2)\n(car a)\n(defun sq (x)\n  (* x x))\n(sq a) (princ)\n"
        "(repeat 3000 (setq deep (list deep)))\n\"open";
    QTextStream out(&outText), err(&errText), in(&inText);
    EXPECT_EQ(zvhost::runHost({"lisp"}, out, err, in), zvhost::kExitOk);
    EXPECT_EQ(outText,
              "2\n; error: bad argument type: consp 2\nSQ\n4\n"
              "; error: stack overflow\n; error: malformed string on input\n");
}
