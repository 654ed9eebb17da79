// The wire list's rows written into a document of an in-process host, with row blocks made
// by the test: each cell filled from its row's item, and a row block that changes between
// two lists of one writer filled as it is then.
#include "QtPrinters.h"
#include "TemplateDouble.h"
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "lists/CCFioGrfWriter.h"
#include "readers/VetorItens.h"
#include "settings/CIMensagens.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFileInfo>

#include <memory>

namespace {

class WireRowsTest : public FacadeFixture {
protected:
    void SetUp() override {
        FacadeFixture::SetUp();
        ASSERT_NE(documento_, nullptr);
        CICad::SetStringLisp("*DIRETORIO_REDE*", pasta_.path() + "/");
        modelo_.simbolos = {{"*X_INIC_LISTA*", 10.0},
                            {"*Y_INIC_LISTA*", 200.0},
                            {"TAM_DETALHE", "5"},
                            {"*ESPACO_HORIZONTAL*", 0.0},
                            {"*LINHAS_POR_PAGINA*", 10},
                            {"*COLUNA_SN*", false},
                            {"*LISTA_DE_SORT*", QStringList{"FIO"}},
                            {"*ORDEM_CRESCENTE*", "C"},
                            {"FUNCAO_LSTGRW", "LISTAS"},
                            {"LISTA_DETALHE", "BLOCOS\\LINHA"}};
        Bloco({{"VARIAVEL_1", "FIO"}, {"VARIAVEL_2", "COMPRIMENTO"}, {"ROTULO", "fixo"}});
    }
    void TearDown() override {
        CIMensagens::Descarregar();
        app_.reset();
    }

    // The row block's file, with these attribute definitions (tag and default text).
    void Bloco(const std::vector<std::pair<QString, QString>>& atributos,
               const QString& nome = "LINHA") {
        zvdb::Database bloco;
        bloco.modelSpace()->addLwPolyline({{0, 0}, {100, 0}, {100, -5}, {0, -5}}, true);
        double x = 0;
        for (const auto& [tag, valor] : atributos)
            bloco.modelSpace()->addAttributeDefinition(tag.toStdString(), tag.toStdString(),
                                                       valor.toStdString(), {x += 10, -4, 0}, 2.0);
        const QString caminho = pasta_.filePath("BLOCOS/" + nome + ".dxf");
        QDir().mkpath(QFileInfo(caminho).path());
        zvdb::DxfWriter::saveFile(bloco, caminho.toStdString());
    }
    CEItemLista* Fio(const QString& numero, const QString& comprimento) {
        donos_.push_back(std::make_unique<CEItemLista>());
        donos_.back()->definirCampo("FIO", numero);
        donos_.back()->definirCampo("COMPRIMENTO", comprimento);
        itens_.push_back(donos_.back().get());
        return donos_.back().get();
    }
    // Each row reference of the drawing as "tag=value ..." in attribute order, in drawing
    // order.
    QStringList Linhas() const {
        QStringList linhas;
        for (const zvdb::Entity* entidade : documento_->database()->modelSpace()->entities()) {
            const auto* ref = dynamic_cast<const zvdb::BlockReference*>(entidade);
            if (!ref || !QString::fromUtf8(ref->blockName().data(), int(ref->blockName().size()))
                             .startsWith("BLK_CTR_LST_DET_CABLA"))
                continue;
            QStringList celulas;
            for (const zvdb::Attribute* a : ref->attributes())
                celulas << QString::fromStdString(std::string(a->tag())) + "=" +
                               QString::fromStdString(std::string(a->textValue()));
            linhas << celulas.join(" ");
        }
        return linhas;
    }

    TemplateDouble modelo_;
    std::vector<std::unique_ptr<CEItemLista>> donos_;
    VetorItens itens_;
};

TEST_F(WireRowsTest, EveryCellIsFilledFromItsRowAndABlockThatGainsAFunctionRunsIt) {
    const CEItemLista* primeiro = Fio("1", "12.5");
    const CEItemLista* segundo = Fio("2", "3");
    Fio("3", "");
    // The length prints as a number; a row without one keeps its empty cell.
    const int digitos = CICad::GetIntLisp("PBLINTFIODGTSAFTERDOT", 0);
    const QString c1 = CCFioGrfWriter::ValorVariavel(*primeiro, "COMPRIMENTO", digitos);
    const QString c2 = CCFioGrfWriter::ValorVariavel(*segundo, "COMPRIMENTO", digitos);
    ASSERT_NE(c1, "12.5") << "the printed length is no copy of the field";
    CCFioGrfWriter escritor;
    escritor.EscreverItens(itens_, modelo_);
    EXPECT_EQ(Linhas(), QStringList({"VARIAVEL_1=1 VARIAVEL_2=" + c1 + " ROTULO=fixo",
                                     "VARIAVEL_1=2 VARIAVEL_2=" + c2 + " ROTULO=fixo",
                                     "VARIAVEL_1=3 VARIAVEL_2= ROTULO=fixo"}));

    // The row block's file gains a function; the same writer's next list reloads it, and the
    // old pages go first.
    Bloco({{"VARIAVEL_1", "FIO"},
           {"FUNCAO_1", "(strcat \"F\" (cdr (assoc \"FIO\" reg)))"},
           {"VARIAVEL_2", "COMPRIMENTO"}});
    ui_->setAnswer("question:89", "yes");
    escritor.EscreverItens(itens_, modelo_);
    EXPECT_EQ(Linhas(), QStringList({"VARIAVEL_1=1 FUNCAO_1=F1 VARIAVEL_2=" + c1,
                                     "VARIAVEL_1=2 FUNCAO_1=F2 VARIAVEL_2=" + c2,
                                     "VARIAVEL_1=3 FUNCAO_1=F3 VARIAVEL_2="}));
}

TEST_F(WireRowsTest, TheFieldsOfTheRowsAreThoseTheirBlocksSortAndBreaksNameUnlessAFunctionReads) {
    modelo_.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"grupo "};
    modelo_.simbolos["LISTA_TOTAL"] = "BLOCOS\\SOMA";
    Bloco({{"VARIAVEL_S", "COMPRIMENTO_TOTAL"}}, "SOMA");
    auto nomes = [this] {
        const std::optional<QSet<QString>> lidos = CCFioGrfWriter::CamposDasLinhas(modelo_);
        if (!lidos) return QStringList{"(all)"};
        QStringList ordenados(lidos->begin(), lidos->end());
        ordenados.sort();
        return ordenados;
    };
    EXPECT_EQ(nomes(), QStringList({"COMPRIMENTO", "COMPRIMENTO_TOTAL", "FIO", "FIXO", "GRUPO",
                                    "GRUPO ", "ROTULO", "VARIAVEL_1", "VARIAVEL_2", "VARIAVEL_S"}));
    // A list defines its row block from the file again: the drawing's older one counts too.
    Fio("1", "12.5");
    CCFioGrfWriter().EscreverItens(itens_, modelo_);
    Bloco({{"VARIAVEL_1", "NOVO"}});
    EXPECT_EQ(nomes(),
              QStringList({"COMPRIMENTO", "COMPRIMENTO_TOTAL", "FIO", "FIXO", "GRUPO", "GRUPO ",
                           "NOVO", "ROTULO", "VARIAVEL_1", "VARIAVEL_2", "VARIAVEL_S"}));
    // A function in the row or the total may read any field.
    Bloco({{"VARIAVEL_1", "FIO"}, {"function_1", "(princ)"}});
    EXPECT_EQ(nomes(), QStringList{"(all)"});
    Bloco({{"VARIAVEL_1", "FIO"}});
    Bloco({{"FUNCAO_S", "(princ)"}}, "SOMA");
    EXPECT_EQ(nomes(), QStringList{"(all)"});
}

TEST_F(WireRowsTest, RowsOfOneLengthPrintItAlikeAndTheNextListTakesTheDigitsSetSince) {
    const CEItemLista* primeiro = Fio("1", "12.5");
    Fio("2", "12.5");
    Fio("3", "7.25");
    CICad::SetIntLisp("PBLINTFIODGTSAFTERDOT", 0);
    const QString sem = CCFioGrfWriter::ValorVariavel(*primeiro, "COMPRIMENTO", 0);
    const QString com = CCFioGrfWriter::ValorVariavel(*primeiro, "COMPRIMENTO", 3);
    const QString outro = CCFioGrfWriter::ValorVariavel(*itens_[2], "COMPRIMENTO", 3);
    ASSERT_NE(sem, com);
    CCFioGrfWriter escritor;
    escritor.EscreverItens(itens_, modelo_);
    QStringList linhas = Linhas();
    ASSERT_EQ(linhas.size(), 3);
    EXPECT_TRUE(linhas[0].contains(" VARIAVEL_2=" + sem + " ")) << linhas[0].toStdString();
    EXPECT_TRUE(linhas[1].contains(" VARIAVEL_2=" + sem + " ")) << linhas[1].toStdString();

    CICad::SetIntLisp("PBLINTFIODGTSAFTERDOT", 3);
    ui_->setAnswer("question:89", "yes");
    escritor.EscreverItens(itens_, modelo_);
    linhas = Linhas();
    ASSERT_EQ(linhas.size(), 3);
    EXPECT_EQ(linhas, QStringList({"VARIAVEL_1=1 VARIAVEL_2=" + com + " ROTULO=fixo",
                                   "VARIAVEL_1=2 VARIAVEL_2=" + com + " ROTULO=fixo",
                                   "VARIAVEL_1=3 VARIAVEL_2=" + outro + " ROTULO=fixo"}));
}

}  // namespace
