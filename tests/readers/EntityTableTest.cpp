// The readers' table of values by drawing object, against a node map given the same steps.
#include "readers/TabelaIds.h"

#include "QtPrinters.h"

#include <gtest/gtest.h>

#include <QString>

#include <cstdint>
#include <memory>
#include <random>
#include <unordered_map>
#include <vector>

namespace {

zvdb::Database* Desenho(std::uintptr_t n) {
    return reinterpret_cast<zvdb::Database*>(n * 64);
}

// Every key of the reference is found with its value, and the sizes agree.
void Confere(const TabelaIds<int>& tabela, const std::unordered_map<OdDbObjectId, int>& ref) {
    ASSERT_EQ(tabela.size(), ref.size());
    for (const auto& [id, valor] : ref) {
        const int* achado = tabela.procura(id);
        ASSERT_NE(achado, nullptr) << id.handle();
        EXPECT_EQ(*achado, valor) << id.handle();
    }
}

TEST(TabelaIdsTest, FollowsANodeMapThroughInsertionsRemovalsAndGrowth) {
    TabelaIds<int> tabela;
    std::unordered_map<OdDbObjectId, int> ref;
    std::mt19937 sorteio(7);
    // Few handles, many steps: the same keys come and go, runs of neighbours collide.
    std::uniform_int_distribution<std::uint64_t> handle(1, 3000);
    std::uniform_int_distribution<int> passo(0, 9);
    for (int i = 0; i < 60000; ++i) {
        const OdDbObjectId id(Desenho(1 + handle(sorteio) % 2), handle(sorteio));
        const int p = passo(sorteio);
        if (p < 5) {
            EXPECT_EQ(tabela.insere(id, i), i);
            ref[id] = i;
        } else if (p < 8) {
            int valor = -1;
            const auto achado = ref.find(id);
            ASSERT_EQ(tabela.retira(id, valor), achado != ref.end());
            if (achado != ref.end()) {
                EXPECT_EQ(valor, achado->second);
                ref.erase(achado);
            }
            EXPECT_FALSE(tabela.contains(id));
        } else {
            const int* achado = tabela.procura(id);
            ASSERT_EQ(achado != nullptr, ref.count(id) == 1);
            if (achado) {
                EXPECT_EQ(*achado, ref.at(id));
            }
        }
        if (i % 5000 == 0) Confere(tabela, ref);
    }
    Confere(tabela, ref);
}

TEST(TabelaIdsTest, TheSameHandleOfTwoDrawingsAndTheNullObjectAreKeysOfTheirOwn) {
    TabelaIds<QString> tabela;
    const OdDbObjectId a(Desenho(1), 0x2A), b(Desenho(2), 0x2A);
    tabela.insere(a, "a");
    tabela.insere(b, "b");
    tabela.insere(OdDbObjectId(), "nulo");
    EXPECT_EQ(*tabela.procura(a), "a");
    EXPECT_EQ(*tabela.procura(b), "b");
    EXPECT_EQ(*tabela.procura(OdDbObjectId()), "nulo");
    tabela.insere(a, "de novo");
    EXPECT_EQ(tabela.size(), 3u);
    EXPECT_EQ(*tabela.procura(a), "de novo");
    QString tirado;
    EXPECT_TRUE(tabela.retira(b, tirado));
    EXPECT_EQ(tirado, "b");
    EXPECT_EQ(tabela.procura(b), nullptr);
    EXPECT_EQ(*tabela.procura(a), "de novo");
}

TEST(TabelaIdsTest, MovedFromAndReleasedTablesAreEmptyAndUsable) {
    TabelaIds<int> tabela;
    for (std::uint64_t h = 1; h <= 100; ++h)
        tabela.insere(OdDbObjectId(Desenho(1), h), int(h));
    TabelaIds<int> outra = std::move(tabela);
    EXPECT_EQ(outra.size(), 100u);
    EXPECT_EQ(*outra.procura(OdDbObjectId(Desenho(1), 77)), 77);
    EXPECT_TRUE(tabela.empty());
    EXPECT_EQ(tabela.procura(OdDbObjectId(Desenho(1), 77)), nullptr);
    tabela.insere(OdDbObjectId(Desenho(1), 5), 50);
    EXPECT_EQ(*tabela.procura(OdDbObjectId(Desenho(1), 5)), 50);
    outra.libera();
    EXPECT_TRUE(outra.empty());
    EXPECT_EQ(outra.procura(OdDbObjectId(Desenho(1), 77)), nullptr);
    outra.insere(OdDbObjectId(Desenho(1), 77), 7);
    EXPECT_EQ(*outra.procura(OdDbObjectId(Desenho(1), 77)), 7);
}

TEST(TabelaIdsTest, EmptyingInPlaceLetsGoOfTheValuesAndTakesNewOnes) {
    const auto valor = std::make_shared<int>(1);
    TabelaIds<std::shared_ptr<int>> tabela;
    for (std::uint64_t h = 1; h <= 40; ++h)
        tabela.insere(OdDbObjectId(Desenho(1), h), valor);
    EXPECT_EQ(valor.use_count(), 41);
    tabela.limpa();
    EXPECT_EQ(valor.use_count(), 1);
    EXPECT_TRUE(tabela.empty());
    EXPECT_EQ(tabela.procura(OdDbObjectId(Desenho(1), 7)), nullptr);
    tabela.insere(OdDbObjectId(Desenho(1), 7), valor);
    ASSERT_NE(tabela.procura(OdDbObjectId(Desenho(1), 7)), nullptr);
    EXPECT_EQ(*tabela.procura(OdDbObjectId(Desenho(1), 7)), valor);
    EXPECT_EQ(tabela.size(), 1u);
}

}  // namespace
