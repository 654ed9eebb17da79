// What the list writers keep of a block's cells from one row to the next: a cell is worked
// out again only when its texts are not the ones seen at its place, and a field name no item
// had yet is found once an item has it.
#include "lists/CECelulasBloco.h"
#include "readers/CEItemLista.h"

#include <gtest/gtest.h>

#include <QString>

namespace {

struct Contador {
    int vezes = 0;
    QString operator()(const QString& tag, const QString& padrao) {
        ++vezes;
        return tag + "/" + padrao;
    }
};

// A text of equal content in memory of its own, as a block read again gives it.
QString Outra(const QString& texto) {
    return QString(texto.constData(), texto.size());
}

TEST(CelulasBlocoTest, TheSameTextsAtAPlaceAreWorkedOutOnceForEveryPlacing) {
    CECelulasBloco<QString> celulas;
    Contador resolve;
    const QString tag1 = "VARIAVEL_1", padrao1 = "FIO", tag2 = "ROTULO", padrao2 = "fixo";
    for (int linha = 0; linha < 5; ++linha) {
        celulas.Inicia("LINHA");
        EXPECT_EQ(celulas.Proxima(tag1, padrao1, resolve), "VARIAVEL_1/FIO");
        EXPECT_EQ(celulas.Proxima(tag2, padrao2, resolve), "ROTULO/fixo");
    }
    EXPECT_EQ(resolve.vezes, 2);
}

TEST(CelulasBlocoTest, EqualTextsOfOtherMemoryKeepTheAnswerAndOtherTextsAreWorkedOutAgain) {
    CECelulasBloco<QString> celulas;
    Contador resolve;
    const QString tag = "VARIAVEL_1", padrao = "FIO";
    celulas.Inicia("LINHA");
    celulas.Proxima(tag, padrao, resolve);
    // As read back from a placed reference: the same texts, in memory of their own.
    celulas.Inicia("LINHA");
    EXPECT_EQ(celulas.Proxima(Outra(tag), Outra(padrao), resolve), "VARIAVEL_1/FIO");
    EXPECT_EQ(resolve.vezes, 1);
    // The block changed: the place now holds another cell, and its answer is the new one.
    const QString nova = "FUNCAO_1";
    celulas.Inicia("LINHA");
    EXPECT_EQ(celulas.Proxima(nova, padrao, resolve), "FUNCAO_1/FIO");
    celulas.Inicia("LINHA");
    EXPECT_EQ(celulas.Proxima(nova, padrao, resolve), "FUNCAO_1/FIO");
    EXPECT_EQ(resolve.vezes, 2);
    // A changed default text alone is another cell too.
    celulas.Inicia("LINHA");
    EXPECT_EQ(celulas.Proxima(nova, Outra(padrao) + "_2", resolve), "FUNCAO_1/FIO_2");
    EXPECT_EQ(resolve.vezes, 3);
}

TEST(CelulasBlocoTest, BlocksPlacedInTurnKeepTheirCellsApartUntilReset) {
    CECelulasBloco<QString> celulas;
    Contador resolve;
    const QString a = "A", b = "B", padrao = "x";
    for (int vez = 0; vez < 3; ++vez) {
        celulas.Inicia("BORNE");
        EXPECT_EQ(celulas.Proxima(a, padrao, resolve), "A/x");
        celulas.Inicia("SIMBOLO");
        EXPECT_EQ(celulas.Proxima(b, padrao, resolve), "B/x");
    }
    EXPECT_EQ(resolve.vezes, 2);
    celulas.Reinicia();
    celulas.Inicia("BORNE");
    celulas.Proxima(a, padrao, resolve);
    EXPECT_EQ(resolve.vezes, 3);
}

// A writer places its blocks under the very same name texts, row after row, and new blocks
// come in between: each name keeps finding its own cells, however the table grows.
TEST(CelulasBlocoTest, ANameTextPlacedAgainFindsItsOwnCellsWhileOtherBlocksComeAndGo) {
    CECelulasBloco<QString> celulas;
    Contador resolve;
    const QString borne = "BORNE", simbolo = "SIMBOLO", tag = "T", padrao = "x";
    const QString outroPadrao = "y";
    celulas.Inicia(borne);
    EXPECT_EQ(celulas.Proxima(tag, padrao, resolve), "T/x");
    celulas.Inicia(borne);
    EXPECT_EQ(celulas.Proxima(tag, padrao, resolve), "T/x");
    EXPECT_EQ(resolve.vezes, 1);
    // Many other blocks, each under a name of its own, between two placings of one name.
    for (int i = 0; i < 200; ++i) {
        celulas.Inicia(simbolo + QString::number(i));
        EXPECT_EQ(celulas.Proxima(tag, outroPadrao, resolve), "T/y");
        celulas.Inicia(borne);
        EXPECT_EQ(celulas.Proxima(tag, padrao, resolve), "T/x");
    }
    EXPECT_EQ(resolve.vezes, 201);
    // The same name in memory of its own is the same block.
    celulas.Inicia(Outra(borne));
    EXPECT_EQ(celulas.Proxima(tag, padrao, resolve), "T/x");
    celulas.Inicia(simbolo + "7");
    EXPECT_EQ(celulas.Proxima(tag, outroPadrao, resolve), "T/y");
    EXPECT_EQ(resolve.vezes, 201);
    // After a reset the name's cells are worked out anew, under the same text too.
    celulas.Reinicia();
    celulas.Inicia(borne);
    EXPECT_EQ(celulas.Proxima(tag, padrao, resolve), "T/x");
    EXPECT_EQ(resolve.vezes, 202);
}

TEST(CelulasBlocoTest, AFieldNameNoItemHadIsFoundOnceAnItemHasIt) {
    const QString nome = "CAMPO_SO_DAS_CELULAS_DE_BLOCO";
    ASSERT_EQ(CamposItem::numeroSeHouver(nome), CamposItem::kSemNome)
        << "the name must be new to this program for the test to mean anything";
    CECampoPorNumero campo = CECampoPorNumero::De(nome);
    CEItemLista item;
    item.definirCampo("FIO", "7");
    EXPECT_EQ(campo.Valor(item.campos, nome), QString());
    item.definirCampo(nome, "achado");
    EXPECT_EQ(campo.Valor(item.campos, nome), "achado");
    CEItemLista outro;
    outro.definirCampo("FIO", "8");
    EXPECT_EQ(campo.Valor(outro.campos, nome), QString());
    EXPECT_EQ(CECampoPorNumero::De("FIO").Valor(outro.campos, "FIO"), "8");
}

}  // namespace
