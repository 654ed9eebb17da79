// The strip drawing's layout on items made by the tests: the order of strips and terminals,
// the symbols' order, the jumper tracks, cuts, pages, points and detail runs.
#include "ItensRegua.h"
#include "QtPrinters.h"
#include "strips/CEModeloReguas.h"

#include <gtest/gtest.h>

namespace {

class ModeloReguasTest : public ::testing::Test {
protected:
    // Each strip as "X1: 1 2 3", with " |" behind a strip that ends its page.
    static QStringList Reguas(const CEModeloReguas& modelo) {
        QStringList texto;
        for (const auto& regua : modelo.reguas) {
            QString linha = regua->nome + ":";
            for (const CEBorneDwg* borne : regua->bornes)
                linha += " " + borne->item->valorCampo("NUMERO");
            texto << linha + (regua->quebra ? " |" : "");
        }
        return texto;
    }
    // The tracks of the strip's terminals: "number:states", one digit a track.
    static QString Trilhas(const CEReguaDwg& regua) {
        QStringList texto;
        for (const CEBorneDwg* borne : regua.bornes) {
            QString estados;
            for (std::int32_t estado : borne->trilhas)
                estados += QString::number(estado);
            texto << borne->item->valorCampo("NUMERO") + ":" + estados;
        }
        return texto.join(" ");
    }
    CEModeloReguas& Modelo() {
        modelo_.Constroi(itens_.itens);
        return modelo_;
    }
    CEModeloReguas& ComTrilhas() {
        Modelo().CalculaTrilhas();
        return modelo_;
    }

    ItensRegua itens_;
    CEModeloReguas modelo_;
};

// ---- building: strips, terminals and their symbols

TEST_F(ModeloReguasTest, StripsAndTerminalsComeInNaturalOrderAndTheFirstOfANumberWins) {
    itens_.Borne("X2", "1");
    CEItemLista* primeiro = itens_.Borne("X10", "3");
    itens_.Borne("X1", "10");
    itens_.Borne("X1", "2");
    CEItemLista* segundo = itens_.Borne("X10", "3");
    segundo->definirCampo("ZV_KEY", "outro");
    primeiro->definirCampo("ZV_KEY", "primeiro");
    itens_.itens.push_back(nullptr);
    CEModeloReguas& modelo = Modelo();
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 2 10", "X2: 1", "X10: 3"}));
    EXPECT_EQ(modelo.bornes.size(), 4u);
    ASSERT_NE(modelo.Borne("X10", "3"), nullptr);
    // Which of two equal items comes first is the sort's; one of them stands, once.
    const QString chave = modelo.Borne("X10", "3")->item->valorCampo("ZV_KEY");
    EXPECT_TRUE(chave == "primeiro" || chave == "outro") << chave.toStdString();
    for (const auto& regua : modelo.reguas)
        for (const CEBorneDwg* borne : regua->bornes)
            EXPECT_EQ(borne->regua, regua.get());
}

TEST_F(ModeloReguasTest, NumbersThatAreNotNumbersSortAfterTheNumbersAndStillDraw) {
    for (const char* numero : {"PE", "10", "A3", "2", "", "01"})
        itens_.Borne("X1", numero);
    CEModeloReguas& modelo = Modelo();
    // "01" and "" are terminals of their own: text is the key, not a value.
    EXPECT_EQ(Reguas(modelo), QStringList({"X1:  01 2 10 A3 PE"}));
    EXPECT_NE(modelo.Borne("X1", ""), nullptr);
}

// A terminal is found by its strip and number as two texts: a strip whose name runs on into
// the number of another is a terminal of its own.
TEST_F(ModeloReguasTest, StripAndNumberAreTwoTextsThatDoNotRunTogether) {
    CEItemLista* a = itens_.Borne("X1", "10");
    CEItemLista* b = itens_.Borne("X11", "0");
    CEItemLista* c = itens_.Borne("X", "110");
    CEModeloReguas& modelo = Modelo();
    EXPECT_EQ(modelo.bornes.size(), 3u);
    ASSERT_NE(modelo.Borne("X1", "10"), nullptr);
    ASSERT_NE(modelo.Borne("X11", "0"), nullptr);
    ASSERT_NE(modelo.Borne("X", "110"), nullptr);
    EXPECT_EQ(modelo.Borne("X1", "10")->item, a);
    EXPECT_EQ(modelo.Borne("X11", "0")->item, b);
    EXPECT_EQ(modelo.Borne("X", "110")->item, c);
    EXPECT_EQ(modelo.Borne("X1", "1"), nullptr);
    EXPECT_EQ(modelo.Borne("X110", ""), nullptr);
}

// Many terminals and symbols: every strip, symbol and look-up still points at the terminal
// made for its item once all are made.
TEST_F(ModeloReguasTest, ManyTerminalsStayWhereTheStripsAndSymbolsPointAtThem) {
    std::vector<CEItemLista*> feitos;
    for (int r = 1; r <= 7; ++r)
        for (CEItemLista* borne : itens_.Regua("X" + QString::number(r), 300))
            feitos.push_back(borne);
    for (int s = 0; s < 400; ++s) {
        const QString handle = "S" + QString::number(s);
        CEItemLista* simbolo = itens_.Simbolo(handle, "K" + QString::number(s), {"1"});
        ItensRegua::Liga(feitos[size_t(s) * 5], "INI", simbolo, "1");
    }
    CEModeloReguas& modelo = Modelo();
    ASSERT_EQ(modelo.bornes.size(), feitos.size());
    ASSERT_EQ(modelo.simbolos.size(), 400u);
    size_t vistos = 0;
    for (const auto& regua : modelo.reguas)
        for (const CEBorneDwg* borne : regua->bornes) {
            ++vistos;
            EXPECT_EQ(borne->regua, regua.get());
            EXPECT_EQ(modelo.Borne(regua->nome, borne->item->valorCampo("NUMERO")), borne);
        }
    EXPECT_EQ(vistos, feitos.size());
    for (int s = 0; s < 400; ++s) {
        const CESimboloDwg* simbolo = modelo.Simbolo("S" + QString::number(s));
        ASSERT_NE(simbolo, nullptr);
        ASSERT_EQ(simbolo->ligados.size(), 1u);
        EXPECT_EQ(simbolo->Ligado(0)->item, feitos[size_t(s) * 5]);
        EXPECT_EQ(static_cast<const CEBorneDwg*>(simbolo->Ligado(0))->PrimeiroSimbolo(), simbolo);
    }
}

TEST_F(ModeloReguasTest, StripNamesComeFromTheFirstLanguageThatHasOne) {
    CEItemLista* ingles = itens_.Borne("", "1");
    ingles->definirCampo("STRIP", "X7");
    ingles->definirCampo("NUMERO", "");
    ingles->definirCampo("NUMBER", "4");
    itens_.Borne("X7", "3");
    CEModeloReguas& modelo = Modelo();
    ASSERT_EQ(modelo.reguas.size(), 1u);
    EXPECT_EQ(modelo.reguas[0]->bornes.size(), 2u);
    EXPECT_EQ(modelo.Borne("X7", "4")->item, ingles);
}

TEST_F(ModeloReguasTest, SymbolsAreJoinedToTheTerminalsWiredToThem) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"13", "14"});
    CEItemLista* sem = itens_.Simbolo("A2", "H9");
    auto x1 = itens_.Regua("X1", 3);
    ItensRegua::Liga(x1[0], "INI", k1, "13");
    ItensRegua::Liga(x1[1], "FIM", k1, "14");
    // A side whose relation is empty is not read, whatever its handle says.
    x1[2]->definirCampo("HANDLE_INI", "A1");
    CEModeloReguas& modelo = Modelo();
    ASSERT_EQ(modelo.simbolos.size(), 2u);
    const CESimboloDwg* simbolo = modelo.Simbolo("A1");
    ASSERT_NE(simbolo, nullptr);
    ASSERT_EQ(simbolo->ligados.size(), 2u);
    EXPECT_EQ(simbolo->Ligado(0), modelo.Borne("X1", "1"));
    EXPECT_EQ(simbolo->Ligado(1), modelo.Borne("X1", "2"));
    EXPECT_EQ(simbolo->Ligado(2), nullptr);
    EXPECT_EQ(modelo.Borne("X1", "1")->PrimeiroSimbolo(), simbolo);
    EXPECT_EQ(modelo.Borne("X1", "3")->PrimeiroSimbolo(), nullptr);
    const auto semBorne = modelo.SimbolosSemBorne();
    ASSERT_EQ(semBorne.size(), 1u);
    EXPECT_EQ(semBorne[0]->item, sem);
}

TEST_F(ModeloReguasTest, AStripIsPutInTheOrderOfItsSymbolsConnections) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"A1", "A2", "13"});
    auto x1 = itens_.Regua("X1", 6);
    // K1 is wired to 2 (A2), 5 (A1) and 4 (13); 3 is wired to K1 at a name K1 lacks.
    ItensRegua::Liga(x1[1], "INI", k1, "A2");
    ItensRegua::Liga(x1[4], "INI", k1, "A1");
    ItensRegua::Liga(x1[3], "FIM", k1, "13");
    ItensRegua::Liga(x1[2], "INI", k1, "99");
    CEModeloReguas& modelo = Modelo();
    // At terminal 2, K1 places its terminals by connection: A1, A2, 13. The one that
    // matched nothing keeps its turn.
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1 5 2 4 3 6"}));
}

TEST_F(ModeloReguasTest, ASymbolOnTwoStripsPlacesItsTerminalsOnEachStrip) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"1", "2", "3", "4"});
    auto x1 = itens_.Regua("X1", 3);
    auto x2 = itens_.Regua("X2", 3);
    ItensRegua::Liga(x1[0], "INI", k1, "2");
    ItensRegua::Liga(x1[2], "INI", k1, "1");
    ItensRegua::Liga(x2[1], "INI", k1, "4");
    ItensRegua::Liga(x2[2], "INI", k1, "3");
    EXPECT_EQ(Reguas(Modelo()), QStringList({"X1: 3 1 2", "X2: 1 3 2"}));
}

TEST_F(ModeloReguasTest, ConnectionsOfOtherLanguagesCountAndTheFirstLanguageWinsASuffix) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1");
    k1->definirCampo("CONNECTION_1", "B");
    k1->definirCampo("LIGACAO_2", "A");
    k1->definirCampo("CONEXION_2", "C");
    auto x1 = itens_.Regua("X1", 3);
    ItensRegua::Liga(x1[0], "INI", k1, "C");
    ItensRegua::Liga(x1[1], "INI", k1, "A");
    ItensRegua::Liga(x1[2], "INI", k1, "B");
    // Suffix 1 is B, suffix 2 is A (Portuguese before Spanish); C matches nothing and keeps
    // its turn behind the symbol's terminals.
    EXPECT_EQ(Reguas(Modelo()), QStringList({"X1: 3 2 1"}));
}

TEST_F(ModeloReguasTest, ATerminalOfTwoSymbolsIsPlacedByTheFirstAndTiesKeepTheStripOrder) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"11", "12"});
    CEItemLista* k2 = itens_.Simbolo("A2", "K2", {"21", "22"});
    auto x1 = itens_.Regua("X1", 4);
    ItensRegua::Liga(x1[0], "INI", k2, "22");
    ItensRegua::Liga(x1[1], "INI", k1, "12");
    ItensRegua::Liga(x1[1], "FIM", k2, "21");
    // 3 and 4 are both at K1's 11: the first of the strip takes it, the other keeps its turn.
    ItensRegua::Liga(x1[2], "INI", k1, "11");
    ItensRegua::Liga(x1[3], "INI", k1, "11");
    // At 1, K2 places 2 (21) before 1 (22); at 2, K1 finds 3 (11) free and 2 placed.
    EXPECT_EQ(Reguas(Modelo()), QStringList({"X1: 2 1 3 4"}));
    // The same items changed and laid out again: the new connections count.
    x1[3]->definirCampo("LIG_INI", "12");
    x1[1]->definirCampo("LIG_INI", "11");
    x1[2]->definirCampo("LIG_INI", "99");
    CEModeloReguas outro;
    outro.Constroi(itens_.itens);
    EXPECT_EQ(Reguas(outro), QStringList({"X1: 2 1 4 3"}));
}

// A terminal's side connections are found among many other fields, under names made
// before and after the others, and a side connection named only now counts too.
TEST_F(ModeloReguasTest, SideConnectionsAreFoundAmongManyFieldsWhateverTheirNames) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"11", "12", "13"});
    auto x1 = itens_.Regua("X1", 3);
    for (CEItemLista* borne : x1)
        for (int i = 0; i < 40; ++i)
            borne->definirCampo(QString("CAMPO_%1_INI").arg(i), QString::number(i));
    ItensRegua::Liga(x1[0], "INI", k1, "99");
    ItensRegua::Liga(x1[1], "INI", k1, "98");
    ItensRegua::Liga(x1[2], "INI", k1, "97");
    // 3 by a side of its other end, 1 by a name no item had before this test.
    x1[2]->definirCampo("LIG_FIM", "11");
    x1[0]->definirCampo("LIG_LADO_NOVO_Q8", "12");
    x1[1]->definirCampo("LIG_FIM", "13");
    EXPECT_EQ(Reguas(Modelo()), QStringList({"X1: 3 1 2"}));
}

// A symbol's connections are found among many other fields, in each language, under
// names made before and after the others, and names that only other symbols hold are passed.
TEST_F(ModeloReguasTest, SymbolConnectionsAreFoundAmongManyFieldsWhateverTheirNames) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"A"});
    CEItemLista* k2 = itens_.Simbolo("A2", "K2");
    for (int i = 0; i < 40; ++i) {
        k1->definirCampo(QString("CAMPO_%1_SIMBOLO").arg(i), QString::number(i));
        k2->definirCampo(QString("CONNECTION_%1").arg(i + 2), QString("K2_%1").arg(i));
    }
    k1->definirCampo("CONNECTION_0", "C");
    k1->definirCampo("LIGACAO_Z9_SO_DESTE_TESTE", "B");
    auto x1 = itens_.Regua("X1", 4);
    ItensRegua::Liga(x1[0], "INI", k1, "B");
    ItensRegua::Liga(x1[1], "INI", k1, "C");
    ItensRegua::Liga(x1[2], "INI", k1, "A");
    ItensRegua::Liga(x1[3], "INI", k2, "K2_5");
    // K1's connections by suffix: 0 (C), 1 (A), Z9... (B); then K2 places 4.
    EXPECT_EQ(Reguas(Modelo()), QStringList({"X1: 2 3 1 4"}));
}

// ---- jumper tracks

TEST_F(ModeloReguasTest, AChainBeginsPassesGoesThroughAndEnds) {
    auto x1 = itens_.Regua("X1", 6);
    ItensRegua::Jumper({x1[1], x1[3], x1[4]});
    const CEModeloReguas& modelo = ComTrilhas();
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "1: 2:1 3:2 4:4 5:3 6:");
    EXPECT_EQ(modelo.Borne("X1", "2")->proximo, modelo.Borne("X1", "4"));
    EXPECT_EQ(modelo.Borne("X1", "4")->anterior, modelo.Borne("X1", "2"));
}

// Links go to the terminal next door or further on, either way, and a link to the second
// item of a number lands on the terminal kept for it.
TEST_F(ModeloReguasTest, JumperLinksFindTheirTerminalsNearOrFarAndThroughASecondItemOfANumber) {
    auto x1 = itens_.Regua("X1", 4);
    CEItemLista* outro2 = itens_.Borne("X1", "2");
    x1[0]->proximo = outro2;
    x1[1]->proximo = outro2->proximo = x1[3];
    x1[3]->anterior = outro2;
    x1[2]->anterior = x1[1];
    CEModeloReguas& modelo = Modelo();
    ASSERT_EQ(modelo.bornes.size(), 4u);
    CEBorneDwg* const b1 = modelo.Borne("X1", "1");
    CEBorneDwg* const b2 = modelo.Borne("X1", "2");
    CEBorneDwg* const b3 = modelo.Borne("X1", "3");
    CEBorneDwg* const b4 = modelo.Borne("X1", "4");
    EXPECT_EQ(b1->proximo, b2);
    EXPECT_EQ(b2->proximo, b4);
    EXPECT_EQ(b4->anterior, b2);
    EXPECT_EQ(b3->anterior, b2);
    EXPECT_EQ(b1->anterior, nullptr);
    EXPECT_EQ(b3->proximo, nullptr);
}

TEST_F(ModeloReguasTest, ChainsThatOverlapOrCrossTakeTheNextTrack) {
    auto x1 = itens_.Regua("X1", 6);
    ItensRegua::Jumper({x1[0], x1[2]});
    ItensRegua::Jumper({x1[1], x1[3]});
    ItensRegua::Jumper({x1[4], x1[5]});
    // 1-3 and 2-4 cross: the second finds track 0 busy at 2; 5-6 finds it free again.
    EXPECT_EQ(Trilhas(*ComTrilhas().reguas[0]), "1:1 2:21 3:32 4:03 5:1 6:3");
}

TEST_F(ModeloReguasTest, NestedChainsStackAndATrackIsFreeAfterItsEnd) {
    auto x1 = itens_.Regua("X1", 8);
    ItensRegua::Jumper({x1[0], x1[5]});
    ItensRegua::Jumper({x1[1], x1[2]});
    ItensRegua::Jumper({x1[3], x1[4]});
    ItensRegua::Jumper({x1[5 + 1], x1[7]});
    // 2-3 and 4-5 inside 1-6 both take track 1; 7-8 begins after 1-6 ended, on track 0.
    EXPECT_EQ(Trilhas(*ComTrilhas().reguas[0]), "1:1 2:21 3:23 4:21 5:23 6:3 7:1 8:3");
}

TEST_F(ModeloReguasTest, ATerminalWithAJumperInAndOneOutIsAMiddleTerminal) {
    auto x1 = itens_.Regua("X1", 4);
    ItensRegua::Jumper({x1[0], x1[1]});
    x1[1]->proximo = x1[3];
    x1[3]->anterior = x1[1];
    const CEModeloReguas& modelo = ComTrilhas();
    // The item links make one chain 1-2-4: 2 is a middle terminal.
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "1:1 2:4 3:2 4:3");
}

TEST_F(ModeloReguasTest, AJumperToAnotherStripRunsToTheStripsEndWithoutAnEnd) {
    auto x1 = itens_.Regua("X1", 4);
    auto x2 = itens_.Regua("X2", 2);
    ItensRegua::Jumper({x1[1], x2[0]});
    const CEModeloReguas& modelo = ComTrilhas();
    EXPECT_EQ(modelo.Borne("X1", "2")->proximo, modelo.Borne("X2", "1"));
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "1: 2:1 3:2 4:2");
    EXPECT_EQ(Trilhas(*modelo.reguas[1]), "1: 2:");
}

TEST_F(ModeloReguasTest, AJumperToATerminalThatIsNotDrawnRunsOnToTheEnd) {
    auto x1 = itens_.Regua("X1", 3);
    CEItemLista fora;
    fora.definirCampo("REGUA", "X1");
    fora.definirCampo("NUMERO", "77");
    x1[0]->proximo = &fora;
    const CEModeloReguas& modelo = ComTrilhas();
    EXPECT_EQ(modelo.Borne("X1", "1")->proximo, nullptr);
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "1: 2: 3:");
}

TEST_F(ModeloReguasTest, AChainWhoseNextStandsBeforeItRunsToTheEnd) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"1", "2"});
    auto x1 = itens_.Regua("X1", 3);
    // K1 puts 3 before 1; the chain 1-3 then finds no 3 behind 1.
    ItensRegua::Liga(x1[2], "INI", k1, "1");
    ItensRegua::Liga(x1[0], "INI", k1, "2");
    ItensRegua::Jumper({x1[0], x1[2]});
    const CEModeloReguas& modelo = ComTrilhas();
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 3 1 2"}));
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "3: 1:1 2:2");
}

TEST_F(ModeloReguasTest, LinksThatLoopDoNotHangTheWalk) {
    auto x1 = itens_.Regua("X1", 3);
    x1[0]->proximo = x1[1];
    x1[1]->proximo = x1[0];
    x1[2]->proximo = x1[2];
    const CEModeloReguas& modelo = ComTrilhas();
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "1:1 2:4 3:21");
}

// ---- cutting strips, pages and points

TEST_F(ModeloReguasTest, AStripOfExactlyTheLimitIsNotCutAndALongerOneIs) {
    itens_.Regua("X1", 4);
    itens_.Regua("X2", 9);
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(4, {});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1 2 3 4", "X2: 1 2 3 4", "X2: 5 6 7 8", "X2: 9"}));
}

TEST_F(ModeloReguasTest, ABreakFieldChangeCutsTheStripAndEndsItsPage) {
    auto x1 = itens_.Regua("X1", 6);
    for (size_t i = 0; i < x1.size(); ++i)
        x1[i]->definirCampo("LOCAL", i < 2 ? "+A1" : "+A2");
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(10, {"LOCAL"});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1 2 |", "X1: 3 4 5 6"}));
    modelo.Pagina(3);
    ASSERT_EQ(modelo.paginas.size(), 2u);
    EXPECT_EQ(modelo.paginas[0]->Quantidade(), 1);
    EXPECT_EQ(modelo.reguas[1]->pagina, modelo.paginas[1].get());
}

TEST_F(ModeloReguasTest, AChangeOfBreakFieldBetweenStripsEndsThePageOfTheFirst) {
    itens_.Regua("X1", 2);
    itens_.Regua("X2", 2);
    itens_.Regua("X3", 1);
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(10, {"REGUA"});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1 2 |", "X2: 1 2 |", "X3: 1"}));
    modelo.Pagina(2);
    EXPECT_EQ(modelo.paginas.size(), 3u);
}

TEST_F(ModeloReguasTest, ASymbolAcrossTheLimitGoesWholeToTheNextStrip) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"1", "2", "3", "4"});
    auto x1 = itens_.Regua("X1", 8);
    for (int i = 0; i < 4; ++i)
        ItensRegua::Liga(x1[size_t(3 + i)], "INI", k1, QString::number(i + 1));
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(5, {});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1 2 3", "X1: 4 5 6 7 8"}));
}

TEST_F(ModeloReguasTest, ASymbolThatStartsTheStripIsNotPartedAndRunsOn) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"1", "2", "3", "4"});
    auto x1 = itens_.Regua("X1", 6);
    for (int i = 0; i < 4; ++i)
        ItensRegua::Liga(x1[size_t(i)], "INI", k1, QString::number(i + 1));
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(3, {});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1 2 3 4", "X1: 5 6"}));
}

TEST_F(ModeloReguasTest, TwoSymbolsOfOneLabelCountAsOneWhenCutting) {
    CEItemLista* a = itens_.Simbolo("A1", "K1", {"1", "2"});
    CEItemLista* b = itens_.Simbolo("A2", "K1", {"3", "4"});
    auto x1 = itens_.Regua("X1", 5);
    ItensRegua::Liga(x1[1], "INI", a, "1");
    ItensRegua::Liga(x1[2], "INI", a, "2");
    ItensRegua::Liga(x1[3], "INI", b, "3");
    ItensRegua::Liga(x1[4], "INI", b, "4");
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(3, {});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1", "X1: 2 3 4 5"}));
}

TEST_F(ModeloReguasTest, AStripOfOneTerminalAndAnEmptyDrawing) {
    itens_.Borne("X1", "1");
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(1, {"REGUA"});
    modelo.Pagina(2);
    modelo.CalculaPontos(100, 10, 20);
    modelo.CalculaDetalhes({"RELACAO_INI"});
    EXPECT_EQ(Reguas(modelo), QStringList({"X1: 1"}));
    ASSERT_EQ(modelo.paginas.size(), 1u);
    EXPECT_EQ(modelo.reguas[0]->y, 120.0);
    ASSERT_EQ(modelo.reguas[0]->detalhes.size(), 1u);
    EXPECT_EQ(modelo.reguas[0]->detalhes[0].quantidade, 1);

    CEModeloReguas vazio;
    vazio.Monta(VetorItens{nullptr}, {});
    EXPECT_TRUE(vazio.reguas.empty());
    EXPECT_TRUE(vazio.paginas.empty());
}

TEST_F(ModeloReguasTest, NoLimitCutsOnlyAtBreakFieldsAndAZeroStripCountIsOne) {
    itens_.Regua("X1", 30);
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(0, {});
    ASSERT_EQ(modelo.reguas.size(), 1u);
    EXPECT_EQ(modelo.reguas[0]->bornes.size(), 30u);
    modelo.Pagina(0);
    EXPECT_EQ(modelo.paginas.size(), 1u);
}

TEST_F(ModeloReguasTest, AJumperKeepsItsTracksAcrossACutAndAPageBreak) {
    auto x1 = itens_.Regua("X1", 6);
    ItensRegua::Jumper({x1[1], x1[4]});
    CEModeloReguas& modelo = ComTrilhas();
    modelo.CortaReguas(3, {});
    modelo.Pagina(1);
    ASSERT_EQ(modelo.reguas.size(), 2u);
    EXPECT_EQ(Trilhas(*modelo.reguas[0]), "1: 2:1 3:2");
    EXPECT_EQ(Trilhas(*modelo.reguas[1]), "4:2 5:3 6:");
    EXPECT_EQ(modelo.paginas.size(), 2u);
    EXPECT_NE(modelo.reguas[0]->pagina, modelo.reguas[1]->pagina);
    EXPECT_EQ(modelo.Borne("X1", "5")->regua, modelo.reguas[1].get());
}

TEST_F(ModeloReguasTest, PagesTakeStripsUpToTheirCountAndPointsGoTopDown) {
    itens_.Regua("X1", 7);
    CEModeloReguas& modelo = Modelo();
    modelo.CortaReguas(2, {});
    modelo.Pagina(3);
    modelo.CalculaPontos(50, 10, 5);
    ASSERT_EQ(modelo.reguas.size(), 4u);
    ASSERT_EQ(modelo.paginas.size(), 2u);
    EXPECT_EQ(modelo.paginas[0]->Quantidade(), 3);
    std::vector<double> ys;
    for (const auto& regua : modelo.reguas) {
        EXPECT_EQ(regua->x, 10.0);
        ys.push_back(regua->y);
    }
    // A page of three: 2d, d, 0 above the reference; a lone strip one distance up.
    EXPECT_EQ(ys, (std::vector<double>{105, 55, 5, 55}));
}

TEST_F(ModeloReguasTest, TheTemplatesSettingsDriveTheWholeLayout) {
    auto x1 = itens_.Regua("X1", 5);
    ItensRegua::Jumper({x1[0], x1[4]});
    CEModeloReguas::Parametros p;
    p.bornesPorRegua = 3;
    p.reguasPorPagina = 2;
    p.distanciaReguas = 100;
    p.refX = 1;
    p.refY = 2;
    modelo_.Monta(itens_.itens, p);
    EXPECT_EQ(Reguas(modelo_), QStringList({"X1: 1 2 3", "X1: 4 5"}));
    EXPECT_EQ(Trilhas(*modelo_.reguas[1]), "4:2 5:3");
    ASSERT_EQ(modelo_.paginas.size(), 1u);
    EXPECT_EQ(modelo_.reguas[0]->y, 102.0);
    EXPECT_EQ(modelo_.reguas[1]->y, 2.0);
}

// ---- details and the symbols row

TEST_F(ModeloReguasTest, DetailRunsCloseWhereAFieldChangesWithTheLastTerminalsFields) {
    auto x1 = itens_.Regua("X1", 6);
    const char* lados[] = {"K1", "K1", "K2", "", "", "K1"};
    for (size_t i = 0; i < x1.size(); ++i)
        x1[i]->definirCampo("RELACAO_INI", lados[i]);
    CEModeloReguas& modelo = Modelo();
    modelo.CalculaDetalhes({"RELACAO_INI"});
    const auto& detalhes = modelo.reguas[0]->detalhes;
    QStringList runs;
    for (const CEDetalheReguaDwg& d : detalhes)
        runs << QString::number(d.quantidade) + "/" + d.ultimo->valorCampo("NUMERO") + "/" +
                    d.ultimo->valorCampo("RELACAO_INI");
    EXPECT_EQ(runs, QStringList({"2/2/K1", "1/3/K2", "2/5/", "1/6/K1"}));
    // Without fields the whole strip is one run.
    modelo.CalculaDetalhes({});
    ASSERT_EQ(modelo.reguas[0]->detalhes.size(), 1u);
    EXPECT_EQ(modelo.reguas[0]->detalhes[0].quantidade, 6);
}

TEST_F(ModeloReguasTest, RunsAndCutsReadAFieldATerminalLacksAsEmptyAndANameNoneHasAsEqual) {
    auto x1 = itens_.Regua("X1", 7);
    // The fifth lacks the field: as empty as the fourth's and the sixth's.
    const char* lados[] = {"K1", "K1", "K2", "", nullptr, "", "K1"};
    const char* locais[] = {"+A", "+A", "+A", "+A", "+A", "+B", "+B"};
    for (size_t i = 0; i < x1.size(); ++i) {
        if (lados[i]) x1[i]->definirCampo("RELACAO_INI", lados[i]);
        x1[i]->definirCampo("LOCAL", locais[i]);
    }
    CEModeloReguas& modelo = Modelo();
    modelo.CalculaDetalhes({"NENHUM_ITEM_TEM", "RELACAO_INI", "LOCAL"});
    QStringList runs;
    for (const CEDetalheReguaDwg& d : modelo.reguas[0]->detalhes)
        runs << QString::number(d.quantidade) + "/" + d.ultimo->valorCampo("NUMERO");
    EXPECT_EQ(runs, QStringList({"2/2", "1/3", "2/5", "1/6", "1/7"}));
    // Cuts at the limit or where a break field changes, whichever field it is.
    modelo.CortaReguas(3, {"NENHUM_ITEM_TEM", "LOCAL", "RELACAO_INI"});
    EXPECT_EQ(Reguas(modelo),
              QStringList({"X1: 1 2 |", "X1: 3 |", "X1: 4 5 |", "X1: 6 |", "X1: 7"}));
}

TEST_F(ModeloReguasTest, ASideThatNamesNoHandleJoinsTheFirstSymbolWithoutOne) {
    CEItemLista* sem = itens_.Simbolo("", "K1", {"1"});
    itens_.Simbolo("", "K2", {"1"});
    CEItemLista* com = itens_.Simbolo("A3", "K3", {"1"});
    auto x1 = itens_.Regua("X1", 3);
    x1[0]->definirCampo("REL_INI", "K1:1");
    ItensRegua::Liga(x1[1], "FIM", com, "1");
    x1[2]->definirCampo("REL_INI", "K9:1");
    x1[2]->definirCampo("HANDLE_INI", "B9");
    CEModeloReguas& modelo = Modelo();
    ASSERT_NE(modelo.Simbolo(""), nullptr);
    EXPECT_EQ(modelo.Simbolo("")->item, sem);
    EXPECT_EQ(modelo.Borne("X1", "1")->PrimeiroSimbolo(), modelo.Simbolo(""));
    EXPECT_EQ(modelo.Borne("X1", "2")->PrimeiroSimbolo(), modelo.Simbolo("A3"));
    EXPECT_EQ(modelo.Borne("X1", "3")->PrimeiroSimbolo(), nullptr);
    EXPECT_EQ(modelo.Simbolo("B9"), nullptr);
}

TEST_F(ModeloReguasTest, ASymbolSpanningTerminalsStandsUnderTheFirstOfThem) {
    CEItemLista* k1 = itens_.Simbolo("A1", "K1", {"1", "2", "3"});
    CEItemLista* k2 = itens_.Simbolo("A2", "K2", {"1"});
    auto x1 = itens_.Regua("X1", 5);
    for (int i = 0; i < 3; ++i)
        ItensRegua::Liga(x1[size_t(i)], "INI", k1, QString::number(i + 1));
    ItensRegua::Liga(x1[3], "INI", k2, "1");
    CEModeloReguas& modelo = Modelo();
    const auto simbolos = modelo.reguas[0]->Simbolos();
    ASSERT_EQ(simbolos.size(), 5u);
    EXPECT_EQ(simbolos[0], modelo.Simbolo("A1"));
    EXPECT_EQ(simbolos[1], nullptr);
    EXPECT_EQ(simbolos[2], nullptr);
    EXPECT_EQ(simbolos[3], modelo.Simbolo("A2"));
    EXPECT_EQ(simbolos[4], nullptr);
}

}  // namespace
