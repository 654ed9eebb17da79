// The strip drawing written into a document of an in-process host, from items made by the
// test, with the demo catalogue for the symbols' blocks; the saved drawing is read back and
// audited with ezdxf.
#include "ItensRegua.h"
#include "QtPrinters.h"
#include "ZvhostRun.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "cad/CICad.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "drawing/BlockRecord.h"
#include "drawing/Database.h"
#include "drawing/DxfWriter.h"
#include "drawing/PythonChecker.h"
#include "lists/CETemplate.h"
#include "lists/CETemplateLisp.h"
#include "lists/TemplateDouble.h"
#include "settings/CIMensagens.h"
#include "strips/CCBorneDwgWriter.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTemporaryDir>
#include <QVariant>

namespace {

struct Insercao {
    QString nome, layer;
    double x, y;
    QJsonObject atributos;
    QStringList rep;
};

// A tag of the terminal block whose field no item of these tests has until one test gives it.
const QString kAcabamento = QStringLiteral("ACABAMENTO_BORNE_DESENHO");

class DesenhoReguasTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new QTemporaryDir;
        ASSERT_TRUE(pasta_->isValid());
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert("ZV_DATA_DIR", pasta_->path());
        const QString problema = zvtest::buildDemoCatalogue(pasta_->path(), env);
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
        // The strip pieces: each a frame with the attributes that its role fills.
        Bloco("REGUA_CAB", {{"REGUA", ""}, {"TITULO", "Regua"}});
        Bloco("REGUA_BORNE", {{"VARIAVEL_NUMERO", "NUMERO"}, {"ZV_KEY", ""}, {kAcabamento, ""}});
        Bloco("REGUA_DET",
              {{"VARIAVEL_REL", "RELACAO_INI"}, {"FUNCAO_QTD", "(itoa (length reg))"}});
        for (const char* nome :
             {"REGUA_SEP", "REGUA_PONTEI", "REGUA_PONTE", "REGUA_PONTEF", "REGUA_PONTEM"})
            Bloco(nome, {});
        Bloco("REGUA_AVISO", {});
        // The strip view of catalogue key 1001 in standard 1.
        Bloco("REGUA_BX2_5_GY", {{"VARIAVEL_RELACAO", "RELACAO"}});
    }
    static void TearDownTestSuite() {
        delete pasta_;
        pasta_ = nullptr;
    }
    static void Bloco(const QString& nome, const std::vector<std::pair<QString, QString>>& atts) {
        zvdb::Database bloco;
        bloco.modelSpace()->addLwPolyline({{0, 0}, {5, 0}, {5, -10}, {0, -10}}, true);
        double y = -2;
        for (const auto& [tag, valor] : atts)
            bloco.modelSpace()->addAttributeDefinition(tag.toStdString(), tag.toStdString(),
                                                       valor.toStdString(), {0, y -= 2, 0}, 1.0);
        const QString caminho = pasta_->filePath("DADOS/1/BLOCOS/" + nome + ".dxf");
        QDir().mkpath(QFileInfo(caminho).path());
        zvdb::DxfWriter::saveFile(bloco, caminho.toStdString());
    }

    void SetUp() override {
        qputenv("ZV_DATA_DIR", pasta_->path().toUtf8());
        ASSERT_TRUE(trabalho_.isValid());
        qputenv("TMPDIR", trabalho_.path().toUtf8());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        ui_ = ui.get();
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(ZV_BIN_DIR);
        documento_ = app_->openDocument(trabalho_.filePath("projeto.dxf"));
        CICad::SetStringLisp("*DIRETORIO_REDE*", pasta_->path() + "/");
        CICad::SetStringLisp("*NORMA_UTILIZADA*", "1");
        modelo_.simbolos = {{"*GP_PAGINA_GRX*", "REGUAS"},
                            {"*BLOCO_REGUA_GRX*", "DADOS\\1\\BLOCOS\\REGUA_CAB"},
                            {"*BLOCO_BORNE_GRX*", "DADOS\\1\\BLOCOS\\REGUA_BORNE"},
                            {"*BLOCO_DETALHE_GRX*", "DADOS\\1\\BLOCOS\\REGUA_DET"},
                            {"*BLOCO_TRACO_GRX*", "DADOS\\1\\BLOCOS\\REGUA_SEP"},
                            {"*BLOCO_PONTEI_GRX*", "DADOS\\1\\BLOCOS\\REGUA_PONTEI"},
                            {"*BLOCO_PONTE_GRX*", "DADOS\\1\\BLOCOS\\REGUA_PONTE"},
                            {"*BLOCO_PONTEF_GRX*", "DADOS\\1\\BLOCOS\\REGUA_PONTEF"},
                            {"*BLOCO_PONTEM_GRX*", "DADOS\\1\\BLOCOS\\REGUA_PONTEM"},
                            {"*BLOCO_ATENCAO_GRX*", "DADOS\\1\\BLOCOS\\REGUA_AVISO"},
                            {"*PONTO_X_INC_GRX*", 10.0},
                            {"*DIST_JUMPER_GRX*", 2.0},
                            {"*ENTRE_BORNES_GRX*", 50.0},
                            {"*BORNE_PAGINA_GRX*", 4},
                            {"*REGUAS_POR_PAGINA_GRX*", 2},
                            {"*DIST_ENTRE_REGUAS_GRX*", 100.0},
                            {"*PONTO_REF_GRX*", "20,40"},
                            {"*NAO_BORNES_GRX*", 30.0},
                            {"*ZV_CHAVE_QUEBRA_PAGINA*", QStringList{"REGUA"}},
                            {"*ZV_CAMPOS_QUEBRA_DETALHE*", QStringList{"RELACAO_INI"}},
                            {"*NORMA_UTILIZADA*", "1"},
                            {"PBLCHAVEREPBORNEDWG", "2"}};
    }
    void TearDown() override {
        CEConexaoCatalogo::LiberarCatalogo();
        CIMensagens::Descarregar();
        app_.reset();
    }

    // Writes, saves and reads back the block references; the audit must be clean.
    std::vector<Insercao> Desenha() {
        CCBorneDwgWriter escritor;
        escritor.EscreverItens(itens_.itens, modelo_);
        return Salvo();
    }
    std::vector<Insercao> Salvo() {
        const QString arquivo = trabalho_.filePath("saida.dxf");
        zvdb::DxfWriter::saveFile(*documento_->database(), arquivo.toStdString());
        std::vector<Insercao> insercoes;
        const QString falta = zvtest::PythonChecker::missing();
        if (!falta.isEmpty()) {
            ADD_FAILURE() << falta.toStdString();
            return insercoes;
        }
        QString saida;
        const int estado = zvtest::PythonChecker::run("reguas_dxf.py", {arquivo}, &saida);
        EXPECT_EQ(estado, 0) << saida.toStdString();
        const QJsonObject raiz = QJsonDocument::fromJson(saida.toUtf8()).object();
        layers_.clear();
        for (const QJsonValue& l : raiz["layers"].toArray())
            layers_ << l.toString();
        for (const QJsonValue& v : raiz["inserts"].toArray()) {
            const QJsonObject o = v.toObject();
            QStringList rep;
            for (const QJsonValue& r : o["rep"].toArray())
                rep << r.toString();
            insercoes.push_back({o["name"].toString(), o["layer"].toString(), o["x"].toDouble(),
                                 o["y"].toDouble(), o["attribs"].toObject(), rep});
        }
        return insercoes;
    }
    // The references of one block, as "x,y" texts in drawing order.
    static QStringList Pontos(const std::vector<Insercao>& todas, const QString& nome,
                              const QString& layer = QString()) {
        QStringList pontos;
        for (const Insercao& i : todas)
            if (i.nome == nome && (layer.isEmpty() || i.layer == layer))
                pontos << QString("%1,%2").arg(i.x).arg(i.y);
        return pontos;
    }
    static QStringList Layers(const std::vector<Insercao>& todas) {
        QStringList layers;
        for (const Insercao& i : todas)
            if (!layers.contains(i.layer)) layers << i.layer;
        return layers;
    }
    QString Linha() {
        out_.flush();
        return saida_;
    }

    static QTemporaryDir* pasta_;
    QTemporaryDir trabalho_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::ConsoleUserInterface* ui_ = nullptr;
    zvhost::HostDocument* documento_ = nullptr;
    TemplateDouble modelo_;
    ItensRegua itens_;
    QStringList layers_;
};

QTemporaryDir* DesenhoReguasTest::pasta_ = nullptr;

TEST_F(DesenhoReguasTest, TerminalsDetailsSeparatorsAndTracksStandWhereTheLayoutSays) {
    auto x1 = itens_.Regua("X1", 3);
    const char* lados[] = {"K1", "K1", "K2"};
    for (size_t i = 0; i < x1.size(); ++i)
        x1[i]->definirCampo("RELACAO_INI", lados[i]);
    x1[0]->definirCampo("ZV_KEY", "1001");
    ItensRegua::Jumper({x1[0], x1[2]});
    const auto todas = Desenha();
    ASSERT_FALSE(todas.empty());
    EXPECT_EQ(Layers(todas), QStringList({"REGUAS$0001$A"}));
    // A lone strip stands one distance above the reference point.
    EXPECT_EQ(Pontos(todas, "REGUA_CAB"), QStringList({"20,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_BORNE"), QStringList({"20,140", "30,140", "40,140"}));
    // Runs of 2 and 1 terminals: details at their middles, a separator behind each, as the
    // strip is not full.
    EXPECT_EQ(Pontos(todas, "REGUA_DET"), QStringList({"25,140", "40,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_SEP"), QStringList({"35,140", "45,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEI"), QStringList({"20,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTE"), QStringList({"30,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEF"), QStringList({"40,140"}));
    EXPECT_TRUE(Pontos(todas, "REGUA_PONTEM").isEmpty());
    for (const Insercao& i : todas) {
        if (i.nome == "REGUA_CAB") {
            EXPECT_EQ(i.atributos["REGUA"].toString(), "X1");
            EXPECT_EQ(i.atributos["TITULO"].toString(), "Regua");
        }
        if (i.nome == "REGUA_BORNE" && i.x == 20) {
            EXPECT_EQ(i.atributos["VARIAVEL_NUMERO"].toString(), "1");
            EXPECT_EQ(i.atributos["ZV_KEY"].toString(), "1001");
        }
        if (i.nome == "REGUA_DET" && i.x == 40) {
            EXPECT_EQ(i.atributos["VARIAVEL_REL"].toString(), "K2");
            // FUNCAO attributes see the run's fields as reg.
            EXPECT_EQ(i.atributos["FUNCAO_QTD"].toString(),
                      QString::number(CEDetalheReguaDwg::NomesCampos(*x1[2]).size()));
        }
    }
}

// A run's last terminal fills its detail block, and keeps every field of its own after
// the detail is drawn.
TEST_F(DesenhoReguasTest, ARunsLastTerminalKeepsItsFieldsAfterItsDetailIsDrawn) {
    auto x1 = itens_.Regua("X1", 3);
    const char* lados[] = {"K1", "K2", "K2"};
    for (size_t i = 0; i < x1.size(); ++i)
        x1[i]->definirCampo("RELACAO_INI", lados[i]);
    const QStringList antes = CEDetalheReguaDwg::NomesCampos(*x1[2]);
    CCBorneDwgWriter escritor;
    escritor.EscreverItens(itens_.itens, modelo_);
    const auto& detalhes = escritor.Modelo().reguas.at(0)->detalhes;
    ASSERT_EQ(detalhes.size(), 2u);
    EXPECT_EQ(detalhes[0].ultimo, x1[0]);
    EXPECT_EQ(detalhes[1].ultimo, x1[2]);
    EXPECT_EQ(CEDetalheReguaDwg::NomesCampos(*x1[2]), antes);
    EXPECT_EQ(x1[2]->valorCampo("RELACAO_INI"), "K2");
    EXPECT_EQ(x1[1]->valorCampo("RELACAO_INI"), "K2");
    QStringList relacoes;
    for (const Insercao& i : Salvo())
        if (i.nome == "REGUA_DET") relacoes << i.atributos["VARIAVEL_REL"].toString();
    EXPECT_EQ(relacoes, QStringList({"K1", "K2"}));
}

// Each terminal's block shows its own fields, a field missing as blank; a writer that drew
// before any item had a field shows it once an item has it.
TEST_F(DesenhoReguasTest, TerminalAttributesComeFromEachItemAndFromFieldsNamedLater) {
    ASSERT_EQ(CamposItem::numeroSeHouver(kAcabamento), CamposItem::kSemNome);
    auto x1 = itens_.Regua("X1", 3);
    x1[0]->definirCampo("ZV_KEY", "1001");
    x1[2]->definirCampo("ZV_KEY", "1002");
    CCBorneDwgWriter escritor;
    escritor.EscreverItens(itens_.itens, modelo_);
    x1[1]->definirCampo(kAcabamento, "Azul");
    escritor.EscreverItens(itens_.itens, modelo_);
    QStringList chaves, acabamentos;
    for (const Insercao& i : Salvo())
        if (i.nome == "REGUA_BORNE") {
            chaves << i.atributos["ZV_KEY"].toString();
            acabamentos << i.atributos[kAcabamento].toString();
        }
    EXPECT_EQ(chaves, QStringList({"1001", "", "1002", "1001", "", "1002"}));
    EXPECT_EQ(acabamentos, QStringList({"", "", "", "", "Azul", ""}));
}

TEST_F(DesenhoReguasTest, AFullStripHasNoSeparatorBehindItsLastRunAndPagesHoldTwoStrips) {
    modelo_.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList();
    itens_.Regua("X1", 10);
    const auto todas = Desenha();
    // 4 + 4 + 2 terminals: two strips on the first page, the third alone on the next.
    EXPECT_EQ(Pontos(todas, "REGUA_CAB"), QStringList({"20,140", "20,40", "20,140"}));
    EXPECT_EQ(Layers(todas), QStringList({"REGUAS$0001$A", "REGUAS$0002$A"}));
    EXPECT_EQ(Pontos(todas, "REGUA_BORNE", "REGUAS$0002$A"), QStringList({"20,140", "30,140"}));
    // One run per piece; only the short piece gets a separator.
    EXPECT_EQ(Pontos(todas, "REGUA_DET"), QStringList({"35,140", "35,40", "25,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_SEP"), QStringList({"35,140"}));
}

TEST_F(DesenhoReguasTest, TracksSideBySideAndAJumperAcrossAPageBreak) {
    modelo_.simbolos["*REGUAS_POR_PAGINA_GRX*"] = 1;
    auto x1 = itens_.Regua("X1", 6);
    ItensRegua::Jumper({x1[0], x1[2], x1[5]});
    ItensRegua::Jumper({x1[1], x1[3]});
    const auto todas = Desenha();
    EXPECT_EQ(Layers(todas), QStringList({"REGUAS$0001$A", "REGUAS$0002$A"}));
    // Track 0 runs 1-3-6 with 3 in the middle; track 1, two units down, runs 2-4.
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEI"), QStringList({"20,140", "30,138"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEM"), QStringList({"40,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTE", "REGUAS$0001$A"),
              QStringList({"30,140", "40,138", "50,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEF", "REGUAS$0001$A"), QStringList({"50,138"}));
    // The strip's second piece, on the next page, carries track 0 on to its end.
    EXPECT_EQ(Pontos(todas, "REGUA_PONTE", "REGUAS$0002$A"), QStringList({"20,140"}));
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEF", "REGUAS$0002$A"), QStringList({"30,140"}));
}

TEST_F(DesenhoReguasTest, SymbolsStandUnderTheirFirstTerminalAndLinkBackToTheSchematic) {
    CEItemLista* k1 = itens_.Simbolo("2A", "K1", {"13", "14", "A1"});
    k1->definirCampo("ZV_KEY", "1001");
    // A link is any text, in UTF-8 as the schematic holds it.
    CEItemLista* k2 = itens_.Simbolo("2B-ção", "K2", {"1"});
    k2->definirCampo("ZV_KEY", "1001");
    // A key without a strip view in the catalogue leaves a gap.
    CEItemLista* k3 = itens_.Simbolo("2C", "K3", {"1"});
    k3->definirCampo("ZV_KEY", "1106");
    // A key whose strip view has no file in the shared folder leaves a gap too.
    CEItemLista* k4 = itens_.Simbolo("2D", "K4", {"1"});
    k4->definirCampo("ZV_KEY", "2001");
    auto x1 = itens_.Regua("X1", 6);
    for (int i = 0; i < 3; ++i)
        ItensRegua::Liga(x1[size_t(i)], "INI", k1, QStringList({"13", "14", "A1"})[i]);
    ItensRegua::Liga(x1[3], "INI", k2, "1");
    ItensRegua::Liga(x1[4], "INI", k3, "1");
    ItensRegua::Liga(x1[5], "INI", k4, "1");
    modelo_.simbolos["*BORNE_PAGINA_GRX*"] = 10;
    const auto todas = Desenha();
    EXPECT_EQ(Pontos(todas, "REGUA_BX2_5_GY"), QStringList({"20,90", "50,90"}));
    QStringList rotulos, reps;
    for (const Insercao& i : todas)
        if (i.nome == "REGUA_BX2_5_GY") {
            rotulos << i.atributos["VARIAVEL_RELACAO"].toString();
            reps << i.rep.join(":");
        }
    EXPECT_EQ(rotulos, QStringList({"K1", "K2"}));
    EXPECT_EQ(reps, QStringList({"2:2A", "2:2B-ção"}));
    EXPECT_EQ(Pontos(todas, "REGUA_BORNE").size(), 6);
    EXPECT_TRUE(Pontos(todas, "REGUA_COMP").isEmpty());
}

TEST_F(DesenhoReguasTest, TheWarningPageAndThePageOfUnwiredSymbolsComeFirst) {
    modelo_.simbolos["*INSERIR_CAPA_GRX*"] = true;
    modelo_.simbolos["*SIMB_NAO_LIG_BORNES_GRX*"] = true;
    for (const char* rotulo : {"H2", "H1"})
        itens_.Simbolo(QString("3") + rotulo, rotulo)->definirCampo("ZV_KEY", "1001");
    itens_.Regua("X1", 2);
    const auto todas = Desenha();
    EXPECT_EQ(Layers(todas), QStringList({"REGUAS$0001$A", "REGUAS$0002$A", "REGUAS$0003$A"}));
    EXPECT_EQ(Pontos(todas, "REGUA_AVISO", "REGUAS$0001$A"), QStringList({"0,0"}));
    // In symbol order, from (100, 100) on by the template's step.
    EXPECT_EQ(Pontos(todas, "REGUA_BX2_5_GY", "REGUAS$0002$A"),
              QStringList({"100,100", "130,100"}));
    QStringList rotulos;
    for (const Insercao& i : todas)
        if (i.nome == "REGUA_BX2_5_GY") rotulos << i.atributos["VARIAVEL_RELACAO"].toString();
    EXPECT_EQ(rotulos, QStringList({"H1", "H2"}));
    EXPECT_EQ(Pontos(todas, "REGUA_CAB", "REGUAS$0003$A"), QStringList({"20,140"}));
}

TEST_F(DesenhoReguasTest, NoTerminalsDrawNothingAndTouchNoGroup) {
    itens_.Simbolo("1", "K1");
    modelo_.simbolos["*INSERIR_CAPA_GRX*"] = true;
    const auto todas = Desenha();
    EXPECT_TRUE(todas.empty());
    EXPECT_FALSE(layers_.contains("REGUAS$0001$A"));
    EXPECT_FALSE(CICad::ExisteLayer("REGUAS$0001$A"));
}

TEST_F(DesenhoReguasTest, AMissingBlockFileStopsWithItsNumberedMessageBeforeAnyPage) {
    modelo_.simbolos["*BLOCO_PONTEF_GRX*"] = "DADOS\\1\\BLOCOS\\NAO_EXISTE";
    auto x1 = itens_.Regua("X1", 2);
    CCBorneDwgWriter escritor;
    try {
        escritor.EscreverItens(itens_.itens, modelo_);
        ADD_FAILURE() << "no failure thrown";
    } catch (const ZVString& texto) {
        EXPECT_TRUE(texto.endsWith(pasta_->path() + "/DADOS\\1\\BLOCOS\\NAO_EXISTE.dwg"))
            << texto.toStdString();
        EXPECT_TRUE(texto.startsWith(CIMensagens::Mensagem("ZVLISTAS", 150)));
    }
    EXPECT_FALSE(CICad::ExisteLayer("REGUAS$0001$A"));
    EXPECT_TRUE(Salvo().empty());
}

TEST_F(DesenhoReguasTest, ADrawingAgainAsksWhetherTheOldPagesGo) {
    itens_.Regua("X1", 2);
    Desenha();
    // No answer keeps the old pages: the new ones come behind them.
    auto todas = Desenha();
    EXPECT_EQ(Layers(todas), QStringList({"REGUAS$0001$A", "REGUAS$0002$A"}));
    err_.flush();
    EXPECT_TRUE(erros_.contains("question:89")) << erros_.toStdString();
    // Yes takes the old group away first.
    ui_->setAnswer("question:89", "yes");
    todas = Desenha();
    EXPECT_EQ(Pontos(todas, "REGUA_CAB").size(), 1);
    EXPECT_EQ(Layers(todas).size(), 1);
}

TEST_F(DesenhoReguasTest, EveryTerminalIsFilledFromItsItemAndABlockThatGainsAFunctionRunsIt) {
    auto x1 = itens_.Regua("X1", 3);
    for (size_t i = 0; i < x1.size(); ++i)
        x1[i]->definirCampo("ZV_KEY", QString::number(2001 + int(i)));
    const auto celulas = [](const std::vector<Insercao>& todas, const char* segunda) {
        QStringList texto;
        for (const Insercao& i : todas)
            if (i.nome == "REGUA_BORNE")
                texto << i.atributos["VARIAVEL_NUMERO"].toString() + "/" +
                             i.atributos[segunda].toString();
        return texto;
    };
    CCBorneDwgWriter escritor;
    escritor.EscreverItens(itens_.itens, modelo_);
    // A VARIAVEL cell names its field; any other tag is the field's own name.
    EXPECT_EQ(celulas(Salvo(), "ZV_KEY"), QStringList({"1/2001", "2/2002", "3/2003"}));

    // The drawing's terminal block gains a function between two drawings of one writer.
    zvdb::BlockRecord* bloco = documento_->database()->block("REGUA_BORNE");
    ASSERT_NE(bloco, nullptr);
    bloco->addAttributeDefinition("FUNCAO_N", "FUNCAO_N",
                                  "(strcat \"N\" (cdr (assoc \"NUMERO\" reg)))", {0, -12, 0}, 1.0);
    ui_->setAnswer("question:89", "yes");
    escritor.EscreverItens(itens_.itens, modelo_);
    EXPECT_EQ(celulas(Salvo(), "FUNCAO_N"), QStringList({"1/N1", "2/N2", "3/N3"}));
}

TEST_F(DesenhoReguasTest, AnEmptyBlockValueIsNotDrawnAndTheRestIs) {
    modelo_.simbolos["*BLOCO_DETALHE_GRX*"] = "";
    modelo_.simbolos["*BLOCO_TRACO_GRX*"] = "";
    itens_.Regua("X1", 2);
    const auto todas = Desenha();
    EXPECT_TRUE(Pontos(todas, "REGUA_DET").isEmpty());
    EXPECT_EQ(Pontos(todas, "REGUA_BORNE").size(), 2);
}

TEST_F(DesenhoReguasTest, TheBlockNameTakesThePrefixAndTheLastPieceOfThePath) {
    CICad::SetStringLisp("*ZV_PREFIX*", "P_");
    CCBorneDwgWriter escritor;
    const auto bloco = escritor.BlocoConfigurado("DADOS\\1\\BLOCOS\\REGUA_CAB");
    EXPECT_EQ(bloco.nome, "P_REGUA_CAB");
    EXPECT_EQ(bloco.arquivo, pasta_->path() + "/DADOS\\1\\BLOCOS\\REGUA_CAB.dwg");
    EXPECT_FALSE(escritor.BlocoConfigurado("").existe());
    itens_.Regua("X1", 1);
    escritor.EscreverItens(itens_.itens, modelo_);
    const auto todas = Salvo();
    EXPECT_EQ(Pontos(todas, "P_REGUA_BORNE"), QStringList({"20,140"}));
    EXPECT_TRUE(Pontos(todas, "REGUA_BORNE").isEmpty());
}

// The fields the drawing reads of a terminal: its blocks' cells, and what a function cell
// looks up by name; nothing to say when a function may read any field (the fixture's detail
// block counts them).
TEST_F(DesenhoReguasTest, ATerminalsFieldsAreItsBlocksCellsAndWhatTheirFunctionsLookUp) {
    EXPECT_EQ(CCBorneDwgWriter::CamposDosBornes(modelo_), std::nullopt);
    Bloco("REGUA_DET_NOMES", {{"VARIAVEL_REL", "RELACAO_INI"},
                              {"FUNCAO_T", "(strcat \"T\" (cdr (assoc \"Tensao_fim\" reg)))"}});
    modelo_.simbolos["*BLOCO_DETALHE_GRX*"] = "DADOS\\1\\BLOCOS\\REGUA_DET_NOMES";
    modelo_.simbolos["*ZV_CAMPOS_QUEBRA_DETALHE*"] = QStringList{"grupo "};
    modelo_.simbolos["*ZV_CHAVE_QUEBRA_PAGINA*"] = QStringList{"REGUA"};
    // The fixture's terminal block has cells without default text: the empty name, which no
    // field has, comes with them.
    const auto nomes = CCBorneDwgWriter::CamposDosBornes(modelo_);
    EXPECT_EQ(nomes, std::optional(QSet<QString>({"", "VARIAVEL_NUMERO", "NUMERO", "ZV_KEY",
                                                  kAcabamento, "VARIAVEL_REL", "RELACAO_INI",
                                                  "TENSAO_FIM", "GRUPO", "REGUA"})));
}

// The same for a component: the cells of the block its key gives, with the key and handle;
// a key without a block reads those alone.
TEST_F(DesenhoReguasTest, ASymbolsFieldsAreItsBlocksCellsAndWhatTheirFunctionsLookUp) {
    CEItemLista* simbolo = itens_.Simbolo("A01", "-K1", {"A1"});
    const auto campos = [&](const char* chave) {
        simbolo->definirCampo("ZV_KEY", chave);
        CCBorneDwgWriter escritor;
        return escritor.CamposDoSimbolo(*simbolo, modelo_);
    };
    EXPECT_EQ(campos("1001"),
              std::optional(QSet<QString>({"ZV_KEY", "HANDLE", "VARIAVEL_RELACAO", "RELACAO"})));
    EXPECT_EQ(campos("SEM_BLOCO"), std::optional(QSet<QString>({"ZV_KEY", "HANDLE"})));
    // The catalogue gives 2001 the block REGUA_COMP, which the fixture does not have.
    Bloco("REGUA_COMP",
          {{"VARIAVEL_D", "DESCRICAO"}, {"FUNCAO_T", "(cdr (assoc \"TENSAO\" reg))"}});
    EXPECT_EQ(
        campos("2001"),
        std::optional(QSet<QString>({"ZV_KEY", "HANDLE", "VARIAVEL_D", "DESCRICAO", "TENSAO"})));
    Bloco("REGUA_COMP", {{"VARIAVEL_D", "DESCRICAO"}, {"FUNCAO_N", "(itoa (length reg))"}});
    EXPECT_EQ(campos("2001"), std::nullopt);
    QFile::remove(pasta_->filePath("DADOS/1/BLOCOS/REGUA_COMP.dxf"));
    EXPECT_EQ(campos("2001"), std::nullopt);
}

}  // namespace

namespace {

// The demo's strip template and product blocks, on items shaped as the strip reader gives
// them: two strips, one longer than a row, contactors, lights and buttons wired to them,
// bridged commons. With ZV_STRIP_SAMPLE set the drawing is kept there, for a look.
TEST_F(DesenhoReguasTest, TheDemoTemplateAndBlocksDrawAStripDrawing) {
    QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
    env.insert("ZV_DATA_DIR", pasta_->path());
    const QString produto = trabalho_.filePath("produto") + "/";
    const zvtest::HostRun r = zvtest::runZvhost(
        {"generate", "--out", trabalho_.filePath("p.dxf"), "--terminals", "10", "--data", produto},
        env);
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    QDir().mkpath(produto + "templates");
    ASSERT_TRUE(QFile::copy(QString(ZV_SOURCE_DIR) + "/data/templates/reguas.grx",
                            produto + "templates/reguas.grx"));
    CICad::SetStringLisp("*DIRETORIO_REDE*", produto);
    CETemplateLisp modelo(produto + "templates/reguas.grx");
    ASSERT_TRUE(modelo.Carregar());

    struct Componente {
        const char* handle;
        const char* tag;
        const char* chave;
        const char* descricao;
        QStringList ligacoes;
    };
    const Componente componentes[] = {
        {"A01", "-K1", "2001", "Contator 9A 24Vcc", {"A1", "A2", "13", "14"}},
        {"A02", "-K2", "2002", "Contator 18A 230Vca", {"A1", "A2"}},
        {"A03", "-H1", "6101", "Sinaleiro verde 24V", {"X1", "X2"}},
        {"A04", "-S1", "6001", "Botao verde NA", {"13", "14"}},
        {"A05", "-S2", "6002", "Botao vermelho NF", {"11", "12"}},
        {"A06", "-B1", "8001", "Sensor indutivo M12", {"BN", "BU", "BK"}},
        {"A07", "-P9", "7001", "Fonte 24V 5A", {"L", "N"}}};
    std::vector<CEItemLista*> simbolos;
    for (const Componente& c : componentes) {
        CEItemLista* item = itens_.Simbolo(c.handle, c.tag, c.ligacoes);
        item->definirCampo("ZV_KEY", c.chave);
        item->definirCampo("DESCRICAO", c.descricao);
        simbolos.push_back(item);
    }
    auto x1 = itens_.Regua("-X1", 12);
    auto x2 = itens_.Regua("-X2", 64);
    int fio = 100;
    auto liga = [&](CEItemLista* borne, int simbolo, const QString& ligacao) {
        ItensRegua::Liga(borne, "INI", simbolos[size_t(simbolo)], ligacao);
        borne->definirCampo("REL_INI", simbolos[size_t(simbolo)]->valorCampo("RELACAO"));
        borne->definirCampo("RELACAO_INI", borne->valorCampo("REL_INI") + ":" + ligacao);
        borne->definirCampo("FIO_SEGINI", QString::number(++fio));
        borne->definirCampo("RELACAO_FIM", "-M" + borne->valorCampo("NUMERO") + ":1");
        borne->definirCampo("FIO_SEGFIM", QString::number(++fio));
    };
    liga(x1[0], 0, "A1"), liga(x1[1], 0, "A2"), liga(x1[2], 0, "13"), liga(x1[3], 0, "14");
    liga(x1[4], 2, "X1"), liga(x1[5], 2, "X2"), liga(x1[6], 3, "13"), liga(x1[7], 3, "14");
    liga(x1[8], 4, "11"), liga(x1[9], 4, "12");
    for (int i = 0; i < 64; i += 8) {
        liga(x2[size_t(i)], 5, "BN"), liga(x2[size_t(i + 1)], 5, "BU");
        liga(x2[size_t(i + 2)], 5, "BK");
    }
    liga(x2[50], 1, "A1"), liga(x2[51], 1, "A2");
    // Bridged commons: 0 V on X1 2, 6, 10; on X2 the sensors' 0 V, across the row's end.
    ItensRegua::Jumper({x1[1], x1[5], x1[9]});
    ItensRegua::Jumper({x1[3], x1[4]});
    ItensRegua::Jumper({x2[1], x2[9], x2[17], x2[25], x2[33], x2[41], x2[49], x2[57]});
    ItensRegua::Jumper({x2[44], x2[46], x2[48]});
    itens_.Simbolo("A08", "-Q1", {"1", "2"})->definirCampo("ZV_KEY", "3001");

    CCBorneDwgWriter escritor;
    escritor.EscreverItens(itens_.itens, modelo);
    const auto todas = Salvo();
    if (!qEnvironmentVariableIsEmpty("ZV_STRIP_SAMPLE"))
        zvdb::DxfWriter::saveFile(*documento_->database(),
                                  qEnvironmentVariable("ZV_STRIP_SAMPLE").toStdString());
    // The warning page, the page of -P9 and -Q1 (wired to no terminal), then two pages of
    // strips; each page has the frame the product puts on its group's frame layer.
    EXPECT_EQ(Layers(todas).filter("$0"),
              QStringList({"REGUAS$0001$A", "REGUAS$0002$A", "REGUAS$0003$A", "REGUAS$0004$A"}));
    EXPECT_EQ(Pontos(todas, "REGUA_AVISO"), QStringList({"0,0"}));
    EXPECT_EQ(Pontos(todas, "REGUA_COMP", "REGUAS$0002$A"), QStringList({"100,100", "120,100"}));
    // -X1 alone on its page (the strip name breaks pages); -X2 in rows of 50 and 14.
    EXPECT_EQ(Pontos(todas, "REGUA_CAB"), QStringList({"50,225", "50,225", "50,90"}));
    EXPECT_EQ(Pontos(todas, "REGUA_BORNE").size(), 76);
    EXPECT_EQ(Pontos(todas, "REGUA_PONTEF").size(), 4);
    for (const Insercao& i : todas)
        if (i.nome == "REGUA_CAB") {
            EXPECT_TRUE(i.atributos["REGUA"].toString().startsWith("-X"));
        }
}

}  // namespace
