// Items published to LISP one after another as `reg`, and the template filter evaluated for
// each: what LISP code sees of an item, what it keeps of an earlier one, and the filter
// read again when its text or its variables change.
#include "FacadeFixture.h"
#include "cad/CICad.h"
#include "lists/CETemplateLisp.h"
#include "readers/CEItemLista.h"

namespace {

class LispPublishingTest : public FacadeFixture {
protected:
    bool lisp(const QString& text) { return CICad::AvaliaLisp(text); }
    QString valor(const QString& expressao) {
        lisp("(setq publishing-test-value (vl-prin1-to-string " + expressao + "))");
        return CICad::GetStringLisp("publishing-test-value");
    }
    // The fields of an item as prin1 shows the association list, in the item's order.
    static QString comoLista(const CEItemLista& item) {
        QStringList pares;
        for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it)
            pares << "(\"" + it.key() + "\" . \"" + it.value() + "\")";
        return "(" + pares.join(' ') + ")";
    }
    static CEItemLista item(const QString& regua, int campos, const QString& marca) {
        CEItemLista novo;
        novo.definirCampo("REGUA", regua);
        for (int i = 0; i < campos; ++i)
            novo.definirCampo("CAMPO" + QString::number(i), marca + QString::number(i));
        return novo;
    }
};

}  // namespace

TEST_F(LispPublishingTest, EachPublishedItemShowsExactlyItsOwnFields) {
    // longer, shorter, longer again and empty: the list kept from the last item must
    // neither leave fields behind nor miss new ones
    const CEItemLista itens[] = {item("X1", 6, "a"), item("X2", 2, "b"), item("X3", 9, "c"),
                                 CEItemLista(), item("X4", 1, "")};
    for (const CEItemLista& i : itens) {
        i.paraLisp();
        EXPECT_EQ(valor("reg"), i.campos.isEmpty() ? "nil" : comoLista(i));
        EXPECT_EQ(valor("(length reg)"), QString::number(i.campos.size()));
        CEItemLista::limparLisp();
        EXPECT_EQ(valor("reg"), "nil");
    }
    // published twice in a row without clearing in between
    itens[0].paraLisp();
    itens[2].paraLisp();
    EXPECT_EQ(valor("reg"), comoLista(itens[2]));
    CEItemLista::limparLisp();
}

TEST_F(LispPublishingTest, WhatLispKeptOfAnEarlierItemStaysAsItWas) {
    const CEItemLista primeiro = item("X1", 4, "p");
    primeiro.paraLisp();
    lisp("(setq todo reg resto (cddr reg) par (car reg) texto (cdr (cadr reg)))");
    const QString todo = valor("todo"), resto = valor("resto");
    const QString par = valor("par"), texto = valor("texto");
    EXPECT_EQ(texto, "\"p0\"");
    CEItemLista::limparLisp();

    const CEItemLista segundo = item("X2", 4, "s");
    segundo.paraLisp();
    EXPECT_EQ(valor("reg"), comoLista(segundo));
    EXPECT_EQ(valor("todo"), todo);
    EXPECT_EQ(valor("resto"), resto);
    EXPECT_EQ(valor("par"), par);
    EXPECT_EQ(valor("texto"), texto);
    // parts of the list now published: a pair, a text, a tail
    lisp("(setq par (car reg) texto (cdr (cadr reg)) resto (cdddr reg) todo nil)");
    const QString par2 = valor("par"), texto2 = valor("texto"), resto2 = valor("resto");
    EXPECT_EQ(texto2, "\"s0\"");
    CEItemLista::limparLisp();

    // only parts kept: the rest of the list is filled again, the parts stay
    const CEItemLista terceiro = item("X3", 4, "t");
    terceiro.paraLisp();
    EXPECT_EQ(valor("reg"), comoLista(terceiro));
    EXPECT_EQ(valor("par"), par2);
    EXPECT_EQ(valor("texto"), texto2);
    EXPECT_EQ(valor("resto"), resto2);
    CEItemLista::limparLisp();
}

TEST_F(LispPublishingTest, AFilterAndARowFunctionSeeTheSameFields) {
    CETemplateLisp modelo(arquivo("lista.grt"));
    const CEItemLista itemA = item("X1", 5, "f");
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(progn (setq visto (vl-prin1-to-string reg)) T)");
    EXPECT_TRUE(modelo.FiltraItem(itemA));
    EXPECT_EQ(CICad::GetStringLisp("visto"), comoLista(itemA));
    EXPECT_EQ(valor("reg"), "nil");  // cleared after the filter
    // a row function reads the same `reg` the same way
    itemA.paraLisp();
    lisp("(defun funcao-linha () (vl-prin1-to-string reg))");
    EXPECT_EQ(CICad::zvInvokeString("funcao-linha"), comoLista(itemA));
    CEItemLista::limparLisp();
}

TEST_F(LispPublishingTest, TheFilterFollowsItsTextAndItsVariables) {
    CETemplateLisp modelo(arquivo("lista.grt"));
    const CEItemLista x1 = item("X1", 2, "v"), x2 = item("X2", 2, "v");
    // no filter: everything passes
    EXPECT_TRUE(modelo.FiltraItem(x1));
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(= (cdr (assoc \"REGUA\" reg)) alvo)");
    lisp("(setq alvo \"X1\")");
    EXPECT_TRUE(modelo.FiltraItem(x1));
    EXPECT_FALSE(modelo.FiltraItem(x2));
    // the same text read once sees the variable's new value
    lisp("(setq alvo \"X2\")");
    EXPECT_FALSE(modelo.FiltraItem(x1));
    EXPECT_TRUE(modelo.FiltraItem(x2));
    // a new text between runs takes over
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(/= (cdr (assoc \"REGUA\" reg)) \"X1\")");
    EXPECT_FALSE(modelo.FiltraItem(x1));
    EXPECT_TRUE(modelo.FiltraItem(x2));
    // 0 and "" pass, nil does not
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(if (= (cdr (assoc \"REGUA\" reg)) \"X1\") 0)");
    EXPECT_TRUE(modelo.FiltraItem(x1));
    EXPECT_FALSE(modelo.FiltraItem(x2));
}

TEST_F(LispPublishingTest, AFailingFilterIsReportedAndLeavesTheLastAnswer) {
    CETemplateLisp modelo(arquivo("lista.grt"));
    const CEItemLista x1 = item("X1", 2, "e");
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(car (cdr (assoc \"REGUA\" reg)))");
    // the answer of the expression never made: the symbol keeps what it had
    lisp("(setq INVOKELISP_LISTAS_TMP nil)");
    EXPECT_FALSE(modelo.FiltraItem(x1));
    EXPECT_TRUE(saida().contains("; error: bad argument type: consp \"X1\"\n"));
    lisp("(setq INVOKELISP_LISTAS_TMP T)");
    EXPECT_TRUE(modelo.FiltraItem(x1));
    EXPECT_EQ(valor("reg"), "nil");
    // a text that does not read is reported too, and nothing passes on it
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(= 1");
    lisp("(setq INVOKELISP_LISTAS_TMP nil)");
    EXPECT_FALSE(modelo.FiltraItem(x1));
    EXPECT_TRUE(saida().contains("; error: malformed list on input"));
}

// The filter sees the item's own fields, whatever the items before it held: a filter on a
// field, on an accessory's fields, on a field the item lacks; and names new to the program
// between two items.
TEST_F(LispPublishingTest, TheFilterSeesEachItemsOwnFieldsByName) {
    CETemplateLisp modelo(arquivo("lista.grt"));
    CEItemLista componente = item("X1", 3, "c");
    componente.definirCampo("ZV_KEY", "A1");
    CEItemLista acessorio;
    acessorio.definirCampo("ZV_LISTA_TIPO", "ACE");
    acessorio.definirCampo("ZV_KEY", "B3");
    acessorio.definirCampo("QTD", "2");
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(= (cdr (assoc \"ZV_KEY\" reg)) \"A1\")");
    EXPECT_TRUE(modelo.FiltraItem(componente));
    EXPECT_FALSE(modelo.FiltraItem(acessorio));
    CICad::SetStringLisp("*FILTRO_TEMPLATE*",
                         "(and (= (cdr (assoc \"ZV_LISTA_TIPO\" reg)) \"ACE\") "
                         "(> (atoi (cdr (assoc \"QTD\" reg))) 1))");
    EXPECT_FALSE(modelo.FiltraItem(componente));
    EXPECT_TRUE(modelo.FiltraItem(acessorio));
    // a field the item lacks is no pair of `reg`, also after an item that had it
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(null (assoc \"REGUA\" reg))");
    EXPECT_FALSE(modelo.FiltraItem(componente));
    EXPECT_TRUE(modelo.FiltraItem(acessorio));
    EXPECT_FALSE(modelo.FiltraItem(componente));
    // Many names new to the program between two items: the newest item's names are its own.
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(progn (setq visto (vl-prin1-to-string reg)) T)");
    EXPECT_TRUE(modelo.FiltraItem(componente));
    const QString marca = QString::number(quintptr(this), 16);
    CEItemLista novo;
    for (int i = 0; i < 2000; ++i)
        novo.definirCampo("NOVO_" + marca + "_" + QString::number(i), QString::number(i));
    EXPECT_TRUE(modelo.FiltraItem(novo));
    EXPECT_EQ(CICad::GetStringLisp("visto"), comoLista(novo));
    EXPECT_TRUE(modelo.FiltraItem(componente));
    EXPECT_EQ(CICad::GetStringLisp("visto"), comoLista(componente));
}

// A filter that reads the item only through fields it names answers alike for the same values
// of those fields, and leaves in LISP what an evaluation leaves: its answer and the item's
// entity, with `reg` cleared. Absent and empty fields, and values that join alike, are apart;
// a name first met after the filter was read counts; a failing filter fails each time.
TEST_F(LispPublishingTest, AFilterOverNamedFieldsAnswersAlikeForTheSameValues) {
    CETemplateLisp modelo(arquivo("lista.grt"));
    const auto entidade = [this](double x) {
        return OdDbObjectId(&db(), db().modelSpace()->addLine({x, 0, 0}, {x, 5, 0})->handle());
    };
    CEItemLista a = item("X1", 1, "a"), b = item("X2", 1, "b"), c = item("X1", 1, "c");
    a.ids.push_back(entidade(1));
    b.ids.push_back(entidade(2));
    c.ids.push_back(entidade(3));
    const auto deixado = [this](const CEItemLista& i) {
        EXPECT_EQ(valor("reg"), "nil");
        EXPECT_EQ(valor("(cdr (assoc -1 (entget ename)))"),
                  valor("(handent \"" + QString::number(i.ids.front().handle(), 16) + "\")"));
    };
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(= (cdr (assoc \"REGUA\" reg)) \"X1\")");
    for (int vez = 0; vez < 2; ++vez) {
        EXPECT_TRUE(modelo.FiltraItem(a));
        EXPECT_EQ(valor("INVOKELISP_LISTAS_TMP"), "T");
        deixado(a);
        EXPECT_FALSE(modelo.FiltraItem(b));
        EXPECT_EQ(valor("INVOKELISP_LISTAS_TMP"), "nil");
        deixado(b);
        EXPECT_TRUE(modelo.FiltraItem(c));  // the same REGUA as a, the rest apart
        EXPECT_EQ(valor("INVOKELISP_LISTAS_TMP"), "T");
        deixado(c);
    }
    // A text answer.
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(cdr (assoc \"REGUA\" reg))");
    for (int vez = 0; vez < 2; ++vez) {
        EXPECT_TRUE(modelo.FiltraItem(b));
        EXPECT_EQ(valor("INVOKELISP_LISTAS_TMP"), "\"X2\"");
        EXPECT_TRUE(modelo.FiltraItem(a));
        EXPECT_EQ(valor("INVOKELISP_LISTAS_TMP"), "\"X1\"");
    }
    // An empty field is no absent one.
    CEItemLista vazio, sem;
    vazio.definirCampo("REGUA", "");
    sem.definirCampo("OUTRO", "");
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(null (assoc \"REGUA\" reg))");
    for (int vez = 0; vez < 2; ++vez) {
        EXPECT_FALSE(modelo.FiltraItem(vazio));
        EXPECT_TRUE(modelo.FiltraItem(sem));
    }
    // Two fields whose values join alike, whatever marks the key puts between them.
    CEItemLista ab, a_b;
    ab.definirCampo("PF_P", QString("A") + QChar(1));
    ab.definirCampo("PF_Q", "B");
    a_b.definirCampo("PF_P", "A");
    a_b.definirCampo("PF_Q", QString(QChar(1)) + "B");
    CICad::SetStringLisp("*FILTRO_TEMPLATE*",
                         "(and (assoc \"PF_P\" reg) (= (cdr (assoc \"PF_Q\" reg)) \"B\"))");
    for (int vez = 0; vez < 2; ++vez) {
        EXPECT_TRUE(modelo.FiltraItem(ab));
        EXPECT_FALSE(modelo.FiltraItem(a_b));
    }
    // A name no item had when the filter was read.
    const QString novo = "PF_NOVO_" + QString::number(quintptr(this), 16);
    ASSERT_EQ(CamposItem::numeroSeHouver(novo), CamposItem::kSemNome);
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(assoc \"" + novo + "\" reg)");
    EXPECT_FALSE(modelo.FiltraItem(a));
    CEItemLista comNovo = a;
    comNovo.definirCampo(novo, "1");
    EXPECT_TRUE(modelo.FiltraItem(comNovo));
    EXPECT_FALSE(modelo.FiltraItem(a));
    // A failing filter is evaluated, and reported, each time.
    CICad::SetStringLisp("*FILTRO_TEMPLATE*", "(car (cdr (assoc \"REGUA\" reg)))");
    const QString erro = "; error: bad argument type: consp \"X1\"\n";
    const int antes = saida().count(erro);
    lisp("(setq INVOKELISP_LISTAS_TMP nil)");
    EXPECT_FALSE(modelo.FiltraItem(a));
    lisp("(setq INVOKELISP_LISTAS_TMP T)");
    EXPECT_TRUE(modelo.FiltraItem(a));
    EXPECT_EQ(saida().count(erro), antes + 2);
}
