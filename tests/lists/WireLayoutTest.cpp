// The wire list's page layout on items and a template of the test's own: sorting, page
// breaks at key changes, the grid, the total page and the length's number format.
#include "QtPrinters.h"
#include "TemplateDouble.h"
#include "lists/CCFioGrfWriter.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

class WireLayoutTest : public ::testing::Test {
protected:
    WireLayoutTest() {
        modelo_.simbolos = {
            {"*X_INIC_LISTA*", 10.0},   {"*Y_INIC_LISTA*", 200.0},
            {"TAM_DETALHE", "5"},       {"*ESPACO_HORIZONTAL*", 100.0},
            {"*LINHAS_POR_PAGINA*", 3}, {"*COLUNA_SN*", true},
            {"*NUMERO_COLUNA*", 2},     {"*LISTA_DE_SORT*", QStringList{"FIO"}},
            {"*ORDEM_CRESCENTE*", "C"}, {"*ZV_CHAVE_QUEBRA_PAGINA*", QStringList{"GRUPO"}},
            {"*NUMERO_LINHAS*", 2},     {"LISTA_TOTAL", "TOT"}};
    }
    CEItemLista* fio(const char* numero, const char* grupo = "ESQ", const char* comp = "10") {
        donos_.push_back(std::make_unique<CEItemLista>());
        donos_.back()->definirCampo("FIO", numero);
        donos_.back()->definirCampo("GRUPO", grupo);
        donos_.back()->definirCampo("COMPRIMENTO", comp);
        itens_.push_back(donos_.back().get());
        return donos_.back().get();
    }
    // Each page as "PAGINA QTD | number@x,y ...", the total page as "TOTAL | field=sum".
    QStringList paginas(CCFioGrfWriter& escritor, const QStringList& totais = {"COMPRIMENTO"}) {
        QStringList texto;
        for (const CEPaginaLista& p : escritor.Diagrama(itens_, modelo_, totais)) {
            QString linha = "TOTAL |";
            if (!p.pagina_total)
                linha = p.atributos.value("PAGINA") + " " + p.atributos.value("QTD") + " |";
            for (const CELinhaLista& l : p.linhas) {
                if (p.pagina_total) {
                    QStringList campos = l.item->campos.keys();
                    campos.sort();
                    for (const QString& c : campos)
                        linha += " " + c + "=" + l.item->valorCampo(c);
                    linha += QString("@%1,%2").arg(l.x).arg(l.y);
                } else {
                    linha += QString(" %1@%2,%3").arg(l.item->valorCampo("FIO")).arg(l.x).arg(l.y);
                }
            }
            texto << linha;
        }
        return texto;
    }

    TemplateDouble modelo_;
    std::vector<std::unique_ptr<CEItemLista>> donos_;
    VetorItens itens_;
};

TEST_F(WireLayoutTest, RowsAreSortedFillTheGridAndAKeyChangeStartsAPage) {
    fio("10"), fio("2"), fio("1"), fio("3", "ESQ", "2.5"), fio("20", "FORCA", "0.5");
    CCFioGrfWriter escritor;
    EXPECT_EQ(paginas(escritor), QStringList({"1 5 | 1@10,200 2@10,195 3@10,190 10@110,200",
                                              "4 5 | 20@10,200", "TOTAL | COMPRIMENTO=33@10,200"}));
    // The vector is left in the list's order.
    ASSERT_EQ(itens_.size(), 5u);
    EXPECT_EQ(itens_[0]->valorCampo("FIO"), "1");
    EXPECT_EQ(itens_[4]->valorCampo("FIO"), "20");
}

TEST_F(WireLayoutTest, AFullPageStartsTheNextAtTheItemsIndex) {
    for (const char* n : {"1", "2", "3", "4", "5", "6", "7"})
        fio(n);
    modelo_.simbolos.remove("LISTA_TOTAL");
    CCFioGrfWriter escritor;
    EXPECT_EQ(paginas(escritor),
              QStringList({"1 7 | 1@10,200 2@10,195 3@10,190 4@110,200 5@110,195 6@110,190",
                           "6 7 | 7@10,200"}));
    // Each page took room for its three rows by two columns at its first row, and needed
    // no more; a template's absurd grid takes a bounded room.
    itens_.clear();
    for (const char* n : {"1", "2", "3", "4", "5", "6", "7"})
        fio(n);
    for (const CEPaginaLista& pagina : escritor.Diagrama(itens_, modelo_, {}))
        EXPECT_EQ(pagina.linhas.capacity(), 6u);
    modelo_.simbolos["*LINHAS_POR_PAGINA*"] = 1 << 30;
    modelo_.simbolos["*NUMERO_COLUNA*"] = -5;
    const std::vector<CEPaginaLista> grande = escritor.Diagrama(itens_, modelo_, {});
    ASSERT_EQ(grande.size(), 1u);
    EXPECT_EQ(grande[0].linhas.size(), 7u);
    EXPECT_EQ(grande[0].linhas.capacity(), size_t(CCListaPaginada::Grade::kMaxLinhas));
}

TEST_F(WireLayoutTest, AnyOrderButCReversesTheSortedList) {
    fio("1"), fio("3"), fio("2");
    modelo_.simbolos["*ORDEM_CRESCENTE*"] = "D";
    modelo_.simbolos["*LINHAS_POR_PAGINA*"] = 10;
    CCFioGrfWriter escritor;
    EXPECT_EQ(paginas(escritor, {})[0], "1 3 | 3@10,200 2@10,195 1@10,190");
}

TEST_F(WireLayoutTest, TotalsSumTheLeadingNumberOfEachTextAndAnEmptyItemStillMakesARow) {
    fio("1", "ESQ", "12,5");
    fio("2", "ESQ", "abc");
    donos_.push_back(std::make_unique<CEItemLista>());
    itens_.push_back(donos_.back().get());
    modelo_.simbolos["*LINHAS_POR_PAGINA*"] = 10;
    modelo_.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList();
    CCFioGrfWriter escritor;
    const QStringList p = paginas(escritor, {"COMPRIMENTO", "QTD"});
    ASSERT_EQ(p.size(), 2);
    // The empty item sorts first: its row is empty.
    EXPECT_EQ(p[0], "1 3 | @10,200 1@10,195 2@10,190");
    EXPECT_EQ(p[1], "TOTAL | COMPRIMENTO=12 QTD=0@10,200");
}

TEST_F(WireLayoutTest, NoTotalBlockNoTotalPageAndNoItemsNoPages) {
    modelo_.simbolos["LISTA_TOTAL"] = "";
    fio("1");
    CCFioGrfWriter escritor;
    EXPECT_EQ(paginas(escritor), QStringList({"1 1 | 1@10,200"}));
    itens_.clear();
    modelo_.simbolos["LISTA_TOTAL"] = "TOT";
    EXPECT_TRUE(paginas(escritor).isEmpty());
}

// The cable list breaks with blank rows: the hook decides.
class ComBranco : public CCFioGrfWriter {
public:
    bool QuebraComBranco(CETemplate&) override { return true; }
};

TEST_F(WireLayoutTest, WithTheBlankRowHookAKeyChangeLeavesRowsFree) {
    fio("1", "A"), fio("2", "B"), fio("3", "B");
    modelo_.simbolos["*LINHAS_POR_PAGINA*"] = 10;
    modelo_.simbolos.remove("LISTA_TOTAL");
    ComBranco escritor;
    EXPECT_EQ(paginas(escritor), QStringList({"1 3 | 1@10,200 2@10,185 3@10,180"}));
}

TEST_F(WireLayoutTest, TheLengthAndAnyFieldOfTheSameTextPrintAsANumber) {
    CEItemLista item;
    item.definirCampo("COMPRIMENTO", "1150.000000");
    item.definirCampo("LENGTH", "1150.000000");
    item.definirCampo("FIO", "12");
    EXPECT_EQ(CCFioGrfWriter::ValorVariavel(item, "COMPRIMENTO", 0), "1150");
    EXPECT_EQ(CCFioGrfWriter::ValorVariavel(item, "LENGTH", 2), "1150.00");
    EXPECT_EQ(CCFioGrfWriter::ValorVariavel(item, "FIO", 2), "12");
    // Narrowed to single precision before printing.
    item.definirCampo("COMPRIMENTO", "0.1");
    EXPECT_EQ(CCFioGrfWriter::ValorVariavel(item, "COMPRIMENTO", 9), "0.100000001");
    // A row without a length prints its empty cells empty.
    CEItemLista sem;
    EXPECT_EQ(CCFioGrfWriter::ValorVariavel(sem, "CAMINHOFIO", 0), "");
}

}  // namespace
