// The wire reader on small schematics: how a wire breaks into chained stretches, what each
// end of a stretch says, which wires and pages it reads, and the ferrule variant.
#include "readers/FioFixture.h"

#include "module/CIProgress.h"
#include "readers/CCBorneDataReader.h"
#include "readers/CEAtributo.h"

#include <QRegularExpression>

namespace {

using WireReaderTest = FioFixture;

// ---- chains

TEST_F(WireReaderTest, AWireThroughAContactMakesTwoStretchesChainedByLigado) {
    const zvdb::BlockReference* x1 = borne("X1", "1", {20, 200, 0});
    const zvdb::BlockReference* k1 = componente("-K1", {{"A1", {20, 150, 0}}}, "NA-1");
    const zvdb::BlockReference* x2 = borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 150, 0}, {20, 100, 0}}, "12");
    CCFioDataReader leitor;
    const VetorItens& itens = le(leitor);
    ASSERT_EQ(itens.size(), 2u);
    // The first stretch stands behind the later ones.
    const CEItemLista& primeiro = *itens[1];
    const CEItemLista& segundo = *itens[0];
    EXPECT_EQ(primeiro.ligado, &segundo);
    EXPECT_EQ(segundo.ligado, nullptr);
    EXPECT_EQ(primeiro.valorCampo("HANDLE_INI"), handle(x1));
    EXPECT_EQ(primeiro.valorCampo("HANDLE_FIM"), handle(k1));
    EXPECT_EQ(segundo.valorCampo("HANDLE_INI"), handle(k1));
    EXPECT_EQ(segundo.valorCampo("HANDLE_FIM"), handle(x2));
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-K1:A1 -K1:A1>X1:2/"}));
    for (const CEItemLista* item : itens) {
        EXPECT_EQ(item->valorCampo("ZV_LISTA_TIPO"), "FIO");
        EXPECT_EQ(item->valorCampo("FIO"), "12");
        // The wire polyline's own fields at each end, and the wire itself first in the ids.
        EXPECT_EQ(item->valorCampo("FIO_SEGINI"), "12");
        EXPECT_EQ(item->valorCampo("FIO_SEGFIM"), "12");
        ASSERT_FALSE(item->ids.empty());
        EXPECT_TRUE(CICad::EhPolilinha(item->ids.front()));
    }
    EXPECT_EQ(primeiro.valorCampo("REL_INI"), "X1:1");
    EXPECT_EQ(primeiro.valorCampo("LIG_INI"), "");
    EXPECT_EQ(primeiro.valorCampo("REL_FIM"), "-K1");
    EXPECT_EQ(primeiro.valorCampo("LIG_FIM"), "A1");
}

TEST_F(WireReaderTest, TwoPolylinesOfOneNumberOnTwoPagesMakeOneChain) {
    borne("X1", "1", {20, 200, 0});
    componente("-K1", {{"A1", {20, 150, 0}}});
    componente("-K2", {{"A1", {50, 150, 0}}}, "BOBINA", kPagina2);
    borne("X2", "1", {50, 100, 0}, kPagina2);
    fio({{20, 190, 0}, {20, 150, 0}}, "12");
    fio({{50, 150, 0}, {50, 100, 0}}, "12", kPagina2);
    CCFioDataReader leitor;
    EXPECT_EQ(le(leitor).size(), 3u);
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-K1:A1 -K1:A1>-K2:A1 -K2:A1>X2:1/"}));
}

TEST_F(WireReaderTest, AnEquipmentPassedTwiceInARowMakesNoBreakTwoEquipmentsDo) {
    borne("X1", "1", {20, 200, 0});
    zvdb::BlockReference* e =
        componente("-A1", {{"I1", {20, 170, 0}}, {"I2", {20, 160, 0}}}, "CLP");
    e->setXData("KVR_ZV_EQUIPO", zvsample::XDataItems().text("EQUIPO").tags());
    borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 170, 0}, {20, 160, 0}, {20, 100, 0}}, "20");
    CCFioDataReader leitor;
    le(leitor);
    // In at one pin, out at the other: one passage, two stretches.
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-A1:I1 -A1:I2>X1:2/"}));
}

TEST_F(WireReaderTest, TwoDifferentEquipmentsAndAComponentTwiceBreakTheWire) {
    borne("X1", "1", {20, 200, 0});
    zvdb::BlockReference* e1 = componente("-A1", {{"I1", {20, 170, 0}}}, "CLP");
    zvdb::BlockReference* e2 = componente("-A2", {{"I1", {20, 160, 0}}}, "CLP");
    for (zvdb::BlockReference* e : {e1, e2})
        e->setXData("KVR_ZV_EQUIPO", zvsample::XDataItems().text("EQUIPO").tags());
    borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 170, 0}, {20, 160, 0}, {20, 100, 0}}, "20");
    // Not an equipment: a component touched twice in a row ends a stretch on itself.
    borne("X3", "1", {120, 200, 0});
    componente("-K1", {{"A1", {120, 170, 0}}, {"A2", {120, 160, 0}}});
    borne("X3", "2", {120, 100, 0});
    fio({{120, 190, 0}, {120, 170, 0}, {120, 160, 0}, {120, 100, 0}}, "21");
    CCFioDataReader leitor;
    le(leitor);
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-A1:I1 -A1:I1>-A2:I1 -A2:I1>X1:2/",
                                      "X3:1/>-K1:A1 -K1:A1>-K1:A2 -K1:A2>X3:2/"}));
}

TEST_F(WireReaderTest, EveryStretchHoldsTheFieldsOfItsOwnWireAndOfNoOther) {
    // Two wires of three stretches each, the first with a field of its own, the second
    // without: the later stretches start from their own wire's fields, and each end's
    // connection is its own wire's.
    borne("X1", "1", {20, 200, 0});
    componente("-K1", {{"A1", {20, 170, 0}}});
    componente("-K2", {{"A1", {20, 150, 0}}});
    borne("X1", "2", {20, 100, 0});
    zvdb::Polyline* comCampo = fio({{20, 190, 0}, {20, 170, 0}, {20, 150, 0}, {20, 100, 0}}, "40");
    comCampo->setXData("KVR_ZV_WIRE", zvsample::XDataItems()
                                          .text("10006\f1")
                                          .text("1")
                                          .text("FIO\f40")
                                          .text("OBS_LOTE\fAZ")
                                          .tags());
    borne("X2", "1", {120, 200, 0});
    componente("-K3", {{"A2", {120, 170, 0}}});
    componente("-K4", {{"B1", {120, 150, 0}}});
    borne("X2", "2", {120, 100, 0});
    const zvdb::Polyline* simples =
        fio({{120, 190, 0}, {120, 170, 0}, {120, 150, 0}, {120, 100, 0}}, "41");
    CCFioDataReader leitor;
    ASSERT_EQ(le(leitor).size(), 6u);
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-K1:A1 -K1:A1>-K2:A1 -K2:A1>X1:2/",
                                      "X2:1/>-K3:A2 -K3:A2>-K4:B1 -K4:B1>X2:2/"}));
    int porFio[2] = {0, 0};
    for (const CEItemLista* item : itens_) {
        const bool primeiro = item->valorCampo("FIO") == "40";
        ++porFio[primeiro ? 0 : 1];
        EXPECT_EQ(item->valorCampo("OBS_LOTE"), primeiro ? "AZ" : "");
        EXPECT_EQ(item->temCampo("OBS_LOTE"), primeiro);
        EXPECT_EQ(item->valorCampo("ZV_LISTA_TIPO"), "FIO");
        ASSERT_EQ(item->ids.size(), 1u);
        EXPECT_EQ(item->ids.front(), id(primeiro ? comCampo : simples));
        EXPECT_EQ(item->valorCampo("FIO_SEGINI"), item->valorCampo("FIO"));
    }
    EXPECT_EQ(porFio[0], 3);
    EXPECT_EQ(porFio[1], 3);
}

TEST_F(WireReaderTest, AWireTouchingNothingIsOneItemWithoutEnds) {
    fio({{200, 200, 0}, {250, 200, 0}}, "30");
    CCFioDataReader leitor;
    ASSERT_EQ(le(leitor).size(), 1u);
    const CEItemLista& item = *itens_[0];
    EXPECT_EQ(item.valorCampo("FIO"), "30");
    EXPECT_EQ(item.ligado, nullptr);
    EXPECT_FALSE(item.temCampo("HANDLE_INI"));
    EXPECT_FALSE(item.temCampo("COMPRIMENTO"));
}

// A reader that makes wire items from the kept readings, as the bill of materials does.
class LeitorDasLeituras : public CCFioDataReader {
public:
    LeitorDasLeituras() { FiosDasLeituras = true; }
};

TEST_F(WireReaderTest, AWireItemFromTheKeptReadingEqualsOneReadApart) {
    const zvdb::Polyline* simples = fio({{200, 200, 0}, {250, 200, 0}}, "30");
    zvdb::Polyline* comQtd = fio({{200, 100, 0}, {250, 100, 0}}, "31");
    comQtd->setXData("KVR_ZV_WIRE",
                     zvsample::XDataItems().text("10006\f1").text("1").text("QTD\f4").tags());
    // Without its second item the polyline is no complete wire.
    zvdb::Polyline* incompleto = fio({{200, 0, 0}, {250, 0, 0}}, "32");
    incompleto->setXData("KVR_ZV_WIRE", zvsample::XDataItems().text("10006\f1").tags());
    auto campos = [](const CEItemLista* item) {
        QStringList texto;
        for (auto it = item->campos.constBegin(); it != item->campos.constEnd(); ++it)
            texto << it.key() + "=" + it.value();
        return texto;
    };
    CCFioDataReader aParte;
    LeitorDasLeituras dasLeituras;
    for (const zvdb::Polyline* linha : {simples, static_cast<const zvdb::Polyline*>(comQtd),
                                        static_cast<const zvdb::Polyline*>(incompleto)}) {
        SCOPED_TRACE(linha->handle());
        const std::unique_ptr<CEItemLista> lido(aParte.CriaItemFio(id(linha), modelo_));
        const std::unique_ptr<CEItemLista> guardado(dasLeituras.CriaItemFio(id(linha), modelo_));
        ASSERT_TRUE(lido && guardado);
        EXPECT_EQ(campos(guardado.get()), campos(lido.get()));
        EXPECT_TRUE(dasLeituras.LeituraGuardada(id(linha)));
        // A copy as an end still gets the quantity a wire without one of its own stands for.
        CEItemLista ponta;
        dasLeituras.CopiaEntidade("_INI", ponta, id(linha), &modelo_);
        EXPECT_EQ(ponta.valorCampo("QTD_INI"), linha == simples  ? "1"
                                               : linha == comQtd ? "4"
                                                                 : QString());
    }
    EXPECT_EQ(campos(std::unique_ptr<CEItemLista>(aParte.CriaItemFio(id(comQtd), modelo_)).get())
                  .filter("QTD="),
              QStringList({"QTD=4"}));
}

TEST_F(WireReaderTest, AnElementThatNoLongerExistsLeavesTheStretchOpen) {
    const zvdb::BlockReference* x1 = borne("X1", "1", {20, 200, 0});
    const zvdb::BlockReference* x2 = borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 100, 0}}, "12");
    // The product's answer names an element that the drawing does not hold (any more).
    ASSERT_TRUE(lisp(QString("(defun getConexoesTodosFios () (list (list \"12\" (list \"%1#\" "
                             "20.0 190.0 0.0) (list \"FFFFF#A1#X\" 20.0 150.0 0.0) (list "
                             "\"%2#\" 20.0 100.0 0.0))))")
                         .arg(handle(x1), handle(x2))));
    CCFioDataReader leitor;
    le(leitor);
    ASSERT_EQ(itens_.size(), 1u);
    EXPECT_EQ(itens_[0]->valorCampo("RELACAO_INI"), "X1:1/");
    EXPECT_FALSE(itens_[0]->temCampo("HANDLE_FIM"));
    EXPECT_EQ(itens_[0]->ligado, nullptr);
}

// ---- what a walk keeps

TEST_F(WireReaderTest, AReaderWalkingAgainSeesTheChangedConnectionAndSeparators) {
    borne("X1", "1", {20, 200, 0});
    zvdb::BlockReference* k1 = componente("-K1", {{"A1", {20, 150, 0}}});
    fio({{20, 190, 0}, {20, 150, 0}}, "12");
    CCFioDataReader leitor;
    le(leitor);
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-K1:A1"}));
    EXPECT_EQ(itens_[0]->valorCampo("LIG_FIM"), "A1");
    itens_.destruirItens();

    // The same reader, the drawing and the template changed in between.
    ASSERT_TRUE(k1->attribute("LIGACAO1"));
    k1->attribute("LIGACAO1")->setTextValue("A9");
    modelo_.simbolos["*CHAR_SEP_STD_CFG*"] = ".";
    modelo_.simbolos["*CHAR_SEP_LIG_CFG*"] = "+";
    le(leitor);
    EXPECT_EQ(cadeias(), QStringList({"X1.1+>-K1.A9"}));
    EXPECT_EQ(itens_[0]->valorCampo("LIG_FIM"), "A9");
    // Outside a walk the relation reads the template as it is.
    modelo_.simbolos["*ORDEM_CONCAT_STD*"] = "0";
    CEItemLista avulso;
    avulso.definirCampo("RELACAO_FIM", "-K2");
    leitor.ComporRelacaoFio("_FIM", avulso, &modelo_, nullptr);
    EXPECT_EQ(avulso.valorCampo("RELACAO_FIM"), ".-K2");
}

TEST_F(WireReaderTest, AReaderThatGaveBackItsReadsReadsTheSameAgain) {
    borne("X1", "1", {20, 200, 0});
    componente("-K1", {{"A1", {20, 150, 0}}}, "NA-1");
    borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 150, 0}, {20, 100, 0}}, "12");
    CCFioDataReader leitor;
    le(leitor);
    QStringList antes;
    for (const CEItemLista* item : itens_)
        antes << item->textoCampos();
    ASSERT_EQ(antes.size(), 2);
    itens_.destruirItens();
    // Connections, entities read and indexes go; the next walk loads them again.
    leitor.LiberaLeituras();
    EXPECT_FALSE(leitor.ListaConexoes("12"));
    le(leitor);
    QStringList depois;
    for (const CEItemLista* item : itens_)
        depois << item->textoCampos();
    EXPECT_EQ(depois, antes);
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-K1:A1 -K1:A1>X1:2/"}));
    EXPECT_EQ(itens_[1]->valorCampo("FIO_SEGFIM"), "12");
}

TEST_F(WireReaderTest, AnElementEndingSeveralWiresGivesEachWhatACopyOfItGives) {
    // -K1 ends two wires and has no QTD; -K2 ends two and has a QTD of its own.
    zvdb::BlockReference* k1 = componente("-K1", {{"A1", {20, 150, 0}}, {"A2", {60, 150, 0}}});
    const zvdb::BlockReference* k2 = simbolo("BOBINA", {170, 150, 0},
                                             {{"RELACAO", "-K2", {170, 170, 0}},
                                              {"QTD", "3", {170, 165, 0}},
                                              {"LIGACAO1", "B1", {140, 150, 0}},
                                              {"LIGACAO2", "B2", {180, 150, 0}}});
    const std::vector<std::pair<double, const char*>> fios{
        {20, "1"}, {60, "2"}, {140, "3"}, {180, "4"}};
    for (const auto& [x, numero] : fios) {
        borne("X1", numero, {x, 200, 0});
        fio({{x, 190, 0}, {x, 150, 0}}, numero);
    }
    // What the element's copy under the end's suffix holds, but the relation texts that
    // the end composes from it.
    const auto copiados = [this](const zvdb::BlockReference* elemento) {
        CCFioDataReader outro;
        CEItemLista copia;
        outro.CopiaEntidade("_FIM", copia, id(elemento), &modelo_);
        const QStringList compostos{"REL_FIM", "LIG_FIM", "RELACAO_FIM", "TAG_FIM", "ETIQUETA_FIM"};
        QStringList campos;
        for (auto c = copia.campos.begin(); c != copia.campos.end(); ++c)
            if (!compostos.contains(c.key())) campos << c.key() + "=" + c.value();
        return campos;
    };
    const auto doItem = [](const CEItemLista& item, const QStringList& esperados) {
        QStringList campos;
        for (const QString& esperado : esperados) {
            const QString nome = esperado.section('=', 0, 0);
            campos << nome + "=" + item.valorCampo(nome);
        }
        return campos;
    };
    CCFioDataReader leitor;
    ASSERT_EQ(le(leitor).size(), 4u);
    QStringList deK1 = copiados(k1);
    const QStringList deK2 = copiados(k2);
    ASSERT_TRUE(deK1.contains("HANDLE_FIM=" + handle(k1)));
    ASSERT_TRUE(deK1.contains("LIGACAO2_FIM=A2"));
    for (const CEItemLista* item : itens_) {
        const bool primeiro = item->valorCampo("HANDLE_FIM") == handle(k1);
        ASSERT_TRUE(primeiro || item->valorCampo("HANDLE_FIM") == handle(k2));
        const QStringList& esperados = primeiro ? deK1 : deK2;
        EXPECT_EQ(doItem(*item, esperados), esperados) << item->valorCampo("FIO").toStdString();
        // A copy puts a QTD of "1" where the element has none.
        EXPECT_EQ(item->valorCampo("QTD_FIM"), primeiro ? "1" : "3");
        EXPECT_EQ(item->valorCampo("REL_FIM"), primeiro ? "-K1" : "-K2");
    }
    itens_.destruirItens();

    // The same reader after the element changed: the ends see the new fields.
    k1->attribute("RELACAO")->setTextValue("-K7");
    k1->attribute("LIGACAO2")->setTextValue("A8");
    deK1 = copiados(k1);
    ASSERT_TRUE(deK1.contains("LIGACAO2_FIM=A8"));
    ASSERT_EQ(le(leitor).size(), 4u);
    int vistos = 0;
    for (const CEItemLista* item : itens_) {
        if (item->valorCampo("HANDLE_FIM") != handle(k1)) continue;
        ++vistos;
        EXPECT_EQ(doItem(*item, deK1), deK1) << item->valorCampo("FIO").toStdString();
        EXPECT_EQ(item->valorCampo("REL_FIM"), "-K7");
        const QString ligacao = item->valorCampo("FIO") == "1" ? "A1" : "A8";
        EXPECT_EQ(item->valorCampo("LIG_FIM"), ligacao);
        EXPECT_EQ(item->valorCampo("RELACAO_FIM"), "-K7:" + ligacao);
    }
    EXPECT_EQ(vistos, 2);
}

TEST_F(WireReaderTest, AWireThroughManyElementsFindsTheWireAtEachEndAndItsConnection) {
    // Past some sixteen entries a wire's repeated texts are found through an index.
    const int n = 24;
    borne("X1", "1", {20, 1000, 0});
    std::vector<zvdb::Point3> pontos{{20, 990, 0}};
    for (int i = 0; i < n; ++i) {
        const zvdb::Point3 p{20, 950.0 - 30.0 * i, 0};
        componente(QString("-K%1").arg(i + 1).toStdString(),
                   {{QString("A%1").arg(i + 1).toStdString(), p}});
        pontos.push_back(p);
    }
    fio(pontos, "30");
    CCFioDataReader leitor;
    ASSERT_EQ(le(leitor).size(), size_t(n));
    QStringList esperada{"X1:1/>-K1:A1"};
    for (int i = 1; i < n; ++i)
        esperada << QString("-K%1:A%1>-K%2:A%2").arg(i).arg(i + 1);
    EXPECT_EQ(cadeias(), QStringList({esperada.join(" ")}));
    for (const CEItemLista* item : itens_) {
        EXPECT_EQ(item->valorCampo("FIO_SEGINI"), "30");
        EXPECT_EQ(item->valorCampo("FIO_SEGFIM"), "30");
    }
}

TEST_F(WireReaderTest, AnElementTouchedTwiceAtOneConnectionGivesBothEndsTheWireAtItsFirstPlace) {
    // One wire of a few entries and one of more than sixteen (found through an index): on
    // each, -K2 has two connection attributes of one value, so two entries share one whole
    // text; another wire, drawn first, passes the second place only. Both ends take the
    // wire at the first place of their text.
    const auto monta = [this](double x, int n, const std::string& numero) {
        borne("X1", numero, {x, 1000, 0});
        std::vector<zvdb::Point3> pontos{{x, 990, 0}};
        for (int i = 0; i < n; ++i)
            pontos.push_back({x, 950.0 - 30.0 * i, 0});
        const int segundo = n - 2;
        const zvdb::Point3 outro = pontos[size_t(segundo) + 1];
        fio({outro, {x - 15, outro.y, 0}}, numero + "9");
        const zvdb::BlockReference* repetido = nullptr;
        for (int i = 0; i < n; ++i) {
            if (i == segundo) continue;
            std::vector<std::pair<std::string, zvdb::Point3>> ligacoes{
                {QString("A%1").arg(i + 1).toStdString(), pontos[size_t(i) + 1]}};
            if (i == 1) ligacoes.push_back({"A2", outro});
            const zvdb::BlockReference* k =
                componente(QString("-K%1").arg(i + 1).toStdString(), ligacoes);
            if (i == 1) repetido = k;
        }
        fio(pontos, numero);
        return handle(repetido);
    };
    const QString curto = monta(20, 8, "30");
    const QString longo = monta(200, 24, "40");
    CCFioDataReader leitor;
    le(leitor);
    int pontas = 0;
    for (const CEItemLista* item : itens_) {
        const QString numero = item->valorCampo("FIO");
        if (numero != "30" && numero != "40") continue;
        const QString repetido = numero == "30" ? curto : longo;
        pontas += (item->valorCampo("HANDLE_INI") == repetido) +
                  (item->valorCampo("HANDLE_FIM") == repetido);
        EXPECT_EQ(item->valorCampo("FIO_SEGINI"), numero)
            << item->valorCampo("REL_INI").toStdString();
        EXPECT_EQ(item->valorCampo("FIO_SEGFIM"), numero)
            << item->valorCampo("REL_FIM").toStdString();
    }
    // Each wire meets -K2 twice, and each meeting is the end of one stretch and the start of
    // the next.
    EXPECT_EQ(pontas, 8);
}

// ---- which wires

TEST_F(WireReaderTest, AWireWhoseKeyIsNotListedIsLeftOutWithoutAMessage) {
    borne("X1", "1", {20, 200, 0});
    borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 100, 0}}, "40", kPagina1, "10099");
    fio({{60, 190, 0}, {60, 100, 0}}, "41");
    const QString antes = saida();
    CCFioDataReader leitor;
    le(leitor);
    QStringList numeros;
    for (const CEItemLista* item : itens_)
        numeros << item->valorCampo("FIO");
    EXPECT_EQ(numeros, QStringList({"41"}));
    EXPECT_EQ(saida(), antes);
}

TEST_F(WireReaderTest, TheNumberIsReadFromAnyLanguagesWireField) {
    fio({{0, 10, 0}, {10, 10, 0}}, "7", kPagina1, "10006", "WIRE");
    fio({{0, 20, 0}, {10, 20, 0}}, "8", kPagina1, "10006", "ALAMBRE");
    fio({{0, 30, 0}, {10, 30, 0}}, "9", kPagina1, "10006", "CABO");
    fio({{0, 40, 0}, {10, 40, 0}}, "", kPagina1, "10006", "CABO");  // no number: left out
    CCFioDataReader leitor;
    le(leitor);
    QStringList numeros;
    for (const CEItemLista* item : itens_) {
        const QString campo = CCDataReader::CampoFio(*item);
        numeros << campo + "=" + item->valorCampo(campo);
    }
    numeros.sort();
    EXPECT_EQ(numeros, QStringList({"ALAMBRE=8", "CABO=9", "WIRE=7"}));
}

TEST_F(WireReaderTest, AWiresFieldsFollowItsTextsUnderAnySuffixAndAfterAChange) {
    zvdb::Polyline* a = fio({{0, 10, 0}, {10, 10, 0}}, "30");
    zvdb::Polyline* b = fio({{0, 20, 0}, {10, 20, 0}}, "30");
    const auto textos = [](const CEItemLista& item) { return item.textoCampos(); };
    // One reader reads both wires of one key and number, the second under a suffix; each
    // gives what a reader of its own gives.
    CCFioDataReader leitor, sozinhoA, sozinhoB;
    CEItemLista lidoA, lidoB, aParteA, aParteB;
    leitor.LeFio(QString(), lidoA, id(a), &modelo_);
    leitor.LeFio("_X", lidoB, id(b), &modelo_);
    sozinhoA.LeFio(QString(), aParteA, id(a), &modelo_);
    sozinhoB.LeFio("_X", aParteB, id(b), &modelo_);
    EXPECT_EQ(textos(lidoA), textos(aParteA));
    EXPECT_EQ(textos(lidoB), textos(aParteB));
    EXPECT_EQ(lidoA.valorCampo("FIO"), "30");
    EXPECT_EQ(lidoB.valorCampo("FIO_X"), "30");
    EXPECT_FALSE(lidoB.temCampo("FIO"));
    EXPECT_EQ(lidoB.valorCampo("ZV_KEY_X"), "10006");
    // The key's catalogue columns come with the wire, under the suffix too.
    EXPECT_EQ(lidoA.valorCampo("REFERENCIA"), "FX-1.5-BK");
    EXPECT_EQ(lidoB.valorCampo("SECAO_MM2_X"), "1.5");
    EXPECT_FALSE(lidoB.temCampo("REFERENCIA"));

    // The texts changed in the drawing: the next reading gives the new fields; a text of
    // three parts or of separators alone is no field.
    b->setXData("KVR_ZV_WIRE", zvsample::XDataItems()
                                   .text("10006\f1")
                                   .text("1")
                                   .text("FIO\f31")
                                   .text("COR\fAZ")
                                   .text("A\fB\fC")
                                   .text("\f\f")
                                   .tags());
    CEItemLista depois;
    leitor.LeFio(QString(), depois, id(b), &modelo_);
    EXPECT_EQ(depois.valorCampo("FIO"), "31");
    EXPECT_EQ(depois.valorCampo("COR"), "AZ");
    EXPECT_EQ(depois.valorCampo("FABRICANTE"), "Condutel");
    EXPECT_FALSE(depois.temCampo("A"));
    CCFioDataReader novo;
    CEItemLista novoB;
    novo.LeFio(QString(), novoB, id(b), &modelo_);
    EXPECT_EQ(textos(depois), textos(novoB));
}

TEST_F(WireReaderTest, AWiresTextsGiveWayToTheFieldsWrittenAfterThemAndNameFieldsInTurn) {
    // Texts that repeat a name, or name a field the reader writes after them, or leave the
    // quantity empty; and two names no wire had before.
    zvdb::Polyline* linha = fio({{0, 10, 0}, {10, 10, 0}}, "60");
    linha->setXData("KVR_ZV_WIRE", zvsample::XDataItems()
                                       .text("100061")
                                       .text("1")
                                       .text("FIO60")
                                       .text("CORVM")
                                       .text("CORAZ")
                                       .text("LAYEROUTRO")
                                       .text("QTD")
                                       .text("ZZ_FIO_TURNO1a")
                                       .text("AA_FIO_TURNO2b")
                                       .tags());
    const zvdb::Polyline* semQtd = fio({{0, 20, 0}, {10, 20, 0}}, "61");
    ASSERT_EQ(CamposItem::numeroSeHouver("ZZ_FIO_TURNO1"), CamposItem::kSemNome);
    ASSERT_EQ(CamposItem::numeroSeHouver("ZV_KEY_TURNO"), CamposItem::kSemNome);
    const auto confere = [](const CEItemLista& item, const QString& s) {
        EXPECT_EQ(item.valorCampo("FIO" + s), "60");
        EXPECT_EQ(item.valorCampo("COR" + s), "AZ");
        EXPECT_EQ(item.valorCampo("LAYER" + s), kPagina1);
        EXPECT_EQ(item.valorCampo("QTD" + s), "1");
        EXPECT_EQ(item.valorCampo("ZZ_FIO_TURNO1" + s), "a");
        EXPECT_EQ(item.valorCampo("AA_FIO_TURNO2" + s), "b");
    };
    // Read into an item that holds fields already: the wire's replace them, the others stay.
    CCFioDataReader leitor;
    CEItemLista item;
    item.definirCampo("COR", "PR");
    item.definirCampo("QTD", "7");
    item.definirCampo("OUTRO", "x");
    leitor.LeFio(QString(), item, id(linha), &modelo_);
    confere(item, QString());
    EXPECT_EQ(item.valorCampo("OUTRO"), "x");
    // A wire without a quantity of its own keeps the item's.
    CEItemLista comQtd;
    comQtd.definirCampo("QTD", "7");
    leitor.LeFio(QString(), comQtd, id(semQtd), &modelo_);
    EXPECT_EQ(comQtd.valorCampo("QTD"), "7");
    EXPECT_EQ(comQtd.valorCampo("FIO"), "61");
    // The reading kept for the copies gives the same, under a suffix too.
    LeitorDasLeituras dasLeituras;
    CEItemLista ponta;
    dasLeituras.CopiaEntidade("_P", ponta, id(linha), &modelo_);
    confere(ponta, "_P");
    const std::unique_ptr<CEItemLista> criado(dasLeituras.CriaItemFio(id(linha), modelo_));
    ASSERT_TRUE(criado);
    confere(*criado, QString());

    // Names are numbered in the order the fields are written, new ones of the texts among
    // them: the fields reach LISP in that order.
    EXPECT_LT(CamposItem::numeroSeHouver("ZZ_FIO_TURNO1"),
              CamposItem::numeroSeHouver("AA_FIO_TURNO2"));
    CEItemLista sufixado;
    leitor.LeFio("_TURNO", sufixado, id(linha), &modelo_);
    confere(sufixado, "_TURNO");
    std::vector<std::uint32_t> numeros;
    // (COR is a catalogue column too: it comes first, with the columns.)
    for (const char* nome :
         {"ZV_KEY", "FIO", "LAYER", "QTD", "ZZ_FIO_TURNO1", "AA_FIO_TURNO2", "WIRE_LISTA",
          "DESCRICAO", "TP_DESCRI", "POSICAO", "GRUPO", "PAGINA", "SAP_MATERIAL"})
        numeros.push_back(CamposItem::numeroSeHouver(QString(nome) + "_TURNO"));
    EXPECT_TRUE(std::is_sorted(numeros.begin(), numeros.end()));
    EXPECT_EQ(std::adjacent_find(numeros.begin(), numeros.end()), numeros.end());
}

TEST_F(WireReaderTest, AWireReadAgainAfterAChangeGivesItsNewTextsNotThoseTheListSaw) {
    borne("X1", "1", {20, 200, 0});
    borne("X1", "2", {20, 100, 0});
    zvdb::Polyline* linha = fio({{20, 190, 0}, {20, 100, 0}}, "70");
    CCFioDataReader leitor;
    // The second walk finds the wire's reading kept from the first.
    for (int vez = 0; vez < 2; ++vez) {
        le(leitor);
        ASSERT_EQ(itens_.size(), 1u);
        EXPECT_EQ(itens_[0]->valorCampo("FIO"), "70");
        itens_.destruirItens();
    }
    linha->setXData(
        "KVR_ZV_WIRE",
        zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f71").text("COR\fAZ").tags());
    CEItemLista depois;
    leitor.LeFio(QString(), depois, id(linha), &modelo_);
    EXPECT_EQ(depois.valorCampo("FIO"), "71");
    EXPECT_EQ(depois.valorCampo("COR"), "AZ");
    le(leitor);
    ASSERT_EQ(itens_.size(), 1u);
    EXPECT_EQ(itens_[0]->valorCampo("FIO"), "71");
}

TEST_F(WireReaderTest, APolylineWithASymbolsKeyTooTakesItsWireKeyFromItsOwnTexts) {
    zvdb::Polyline* linha = fio({{0, 10, 0}, {10, 10, 0}}, "80");
    linha->setXData("KVR_ZV", zvsample::XDataItems().text("7001\f1").tags());
    const zvdb::Polyline* simples = fio({{0, 20, 0}, {10, 20, 0}}, "81");
    CCFioDataReader leitor;
    CEItemLista item, outro;
    leitor.LeFio(QString(), item, id(linha), &modelo_);
    leitor.LeFio(QString(), outro, id(simples), &modelo_);
    // The wire's own key and what the catalogue lists of it; the columns follow the key the
    // polyline answers to, the symbol's.
    EXPECT_EQ(item.valorCampo("ZV_KEY"), "10006");
    EXPECT_EQ(item.valorCampo("DESCRICAO"), outro.valorCampo("DESCRICAO"));
    EXPECT_FALSE(outro.valorCampo("DESCRICAO").isEmpty());
    EXPECT_EQ(outro.valorCampo("REFERENCIA"), "FX-1.5-BK");
    EXPECT_NE(item.valorCampo("REFERENCIA"), "FX-1.5-BK");
}

class FiltroTemplate : public TemplateDouble {
public:
    bool FiltraItem(const CEItemLista& item) override { return item.valorCampo("FIO") != "51"; }
};

TEST_F(WireReaderTest, TheTemplatesFilterRefusesWires) {
    fio({{0, 10, 0}, {10, 10, 0}}, "50");
    fio({{0, 20, 0}, {10, 20, 0}}, "51");
    FiltroTemplate filtro;
    CCFioDataReader leitor;
    std::unique_ptr<VetorItens> lidos(leitor.LeFios(std::nullopt, &filtro, nullptr));
    ASSERT_EQ(lidos->size(), 1u);
    EXPECT_EQ((*lidos)[0]->valorCampo("FIO"), "50");
    lidos->destruirItens();
}

// ---- pages

class WirePagesTest : public FioFixture {
protected:
    void SetUp() override {
        FioFixture::SetUp();
        borne("X1", "1", {20, 200, 0});
        componente("-K1", {{"A1", {20, 150, 0}}});
        componente("-K2", {{"A1", {50, 150, 0}}}, "BOBINA", kPagina2);
        borne("X2", "1", {50, 100, 0}, kPagina2);
        fio({{20, 190, 0}, {20, 150, 0}}, "12");
        fio({{50, 150, 0}, {50, 100, 0}}, "12", kPagina2);
        fio({{90, 150, 0}, {90, 100, 0}}, "13", kPagina2);
    }
};

TEST_F(WirePagesTest, OnlyTheSecondPageStillGivesTheWholeChainOfAWireThatStartsOnTheFirst) {
    CCFioDataReader leitor;
    le(leitor, QStringList{kPagina2});
    EXPECT_EQ(cadeias(), QStringList({">", "X1:1/>-K1:A1 -K1:A1>-K2:A1 -K2:A1>X2:1/"}));
}

TEST_F(WirePagesTest, AnEmptyPageListReadsNothingAndNoListReadsEveryPage) {
    CCFioDataReader vazio;
    EXPECT_TRUE(le(vazio, QStringList()).empty());
    CCFioDataReader todos;
    le(todos);
    EXPECT_EQ(itens_.size(), 4u);
    EXPECT_EQ(cadeias(), QStringList({">", "X1:1/>-K1:A1 -K1:A1>-K2:A1 -K2:A1>X2:1/"}));
}

TEST_F(WirePagesTest, ThePagePickerOfTheTemplateChoosesThePages) {
    auto* ui = dynamic_cast<zvhost::ConsoleUserInterface*>(app_->userInterface());
    ASSERT_TRUE(ui);
    ui->setAnswer("pages", kPagina1);
    modelo_.simbolos["*SELECAO_PAG_FIOS*"] = true;
    CCFioDataReader leitor;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
    itens_.juntarSemRepetir(*lidos);
    // Wire 13 lies on the second page only.
    EXPECT_EQ(itens_.size(), 3u);
    for (const CEItemLista* item : itens_)
        EXPECT_EQ(item->valorCampo("FIO"), "12");
    // The pipeline's page list is not the reader's business.
    modelo_.simbolos["*SELECAO_PAG_FIOS*"] = false;
    CCFioDataReader semPicker;
    std::unique_ptr<VetorItens> todos(
        semPicker.LerDados(&db(), QStringList{kPagina1}, modelo_, progresso));
    EXPECT_EQ(todos->size(), 4u);
    todos->destruirItens();
}

// ---- the fields a list keeps of the ends

class WireListFieldsTest : public FioFixture {
protected:
    void SetUp() override {
        FioFixture::SetUp();
        borne("X1", "1", {20, 200, 0});
        componente("-K1", {{"A1", {20, 150, 0}}});
        zvdb::BlockReference* pino =
            simbolo("PIN-1", {20, 120, 0}, {{"ID_PINO", "3", {25, 115, 0}}}, "9011");
        pino->setXData("ZV_PINO", zvsample::XDataItems().text("-X5").tags());
        borne("X1", "2", {20, 80, 0});
        fio({{20, 190, 0}, {20, 150, 0}, {20, 120, 0}, {20, 80, 0}}, "12");
        CICad::SetStringLisp("*DIRETORIO_REDE*", pasta_.path() + "/");
        modelo_.simbolos["FUNCAO_LSTGRW"] = "LISTAS";
        modelo_.simbolos["LISTA_DETALHE"] = "BLOCOS\\LINHA";
    }
    // The row block's file, with these attribute definitions (tag and default text).
    void linha(const std::vector<std::pair<std::string, std::string>>& atributos) {
        zvdb::Database bloco;
        double x = 0;
        for (const auto& [tag, valor] : atributos)
            bloco.modelSpace()->addAttributeDefinition(tag, tag, valor, {x += 10, -4, 0}, 2.0);
        const QString caminho = pasta_.filePath("BLOCOS/LINHA.dxf");
        QDir().mkpath(QFileInfo(caminho).path());
        zvdb::DxfWriter::saveFile(bloco, caminho.toStdString());
    }
    // Each stretch's fields as "name=value", in the reader's order.
    std::vector<QStringList> campos(const VetorItens& itens) {
        std::vector<QStringList> todos;
        for (const CEItemLista* item : itens) {
            QStringList deste;
            for (auto c = item->campos.begin(); c != item->campos.end(); ++c)
                deste << c.key() + "=" + c.value();
            todos.push_back(deste);
        }
        return todos;
    }
    std::vector<QStringList> lista() {
        CCFioDataReader leitor;
        return lista(leitor);
    }
    std::vector<QStringList> lista(CCFioDataReader& leitor) {
        CIProgress progresso;
        std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
        const std::vector<QStringList> lidas = campos(*lidos);
        lidos->destruirItens();
        return lidas;
    }
};

TEST_F(WireListFieldsTest, TheStretchesKeepWhatTheListReadsAndAFunctionKeepsEveryField) {
    CCFioDataReader leitor;
    const std::vector<QStringList> inteiros = campos(le(leitor));
    ASSERT_EQ(inteiros.size(), 3u);
    // A full reading holds every field of the wire and of its ends, and what the walk wrote.
    for (const char* campo : {"WIRE_LISTA", "DESCRICAO", "QTD_INI", "DESCRICAO_FIM", "FIO_SEGFIM",
                              "HANDLE_INI", "LAYER_INI", "REL_INI", "LENGTH"})
        ASSERT_FALSE(inteiros[0].filter(QRegularExpression(QString("^") + campo + "=")).isEmpty())
            << campo;
    linha({{"VARIAVEL_1", "FIO"}, {"VARIAVEL_2", "zv_key_fim"}, {"VARIAVEL_3", "FIO_SEGINI"}});
    const std::vector<QStringList> lidos = lista();
    ASSERT_EQ(lidos.size(), inteiros.size());
    // The cells' fields, the length and the ends' relations (the routes look them up), as a
    // full reading gives them: the relations come from fields the walk read and dropped.
    const QRegularExpression daLista(
        "^(FIO|ZV_KEY_FIM|FIO_SEGINI|COMPRIMENTO|RELACAO_INI|RELACAO_FIM)=");
    for (size_t k = 0; k < lidos.size(); ++k)
        EXPECT_EQ(lidos[k].join(' ').toStdString(),
                  inteiros[k].filter(daLista).join(' ').toStdString());
    // The pin's end: its connector and pin.
    EXPECT_TRUE(std::any_of(lidos.begin(), lidos.end(), [](const QStringList& campos) {
        return campos.contains("RELACAO_FIM=-X5:3");
    }));
    // Without a cell at the wire found at an end, the wire is not looked for there, and each
    // polyline's reading goes whole into its item.
    linha({{"VARIAVEL_1", "FIO"}, {"VARIAVEL_2", "DESCRICAO"}, {"VARIAVEL_3", "GRUPO"}});
    const std::vector<QStringList> semSegmento = lista();
    ASSERT_EQ(semSegmento.size(), inteiros.size());
    const QRegularExpression semSegmentoDaLista(
        "^(FIO|DESCRICAO|GRUPO|COMPRIMENTO|RELACAO_INI|RELACAO_FIM)=");
    for (size_t k = 0; k < semSegmento.size(); ++k)
        EXPECT_EQ(semSegmento[k].join(' ').toStdString(),
                  inteiros[k].filter(semSegmentoDaLista).join(' ').toStdString());
    // The same reader reads every field again once the list is made.
    CCFioDataReader mesmo;
    lista(mesmo);
    itens_.destruirItens();
    const std::vector<QStringList> depois = campos(le(mesmo));
    ASSERT_EQ(depois.size(), inteiros.size());
    for (size_t k = 0; k < depois.size(); ++k)
        EXPECT_EQ(depois[k].join(' ').toStdString(), inteiros[k].join(' ').toStdString());

    // A function in the row may read any field: every one is kept.
    linha({{"VARIAVEL_1", "FIO"}, {"FUNCAO_1", "(cdr (assoc \"QTD_INI\" reg))"}});
    const std::vector<QStringList> todos = lista();
    ASSERT_EQ(todos.size(), inteiros.size());
    for (size_t k = 0; k < todos.size(); ++k)
        EXPECT_EQ(todos[k].join(' ').toStdString(), inteiros[k].join(' ').toStdString());
}

// ---- the fields the terminal list keeps of a terminal's sides

class TerminalSidesTest : public FioFixture {
protected:
    // Each terminal's fields as "name=value"; with `nomes`, the reader copies of its sides only
    // those the list reads.
    std::vector<QStringList> bornes(const std::optional<QSet<QString>>& nomes) {
        CCBorneDataReader leitor;
        if (nomes) leitor.CamposDaLista = [&nomes](CETemplate&) { return nomes; };
        CIProgress progresso;
        std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
        std::vector<QStringList> todos;
        for (const CEItemLista* item : *lidos) {
            QStringList deste;
            for (auto c = item->campos.begin(); c != item->campos.end(); ++c)
                deste << c.key() + "=" + c.value();
            todos.push_back(deste);
        }
        lidos->destruirItens();
        return todos;
    }
};

TEST_F(TerminalSidesTest, ASideKeepsWhatTheListReadsAndWhatItsRelationIsMadeOf) {
    borne("X1", "1", {20, 200, 0});
    borne("X2", "5", {20, 150, 0});
    componente("-K1", {{"A1", {20, 100, 0}}});
    fio({{20, 190, 0}, {20, 150, 0}}, "12");
    fio({{20, 140, 0}, {20, 100, 0}}, "13");
    const std::vector<QStringList> inteiros = bornes(std::nullopt);
    ASSERT_EQ(inteiros.size(), 2u);
    const QStringList todos = inteiros[0] + inteiros[1];
    // A full reading holds the neighbours' and wires' fields; the terminal met as neighbour
    // gives its strip and number as the relation.
    for (const char* campo : {"DESCRICAO_INI", "QTD_FIM", "FIO_SEGINI", "REGUA_FIM"})
        EXPECT_FALSE(todos.filter(QRegularExpression(QString("^") + campo + "=")).isEmpty())
            << campo;
    EXPECT_TRUE(todos.contains("RELACAO_FIM=X1:1"));
    // A list that reads one field of a wire: the terminals' own fields, that one, and the
    // relations with what they are made of, as the full reading gives them.
    const QRegularExpression lido(
        "^([A-Z_0-9]+(?<!_INI|_FIM|_SEGINI|_SEGFIM)|FIO_SEGINI|"
        "(RELACAO|TAG|ETIQUETA|REGUA|STRIP|REGLETA|NUMERO|NUMBER)_(INI|FIM))=");
    const std::vector<QStringList> lidos = bornes(QSet<QString>{"FIO_SEGINI"});
    ASSERT_EQ(lidos.size(), inteiros.size());
    for (size_t k = 0; k < lidos.size(); ++k) {
        const QStringList esperado = inteiros[k].filter(lido);
        EXPECT_EQ(lidos[k].join('|').toStdString(), esperado.join('|').toStdString());
        EXPECT_LT(esperado.size(), inteiros[k].size());
    }
}

// ---- the relation texts of an end

class EndTextTest : public FioFixture {
protected:
    QString compoe(CEItemLista& item, const QString& ligacao, CETemplate* modelo) {
        CCFioDataReader leitor;
        std::unique_ptr<zv::CEAtributo> atributo;
        if (!ligacao.isNull())
            atributo =
                std::make_unique<zv::CEAtributo>("LIGACAO1", "", ligacao, OdDbObjectId(), false);
        leitor.ComporRelacaoFio("_FIM", item, modelo, atributo.get());
        return item.valorCampo("RELACAO_FIM") + "|" + item.valorCampo("TAG_FIM") + "|" +
               item.valorCampo("ETIQUETA_FIM") + "|" + item.valorCampo("REL_FIM") + "|" +
               item.valorCampo("LIG_FIM");
    }
    static CEItemLista campos(const std::vector<std::pair<QString, QString>>& pares) {
        CEItemLista item;
        for (const auto& [k, v] : pares)
            item.definirCampo(k, v);
        return item;
    }
};

TEST_F(EndTextTest, ATerminalIsStripAndNumberInEitherOrder) {
    CEItemLista borne = campos({{"REGUA_FIM", "X1"}, {"NUMERO_FIM", "7"}});
    EXPECT_EQ(compoe(borne, "A", &modelo_), "X1:7/A|X1:7/A|X1:7/A|X1:7|A");
    modelo_.simbolos["*ORDEM_CONCAT_STD*"] = "2";
    CEItemLista outra = campos({{"REGUA_FIM", "X1"}, {"NUMERO_FIM", "7"}});
    EXPECT_EQ(compoe(outra, "A", &modelo_), "A/7:X1|A/7:X1|A/7:X1|X1:7|A");
}

TEST_F(EndTextTest, ASeparatorOfTheTemplateOrOfTheExportSettingsStandsBetween) {
    modelo_.simbolos["*CHAR_SEP_STD_CFG*"] = ".";
    modelo_.simbolos["*CHAR_SEP_LIG_CFG*"] = "_";
    CEItemLista borne = campos({{"STRIP_FIM", "X2"}, {"NUMBER_FIM", "3"}});
    EXPECT_EQ(compoe(borne, "B", &modelo_), "X2.3_B|X2.3_B|X2.3_B|X2.3|B");
    // Without a separator of its own the first is ":", the second nothing.
    modelo_.simbolos.clear();
    CEItemLista semSep = campos({{"REGUA_FIM", "X2"}, {"NUMERO_FIM", "3"}});
    EXPECT_EQ(compoe(semSep, "B", &modelo_), "B3:X2|B3:X2|B3:X2|X2:3|B");
    // Without a template (the exports): the export symbols, relation first.
    CICad::SetStringLisp("*EXPORT_CHAR_SEP*", "-");
    CICad::SetStringLisp("*EXPORT_CHAR_SEP_LIG*", "+");
    CEItemLista exportado = campos({{"REGUA_FIM", "X2"}, {"NUMERO_FIM", "3"}});
    EXPECT_EQ(compoe(exportado, "B", nullptr), "X2-3+B|X2-3+B|X2-3+B|X2-3|B");
}

TEST_F(EndTextTest, TheLastLanguageWithStripAndNumberWritesTheText) {
    CEItemLista borne = campos({{"REGUA_FIM", "X1"},
                                {"NUMERO_FIM", "7"},
                                {"REGLETA_FIM", "XS"},
                                {"STRIP_FIM", "XE"},
                                {"NUMBER_FIM", "9"}});
    // Spanish pairs REGLETA with NUMERO and comes last; REL takes the first language.
    EXPECT_EQ(compoe(borne, "", &modelo_), "XS:7/|XS:7/|XS:7/|X1:7|");
}

TEST_F(EndTextTest, AnyOtherElementIsItsRelationAndConnection) {
    CEItemLista rele = campos({{"RELACAO_FIM", "-K1"}});
    EXPECT_EQ(compoe(rele, "A2", &modelo_), "-K1:A2|-K1:A2|-K1:A2|-K1|A2");
    CEItemLista ingles = campos({{"TAG_FIM", "-K9"}});
    EXPECT_EQ(compoe(ingles, QString(), &modelo_), "-K9:|-K9:|-K9:|-K9|");
    modelo_.simbolos["*ORDEM_CONCAT_STD*"] = "0";
    CEItemLista invertido = campos({{"RELACAO_FIM", "-K1"}});
    EXPECT_EQ(compoe(invertido, "A2", &modelo_), "A2:-K1|A2:-K1|A2:-K1|-K1|A2");
    // Nothing to name the element by: empty texts, the connection still kept.
    CEItemLista nada = campos({{"OUTRO_FIM", "?"}});
    EXPECT_EQ(compoe(nada, "A2", &modelo_), "||||A2");
}

TEST_F(EndTextTest, APinIsItsConnectorAndPinAndComesBeforeEverythingElse) {
    CEItemLista pino =
        campos({{"CONECTOR_FIM", "-X5"}, {"ID_PINO_FIM", "3"}, {"RELACAO_FIM", "-K1"}});
    // The pin's own connection attribute does not count: LIG is the pin.
    EXPECT_EQ(compoe(pino, "A1", &modelo_), "-X5:3|||-X5|3");
    modelo_.simbolos["*ORDEM_CONCAT_STD*"] = "0";
    CEItemLista ingles = campos({{"CONECTOR_FIM", "-X5"}, {"ID_PIN_FIM", "4"}});
    EXPECT_EQ(compoe(ingles, "", &modelo_), "|4:-X5|4:-X5|-X5|4");
    // A pin field without a connector is no pin.
    CEItemLista solto = campos({{"ID_PINO_FIM", "3"}, {"RELACAO_FIM", "-K1"}});
    EXPECT_EQ(compoe(solto, "A1", &modelo_), "A1:-K1|A1:-K1|A1:-K1|-K1|A1");
}

// The names an end reads are found by number once they exist: a name that no item had when
// an end first asked for it is seen as soon as some item gets it.
TEST_F(EndTextTest, ANameUnknownAtTheFirstEndIsSeenOnceAnItemHasIt) {
    CCFioDataReader leitor;
    const auto atributo =
        std::make_unique<zv::CEAtributo>("LIGACAO1", "", "A", OdDbObjectId(), false);
    // A suffix no other test uses: its names are new to the program.
    const QString s = "_PONTA_NOVA";
    CEItemLista vazio;
    leitor.ComporRelacaoFio(s, vazio, &modelo_, atributo.get());
    EXPECT_EQ(vazio.valorCampo("REL" + s), "");
    EXPECT_EQ(vazio.valorCampo("LIG" + s), "A");
    CEItemLista borne = campos({{"REGUA" + s, "X1"}, {"NUMERO" + s, "7"}});
    leitor.ComporRelacaoFio(s, borne, &modelo_, atributo.get());
    EXPECT_EQ(borne.valorCampo("REL" + s), "X1:7");
    EXPECT_EQ(borne.valorCampo("RELACAO" + s), "X1:7/A");
    CEItemLista pino = campos({{"CONECTOR" + s, "-X5"}, {"ID_PINO" + s, "3"}});
    leitor.ComporRelacaoFio(s, pino, &modelo_, atributo.get());
    EXPECT_EQ(pino.valorCampo("REL" + s), "-X5");
    EXPECT_EQ(pino.valorCampo("LIG" + s), "3");
    EXPECT_EQ(pino.valorCampo("RELACAO" + s), "-X5:3");
}

TEST_F(EndTextTest, APinBlockOnAWireGivesItsConnectorFromTheDrawing) {
    zvdb::BlockReference* pino =
        simbolo("PIN-1", {20, 150, 0}, {{"ID_PINO", "3", {25, 145, 0}}}, "9011");
    pino->setXData("ZV_PINO", zvsample::XDataItems().text("-X5").tags());
    borne("X1", "1", {20, 200, 0});
    fio({{20, 190, 0}, {20, 150, 0}}, "12");
    CCFioDataReader leitor;
    le(leitor);
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-X5:3"}));
    EXPECT_EQ(itens_[0]->valorCampo("LIG_FIM"), "3");
}

// ---- ferrules

TEST_F(WireReaderTest, FerrulesBreakTheWireAtEveryElement) {
    borne("X1", "1", {20, 200, 0});
    componente("-K1", {{"A1", {20, 150, 0}}});
    borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 150, 0}, {20, 100, 0}}, "12");
    // An equipment in and out: its two stretches start at it and become one.
    borne("X2", "1", {120, 200, 0}, kPagina2);
    zvdb::BlockReference* e =
        componente("-A1", {{"I1", {120, 170, 0}}, {"I2", {120, 160, 0}}}, "CLP", kPagina2);
    e->setXData("KVR_ZV_EQUIPO", zvsample::XDataItems().text("EQUIPO").tags());
    borne("X2", "2", {120, 100, 0}, kPagina2);
    fio({{120, 190, 0}, {120, 170, 0}, {120, 160, 0}, {120, 100, 0}}, "13", kPagina2);
    CCFioDataReader leitor;
    std::unique_ptr<VetorItens> lidos(leitor.LeAnilhas({}, &modelo_, nullptr));
    itens_.juntarSemRepetir(*lidos);
    for (const CEItemLista* item : itens_)
        EXPECT_EQ(item->valorCampo("ZV_LISTA_TIPO"), "ANILHA");
    EXPECT_EQ(cadeias(), QStringList({"X1:1/>-K1:A1 -K1:A1>X1:2/", "X2:1/>-A1:I1 -A1:I1>-A1:I2"}));
    EXPECT_EQ(itens_.size(), 4u);
    // The PAGINAS option keeps the wires of those pages.
    CCFioDataReader pagina;
    std::unique_ptr<VetorItens> segunda(
        pagina.LeAnilhas({{"PAGINAS", QString(kPagina2) + ";"}}, &modelo_, nullptr));
    ASSERT_EQ(segunda->size(), 2u);
    for (const CEItemLista* item : *segunda)
        EXPECT_EQ(item->valorCampo("FIO"), "13");
    segunda->destruirItens();
}

}  // namespace
