// The terminal list's page layout and jumper marks, on items and a template of the test's own.
#include "QtPrinters.h"
#include "TemplateDouble.h"
#include "lists/CCBorneGrfWriter.h"
#include "readers/CCBorneDataReader.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

class LayoutTest : public ::testing::Test {
protected:
    LayoutTest() {
        modelo_.simbolos = {{"*X_INIC_LISTA*", 10.0},   {"*Y_INIC_LISTA*", 200.0},
                            {"TAM_DETALHE", "4.7"},     {"*ESPACO_HORIZONTAL*", 100.0},
                            {"*LINHAS_POR_PAGINA*", 3}, {"*COLUNA_SN*", true},
                            {"*NUMERO_COLUNA*", 2}};
    }
    CEItemLista* borne(const char* regua, const char* numero) {
        donos_.push_back(std::make_unique<CEItemLista>());
        donos_.back()->definirCampo("REGUA", regua);
        donos_.back()->definirCampo("NUMERO", numero);
        itens_.push_back(donos_.back().get());
        return donos_.back().get();
    }
    // Each page as "PAGINA:REGUA | strip:number@x,y ...", blank rows marked with *.
    QStringList paginas() {
        QStringList texto;
        for (const CEPaginaLista& p : CCBorneGrfWriter::Diagrama(itens_, modelo_)) {
            QString linha = p.atributos.value("PAGINA") + ":" + p.atributos.value("REGUA") + " |";
            for (const CELinhaLista& l : p.linhas)
                linha += QString(" %1:%2%3@%4,%5")
                             .arg(l.item->valorCampo("REGUA"), l.item->valorCampo("NUMERO"),
                                  l.proprio ? "*" : "")
                             .arg(l.x)
                             .arg(l.y);
            texto << linha;
        }
        return texto;
    }

    TemplateDouble modelo_;
    std::vector<std::unique_ptr<CEItemLista>> donos_;
    VetorItens itens_;
};

TEST_F(LayoutTest, RowsFillColumnsDownwardsAndAStripChangeStartsAPage) {
    borne("X1", "1"), borne("X1", "2"), borne("X1", "3"), borne("X1", "4");
    borne("X2", "1");
    const float y1 = 200.0f - 4.7f, y2 = y1 - 4.7f;
    EXPECT_EQ(paginas(),
              QStringList({QString("1:X1 | X1:1@10,200 X1:2@10,%1 X1:3@10,%2 X1:4@110,200")
                               .arg(double(y1))
                               .arg(double(y2)),
                           "4:X2 | X2:1@10,200"}));
}

TEST_F(LayoutTest, BlankRowsBetweenStripsWhenTheBreakFlagAsksForThem) {
    modelo_.simbolos.insert("*QUEBRA_PAGINA*", true);
    modelo_.simbolos.insert("*LINHAS_ESPACO*", 1);
    borne("X1", "1"), borne("X2", "1"), borne("X2", "2");
    const QStringList p = paginas();
    ASSERT_EQ(p.size(), 1);
    // X1:1 at the top, one blank place, then X2:1 ends the column; X2:2 opens the next.
    EXPECT_TRUE(p[0].contains(QString("X2:1@10,%1").arg(double(200.0f - 4.7f - 4.7f))));
    EXPECT_TRUE(p[0].contains("X2:2@110,200"));
}

// With no rows per column the column ends after every row, a page break included: after a
// strip break the new page's first row stands in its second column, and with one column
// the break leaves an empty page behind it.
TEST_F(LayoutTest, WithNoRowsPerColumnTheColumnEndsAfterABreakToo) {
    modelo_.simbolos.insert("*LINHAS_POR_PAGINA*", 0);
    borne("X1", "1"), borne("X2", "1"), borne("X2", "2");
    EXPECT_EQ(paginas(),
              QStringList({"1:X1 | X1:1@10,200", "1:X2 | X2:1@110,200", "2:X2 | X2:2@10,200"}));
    modelo_.simbolos.insert("*NUMERO_COLUNA*", 1);
    EXPECT_EQ(paginas(), QStringList({"1:X1 | X1:1@10,200", "1:X2 |", "1:X2 | X2:1@10,200",
                                      "2:X2 | X2:2@10,200"}));
    // A key break does the same.
    itens_.clear();
    modelo_.simbolos.insert("*ZV_CHAVE_QUEBRA_PAGINA*", QStringList{"LADO"});
    borne("X3", "1")->definirCampo("LADO", "A");
    borne("X3", "2")->definirCampo("LADO", "B");
    EXPECT_EQ(paginas(), QStringList({"1:X3 | X3:1@10,200", "1:X3 |", "1:X3 | X3:2@10,200"}));
}

TEST_F(LayoutTest, FillingToTheEndNumbersBlankRowsAndKeysDoNotBreak) {
    modelo_.simbolos.insert("*PREENCHE_ATE_FINAL*", true);
    modelo_.simbolos.insert("*ZV_CHAVE_QUEBRA_PAGINA*", QStringList{"LADO"});
    borne("X1", "7")->definirCampo("LADO", "A");
    borne("X1", "8")->definirCampo("LADO", "B");
    borne("X2", "1");
    const QStringList p = paginas();
    ASSERT_EQ(p.size(), 1);
    EXPECT_TRUE(p[0].contains("X1:8@10,"));
    EXPECT_TRUE(p[0].contains("X1:9*@10,"));
    EXPECT_TRUE(p[0].contains("X2:1@110,200"));
    EXPECT_TRUE(p[0].contains("X2:2*@110,"));
    EXPECT_TRUE(p[0].contains("X2:3*@110,"));
}

TEST_F(LayoutTest, JumperBarsKeepTheirColumnAndOverflowWhenNoneIsFree) {
    modelo_.simbolos.insert("*LINHAS_POR_PAGINA*", 10);
    CEItemLista* b1 = borne("X1", "1");
    CEItemLista* b2 = borne("X1", "2");
    CEItemLista* b3 = borne("X1", "3");
    CEItemLista* b4 = borne("X1", "4");
    // Bar 1-3 passes 2; bar 2-4 overlaps it.
    b1->proximo = b3, b3->anterior = b1;
    b2->proximo = b4, b4->anterior = b2;
    std::vector<CEPaginaLista> paginas = CCBorneGrfWriter::Diagrama(itens_, modelo_);
    CCBorneGrfWriter::MarcaJumpers(paginas, 2);
    const auto& l = paginas[0].linhas;
    EXPECT_EQ(l[0].marcas, std::vector<int>({0, 4}));
    EXPECT_EQ(l[1].marcas, std::vector<int>({2, 0}));
    EXPECT_EQ(l[2].marcas, std::vector<int>({3, 2}));
    EXPECT_EQ(l[3].marcas, std::vector<int>({4, 3}));
    // With one column the second bar has no free place and draws in overflow.
    CCBorneGrfWriter::MarcaJumpers(paginas, 1);
    EXPECT_EQ(l[1].marcas_extra, std::vector<int>({0}));
    EXPECT_EQ(l[2].marcas_extra, std::vector<int>({2}));
    EXPECT_EQ(l[3].marcas_extra, std::vector<int>({3}));
}

// Strip X1 of 1 to 8 after a strip X0, terminal 3 bridged to 5 and 7, the others pointing
// nowhere: one bar from 3 to 7, through 5, passing 4 and 6, and no mark anywhere else.
TEST_F(LayoutTest, AJumperTextDrawsTheBarItNamesAndNoOther) {
    modelo_.simbolos.insert("*LINHAS_POR_PAGINA*", 20);
    modelo_.simbolos.insert("*QUEBRA_PAGINA*", true);
    for (const char* n : {"1", "2"})
        borne("X0", n)->definirCampo("JUMPER", "");
    for (const char* n : {"1", "2", "3", "4", "5", "6", "7", "8"})
        borne("X1", n)->definirCampo("JUMPER", n == QString("8") ? "," : "");
    itens_[4]->definirCampo("JUMPER", "5,7");
    CCBorneDataReader::LigaJumpers(itens_);
    std::vector<CEPaginaLista> paginas = CCBorneGrfWriter::Diagrama(itens_, modelo_);
    CCBorneGrfWriter::MarcaJumpers(paginas, 3);
    ASSERT_EQ(paginas.size(), 1u);
    QStringList marcas;
    for (const CELinhaLista& l : paginas[0].linhas) {
        QString texto = l.item->valorCampo("REGUA") + ":" + l.item->valorCampo("NUMERO") + " ";
        for (int m : l.marcas)
            texto += QString::number(m);
        for (int m : l.marcas_extra)
            texto += "+" + QString::number(m);
        marcas << texto;
    }
    EXPECT_EQ(marcas, QStringList({"X0:1 444", "X0:2 444", "X1:1 444", "X1:2 444", "X1:3 044",
                                   "X1:4 244", "X1:5 144", "X1:6 244", "X1:7 344", "X1:8 444"}));
}

TEST_F(LayoutTest, NoItemsNoPages) {
    EXPECT_TRUE(paginas().isEmpty());
}

}  // namespace
