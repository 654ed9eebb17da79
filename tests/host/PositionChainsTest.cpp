// BuscarCoordenadas answers the module straight from the call's chain: what the LISP
// function gives for the same arguments, in every shape of call, and only while the
// function is the product's own. Also the module's publication of string pairs.
#include "LispHostFixture.h"

#include "app/LispChains.h"
#include "sdk/ResultBuffer.h"

namespace {

using zvsdk::ResultBuffer;

// The answer as text: the string, "nil" for no answer, the type code for anything else.
std::string answer(ResultBuffer* chain) {
    std::string text = !chain                           ? "nil"
                       : chain->restype == zvsdk::RTSTR ? chain->rstring.toStdString()
                                                        : std::to_string(chain->restype);
    zvsdk::releaseChain(chain);
    return text;
}

class PositionChainsTest : public LispHostFixture {
protected:
    zvhost::DocumentLisp& lisp() { return *static_cast<zvhost::DocumentLisp*>(document->lisp()); }
    // The call as the module makes it; `args` are LISP text, made into a chain.
    std::string invoked(const QString& args) {
        const zvlisp::Value values = interpreter().evalText("(list " + args + ")");
        ResultBuffer* call = zvsdk::newString("BuscarCoordenadas");
        // the list's chain, less its brackets
        ResultBuffer* list = zvhost::LispChains::toChain(values);
        ResultBuffer* inner = list->restype == zvsdk::RTLB ? list->rbnext : nullptr;
        ResultBuffer* last = nullptr;
        for (ResultBuffer* n = inner; n && n->rbnext; n = n->rbnext)
            last = n;
        if (last) zvsdk::releaseChain(last->rbnext), last->rbnext = nullptr;
        if (inner) list->rbnext = nullptr;
        call->rbnext = last ? inner : nullptr;
        zvsdk::releaseChain(list);
        const std::string text = answer(lisp().lispInvoke(call));
        zvsdk::releaseChain(call);
        return text;
    }
    // What the LISP function gives for the same arguments.
    std::string throughLisp(const QString& args) {
        const std::string shown = ev("(BuscarCoordenadas " + args + ")");
        if (shown.rfind("ERROR", 0) == 0) return "nil";
        return shown.size() >= 2 && shown.front() == '"' ? shown.substr(1, shown.size() - 2)
                                                         : shown;
    }
};

TEST_F(PositionChainsTest, TheChainAnswerIsTheLispAnswerForEveryShapeOfCall) {
    const QStringList calls = {
        "nil \"COMANDO\" \"0001\" 10.0 290.0",
        "nil \"COMANDO\" \"0001\" 419.0 1.0",
        "nil \"comando\" \"0002\" 100.0 200.0",
        "nil \"COMANDO\" \"0001\" 500.0 10.0",    // outside the sheet
        "nil \"COMANDO\" \"0001\" 100 200",       // integers
        "nil \"COMANDO\" \"0001\" 70000 200",     // a 32-bit integer
        "nil \"COMANDO\" \"0001\" \"x\" 1.0",     // not a number
        "nil nil \"0001\" 10.0 290.0",            // no group
        "nil 5 nil 10.0 290.0",                   // a group that is not a text
        "nil \"COMANDO\" \"0001\" '(1 2) 1.0",    // a list among the arguments
        "nil \"COMANDO\" \"0001\" 10.0",          // too few
        "nil \"COMANDO\" \"0001\" 10.0 290.0 1",  // too many
    };
    for (const QString& args : calls) {
        const std::string expected = throughLisp(args);
        EXPECT_EQ(invoked(args), expected) << args.toStdString();
    }
    EXPECT_EQ(invoked("nil \"COMANDO\" \"0001\" 10.0 290.0"), "A1");
    EXPECT_EQ(invoked("nil \"COMANDO\" \"0001\" \"x\" 1.0"), "??");
    // the calls with the wrong count failed as the function does, on the command line
    EXPECT_TRUE(commandLine.contains("too few arguments"));
    EXPECT_TRUE(commandLine.contains("too many arguments"));
}

TEST_F(PositionChainsTest, AUsersDefunOfTheFunctionTakesOverAndCanBeUndone) {
    const QString args = "nil \"COMANDO\" \"0001\" 10.0 290.0";
    ev("(setq produto BuscarCoordenadas chamadas 0)");
    ev("(defun BuscarCoordenadas (e g p x y) (setq chamadas (1+ chamadas)) (strcat \"meu-\" g))");
    EXPECT_EQ(invoked(args), "meu-COMANDO");
    EXPECT_EQ(invoked(args), "meu-COMANDO");
    EXPECT_EQ(ev("chamadas"), "2");
    // a function that fails is reported and answers nothing
    ev("(defun BuscarCoordenadas (e g p x y) (car x))");
    EXPECT_EQ(invoked(args), "nil");
    EXPECT_TRUE(commandLine.contains("bad argument type"));
    // the product's own again: its straight answer again
    ev("(setq BuscarCoordenadas produto)");
    EXPECT_EQ(invoked(args), "A1");
    EXPECT_EQ(ev("chamadas"), "2");
    // gone altogether: nothing, quietly
    ev("(setq BuscarCoordenadas nil)");
    const QString before = commandLine;
    EXPECT_EQ(invoked(args), "nil");
    EXPECT_EQ(commandLine, before);
}

TEST_F(PositionChainsTest, FunctionsNeverDefinedAnswerNothingAndAreNotMadeSymbols) {
    ResultBuffer* call = zvsdk::newString("funcao-que-ninguem-definiu");
    EXPECT_EQ(lisp().lispInvoke(call), nullptr);
    EXPECT_EQ(lisp().lispInvoke(call), nullptr);
    zvsdk::releaseChain(call);
    EXPECT_EQ(interpreter().findSymbol("funcao-que-ninguem-definiu"), nullptr);
    ResultBuffer* value = nullptr;
    EXPECT_EQ(lisp().lispGetSymbol("simbolo-nunca-usado", &value), zvsdk::RTERROR);
    EXPECT_EQ(interpreter().findSymbol("simbolo-nunca-usado"), nullptr);
    // once set, by any spelling, it reads back
    ev("(setq simbolo-nunca-usado 3)");
    ASSERT_EQ(lisp().lispGetSymbol("SIMBOLO-NUNCA-USADO", &value), zvsdk::RTNORM);
    ASSERT_NE(value, nullptr);
    EXPECT_EQ(value->restype, zvsdk::RTSHORT);
    EXPECT_EQ(value->rint, 3);
    zvsdk::releaseChain(value);
}

TEST_F(PositionChainsTest, ListsOfChangingLengthReadRightAndATailHeldElsewhereStaysAsItWas) {
    const QString a = "A", b = "B", c = "C", um = "1", dois = "2", tres = "3";
    const zvsdk::StringPair tres_pares[] = {{&a, &um}, {&b, &dois}, {&c, &tres}};
    const zvsdk::StringPair outros_tres[] = {{&c, &um}, {&a, &dois}, {&b, &tres}};
    const zvsdk::StringPair um_par[] = {{&b, &um}};
    ASSERT_EQ(lisp().lispPutStringPairs("reg", tres_pares, 3), zvsdk::RTNORM);
    ASSERT_EQ(lisp().lispPutStringPairs("reg", um_par, 1), zvsdk::RTNORM);
    EXPECT_EQ(ev("reg"), "((\"B\" . \"1\"))");
    ASSERT_EQ(lisp().lispPutStringPairs("reg", outros_tres, 3), zvsdk::RTNORM);
    EXPECT_EQ(ev("reg"), "((\"C\" . \"1\") (\"A\" . \"2\") (\"B\" . \"3\"))");
    // A tail that LISP keeps is its own: shorter and longer lists after it leave it alone.
    ev("(setq cauda (cdr reg))");
    ASSERT_EQ(lisp().lispPutStringPairs("reg", um_par, 1), zvsdk::RTNORM);
    ASSERT_EQ(lisp().lispPutStringPairs("reg", tres_pares, 3), zvsdk::RTNORM);
    EXPECT_EQ(ev("reg"), "((\"A\" . \"1\") (\"B\" . \"2\") (\"C\" . \"3\"))");
    EXPECT_EQ(ev("cauda"), "((\"A\" . \"2\") (\"B\" . \"3\"))");
    // Forgotten, then built anew at every length.
    lisp().forgetPairs();
    ASSERT_EQ(lisp().lispPutStringPairs("reg", um_par, 1), zvsdk::RTNORM);
    ASSERT_EQ(lisp().lispPutStringPairs("reg", outros_tres, 3), zvsdk::RTNORM);
    EXPECT_EQ(ev("reg"), "((\"C\" . \"1\") (\"A\" . \"2\") (\"B\" . \"3\"))");
    EXPECT_EQ(ev("cauda"), "((\"A\" . \"2\") (\"B\" . \"3\"))");
}

TEST_F(PositionChainsTest, PairsPublishedAgainAndAgainStayRightAfterTheListIsForgotten) {
    const QString a = "A", b = "B", um = "1", dois = "2";
    const zvsdk::StringPair dois_pares[] = {{&a, &um}, {&b, &dois}};
    const zvsdk::StringPair um_par[] = {{&b, &um}};
    ASSERT_EQ(lisp().lispPutStringPairs("reg", dois_pares, 2), zvsdk::RTNORM);
    EXPECT_EQ(ev("reg"), "((\"A\" . \"1\") (\"B\" . \"2\"))");
    ASSERT_EQ(lisp().lispPutStringPairs("reg", um_par, 1), zvsdk::RTNORM);
    EXPECT_EQ(ev("reg"), "((\"B\" . \"1\"))");
    // another symbol takes the list over; the first keeps its own
    ev("(setq guardado reg)");
    ASSERT_EQ(lisp().lispPutStringPairs("outro", dois_pares, 2), zvsdk::RTNORM);
    EXPECT_EQ(ev("guardado"), "((\"B\" . \"1\"))");
    EXPECT_EQ(ev("outro"), "((\"A\" . \"1\") (\"B\" . \"2\"))");
    lisp().forgetPairs();
    EXPECT_EQ(ev("outro"), "((\"A\" . \"1\") (\"B\" . \"2\"))");
    ASSERT_EQ(lisp().lispPutStringPairs("outro", um_par, 1), zvsdk::RTNORM);
    EXPECT_EQ(ev("outro"), "((\"B\" . \"1\"))");
    EXPECT_EQ(ev("reg"), "((\"B\" . \"1\"))");
    EXPECT_EQ(lisp().lispPutStringPairs("", um_par, 1), zvsdk::RTERROR);
    ASSERT_EQ(lisp().lispPutStringPairs("outro", um_par, 0), zvsdk::RTNORM);
    EXPECT_EQ(ev("outro"), "nil");
}

TEST_F(PositionChainsTest, AssocFindsAPublishedPairAsTheListWouldAnswer) {
    const QString a = "A", b = "B", bb = "BB", um = "1", dois = "2", tres = "3";
    const zvsdk::StringPair pares[] = {{&a, &um}, {&bb, &dois}, {&b, &dois}, {&b, &tres}};
    ASSERT_EQ(lisp().lispPutStringPairs("reg", pares, 4), zvsdk::RTNORM);
    EXPECT_EQ(ev("(assoc \"B\" reg)"), "(\"B\" . \"2\")") << "the first of two wins";
    EXPECT_EQ(ev("(cdr (assoc \"BB\" reg))"), "\"2\"");
    EXPECT_EQ(ev("(assoc \"b\" reg)"), "nil") << "keys are compared as spelt";
    EXPECT_EQ(ev("(assoc \"Z\" reg)"), "nil");
    EXPECT_EQ(ev("(assoc 'A reg)"), "nil") << "a symbol is no text";
    // what the key's expression does to the symbol comes first, as in any call
    EXPECT_EQ(ev("(assoc (progn (setq reg (list (cons \"A\" \"novo\"))) \"A\") reg)"),
              "(\"A\" . \"novo\")");
    ASSERT_EQ(lisp().lispPutStringPairs("reg", pares, 4), zvsdk::RTNORM);
    EXPECT_EQ(ev("(assoc \"A\" (cdr reg))"), "nil");
    EXPECT_EQ(ev("(eq reg reg)"), "T") << "read twice, the same list";
    EXPECT_EQ(ev("(eq (assoc \"A\" reg) (car reg))"), "T") << "a list read once is the one";
    // a function of the user's own under the name is the one called
    ev("(defun assoc (k l) \"meu\")");
    EXPECT_EQ(ev("(assoc \"A\" reg)"), "\"meu\"");
}

TEST_F(PositionChainsTest, WhatHoldsPublishedPairsWhenTheyAreSetAgainKeepsTheirTexts) {
    QString a = "A", um = "1", b = "B", dois = "2";
    const zvsdk::StringPair antigo[] = {{&a, &um}};
    const zvsdk::StringPair novo[] = {{&b, &dois}};
    // The module publishes again and drops the old texts while a function's binding holds
    // the earlier publication; the binding gives it back as it was.
    interpreter().define(
        "publica-de-novo",
        [&](zvlisp::Interpreter&, zvlisp::Args) {
            lisp().lispPutStringPairs("reg", novo, 1);
            a = "apagado", um = "apagado";
            return zvlisp::Value();
        },
        0, 0);
    ev("(defun com-reg (reg) (publica-de-novo) (cdr (assoc \"B\" reg)))");
    ASSERT_EQ(lisp().lispPutStringPairs("reg", antigo, 1), zvsdk::RTNORM);
    EXPECT_EQ(ev("(com-reg nil)"), "\"2\"");
    EXPECT_EQ(ev("reg"), "((\"A\" . \"1\"))");
    // Set by the module through a chain while a binding holds it: the same.
    a = "A", um = "1";
    ASSERT_EQ(lisp().lispPutStringPairs("reg", antigo, 1), zvsdk::RTNORM);
    interpreter().define(
        "limpa-reg",
        [&](zvlisp::Interpreter&, zvlisp::Args) {
            ResultBuffer* nil = zvsdk::newNode(zvsdk::RTNIL);
            lisp().lispPutSymbol("reg", nil);
            zvsdk::releaseChain(nil);
            a = "apagado", um = "apagado";
            return zvlisp::Value();
        },
        0, 0);
    ev("(defun com-reg-2 (/ reg) (limpa-reg) reg)");
    EXPECT_EQ(ev("(com-reg-2)"), "nil");
    EXPECT_EQ(ev("reg"), "((\"A\" . \"1\"))");
}

TEST_F(PositionChainsTest, PublishedPairsReadWholeThroughTheHostAndForgottenReadNil) {
    const QString a = "A", b = "B", um = "1", dois = "2";
    const zvsdk::StringPair pares[] = {{&a, &um}, {&b, &dois}};
    ASSERT_EQ(lisp().lispPutStringPairs("reg", pares, 2), zvsdk::RTNORM);
    ResultBuffer* value = nullptr;
    ASSERT_EQ(lisp().lispGetSymbol("reg", &value), zvsdk::RTNORM);
    EXPECT_EQ(value->restype, zvsdk::RTLB);
    std::vector<QString> texts;
    for (const ResultBuffer* n = value; n; n = n->rbnext)
        if (n->restype == zvsdk::RTSTR) texts.push_back(n->rstring);
    zvsdk::releaseChain(value);
    EXPECT_EQ(texts, (std::vector<QString>{"A", "1", "B", "2"}));
    EXPECT_EQ(ev("(vl-symbol-value 'reg)"), "((\"A\" . \"1\") (\"B\" . \"2\"))");
    // Forgotten before LISP read them (their texts may be gone): nil, not the old texts.
    ASSERT_EQ(lisp().lispPutStringPairs("reg", pares, 2), zvsdk::RTNORM);
    ev("(defun le-reg () reg)");
    lisp().forgetPairs();
    EXPECT_EQ(ev("(le-reg)"), "nil");
    EXPECT_EQ(ev("(assoc \"A\" reg)"), "nil");
}

}  // namespace
