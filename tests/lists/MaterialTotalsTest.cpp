// The total block's sums of the material list: every item and every member of its chain,
// whether members share one text of their group's sum or hold texts of their own.
#include "lists/CCMaterialGrfWriter.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

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

}  // namespace
