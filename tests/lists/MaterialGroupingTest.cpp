// Equal materials grouped into chains: which items join, which head stays, and the order of
// the members when their sort keys tie.
#include "QtPrinters.h"
#include "TemplateDouble.h"
#include "readers/CCMaterialDataReader.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

#include <QHash>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <vector>

namespace {

class MaterialGroupingTest : public ::testing::Test {
protected:
    void SetUp() override {
        modelo.simbolos["PBLLSTAGRUPAMENTO"] = QStringList{"ZV_KEY"};
        modelo.simbolos["*LISTA_DE_SORT*"] = QStringList{"DESCRICAO"};
        modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"GRUPO"};
    }
    CEItemLista* Item(int id, const QString& chave, const QString& descricao,
                      const QString& grupo = "G1") {
        donos_.push_back(std::make_unique<CEItemLista>());
        CEItemLista* item = donos_.back().get();
        item->definirCampoInteiro("ID", id);
        item->definirCampo("ZV_KEY", chave);
        item->definirCampo("DESCRICAO", descricao);
        item->definirCampo("GRUPO", grupo);
        return item;
    }
    // Each chain as its members' IDs, head first.
    static QStringList Cadeias(const VetorItens& itens) {
        QStringList cadeias;
        for (const CEItemLista* item : itens) {
            QStringList ids;
            for (const CEItemLista* m = item; m; m = m->ligado)
                ids << m->valorCampo("ID");
            cadeias << ids.join(",");
        }
        return cadeias;
    }

    TemplateDouble modelo;
    std::vector<std::unique_ptr<CEItemLista>> donos_;
};

TEST_F(MaterialGroupingTest, EqualKeysJoinTheFirstInSortOrderAndABreakFieldKeepsThemApart) {
    VetorItens itens{Item(1, "K2", "b"), Item(2, "K1", "z"), Item(3, "K2", "a"),
                     Item(4, "K1", "y", "G2"), Item(5, "K1", "x")};
    CCMaterialDataReader::Agrupa(itens, modelo);
    // Sorted by key, then description: K1 x, K1 y, K1 z, K2 a, K2 b. Item 4 is another
    // page group, a material of its own.
    EXPECT_EQ(Cadeias(itens), QStringList({"5,2", "4", "3,1"}));
}

TEST_F(MaterialGroupingTest, AMemberThatAlreadyLeadsAChainBringsItsChainAlong) {
    CEItemLista* a = Item(1, "K1", "a");
    CEItemLista* b = Item(2, "K1", "b");
    CEItemLista* b2 = Item(3, "OUTRA", "b");
    b->ligado = b2;
    CEItemLista* c = Item(4, "K1", "c");
    VetorItens itens{c, b, a};
    CCMaterialDataReader::Agrupa(itens, modelo);
    EXPECT_EQ(Cadeias(itens), QStringList({"1,2,3,4"}));
}

TEST_F(MaterialGroupingTest, NoGroupingFieldsLeavesTheItemsAsTheyAre) {
    modelo.simbolos["PBLLSTAGRUPAMENTO"] = QStringList();
    VetorItens itens{Item(1, "K1", "b"), Item(2, "K1", "a")};
    CCMaterialDataReader::Agrupa(itens, modelo);
    EXPECT_EQ(Cadeias(itens), QStringList({"1", "2"}));
}

// One grouping field and no break field: the materials are those a lookup by the joined
// fields makes (a break field every item holds alike changes nothing there). Texts that sort
// alike but differ ("01", "1") stay apart; an empty key and none are one material.
TEST_F(MaterialGroupingTest, WithoutABreakFieldTheSameMaterialsJoinInTheSameOrder) {
    auto monta = [this]() {
        VetorItens itens;
        std::uint32_t semente = 7;
        const QStringList chaves = {"K1", "K01", "K2", "k1", "", "K10", "K1 ", "K3"};
        for (int i = 0; i < 200; ++i) {
            semente = semente * 1103515245u + 12345u;
            const int c = int((semente >> 16) % 9);
            CEItemLista* item = Item(i, c < 8 ? chaves[c] : "", (semente >> 8) % 3 ? "d" : "e");
            if (c == 8) item->campos.remove("ZV_KEY");
            // Some items lead a chain of their own already.
            if (i % 17 == 0) item->ligado = Item(1000 + i, "OUTRA", "x");
            itens.push_back(item);
        }
        return itens;
    };
    VetorItens vizinhos = monta(), porChave = monta();
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList();
    CCMaterialDataReader::Agrupa(vizinhos, modelo);
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"GRUPO"};
    CCMaterialDataReader::Agrupa(porChave, modelo);
    EXPECT_EQ(Cadeias(vizinhos), Cadeias(porChave));
    QStringList cabecas;
    for (const CEItemLista* item : vizinhos)
        cabecas << item->valorCampo("ZV_KEY");
    EXPECT_EQ(cabecas, QStringList({"", "K01", "K1", "K1 ", "K2", "K3", "K10", "k1"}));
}

TEST_F(MaterialGroupingTest, MembersWhoseKeysTieKeepTheOrderOfAFieldByFieldComparisonSort) {
    // Hundreds of items over a few materials with the same description: the members of a
    // chain tie on every sort key, and their order is the one a sort comparing the items
    // field by field leaves them in (not their first order: that sort is not stable).
    VetorItens itens;
    std::uint32_t semente = 11;
    for (int i = 0; i < 300; ++i) {
        semente = semente * 1103515245u + 12345u;
        const QString chave = "K" + QString::number((semente >> 16) % 4);
        itens.push_back(Item(i, chave, (semente >> 8) % 3 ? "igual" : "outra"));
    }
    const QStringList campos = {"ZV_KEY", "DESCRICAO"};
    VetorItens ordem = itens;
    std::sort(ordem.begin(), ordem.end(), [&](const CEItemLista* a, const CEItemLista* b) {
        return VetorItens::compararItens(a, b, campos) < 0;
    });
    QHash<QString, QStringList> esperado;
    QStringList chaves;
    for (const CEItemLista* item : ordem) {
        const QString chave = item->valorCampo("ZV_KEY");
        if (!esperado.contains(chave)) chaves << chave;
        esperado[chave] << item->valorCampo("ID");
    }
    CCMaterialDataReader::Agrupa(itens, modelo);
    QStringList cadeias;
    for (const QString& chave : chaves)
        cadeias << esperado[chave].join(",");
    EXPECT_EQ(Cadeias(itens), cadeias);
    // Some tied neighbours of a chain are out of their first order, so ties were really
    // decided by the sort.
    bool foraDeOrdem = false;
    for (const CEItemLista* item : itens)
        for (const CEItemLista* m = item; m && m->ligado; m = m->ligado) {
            const CEItemLista* seguinte = m->ligado;
            if (m->valorCampo("DESCRICAO") == seguinte->valorCampo("DESCRICAO") &&
                m->valorCampo("ID").toInt() > seguinte->valorCampo("ID").toInt())
                foraDeOrdem = true;
        }
    EXPECT_TRUE(foraDeOrdem);
}

}  // namespace
