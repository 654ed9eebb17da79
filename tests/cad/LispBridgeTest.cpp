// The module's LISP bridge (CICad) over the host's document LISP: symbols read and
// written through result-buffer chains, calls, evaluation with the item published, and
// the stale value of INVOKELISP_LISTAS_TMP after a failed expression.
#include "FacadeFixture.h"
#include "app/DocumentLisp.h"
#include "cad/CICad.h"
#include "readers/CEItemLista.h"
#include "readers/SelecaoPaginas.h"
#include "sdk/LispInterface.h"

#include <QFile>

namespace {

class LispBridgeTest : public FacadeFixture {
protected:
    bool lisp(const QString& text) { return CICad::AvaliaLisp(text); }
    // The value of an expression as prin1 shows it.
    QString valor(const QString& expressao) {
        lisp("(setq bridge-test-value (vl-prin1-to-string " + expressao + "))");
        return CICad::GetStringLisp("bridge-test-value");
    }
};

}  // namespace

TEST_F(LispBridgeTest, NilSymbolReadsEmptyButAMissingOneGivesTheDefault) {
    lisp("(setq vazio nil texto \"abc\" numero 5)");
    EXPECT_EQ(CICad::GetStringLisp("vazio", "padrao"), "");
    EXPECT_EQ(CICad::GetStringLisp("nunca-definido", "padrao"), "padrao");
    EXPECT_EQ(CICad::GetStringLisp("TEXTO", "padrao"), "abc");
    EXPECT_EQ(CICad::GetStringLisp("numero", "padrao"), "");
    zvsdk::ResultBuffer* chain = nullptr;
    EXPECT_EQ(documento_->lisp()->lispGetSymbol("vazio", &chain), zvsdk::RTNORM);
    ASSERT_NE(chain, nullptr);
    EXPECT_EQ(chain->restype, zvsdk::RTNIL);
    zvsdk::releaseChain(chain);
    EXPECT_EQ(documento_->lisp()->lispGetSymbol("nunca-definido", &chain), zvsdk::RTERROR);
    EXPECT_EQ(chain, nullptr);
}

TEST_F(LispBridgeTest, IntegersTravelAs16BitsOr32Bits) {
    CICad::SetIntLisp("curto", 70000);
    EXPECT_EQ(valor("curto"), "4464");  // truncated to 16 bits
    EXPECT_EQ(CICad::GetIntLisp("curto", -1), 4464);
    lisp("(setq grande 40000 negativo -5)");
    EXPECT_EQ(CICad::GetIntLisp("grande", -1), -1);  // a 32-bit value gives the default
    EXPECT_EQ(CICad::GetIntLisp("negativo", -1), -5);
    EXPECT_DOUBLE_EQ(CICad::GetRealLisp("negativo", 0.5), -5.0);
    EXPECT_DOUBLE_EQ(CICad::GetRealLisp("grande", 0.5), 0.5);
    CICad::SetRealLisp("real", 2.25);
    EXPECT_EQ(valor("(* real 2)"), "4.5");
    EXPECT_DOUBLE_EQ(CICad::GetRealLisp("real", 0.0), 2.25);
}

TEST_F(LispBridgeTest, AnythingButNilIsTrue) {
    lisp("(setq zero 0 falso nil vazio \"\")");
    EXPECT_TRUE(CICad::GetBoolLisp("zero"));
    EXPECT_TRUE(CICad::GetBoolLisp("vazio"));
    EXPECT_FALSE(CICad::GetBoolLisp("falso"));
    EXPECT_FALSE(CICad::GetBoolLisp("nunca-definido"));
    EXPECT_FALSE(CICad::GetBoolLisp("zero", nullptr));
}

TEST_F(LispBridgeTest, ListsFlattenToTheirStrings) {
    lisp("(setq pares '((\"A\" . \"1\") (\"B\" . \"2\")) misto '(\"x\" 1 (\"y\" (\"z\")) 2.5))");
    EXPECT_EQ(CICad::GetListaLisp("pares"), QStringList({"A", "1", "B", "2"}));
    EXPECT_EQ(CICad::GetListaLisp("misto"), QStringList({"x", "y", "z"}));
    EXPECT_TRUE(CICad::GetListaLisp("nunca-definido").isEmpty());
    CICad::SetListaLisp("lista", {"um", "dois"});
    EXPECT_EQ(valor("lista"), "(\"um\" \"dois\")");
    CICad::SetStringLisp("s", "ação");
    EXPECT_EQ(valor("(strlen s)"), "4");
    CICad::SetNilLisp("s");
    EXPECT_EQ(valor("s"), "nil");
    EXPECT_EQ(CICad::GetStringLisp("s", "padrao"), "");
}

TEST_F(LispBridgeTest, ChainsConvertBothWays) {
    lisp("(setq ponto '(1.0 2 3) inteiros '(1 2 3) par '(\"K\" . \"V\") sim t)");
    zvsdk::ResultBuffer* chain = CICad::LeSimboloLisp("ponto");
    ASSERT_NE(chain, nullptr);
    EXPECT_EQ(chain->restype, zvsdk::RT3DPOINT);
    EXPECT_DOUBLE_EQ(chain->rpoint[2], 3.0);
    CICad::LiberaLista(chain);
    chain = CICad::LeSimboloLisp("inteiros");
    EXPECT_TRUE(CICad::PadraoDaLista(chain, {zvsdk::RTLB, zvsdk::RTSHORT, zvsdk::RTSHORT}));
    CICad::LiberaLista(chain);
    chain = CICad::LeSimboloLisp("par");
    EXPECT_TRUE(CICad::PadraoDaLista(
        chain, {zvsdk::RTLB, zvsdk::RTSTR, zvsdk::RTDOTE, zvsdk::RTSTR, zvsdk::RTLE}));
    CICad::SetChainLisp("copia", chain);
    CICad::LiberaLista(chain);
    EXPECT_EQ(valor("copia"), "(\"K\" . \"V\")");
    chain = CICad::LeSimboloLisp("sim");
    EXPECT_EQ(chain->restype, zvsdk::RTT);
    CICad::LiberaLista(chain);

    zvsdk::ResultBuffer* entrada = zvsdk::newPoint(4, 5, 0);
    entrada->rbnext = zvsdk::newLong(100000);
    entrada->rbnext->rbnext = zvsdk::newEntity({&db(), 0x2A});
    CICad::SetChainLisp("varios", entrada);
    zvsdk::releaseChain(entrada);
    EXPECT_EQ(valor("(list (car varios) (cadr varios) (type (caddr varios)))"),
              "((4.0 5.0) 100000 ENAME)");
}

TEST_F(LispBridgeTest, InvokeFamilies) {
    lisp("(defun junta (a b) (strcat a \"-\" b))");
    lisp("(defun conta (s) (strlen s)) (defun grande () 100000) (defun nada () nil)");
    lisp("(defun lista () (list \"a\" 70000 2.5 '(1.0 2.0 3.0)))");
    EXPECT_EQ(CICad::zvInvokeString("junta", {"X1", "12"}), "X1-12");
    EXPECT_EQ(CICad::zvInvokeString("conta", {"abc"}), "");  // not a string
    EXPECT_EQ(CICad::zvInvokeInt("conta", {"abcd"}), 4);
    EXPECT_EQ(CICad::zvInvokeInt("grande"), 100000);
    EXPECT_FALSE(CICad::zvInvokeBool("nada"));
    EXPECT_TRUE(CICad::zvInvokeBool("conta", {""}));
    zvsdk::ResultBuffer* resultado = CICad::zvInvokeLista("lista");
    EXPECT_EQ(CICad::StringDaLista(resultado, 1), "a");
    EXPECT_EQ(CICad::IntDaLista(resultado, 2), 70000);
    EXPECT_DOUBLE_EQ(CICad::RealDaLista(resultado, 3), 2.5);
    EXPECT_EQ(CICad::NoDaLista(resultado, 4)->restype, zvsdk::RT3DPOINT);
    CICad::LiberaLista(resultado);
    // An unknown function answers null quietly (the product's optional functions); a
    // failing call answers null and says why on the command line.
    EXPECT_EQ(CICad::zvInvokeLista("naoexiste"), nullptr);
    EXPECT_FALSE(saida().contains("NAOEXISTE"));
    EXPECT_EQ(CICad::zvInvokeLista("junta", {"so-um"}), nullptr);
    EXPECT_TRUE(saida().contains("; error: too few arguments\n"));
}

TEST_F(LispBridgeTest, ItemEvaluationKeepsTheStaleValueAfterAFailure) {
    CEItemLista item;
    item.definirCampo("REGUA", "X1");
    item.definirCampo("NUMERO", "12");
    item.ids.push_back(OdDbObjectId(&db(), 0x2A));
    item.paraLisp();
    const QString tmp = "(progn (setq INVOKELISP_LISTAS_TMP %1 ) (princ))";
    EXPECT_TRUE(
        lisp(tmp.arg("(strcat (cdr (assoc \"REGUA\" reg)) \":\" (cdr (assoc \"NUMERO\" reg)))")));
    EXPECT_EQ(CICad::GetStringLisp("INVOKELISP_LISTAS_TMP"), "X1:12");
    EXPECT_EQ(valor("(type ename)"), "ENAME");
    EXPECT_FALSE(lisp(tmp.arg("(car (cdr (assoc \"REGUA\" reg)))")));
    EXPECT_TRUE(saida().contains("; error: bad argument type: consp \"X1\"\n"));
    EXPECT_EQ(CICad::GetStringLisp("INVOKELISP_LISTAS_TMP"), "X1:12");  // stale, as before

    CEItemLista semObjeto;
    semObjeto.definirCampo("REGUA", "X2");
    semObjeto.paraLisp();
    EXPECT_EQ(valor("(list (cdr (assoc \"REGUA\" reg)) (type ename))"), "(\"X2\" ENAME)");
    CEItemLista::limparLisp();
    EXPECT_EQ(valor("reg"), "nil");
}

// A host without its own way to take string pairs gets them through a chain.
class ChainOnlyLisp : public zvsdk::LispInterface {
public:
    explicit ChainOnlyLisp(zvsdk::LispInterface& host) : host_(host) {}
    int lispGetSymbol(const QString& n, zvsdk::ResultBuffer** v) override {
        return host_.lispGetSymbol(n, v);
    }
    int lispPutSymbol(const QString& n, const zvsdk::ResultBuffer* v) override {
        return host_.lispPutSymbol(n, v);
    }
    zvsdk::ResultBuffer* lispInvoke(const zvsdk::ResultBuffer* c) override {
        return host_.lispInvoke(c);
    }
    bool lispEvaluate(const QString& t) override { return host_.lispEvaluate(t); }

private:
    zvsdk::LispInterface& host_;
};

TEST_F(LispBridgeTest, StringPairsGiveTheSameListDirectlyAndThroughAChain) {
    const QString chaves[] = {"REGUA", "NUMERO", "VAZIO", "ASPAS"};
    const QString valores[] = {"X1", "12", "", "a \"b\" \\ c"};
    std::vector<zvsdk::StringPair> pares;
    for (int i = 0; i < 4; ++i)
        pares.push_back({&chaves[i], &valores[i]});
    const QString esperado =
        "((\"REGUA\" . \"X1\") (\"NUMERO\" . \"12\") (\"VAZIO\" . \"\") "
        "(\"ASPAS\" . \"a \\\"b\\\" \\\\ c\"))";

    CICad::SetParesLisp("direto", pares);
    EXPECT_EQ(valor("direto"), esperado);
    ChainOnlyLisp soCadeias(*documento_->lisp());
    EXPECT_EQ(soCadeias.lispPutStringPairs("cadeia", pares.data(), int(pares.size())),
              zvsdk::RTNORM);
    EXPECT_EQ(valor("cadeia"), esperado);
    // No pairs make nil, and an unnamed symbol is refused.
    CICad::SetParesLisp("direto", {});
    EXPECT_EQ(valor("direto"), "nil");
    EXPECT_EQ(documento_->lisp()->lispPutStringPairs("", pares.data(), 1), zvsdk::RTERROR);
}

// The first node the host gives without a chain is the chain's first node, for every kind
// of value; a host that only makes chains gives the same.
TEST_F(LispBridgeTest, TheFirstNodeOfASymbolIsTheChainsFirstNode) {
    lisp(
        "(setq n0 nil n1 \"abc\" n2 5 n3 40000 n4 -32768 n5 32768 n6 2.25 n7 T n8 'abc "
        "n9 (list 1 \"b\") n10 \"\")");
    CEItemLista item;
    item.definirCampo("REGUA", "X2");
    item.paraLisp();  // `reg`, published as pairs and made into a list when read
    ChainOnlyLisp soCadeias(*documento_->lisp());
    QStringList nomes{"reg", "nunca-definido"};
    for (int i = 0; i <= 10; ++i)
        nomes << "n" + QString::number(i);
    for (const QString& nome : nomes) {
        SCOPED_TRACE(nome.toStdString());
        zvsdk::ResultBuffer* cadeia = nullptr;
        const int esperado = documento_->lisp()->lispGetSymbol(nome, &cadeia);
        for (zvsdk::LispInterface* lisp : {documento_->lisp(), (zvsdk::LispInterface*)&soCadeias}) {
            zvsdk::ResultBuffer primeiro;
            ASSERT_EQ(lisp->lispGetSymbolFirst(nome, primeiro), esperado);
            if (esperado != zvsdk::RTNORM) continue;
            ASSERT_NE(cadeia, nullptr);
            EXPECT_EQ(primeiro.rbnext, nullptr);
            EXPECT_EQ(primeiro.restype, cadeia->restype);
            EXPECT_EQ(primeiro.rstring, cadeia->rstring);
            if (cadeia->restype == zvsdk::RTSHORT) {
                EXPECT_EQ(primeiro.rint, cadeia->rint);
            }
            if (cadeia->restype == zvsdk::RTLONG) {
                EXPECT_EQ(primeiro.rlong, cadeia->rlong);
            }
            if (cadeia->restype == zvsdk::RTREAL) {
                EXPECT_EQ(primeiro.rreal, cadeia->rreal);
            }
        }
        zvsdk::releaseChain(cadeia);
    }
    CEItemLista::limparLisp();
    EXPECT_EQ(CICad::TipoSimboloLisp("n9"), zvsdk::RTLB);
    EXPECT_EQ(CICad::TipoSimboloLisp("n0"), zvsdk::RTNIL);
    EXPECT_EQ(CICad::TipoSimboloLisp("n7"), zvsdk::RTT);
    EXPECT_EQ(CICad::TipoSimboloLisp("nunca-definido"), zvsdk::RTNONE);
    EXPECT_EQ(CICad::GetStringLisp("n8"), "ABC");  // a symbol reads as its name
    EXPECT_DOUBLE_EQ(CICad::GetRealLisp("n6"), 2.25);
}

TEST_F(LispBridgeTest, HostCodeRegistersFunctionsThatUserCodeCanReplace) {
    auto* documentLisp = dynamic_cast<zvhost::DocumentLisp*>(documento_->lisp());
    ASSERT_NE(documentLisp, nullptr);
    documentLisp->interpreter().define(
        "zvDobro",
        [](zvlisp::Interpreter& in, zvlisp::Args a) {
            return zvlisp::Value::integer(2 * in.toInt(a[0]));
        },
        1, 1);
    EXPECT_EQ(valor("(zvdobro 21)"), "42");
    lisp("(defun zvDobro (x) (* x 3))");
    EXPECT_EQ(valor("(zvdobro 21)"), "63");
}

TEST_F(LispBridgeTest, FileDialogFiltersAndLog) {
    EXPECT_EQ(CICad::ConverteFiltro("Templates|*.grt|All files (*.*)|*.*"),
              "Templates( *.grt );;All files (*.*);;");
    dynamic_cast<zvhost::ConsoleUserInterface*>(app_->userInterface())
        ->setAnswer("template", "C:/ZV/lists/x.grt");
    EXPECT_EQ(CICad::DialogoArquivo(true, "Templates|*.grt", "C:\\ZV", "Title", "template"),
              "C:\\ZV\\lists\\x.grt");
    QFile log(CICad::ArquivoLog());
    ASSERT_TRUE(log.open(QIODevice::ReadOnly));
    const QString text = QString::fromUtf8(log.readAll());
    EXPECT_TRUE(text.contains("OPEN file dialog, filter=Templates|*.grt, path=C:\\ZV"));
    EXPECT_TRUE(text.contains("File dialog result: C:/ZV/lists/x.grt"));
}

TEST_F(LispBridgeTest, PagePickerAnswersNoPageOrThePagesInOrder) {
    lisp("(criarpagina \"ESQ\" 0)");
    lisp("(criarpagina \"ESQ\" 0)");
    auto* ui = dynamic_cast<zvhost::ConsoleUserInterface*>(app_->userInterface());
    std::optional<QStringList> paginas;
    // Cancelled: an empty list, which reads no page, not the absence of a list.
    EXPECT_EQ(SelecionaPaginas(false, paginas), 0);
    ASSERT_TRUE(paginas.has_value());
    EXPECT_TRUE(paginas->isEmpty());
    ui->setAnswer("pages", "ESQ$0002$A;ESQ$0001$A");
    EXPECT_EQ(SelecionaPaginas(true, paginas), 0);
    EXPECT_EQ(*paginas, QStringList({"ESQ$0002$A", "ESQ$0001$A"}));
    EXPECT_EQ(valor("pblTmpSelPags"), "(\"ESQ$0002$A\" \"ESQ$0001$A\")");
}

TEST(SelecaoPaginasSemDesenho, NoActiveDrawingLeavesTheListAlone) {
    std::optional<QStringList> paginas = QStringList{"X"};
    EXPECT_EQ(SelecionaPaginas(false, paginas), 2);
    EXPECT_EQ(*paginas, QStringList{"X"});
}
