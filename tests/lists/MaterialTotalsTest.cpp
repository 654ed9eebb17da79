// The total block's sums of the material list: every item and every member of its chain,
// whether members share one text of their group's sum or hold texts of their own.
#include "lists/CCMaterialGrfWriter.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

#include <QMap>

#include <memory>
#include <vector>

namespace {

class MaterialTotalsTest : public ::testing::Test {
protected:
    CEItemLista* Item(const QString& campo, const QString& valor, CEItemLista* ligado = nullptr) {
        donos_.push_back(std::make_unique<CEItemLista>());
        CEItemLista* item = donos_.back().get();
        item->definirCampo("ZV_KEY", "K");
        if (!campo.isEmpty()) item->definirCampo(campo, valor);
        item->ligado = ligado;
        return item;
    }
    std::vector<std::unique_ptr<CEItemLista>> donos_;
};

TEST_F(MaterialTotalsTest, EveryMemberCountsOnceWhetherItsTextIsSharedOrItsOwn) {
    // One text shared by a chain of three (as the group sums leave it), then texts of equal
    // content each in its own memory, then other numbers and a member without the field.
    const QString partilhado = "2.5";
    CEItemLista* cadeia = Item("QTD", partilhado, Item("QTD", partilhado, Item("QTD", partilhado)));
    CEItemLista* proprios =
        Item("QTD", QString("1.25").left(4), Item("QTD", QString("1.25").left(4)));
    CEItemLista* outros = Item("QTD", "4", Item("", "", Item("QTD", "0.5")));
    const VetorItens itens{cadeia, proprios, outros};
    EXPECT_DOUBLE_EQ(CCMaterialGrfWriter::SomaCampo(itens, "QTD"), 3 * 2.5 + 2 * 1.25 + 4 + 0.5);
    // A text of another number right after a shared one is read as its own number.
    const VetorItens alternados{Item("QTD", partilhado), Item("QTD", "10"),
                                Item("QTD", partilhado)};
    EXPECT_DOUBLE_EQ(CCMaterialGrfWriter::SomaCampo(alternados, "QTD"), 15.0);
    EXPECT_DOUBLE_EQ(CCMaterialGrfWriter::SomaCampo(itens, "CAMPO_QUE_NENHUM_ITEM_TEM"), 0.0);
}

QMap<QString, QString> Campos(const CEItemLista& item) {
    QMap<QString, QString> campos;
    for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it)
        campos.insert(it.key(), it.value());
    return campos;
}

// Members that read one shared array (an accessory's units) read one array after the sums,
// per group and per array they read before; each reads what fields of its own would.
TEST_F(MaterialTotalsTest, MembersSharingFieldsShareTheirSumsAndReadWhatOwnFieldsWould) {
    auto unidade = [](const QString& qtd, const QString& obs) {
        CamposItem campos;
        campos.insert("ZV_KEY", "K");
        campos.insert("QTD", qtd);
        campos.insert("OBS", obs);
        campos.partilhar();
        return campos;
    };
    const CamposItem x = unidade("1", "x"), y = unidade("2", "y");
    // Two groups: a head of its own and members of both arrays and of their own; a head and
    // a member of the first array.
    const std::vector<std::vector<const CamposItem*>> grupos = {{nullptr, &x, &y, &x, &y, nullptr},
                                                                {&x, &x}};
    auto monta = [&](bool proprios) {
        VetorItens itens;
        for (const auto& grupo : grupos) {
            CEItemLista* anterior = nullptr;
            for (const CamposItem* campos : grupo) {
                CEItemLista* item = Item("QTD", "3");
                if (campos && proprios) item->campos.juntar(*campos);
                if (campos && !proprios) item->campos = *campos;
                (anterior ? anterior->ligado : itens.emplace_back()) = item;
                anterior = item;
            }
        }
        return itens;
    };
    VetorItens itens = monta(false), copias = monta(true);
    CCMaterialGrfWriter::SomaGrupos(itens, 0);
    CCMaterialGrfWriter::SomaGrupos(copias, 0);
    std::vector<CEItemLista*> membros, outros;
    for (size_t g = 0; g < itens.size(); ++g)
        for (CEItemLista *m = itens[g], *c = copias[g]; m || c; m = m->ligado, c = c->ligado) {
            ASSERT_TRUE(m && c);
            EXPECT_FALSE(c->campos.partilhado());
            EXPECT_EQ(Campos(*m), Campos(*c));
            membros.push_back(m);
        }
    ASSERT_EQ(membros.size(), 8u);
    EXPECT_EQ(membros[1]->valorCampo("QTD"), "12");
    EXPECT_EQ(membros[2]->valorCampo("OBS"), "y");
    EXPECT_TRUE(membros[1]->campos.partilhaCom(membros[3]->campos));
    EXPECT_TRUE(membros[2]->campos.partilhaCom(membros[4]->campos));
    EXPECT_FALSE(membros[1]->campos.partilhaCom(membros[2]->campos));
    EXPECT_FALSE(membros[0]->campos.partilhado());
    // The second group's sums are its own, and its head took its sequence number alone.
    EXPECT_EQ(membros[7]->valorCampo("QTD"), "2");
    EXPECT_TRUE(membros[7]->campos.partilhado());
    EXPECT_FALSE(membros[7]->campos.partilhaCom(membros[1]->campos));
    EXPECT_FALSE(membros[6]->campos.partilhado());
    EXPECT_EQ(membros[6]->valorCampo("SEQUENCIA"), "2");
    EXPECT_FALSE(membros[7]->temCampo("SEQUENCIA"));
    // A change to one member stays there.
    membros[3]->definirCampo("OBS", "mudou");
    EXPECT_EQ(membros[1]->valorCampo("OBS"), "x");
    EXPECT_EQ(membros[3]->valorCampo("OBS"), "mudou");
    EXPECT_EQ(x.value("QTD"), "1");
}

}  // namespace
