// The reading of a symbol into an item's fields: attributes, constants, key, catalogue data,
// circuit, position and layer, and what the reader keeps of them for the run following a
// change of the drawing, of the symbol's key or of the catalogue.
#include "ReaderFixture.h"
#include "lists/TemplateDouble.h"
#include "readers/CEAtributo.h"
#include "readers/LeitorBase.h"
#include "readers/ZVString.h"
#include "sample/XDataItems.h"

#include <QSet>

#include <functional>
#include <memory>
#include <string_view>

namespace {

class BlockReadingTest : public ReaderFixture {
protected:
    void SetUp() override {
        ReaderFixture::SetUp();
        // The position shows the point it was asked at.
        ASSERT_TRUE(
            lisp("(defun BuscarCoordenadas (e g p x y) (strcat g \"/\" p \":\" "
                 "(rtos x 2 1) \";\" (rtos y 2 1)))"));
    }
    bool lisp(const QString& texto) { return CICad::AvaliaLisp(texto); }
    // Positions answer `resposta` and are counted from now: the function tells how many.
    std::function<int()> ContaPosicoes(const QString& resposta) {
        EXPECT_TRUE(
            lisp("(progn (setq posicoes 0) (defun BuscarCoordenadas (e g p x y) "
                 "(setq posicoes (1+ posicoes)) \"" +
                 resposta + "\"))"));
        return [] { return CICad::GetIntLisp("posicoes", -1); };
    }
    QString handle(const OdDbObjectId& id) { return ZVString::DeHandle(id.handle()); }
    zvdb::BlockReference* ref(const OdDbObjectId& id) {
        return dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(id.handle()));
    }
    CEItemLista Le(CCDataReader& leitor, const OdDbObjectId& id, const QString& sufixo = {}) {
        CEItemLista item;
        leitor.LeBloco(sufixo, item, id, nullptr);
        return item;
    }
};

}  // namespace

TEST_F(BlockReadingTest, ASymbolGivesItsAttributesKeyCatalogueDataPlaceAndLayer) {
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A",
                                   {{" REGUA ", " X1 "}, {"NUMERO", "5"}, {"QTD", "3"}}, 40);
    zvdb::BlockRecord* definicao = db().block("NA-1");
    definicao->addAttributeDefinition("NUMERO", "n", "C9", {0, 0, 0}, 2.5)
        ->setInteger(70, 2, "AcDbAttributeDefinition");
    LeitorBase leitor;
    const CEItemLista item = Le(leitor, k);
    // tags and values trimmed; a constant of the block wins over the attribute of its tag
    EXPECT_EQ(item.valorCampo("REGUA"), "X1");
    EXPECT_EQ(item.valorCampo("NUMERO"), "C9");
    EXPECT_EQ(item.valorCampo("QTD"), "3");
    EXPECT_EQ(item.valorCampo("HANDLE"), handle(k));
    EXPECT_EQ(item.valorCampo("ZV_KEY"), "A1");
    EXPECT_EQ(item.valorCampo("ZV_LISTA"), "S");
    EXPECT_EQ(item.valorCampo("DESCRICAO"), "Owner");
    EXPECT_EQ(item.valorCampo("TP_DESCRI"), "Owner");
    EXPECT_EQ(item.valorCampo("POSICAO"), "ESQ/0001:40.0;0.0");
    EXPECT_EQ(item.valorCampo("LAYER"), "ESQ$0001$A");
    EXPECT_EQ(item.valorCampo("GRUPO"), "ESQ");
    EXPECT_EQ(item.valorCampo("PAGINA"), "0001");
    EXPECT_EQ(item.valorCampo("ORIENTACAO"), "0");
    EXPECT_TRUE(item.temCampo("PAINEL"));
    EXPECT_TRUE(item.temCampo("SAP_MATERIAL"));
    EXPECT_FALSE(item.temCampo("LAYOUTPOSITIONX"));
    // Under a suffix: the same fields, renamed, and a QTD the item had stays unless empty.
    CEItemLista lado;
    lado.definirCampo("QTD_INI", "7");
    leitor.LeBloco("_INI", lado, k, nullptr);
    EXPECT_EQ(lado.valorCampo("REGUA_INI"), "X1");
    EXPECT_EQ(lado.valorCampo("QTD_INI"), "3");
    EXPECT_FALSE(lado.temCampo("REGUA"));
    const OdDbObjectId sem = Simbolo("NA-1", "B3", "OUTRO", {{"QTD", ""}});
    CEItemLista semQtd;
    leitor.LeBloco("_FIM", semQtd, sem, nullptr);
    EXPECT_EQ(semQtd.valorCampo("QTD_FIM"), "1");
    EXPECT_EQ(semQtd.valorCampo("POSICAO_FIM"), "??");  // no page: no position asked
    EXPECT_EQ(semQtd.valorCampo("GRUPO_FIM"), "");
    EXPECT_EQ(semQtd.valorCampo("DESCRICAO_FIM"), "Three of them");
}

TEST_F(BlockReadingTest, AttributesChangedInLispAreReadAgain) {
    const OdDbObjectId k =
        Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}, {"LIGACAO1", "A1"}});
    const OdDbObjectId q =
        Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}, {"LIGACAO1", "A1"}});
    LeitorBase leitor;
    EXPECT_EQ(Le(leitor, k).valorCampo("REGUA"), "X1");
    // the first attribute of k gets a new value through LISP; q keeps the old one
    ASSERT_TRUE(lisp("(setq ea (entget (entnext (handent \"" + handle(k) +
                     "\")))) (entmod (subst (cons 1 \" X7 \") (assoc 1 ea) ea))"));
    EXPECT_EQ(Le(leitor, k).valorCampo("REGUA"), "X7");
    EXPECT_EQ(Le(leitor, q).valorCampo("REGUA"), "X1");
    // a tag renamed becomes another field
    ASSERT_TRUE(lisp("(setq ea (entget (entnext (handent \"" + handle(q) +
                     "\")))) (entmod (subst (cons 2 \"BORNE\") (assoc 2 ea) ea))"));
    const CEItemLista renomeado = Le(leitor, q);
    EXPECT_FALSE(renomeado.temCampo("REGUA"));
    EXPECT_EQ(renomeado.valorCampo("BORNE"), "X1");
    // The connection attribute of the symbol just read, changed before it is asked for.
    Le(leitor, k);
    ref(k)->attribute("LIGACAO1")->setTextValue("B2");
    const std::unique_ptr<zv::CEAtributo> ligacao = leitor.AtributoConexaoProximo(k, {0, 0, 0});
    ASSERT_TRUE(ligacao);
    EXPECT_EQ(ligacao->GetValor(), "B2");
}

TEST_F(BlockReadingTest, TheConnectionAttributesOfTheSymbolJustReadAreCopiedWhole) {
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A",
                                   {{"REGUA", "X1"}, {" ligacao1 ", " A1 "}, {"CONEXION2", "A2"}});
    ref(k)->attribute("CONEXION2")->setInteger(70, 1, "AcDbAttribute");
    LeitorBase leitor;
    Le(leitor, k);
    // attributes placed at y -2, -4 and -6
    const std::unique_ptr<zv::CEAtributo> primeira = leitor.AtributoConexaoProximo(k, {0, -4, 0});
    ASSERT_TRUE(primeira);
    EXPECT_EQ(primeira->GetTag(), "ligacao1");
    EXPECT_EQ(primeira->GetValor(), "A1");
    EXPECT_FALSE(primeira->IsInvisivel());
    const std::unique_ptr<zv::CEAtributo> segunda = leitor.AtributoConexaoProximo(k, {0, -7, 0});
    ASSERT_TRUE(segunda);
    EXPECT_EQ(segunda->GetTag(), "CONEXION2");
    EXPECT_TRUE(segunda->IsInvisivel());
    EXPECT_FALSE(segunda->GetId().isNull());
    EXPECT_EQ(segunda->GetId(), OdDbObjectId(&db(), ref(k)->attribute("CONEXION2")->handle()));
}

TEST_F(BlockReadingTest, AMovedSymbolIsAskedItsPositionAtItsNewPoint) {
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A", {}, 10);
    LeitorBase leitor;
    EXPECT_EQ(Le(leitor, k).valorCampo("POSICAO"), "ESQ/0001:10.0;0.0");
    ASSERT_TRUE(lisp("(setq e (entget (handent \"" + handle(k) +
                     "\"))) (entmod (subst '(10 25.0 30.0 0.0) (assoc 10 e) e))"));
    EXPECT_EQ(Le(leitor, k).valorCampo("POSICAO"), "ESQ/0001:25.0;30.0");
    // moved to another page
    db().createLayer("ESQ$0002$A");
    ASSERT_TRUE(lisp("(setq e (entget (handent \"" + handle(k) +
                     "\"))) (entmod (subst '(8 . \"ESQ$0002$A\") (assoc 8 e) e))"));
    const CEItemLista item = Le(leitor, k);
    EXPECT_EQ(item.valorCampo("POSICAO"), "ESQ/0002:25.0;30.0");
    EXPECT_EQ(item.valorCampo("PAGINA"), "0002");
}

TEST_F(BlockReadingTest, ANewKeyOnTheSymbolBringsItsOwnCatalogueData) {
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A");
    LeitorBase leitor;
    EXPECT_EQ(Le(leitor, k).valorCampo("DESCRICAO"), "Owner");
    CICad::SetXData(k, "KVR_ZV", {{1000, QString("NL") + QChar(0x0C) + "1"}});
    const CEItemLista item = Le(leitor, k);
    EXPECT_EQ(item.valorCampo("ZV_KEY"), "NL");
    EXPECT_EQ(item.valorCampo("DESCRICAO"), "Not listed");
    EXPECT_EQ(item.valorCampo("ZV_LISTA"), "N");
    EXPECT_EQ(leitor.ChaveDaEntidade(k), "NL");
    EXPECT_EQ(leitor.NormaDaEntidade(k), "1");
    // the same key under another standard is another catalogue question
    CICad::SetXData(k, "KVR_ZV", {{1000, QString("NL") + QChar(0x0C) + "2"}});
    EXPECT_EQ(Le(leitor, k).valorCampo("ZV_LISTA"), "");
    // no key text: no key, the component's message for no description
    CICad::SetXData(k, "KVR_ZV", {{1070, "3"}});
    const CEItemLista semChave = Le(leitor, k);
    EXPECT_EQ(semChave.valorCampo("ZV_KEY"), "");
    EXPECT_EQ(leitor.ChaveDaEntidade(k), "");
}

TEST_F(BlockReadingTest, ACatalogueChangedBetweenRunsIsSeenByTheNextReader) {
    const OdDbObjectId k = Simbolo("NA-1", "SO", "ESQ$0001$A");
    {
        LeitorBase leitor;
        EXPECT_EQ(Le(leitor, k).valorCampo("DESCRICAO"), "Symbol own");
    }
    ASSERT_TRUE(CEConexaoCatalogo::ObterCatalogo()->Executar(
        "update BDMENUS set MENU_DESCR = 'Renamed' where MENU_KEY = 'SO'"));
    ASSERT_TRUE(CEConexaoCatalogo::ObterCatalogo()->Executar(
        "update BDZV set ZV_LISTA = 'n' where ZV_KEY = 'SO'"));
    LeitorBase leitor;
    const CEItemLista item = Le(leitor, k);
    EXPECT_EQ(item.valorCampo("DESCRICAO"), "Renamed");
    EXPECT_EQ(item.valorCampo("ZV_LISTA"), "N");
}

TEST_F(BlockReadingTest, AfterTheReadsAreGivenBackTheSameFieldsAreReadAgain) {
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}});
    LeitorBase leitor;
    const CEItemLista antes = Le(leitor, k);
    leitor.LiberaLeituras();
    const CEItemLista depois = Le(leitor, k);
    EXPECT_EQ(depois.campos.keys(), antes.campos.keys());
    EXPECT_EQ(depois.campos.values(), antes.campos.values());
    EXPECT_EQ(depois.valorCampo("DESCRICAO"), "Owner");
}

// Fields get their names' numbers in the order they are written: LISP sees an item's fields
// in that order.
TEST_F(BlockReadingTest, NewFieldNamesAreNumberedInTheOrderOfWriting) {
    const QString marca = QString::number(quintptr(this), 16).toUpper();
    const QString a = "ZZ_" + marca + "_A", b = "AA_" + marca + "_B";
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A", {{a, "1"}, {b, "2"}});
    ASSERT_EQ(CamposItem::numeroSeHouver(a), CamposItem::kSemNome);
    LeitorBase leitor;
    const CEItemLista item = Le(leitor, k);
    EXPECT_LT(CamposItem::numeroSeHouver(a), CamposItem::numeroSeHouver(b));
    EXPECT_LT(item.campos.keys().indexOf(a), item.campos.keys().indexOf(b));
    // Under a suffix only the whole names are made.
    const QString c = "CC_" + marca;
    const OdDbObjectId q = Simbolo("NA-1", "A1", "ESQ$0001$A", {{c, "3"}});
    CEItemLista lado;
    leitor.LeBloco("_FIM", lado, q, nullptr);
    EXPECT_EQ(lado.valorCampo(c + "_FIM"), "3");
    EXPECT_EQ(CamposItem::numeroSeHouver(c), CamposItem::kSemNome);
    // Under a suffix new to the run, the fields every symbol has are numbered as written,
    // after the symbol's own attributes; a second symbol under other suffixes, then this
    // one again, gives each its own names.
    const QString novo = "_" + marca;
    CEItemLista comNovo;
    leitor.LeBloco(novo, comNovo, q, nullptr);
    const QStringList escritos = {
        c,        "HANDLE",        "PAINEL",    "LOCAL",        "CIRCUITO",  "ZV_LISTA",
        "ZV_KEY", "DESCRICAO",     "TP_DESCRI", "POSICAO",      "LAYER",     "GRUPO",
        "PAGINA", "COMPONENTTYPE", "QTD",       "SAP_MATERIAL", "ORIENTACAO"};
    for (qsizetype i = 0; i + 1 < escritos.size(); ++i)
        EXPECT_LT(CamposItem::numeroSeHouver(escritos[i] + novo),
                  CamposItem::numeroSeHouver(escritos[i + 1] + novo))
            << escritos[i].toStdString();
    for (const QString& sufixo : {QStringLiteral("_INI"), QStringLiteral("_FIM"), novo}) {
        CEItemLista outro;
        leitor.LeBloco(sufixo, outro, k, nullptr);
        EXPECT_EQ(outro.valorCampo("HANDLE" + sufixo), handle(k));
        EXPECT_EQ(outro.valorCampo("ZV_KEY" + sufixo), "A1");
        EXPECT_FALSE(outro.temCampo("HANDLE"));
    }
}

// Of a name written twice the later value counts, whatever the order of the other names; the
// symbols whose batches name the same fields in another order are read as the first of them
// was not, and a copy of a kept reading gives what a reading gives.
TEST_F(BlockReadingTest, ALaterFieldOfANameWinsForSymbolsOfAnyOrderOfNames) {
    const OdDbObjectId k1 =
        Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}, {"NUMERO", "5"}, {"REGUA", "X2"}}, 0);
    const OdDbObjectId k2 = Simbolo("NA-1", "A1", "ESQ$0001$A",
                                    {{"NUMERO", "7"}, {"REGUA", "Y1"}, {"REGUA", "Y0"}}, 10);
    const OdDbObjectId k3 = Simbolo("NA-1", "A1", "ESQ$0001$A",
                                    {{"REGUA", "Z1"}, {"NUMERO", "9"}, {"REGUA", "Z2"}}, 20);
    LeitorBase leitor;
    for (int vez = 0; vez < 2; ++vez) {
        const CEItemLista um = Le(leitor, k1), dois = Le(leitor, k2), tres = Le(leitor, k3);
        EXPECT_EQ(um.valorCampo("REGUA"), "X2");
        EXPECT_EQ(um.valorCampo("NUMERO"), "5");
        EXPECT_EQ(dois.valorCampo("REGUA"), "Y0");
        EXPECT_EQ(dois.valorCampo("NUMERO"), "7");
        EXPECT_EQ(tres.valorCampo("REGUA"), "Z2");
        EXPECT_EQ(tres.valorCampo("NUMERO"), "9");
        EXPECT_EQ(dois.campos.keys(), um.campos.keys());
        EXPECT_EQ(tres.valorCampo("QTD"), "1");
    }
    for (const OdDbObjectId& id : {k1, k2, k3, k2}) {
        LeitorBase novo;
        const CEItemLista lido = Le(novo, id);
        CEItemLista copia;
        leitor.CopiaEntidade(QString(), copia, id, nullptr);
        EXPECT_EQ(copia.campos.keys(), lido.campos.keys());
        EXPECT_EQ(copia.campos.values(), lido.campos.values());
    }
}

namespace {

// A reader that keeps no terminal's reading, as the strip's and the wires' sides do.
class LeitorSemBornes : public LeitorBase {
public:
    LeitorSemBornes() { GuardaBornes = false; }
};

}  // namespace

// A terminal's reading that is not kept goes into the item that asked for it; the next copy
// of the same terminal reads it again and gets every value as well.
TEST_F(BlockReadingTest, ATerminalReadForOneCopyGivesEachCopyTheWholeReading) {
    const OdDbObjectId x1 =
        Simbolo("BORNE-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}, {"NUMERO", "5"}, {"QTD", "2"}}, 0);
    const OdDbObjectId x2 =
        Simbolo("BORNE-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}, {"NUMERO", "6"}}, 10);
    LeitorBase direto;
    LeitorSemBornes leitor;
    for (const QString& sufixo : {QString(), QStringLiteral("_INI"), QStringLiteral("_INI")}) {
        for (const OdDbObjectId& id : {x1, x2, x1}) {
            const CEItemLista lido = Le(direto, id);
            CEItemLista copia, outra;
            leitor.CopiaEntidade(sufixo, copia, id, nullptr);
            EXPECT_FALSE(leitor.LeituraGuardada(id));
            leitor.CopiaEntidade(sufixo, outra, id, nullptr);
            ASSERT_EQ(copia.campos.size(), lido.campos.size());
            EXPECT_EQ(outra.campos.values(), copia.campos.values());
            EXPECT_EQ(outra.campos.keys(), copia.campos.keys());
            for (auto it = lido.campos.begin(); it != lido.campos.end(); ++it)
                EXPECT_EQ(copia.valorCampo(it.key() + sufixo), it.value())
                    << it.key().toStdString();
        }
    }
    // Joined to an item with fields of its own, the copy wins on its names and leaves the rest.
    CEItemLista item;
    item.definirCampo(QStringLiteral("NUMERO"), QStringLiteral("antes"));
    item.definirCampo(QStringLiteral("ZZ_PROPRIO"), QStringLiteral("meu"));
    leitor.CopiaEntidade(QString(), item, x2, nullptr);
    EXPECT_EQ(item.valorCampo("NUMERO"), "6");
    EXPECT_EQ(item.valorCampo("ZZ_PROPRIO"), "meu");
    EXPECT_EQ(item.valorCampo("QTD"), "1");
    EXPECT_EQ(item.valorCampo("REGUA"), "X1");
}

namespace {

// A reader whose copies under a suffix keep the names the test gives, as the strip
// drawing's reader keeps the few fields of a terminal's sides that its blocks show.
class LeitorFiltrado : public LeitorBase {
public:
    void Filtra(std::function<bool(const QString&)> fica) { FiltraSufixos(std::move(fica)); }
};

// A reader whose sides copy their neighbours under _INI and _FIM, as a terminal's do.
class LeitorDosLados : public LeitorFiltrado {
public:
    LeitorDosLados() { CopiasDosLados({QStringLiteral("_INI"), QStringLiteral("_FIM")}); }
};

// A reader whose items of symbols are copies of kept readings, as the exports' are.
class LeitorQueCopia : public LeitorBase {
public:
    LeitorQueCopia() { GuardaSimbolos = true; }
};

}  // namespace

TEST_F(BlockReadingTest, ACopyUnderASuffixKeepsOnlyTheNamesItsReaderAsksFor) {
    // No QTD of its own: a full copy puts "1" under the suffix.
    const OdDbObjectId k =
        Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}, {"NUMERO", "5"}}, 0);
    LeitorBase todos;
    LeitorFiltrado leitor;
    leitor.Filtra([](const QString& nome) {
        return nome == "NUMERO_FIM" || nome == "REGUA_INI" || nome == "QTD_INI" ||
               nome == "REGUA_ZQ";
    });
    const auto copia = [](CCDataReader& r, const QString& sufixo, const OdDbObjectId& id) {
        CEItemLista item;
        r.CopiaEntidade(sufixo, item, id, nullptr);
        return item;
    };
    const CEItemLista cheio = copia(todos, "_FIM", k);
    ASSERT_GT(cheio.campos.size(), 5);
    EXPECT_EQ(cheio.valorCampo("QTD_FIM"), "1");
    for (int vez = 0; vez < 2; ++vez) {  // the second time from the names put in order
        const CEItemLista fim = copia(leitor, "_FIM", k);
        EXPECT_EQ(fim.campos.keys(), QStringList({"NUMERO_FIM"}));
        EXPECT_EQ(fim.valorCampo("NUMERO_FIM"), "5");
        const CEItemLista ini = copia(leitor, "_INI", k);
        EXPECT_EQ(ini.campos.size(), 2);
        EXPECT_EQ(ini.valorCampo("REGUA_INI"), "X1");
        EXPECT_EQ(ini.valorCampo("QTD_INI"), "1");
    }
    // A name left out is numbered all the same, so that the names keep the order a full
    // copy gives them.
    EXPECT_EQ(CamposItem::numeroSeHouver("NUMERO_ZQ"), CamposItem::kSemNome);
    EXPECT_EQ(copia(leitor, "_ZQ", k).campos.keys(), QStringList({"REGUA_ZQ"}));
    EXPECT_NE(CamposItem::numeroSeHouver("NUMERO_ZQ"), CamposItem::kSemNome);
    EXPECT_EQ(CamposItem::numeroSeHouver("NUMERO_ZQ") < CamposItem::numeroSeHouver("REGUA_ZQ"),
              CamposItem::numeroSeHouver("NUMERO") < CamposItem::numeroSeHouver("REGUA"));
    // Without a suffix the whole reading; without the filter every name again.
    EXPECT_EQ(copia(leitor, QString(), k).campos.keys(), copia(todos, QString(), k).campos.keys());
    leitor.Filtra({});
    const CEItemLista fim = copia(leitor, "_FIM", k);
    EXPECT_EQ(fim.campos.keys(), cheio.campos.keys());
    EXPECT_EQ(fim.campos.values(), cheio.campos.values());
}

// A symbol read for the sides' copies works out only the values those keep (no position asked
// when none keeps it) and is kept for them; a copy under another suffix, or none, reads it again
// whole.
TEST_F(BlockReadingTest, AReadingForTheSidesWorksOutWhatTheyKeepAndServesNoOtherCopy) {
    const auto chamadas = ContaPosicoes("B2");
    const OdDbObjectId k = Simbolo("NA-1", "A1", "ESQ$0001$A",
                                   {{"REGUA", "X1"}, {"NUMERO", "5"}, {"BITOLA", "2,5"}}, 40);
    LeitorBase todos;
    LeitorDosLados leitor;
    leitor.Filtra([](const QString& nome) {
        return nome == "REGUA_INI" || nome == "HANDLE_INI" || nome == "NUMERO_FIM" ||
               nome == "QTD_FIM" || nome == "POSICAO_ZQ" || nome == "BITOLA_ZQ";
    });
    const auto copia = [&k](CCDataReader& r, const QString& sufixo) {
        CEItemLista item;
        r.CopiaEntidade(sufixo, item, k, nullptr);
        return item;
    };
    for (int vez = 0; vez < 2; ++vez) {  // the second time from the kept reading
        const CEItemLista ini = copia(leitor, "_INI");
        EXPECT_EQ(ini.campos.keys(), QStringList({"REGUA_INI", "HANDLE_INI"}));
        EXPECT_EQ(ini.valorCampo("REGUA_INI"), "X1");
        EXPECT_EQ(ini.valorCampo("HANDLE_INI"), handle(k));
        const CEItemLista fim = copia(leitor, "_FIM");
        EXPECT_EQ(fim.valorCampo("NUMERO_FIM"), "5");
        EXPECT_EQ(fim.valorCampo("QTD_FIM"), "1");
        EXPECT_EQ(fim.campos.size(), 2);
    }
    EXPECT_TRUE(leitor.LeituraGuardada(k));
    EXPECT_EQ(chamadas(), 0);
    // The values the sides left out are there for a copy under another suffix.
    const CEItemLista zq = copia(leitor, "_ZQ");
    EXPECT_EQ(zq.valorCampo("POSICAO_ZQ"), "B2");
    EXPECT_EQ(zq.valorCampo("BITOLA_ZQ"), "2,5");
    EXPECT_EQ(chamadas(), 1);
    const CEItemLista inteiro = copia(leitor, QString());
    const CEItemLista cheio = copia(todos, QString());
    EXPECT_EQ(inteiro.campos.keys(), cheio.campos.keys());
    EXPECT_EQ(inteiro.campos.values(), cheio.campos.values());
    EXPECT_EQ(inteiro.valorCampo("DESCRICAO"), "Owner");
    // And the sides' copies go on as before.
    EXPECT_EQ(copia(leitor, "_INI").valorCampo("REGUA_INI"), "X1");
}

// The key read to tell whether a symbol makes an item is the start of the kept reading made
// for its copy; a reading found kept, or made for another entity, owes nothing to it.
TEST_F(BlockReadingTest, AnItemCopiedFromAKeptReadingIsItsOwnSymbolsWholeReading) {
    const OdDbObjectId a = Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X1"}}, 0);
    const OdDbObjectId b = Simbolo("NA-1", "SO", "ESQ$0001$A", {{"REGUA", "X2"}}, 10);
    LeitorBase direto;
    LeitorQueCopia leitor;
    TemplateDouble modelo;
    const auto confere = [&](const OdDbObjectId& id, const CEItemLista& item) {
        const CEItemLista lido = Le(direto, id);
        for (auto it = lido.campos.begin(); it != lido.campos.end(); ++it)
            EXPECT_EQ(item.valorCampo(it.key()), it.value()) << it.key().toStdString();
        EXPECT_EQ(item.campos.size(), lido.campos.size());
    };
    for (const OdDbObjectId& id : {a, b, a}) {
        const std::unique_ptr<CEItemLista> item(leitor.CriaItemBloco(id, modelo));
        ASSERT_NE(item, nullptr);
        confere(id, *item);
    }
    EXPECT_EQ(std::unique_ptr<CEItemLista>(leitor.CriaItemBloco(a, modelo))->valorCampo("ZV_KEY"),
              "A1");
    // After the item of a reading found kept, a copy asked for by itself reads its own symbol.
    const OdDbObjectId c = Simbolo("NA-1", "B3", "ESQ$0001$A", {{"REGUA", "X3"}}, 20);
    CEItemLista copia;
    leitor.CopiaEntidade(QString(), copia, c, nullptr);
    EXPECT_EQ(copia.valorCampo("ZV_KEY"), "B3");
    confere(c, copia);
    // A new key is read; a symbol whose key text is empty makes no item.
    CICad::SetXData(a, "KVR_ZV", {{1000, QString("SY") + QChar(0x0C) + "1"}});
    const std::unique_ptr<CEItemLista> novo(leitor.CriaItemBloco(a, modelo));
    ASSERT_NE(novo, nullptr);
    EXPECT_EQ(novo->valorCampo("ZV_KEY"), "SY");
    confere(a, *novo);
    CICad::SetXData(b, "KVR_ZV", {{1000, ""}});
    EXPECT_EQ(std::unique_ptr<CEItemLista>(leitor.CriaItemBloco(b, modelo)), nullptr);
}

namespace {

// A reader that cuts the symbols of key A1 to the names the test gives, and asks for a whole
// reading of those whose ZV_LISTA_TIPO it does not cut for, as the strip drawing's reader
// cuts its components.
class LeitorQueCorta : public LeitorBase {
public:
    QSet<QString> nomes;
    QStringList perguntas;  // "block:key" of each symbol asked about
    int inteiros = 0;

protected:
    CamposDoSimbolo* CamposDaLeitura(std::string_view bloco, const QString& chave) override {
        perguntas << QString::fromUtf8(bloco.data(), int(bloco.size())) + ":" + chave;
        return chave == "A1" ? &corte_ : nullptr;
    }

private:
    struct Corte : CamposDoSimbolo {
        LeitorQueCorta& leitor;
        explicit Corte(LeitorQueCorta& l) : leitor(l) {}
        bool Quer(std::uint32_t nome) override {
            return leitor.nomes.contains(CamposItem::nome(nome));
        }
        bool Inteiro(const CEItemLista& item) override {
            const bool inteiro = item.valorCampo("ZV_LISTA_TIPO") == "OUTRO";
            leitor.inteiros += inteiro;
            return inteiro;
        }
    } corte_{*this};
};

}  // namespace

// A symbol read for the names its reader tells by its block and key gets those fields of the
// whole reading alone, and what no kept field shows (its position, a call of the LISP side)
// is not worked out; the names left out are numbered all the same. A symbol the reader wants
// whole after all is read again whole.
TEST_F(BlockReadingTest, ASymbolCutByItsKeyGetsOnlyTheNamesItsReaderAsksFor) {
    const auto perguntas = ContaPosicoes("P");
    const OdDbObjectId a = Simbolo("NA-1", "A1", "ESQ$0001$A",
                                   {{"REGUA", " X1 "}, {"NUMERO", "5"}, {"ZQ_SO_AQUI", "z"}}, 10);
    const OdDbObjectId s = Simbolo("NA-2", "SO", "ESQ$0001$A", {{"REGUA", "X2"}}, 20);
    const OdDbObjectId o =
        Simbolo("NA-1", "A1", "ESQ$0001$A", {{"REGUA", "X3"}, {"ZV_LISTA_TIPO", "OUTRO"}}, 30);
    LeitorBase todos;
    LeitorQueCorta leitor;
    leitor.nomes = {"REGUA", "ZV_KEY", "HANDLE", "ZV_LISTA_TIPO"};
    TemplateDouble modelo;
    EXPECT_EQ(CamposItem::numeroSeHouver("ZQ_SO_AQUI"), CamposItem::kSemNome);
    const int antes = perguntas();
    const std::unique_ptr<CEItemLista> cortado(leitor.CriaItemBloco(a, modelo));
    ASSERT_NE(cortado, nullptr);
    EXPECT_EQ(perguntas(), antes);
    EXPECT_EQ(leitor.perguntas, QStringList({"NA-1:A1"}));
    // The same values as the whole reading, in its order.
    const CEItemLista inteiro = Le(todos, a);
    EXPECT_EQ(perguntas(), antes + 1);
    QStringList esperados;
    for (auto it = inteiro.campos.begin(); it != inteiro.campos.end(); ++it)
        if (leitor.nomes.contains(it.key())) esperados << it.key();
    EXPECT_EQ(esperados.size(), 3);
    EXPECT_EQ(cortado->campos.keys(), esperados);
    for (const QString& nome : esperados)
        EXPECT_EQ(cortado->valorCampo(nome), inteiro.valorCampo(nome)) << nome.toStdString();
    EXPECT_EQ(cortado->valorCampo("REGUA"), "X1");
    EXPECT_NE(CamposItem::numeroSeHouver("ZQ_SO_AQUI"), CamposItem::kSemNome);
    // Another key is read whole.
    const std::unique_ptr<CEItemLista> outraChave(leitor.CriaItemBloco(s, modelo));
    ASSERT_NE(outraChave, nullptr);
    EXPECT_EQ(leitor.perguntas.last(), "NA-2:SO");
    EXPECT_EQ(outraChave->campos.keys(), Le(todos, s).campos.keys());
    EXPECT_EQ(outraChave->valorCampo("POSICAO"), "P");
    // A symbol the reader wants whole after all: its whole reading, once.
    EXPECT_EQ(leitor.inteiros, 0);
    const std::unique_ptr<CEItemLista> refeito(leitor.CriaItemBloco(o, modelo));
    ASSERT_NE(refeito, nullptr);
    EXPECT_EQ(leitor.inteiros, 1);
    const CEItemLista todoO = Le(todos, o);
    EXPECT_EQ(refeito->campos.keys(), todoO.campos.keys());
    EXPECT_EQ(refeito->campos.values(), todoO.campos.values());
}

// Symbols of one layer in a row, another's between them, and the reads given back between
// two of the same layer: each gets its own layer, group and page.
TEST_F(BlockReadingTest, SymbolsOfLayersInTurnEachGetTheirOwnLayer) {
    const OdDbObjectId a1 = Simbolo("NA-1", "A1", "ESQ$0001$A", {}, 0);
    const OdDbObjectId a2 = Simbolo("NA-1", "A1", "ESQ$0001$A", {}, 10);
    const OdDbObjectId b = Simbolo("NA-1", "A1", "MEC$0007$B", {}, 20);
    const OdDbObjectId c = Simbolo("NA-1", "A1", "SOLTO", {}, 30);
    LeitorBase leitor;
    const auto layer = [&](const OdDbObjectId& id) -> QString {
        const CEItemLista item = Le(leitor, id);
        return item.valorCampo("LAYER") + "|" + item.valorCampo("GRUPO") + "|" +
               item.valorCampo("PAGINA");
    };
    for (int vez = 0; vez < 2; ++vez) {
        EXPECT_EQ(layer(a1), "ESQ$0001$A|ESQ|0001");
        EXPECT_EQ(layer(a2), "ESQ$0001$A|ESQ|0001");
        EXPECT_EQ(layer(b), "MEC$0007$B|MEC|0007");
        EXPECT_EQ(layer(c), "SOLTO||");
        EXPECT_EQ(layer(a1), "ESQ$0001$A|ESQ|0001");
        leitor.LiberaLeituras();
    }
    EXPECT_EQ(leitor.LayerDe(b), "MEC$0007$B");
    EXPECT_EQ(leitor.LayerDe(a2), "ESQ$0001$A");
}
