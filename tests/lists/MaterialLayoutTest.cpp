// The material list's pages laid out in memory: row defs, wrapping, multi-row items at a
// column's end, breaks, blank rows, group sums, totals and the cached template functions.
#include "QtPrinters.h"
#include "TemplateDouble.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "cad/CICad.h"
#include "lists/CCMaterialGrfWriter.h"
#include "readers/VetorItens.h"

#include <gtest/gtest.h>

#include <QTemporaryDir>
#include <QTextStream>

#include <memory>
#include <vector>

namespace {

using Writer = CCMaterialGrfWriter;

class MaterialLayoutTest : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(pasta_.isValid());
        qputenv("ZV_DATA_DIR", pasta_.path().toUtf8());
        qputenv("TMPDIR", pasta_.path().toUtf8());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(QString(ZV_BIN_DIR));
        app_->openDocument(pasta_.filePath("p.dxf"));
        modelo.simbolos["*LINHAS_POR_PAGINA*"] = 4;
        modelo.simbolos["*X_INIC_LISTA*"] = 10.0;
        modelo.simbolos["*Y_INIC_LISTA*"] = 100.0;
        modelo.simbolos["TAM_DETALHE"] = "5";
        modelo.simbolos["TAM_DETALHE_VINCL"] = "3";
        escritor.especificacoes = {Writer::LeEspecificacao("VARIAVEL_QTD", "QTD"),
                                   Writer::LeEspecificacao("VARIAVEL_DESC", kDesc)};
        escritor.especificacoesAce = {Writer::LeEspecificacao("VARIAVEL_DESC", kDescAce)};
    }
    void TearDown() override {
        itens.destruirItens();
        app_.reset();
    }
    CEItemLista* Item(const QString& chave, const QString& descricao, const QString& tipo = "") {
        auto* item = new CEItemLista;
        item->definirCampo("ZV_KEY", chave);
        item->definirCampo("DESCRICAO", descricao);
        if (!tipo.isEmpty()) item->definirCampo("ZV_LISTA_TIPO", tipo);
        itens.push_back(item);
        return item;
    }
    // Each page as its rows: the text of the description det, or "-" for a blank row.
    QStringList Paginas() {
        paginas = escritor.Diagrama(itens, modelo);
        QStringList texto;
        for (const CEPaginaLista& pagina : paginas) {
            QStringList linhas;
            for (const CELinhaLista& linha : pagina.linhas) {
                const QString t = linha.item->valorCampo(kDesc) + linha.item->valorCampo(kDescAce);
                linhas << (t.isEmpty() ? "-" : t);
            }
            texto << linhas.join("|");
        }
        return texto;
    }

    static constexpr const char* kDesc = "DESCRICAO%M$10$L$ %";
    static constexpr const char* kDescAce = "DESCRICAO%M$6$L$ %";
    QTemporaryDir pasta_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
    TemplateDouble modelo;
    Writer escritor;
    VetorItens itens;
    std::vector<CEPaginaLista> paginas;
};

TEST_F(MaterialLayoutTest, RowDefinitionsNeedAllFourParts) {
    const Writer::itemDet d = Writer::LeEspecificacao("VARIAVEL_D", "DESCRICAO%M$40$L$ %");
    EXPECT_TRUE(d.valido);
    EXPECT_EQ(d.campo, "DESCRICAO");
    EXPECT_EQ(d.modo, "M");
    EXPECT_EQ(d.limite, 40);
    EXPECT_EQ(d.submodo, "L");
    EXPECT_EQ(d.separador, " ");
    EXPECT_FALSE(Writer::LeEspecificacao("T", "%DESCRICAO%M$40$L$ %").valido);
    EXPECT_FALSE(Writer::LeEspecificacao("T", "ZV_KEY").valido);
    EXPECT_FALSE(Writer::LeEspecificacao("T", "A%M$5$L%").valido);
    EXPECT_FALSE(Writer::LeEspecificacao("T", "(cond ((cdr (assoc \"R\" reg))) (\"\"))").valido);
}

TEST_F(MaterialLayoutTest, LongTextsWrapAtBlanksAndAWordLongerThanARowIsCut) {
    Item("1", "alpha beta gamma delta");
    Item("2", "ABCDEFGHIJKLMNOPQRSTUVWXYZ");
    modelo.simbolos["*LINHAS_POR_PAGINA*"] = 20;
    EXPECT_EQ(Paginas(), QStringList({"alpha beta|gamma|delta|ABCDEFGHIJ|KLMNOPQRST|UVWXYZ"}));
    // Continuation rows are rows of their own below the item's first.
    ASSERT_EQ(paginas[0].linhas.size(), 6u);
    EXPECT_EQ(paginas[0].linhas[0].item, itens[0]);
    EXPECT_NE(paginas[0].linhas[1].item, itens[0]);
    EXPECT_DOUBLE_EQ(paginas[0].linhas[1].y, 95.0);
    EXPECT_DOUBLE_EQ(paginas[0].linhas[4].y, 80.0);
}

TEST_F(MaterialLayoutTest, AnItemNotFinishedAtAColumnsEndMovesWholeToTheNextPage) {
    Item("1", "short");
    Item("2", "one two three four five six seven eight");
    EXPECT_EQ(Paginas(), QStringList({"short", "one two|three four|five six|seven", "eight"}));
    EXPECT_DOUBLE_EQ(paginas[1].linhas[0].y, 100.0);
    EXPECT_EQ(paginas[1].atributos.value("PAGINA"), "2");
    EXPECT_EQ(paginas[1].atributos.value("PAGE"), "2");
    // Allowed to split, it runs on where it stands.
    modelo.simbolos["*QUEBRA_ITEM_SN*"] = true;
    EXPECT_EQ(Paginas(), QStringList({"short|one two|three four|five six", "seven|eight"}));
    // A last line on the column's last row is drawn, and asks for no further row.
    itens.destruirItens();
    Item("1", "short");
    Item("2", "one two three four five");
    modelo.simbolos["*QUEBRA_ITEM_SN*"] = false;
    EXPECT_EQ(Paginas(), QStringList({"short|one two|three four|five"}));
}

TEST_F(MaterialLayoutTest, AnItemAtThePageTopIsNeverMovedAndRunsOn) {
    Item("1", "a b c d e f g h i j k l m n o p q r s t u v w x y z");
    modelo.simbolos["TAM_DETALHE"] = "1";
    escritor.especificacoes = {Writer::LeEspecificacao("VARIAVEL_DESC", "DESCRICAO%M$3$L$ %")};
    ASSERT_GE(Paginas().size(), 2);
    QStringList primeira;
    for (const CELinhaLista& linha : paginas[0].linhas)
        primeira << linha.item->valorCampo("DESCRICAO%M$3$L$ %");
    EXPECT_EQ(primeira, QStringList({"a b", "c d", "e f", "g h"}));
    EXPECT_EQ(paginas[1].linhas.at(0).item->valorCampo("DESCRICAO%M$3$L$ %"), "i j");
    int linhas = 0;
    for (const CEPaginaLista& p : paginas)
        linhas += int(p.linhas.size());
    EXPECT_EQ(linhas, 13);  // two letters a row
    EXPECT_EQ(paginas[0].linhas.size(), 4u);
}

TEST_F(MaterialLayoutTest, KeyChangesBreakPagesOrLeaveBlankRowsAndBlankRowsFollowItems) {
    Item("1", "x")->definirCampo("GRUPO", "A");
    Item("2", "y")->definirCampo("GRUPO", "B");
    Item("3", "z")->definirCampo("GRUPO", "B");
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"GRUPO"};
    modelo.simbolos["*QUEBRA_POR_CFG*"] = "P";
    EXPECT_EQ(Paginas(), QStringList({"x", "y|z"}));
    modelo.simbolos["*QUEBRA_POR_CFG*"] = "L";
    modelo.simbolos["*NUMERO_LINHAS*"] = 1;
    modelo.simbolos["*LINHAS_POR_PAGINA*"] = 10;
    Paginas();
    ASSERT_EQ(paginas.size(), 1u);
    EXPECT_DOUBLE_EQ(paginas[0].linhas[1].y, 90.0);  // one row left free after "x"
    // Without row defs each item is one row; one blank row after each.
    escritor.especificacoes = {Writer::LeEspecificacao("VARIAVEL_QTD", "QTD")};
    modelo.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{};
    modelo.simbolos["*NUM_LINHAS_BRANCO*"] = 1;
    Paginas();
    ASSERT_EQ(paginas.size(), 1u);
    ASSERT_EQ(paginas[0].linhas.size(), 6u);
    EXPECT_EQ(paginas[0].linhas[0].item, itens[0]);
    EXPECT_TRUE(paginas[0].linhas[1].item->campos.isEmpty());
    EXPECT_EQ(paginas[0].linhas[2].item, itens[1]);
}

TEST_F(MaterialLayoutTest, AccessoryRowsUseTheirOwnSpecsAndHeight) {
    Item("1", "owner");
    Item("2", "accessory row", "ACE");
    Item("3", "next");
    modelo.simbolos["*LINHAS_POR_PAGINA*"] = 20;
    EXPECT_EQ(Paginas(), QStringList({"owner|access|ory|row|next"}));
    EXPECT_DOUBLE_EQ(paginas[0].linhas[1].y, 95.0);
    EXPECT_DOUBLE_EQ(paginas[0].linhas[2].y, 92.0);
    EXPECT_DOUBLE_EQ(paginas[0].linhas[4].y, 86.0);
    EXPECT_EQ(paginas[0].linhas[2].item->valorCampo("ZV_LISTA_TIPO"), "ACE");
}

TEST_F(MaterialLayoutTest, GroupSumsAreSetOnEveryMemberAndTotalsGetAPage) {
    CEItemLista* a = Item("1", "a");
    auto* a2 = new CEItemLista;
    a2->definirCampo("QTD", "0.5");
    a->definirCampo("QTD", "2.5");
    a->ligado = a2;
    CEItemLista* b = Item("2", "b");
    b->definirCampo("QTD", "abc");
    auto* b2 = new CEItemLista;
    b2->definirCampo("QTD", "2");
    b2->definirCampo("COMPRIMENTO", "1.25");
    b->ligado = b2;
    CEItemLista* c = Item("3", "c");
    c->definirCampo("QTD", "1.5");
    Writer::SomaGrupos(itens, 2);
    // 2.5 and 0.5 make a whole 3; a quantity that is no number counts 0; a fraction keeps
    // the digits.
    EXPECT_EQ(a->valorCampo("QTD"), "3");
    EXPECT_EQ(a2->valorCampo("QTD"), "3");
    EXPECT_EQ(b->valorCampo("QTD"), "2");
    EXPECT_EQ(c->valorCampo("QTD"), "1.50");
    EXPECT_EQ(b2->valorCampo("COMPRIMENTO"), "1.25");
    EXPECT_EQ(a->valorCampo("LENGTH"), "0.00");
    EXPECT_EQ(c->valorCampo("SEQUENCIA"), "3");
    EXPECT_FALSE(a2->temCampo("SEQUENCIA"));
    modelo.simbolos["LISTA_TOTAL"] = "TOT";
    escritor.totais = {{"QTD", 9.0}};
    Paginas();
    ASSERT_EQ(paginas.size(), 2u);
    EXPECT_TRUE(paginas[1].pagina_total);
    EXPECT_EQ(paginas[1].linhas.at(0).item->valorCampo("QTD"), "9");
    delete a2;
    delete b2;
}

TEST_F(MaterialLayoutTest, GroupSumsCountEachMemberOnceHoweverLongTheChains) {
    // One head leads a long chain (far more members than entries in the vector); a second
    // head's chain runs into the first one's: the shared members count in the first group.
    std::vector<std::unique_ptr<CEItemLista>> membros;
    CEItemLista* a = Item("1", "a");
    CEItemLista* fim = a;
    for (int i = 0; i < 999; ++i) {
        membros.push_back(std::make_unique<CEItemLista>());
        membros.back()->definirCampo("QTD", "2");
        membros.back()->definirCampo("COMPRIMENTO", "0.5");
        fim->ligado = membros.back().get();
        fim = fim->ligado;
    }
    CEItemLista* b = Item("2", "b");
    membros.push_back(std::make_unique<CEItemLista>());
    b->ligado = membros.back().get();
    b->ligado->ligado = a->ligado;
    Writer::SomaGrupos(itens, 1);
    // 1 for the head without a QTD, 2 for each of the 999.
    EXPECT_EQ(a->valorCampo("QTD"), "1999");
    EXPECT_EQ(a->valorCampo("COMPRIMENTO"), "499.5");
    EXPECT_EQ(a->valorCampo("LENGTH"), "499.5");
    // The second group stops where the first one's members begin.
    EXPECT_EQ(b->valorCampo("QTD"), "2");
    EXPECT_EQ(b->valorCampo("SEQUENCIA"), "2");
}

TEST_F(MaterialLayoutTest, ATemplateFunctionRunsOncePerItemAndAnErrorPrintsNothing) {
    ASSERT_TRUE(CICad::AvaliaLisp("(setq n 0)"));
    const QString funcao = "(progn (setq n (1+ n)) \"one two three four\")";
    escritor.especificacoes = {Writer::LeEspecificacao("FUNCAO_D", funcao + "%M$8$L$ %")};
    Item("1", "");
    modelo.simbolos["*LINHAS_POR_PAGINA*"] = 20;
    Paginas();
    ASSERT_EQ(paginas.size(), 1u);
    ASSERT_EQ(paginas[0].linhas.size(), 3u);
    EXPECT_EQ(paginas[0].linhas[2].item->valorCampo(funcao + "%M$8$L$ %"), "four");
    EXPECT_EQ(CICad::GetIntLisp("n"), 1);

    itens.destruirItens();
    const QString erro = "(car 5)";
    escritor.especificacoes = {Writer::LeEspecificacao("FUNCAO_D", erro + "%M$8$L$ %")};
    ASSERT_TRUE(CICad::AvaliaLisp("(setq INVOKELISP_LISTAS_TMP \"stale\")"));
    Item("1", "");
    Paginas();
    ASSERT_EQ(paginas.size(), 1u);
    ASSERT_EQ(paginas[0].linhas.size(), 1u);
    EXPECT_EQ(itens[0]->valorCampo(erro + "###FUNCAOCACHE"), "");
}

// Accessory units that share their fields: a function cell sees each unit's fields and
// runs once per unit; its answer stays in that unit, and the shared fields keep none.
TEST_F(MaterialLayoutTest, AFunctionCellRunsOnEachSharedUnitAndItsAnswerStaysInThatUnit) {
    ASSERT_TRUE(CICad::AvaliaLisp("(setq n 0)"));
    const QString funcao = "(progn (setq n (1+ n)) (strcat (cdr (assoc \"OBS\" reg)) (itoa n)))";
    const QString cache = funcao + "###FUNCAOCACHE";
    escritor.especificacoesAce = {Writer::LeEspecificacao("FUNCAO_A", funcao + "%M$30$L$ %")};
    CEItemLista* cabeca = Item("K", "", "ACE");
    cabeca->definirCampo("OBS", "h");
    CamposItem unidade = cabeca->campos;
    unidade.insert("OBS", "u");
    unidade.partilhar();
    std::vector<std::unique_ptr<CEItemLista>> membros;
    for (CEItemLista* anterior = cabeca; membros.size() < 3; anterior = membros.back().get()) {
        membros.push_back(std::make_unique<CEItemLista>());
        membros.back()->campos = unidade;
        anterior->ligado = membros.back().get();
    }
    modelo.simbolos["*LINHAS_POR_PAGINA*"] = 20;
    Paginas();
    EXPECT_EQ(CICad::GetIntLisp("n"), 4);
    EXPECT_EQ(cabeca->valorCampo(cache), "h1");
    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(membros[size_t(i)]->valorCampo(cache), "u" + QString::number(i + 2));
        EXPECT_EQ(membros[size_t(i)]->valorCampo("OBS"), "u");
        EXPECT_FALSE(membros[size_t(i)]->campos.partilhaCom(unidade));
    }
    EXPECT_FALSE(unidade.contains(cache));
    // Key, description, type and OBS, as made.
    EXPECT_EQ(unidade.size(), 4);
    EXPECT_EQ(unidade.value("OBS"), "u");
}

}  // namespace
