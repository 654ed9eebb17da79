// Wire lengths along the routes of the panel layout, with the allowances, and the route
// texts of the manual wire layout, on a small schematic with its layout page.
#include "readers/FioFixture.h"

#include "cad/CELayoutRotasFios.h"

namespace {

class WireLengthTest : public FioFixture {
protected:
    void SetUp() override {
        FioFixture::SetUp();
        CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 10.0);
        CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 50.0);
        // Coil -K1 and terminal X1:1 in the schematic, with their views in the layout: the
        // coil's view has its connections A1 and A2 at (100,210) and (100,190).
        k1_ = componente("-K1", {{"A1", {20, 170, 0}}, {"A2", {20, 150, 0}}});
        x1_ = borne("X1", "1", {20, 100, 0});
        x2_ = borne("X1", "2", {60, 100, 0});
        vistaK1_ = vista(*k1_, {100, 200, 0},
                         {{"CPOINT1", "A1", {100, 210, 0}}, {"CPOINT2", "A2", {100, 190, 0}}});
        vistaX1_ = vista(*x1_, {900, -10, 0}, {});
    }

    // A layout view of a symbol: the symbol names it in KVR_LAYOUT_ESQUEMA.
    zvdb::BlockReference* vista(zvdb::BlockReference& de, zvdb::Point3 em,
                                const std::vector<Atributo>& pontos) {
        auto* ref =
            db().modelSpace()->addBlockReference(bloco("TOPO_1"), em, {1, 1, 1}, 0, kLayout);
        for (const Atributo& a : pontos)
            ref->addAttribute(a.tag, a.valor, a.em, 1.0);
        ref->setXData("KVR_LAYOUT_PAINEL", zvsample::XDataItems().handle(de.handle()).tags());
        de.setXData("KVR_LAYOUT_ESQUEMA", zvsample::XDataItems()
                                              .handle(ref->handle())
                                              .text("PAINEL_1")
                                              .handle(ref->handle())
                                              .tags());
        return ref;
    }
    zvdb::Polyline* rota(const std::vector<zvdb::Point3>& pontos, const std::string& numero) {
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline(pontos, false, kLayout);
        linha->setXData("KVR_ZV_WIRE_LAYOUT", zvsample::XDataItems().text(numero).tags());
        return linha;
    }
    // The length of each listed wire, by number (the first stretch of each).
    QHash<QString, QString> comprimentos() {
        CCFioDataReader leitor;
        le(leitor);
        QHash<QString, QString> porFio;
        for (const CEItemLista* item : itens_) {
            EXPECT_EQ(item->valorCampo("LENGTH"), item->valorCampo("COMPRIMENTO"));
            porFio.insert(item->valorCampo("FIO"), item->valorCampo("COMPRIMENTO"));
        }
        return porFio;
    }

    zvdb::BlockReference *k1_, *x1_, *x2_, *vistaK1_, *vistaX1_;
};

TEST_F(WireLengthTest, ARoutedWireGetsItsRouteLengthWithTheAllowances) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    // From the coil's A2 down 200 and across 800 to the terminal's view: 1000.
    rota({{100, 190, 0}, {100, -10, 0}, {900, -10, 0}}, "12");
    EXPECT_EQ(comprimentos().value("12"), "1150.000000");
}

TEST_F(WireLengthTest, AReaderWalkingAgainFindsTheViewsWhereTheyAreNow) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    rota({{100, 190, 0}, {100, -10, 0}, {900, -10, 0}}, "12");
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    CCFioDataReader leitor;
    le(leitor);
    ASSERT_EQ(itens_.size(), 1u);
    EXPECT_EQ(itens_[0]->valorCampo("COMPRIMENTO"), "1000.000000");
    itens_.destruirItens();
    // The coil's A2 moves down beside the route's corner: only the 800 across is left.
    ASSERT_TRUE(vistaK1_->attribute("CPOINT2"));
    vistaK1_->attribute("CPOINT2")->setPosition({100, -5, 0});
    le(leitor);
    ASSERT_EQ(itens_.size(), 1u);
    EXPECT_EQ(itens_[0]->valorCampo("COMPRIMENTO"), "800.000000");
}

TEST_F(WireLengthTest, TheRouteIsMeasuredBetweenTheVerticesNearestTheEndsOnly) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    // Vertices before the first end and beyond the second do not count: 200 + 800.
    rota({{0, 190, 0}, {100, 190, 0}, {100, -10, 0}, {900, -10, 0}, {990, -10, 0}}, "12");
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    EXPECT_EQ(comprimentos().value("12"), "1000.000000");
}

TEST_F(WireLengthTest, AWireWithoutARouteIsZeroAndOneWithoutEndsHasNoLength) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    fio({{300, 300, 0}, {350, 300, 0}}, "13");  // touches nothing
    const QHash<QString, QString> c = comprimentos();
    EXPECT_EQ(c.value("12"), "0.000000");
    ASSERT_TRUE(c.contains("13"));
    EXPECT_EQ(c.value("13"), "");
}

TEST_F(WireLengthTest, AWireWhoseOnlyRouteIsKeptAsItsSecondIsMeasuredBesideOneWithout) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    fio({{20, 170, 0}, {60, 170, 0}, {60, 100, 0}}, "13");
    // A route whose own key ends in "$" is found as the second route of "12".
    rota({{100, 190, 0}, {100, -10, 0}, {900, -10, 0}}, "12$");
    rota({{0, 0, 0}, {10, 0, 0}}, "99");
    const QHash<QString, QString> c = comprimentos();
    EXPECT_EQ(c.value("12"), "1150.000000");
    EXPECT_EQ(c.value("13"), "0.000000");
}

TEST_F(WireLengthTest, ARouteFartherThan999FromBothEndsGivesZero) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    rota({{5000, 5000, 0}, {6000, 5000, 0}}, "12");
    EXPECT_EQ(comprimentos().value("12"), "0.000000");
}

TEST_F(WireLengthTest, ARouteOfOneVertexMeasuresNothingButTheAbsoluteAllowance) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    rota({{500, 100, 0}}, "12");
    EXPECT_EQ(comprimentos().value("12"), "50.000000");
}

TEST_F(WireLengthTest, ARouteAcrossATransitionIsZeroEvenWithAPartnerMissing) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    rota({{100, 190, 0}, {100, 50, 0}}, "12");
    rota({{100, 46, 0}, {100, -10, 0}, {900, -10, 0}}, "12");
    auto* a = db().modelSpace()->addBlockReference(bloco("TRANSICAO"), {100, 50, 0}, {1, 1, 1}, 0,
                                                   kLayout);
    auto* b = db().modelSpace()->addBlockReference(bloco("TRANSICAO"), {100, 46, 0}, {1, 1, 1}, 0,
                                                   kLayout);
    auto* solta = db().modelSpace()->addBlockReference(bloco("TRANSICAO"), {200, 46, 0}, {1, 1, 1},
                                                       0, kLayout);
    a->setXData("KVR_ZV_REPRESENTACAO",
                zvsample::XDataItems().text("-50").handle(b->handle()).tags());
    b->setXData("KVR_ZV_REPRESENTACAO",
                zvsample::XDataItems().text("-50").handle(a->handle()).tags());
    a->setXData("KVR_ZV_TRANSITION", zvsample::XDataItems().handle(b->handle()).tags());
    b->setXData("KVR_ZV_TRANSITION", zvsample::XDataItems().handle(a->handle()).tags());
    solta->setXData("KVR_ZV_REPRESENTACAO",
                    zvsample::XDataItems().text("-50").text("FFFFF").tags());
    solta->setXData("KVR_ZV_TRANSITION", zvsample::XDataItems().text("FFFFF").tags());
    CCFioDataReader leitor;
    le(leitor);
    ASSERT_EQ(itens_.size(), 1u);
    EXPECT_EQ(itens_[0]->valorCampo("COMPRIMENTO"), "0.000000");
    // The transition without its partner pairs with nothing.
    ASSERT_EQ(leitor.Transicoes().size(), 2u);
    for (const auto& [de, para] : leitor.Transicoes())
        EXPECT_TRUE(de == id(a) || de == id(b));
}

TEST_F(WireLengthTest, AContactReachesTheLayoutThroughItsMaster) {
    zvdb::BlockReference* contato = simbolo("NA-1", {60, 250, 0},
                                            {{"RELACAO", "-K1", {70, 250, 0}},
                                             {"PARENT", "-K1", {70, 245, 0}},
                                             {"LIGACAO1", "13", {60, 240, 0}}},
                                            "2101");
    ASSERT_TRUE(contato);
    fio({{60, 240, 0}, {60, 110, 0}, {20, 110, 0}, {20, 100, 0}}, "17");
    // The contact's connection 13 is not a point of the coil's view: the view's position.
    rota({{100, 200, 0}, {900, 200, 0}, {900, -10, 0}}, "17");
    EXPECT_EQ(comprimentos().value("17"), "1161.000000");
}

TEST_F(WireLengthTest, AnElementWithoutAViewIsPlacedByTheViewOfItsRelation) {
    // A second coil symbol of -K1 without a view of its own.
    componente("-K1", {{"A1", {200, 170, 0}}});
    fio({{200, 170, 0}, {200, 120, 0}, {60, 120, 0}, {60, 100, 0}}, "18");
    // From the view's A1 at (100,210) to the X1:2 view at (500,0).
    vista(*x2_, {500, 0, 0}, {});
    rota({{100, 210, 0}, {500, 210, 0}, {500, 0, 0}}, "18");
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    EXPECT_EQ(comprimentos().value("18"), "660.000000");
}

TEST_F(WireLengthTest, EachStretchIsMeasuredBetweenTheElementsItJoins) {
    // A PLC entered at I1 and left at I2, with a view that has both points.
    zvdb::BlockReference* clp =
        componente("-A1", {{"I1", {20, 140, 0}}, {"I2", {20, 130, 0}}}, "CLP");
    clp->setXData("KVR_ZV_EQUIPO", zvsample::XDataItems().text("EQUIPO").tags());
    vista(*clp, {300, 170, 0},
          {{"CPOINT1", "I1", {300, 190, 0}}, {"CPOINT2", "I2", {300, 150, 0}}});
    fio({{20, 150, 0}, {20, 140, 0}, {20, 130, 0}, {20, 100, 0}}, "12");
    rota({{100, 190, 0}, {300, 190, 0}, {300, 150, 0}, {300, -10, 0}, {900, -10, 0}}, "12");
    // The same PLC first on a wire: the stretch that starts at its entry stays open.
    fio({{20, 140, 0}, {20, 130, 0}, {20, 120, 0}, {60, 120, 0}, {60, 100, 0}}, "19");
    vista(*x2_, {900, -10, 0}, {});
    rota({{300, 190, 0}, {300, 150, 0}, {300, -10, 0}, {900, -10, 0}}, "19");
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    CCFioDataReader leitor;
    le(leitor);
    QStringList trechos;
    for (const CEItemLista* item : itens_)
        trechos << item->valorCampo("FIO") + " " + item->valorCampo("RELACAO_INI") + ">" +
                       item->valorCampo("RELACAO_FIM") + " " + item->valorCampo("COMPRIMENTO");
    trechos.sort();
    EXPECT_EQ(trechos, QStringList({"12 -A1:I2>X1:1/ 760.000000", "12 -K1:A2>-A1:I1 200.000000",
                                    "19 -A1:I1> 40.000000", "19 -A1:I2>X1:2/ 760.000000"}));
}

TEST_F(WireLengthTest, StretchesBetweenTheSamePointsShareOneAnswer) {
    CCFioDataReader leitor;
    rota({{0, 0, 0}, {0, 100, 0}}, "9");
    const CEPonto a{0, 0, 0}, b{0, 100, 0}, c{0, 90, 0};
    EXPECT_EQ(leitor.ComprimentoFio("9", a, b), "160.000000");
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    EXPECT_EQ(leitor.ComprimentoFio("9", a, b), "160.000000");
    // Other points are measured anew, with the allowance as it is now.
    EXPECT_EQ(leitor.ComprimentoFio("9", a, c), "110.000000");
    EXPECT_EQ(leitor.ComprimentoFio("", a, b), "-");
    EXPECT_EQ(leitor.ComprimentoFio("8", a, b), "0.000000");
}

TEST_F(WireLengthTest, EachStretchIsMeasuredBetweenTheEntriesItsOwnRecordGives) {
    // Terminals with views along one route, gap k+1 being 10 * (k + 1) long.
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    QStringList elementos;
    std::vector<zvdb::Point3> vertices;
    double x = 0;
    for (int k = 0; k < 8; ++k) {
        zvdb::BlockReference* b = borne("X9", std::to_string(k + 1), {400.0 + 20 * k, 400, 0});
        vista(*b, {x, 0, 0}, {});
        elementos << handle(b);
        vertices.push_back({x, 0, 0});
        x += 10 * (k + 1);
    }
    rota(vertices, "12");
    CCFioDataReader leitor;
    std::vector<std::unique_ptr<CEItemLista>> cadeia;
    for (int k = 0; k < 4; ++k) {
        cadeia.push_back(std::make_unique<CEItemLista>());
        cadeia.back()->definirCampo("FIO", "12");
        if (k > 0) cadeia[size_t(k - 1)]->ligado = cadeia.back().get();
    }
    // Records out of the chain's order, one stretch open and one without a record.
    CCFioDataReader::Trechos trechos;
    trechos.acrescenta(cadeia[2].get(), {5, -1});
    trechos.acrescenta(cadeia[0].get(), {0, 2});
    trechos.acrescenta(cadeia[1].get(), {2, 5});
    leitor.CalculaComprimentos(cadeia.front().get(), elementos, &trechos);
    EXPECT_EQ(cadeia[0]->valorCampo("COMPRIMENTO").toDouble(), 10.0 + 20.0);
    EXPECT_EQ(cadeia[1]->valorCampo("COMPRIMENTO").toDouble(), 30.0 + 40.0 + 50.0);
    EXPECT_EQ(cadeia[2]->valorCampo("COMPRIMENTO").toDouble(), 60.0);
    // Without a record the fourth stretch is the fourth gap.
    EXPECT_EQ(cadeia[3]->valorCampo("COMPRIMENTO").toDouble(), 40.0);
}

TEST(WireStretchesTest, AStretchIsFoundAtItsPlaceOrElsewhereAndRemovedKeepingTheOrder) {
    CEItemLista a, b, c, fora;
    CCFioDataReader::Trechos trechos;
    trechos.acrescenta(&a, {0, -1});
    trechos.acrescenta(&b, {1, 3});
    trechos.acrescenta(&c, {3, 4});
    ASSERT_NE(trechos.procura(&b, 1), nullptr);
    EXPECT_EQ(trechos.procura(&b, 1)->fim, 3);
    // A wrong place or one past the end still finds it.
    ASSERT_NE(trechos.procura(&c, 0), nullptr);
    EXPECT_EQ(trechos.procura(&c, 0)->inicio, 3);
    ASSERT_NE(trechos.procura(&a, 9), nullptr);
    EXPECT_EQ(trechos.procura(&a, 9)->inicio, 0);
    EXPECT_EQ(trechos.procura(&fora, 0), nullptr);
    trechos.procura(&a, 0)->fim = 1;
    trechos.remove(&b);
    EXPECT_EQ(trechos.tamanho(), 2u);
    EXPECT_EQ(trechos.procura(&b, 1), nullptr);
    const CCFioDataReader::Trechos& lidos = trechos;
    ASSERT_NE(lidos.procura(&c, 1), nullptr);
    EXPECT_EQ(lidos.procura(&c, 1)->inicio, 3);
    EXPECT_EQ(lidos.procura(&a, 0)->fim, 1);
    std::vector<const CEItemLista*> ordem;
    for (const auto& [item, trecho] : lidos)
        ordem.push_back(item);
    EXPECT_EQ(ordem, (std::vector<const CEItemLista*>{&a, &c}));
    trechos.clear();
    EXPECT_EQ(trechos.procura(&a, 0), nullptr);
}

TEST_F(WireLengthTest, AChainThatComesBackOnItselfIsMeasuredOncePerStretch) {
    // Terminals with views along one route, each gap 10 longer than the one before, so the
    // length an item gets tells which stretch of the list it was measured as.
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    constexpr int kElementos = 25;
    QStringList elementos;
    std::vector<zvdb::Point3> vertices;
    double x = 0;
    for (int k = 0; k < kElementos; ++k) {
        zvdb::BlockReference* b = borne("X9", std::to_string(k + 1), {400.0 + 20 * k, 400, 0});
        vista(*b, {x, 0, 0}, {});
        elementos << handle(b);
        vertices.push_back({x, 0, 0});
        x += 10 * (k + 1);
    }
    rota(vertices, "12");
    CCFioDataReader leitor;
    // Chains short and long, each linked back to its second item at its end: every item is
    // measured once, as the stretch of its place in the chain.
    for (const int n : {3, kElementos - 1}) {
        std::vector<std::unique_ptr<CEItemLista>> cadeia;
        for (int k = 0; k < n; ++k) {
            cadeia.push_back(std::make_unique<CEItemLista>());
            cadeia.back()->definirCampo("FIO", "12");
            if (k > 0) cadeia[size_t(k - 1)]->ligado = cadeia.back().get();
        }
        cadeia.back()->ligado = cadeia[1].get();
        leitor.CalculaComprimentos(cadeia.front().get(), elementos);
        for (int k = 0; k < n; ++k)
            EXPECT_EQ(cadeia[size_t(k)]->valorCampo("COMPRIMENTO").toDouble(), 10.0 * (k + 1))
                << "chain of " << n << ", item " << k;
    }
}

TEST_F(WireLengthTest, ASecondRouteOfTheSameWireIsSearchedToo) {
    CCFioDataReader leitor;
    rota({{0, 0, 0}, {0, 100, 0}}, "9");
    rota({{500, 0, 0}, {500, 30, 0}, {540, 30, 0}}, "9");
    CICad::SetRealLisp("PBLCOMPFIOPORCENTO", 0.0);
    CICad::SetRealLisp("PBLCOMPFIOABSOLUTO", 0.0);
    EXPECT_EQ(leitor.ComprimentoFio("9", {500, 0, 0}, {540, 30, 0}), "70.000000");
    EXPECT_EQ(leitor.ComprimentoFio("9", {0, 0, 0}, {540, 30, 0}), "0.000000");
}

TEST_F(WireLengthTest, TheRouteTextOfTheManualLayoutGoesToCaminhofio) {
    fio({{20, 150, 0}, {20, 100, 0}}, "12");
    fio({{20, 170, 0}, {60, 170, 0}, {60, 100, 0}}, "13");
    CELayoutRotasFios registro;
    registro.strKeyFio = "12";
    registro.strRotaData = QString("%1:A2-%2-C1-C2-T1$%1:A1-%2-X9").arg(handle(k1_), handle(x1_));
    registro.Gravar();
    CCFioDataReader leitor;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(leitor.LerDados(&db(), std::nullopt, modelo_, progresso));
    itens_.juntarSemRepetir(*lidos);
    QHash<QString, QString> caminhos;
    for (const CEItemLista* item : itens_) {
        EXPECT_EQ(item->valorCampo("CAMINHOFIO"), item->valorCampo("PATHWIRE"));
        caminhos.insert(item->valorCampo("FIO"), item->valorCampo("CAMINHOFIO"));
    }
    EXPECT_EQ(caminhos.value("12"), "C1-C2-T1");
    // A wire without a record gets no route text at all.
    EXPECT_TRUE(caminhos.contains("13"));
    for (const CEItemLista* item : itens_) {
        if (item->valorCampo("FIO") == "13") {
            EXPECT_FALSE(item->temCampo("CAMINHOFIO"));
        }
    }
}

TEST_F(WireLengthTest, AWiresCopyReadsTheRoutesOfTheNumberItsCallerGives) {
    const zvdb::Polyline* doze = fio({{20, 150, 0}, {20, 100, 0}}, "12");
    CELayoutRotasFios registro;
    registro.strKeyFio = "13";
    registro.strRotaData = QString("%1:A2-%2-C7").arg(handle(k1_), handle(x1_));
    registro.Gravar();
    CCFioDataReader leitor;
    // Wire 12's polyline copied under a suffix into an item of wire 13: the routes read are
    // those of 13, the item's number, not of the polyline's own.
    CEItemLista item;
    const QString treze = "13";
    leitor.CopiaEntidade("_SEGINI", item, id(doze), &modelo_, &treze);
    EXPECT_EQ(item.valorCampo("FIO_SEGINI"), "12");
    ASSERT_NE(leitor.Caminhos("13"), nullptr);
    EXPECT_EQ(leitor.Caminhos("13")->size(), 1);
    EXPECT_EQ(leitor.Caminhos("12"), nullptr);
}

}  // namespace
