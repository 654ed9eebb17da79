// The terminal reader's steps after reading: blank rows from 1, gaps, and jumper chains.
#include "QtPrinters.h"
#include "readers/CCBorneDataReader.h"

#include <gtest/gtest.h>

#include <set>

namespace {

class TerminalStepsTest : public ::testing::Test {
protected:
    ~TerminalStepsTest() override {
        // Blank rows made by the steps sit in the vectors; the test owns everything.
        std::unordered_set<CEItemLista*> todos(donos_.begin(), donos_.end());
        for (CEItemLista* item : vetor_)
            todos.insert(item);
        for (CEItemLista* item : todos)
            delete item;
    }
    CEItemLista* borne(const char* regua, const char* numero, const char* jumper = "",
                       const char* reguaCampo = "REGUA", const char* numeroCampo = "NUMERO") {
        auto* item = new CEItemLista;
        item->definirCampo(reguaCampo, regua);
        item->definirCampo(numeroCampo, numero);
        if (*jumper) item->definirCampo("JUMPER", jumper);
        donos_.push_back(item);
        vetor_.push_back(item);
        return item;
    }
    QStringList linhas() const {
        QStringList texto;
        for (const CEItemLista* item : vetor_)
            texto << CCBorneDataReader::Regua(*item) + ":" + CCBorneDataReader::Numero(*item) +
                         (item->ids.size() == 1 && item->ids[0].isNull() ? "*" : "");
        return texto;
    }

    std::vector<CEItemLista*> donos_;
    VetorItens vetor_;
};

TEST_F(TerminalStepsTest, StripsStartingAboveOneGetBlankRowsInFront) {
    borne("X1", "3");
    borne("X1", "4");
    borne("X2", "1");
    borne("X3", "2", "", "STRIP", "NUMBER");
    CCBorneDataReader::IniciaSequencial(vetor_);
    EXPECT_EQ(linhas(), QStringList({"X1:1*", "X1:2*", "X1:3", "X1:4", "X2:1", "X3:1*", "X3:2"}));
    // Blank rows carry strip and number in all three languages.
    EXPECT_EQ(vetor_[0]->valorCampo("REGLETA"), "X1");
    EXPECT_EQ(vetor_[0]->valorCampo("NUMBER"), "1");
}

TEST_F(TerminalStepsTest, GapsAreFilledOnlyBetweenRisingNumbersOfOneStrip) {
    borne("X1", "3");
    borne("X1", "4");
    borne("X1", "7");
    borne("X2", "9");
    borne("X2", "A");  // not a number: counts as 0
    borne("X2", "2");
    CCBorneDataReader::PreencheFaltantes(vetor_);
    EXPECT_EQ(linhas(), QStringList({"X1:3", "X1:4", "X1:5*", "X1:6*", "X1:7", "X2:9", "X2:A",
                                     "X2:1*", "X2:2"}));
}

TEST_F(TerminalStepsTest, AFallingListGetsNoBlankRows) {
    borne("X1", "6");
    borne("X1", "3");
    CCBorneDataReader::PreencheFaltantes(vetor_);
    EXPECT_EQ(linhas(), QStringList({"X1:6", "X1:3"}));
}

TEST_F(TerminalStepsTest, JumperTextsChainTerminalsWhateverLiesBetween) {
    CEItemLista* b3 = borne("X1", "3", "5,7");
    CEItemLista* b4 = borne("X1", "4");
    CEItemLista* b5 = borne("X1", "5");
    CEItemLista* b6 = borne("X1", "6");
    CEItemLista* b7 = borne("X1", "7");
    CEItemLista* outra = borne("X2", "5");
    CCBorneDataReader::LigaJumpers(vetor_);
    EXPECT_EQ(b3->proximo, b5);
    EXPECT_EQ(b5->anterior, b3);
    EXPECT_EQ(b5->proximo, b7);
    EXPECT_EQ(b7->anterior, b5);
    EXPECT_EQ(b3->anterior, nullptr);
    EXPECT_EQ(b7->proximo, nullptr);
    for (const CEItemLista* fora : {b4, b6, outra}) {
        EXPECT_EQ(fora->anterior, nullptr);
        EXPECT_EQ(fora->proximo, nullptr);
    }
}

// Terminals as the drawing gives them: every one has a JUMPER field, most of them empty, and
// only the tags of its own language. An empty piece of a jumper text names no terminal.
TEST_F(TerminalStepsTest, OneWayJumpersAndStrayCommasBridgeOnlyWhatTheyName) {
    auto comJumper = [this](const char* regua, const char* numero, const char* jumper,
                            const char* reguaCampo = "REGUA", const char* numeroCampo = "NUMERO") {
        CEItemLista* item = borne(regua, numero, "", reguaCampo, numeroCampo);
        item->definirCampo("JUMPER", jumper);
        return item;
    };
    std::vector<CEItemLista*> x0, x1, x2;
    for (const char* n : {"1", "2"})
        x0.push_back(comJumper("X0", n, ""));
    for (const char* n : {"1", "2", "3", "4", "5", "6", "7", "8", "9", "10"})
        x1.push_back(comJumper("X1", n, ""));
    for (const char* n : {"1", "2"})
        x2.push_back(comJumper("X2", n, ",", "STRIP", "NUMBER"));
    x1[2]->definirCampo("JUMPER", "5,7");  // the others point nowhere
    x1[8]->definirCampo("JUMPER", "10,");  // one way, with a trailing comma
    x1[9]->definirCampo("JUMPER", ",");
    CCBorneDataReader::LigaJumpers(vetor_);
    auto par = [](const CEItemLista* item) {
        return QString("%1/%2").arg(
            item->anterior ? CCBorneDataReader::Numero(*item->anterior) : "-",
            item->proximo ? CCBorneDataReader::Numero(*item->proximo) : "-");
    };
    QStringList ligacoes;
    for (const auto* grupo : {&x0, &x1, &x2})
        for (const CEItemLista* item : *grupo)
            ligacoes << CCBorneDataReader::Regua(*item) + ":" + CCBorneDataReader::Numero(*item) +
                            " " + par(item);
    EXPECT_EQ(ligacoes, QStringList({"X0:1 -/-", "X0:2 -/-", "X1:1 -/-", "X1:2 -/-", "X1:3 -/5",
                                     "X1:4 -/-", "X1:5 3/7", "X1:6 -/-", "X1:7 5/-", "X1:8 -/-",
                                     "X1:9 -/10", "X1:10 9/-", "X2:1 -/-", "X2:2 -/-"}));
}

TEST_F(TerminalStepsTest, ChainsFollowJumpersOfJumpersAndOtherLanguages) {
    // 3 bridges 1, 1 bridges 2 through the English tags both carry: one chain, sorted.
    CEItemLista* b3 = borne("X1", "3", "1");
    CEItemLista* b1 = borne("X1", "1", "2");
    b1->definirCampo("STRIP", "X1");
    CEItemLista* b2 = borne("X1", "2", "", "STRIP", "NUMBER");
    CCBorneDataReader::LigaJumpers(vetor_);
    // One chain of the three, whatever order the mixed tags sort into.
    CEItemLista* cabeca = b1;
    while (cabeca->anterior)
        cabeca = cabeca->anterior;
    std::vector<CEItemLista*> cadeia;
    for (CEItemLista* p = cabeca; p; p = p->proximo) {
        if (p->proximo) {
            EXPECT_EQ(p->proximo->anterior, p);
        }
        cadeia.push_back(p);
    }
    EXPECT_EQ(std::set<CEItemLista*>(cadeia.begin(), cadeia.end()),
              std::set<CEItemLista*>({b1, b2, b3}));
    EXPECT_EQ(cadeia.size(), 3u);
    // A later terminal bridged to a visited one starts a chain of its own, of one item: it
    // stays unlinked, as does the chain it points at.
    CEItemLista* b9 = borne("X1", "9", "3");
    CCBorneDataReader::LigaJumpers(vetor_);
    EXPECT_EQ(b9->anterior, nullptr);
    EXPECT_EQ(b9->proximo, nullptr);
}

TEST_F(TerminalStepsTest, AChainIsSortedByTheTagsItsTerminalsCarryInTheirLanguage) {
    // Tagged in English only and made out of order: the chain runs by strip and number.
    CEItemLista* b10 = borne("X5", "10", "9", "STRIP", "NUMBER");
    CEItemLista* b9 = borne("X5", "9", "2", "STRIP", "NUMBER");
    CEItemLista* b2 = borne("X5", "2", "", "STRIP", "NUMBER");
    CCBorneDataReader::LigaJumpers(vetor_);
    EXPECT_EQ(b2->anterior, nullptr);
    EXPECT_EQ(b2->proximo, b9);
    EXPECT_EQ(b9->anterior, b2);
    EXPECT_EQ(b9->proximo, b10);
    EXPECT_EQ(b10->anterior, b9);
    EXPECT_EQ(b10->proximo, nullptr);
}

TEST_F(TerminalStepsTest, AJumperToAMissingNumberLinksNothing) {
    CEItemLista* b1 = borne("X1", "1", " 8 ");
    CCBorneDataReader::LigaJumpers(vetor_);
    EXPECT_EQ(b1->proximo, nullptr);
    EXPECT_EQ(b1->anterior, nullptr);
}

}  // namespace
