// Accessories of a symbol: units as rows, zero rows, the symbol's own pairs, recursion and
// its guard, and bad extended data.
#include "ReaderFixture.h"
#include "drawing/Polyline.h"
#include "lists/TemplateDouble.h"
#include "readers/CCMaterialDataReader.h"

#include <QMap>

#include <memory>

namespace {

class AccessoriesTest : public ReaderFixture {
protected:
    // The owner's accessories as "KEY/QTD" texts, in order; the items are freed.
    QStringList Expande(CEItemLista& dono, CETemplate* modelo) {
        CCMaterialDataReader leitor;
        VetorItens itens = leitor.ExpandeAcessorios(dono, nullptr, modelo, {}, QString());
        QStringList textos;
        for (CEItemLista* item : itens) {
            EXPECT_EQ(item->valorCampo("ZV_LISTA_TIPO"), "ACE");
            textos << item->valorCampo("ZV_KEY") + "/" + item->valorCampo("QTD");
        }
        itens.destruirItens();
        return textos;
    }
    CEItemLista Dono(const OdDbObjectId& id, const QString& qtd = "1") {
        CEItemLista dono;
        dono.ids.push_back(id);
        dono.definirCampo("QTD", qtd);
        return dono;
    }
};

TEST_F(AccessoriesTest, CatalogueQuantitiesAreUnitsAndAZeroKeyCountedElsewhereHasNoZeroRow) {
    CEItemLista dono = Dono(Simbolo("K", "A1", "ESQ$0001$A"), "2");
    TemplateDouble modelo;
    const QStringList textos = Expande(dono, &modelo);
    // Three units of B3 and two of Z0, each with the owner's quantity; Z0's zero entry is
    // not a row of its own, since Z0 is counted.
    EXPECT_EQ(textos, QStringList({"B3/2", "B3/2", "B3/2", "Z0/2", "Z0/2"}));
    EXPECT_EQ(dono.valorCampo("ZV_KEY"), "A1");
}

TEST_F(AccessoriesTest, AnUnlistedOwnerStillHasItsAccessories) {
    // NL is not listed, but its accessory B3 is: the owner's flag does not matter here.
    CEItemLista dono = Dono(Simbolo("K", "NL", "ESQ$0001$A"));
    EXPECT_EQ(Expande(dono, nullptr), QStringList({"B3/1"}));
}

TEST_F(AccessoriesTest, ACycleStopsAtTheSecondVisitAndWithoutATemplateOneLevelIsExpanded) {
    CEItemLista dono = Dono(Simbolo("K", "CA", "ESQ$0001$A"));
    TemplateDouble recursivo;
    recursivo.simbolos["PBLACERECUR"] = true;
    // CA gives CB, CB gives CA again, whose own expansion stops: CA is on the path.
    EXPECT_EQ(Expande(dono, &recursivo), QStringList({"CB/1", "CA/1"}));
    TemplateDouble plano;
    EXPECT_EQ(Expande(dono, &plano), QStringList({"CB/1"}));
    EXPECT_EQ(Expande(dono, nullptr), QStringList({"CB/1"}));
}

TEST_F(AccessoriesTest, TheSymbolsOwnPairsCountAndBadOnesNeitherCrashNorLoop) {
    const OdDbObjectId id = Simbolo("K", "SO", "ESQ$0001$A");
    // Quantity first, then the key; a quantity that is no number reads 0 and makes a zero
    // row; the lone last string has no partner and is left out.
    CICad::SetXData(id, "ZV_VINC_ADITIVO",
                    {{1000, "2"}, {1000, "SY"}, {1000, "abc"}, {1000, "Z0"}, {1000, "7"}});
    CEItemLista dono = Dono(id);
    TemplateDouble modelo;
    EXPECT_EQ(Expande(dono, &modelo), QStringList({"SY/1", "SY/1", "Z0/0"}));

    // A symbol that names itself as its own accessory, with recursion on: one level more,
    // then the path stops it.
    const OdDbObjectId ciclo = Simbolo("K", "SY", "ESQ$0001$A", {}, 20);
    CICad::SetXData(ciclo, "ZV_VINC_ADITIVO", {{1000, "1"}, {1000, "SY"}});
    CEItemLista proprio = Dono(ciclo);
    modelo.simbolos["PBLACERECUR"] = true;
    EXPECT_EQ(Expande(proprio, &modelo), QStringList({"SY/1"}));
}

TEST_F(AccessoriesTest, AHugeQuantityIsCutInsteadOfExhaustingMemory) {
    const OdDbObjectId id = Simbolo("K", "SO", "ESQ$0001$A");
    CICad::SetXData(id, "ZV_VINC_ADITIVO", {{1000, "2000000000"}, {1000, "SY"}});
    CEItemLista dono = Dono(id);
    const QStringList textos = Expande(dono, nullptr);
    EXPECT_EQ(textos.size(), 100000);
    EXPECT_EQ(textos.front(), "SY/1");
}

// A material reader that keeps what the accessories ask of the symbols it reads.
class LeitorQueGuarda : public CCMaterialDataReader {
public:
    LeitorQueGuarda() { GuardaAcessorios = true; }
};

QStringList Textos(VetorItens itens) {
    QStringList textos;
    for (CEItemLista* item : itens)
        textos << item->valorCampo("ZV_KEY") + "/" + item->valorCampo("QTD");
    itens.destruirItens();
    return textos;
}

TEST_F(AccessoriesTest, WhatASymbolsReadingKeptServesUntilTheDrawingChanges) {
    const OdDbObjectId id = Simbolo("K", "SO", "ESQ$0001$A");
    CICad::SetXData(id, "ZV_VINC_ADITIVO", {{1000, "2"}, {1000, "SY"}});
    LeitorQueGuarda leitor;
    TemplateDouble modelo;
    std::unique_ptr<CEItemLista> item(leitor.CriaItemBloco(id, modelo));
    ASSERT_NE(item, nullptr);
    // The owner's key is the symbol's, whatever the item says.
    item->definirCampo("ZV_KEY", "OUTRA");
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*item, nullptr, &modelo, {}, QString())),
              QStringList({"SY/1", "SY/1"}));
    EXPECT_EQ(item->valorCampo("ZV_KEY"), "SO");
    // Changed since the reading: the symbol is read again.
    CICad::SetXData(id, "ZV_VINC_ADITIVO", {{1000, "1"}, {1000, "Z0"}});
    CICad::SetXData(id, "KVR_ZV", {{1000, QString("SY") + QChar(0x0C) + "1"}});
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*item, nullptr, &modelo, {}, QString())),
              QStringList({"Z0/1"}));
    EXPECT_EQ(item->valorCampo("ZV_KEY"), "SY");
}

// Symbols that read alike keep one reading between them; a symbol with pairs of its own, or
// with another standard, keeps its own, read after all of them as well as right away.
TEST_F(AccessoriesTest, EverySymbolExpandsFromItsOwnReadingAmongManyAlike) {
    const OdDbObjectId primeiro = Simbolo("K", "A1", "ESQ$0001$A", {}, 0);
    const OdDbObjectId pares = Simbolo("K", "A1", "ESQ$0001$A", {}, 10);
    CICad::SetXData(pares, "ZV_VINC_ADITIVO", {{1000, "2"}, {1000, "SY"}});
    const OdDbObjectId outraNorma = Simbolo("K", "A1", "ESQ$0001$A", {}, 20);
    CICad::SetXData(outraNorma, "KVR_ZV", {{1000, QString("A1") + QChar(0x0C) + "2"}});
    const OdDbObjectId ultimo = Simbolo("K", "A1", "ESQ$0001$A", {}, 30);
    const OdDbObjectId outraChave = Simbolo("K", "SO", "ESQ$0001$A", {}, 40);
    CICad::SetXData(outraChave, "ZV_VINC_ADITIVO", {{1000, "1"}, {1000, "Z0"}});
    const QStringList simples = {"B3/1", "B3/1", "B3/1", "Z0/1", "Z0/1"};
    // Its units are not listed under that standard.
    CEItemLista donoNorma = Dono(outraNorma);
    const QStringList daNorma = Expande(donoNorma, nullptr);
    ASSERT_EQ(daNorma, QStringList());
    const std::vector<std::pair<OdDbObjectId, QStringList>> esperados = {
        {primeiro, simples},
        {pares, simples + QStringList{"SY/1", "SY/1"}},
        {outraNorma, daNorma},
        {ultimo, simples},
        {outraChave, {"Z0/1"}}};
    LeitorQueGuarda leitor;
    TemplateDouble modelo;
    std::vector<std::unique_ptr<CEItemLista>> itens;
    for (const auto& [id, textos] : esperados) {
        itens.emplace_back(leitor.CriaItemBloco(id, modelo));
        ASSERT_NE(itens.back(), nullptr);
    }
    // The drawing changes no more, so that what was kept is what answers.
    for (size_t i = 0; i < itens.size(); ++i)
        EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*itens[i], nullptr, nullptr, {}, QString())),
                  esperados[i].second)
            << i;
}

TEST_F(AccessoriesTest, AWiresItemKeepsItsKeyAndAccessoriesFromTheWalkThatFoundItsKey) {
    zvdb::Polyline* linha =
        db().modelSpace()->addLwPolyline({{0, 0, 0}, {10, 0, 0}}, false, "ESQ$0001$A");
    const OdDbObjectId fio = Id(linha);
    CICad::SetXData(fio, "KVR_ZV_WIRE", {{1000, QString("SO") + QChar(0x0C) + "1"}});
    CICad::SetXData(fio, "ZV_VINC_ADITIVO", {{1000, "3"}, {1000, "Z0"}});
    LeitorQueGuarda leitor;
    TemplateDouble modelo;
    std::unique_ptr<CEItemLista> item(leitor.CriaItemFio(fio, modelo));
    ASSERT_NE(item, nullptr);
    item->definirCampo("ZV_KEY", "OUTRA");
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*item, nullptr, &modelo, {}, QString())),
              QStringList({"Z0/1", "Z0/1", "Z0/1"}));
    EXPECT_EQ(item->valorCampo("ZV_KEY"), "SO");
    CICad::SetXData(fio, "ZV_VINC_ADITIVO", {{1000, "1"}, {1000, "SY"}});
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*item, nullptr, &modelo, {}, QString())),
              QStringList({"SY/1"}));
    // A polyline without a key, or with an empty key text, makes no item.
    const OdDbObjectId semChave =
        Id(db().modelSpace()->addLwPolyline({{0, 5, 0}, {10, 5, 0}}, false, "ESQ$0001$A"));
    EXPECT_EQ(std::unique_ptr<CEItemLista>(leitor.CriaItemFio(semChave, modelo)), nullptr);
    CICad::SetXData(semChave, "KVR_ZV_WIRE", {{1000, ""}});
    EXPECT_EQ(std::unique_ptr<CEItemLista>(leitor.CriaItemFio(semChave, modelo)), nullptr);
}

TEST_F(AccessoriesTest, EveryUnitHasItsOwnersQuantityWhateverOwnersCameBefore) {
    const OdDbObjectId id = Simbolo("K", "A1", "ESQ$0001$A");
    CCMaterialDataReader leitor;
    TemplateDouble modelo;
    // More quantities than a base keeps, and some of them again.
    QStringList quantidades = {"2", "5", "2", "", "5"};
    for (int q = 10; q < 30; ++q)
        quantidades << QString::number(q);
    quantidades << "2"
                << "11"
                << "29";
    for (const QString& qtd : quantidades) {
        CEItemLista dono = Dono(id, qtd);
        const QString q = qtd.isEmpty() ? "1" : qtd;
        EXPECT_EQ(Textos(leitor.ExpandeAcessorios(dono, nullptr, &modelo, {}, QString())),
                  QStringList({"B3/" + q, "B3/" + q, "B3/" + q, "Z0/" + q, "Z0/" + q}))
            << qtd.toStdString();
    }
}

QMap<QString, QString> Campos(const CEItemLista& item) {
    QMap<QString, QString> campos;
    for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it)
        campos.insert(it.key(), it.value());
    return campos;
}

// The units of one key and quantity read one array, whoever owns them; each reads what a
// copy of its own held, and a change to one unit leaves the others as they were.
TEST_F(AccessoriesTest, UnitsOfAKeyAndQuantityShareOneArrayAndAChangeStaysInItsUnit) {
    const OdDbObjectId id = Simbolo("K", "A1", "ESQ$0001$A");
    CCMaterialDataReader leitor;
    TemplateDouble modelo;
    CEItemLista dono = Dono(id, "2"), outro = Dono(id, "2");
    VetorItens itens = leitor.ExpandeAcessorios(dono, nullptr, &modelo, {}, QString());
    VetorItens outros = leitor.ExpandeAcessorios(outro, nullptr, &modelo, {}, QString());
    ASSERT_EQ(itens.size(), 5u);
    ASSERT_EQ(outros.size(), 5u);
    const QMap<QString, QString> b3 = {{"ZV_LISTA_TIPO", "ACE"},
                                       {"ZV_LISTA", "S"},
                                       {"ZV_KEY", "B3"},
                                       {"DESCRICAO", "Three of them"},
                                       {"TP_DESCRI", "Three of them"},
                                       {"QTD", "2"}};
    QMap<QString, QString> z0 = b3;
    z0["ZV_KEY"] = "Z0";
    z0["DESCRICAO"] = z0["TP_DESCRI"] = "Zero and two";
    for (size_t i = 0; i < 5; ++i) {
        const QMap<QString, QString>& esperado = i < 3 ? b3 : z0;
        EXPECT_EQ(Campos(*itens[i]), esperado) << i;
        EXPECT_TRUE(itens[i]->campos.partilhaCom(outros[i]->campos)) << i;
        EXPECT_EQ(itens[i]->campos.partilhaCom(itens[0]->campos), i < 3) << i;
    }
    itens[1]->definirCampo("QTD", "9");
    itens[1]->definirCampo("OBS", "x");
    QMap<QString, QString> mudado = b3;
    mudado["QTD"] = "9";
    mudado["OBS"] = "x";
    EXPECT_EQ(Campos(*itens[1]), mudado);
    for (size_t i : {0, 2})
        EXPECT_EQ(Campos(*itens[i]), b3) << i;
    EXPECT_EQ(Campos(*outros[1]), b3);
    EXPECT_TRUE(itens[0]->campos.partilhaCom(itens[2]->campos));
    // Another quantity is another array.
    CEItemLista terceiro = Dono(id, "3");
    VetorItens mais = leitor.ExpandeAcessorios(terceiro, nullptr, &modelo, {}, QString());
    ASSERT_EQ(mais.size(), 5u);
    EXPECT_EQ(mais[0]->valorCampo("QTD"), "3");
    EXPECT_FALSE(mais[0]->campos.partilhaCom(itens[0]->campos));
    EXPECT_EQ(Campos(*itens[0]), b3);
    for (VetorItens* v : {&itens, &outros, &mais})
        v->destruirItens();
}

TEST_F(AccessoriesTest, TheSymbolsAccessoryApplicationIsRegisteredByTheFirstExpansion) {
    const OdDbObjectId id = Simbolo("K", "A1", "ESQ$0001$A");
    const OdDbObjectId outro = Simbolo("K", "SO", "ESQ$0001$A", {}, 10);
    LeitorQueGuarda leitor;
    TemplateDouble modelo;
    std::unique_ptr<CEItemLista> item(leitor.CriaItemBloco(id, modelo));
    std::unique_ptr<CEItemLista> segundo(leitor.CriaItemBloco(outro, modelo));
    ASSERT_NE(item, nullptr);
    ASSERT_NE(segundo, nullptr);
    EXPECT_FALSE(db().isApplicationRegistered("ZV_VINC_ADITIVO"));
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*item, nullptr, &modelo, {}, QString())),
              QStringList({"B3/1", "B3/1", "B3/1", "Z0/1", "Z0/1"}));
    EXPECT_TRUE(db().isApplicationRegistered("ZV_VINC_ADITIVO"));
    // What the second symbol's reading kept still holds; pairs given to it now are read.
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*segundo, nullptr, &modelo, {}, QString())),
              QStringList());
    CICad::SetXData(outro, "ZV_VINC_ADITIVO", {{1000, "1"}, {1000, "SY"}});
    EXPECT_EQ(Textos(leitor.ExpandeAcessorios(*segundo, nullptr, &modelo, {}, QString())),
              QStringList({"SY/1"}));
}

}  // namespace
