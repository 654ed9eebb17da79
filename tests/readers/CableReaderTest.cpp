// The cable reader on small drawings built by the tests and on a generated project: a lead's
// two ends found by the window around its end points, blind connections, the join of the
// two sides of a core, and what makes no row.
#include "QtPrinters.h"
#include "ZvhostRun.h"
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "drawing/Dictionary.h"
#include "drawing/Polyline.h"
#include "drawing/XRecord.h"
#include "lists/TemplateDouble.h"
#include "module/CIProgress.h"
#include "readers/CCCaboDataReader.h"
#include "readers/ZVString.h"
#include "sample/ProjectGenerator.h"
#include "sample/XDataItems.h"

#include <QDir>
#include <QFile>

namespace {

const std::string kPagina1 = "ESQ$0001$A";
const std::string kPagina2 = "ESQ$0002$A";

// The demo catalogue, built once for the run; each test's settings point at it.
QString PastaCatalogo() {
    static QTemporaryDir pasta;
    static bool feito = false;
    if (!feito) {
        feito = true;
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert("ZV_DATA_DIR", pasta.path());
        const QString problema = zvtest::buildDemoCatalogue(pasta.path(), env);
        EXPECT_TRUE(problema.isEmpty()) << problema.toStdString();
    }
    return pasta.path();
}

class CableReaderTest : public FacadeFixture {
protected:
    void SetUp() override {
        const QString origem = PastaCatalogo() + "/FV";
        ASSERT_TRUE(QDir().mkpath(arquivo("FV")));
        for (const QString& nome : QDir(origem).entryList(QDir::Files))
            QFile::copy(origem + "/" + nome, arquivo("FV/" + nome));
        FacadeFixture::SetUp();
        if (std::unique_ptr<zvdb::Database> projeto = Projeto())
            documento_ = app_->openDocument(arquivo("gerado.dxf"), std::move(projeto));
        if (!documento_->database()->layer(kPagina1)) {
            db().createLayer(kPagina1);
            db().createLayer(kPagina2)->setFrozen(true);
            CICad::SetLayerCorrente(QString::fromStdString(kPagina1));
        }
    }
    // The drawing of the test's document; null for an empty one.
    virtual std::unique_ptr<zvdb::Database> Projeto() { return nullptr; }

    OdDbObjectId id(const zvdb::DbObject* objeto) { return OdDbObjectId(&db(), objeto->handle()); }
    std::string handle(const zvdb::DbObject* objeto) {
        return ZVString::DeHandle(objeto->handle()).toStdString();
    }

    // A cable record of the dictionary, listed by the catalogue (key 20003).
    zvdb::XRecord* cabo(const std::string& nome) {
        const std::string caminho[] = {"ZV_CABOS"};
        zvdb::XRecord* registro = db().dictionaryAt(caminho, true)->getOrCreateXRecord(nome);
        registro->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20003\f1").tags());
        registro->setXData("KVR_ZV_ATT_VIRTUAL",
                           zvsample::XDataItems().text("CABO\f" + nome + "\fN").tags());
        return registro;
    }

    // A lead of core `via` (its key names the core) from `de` to `para`.
    zvdb::Polyline* condutor(const zvdb::XRecord* registro, int via, zvdb::Point3 de,
                             zvdb::Point3 para, const std::string& layer = kPagina1) {
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline({de, para}, false, layer);
        const std::string h = registro ? handle(registro) : "FFFFF";
        linha->setXData("KVR_ZV_CABO", zvsample::XDataItems()
                                           .text(std::to_string(20100 + via) + "\f1")
                                           .text(h)
                                           .text(h)
                                           .tags());
        return linha;
    }

    zvdb::Polyline* cega(const std::string& parceiro, zvdb::Point3 de, zvdb::Point3 para,
                         const std::string& layer = kPagina2) {
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline({de, para}, false, layer);
        linha->setXData("KVR_ZV_CONEX_BLIND",
                        zvsample::XDataItems().text("W1").text(parceiro).tags());
        return linha;
    }

    zvdb::BlockRecord& bloco(const std::string& nome) {
        if (zvdb::BlockRecord* achado = db().block(nome)) return *achado;
        zvdb::BlockRecord* feito = db().createBlock(nome);
        feito->addLine({-1, -1, 0}, {1, 1, 0});
        return *feito;
    }

    // A project symbol at `em` with its attributes; the connection attributes stand where
    // their offsets say.
    zvdb::BlockReference* simbolo(
        const std::string& nome, zvdb::Point3 em,
        std::vector<std::tuple<std::string, std::string, zvdb::Point3>> atributos,
        const std::string& layer = kPagina1) {
        auto* ref = db().modelSpace()->addBlockReference(bloco(nome), em, {1, 1, 1}, 0, layer);
        ref->setXData("KVR_ZV", zvsample::XDataItems().text("1001\f1").tags());
        for (const auto& [tag, valor, desvio] : atributos)
            ref->addAttribute(tag, valor, em + desvio, 1.0);
        return ref;
    }
    zvdb::BlockReference* borne(const std::string& regua, const std::string& numero,
                                zvdb::Point3 em, const std::string& layer = kPagina1) {
        return simbolo("BORNE_T", em, {{"REGUA", regua, {}}, {"NUMERO", numero, {}}}, layer);
    }

    // Reads with the plain list of the pipeline; the items are the test's.
    VetorItens ler() {
        CCCaboDataReader leitor;
        TemplateDouble modelo;
        CIProgress progresso;
        std::unique_ptr<VetorItens> itens(leitor.LerDados(&db(), std::nullopt, modelo, progresso));
        VetorItens copia = *itens;
        for (CEItemLista* item : copia)
            donos_.emplace_back(item);
        return copia;
    }
    static QStringList valores(const VetorItens& itens, const QString& campo) {
        QStringList texto;
        for (const CEItemLista* item : itens)
            texto << item->valorCampo(campo);
        return texto;
    }

    std::vector<std::unique_ptr<CEItemLista>> donos_;
};

// ---- the ends of a lead

TEST_F(CableReaderTest, EachLeadIsOneRowWithTheComponentsAtItsEndsAndTheCoresName) {
    const zvdb::XRecord* w1 = cabo("W1");
    borne("X1", "1", {0, 0, 0});
    borne("X1", "2", {10, 0, 0});
    simbolo(
        "CONTATOR", {0, 50, 0},
        {{"RELACAO", "-K1", {}}, {"LIGACAO1", "A1", {0, 0.2, 0}}, {"LIGACAO2", "A2", {9, 0, 0}}});
    condutor(w1, 1, {0, 0, 0}, {0, 50, 0});
    condutor(w1, 2, {10, 0, 0}, {10, 50, 0});  // ends where nothing stands

    VetorItens itens = ler();
    ASSERT_EQ(itens.size(), 2u);
    EXPECT_EQ(valores(itens, "ZV_LISTA_TIPO"), QStringList({"CABO", "CABO"}));
    EXPECT_EQ(valores(itens, "CABO"), QStringList({"W1", "W1"}));
    EXPECT_EQ(valores(itens, "NOME"), QStringList({"1", "2"}));  // the catalogue's core names
    EXPECT_EQ(valores(itens, "NAME"), QStringList({"1", "2"}));
    EXPECT_EQ(valores(itens, "LAYER"),
              QStringList({QString::fromStdString(kPagina1), QString::fromStdString(kPagina1)}));
    EXPECT_EQ(valores(itens, "NUMERO_INI"), QStringList({"1", "2"}));
    EXPECT_EQ(valores(itens, "REGUA_INI"), QStringList({"X1", "X1"}));
    EXPECT_EQ(valores(itens, "RELACAO_FIM"), QStringList({"-K1", ""}));
    // The connection attribute nearest the end point, under its own tag.
    EXPECT_EQ(itens[0]->valorCampo("LIG_FIM"), "A1");
    EXPECT_EQ(itens[0]->valorCampo("LIGACAO2_FIM"), "A2");
    EXPECT_FALSE(itens[1]->temCampo("LIG_FIM"));
    EXPECT_FALSE(itens[0]->valorCampo("HANDLE_INI").isEmpty());
}

TEST_F(CableReaderTest, TheWindowIsPointThreeWideAndSkipsListBlocksAndHiddenPages) {
    const zvdb::XRecord* w1 = cabo("W1");
    // Box of the terminal reaches 1 beyond its point: 1.29 away is inside the window's
    // reach, 1.31 is not.
    borne("X1", "1", {0, 0, 0});
    borne("X1", "2", {20, 0, 0});
    condutor(w1, 1, {1.29, 0, 0}, {40, 0, 0});
    condutor(w1, 2, {21.31, 0, 0}, {60, 0, 0});
    simbolo("BLK_CTR_LST_DET1", {40, 0, 0}, {{"RELACAO", "-LIST", {}}});
    borne("X9", "9", {60, 0, 0}, kPagina2);  // frozen page: not shown, not selected

    VetorItens itens = ler();
    ASSERT_EQ(itens.size(), 2u);
    EXPECT_EQ(itens[0]->valorCampo("NUMERO_INI"), "1");
    EXPECT_FALSE(itens[1]->temCampo("NUMERO_INI"));
    for (const CEItemLista* item : itens) {
        EXPECT_FALSE(item->temCampo("RELACAO_FIM"));
        EXPECT_FALSE(item->temCampo("REGUA_FIM"));
    }
}

TEST_F(CableReaderTest, ALeadOfAnUnknownCableOrABlindConnectionWithoutItsLeadMakesNoRow) {
    const zvdb::XRecord* w1 = cabo("W1");
    zvdb::XRecord* semLista = cabo("W2");
    semLista->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("99999\f1").tags());
    const std::string caminho[] = {"ZV_CABOS"};
    zvdb::XRecord* semChave = db().dictionaryAt(caminho, true)->getOrCreateXRecord("W3");
    semChave->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW3\fN").tags());
    borne("X1", "1", {0, 0, 0});
    condutor(semChave, 2, {0, 0, 0}, {0, 30, 0});  // its cable record has no key
    condutor(nullptr, 1, {0, 0, 0}, {0, 30, 0});   // its cable record does not exist
    condutor(semLista, 1, {0, 0, 0}, {0, 30, 0});  // its cable is not listed
    cega("", {5, 0, 0}, {5, 30, 0}, kPagina1);     // no partner
    zvdb::Polyline* apagado = condutor(w1, 3, {9, 0, 0}, {9, 30, 0});
    cega(handle(apagado), {7, 0, 0}, {7, 30, 0}, kPagina1);
    apagado->erase();
    cega("ABCDEF", {8, 0, 0}, {8, 30, 0}, kPagina1);  // names nothing

    EXPECT_TRUE(ler().empty());
}

// ---- blind connections and the join of the sides

TEST_F(CableReaderTest, ALeadThatLeavesItsPageIsJoinedWithItsBlindConnection) {
    const zvdb::XRecord* w1 = cabo("W1");
    borne("X1", "7", {0, 0, 0});
    const zvdb::Polyline* lead = condutor(w1, 4, {0, 0, 0}, {0, 40, 0});
    simbolo("PINO", {30, 60, 0}, {{"RELACAO", "-XS3", {}}, {"LIGACAO1", "4", {}}}, kPagina2);
    cega(handle(lead), {30, 45, 0}, {30, 60, 0});
    const QString atual = CICad::GetLayerCorrente();

    VetorItens itens = ler();
    ASSERT_EQ(itens.size(), 2u);
    // The window looked at the blind connection's page: it is the current one now.
    EXPECT_NE(CICad::GetLayerCorrente(), atual);
    EXPECT_EQ(CICad::GetLayerCorrente(), QString::fromStdString(kPagina2));
    // Both rows are of core 4 of W1; the blind one found its pin as a start side.
    EXPECT_EQ(valores(itens, "NOME"), QStringList({"4", "4"}));
    EXPECT_EQ(itens[1]->valorCampo("RELACAO_INI"), "-XS3");
    EXPECT_EQ(itens[1]->ids.size(), 1u);

    VetorItens removidos;
    CCCaboDataReader::FundeLados(itens, removidos);
    ASSERT_EQ(itens.size(), 1u);
    ASSERT_EQ(removidos.size(), 1u);
    const CEItemLista& linha = *itens[0];
    const bool leadFicou = linha.valorCampo("REGUA_INI") == "X1";
    // Whichever stayed, the row has the terminal on one side and the pin on the other.
    EXPECT_EQ(leadFicou ? linha.valorCampo("RELACAO_FIM") : linha.valorCampo("REGUA_FIM"),
              leadFicou ? "-XS3" : "X1");
    EXPECT_FALSE(linha.valorCampo("HANDLE_INI").isEmpty());
    EXPECT_FALSE(linha.valorCampo("HANDLE_FIM").isEmpty());
}

TEST_F(CableReaderTest, ASecondBlindConnectionOfOneLeadEndsTheFirstOnesItem) {
    const zvdb::XRecord* w1 = cabo("W1");
    const zvdb::Polyline* lead = condutor(w1, 2, {0, 0, 0}, {0, 40, 0});
    simbolo("PINO", {30, 60, 0}, {{"RELACAO", "-XS1", {}}}, kPagina2);
    simbolo("PINO", {50, 60, 0}, {{"RELACAO", "-XS2", {}}}, kPagina2);
    const zvdb::Polyline* primeira = cega(handle(lead), {30, 45, 0}, {30, 60, 0});
    const zvdb::Polyline* segunda = cega(handle(lead), {50, 45, 0}, {50, 60, 0});

    VetorItens itens = ler();
    ASSERT_EQ(itens.size(), 2u);  // the lead and the first blind connection
    const CEItemLista& cegas = *itens[1];
    EXPECT_EQ(cegas.ids, std::vector<OdDbObjectId>({id(primeira), id(segunda)}));
    EXPECT_EQ(cegas.valorCampo("RELACAO_INI"), "-XS1");
    EXPECT_EQ(cegas.valorCampo("RELACAO_FIM"), "-XS2");
}

TEST(CableJoinTest, SidesMoveByTheirSuffixesAndThreeLeadsOfOneNameJoinIntoTheFirst) {
    std::vector<std::unique_ptr<CEItemLista>> donos;
    const auto novo = [&](std::initializer_list<std::pair<const char*, const char*>> campos) {
        donos.push_back(std::make_unique<CEItemLista>());
        for (const auto& [k, v] : campos)
            donos.back()->definirCampo(k, v);
        return donos.back().get();
    };
    // Start sides only: the second one's start becomes the first one's end; a third of the
    // same name then has its start written over that end: the last one wins.
    CEItemLista* a =
        novo({{"CABO", "W1"}, {"NOME", "1"}, {"HANDLE_INI", "A"}, {"REGUA_INI", "X1"}});
    CEItemLista* b =
        novo({{"CABO", "W1"}, {"NOME", "1"}, {"HANDLE_INI", "B"}, {"REGUA_INI", "X2"}});
    CEItemLista* c =
        novo({{"CABLE", "W1"}, {"NOME", "1"}, {"HANDLE_INI", "C"}, {"REGUA_INI", "X3"}});
    // An end side only goes to the start of an item that has none; other names stay apart.
    CEItemLista* d =
        novo({{"CABO", "W2"}, {"NOME", "1"}, {"HANDLE_FIM", "D"}, {"REGUA_FIM", "Y1"}});
    CEItemLista* e =
        novo({{"CABO", "W2"}, {"NOME", "1"}, {"HANDLE_FIM", "E"}, {"REGUA_FIM", "Y2"}});
    CEItemLista* f = novo({{"CABO", "W2"}, {"NOME", "2"}, {"HANDLE_INI", "F"}});
    VetorItens itens{f, e, c, b, a, d}, removidos;
    CCCaboDataReader::FundeLados(itens, removidos);

    ASSERT_EQ(itens.size(), 3u);
    EXPECT_EQ(removidos.size(), 3u);
    const CEItemLista* w1 = itens[0];
    EXPECT_EQ(CCCaboDataReader::NomeDoCabo(*w1), "W1");
    EXPECT_EQ(w1->valorCampo("HANDLE_FIM").size(), 1);
    EXPECT_NE(w1->valorCampo("HANDLE_FIM"), w1->valorCampo("HANDLE_INI"));
    // Three in a row: the one that stays got the start of both others, the last one's last.
    EXPECT_EQ(w1->valorCampo("REGUA_FIM"), removidos[1]->valorCampo("REGUA_INI"));
    const CEItemLista* w2 = itens[1];
    EXPECT_EQ(w2->valorCampo("NOME"), "1");
    EXPECT_TRUE(w2->temCampo("REGUA_INI"));
    EXPECT_TRUE(w2->temCampo("REGUA_FIM"));
    EXPECT_EQ(itens[2], f);
}

// ---- a generated project

class GeneratedCablesTest : public CableReaderTest {
protected:
    std::unique_ptr<zvdb::Database> Projeto() override {
        zvsample::GeneratorOptions opcoes;  // the demo's project
        zvsample::ProjectGenerator gerador(opcoes);
        std::unique_ptr<zvdb::Database> projeto = gerador.generate();
        contagem_ = gerador.counts();
        return projeto;
    }
    zvsample::GeneratedCounts contagem_;
};

TEST_F(GeneratedCablesTest, EveryCoreComesOutOnceWithBothEndsOnItsOwnPage) {
    ASSERT_GT(contagem_.blindConnections, 0);
    // As a list command starts: one page shown, the others frozen.
    ASSERT_EQ(CICad::MostraPagina("COMANDO$0003$A", false), 0);
    VetorItens itens = ler();
    // Pages lie on top of each other: a window sees the components of the lead's page only.
    for (const CEItemLista* item : itens)
        for (const char* lado : {"LAYER_INI", "LAYER_FIM"})
            if (item->temCampo(lado)) {
                EXPECT_EQ(item->valorCampo(lado), item->valorCampo("LAYER")) << lado;
            }
    EXPECT_EQ(int(itens.size()), contagem_.leads + contagem_.blindConnections);
    VetorItens removidos;
    CCCaboDataReader::FundeLados(itens, removidos);
    EXPECT_EQ(int(itens.size()), contagem_.leads);
    QSet<QString> cabos, cores;
    for (const CEItemLista* item : itens) {
        const QString core = item->valorCampo("CABO") + "/" + item->valorCampo("NOME");
        EXPECT_FALSE(cores.contains(core)) << core.toStdString();
        cores.insert(core);
        cabos.insert(item->valorCampo("CABO"));
        EXPECT_FALSE(item->valorCampo("HANDLE_INI").isEmpty()) << core.toStdString();
        EXPECT_FALSE(item->valorCampo("HANDLE_FIM").isEmpty()) << core.toStdString();
    }
    EXPECT_EQ(cabos.size(), contagem_.cables);
}

}  // namespace
