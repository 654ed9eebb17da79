// The facade on drawings built by the tests: pages, blocks, attributes, extended data,
// masters, project settings and the object store.
#include "FacadeFixture.h"
#include "QtPrinters.h"
#include "cad/CEInsercoesBlocos.h"
#include "cad/CELayoutRotasFios.h"
#include "cad/CICad.h"
#include "drawing/Dictionary.h"
#include "drawing/DxfLoader.h"
#include "drawing/Polyline.h"
#include "drawing/TextEntity.h"
#include "drawing/XRecord.h"
#include "readers/ZVString.h"

#include <cmath>
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"

#include <QFile>
#include <QStandardPaths>

namespace {

class PaginasTest : public FacadeFixture {
protected:
    void SetUp() override {
        FacadeFixture::SetUp();
        for (const char* nome : {"ESQ$0001$A", "ESQ$0002$A", "ESQ$DE", "ESQ$FORMATO", "ESQ$SELO",
                                 "CAPA$0001$A", "CAPA$DE", "CAPA$FORMATO", "CAPA$SELO", "SOLTO"})
            db().createLayer(nome);
    }
};

TEST_F(PaginasTest, ShowingAPageThawsItAndItsCompanionsOnly) {
    EXPECT_EQ(CICad::MostraPagina("ESQ$0002$A", false), 0);
    EXPECT_EQ(descongelados(),
              QStringList({"0", "ESQ$0002$A", "ESQ$DE", "ESQ$FORMATO", "ESQ$SELO"}));
    EXPECT_EQ(CICad::GetLayerCorrente(), "ESQ$0002$A");
}

TEST_F(PaginasTest, ACoverKeepsItsTitleBlockFrozen) {
    CICad::MarcaPagina("CAPA$0001$A", "CAPA");
    EXPECT_TRUE(CICad::IsPaginaCapa("CAPA$0001$A"));
    EXPECT_FALSE(CICad::IsPaginaIndice("CAPA$0001$A"));
    EXPECT_EQ(CICad::MostraPagina("CAPA$0001$A", true), 0);
    EXPECT_EQ(descongelados(), QStringList({"0", "CAPA$0001$A", "CAPA$DE", "CAPA$FORMATO"}));
    // Any other word marks nothing.
    CICad::MarcaPagina("ESQ$0001$A", "OUTRA");
    EXPECT_FALSE(CICad::IsPaginaCapa("ESQ$0001$A"));
    EXPECT_FALSE(CICad::IsPaginaIndice("ESQ$0001$A"));
}

TEST_F(PaginasTest, LayerZeroAndUnknownLayersChangeNothing) {
    CICad::MostraPagina("ESQ$0001$A", false);
    const QStringList antes = descongelados();
    EXPECT_EQ(CICad::MostraPagina("0", true), 1);
    EXPECT_EQ(CICad::MostraPagina("NAO$EXISTE$X", true), 1);
    EXPECT_EQ(descongelados(), antes);
}

TEST_F(PaginasTest, SwappingFreezesOnlyTheOldPageAndItsCompanions) {
    CICad::MostraPagina("ESQ$0001$A", false);
    CICad::DescongelaLayer("SOLTO");
    CICad::TrocaPagina("CAPA$0001$A");
    EXPECT_EQ(descongelados(),
              QStringList({"0", "CAPA$0001$A", "CAPA$DE", "CAPA$FORMATO", "CAPA$SELO", "SOLTO"}));
    EXPECT_EQ(CICad::GetLayerCorrente(), "CAPA$0001$A");
}

TEST_F(PaginasTest, BaseNamesAndLayerOperations) {
    EXPECT_EQ(CICad::NomeBase("ESQ$0001$A"), "ESQ");
    EXPECT_EQ(CICad::NomeBase("SOLTO"), "SOLTO");
    EXPECT_EQ(CICad::NomeBase("$ESQ$1"), "ESQ");
    CICad::CriaLayer("");
    CICad::CriaLayer("NOVO");
    EXPECT_TRUE(CICad::ExisteLayer("NOVO"));
    CICad::CongelaTodosLayers();
    EXPECT_EQ(descongelados(), QStringList({"0"}));
    // The current layer comes back thawed.
    EXPECT_EQ(CICad::SetLayerCorrente("NOVO"), "NOVO");
    EXPECT_EQ(descongelados(), QStringList({"0", "NOVO"}));
}

TEST_F(FacadeFixture, ExtendedDataIsStoredOnceWhetherSetOrReplaced) {
    // Blocks are tied to their symbols by extended data by the tens of thousands: each value
    // must be kept once, not once for the call and again by the drawing.
    zvdb::Entity* ponto = db().modelSpace()->addPoint({0, 0, 0});
    const OdDbObjectId id(&db(), ponto->handle());
    CICad::SetXData(id, "KVR_ZV_REPRESENTACAO", {{1000, "a"}, {1010, "", 1.5, 2.5, 0}});
    CEListaXData lidos = CICad::GetXData(id, "KVR_ZV_REPRESENTACAO");
    ASSERT_EQ(lidos.size(), 2u);
    EXPECT_EQ(lidos[1].codigo, 1010);
    EXPECT_DOUBLE_EQ(lidos[1].x, 1.5);
    EXPECT_DOUBLE_EQ(lidos[1].y, 2.5);
    // A text longer than the storage's blocks always gets room of its own: what it costs shows.
    const QString longo(100000, QChar('x'));
    for (int vez = 0; vez < 2; ++vez) {
        const std::size_t antes = db().storageBytes();
        CICad::SetXData(id, "KVR_ZV_REPRESENTACAO", {{1000, longo}});
        const std::size_t custo = db().storageBytes() - antes;
        EXPECT_GE(custo, std::size_t(100000)) << vez;
        EXPECT_LT(custo, std::size_t(150000)) << vez;
    }
    lidos = CICad::GetXData(id, "KVR_ZV_REPRESENTACAO");
    ASSERT_EQ(lidos.size(), 1u);
    EXPECT_EQ(lidos[0].texto, longo);
}

TEST_F(FacadeFixture, ThePointsOfExtendedDataAreThoseOfTheWholeList) {
    zvdb::Entity* ponto = db().modelSpace()->addPoint({0, 0, 0});
    const OdDbObjectId id(&db(), ponto->handle());
    EXPECT_TRUE(CICad::PontosXData(id, "KVR_ZV_PTS_CORTE").empty());
    CICad::SetXData(id, "KVR_ZV_PTS_CORTE",
                    {{1000, "a"}, {1010, "", 1.5, 2.5, 3.5}, {1070, "4"}, {1011, "", -1, 0.25, 9}});
    auto pontos = [&] {
        QStringList textos;
        for (const CEPonto& p : CICad::PontosXData(id, "KVR_ZV_PTS_CORTE"))
            textos << QString("%1,%2,%3").arg(p.x).arg(p.y).arg(p.z);
        return textos;
    };
    auto daLista = [&] {
        QStringList textos;
        for (const CEItemXData& item : CICad::GetXData(id, "KVR_ZV_PTS_CORTE"))
            if (item.codigo >= 1010 && item.codigo <= 1013)
                textos << QString("%1,%2,%3").arg(item.x).arg(item.y).arg(item.z);
        return textos;
    };
    EXPECT_EQ(pontos(), QStringList({"1.5,2.5,3.5", "-1,0.25,9"}));
    EXPECT_EQ(pontos(), daLista());
    // A change of the items is read at the next question.
    CICad::SetXData(id, "KVR_ZV_PTS_CORTE", {{1010, "", 7, 8, 0}});
    EXPECT_EQ(pontos(), QStringList({"7,8,0"}));
    EXPECT_EQ(pontos(), daLista());
    // Texts that are no plain numbers read as the whole list reads them.
    const zvdb::Tag estranhos[] = {{1010, " 1.5"}, {1020, "+2"},  {1030, "1e3"},
                                   {1011, "abc"},  {1021, "0.1"}, {1031, "1e999"}};
    ponto->setXData("KVR_ZV_PTS_CORTE", estranhos);
    EXPECT_EQ(pontos(), daLista());
    EXPECT_EQ(pontos().value(0), "1.5,2,1000");
    EXPECT_TRUE(CICad::PontosXData(id, "KVR_ZV_OUTRA").empty());
    EXPECT_TRUE(CICad::PontosXData(OdDbObjectId(), "KVR_ZV_PTS_CORTE").empty());
}

TEST_F(FacadeFixture, BlockFilesWithTwoLayersOrNestedReferencesAreRefused) {
    const QString duasCamadas = arquivoBloco("DUAS", {"TAG"}, [](zvdb::Database& b) {
        b.createLayer("OUTRA");
        b.modelSpace()->addLine({0, 0, 0}, {1, 1, 0}, "OUTRA");
    });
    const QString aninhado = arquivoBloco("ANINHADO", {"TAG"}, [](zvdb::Database& b) {
        zvdb::BlockRecord* interno = b.createBlock("INTERNO");
        interno->addCircle({0, 0, 0}, 1);
        b.modelSpace()->addBlockReference(*interno, {5, 5, 0});
    });
    EXPECT_TRUE(CICad::CarregaBloco("DUAS", duasCamadas).isNull());
    EXPECT_TRUE(CICad::CarregaBloco("ANINHADO", aninhado).isNull());
    EXPECT_FALSE(db().block("DUAS"));
    const QString texto = saida();
    EXPECT_TRUE(texto.contains("DUAS = " + duasCamadas)) << texto.toStdString();
    EXPECT_TRUE(texto.contains("ANINHADO = " + aninhado));
    EXPECT_EQ(texto.count('\n'), 4);
}

TEST_F(FacadeFixture, ABlockFileLoadsAtTheOriginThroughItsWindowsPath) {
    const QString caminho = arquivoBloco("BORNE_A", {"REGUA", "NUMERO"}, [](zvdb::Database& b) {
        b.header().setPoint("$INSBASE", {5, 5, 0});
    });
    // The product names its files with backslashes and ".dwg"; the ".dxf" beside answers.
    QString windows = caminho;
    windows.replace('/', '\\').replace(".dxf", ".dwg");
    EXPECT_TRUE(CICad::ExisteArquivo(windows));
    const OdDbObjectId id = CICad::CarregaBloco("BORNE_A", windows);
    ASSERT_FALSE(id.isNull());
    zvdb::BlockRecord* bloco = db().block("BORNE_A");
    ASSERT_TRUE(bloco);
    EXPECT_EQ(bloco->basePoint(), (zvdb::Point3{0, 0, 0}));
    bool achouLinha = false;
    for (zvdb::Entity* e : bloco->entities())
        if (e->isType("LINE")) {
            achouLinha = true;
            EXPECT_EQ(e->point(10), (zvdb::Point3{-5, -5, 0}));
            EXPECT_EQ(e->point(11), (zvdb::Point3{5, -5, 0}));
        }
    EXPECT_TRUE(achouLinha);
}

TEST_F(FacadeFixture, ASideDrawingNamedDwgIsReadThroughTheConverter) {
    if (qEnvironmentVariableIsEmpty("ZV_NODE") && QStandardPaths::findExecutable("node").isEmpty())
        GTEST_SKIP() << "Node.js is not installed; reading DWG drawings needs it";
    // The converter lies beside zvhost; this test program is elsewhere.
    qputenv("ZV_DWG_CONVERTER", ZV_BIN_DIR "/dwg");
    const QString dwg = arquivo("project.dwg");
    ASSERT_TRUE(QFile::copy(ZV_SOURCE_DIR "/tests/drawing/dwg/xdata.dwg", dwg));
    const auto lado = CICad::AbreDesenhoLateral(dwg);
    qunsetenv("ZV_DWG_CONVERTER");
    ASSERT_TRUE(lado) << saida().toStdString();
    EXPECT_TRUE(lado->layer("app_layer"));
    // Its extended data as the CAD program has it: the layer name, not a number.
    const zvdb::DbObject* texto = lado->objectByHandle(0x248);
    ASSERT_TRUE(texto);
    const auto itens = texto->xdata("LAYER_APP");
    ASSERT_EQ(itens.size(), 3u);
    EXPECT_EQ(itens[1], (zvdb::Tag{1003, "app_layer"}));
}

TEST_F(FacadeFixture, ADamagedDwgBlockFileIsRefusedWithAMessageNamingIt) {
    QFile dwg(arquivo("REAL.dwg"));
    ASSERT_TRUE(dwg.open(QIODevice::WriteOnly));
    dwg.write("AC1032\0\0\0binary", 16);
    dwg.close();
    const std::size_t blocos = db().blocks().size();
    EXPECT_TRUE(CICad::CarregaBloco("REAL", arquivo("REAL.dwg")).isNull());
    EXPECT_TRUE(saida().contains("REAL.dwg: ")) << saida().toStdString();
    EXPECT_TRUE(saida().contains("DWG")) << saida().toStdString();
    EXPECT_EQ(db().blocks().size(), blocos);
}

TEST_F(FacadeFixture, InsertingMakesAttributesAndKeepsSinglePrecision) {
    const QString caminho = arquivoBloco("BORNE_B", {"REGUA", "NUMERO"});
    const OdDbObjectId ref =
        CICad::InsereBloco(caminho, "BORNE_B", "ESQ$0001$A", 0.1, 1234.567891234, 0, 0.3);
    ASSERT_FALSE(ref.isNull());
    EXPECT_TRUE(CICad::ExisteLayer("ESQ$0001$A"));
    auto* referencia = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(ref.handle()));
    ASSERT_TRUE(referencia);
    EXPECT_EQ(referencia->position().x, 0.10000000149011612);
    EXPECT_EQ(referencia->position().y, 1234.5678710937500);
    EXPECT_NEAR(referencia->rotation(), double(float(0.3)) * 180.0 / M_PI, 1e-9);
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributos(ref, atributos, true, false);
    ASSERT_TRUE(atributos);
    ASSERT_EQ(atributos->Quantidade(), 2);
    EXPECT_EQ((*atributos)[0].GetTag(), "REGUA");
    EXPECT_EQ((*atributos)[0].GetPrompt(), "prompt REGUA");
    EXPECT_THROW((*atributos)[2], std::invalid_argument);
    // A missing file gives no reference and changes nothing but the layer table.
    EXPECT_TRUE(CICad::InsereBloco(arquivo("FALTA.dxf"), "FALTA", "NOVA", 0, 0, 0, 0).isNull());
    EXPECT_TRUE(CICad::ExisteLayer("NOVA"));
    EXPECT_FALSE(db().block("FALTA"));
}

// Values told at insertion: each attribute is made with its value, as inserting and then
// setting the values would leave it; none keeps the default.
TEST_F(FacadeFixture, InsertingWithValuesMakesEachAttributeWithItsValue) {
    const QString caminho =
        arquivoBloco("LINHA", {"VARIAVEL_1", "FUNCAO_1", "VARIAVEL_2"}, [](zvdb::Database& bloco) {
            for (zvdb::Attribute* def : bloco.modelSpace()->attributeDefinitions())
                def->setTextValue(" campo " + std::string(def->tag()));
        });
    QStringList perguntas;
    const CEValoresAtributos valores = [&](const QString& tag,
                                           const QString& padrao) -> std::optional<QString> {
        perguntas << tag + "|" + padrao;
        if (tag.startsWith("FUNCAO")) return std::nullopt;
        return "<" + padrao + ">";
    };
    const OdDbObjectId dados =
        CICad::InsereBloco(caminho, "LINHA", "0", 10.5, -3.25, 0, 0.5, valores);
    const OdDbObjectId depois = CICad::InsereBloco(caminho, "LINHA", "0", 10.5, -3.25, 0, 0.5);
    ASSERT_FALSE(dados.isNull());
    ASSERT_FALSE(depois.isNull());
    EXPECT_EQ(perguntas, QStringList({"VARIAVEL_1|campo VARIAVEL_1", "FUNCAO_1|campo FUNCAO_1",
                                      "VARIAVEL_2|campo VARIAVEL_2"}));
    CICad::SetAtributo(depois, "VARIAVEL_1", "<campo VARIAVEL_1>");
    CICad::SetAtributo(depois, "variavel_2", "<campo VARIAVEL_2>");
    auto* a = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(dados.handle()));
    auto* b = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(depois.handle()));
    ASSERT_TRUE(a && b);
    const auto atributosA = a->attributes();
    const auto atributosB = b->attributes();
    ASSERT_EQ(atributosA.size(), 3u);
    ASSERT_EQ(atributosB.size(), 3u);
    for (size_t i = 0; i < 3; ++i) {
        std::vector<std::string> ta, tb;
        for (const zvdb::Tag& t : atributosA[i]->tags())
            if (t.code != 5 && t.code != 330)
                ta.push_back(std::to_string(t.code) + " " + std::string(t.value));
        for (const zvdb::Tag& t : atributosB[i]->tags())
            if (t.code != 5 && t.code != 330)
                tb.push_back(std::to_string(t.code) + " " + std::string(t.value));
        EXPECT_EQ(ta, tb) << i;
    }
    EXPECT_EQ(atributosA[0]->textValue(), "<campo VARIAVEL_1>");
    EXPECT_EQ(atributosA[1]->textValue(), " campo FUNCAO_1") << "none keeps the default";
    // Edited afterwards like any other attribute.
    std::unique_ptr<zv::CEListaAtributos> lista;
    CICad::GetAtributos(dados, lista, false, false);
    ASSERT_TRUE(lista);
    (*lista)[1].SetValor("feito");
    EXPECT_EQ(atributosA[1]->textValue(), "feito");
}

// A writer that inserts many blocks finds each definition and page once and writes its
// links as plain texts: the reference, its attributes and its extended data are those that
// the name-and-file insertion and the item list give.
TEST_F(FacadeFixture, InsertingAFoundDefinitionAndWritingTextsGiveWhatTheLongWayGives) {
    const QString caminho = arquivoBloco("CURTO", {"VARIAVEL_1", "VARIAVEL_2"});
    const CEValoresAtributos valores = [](const QString& tag,
                                          const QString&) -> std::optional<QString> {
        return "<" + tag + ">";
    };
    const OdDbObjectId longa = CICad::InsereBloco(caminho, "CURTO", "0", 1.5, 2.5, 0, 0.5, valores);
    OdDbObjectId bloco;
    ASSERT_TRUE(CICad::GetBlocoId("CURTO", bloco));
    const OdDbObjectId curta = CICad::InsereReferencia(bloco, "0", 1.5, 2.5, 0, 0.5, valores);
    ASSERT_FALSE(longa.isNull());
    ASSERT_FALSE(curta.isNull());
    EXPECT_NE(longa.handle(), curta.handle());
    EXPECT_TRUE(CICad::InsereReferencia(OdDbObjectId(), "0", 0, 0, 0, 0, valores).isNull());
    CICad::RegistraApp("KVR_ZV_REPRESENTACAO");
    CICad::SetXData(longa, "KVR_ZV_REPRESENTACAO", {{1000, "1"}, {1000, "1A2B"}, {1000, "ç"}});
    CICad::SetXDataTextos(curta, "KVR_ZV_REPRESENTACAO", {"1", "1A2B", "\xc3\xa7"});
    const auto texto = [](const zvdb::DbObject& objeto) {
        std::vector<std::string> linhas;
        for (const zvdb::Tag& t : objeto.tags())
            if (t.code != 5 && t.code != 330)
                linhas.push_back(std::to_string(t.code) + " " + std::string(t.value));
        return linhas;
    };
    auto* a = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(longa.handle()));
    auto* b = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(curta.handle()));
    ASSERT_TRUE(a && b);
    EXPECT_EQ(texto(*a), texto(*b));
    const auto atributosA = a->attributes();
    const auto atributosB = b->attributes();
    ASSERT_EQ(atributosA.size(), 2u);
    ASSERT_EQ(atributosB.size(), 2u);
    for (size_t i = 0; i < 2; ++i)
        EXPECT_EQ(texto(*atributosA[i]), texto(*atributosB[i])) << i;
    EXPECT_EQ(atributosB[1]->textValue(), "<VARIAVEL_2>");
    const CEListaXData lidos = CICad::GetXData(curta, "KVR_ZV_REPRESENTACAO");
    ASSERT_EQ(lidos.size(), 3u);
    EXPECT_EQ(lidos[1].codigo, 1000);
    EXPECT_EQ(lidos[1].texto, "1A2B");
    EXPECT_EQ(lidos[2].texto, QString::fromUtf8("\xc3\xa7"));
}

// A writer's run of insertions finds each block and page once: a reference lands on the
// layer of its own call, and a definition or a layer erased between two calls is loaded or
// made again, as the name-and-file insertion would; so too when the calls pass the very
// same texts, as writers do row after row.
TEST_F(FacadeFixture, RepeatedInsertionsFindAnErasedBlockOrLayerAgain) {
    const QString nome = "REPETIDO", pag2 = "PAG2";
    const QString caminho = arquivoBloco("REPETIDO", {"VARIAVEL_1"});
    const CEValoresAtributos valores = [](const QString& tag,
                                          const QString&) -> std::optional<QString> {
        return "<" + tag + ">";
    };
    CEInsercoesBlocos insercoes;
    const auto referencia = [this](const OdDbObjectId& id) {
        return dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(id.handle()));
    };
    const OdDbObjectId primeira = insercoes.Insere(caminho, "REPETIDO", "PAG1", 0, 0, valores);
    const OdDbObjectId segunda = insercoes.Insere(caminho, nome, pag2, 10, 0);
    ASSERT_TRUE(referencia(primeira) && referencia(segunda));
    EXPECT_EQ(referencia(primeira)->layer(), "PAG1");
    EXPECT_EQ(referencia(segunda)->layer(), "PAG2");
    ASSERT_EQ(referencia(primeira)->attributes().size(), 1u);
    EXPECT_EQ(referencia(primeira)->attributes()[0]->textValue(), "<VARIAVEL_1>");
    EXPECT_TRUE(CICad::ExisteLayer("PAG1"));

    OdDbObjectId antigo;
    ASSERT_TRUE(CICad::GetBlocoId("REPETIDO", antigo));
    db().objectByHandle(antigo.handle())->erase();
    db().layer("PAG2")->erase();
    ASSERT_FALSE(CICad::ExisteLayer("PAG2"));
    const OdDbObjectId terceira = insercoes.Insere(caminho, nome, pag2, 20, 0);
    ASSERT_TRUE(referencia(terceira));
    OdDbObjectId novo;
    ASSERT_TRUE(CICad::GetBlocoId("REPETIDO", novo));
    EXPECT_NE(novo.handle(), antigo.handle());
    EXPECT_TRUE(CICad::ExisteLayer("PAG2"));
    EXPECT_EQ(referencia(terceira)->layer(), "PAG2");
    EXPECT_EQ(referencia(terceira)->attributes().size(), 1u);
}

// The tag and default asked about are those of the definition as it stands at each
// insertion: a definition edited, or a block redefined from its file, between two rows.
// Values of every kind reach their attributes as UTF-8: plain, accented, of two and three
// bytes a letter, beyond the basic plane, empty, longer than a row's values together (plain
// or not), and for more attributes than a row has; read back from the drawing and from the
// saved file alike.
TEST_F(FacadeFixture, EveryValueReachesItsAttributeWhateverItsTextAndTheirNumber) {
    QStringList tags;
    for (int i = 0; i < 20; ++i)
        tags << QString("CAMPO_%1").arg(i);
    const QString caminho = arquivoBloco("MUITOS", tags);
    const QString longo = QString("x").repeated(1500);
    const auto valor = [&](const QString& tag) -> std::optional<QString> {
        const int i = tag.mid(6).toInt();
        if (i == 3) return std::nullopt;
        if (i == 5) return longo;
        if (i == 7) return QString::fromUtf8("2,5mm² € \xF0\x9F\x98\x80 ") + tag;
        if (i == 8) return QString::fromUtf8("é").repeated(600);
        if (i == 10) return QString::fromUtf8("中文 € ²") + tag;
        if (i % 4 == 1) return QString::fromUtf8("ação Ø ") + tag;
        if (i == 6) return QString();
        return tag.toLower();
    };
    const CEValoresAtributos valores = [&](const QString& tag, const QString&) {
        return valor(tag);
    };
    OdDbObjectId bloco;
    ASSERT_FALSE(CICad::InsereBloco(caminho, "MUITOS", "0", 0, 0, 0, 0).isNull());
    ASSERT_TRUE(CICad::GetBlocoId("MUITOS", bloco));
    const OdDbObjectId id = CICad::InsereReferencia(bloco, "0", 3, 4, 0, 0, valores);
    auto* ref = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(id.handle()));
    ASSERT_TRUE(ref);
    const auto esperados = [&] {
        std::vector<std::string> todos;
        for (const QString& tag : tags)
            todos.push_back(valor(tag).value_or(QString()).toStdString());
        return todos;
    }();
    const auto lidos = [](const zvdb::BlockReference& referencia) {
        std::vector<std::string> todos;
        for (zvdb::Attribute* atributo : referencia.attributes())
            todos.emplace_back(atributo->textValue());
        return todos;
    };
    EXPECT_EQ(lidos(*ref), esperados);
    EXPECT_EQ(esperados[9], "ação Ø CAMPO_9");
    EXPECT_EQ(esperados[5].size(), 1500u);
    EXPECT_EQ(esperados[7], "2,5mm\xC2\xB2 \xE2\x82\xAC \xF0\x9F\x98\x80 CAMPO_7");
    EXPECT_EQ(esperados[8].size(), 1200u);
    EXPECT_EQ(esperados[10],
              "\xE4\xB8\xAD\xE6\x96\x87 \xE2\x82\xAC \xC2\xB2"
              "CAMPO_10");
    const auto salvo = zvdb::DxfLoader::load(zvdb::DxfWriter::toText(db()));
    auto* lido = dynamic_cast<zvdb::BlockReference*>(salvo->objectByHandle(id.handle()));
    ASSERT_TRUE(lido);
    EXPECT_EQ(lidos(*lido), esperados);
}

TEST_F(FacadeFixture, ValuesAreAskedWithTheDefinitionsCurrentTagAndDefault) {
    const QString caminho = arquivoBloco("ROW", {"CAMPO_A", "CAMPO_B"}, [](zvdb::Database& b) {
        for (zvdb::Attribute* def : b.modelSpace()->attributeDefinitions())
            def->setTextValue("  def " + std::string(def->tag()) + " ");
    });
    QStringList perguntas;
    const CEValoresAtributos valores = [&](const QString& tag,
                                           const QString& padrao) -> std::optional<QString> {
        perguntas << tag + "|" + padrao;
        return tag + "=" + padrao;
    };
    const auto valoresDe = [&](const OdDbObjectId& id) {
        QStringList textos;
        auto* ref = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(id.handle()));
        for (zvdb::Attribute* atributo : ref ? ref->attributes() : std::vector<zvdb::Attribute*>())
            textos << QString::fromStdString(std::string(atributo->textValue()));
        return textos;
    };
    const OdDbObjectId primeira = CICad::InsereBloco(caminho, "ROW", "0", 0, 0, 0, 0, valores);
    const OdDbObjectId segunda = CICad::InsereBloco(caminho, "ROW", "0", 0, -5, 0, 0, valores);
    EXPECT_EQ(perguntas, QStringList({"CAMPO_A|def CAMPO_A", "CAMPO_B|def CAMPO_B",
                                      "CAMPO_A|def CAMPO_A", "CAMPO_B|def CAMPO_B"}));
    EXPECT_EQ(valoresDe(segunda), QStringList({"CAMPO_A=def CAMPO_A", "CAMPO_B=def CAMPO_B"}));
    // The second definition takes a new default and a new tag.
    zvdb::BlockRecord* bloco = db().block("ROW");
    ASSERT_TRUE(bloco);
    zvdb::Attribute* segundaDefinicao = bloco->attributeDefinitions().at(1);
    segundaDefinicao->setTextValue(" novo ");
    segundaDefinicao->setText(2, "CAMPO_C");
    perguntas.clear();
    const OdDbObjectId terceira = CICad::InsereBloco(caminho, "ROW", "0", 0, -10, 0, 0, valores);
    EXPECT_EQ(perguntas, QStringList({"CAMPO_A|def CAMPO_A", "CAMPO_C|novo"}));
    EXPECT_EQ(valoresDe(terceira), QStringList({"CAMPO_A=def CAMPO_A", "CAMPO_C=novo"}));
    // Redefined from a file whose first definition has another default.
    const QString outro = arquivoBloco("ROW2", {"CAMPO_A"}, [](zvdb::Database& b) {
        b.modelSpace()->attributeDefinitions().front()->setTextValue("outro");
    });
    ASSERT_TRUE(CICad::RecarregaBloco(outro, "ROW"));
    perguntas.clear();
    const OdDbObjectId quarta = CICad::InsereBloco(caminho, "ROW", "0", 0, -15, 0, 0, valores);
    EXPECT_EQ(perguntas, QStringList({"CAMPO_A|outro"}));
    EXPECT_EQ(valoresDe(quarta), QStringList({"CAMPO_A=outro"}));
    EXPECT_EQ(valoresDe(primeira), QStringList({"CAMPO_A=def CAMPO_A"}))
        << "a reference made before keeps the value of the tag still defined";
}

TEST_F(FacadeFixture, RedefiningABlockKeepsValuesAndDropsRemovedTags) {
    const QString v1 = arquivoBloco("REGUA_V1", {"REGUA", "NUMERO", "VELHO"});
    const OdDbObjectId ref = CICad::InsereBloco(v1, "BORNE_C", "0", 0, 0, 0, 0);
    CICad::SetAtributo(ref, "regua", "X1");
    CICad::SetAtributo(ref, "NUMERO", "12");
    CICad::SetAtributo(ref, "VELHO", "fora");
    const QString v2 = arquivoBloco("REGUA_V2", {"NUMERO", "REGUA", "NOVO"});
    ASSERT_TRUE(CICad::RecarregaBloco(v2, "BORNE_C"));
    std::unique_ptr<zv::CEListaAtributos> atributos;
    CICad::GetAtributos(ref, atributos, false, false);
    ASSERT_TRUE(atributos);
    QStringList pares;
    for (int i = 0; i < atributos->Quantidade(); ++i)
        pares << (*atributos)[i].GetTag() + "=" + (*atributos)[i].GetValor();
    EXPECT_EQ(pares, QStringList({"NUMERO=12", "REGUA=X1", "NOVO="}));
    // The temporary block is gone.
    for (zvdb::BlockRecord* bloco : db().blocks())
        EXPECT_FALSE(QString::fromStdString(std::string(bloco->name())).startsWith("ZV_TMP_"));
}

// References inside other blocks are refreshed like those of model space.
TEST_F(FacadeFixture, RedefiningABlockRefreshesReferencesNestedInOtherBlocks) {
    const QString v1 = arquivoBloco("REGUA_V1", {"REGUA", "VELHO"});
    const OdDbObjectId solto = CICad::InsereBloco(v1, "BORNE_C", "0", 0, 0, 0, 0);
    OdDbObjectId definicao;
    ASSERT_TRUE(CICad::GetBlocoId("BORNE_C", definicao));
    zvdb::BlockRecord* grupo = db().createBlock("GRUPO");
    zvdb::BlockReference* aninhada =
        grupo->addBlockReference(*db().block("BORNE_C"), {5, 5, 0}, {1, 1, 1}, 0, "0");
    const OdDbObjectId dentro(&db(), aninhada->handle());
    CICad::CriarAtributos(definicao, dentro);
    CICad::SetAtributo(dentro, "REGUA", "X9");
    CICad::SetAtributo(solto, "REGUA", "X1");
    ASSERT_TRUE(CICad::RecarregaBloco(arquivoBloco("REGUA_V2", {"REGUA", "NOVO"}), "BORNE_C"));
    auto pares = [](const OdDbObjectId& ref) {
        std::unique_ptr<zv::CEListaAtributos> atributos;
        CICad::GetAtributos(ref, atributos, false, false);
        QStringList texto;
        for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
            texto << (*atributos)[i].GetTag() + "=" + (*atributos)[i].GetValor();
        return texto;
    };
    EXPECT_EQ(pares(solto), QStringList({"REGUA=X1", "NOVO="}));
    EXPECT_EQ(pares(dentro), QStringList({"REGUA=X9", "NOVO="}));
}

// Several blocks redefined in one call, each with its own result.
TEST_F(FacadeFixture, RedefiningBlocksTogetherRefreshesEachBlocksReferences) {
    const OdDbObjectId a = CICad::InsereBloco(arquivoBloco("VISTA_A1", {"RELACAO", "VELHO"}),
                                              "VISTA_A", "0", 0, 0, 0, 0);
    const OdDbObjectId b =
        CICad::InsereBloco(arquivoBloco("VISTA_B1", {"NUMERO"}), "VISTA_B", "0", 10, 0, 0, 0);
    CICad::SetAtributo(a, "RELACAO", "-K1");
    CICad::SetAtributo(b, "NUMERO", "7");
    const std::vector<bool> feitos =
        CICad::RecarregaBlocos({{arquivoBloco("VISTA_A2", {"RELACAO", "NOVO"}), "VISTA_A"},
                                {arquivo("nao-existe.dxf"), "VISTA_C"},
                                {arquivoBloco("VISTA_B2", {"NUMERO", "PASSO"}), "VISTA_B"},
                                {arquivoBloco("VISTA_D", {"X"}), "VISTA_D"}});
    EXPECT_EQ(feitos, std::vector<bool>({true, false, true, true}));
    auto pares = [](const OdDbObjectId& ref) {
        std::unique_ptr<zv::CEListaAtributos> atributos;
        CICad::GetAtributos(ref, atributos, false, false);
        QStringList texto;
        for (int i = 0; atributos && i < atributos->Quantidade(); ++i)
            texto << (*atributos)[i].GetTag() + "=" + (*atributos)[i].GetValor();
        return texto;
    };
    EXPECT_EQ(pares(a), QStringList({"RELACAO=-K1", "NOVO="}));
    EXPECT_EQ(pares(b), QStringList({"NUMERO=7", "PASSO="}));
    OdDbObjectId novo;
    EXPECT_TRUE(CICad::GetBlocoId("VISTA_D", novo));
    EXPECT_FALSE(CICad::GetBlocoId("VISTA_C", novo));
    EXPECT_TRUE(CICad::RecarregaBlocos({}).empty());
}

TEST_F(FacadeFixture, AttributesByLanguageTriple) {
    const QString caminho = arquivoBloco("TERMINAL_EN", {"STRIP", "NUMBER"});
    const OdDbObjectId ref = CICad::InsereBloco(caminho, "TERMINAL_EN", "0", 0, 0, 0, 0);
    CICad::SetAtributo(ref, "STRIP", "  X7 ");
    std::unique_ptr<zv::CEAtributo> atributo;
    EXPECT_EQ(CICad::GetAtributoTraduzido(CampoTraduzido::Regua, ref, atributo), 0);
    ASSERT_TRUE(atributo);
    EXPECT_EQ(atributo->GetTag(), "STRIP");
    EXPECT_EQ(atributo->GetValor(), "X7");
    std::unique_ptr<zv::CEAtributo> pino;
    EXPECT_EQ(CICad::GetAtributoTraduzido(CampoTraduzido::Pino, ref, pino), 2);
    EXPECT_FALSE(pino);
    EXPECT_EQ(CICad::TagTraduzida(CampoTraduzido::Regua, 9), "REGUA");
    EXPECT_TRUE(CICad::EhTagFio("fio"));
    EXPECT_TRUE(CICad::EhTagFio("Alambre"));
    EXPECT_FALSE(CICad::EhTagFio("CABLE"));
    // Setting a value through the record writes the drawing.
    atributo->SetValor("X8");
    EXPECT_EQ(CICad::GetAtributo("strip", ref)->GetValor(), "X8");
}

TEST_F(FacadeFixture, VirtualAttributesFillEmptyFieldsWithABlank) {
    zvdb::Entity* fio = db().modelSpace()->addLwPolyline({{0, 0, 0}, {10, 0, 0}}, false);
    const OdDbObjectId id(&db(), fio->handle());
    const QChar ff(0x0C);
    CICad::SetXData(id, "KVR_ZV_ATT_VIRTUAL",
                    {{1000, QString("TAG") + ff + ff + "s"},
                     {1000, QString("CABO") + ff + "101"},
                     {1000, QString("QUEBRADO") + ff + "x"},
                     {1000, QString("CABO") + ff + "999" + ff + "N"},
                     {1000, QString("SO")}});
    // The list takes only records of three fields.
    std::unique_ptr<zv::CEListaAtributos> lista;
    EXPECT_EQ(CICad::GetAtributosVirtuais(id, lista), 0);
    ASSERT_EQ(lista->Quantidade(), 2);
    EXPECT_EQ((*lista)[0].GetValor(), " ");
    EXPECT_TRUE((*lista)[0].IsInvisivel());
    EXPECT_EQ((*lista)[1].GetValor(), "999");
    EXPECT_FALSE((*lista)[1].IsInvisivel());
    // One tag asked for: the first record whose first field is the tag answers, whatever
    // its count of fields.
    const auto cabo = CICad::GetAtributoEntidade("CABO", id);
    ASSERT_TRUE(cabo);
    EXPECT_EQ(cabo->GetValor(), "101");
    EXPECT_FALSE(cabo->IsInvisivel());
    EXPECT_TRUE(cabo->GetId().isNull());
    const auto quebrado = CICad::GetAtributoVirtual("QUEBRADO", id);
    ASSERT_TRUE(quebrado);
    EXPECT_EQ(quebrado->GetValor(), "x");
    const auto so = CICad::GetAtributoVirtual("SO", id);
    ASSERT_TRUE(so);
    EXPECT_EQ(so->GetValor(), "");
    EXPECT_TRUE(CICad::GetAtributoVirtual("TAG", id)->IsInvisivel());
    EXPECT_FALSE(CICad::GetAtributoVirtual("FALTA", id));
    EXPECT_EQ(CICad::GetAtributosVirtuais(OdDbObjectId(), lista), 1);
}

// Read in two steps, a symbol gives what the whole reading gives: the first step its key
// text, its accessory texts and, on a symbol with key data of its own, its circuit; the
// second the rest, with the circuit of its master otherwise.
TEST_F(FacadeFixture, ASymbolReadInTwoStepsGivesTheWholeReading) {
    const QString caminho = arquivoBloco("BORNE_L", {"REGUA", "NUMERO"});
    const OdDbObjectId mestre = CICad::InsereBloco(caminho, "BORNE_L", "ESQ$0001$A", 1, 2, 0, 0);
    const OdDbObjectId outro = CICad::InsereBloco(caminho, "BORNE_L", "ESQ$0002$A", 5, 6, 0, 0);
    ASSERT_FALSE(mestre.isNull());
    ASSERT_FALSE(outro.isNull());
    CICad::SetXData(mestre, "KVR_ZV", {{1000, QString("SO") + QChar(0x0C) + "1"}});
    CICad::SetXData(mestre, "ZV_VINC_ADITIVO", {{1000, "2"}, {1070, "5"}, {1000, "SY"}});
    CICad::SetXData(mestre, "KVR_ZV_CIRCLOC", {{1071, "4"}});
    CICad::SetXData(outro, "KVR_ZV_REPRESENTACAO",
                    {{1000, "-50"}, {1000, ZVString::DeHandle(mestre.handle())}});

    CESimboloLido chave;
    ASSERT_TRUE(CICad::LeituraChaveSimbolo(mestre, chave));
    EXPECT_TRUE(chave.temChave);
    EXPECT_TRUE(chave.temTextoChave);
    EXPECT_EQ(chave.textoChave,
              "SO\x0c"
              "1");
    EXPECT_EQ(chave.vinculos, (std::vector<std::string_view>{"2", "SY"}));
    EXPECT_TRUE(chave.temCircuito);
    EXPECT_EQ(chave.circuito, 4);
    EXPECT_FALSE(chave.referencia);
    EXPECT_TRUE(chave.atributos.empty());
    ASSERT_TRUE(CICad::LeituraChaveSimbolo(outro, chave));
    EXPECT_FALSE(chave.temChave);
    EXPECT_TRUE(chave.vinculos.empty());
    EXPECT_FALSE(chave.temCircuito);

    for (const OdDbObjectId& id : {mestre, outro}) {
        CESimboloLido inteiro, passos;
        ASSERT_TRUE(CICad::LeituraSimbolo(id, inteiro));
        // What the first reading left is emptied by the next.
        ASSERT_TRUE(CICad::LeituraChaveSimbolo(id == mestre ? outro : mestre, passos));
        ASSERT_TRUE(CICad::CompletaLeituraSimbolo(id == mestre ? outro : mestre, passos));
        ASSERT_TRUE(CICad::LeituraChaveSimbolo(id, passos));
        ASSERT_TRUE(CICad::CompletaLeituraSimbolo(id, passos));
        EXPECT_TRUE(passos.referencia);
        EXPECT_EQ(passos.bloco, inteiro.bloco);
        EXPECT_EQ(passos.layer, inteiro.layer);
        EXPECT_EQ(passos.posicao.x, inteiro.posicao.x);
        EXPECT_EQ(passos.textoChave, inteiro.textoChave);
        EXPECT_EQ(passos.temChave, inteiro.temChave);
        EXPECT_EQ(passos.vinculos, inteiro.vinculos);
        EXPECT_TRUE(passos.temCircuito);
        EXPECT_EQ(passos.circuito, 4);
        EXPECT_EQ(passos.circuito, inteiro.circuito);
        ASSERT_EQ(passos.atributos.size(), 2u);
        ASSERT_EQ(inteiro.atributos.size(), 2u);
        for (std::size_t k = 0; k < 2; ++k) {
            EXPECT_EQ(passos.atributos[k].tag, inteiro.atributos[k].tag);
            EXPECT_EQ(passos.atributos[k].valor, inteiro.atributos[k].valor);
        }
    }
    EXPECT_FALSE(CICad::LeituraChaveSimbolo(OdDbObjectId(&db(), 0xFFFFFF), chave));
}

// A wire's one reading of its extended data gives the key text the key applications give,
// in their order, and its own texts item by item, a point counting as one.
TEST_F(FacadeFixture, AWireReadsItsKeyAndTextsInOneWalk) {
    zvdb::BlockRecord* ms = db().modelSpace();
    auto id = [this](zvdb::DbObject* o) { return OdDbObjectId(&db(), o->handle()); };
    const OdDbObjectId fio = id(ms->addCircle({0, 0, 0}, 1));
    CICad::SetXData(fio, "KVR_ZV_CABO", {{1000, "C1"}});
    CICad::SetXData(fio, "KVR_ZV_WIRE",
                    {{1070, "3"},
                     {1000, QString("FIO") + QChar(0x0C) + "IEC"},
                     {1000, "12"},
                     {1010, "", 1.5, 2.5, 0},
                     {1000, "COR=AZ"}});
    std::string_view chave;
    bool temChave = true;
    std::vector<std::string_view> textos{"antes"};
    ASSERT_TRUE(CICad::TextosFio(fio, chave, temChave, textos));
    EXPECT_TRUE(temChave);
    EXPECT_EQ(chave,
              "FIO\x0c"
              "IEC");
    ASSERT_EQ(textos.size(), 5u);
    EXPECT_EQ(textos[1], chave);
    EXPECT_EQ(textos[2], "12");
    EXPECT_EQ(textos[4], "COR=AZ");
    std::vector<std::string_view> aparte;
    CICad::TextosXData(fio, "KVR_ZV_WIRE", aparte);
    EXPECT_EQ(textos, aparte);

    // The symbol's own key data comes before the wire's; a key application without a text
    // item has a key but no text.
    CICad::SetXData(fio, "KVR_ZV", {{1070, "1"}});
    ASSERT_TRUE(CICad::TextosFio(fio, chave, temChave, textos));
    EXPECT_FALSE(temChave);
    EXPECT_EQ(textos.size(), 5u);

    const OdDbObjectId cabo = id(ms->addCircle({5, 0, 0}, 1));
    CICad::SetXData(cabo, "KVR_ZV_CABO", {{1000, "C1"}});
    ASSERT_TRUE(CICad::TextosFio(cabo, chave, temChave, textos));
    EXPECT_TRUE(temChave);
    EXPECT_EQ(chave, "C1");
    EXPECT_TRUE(textos.empty());

    const OdDbObjectId nada = id(ms->addCircle({9, 0, 0}, 1));
    textos = {"antes"};
    EXPECT_FALSE(CICad::TextosFio(nada, chave, temChave, textos));
    EXPECT_FALSE(temChave);
    EXPECT_TRUE(textos.empty());
    textos = {"antes"};
    EXPECT_FALSE(CICad::TextosFio(OdDbObjectId(&db(), 0xFFFFFF), chave, temChave, textos));
    EXPECT_TRUE(textos.empty());
}

TEST_F(FacadeFixture, MastersResolveThroughEachApplication) {
    zvdb::BlockRecord* ms = db().modelSpace();
    auto id = [this](zvdb::DbObject* o) { return OdDbObjectId(&db(), o->handle()); };
    const OdDbObjectId mestre = id(ms->addCircle({0, 0, 0}, 1));
    const QString h = ZVString::DeHandle(mestre.handle());
    CICad::SetXData(mestre, "KVR_ZV", {{1000, "7001"}});
    struct Caso {
        const char* aplicacao;
        CEListaXData itens;
    };
    const Caso casos[] = {{"KVR_LAYOUT_PAINEL", {{1000, h}}},
                          {"KVR_ZV_UNIFILAR", {{1005, h}}},
                          {"KVR_ZV_REPRESENTACAO", {{1000, "-50"}, {1000, h}}},
                          {"KVR_ZV_ANILHAFIO", {{1000, h}}},
                          {"KVR_ZV_ANILHACABO", {{1000, h}}}};
    for (const Caso& caso : casos) {
        const OdDbObjectId representacao = id(ms->addPoint({1, 1, 0}));
        CICad::SetXData(representacao, caso.aplicacao, caso.itens);
        EXPECT_EQ(CICad::GetSimboloMestre(&db(), representacao), mestre) << caso.aplicacao;
    }
    EXPECT_EQ(CICad::GetSimboloMestre(&db(), mestre), mestre);
    // A representation with one item only, or pointing at an erased master, has none.
    const OdDbObjectId curta = id(ms->addPoint({2, 2, 0}));
    CICad::SetXData(curta, "KVR_ZV_REPRESENTACAO", {{1000, h}});
    EXPECT_TRUE(CICad::GetSimboloMestre(&db(), curta).isNull());
    int circuito = 0;
    EXPECT_TRUE(CICad::GetCircuitoLocal(mestre, circuito));
    EXPECT_EQ(circuito, 1);
    CICad::SetXData(mestre, "KVR_ZV_CIRCLOC", {{1071, "3"}});
    EXPECT_TRUE(CICad::GetCircuitoLocal(mestre, circuito));
    EXPECT_EQ(circuito, 3);
    db().objectByHandle(mestre.handle())->erase();
    const OdDbObjectId orfa = id(ms->addPoint({3, 3, 0}));
    CICad::SetXData(orfa, "KVR_ZV_ANILHAFIO", {{1000, h}});
    EXPECT_TRUE(CICad::GetSimboloMestre(&db(), orfa).isNull());
    EXPECT_FALSE(CICad::GetCircuitoLocal(orfa, circuito));
}

TEST_F(FacadeFixture, ProjectSettingsLiveOnThePointOfZvFreeze) {
    EXPECT_EQ(CICad::GetOrdemGrupos(), 0);
    CICad::SetOrdemGrupos(3);
    CICad::SetOrdemPaginas("ESQ", 7);
    CICad::SetCfgProjeto("painel.cfg");
    EXPECT_EQ(CICad::GetOrdemGrupos(), 3);
    EXPECT_EQ(CICad::GetOrdemPaginas("ESQ"), 7);
    EXPECT_EQ(CICad::GetOrdemPaginas("OUTRO"), 0);
    EXPECT_EQ(CICad::GetCfgProjeto(), "painel.cfg");
    int pontos = 0;
    for (zvdb::Entity* e : db().modelSpace()->entities())
        if (e->isType("POINT") && e->layer() == "ZV_FREEZE") ++pontos;
    EXPECT_EQ(pontos, 1);
    CICad::SetNumeracaoPaginas(1);
    EXPECT_EQ(CICad::GetNumeracaoPaginas(), 1);
}

TEST_F(FacadeFixture, TheStoreIsMadeByAReadAndKeepsRecords) {
    EXPECT_FALSE(db().namedObjects()->get("ZV_DATA_MGR"));
    EXPECT_TRUE(ZVData::CESerializable::CarregarClasse("CELayoutRotasFios").empty());
    zvdb::Dictionary* loja = db().namedObjects()->getDictionary("ZV_DATA_MGR");
    ASSERT_TRUE(loja);
    EXPECT_TRUE(loja->getDictionary("CELayoutRotasFios"));

    CELayoutRotasFios rota;
    rota.strKeyFio = "101";
    rota.strRotaData = "2A:1-2B:2-P1-P2-P3$3C-4D-X:Y:Z";
    rota.Gravar();
    EXPECT_TRUE(ZVData::CESerializable::Existe(rota.Chave(), "CELayoutRotasFios"));
    const auto objetos = ZVData::CESerializable::CarregarClasse("CELayoutRotasFios");
    ASSERT_EQ(objetos.size(), 1u);
    EXPECT_EQ(objetos[0].first, rota.Chave());
    CELayoutRotasFios lida;
    lida.Carregar(objetos[0].second);
    EXPECT_EQ(lida.strKeyFio, "101");
    EXPECT_EQ(lida.strRotaData, rota.strRotaData);
    // A second object gets another key; erasing one leaves the other.
    CELayoutRotasFios outra;
    EXPECT_NE(outra.Chave(), rota.Chave());
    outra.Gravar();
    rota.Apagar();
    EXPECT_FALSE(ZVData::CESerializable::Existe(rota.Chave(), "CELayoutRotasFios"));
    EXPECT_EQ(ZVData::CESerializable::CarregarClasse("CELayoutRotasFios").size(), 1u);
    ZVData::CESerializable::ApagarClasse("CELayoutRotasFios");
    EXPECT_FALSE(ZVData::CESerializable::Existe(outra.Chave(), "CELayoutRotasFios"));
}

TEST_F(FacadeFixture, ExtentsOfEntitiesAndReferences) {
    zvdb::BlockRecord* ms = db().modelSpace();
    double xMax, xMin, yMax, yMin;
    const OdDbObjectId linha(&db(), ms->addLine({1, 2, 0}, {4, -1, 0})->handle());
    ASSERT_TRUE(CICad::GetExtensao(linha, xMax, xMin, yMax, yMin, false));
    EXPECT_EQ(QList<double>({xMax, xMin, yMax, yMin}), QList<double>({4, 1, 2, -1}));
    const OdDbObjectId texto(&db(), ms->addText({0, 0, 0}, 2.5, "X1")->handle());
    EXPECT_FALSE(CICad::GetExtensao(texto, xMax, xMin, yMax, yMin, false));
    const QString caminho = arquivoBloco("CAIXA", {});
    const OdDbObjectId ref = CICad::InsereBloco(caminho, "CAIXA", "0", 100, 50, 0, 0);
    ASSERT_TRUE(CICad::GetExtensao(ref, xMax, xMin, yMax, yMin, false));
    EXPECT_EQ(QList<double>({xMax, xMin, yMax, yMin}), QList<double>({110, 100, 50, 50}));
}

// A reference's bounds are its block's, scaled and moved; its rotation takes no part, and
// with attributes asked for every attribute counts, the invisible ones too.
TEST_F(FacadeFixture, ExtentsOfAReferenceAreItsBlocksScaledAndMoved) {
    double xMax, xMin, yMax, yMin;
    const QString caminho = arquivoBloco("CAIXA", {});
    const OdDbObjectId id = CICad::InsereBloco(caminho, "CAIXA", "0", 100, 50, 0, 0);
    auto* ref = dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(id.handle()));
    ASSERT_TRUE(ref);
    ref->setScale({2, 3, 1});
    ref->setRotation(90);
    ASSERT_TRUE(CICad::GetExtensao(id, xMax, xMin, yMax, yMin, false));
    EXPECT_EQ(QList<double>({xMax, xMin, yMax, yMin}), QList<double>({120, 100, 50, 50}));
    // Two attributes of one character below the block, 2 high; one of them invisible.
    ref->addAttribute("VISTO", "a", {100, 20, 0}, 2.0);
    ref->addAttribute("OCULTO", "b", {100, -40, 0}, 2.0)->setInvisible(true);
    ASSERT_TRUE(CICad::GetExtensao(id, xMax, xMin, yMax, yMin, false));
    EXPECT_EQ(yMin, 50);
    ASSERT_TRUE(CICad::GetExtensao(id, xMax, xMin, yMax, yMin, true));
    EXPECT_EQ(QList<double>({xMax, xMin, yMax, yMin}), QList<double>({120, 100, 50, -40}));
}

}  // namespace

namespace {

TEST_F(FacadeFixture, XrecordsCarryExtendedDataBehindTheirData) {
    const std::string caminho[] = {"ESQ_VIRTUAL_ZV", "BORNE_XV_1"};
    zvdb::XRecord* registro = db().xrecordAt(caminho, true);
    const zvdb::Tag dado{1, db().store("dados")};
    registro->setData(std::span<const zvdb::Tag>(&dado, 1));
    const OdDbObjectId id(&db(), registro->handle());
    CICad::SetXData(id, "KVR_ZV", {{1000, QString("7001") + QChar(0x0C) + "1"}});
    EXPECT_TRUE(CICad::TemXData(id, "KVR_ZV"));
    // Rewriting the data keeps the extended data, and the other way round.
    const zvdb::Tag outro{1, db().store("outros")};
    registro->setData(std::span<const zvdb::Tag>(&outro, 1));
    ASSERT_EQ(registro->data().size(), 1u);
    EXPECT_EQ(registro->data()[0].value, "outros");
    EXPECT_EQ(CICad::GetXData(id, "KVR_ZV").front().texto, QString("7001") + QChar(0x0C) + "1");
    const auto entradas = CICad::GetEntradasDicionario({"ESQ_VIRTUAL_ZV"});
    ASSERT_EQ(entradas.size(), 1u);
    EXPECT_EQ(entradas[0].first, "BORNE_XV_1");
}

// The cable reader's one walk: each entity as GetEntidades gives it, its extended data as
// TemXData tells it, and for a reference its GetCaixaSelecao box and its layer.
TEST_F(FacadeFixture, OneWalkOfABlocksEntitiesTellsWhatTheirOwnQuestionsTell) {
    zvdb::BlockRecord* ms = db().modelSpace();
    zvdb::BlockRecord* caixa = db().createBlock("CAIXA1");
    caixa->addLine({-1, -2, 0}, {3, 4, 0});
    zvdb::BlockRecord* vazio = db().createBlock("VAZIO");
    db().createLayer("P$0001$A");
    std::vector<zvdb::Entity*> feitas = {
        ms->addBlockReference(*caixa, {10, 20, 0}, {2, 2, 1}, 0, "P$0001$A"),
        ms->addLwPolyline({{0, 0, 0}, {5, 5, 0}}, false, "P$0001$A"),
        ms->addBlockReference(*vazio, {1, 1, 0}),  // no extents
        ms->addText({0, 0, 0}, 2.5, "T"),
        ms->addBlockReference(*caixa, {-5, 0, 0}, {1, 1, 1}, 0, "p$0001$a"),
        ms->addLine({0, 0, 0}, {1, 1, 0}),
        ms->addBlockReference(*caixa, {7, 7, 0}),
    };
    const auto id = [this](const zvdb::DbObject* o) { return OdDbObjectId(&db(), o->handle()); };
    CICad::SetXData(id(feitas[0]), "KVR_ZV_CABO", {{1000, "20101"}});
    CICad::SetXData(id(feitas[1]), "kvr_zv_conex_blind", {{1000, "W1"}});
    CICad::SetXData(id(feitas[3]), "KVR_ZV_CABO", {});  // a group without items
    CICad::SetXData(id(feitas[4]), "KVR_ZV_CABOS", {{1000, "x"}});
    CICad::SetXData(id(feitas[5]), "KVR_ZV_CABO", {{1000, "a"}});
    CICad::SetXData(id(feitas[5]), "KVR_ZV_CONEX_BLIND", {{1000, "b"}});
    feitas[6]->erase();
    const std::string_view nomes[] = {"KVR_ZV_CABO", "KVR_ZV_CONEX_BLIND"};
    const OdDbObjectId modelSpace = CICad::GetModelSpace(&db());
    std::vector<CICad::EntidadeVista> vistas;
    CICad::PercorreEntidades(modelSpace, nomes,
                             [&](const CICad::EntidadeVista& v) { vistas.push_back(v); });
    const std::vector<OdDbObjectId> ids = CICad::GetEntidades(modelSpace);
    ASSERT_EQ(vistas.size(), ids.size());
    ASSERT_EQ(ids.size(), 6u);
    std::vector<bool> comXData, comCaixa;
    for (size_t k = 0; k < ids.size(); ++k) {
        const CICad::EntidadeVista& v = vistas[k];
        EXPECT_EQ(v.id, ids[k]) << k;
        EXPECT_EQ(v.comXData, CICad::TemXData(ids[k], "KVR_ZV_CABO") ||
                                  CICad::TemXData(ids[k], "KVR_ZV_CONEX_BLIND"))
            << k;
        CEPonto minimo, maximo;
        const bool caixaLida = CICad::GetCaixaSelecao(ids[k], minimo, maximo);
        EXPECT_EQ(v.referenciaComCaixa, CICad::EhReferencia(ids[k]) && caixaLida) << k;
        if (!v.referenciaComCaixa) continue;
        EXPECT_EQ(QList<double>({v.minimo.x, v.minimo.y, v.maximo.x, v.maximo.y}),
                  QList<double>({minimo.x, minimo.y, maximo.x, maximo.y}));
        EXPECT_EQ(v.layer, CICad::NomeLayerUtf8(ids[k]));
    }
    for (const CICad::EntidadeVista& v : vistas) {
        comXData.push_back(v.comXData);
        comCaixa.push_back(v.referenciaComCaixa);
    }
    EXPECT_EQ(comCaixa, (std::vector<bool>{true, false, false, false, true, false}));
    EXPECT_EQ(comXData, (std::vector<bool>{true, true, false, false, false, true}));
    EXPECT_EQ(QList<double>(
                  {vistas[0].minimo.x, vistas[0].minimo.y, vistas[0].maximo.x, vistas[0].maximo.y}),
              QList<double>({8, 16, 16, 28}));
    EXPECT_EQ(vistas[4].layer, "p$0001$a");
    // No applications: nothing has extended data of them.
    int vistas2 = 0;
    CICad::PercorreEntidades(modelSpace, {}, [&](const CICad::EntidadeVista& v) {
        ++vistas2;
        EXPECT_FALSE(v.comXData);
    });
    EXPECT_EQ(vistas2, 6);
}

}  // namespace

TEST_F(FacadeFixture, ReferencesAreListedByTheUpperCaseNameOfTheirBlockInDrawingOrder) {
    // A reference may spell its block's name in any case; all of them count for the block,
    // in the order the drawing holds them, nested references included.
    zvdb::BlockRecord* borne = db().createBlock("BORNE1");
    zvdb::BlockRecord* motor = db().createBlock("Motor");
    zvdb::BlockRecord* grupo = db().createBlock("GRUPO");
    std::vector<OdDbObjectId> esperados;
    const char* grafias[] = {"BORNE1", "borne1", "Borne1", "BORNE1"};
    for (int i = 0; i < 4; ++i) {
        zvdb::BlockReference* ref = db().modelSpace()->addBlockReference(*borne, {i * 10.0, 0, 0});
        ref->setText(2, grafias[i]);
        esperados.push_back(OdDbObjectId(&db(), ref->handle()));
        if (i == 1) db().modelSpace()->addBlockReference(*motor, {0, 50, 0});
    }
    zvdb::BlockReference* aninhada = grupo->addBlockReference(*borne, {0, 0, 0});
    const auto referencias = CICad::GetReferenciasPorBloco(&db());
    EXPECT_FALSE(referencias.contains("borne1"));
    EXPECT_EQ(referencias.value("MOTOR").size(), 1u);
    std::vector<OdDbObjectId> bornes = referencias.value("BORNE1");
    ASSERT_EQ(bornes.size(), 5u);
    const auto lugar =
        std::find(bornes.begin(), bornes.end(), OdDbObjectId(&db(), aninhada->handle()));
    ASSERT_NE(lugar, bornes.end());
    bornes.erase(lugar);
    EXPECT_EQ(bornes, esperados);
}

TEST_F(FacadeFixture, MarkedReferencesComeInDrawingOrderWithTheirBlockAndFirstItem) {
    // Only model-space references that carry the application, as their block is spelt, with
    // the first item of their data whatever its kind.
    zvdb::BlockRecord* borne = db().createBlock("Borne1");
    zvdb::BlockRecord* grupo = db().createBlock("GRUPO");
    zvdb::BlockReference* texto = db().modelSpace()->addBlockReference(*borne, {0, 0, 0});
    zvdb::BlockReference* sem = db().modelSpace()->addBlockReference(*borne, {10, 0, 0});
    zvdb::BlockReference* ponto = db().modelSpace()->addBlockReference(*borne, {20, 0, 0});
    zvdb::BlockReference* vazia = db().modelSpace()->addBlockReference(*grupo, {30, 0, 0});
    zvdb::BlockReference* aninhada = grupo->addBlockReference(*borne, {0, 0, 0});
    const auto id = [this](const zvdb::DbObject* o) { return OdDbObjectId(&db(), o->handle()); };
    CICad::SetXData(id(texto), "KVR_ZV", {{1000, "K1"}});
    CICad::SetXData(id(sem), "KVR_ZV_WIRE", {{1000, "W"}});
    CEItemXData p;
    p.codigo = 1010;
    p.x = 1;
    CICad::SetXData(id(ponto), "kvr_zv", {p, {1000, "depois"}});
    CICad::SetXData(id(vazia), "KVR_ZV", {});
    CICad::SetXData(id(aninhada), "KVR_ZV", {{1000, "dentro"}});
    CICad::SetXData(id(db().modelSpace()->addLine({0, 0, 0}, {1, 1, 0})), "KVR_ZV", {{1000, "L"}});
    CICad::SetXData(id(texto), "OUTRA", {{1000, "a"}, {1000, "b"}});
    const auto refs = CICad::GetReferenciasComXData("KVR_ZV", {"outra", "NENHUMA"}, &db());
    std::vector<OdDbObjectId> ids;
    for (const auto& r : refs)
        ids.push_back(r.id);
    // An application with no items still marks its reference.
    ASSERT_EQ(ids, (std::vector<OdDbObjectId>{id(texto), id(ponto), id(vazia)}));
    EXPECT_EQ(refs[0].bloco, "Borne1");
    EXPECT_EQ(refs[0].codigo, 1000);
    EXPECT_EQ(refs[0].texto, "K1");
    EXPECT_EQ(refs[1].codigo, 1010);
    EXPECT_EQ(refs[2].bloco, "GRUPO");
    EXPECT_EQ(refs[2].codigo, 0);
    EXPECT_TRUE(refs[2].texto.isEmpty());
    // The other applications' items, each group as GetXData reads it.
    ASSERT_EQ(refs[0].outras.size(), 2u);
    ASSERT_EQ(refs[0].outras[0].size(), 2u);
    EXPECT_EQ(refs[0].outras[0][1].texto, "b");
    EXPECT_TRUE(refs[0].outras[1].empty());
    EXPECT_TRUE(refs[1].outras[0].empty());
    // The entity-by-entity reading agrees.
    for (const auto& r : refs) {
        const CEListaXData outra = CICad::GetXData(r.id, "OUTRA");
        ASSERT_EQ(r.outras[0].size(), outra.size());
        for (size_t i = 0; i < outra.size(); ++i)
            EXPECT_EQ(r.outras[0][i].texto, outra[i].texto);
        const CEListaXData dados = CICad::GetXData(r.id, "KVR_ZV");
        EXPECT_EQ(dados.empty() ? 0 : dados.front().codigo, r.codigo);
        EXPECT_EQ(CICad::GetNomeBloco(r.id), r.bloco);
    }
}

// The facade tells an object's kind from the kinds it saw last: asked in turns of many
// kinds, in ever other orders, each answer is still what the object is.
TEST_F(FacadeFixture, EachObjectsKindIsToldRightWhateverWasAskedBefore) {
    const QString caminho = arquivoBloco("BORNE_K", {"REGUA", "NUMERO"});
    const OdDbObjectId ref = CICad::InsereBloco(caminho, "BORNE_K", "ESQ$0001$A", 1, 2, 0, 0);
    ASSERT_FALSE(ref.isNull());
    zvdb::BlockRecord* ms = db().modelSpace();
    const std::vector<std::string> caminhoRegistro = {"ZV_TESTE", "R"};
    std::vector<zvdb::DbObject*> objetos = {db().objectByHandle(ref.handle()),
                                            ms->addLine({0, 0, 0}, {1, 0, 0}, "FIOS"),
                                            ms->addLwPolyline({{0, 0, 0}, {1, 1, 0}}, false),
                                            ms->addText({0, 0, 0}, 1, "texto"),
                                            ms->addPoint({2, 2, 0}),
                                            ms->addCircle({3, 3, 0}, 1, "CIRC"),
                                            db().layer("0"),
                                            db().block("BORNE_K"),
                                            db().namedObjects(),
                                            db().xrecordAt(caminhoRegistro, true)};
    for (const OdDbObjectId& atributo : CICad::GetIdsAtributos(ref))
        objetos.push_back(db().objectByHandle(atributo.handle()));
    ASSERT_EQ(objetos.size(), 12u);
    EXPECT_TRUE(CICad::EhReferencia(ref));
    EXPECT_FALSE(CICad::EhPolilinha(ref));
    EXPECT_EQ(CICad::NomeLayerUtf8(ref), "ESQ$0001$A");
    for (int volta = 0; volta < 4; ++volta) {
        for (std::size_t k = 0; k < objetos.size(); ++k) {
            // Forward, backward and in strides: the kinds come in ever other orders.
            zvdb::DbObject* objeto = objetos[volta == 1   ? objetos.size() - 1 - k
                                             : volta >= 2 ? (k * (2 * volta + 1)) % objetos.size()
                                                          : k];
            ASSERT_NE(objeto, nullptr);
            const OdDbObjectId id(&db(), objeto->handle());
            const auto* entidade = dynamic_cast<zvdb::Entity*>(objeto);
            EXPECT_EQ(CICad::EhReferencia(id),
                      dynamic_cast<zvdb::BlockReference*>(objeto) != nullptr)
                << objeto->type();
            EXPECT_EQ(CICad::EhPolilinha(id), dynamic_cast<zvdb::Polyline*>(objeto) != nullptr)
                << objeto->type();
            EXPECT_EQ(CICad::NomeLayerUtf8(id), entidade ? entidade->layer() : std::string_view())
                << objeto->type();
            EXPECT_EQ(CICad::GetIdsAtributos(id).size(), objeto == objetos[0] ? 2u : 0u)
                << objeto->type();
        }
    }
    // An erased object is no kind at all.
    objetos[2]->erase();
    EXPECT_FALSE(CICad::EhPolilinha(OdDbObjectId(&db(), objetos[2]->handle())));
}

// A symbol's reading gives what the entity's own readers give: its layer and block, and each
// attribute's tag and value, when application groups carry the same codes before them, when
// a tag is missing, and for references just made or read from a file.
TEST_F(FacadeFixture, ASymbolsReadingGivesWhatItsEntitiesSay) {
    const QString caminho = arquivoBloco("BORNE_L", {"REGUA", "NUMERO"});
    std::vector<zvdb::BlockReference*> refs;
    for (int k = 0; k < 3; ++k) {
        const OdDbObjectId id = CICad::InsereBloco(caminho, "BORNE_L", "ESQ$0001$A", k, 2, 0, 0);
        ASSERT_FALSE(id.isNull());
        refs.push_back(dynamic_cast<zvdb::BlockReference*>(db().objectByHandle(id.handle())));
        ASSERT_NE(refs.back(), nullptr);
    }
    // The first with a group that holds a layer, a name, a tag and a value of its own, on the
    // reference and on its first attribute; the second without its layer; the third as made.
    const auto comGrupo = [](zvdb::DbObject& objeto) {
        std::vector<zvdb::Tag> tags(objeto.tags().begin(), objeto.tags().end());
        const zvdb::Tag grupo[] = {
            {102, "{ZV_APP"}, {8, "OUTRO"}, {2, "FALSO"}, {1, "FALSO"}, {102, "}"}};
        tags.insert(tags.begin() + 2, std::begin(grupo), std::end(grupo));
        objeto.replaceTags(tags);
        objeto.setXData("ZV_APP", std::vector<zvdb::Tag>{{1000, "x"}});
    };
    comGrupo(*refs[0]);
    auto* primeiro = dynamic_cast<zvdb::Attribute*>(refs[0]->subEntities().front());
    ASSERT_NE(primeiro, nullptr);
    comGrupo(*primeiro);
    primeiro->setTextValue("X1");
    refs[1]->removeAll(8);
    EXPECT_EQ(refs[1]->layer(), "0");

    const auto confere = [](zvdb::Database& banco, const zvdb::BlockReference& ref) {
        CESimboloLido lido;
        ASSERT_TRUE(CICad::LeituraSimbolo(OdDbObjectId(&banco, ref.handle()), lido));
        EXPECT_TRUE(lido.referencia);
        EXPECT_EQ(lido.layer, ref.layer());
        EXPECT_EQ(lido.bloco, "BORNE_L");
        ASSERT_EQ(lido.atributos.size(), 2u);
        for (std::size_t k = 0; k < 2; ++k) {
            const auto* atributo =
                dynamic_cast<zvdb::Attribute*>(banco.objectByHandle(lido.atributos[k].id.handle()));
            ASSERT_NE(atributo, nullptr);
            EXPECT_EQ(lido.atributos[k].tag, k == 0 ? "REGUA" : "NUMERO");
            EXPECT_EQ(lido.atributos[k].tag, atributo->tag());
            EXPECT_EQ(lido.atributos[k].valor, atributo->textValue());
        }
    };
    for (zvdb::BlockReference* ref : refs)
        confere(db(), *ref);
    CESimboloLido lido;
    ASSERT_TRUE(CICad::LeituraSimbolo(OdDbObjectId(&db(), refs[0]->handle()), lido));
    EXPECT_EQ(lido.layer, "ESQ$0001$A");
    EXPECT_EQ(lido.atributos[0].valor, "X1");
    ASSERT_TRUE(CICad::LeituraSimbolo(OdDbObjectId(&db(), refs[1]->handle()), lido));
    EXPECT_EQ(lido.layer, "0");

    const std::unique_ptr<zvdb::Database> lido2 =
        zvdb::DxfLoader::load(zvdb::DxfWriter::toText(db()));
    for (zvdb::BlockReference* ref : refs) {
        auto* lida = dynamic_cast<zvdb::BlockReference*>(lido2->objectByHandle(ref->handle()));
        ASSERT_NE(lida, nullptr);
        EXPECT_FALSE(lida->isPatterned());
        confere(*lido2, *lida);
    }
}

TEST_F(FacadeFixture, EntitiesWithSeveralApplicationsComeFromOneWalkAsFromOneEach) {
    // References, a line and a nested reference; names that differ in case, one that is the
    // start of another, an empty group, and a name nothing carries.
    zvdb::BlockRecord* borne = db().createBlock("Borne1");
    std::vector<zvdb::Entity*> feitas;
    for (int i = 0; i < 5; ++i)
        feitas.push_back(db().modelSpace()->addBlockReference(*borne, {10.0 * i, 0, 0}));
    feitas.push_back(db().modelSpace()->addLine({0, 0, 0}, {1, 1, 0}));
    zvdb::BlockReference* aninhada = db().createBlock("GRUPO")->addBlockReference(*borne, {});
    const auto id = [this](const zvdb::DbObject* o) { return OdDbObjectId(&db(), o->handle()); };
    CICad::SetXData(id(feitas[0]), "KVR_ZV_WIRE", {{1000, "W"}});
    CICad::SetXData(id(feitas[1]), "kvr_zv", {{1000, "a"}});
    CICad::SetXData(id(feitas[1]), "KVR_ZV_WIRE", {{1000, "b"}});
    CICad::SetXData(id(feitas[2]), "OUTRA", {});
    CICad::SetXData(id(feitas[3]), "KVR_ZV", {{1070, "3"}});
    CICad::SetXData(id(feitas[5]), "KVR_ZV_WIRE", {{1000, "L"}});
    CICad::SetXData(id(aninhada), "KVR_ZV", {{1000, "dentro"}});
    const std::string_view nomes[] = {"KVR_ZV", "KVR_ZV_WIRE", "OUTRA", "NENHUMA"};
    const auto juntas = CICad::GetEntidadesComXData(nomes, &db());
    ASSERT_EQ(juntas.size(), 4u);
    for (size_t k = 0; k < 4; ++k)
        EXPECT_EQ(juntas[k], CICad::GetEntidadesComXData(
                                 QString::fromLatin1(nomes[k].data(), int(nomes[k].size())), &db()))
            << nomes[k];
    EXPECT_EQ(juntas[0], (std::vector<OdDbObjectId>{id(feitas[1]), id(feitas[3])}));
    EXPECT_EQ(juntas[1], (std::vector<OdDbObjectId>{id(feitas[0]), id(feitas[1]), id(feitas[5])}));
    EXPECT_EQ(juntas[2], std::vector<OdDbObjectId>{id(feitas[2])});
    EXPECT_TRUE(juntas[3].empty());
    EXPECT_TRUE(CICad::GetEntidadesComXData(std::span<const std::string_view>(), &db()).empty());
}
