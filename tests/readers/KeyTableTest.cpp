// The table of values by text key, against a node map given the same steps.
#include "readers/CCBorneDataReader.h"
#include "readers/TabelaChaves.h"

#include "QtPrinters.h"

#include <gtest/gtest.h>

#include <QHash>
#include <QString>

#include <random>

namespace {

using Chave = CCBorneDataReader::ChaveBorne;

TEST(TabelaChavesTest, FollowsANodeMapThroughInsertionsLookUpsAndGrowth) {
    for (const bool reservada : {false, true}) {
        TabelaChaves<Chave, int> tabela;
        if (reservada) tabela.reserve(300);
        QHash<Chave, int> ref;
        std::mt19937 sorteio(11);
        // Strips and numbers that run into each other when joined ("X1"+"12", "X11"+"2").
        std::uniform_int_distribution<int> regua(1, 12), numero(1, 40), passo(0, 2);
        for (int i = 1; i <= 4000; ++i) {
            const Chave chave{"X" + QString::number(regua(sorteio)),
                              QString::number(numero(sorteio))};
            if (passo(sorteio) == 0) {
                // The first value of a key stays, as the callers keep it.
                int& valor = tabela[chave];
                if (valor == 0) valor = i;
                if (!ref.contains(chave)) ref.insert(chave, i);
            }
            EXPECT_EQ(tabela.value(chave), ref.value(chave, 0));
        }
        ASSERT_EQ(tabela.size(), size_t(ref.size()));
        for (auto it = ref.cbegin(); it != ref.cend(); ++it)
            EXPECT_EQ(tabela.value(it.key()), it.value());
        // A strip with the number's first digit, the number without it: another key.
        const Chave a{"X1", "12"}, b{"X11", "2"};
        EXPECT_EQ(tabela.value(a) == tabela.value(b), ref.value(a, 0) == ref.value(b, 0));
    }
}

TEST(TabelaChavesTest, AnEmptyTableAnswersDefaultsAndTextValuesStayShared) {
    TabelaChaves<QString, QString> tabela;
    EXPECT_TRUE(tabela.empty());
    EXPECT_EQ(tabela.value("A"), QString());
    tabela.reserve(0);
    EXPECT_EQ(tabela.value("A"), QString());
    const QString dono = QStringLiteral("1F0");
    tabela["-K1"] = dono;
    QString& outro = tabela["-K1"];
    EXPECT_EQ(outro, dono);
    EXPECT_TRUE(outro.isSharedWith(dono));
    EXPECT_EQ(tabela.size(), 1u);
    EXPECT_EQ(tabela.value("-K2"), QString());
    EXPECT_EQ(tabela.size(), 1u);
}

}  // namespace
