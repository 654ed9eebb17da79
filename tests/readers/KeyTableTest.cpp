// The table of values by text key, against a node map given the same steps.
#include "readers/CCBorneDataReader.h"
#include "readers/TabelaChaves.h"

#include "QtPrinters.h"

#include <gtest/gtest.h>

#include <QHash>
#include <QString>

#include <random>
#include <string>
#include <string_view>
#include <unordered_map>

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

namespace {

TEST(TabelaChavesTest, TextsAreAskedForByTheirViewAndMadeOnceEach) {
    TabelaChaves<std::string, QString, std::string_view> tabela;
    std::unordered_map<std::string, QString> ref;
    int feitos = 0;
    std::mt19937 sorteio(5);
    std::uniform_int_distribution<int> numero(0, 2999);
    for (int i = 0; i < 20000; ++i) {
        // Short texts and long ones (past the string's own room), from a buffer of their own:
        // the table keeps a copy, not the view.
        std::string texto = "-K" + std::to_string(numero(sorteio));
        if (i % 3 == 0) texto += std::string(20, 'x');
        const std::string_view vista(texto);
        const QString& valor = tabela.obtem(vista, [&] {
            ++feitos;
            return QString::fromStdString(texto).toLower();
        });
        const QString esperado = ref.try_emplace(texto, valor).first->second;
        EXPECT_EQ(valor, esperado);
        EXPECT_EQ(valor, QString::fromStdString(texto).toLower());
    }
    EXPECT_EQ(feitos, int(ref.size()));
    EXPECT_EQ(tabela.size(), ref.size());
    for (const auto& [texto, valor] : ref)
        EXPECT_EQ(tabela.value(texto), valor);
    EXPECT_EQ(tabela.value("-K"), QString());
    EXPECT_EQ(tabela.value(""), QString());

    // Emptied, it answers none and makes each text again.
    tabela.clear();
    EXPECT_TRUE(tabela.empty());
    EXPECT_EQ(tabela.value(ref.begin()->first), QString());
    feitos = 0;
    tabela.obtem(ref.begin()->first, [&] {
        ++feitos;
        return QStringLiteral("de novo");
    });
    EXPECT_EQ(feitos, 1);
    EXPECT_EQ(tabela.value(ref.begin()->first), QStringLiteral("de novo"));
    EXPECT_EQ(tabela.size(), 1u);
}

}  // namespace
