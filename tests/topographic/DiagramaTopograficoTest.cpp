// The diagram drawn into a document of an in-process host with the module loaded: a small
// schematic made by the test, the demo catalogue, representation blocks written by the test;
// the saved drawing is read back and audited with ezdxf.
#include "QtPrinters.h"
#include "ZvhostRun.h"
#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/HostDocument.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/Dictionary.h"
#include "drawing/DxfWriter.h"
#include "drawing/PythonChecker.h"
#include "drawing/XRecord.h"
#include "sample/XDataItems.h"
#include "sdk/LispInterface.h"

#include <gtest/gtest.h>

#include <QDir>
#include <QFile>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QTemporaryDir>

namespace {

using zvsample::XDataItems;

struct Insercao {
    QString handle, nome, layer;
    double x = 0, y = 0;
    QJsonObject atributos;
    QStringList rep;
    QStringList ace;  // an accessory's block: representation, symbol, place, key
};

class DiagramaTopograficoTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        pasta_ = new QTemporaryDir;
        ASSERT_TRUE(pasta_->isValid());
        QProcessEnvironment env = QProcessEnvironment::systemEnvironment();
        env.insert("ZV_DATA_DIR", pasta_->path());
        const QString problema = zvtest::buildDemoCatalogue(pasta_->path(), env);
        ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
        // Front views (representation 1, standard 1) of the keys the schematic uses.
        Vista("TOPO_CT09_10_24DC", 20, 40, {{"RELACAO", "?"}, {"ZV_KEY", ""}});  // 2001
        Vista("TOPO_PS24_5", 30, 50, {{"RELACAO", "?"}});                        // 7001
        Vista("TOPO_BX2_5_GY", 6, 45, {{"PASSO", "6"}, {"NUMERO", ""}});         // 1001
        Vista("TOPO_TS4_OG", 8, 45, {{"NUMERO", ""}});                           // 1007
        Vista("TOPO_CR4060", 40, 10, {});                                        // 8503, not listed
        // 3001: a file with two layers, which the drawing refuses.
        zvdb::Database duas;
        duas.createLayer("OUTRA");
        duas.modelSpace()->addLine({0, 0, 0}, {10, 10, 0}, "OUTRA");
        Salva(duas, "TOPO_DM4");
        // 3007 (TOPO_RT13) has no file.
    }
    static void TearDownTestSuite() {
        delete pasta_;
        pasta_ = nullptr;
    }
    static void Vista(const QString& nome, double largura, double altura,
                      const std::vector<std::pair<QString, QString>>& atributos) {
        zvdb::Database bloco;
        bloco.modelSpace()->addLwPolyline({{0, 0}, {largura, 0}, {largura, altura}, {0, altura}},
                                          true);
        double y = altura;
        for (const auto& [tag, valor] : atributos)
            bloco.modelSpace()->addAttributeDefinition(tag.toStdString(), tag.toStdString(),
                                                       valor.toStdString(), {1, y -= 3, 0}, 1.0);
        Salva(bloco, nome);
    }
    static void Salva(zvdb::Database& bloco, const QString& nome) {
        const QString caminho = pasta_->filePath("DADOS/1/BLOCOS/" + nome + ".dxf");
        QDir().mkpath(QFileInfo(caminho).path());
        zvdb::DxfWriter::saveFile(bloco, caminho.toStdString());
    }

    void SetUp() override {
        qputenv("ZV_DATA_DIR", pasta_->path().toUtf8());
        ASSERT_TRUE(trabalho_.isValid());
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        ui_ = ui.get();
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(ZV_BIN_DIR);
        documento_ = app_->openDocument(trabalho_.filePath("projeto.dxf"));
        QString erro;
        ASSERT_TRUE(app_->loadModule(QString(ZV_BIN_DIR) + "/libzvlistas.so", &erro))
            << erro.toStdString();
        db().createLayer("ESQ$0001$A");
        Esquema();
        Modelo({});
        lisp("(setq *DIRETORIO_REDE* \"" + pasta_->path() + "/\")");
        lisp("(setq *DIR_ZVCFG_TEMPL* \"" + trabalho_.path() + "/\")");
        ui_->setAnswer("template", modelo());
    }
    void TearDown() override { app_.reset(); }

    zvdb::Database& db() { return *documento_->database(); }
    void lisp(const QString& texto) { ASSERT_TRUE(documento_->lisp()->lispEvaluate(texto)); }
    QString modelo() const { return trabalho_.filePath("topo.dtp"); }

    // The template with the test's values, a symbol replaced by name.
    void Modelo(const std::map<QString, QString>& trocas) {
        std::map<QString, QString> simbolos = {
            {"PBLREPTOPOGRAFICO", "\"1\""},
            {"PBLTOPO_GRUPO", "\"TOPO\""},
            {"PBLTOPO_PTLIM1", "\"0,0\""},
            {"PBLTOPO_PTLIM2", "\"100,100\""},
            {"PBLTOPO_ORDENACAO", "'(\"REGUA\" \"NUMERO\" \"RELACAO\")"},
            {"PBLTOPO_MARGEM", "2.0"},
            {"PBLTOPO_BORNE", "T"},
            {"PBLTOPO_BORNEDIST", "\"PASSO\""}};
        for (const auto& [nome, valor] : trocas)
            simbolos[nome] = valor;
        QFile f(modelo());
        ASSERT_TRUE(f.open(QIODevice::WriteOnly));
        for (const auto& [nome, valor] : simbolos)
            f.write(("(setq " + nome + " " + (valor.isEmpty() ? "nil" : valor) + ")\n").toUtf8());
    }

    zvdb::BlockRecord& Bloco(const std::string& nome) {
        if (zvdb::BlockRecord* b = db().block(nome)) return *b;
        zvdb::BlockRecord* b = db().createBlock(nome);
        b->addLwPolyline({{-2, -2}, {2, -2}, {2, 2}, {-2, 2}}, true);
        return *b;
    }
    zvdb::BlockReference* Simbolo(const std::string& bloco, const std::string& chave,
                                  const std::vector<std::pair<std::string, std::string>>& atts,
                                  zvdb::BlockRecord* dono = nullptr) {
        zvdb::BlockRecord& espaco = dono ? *dono : *db().modelSpace();
        zvdb::BlockReference* ref =
            espaco.addBlockReference(Bloco(bloco), {x_ += 20, 100, 0}, {1, 1, 1}, 0, "ESQ$0001$A");
        for (const auto& [tag, valor] : atts)
            ref->addAttribute(tag, valor, {x_, 96, 0}, 2.0);
        if (!chave.empty()) ref->setXData("KVR_ZV", XDataItems().text(chave).tags());
        return ref;
    }
    void Esquema() {
        db().registerApplication("KVR_ZV");
        db().registerApplication("KVR_ZV_ATT_VIRTUAL");
        k1_ = Simbolo("BOBINA_CONTATOR", "2001\f1", {{"RELACAO", "-K1"}});
        k2_ = Simbolo("BOBINA_CONTATOR", "2001\f1", {{"RELACAO", "-K2"}});
        x11_ = Simbolo("BORNE_PASSAGEM", "1001\f1", {{"REGUA", "X1"}, {"NUMERO", "1"}});
        x12_ = Simbolo("BORNE_PASSAGEM", "1001\f1", {{"REGUA", "X1"}, {"NUMERO", "2"}});
        x21_ = Simbolo("BORNE_SECCIONAVEL", "1007\f1", {{"REGUA", "X2"}, {"NUMERO", "1"}});
        q1_ = Simbolo("DISJUNTOR_MOTOR", "3001\f1", {{"RELACAO", "-Q1"}});  // refused file
        Simbolo("RELE_TERMICO", "3007\f1", {{"RELACAO", "-F1"}});           // no file
        Simbolo("CANALETA", "8503\f1", {{"RELACAO", "-W1"}});               // not listed
        Simbolo("MOTOR_TRIFASICO", "7401\f1", {{"RELACAO", "-M1"}});        // no front view
        Simbolo("PIN-CONECTOR", "9003\f1", {{"RELACAO", "-XS1"}});          // a pin
        Simbolo("NOTA", "", {{"RELACAO", "-N1"}});                          // no key
        // A contactor drawn inside another block is not in model space.
        Simbolo("BOBINA_CONTATOR", "2001\f1", {{"RELACAO", "-K9"}}, db().createBlock("MACRO"));
        // A virtual power supply.
        const std::string caminho[] = {"ESQ_VIRTUAL_ZV"};
        zvdb::XRecord* g1 = db().dictionaryAt(caminho, true)->getOrCreateXRecord("COMP_-G1");
        g1->setData(XDataItems().add(1, "-G1").tags());
        g1->setXData("KVR_ZV", XDataItems().text("7001\f1").tags());
        g1->setXData("KVR_ZV_ATT_VIRTUAL", XDataItems().text("RELACAO\f-G1\fN").tags());
        g1_ = g1->handle();
    }
    zvdb::BlockReference* NovoSimbolo(const std::string& relacao) {
        return Simbolo("BOBINA_CONTATOR", "2001\f1", {{"RELACAO", relacao}});
    }

    zvsdk::CommandResult Executa() {
        zvsdk::CommandResult resultado{};
        documento_->execute("diagramaTopografico", &resultado);
        return resultado;
    }
    QString Saida() {
        out_.flush();
        return saida_;
    }

    // Saves, audits and reads back the block references of model space.
    std::vector<Insercao> Salvo() {
        const QString arquivo = trabalho_.filePath("saida.dxf");
        zvdb::DxfWriter::saveFile(db(), arquivo.toStdString());
        std::vector<Insercao> insercoes;
        const QString falta = zvtest::PythonChecker::missing();
        if (!falta.isEmpty()) {
            ADD_FAILURE() << falta.toStdString();
            return insercoes;
        }
        QString saida;
        const int estado = zvtest::PythonChecker::run("topografico_dxf.py", {arquivo}, &saida);
        EXPECT_EQ(estado, 0) << saida.toStdString();
        const QJsonObject raiz = QJsonDocument::fromJson(saida.toUtf8()).object();
        esq_.clear();
        aceEsq_.clear();
        const QJsonObject cadeias = raiz["esq"].toObject();
        for (auto it = cadeias.begin(); it != cadeias.end(); ++it)
            for (const QJsonValue& e : it.value().toArray())
                esq_[it.key()] << e.toString();
        const QJsonObject cadeiasAce = raiz["ace_esq"].toObject();
        for (auto it = cadeiasAce.begin(); it != cadeiasAce.end(); ++it)
            for (const QJsonValue& e : it.value().toArray())
                aceEsq_[it.key()] << e.toString();
        for (const QJsonValue& v : raiz["inserts"].toArray()) {
            const QJsonObject o = v.toObject();
            Insercao i{o["handle"].toString(),
                       o["name"].toString(),
                       o["layer"].toString(),
                       o["x"].toDouble(),
                       o["y"].toDouble(),
                       o["attribs"].toObject(),
                       {},
                       {}};
            for (const QJsonValue& r : o["rep"].toArray())
                i.rep << r.toString();
            for (const QJsonValue& r : o["ace"].toArray())
                i.ace << r.toString();
            insercoes.push_back(i);
        }
        return insercoes;
    }
    // The diagram's blocks, by the handle of the symbol each shows.
    static std::map<QString, Insercao> PorSimbolo(const std::vector<Insercao>& todas) {
        std::map<QString, Insercao> blocos;
        for (const Insercao& i : todas)
            if (i.rep.size() == 2 && i.rep[0] == "1") {
                EXPECT_EQ(blocos.count(i.rep[1]), 0u)
                    << "two blocks for " << i.rep[1].toStdString();
                blocos[i.rep[1]] = i;
            }
        return blocos;
    }
    static QString H(const zvdb::DbObject* objeto) {
        return QString::fromStdString(zvsample::handleText(objeto->handle()));
    }
    static QTemporaryDir* pasta_;
    QTemporaryDir trabalho_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::ConsoleUserInterface* ui_ = nullptr;
    zvhost::HostDocument* documento_ = nullptr;
    double x_ = 0;
    zvdb::BlockReference *k1_ = nullptr, *k2_ = nullptr, *x11_ = nullptr, *x12_ = nullptr,
                         *x21_ = nullptr, *q1_ = nullptr;
    std::uint64_t g1_ = 0;
    std::map<QString, QStringList> esq_;     // the representation chains by handle
    std::map<QString, QStringList> aceEsq_;  // the accessories' chains by handle
};

QTemporaryDir* DiagramaTopograficoTest::pasta_ = nullptr;

TEST_F(DiagramaTopograficoTest, ListedSymbolsWithAFrontViewFileAreDrawnEachOnce) {
    // A pin is told by its block's name in any case; a terminal's key doesn't make it one.
    Simbolo("pin-borne", "1001\f1", {{"REGUA", "X9"}, {"NUMERO", "1"}});
    Simbolo("Pin-Borne", "1001\f1", {{"REGUA", "X9"}, {"NUMERO", "2"}});
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto todas = Salvo();
    const auto blocos = PorSimbolo(todas);
    const QString g1 = QString::fromStdString(zvsample::handleText(g1_));
    // The contactors, the virtual supply and the three terminals; nothing else.
    std::set<QString> esperados = {H(k1_), H(k2_), g1, H(x11_), H(x12_), H(x21_)};
    std::set<QString> desenhados;
    for (const auto& [simbolo, bloco] : blocos)
        desenhados.insert(simbolo);
    EXPECT_EQ(desenhados, esperados);
    EXPECT_EQ(blocos.at(H(k1_)).nome, "TOPO_CT09_10_24DC_1");
    EXPECT_EQ(blocos.at(g1).nome, "TOPO_PS24_5_1");
    EXPECT_EQ(blocos.at(H(x21_)).nome, "TOPO_TS4_OG_1");
    // Each missing file is named once; the refused one by the drawing's own check.
    const QString saida = Saida();
    EXPECT_EQ(saida.count("TOPO_RT13.dwg"), 1) << saida.toStdString();
    EXPECT_TRUE(saida.contains("Block file not found; the symbols that use it are left out"));
    EXPECT_TRUE(saida.contains("TOPO_DM4")) << saida.toStdString();
    EXPECT_FALSE(saida.contains("TOPO_M12F4"));  // the pin's view is never looked for
    EXPECT_TRUE(saida.contains("Topographic diagram drawn. Blocks inserted / pages made: 6 / 2"))
        << saida.toStdString();
}

TEST_F(DiagramaTopograficoTest, RowsOfBlocksAndOfTerminalsStandWhereTheLayoutSays) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto blocos = PorSimbolo(Salvo());
    const QString g1 = QString::fromStdString(zvsample::handleText(g1_));
    // Sorted by RELACAO: -G1 (30 wide), -K1, -K2 (20): 100 - 70 = 30 in two gaps of 15;
    // the row is 50 high under the top at 100, the contactors centred in it.
    EXPECT_EQ(blocos.at(g1).x, 0.0);
    EXPECT_EQ(blocos.at(g1).y, 50.0);
    EXPECT_EQ(blocos.at(H(k1_)).x, 45.0);
    EXPECT_EQ(blocos.at(H(k1_)).y, 55.0);
    EXPECT_EQ(blocos.at(H(k2_)).x, 80.0);
    // Terminals on a page of their own: steps 6, 6 (the view's PASSO) and 15 (no PASSO),
    // one step to the left of the side, one step of gap at the new strip.
    EXPECT_EQ(blocos.at(H(x11_)).x, -6.0);
    EXPECT_EQ(blocos.at(H(x12_)).x, 0.0);
    EXPECT_EQ(blocos.at(H(x21_)).x, 12.0);
    EXPECT_EQ(blocos.at(H(x21_)).y, 55.0);
    const QString pagina = blocos.at(H(k1_)).layer, paginaBornes = blocos.at(H(x11_)).layer;
    EXPECT_TRUE(pagina.startsWith("TOPO$")) << pagina.toStdString();
    EXPECT_TRUE(paginaBornes.startsWith("TOPO$")) << paginaBornes.toStdString();
    EXPECT_NE(pagina, paginaBornes);
    EXPECT_EQ(blocos.at(g1).layer, pagina);
    EXPECT_EQ(blocos.at(H(x21_)).layer, paginaBornes);
}

TEST_F(DiagramaTopograficoTest, ASortFieldThatNoBlockShowsStillOrdersTheRow) {
    // Items keep only the fields the run reads: the sort's, though no view has that tag.
    k1_->addAttribute("ORDEM", "2", {0, 0, 0}, 2.0);
    k2_->addAttribute("ORDEM", "1", {0, 0, 0}, 2.0);
    Modelo({{"PBLTOPO_ORDENACAO", "'(\"ORDEM\")"}});
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto blocos = PorSimbolo(Salvo());
    const QString g1 = QString::fromStdString(zvsample::handleText(g1_));
    // -G1 has no ORDEM and comes first, then -K2 and -K1, justified as above.
    EXPECT_EQ(blocos.at(g1).x, 0.0);
    EXPECT_EQ(blocos.at(H(k2_)).x, 45.0);
    EXPECT_EQ(blocos.at(H(k1_)).x, 80.0);
    EXPECT_EQ(blocos.at(H(k1_)).atributos["RELACAO"].toString(), "-K1");
    EXPECT_FALSE(blocos.at(H(k1_)).atributos.contains("ORDEM"));
}

TEST_F(DiagramaTopograficoTest, AttributesTakeTheSymbolsFieldsAndBothEndsKnowEachOther) {
    // A pair of another representation on the symbol stays beside the new one.
    db().registerApplication("KVR_ZV_REPRESENTACAO_ESQ");
    k2_->setXData("KVR_ZV_REPRESENTACAO_ESQ", XDataItems().text("7").handle(x11_->handle()).tags());
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto todas = Salvo();
    const auto blocos = PorSimbolo(todas);
    const Insercao& k1 = blocos.at(H(k1_));
    EXPECT_EQ(k1.atributos["RELACAO"].toString(), "-K1");
    EXPECT_EQ(k1.atributos["ZV_KEY"].toString(), "2001");
    EXPECT_EQ(k1.rep, QStringList({"1", H(k1_)}));
    const Insercao& x12 = blocos.at(H(x12_));
    EXPECT_EQ(x12.atributos["NUMERO"].toString(), "2");
    EXPECT_EQ(x12.atributos["PASSO"].toString(), "6");
    // A terminal that opens a strip stands twice in its row and goes in once, filled.
    EXPECT_EQ(blocos.at(H(x21_)).atributos["NUMERO"].toString(), "1");
    // The symbols name their blocks, the virtual one too.
    EXPECT_EQ(esq_[H(k1_)], QStringList({"1", k1.handle}));
    EXPECT_EQ(esq_[H(k2_)], QStringList({"7", H(x11_), "1", blocos.at(H(k2_)).handle}));
    EXPECT_EQ(esq_[H(x21_)], QStringList({"1", blocos.at(H(x21_)).handle}));
    const QString g1 = QString::fromStdString(zvsample::handleText(g1_));
    EXPECT_EQ(esq_[g1], QStringList({"1", blocos.at(g1).handle}));
    EXPECT_EQ(esq_.size(), 6u);
}

TEST_F(DiagramaTopograficoTest, ARunOnItsOwnOutputAddsOnlyWhatIsNew) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    const size_t primeira = PorSimbolo(Salvo()).size();
    const size_t layers = db().layers().size();
    // Keeping the group: nothing new, no page.
    ui_->setAnswer("question:89", "no");
    EXPECT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    EXPECT_TRUE(Saida().contains("Every symbol is on the diagram already; no page was made."));
    EXPECT_EQ(PorSimbolo(Salvo()).size(), primeira);
    EXPECT_EQ(db().layers().size(), layers);
    // A new contactor: only it, on a new page of the same group.
    zvdb::BlockReference* k3 = NovoSimbolo("-K3");
    EXPECT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    const auto blocos = PorSimbolo(Salvo());
    EXPECT_EQ(blocos.size(), primeira + 1);
    ASSERT_EQ(blocos.count(H(k3)), 1u);
    EXPECT_EQ(blocos.at(H(k3)).x, 0.0);  // a row of one block
    EXPECT_NE(blocos.at(H(k3)).layer, blocos.at(H(k1_)).layer);
    EXPECT_TRUE(blocos.at(H(k3)).layer.startsWith("TOPO$"));
}

TEST_F(DiagramaTopograficoTest, DeletingTheGroupDrawsEverythingAgainAndAnErasedBlockIsReplaced) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    const auto antes = PorSimbolo(Salvo());
    ui_->setAnswer("question:89", "yes");
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    const auto depois = PorSimbolo(Salvo());
    ASSERT_EQ(depois.size(), antes.size());
    for (const auto& [simbolo, bloco] : depois)
        EXPECT_NE(bloco.handle, antes.at(simbolo).handle) << simbolo.toStdString();
    // The user erases one block by hand: the next run, keeping the group, draws it again.
    ui_->setAnswer("question:89", "no");
    zvdb::DbObject* bloco = db().objectByHandle(depois.at(H(k2_)).handle.toULongLong(nullptr, 16));
    ASSERT_NE(bloco, nullptr);
    bloco->erase();
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    const auto todas = Salvo();
    const auto ultima = PorSimbolo(todas);
    EXPECT_EQ(ultima.size(), antes.size());
    ASSERT_EQ(ultima.count(H(k2_)), 1u);
    EXPECT_EQ(esq_[H(k2_)], QStringList({"1", ultima.at(H(k2_)).handle}));
}

TEST_F(DiagramaTopograficoTest, WithoutTerminalStripsTerminalsAreOrdinaryBlocks) {
    Modelo({{"PBLTOPO_BORNE", "nil"}, {"PBLTOPO_PTLIM2", "\"1000,100\""}});
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto blocos = PorSimbolo(Salvo());
    ASSERT_EQ(blocos.size(), 6u);
    QSet<QString> paginas;
    for (const auto& [simbolo, bloco] : blocos)
        paginas.insert(bloco.layer);
    EXPECT_EQ(paginas.size(), 1);
    // One row justified over the width of 1000: widths 30, 20, 20, 6, 6 and 8 leave 910 in
    // five gaps of 182; the terminals, with a strip, sort after the blocks without one.
    const QString g1 = QString::fromStdString(zvsample::handleText(g1_));
    EXPECT_EQ(blocos.at(g1).x, 0.0);
    EXPECT_EQ(blocos.at(H(k1_)).x, 212.0);
    EXPECT_EQ(blocos.at(H(x11_)).x, 616.0);
    EXPECT_EQ(blocos.at(H(x21_)).x + 8.0, 1000.0);
    EXPECT_EQ(blocos.at(H(x21_)).y, 100.0 - 50.0 + 2.5);
}

TEST_F(DiagramaTopograficoTest, BadParametersEndTheRunWithAMessageAndDrawNothing) {
    const size_t layers = db().layers().size();
    const size_t objetos = db().objectCount();
    struct Caso {
        std::map<QString, QString> trocas;
        const char* mensagem;
    };
    const Caso casos[] = {
        {{{"PBLREPTOPOGRAFICO", ""}}, "names no representation"},
        {{{"PBLREPTOPOGRAFICO", "\"-1\""}}, "names no representation"},
        {{{"PBLTOPO_GRUPO", ""}}, "names no page group"},
        {{{"PBLTOPO_PTLIM2", ""}}, "is missing or is not a point"},
        {{{"PBLTOPO_PTLIM1", "\"canto\""}}, "is missing or is not a point"},
        {{{"PBLTOPO_PTLIM1", "'(0 0)"}}, "is missing or is not a point"},
        {{{"PBLTOPO_PTLIM2", "\"0,50\""}}, "has no width or no height"},
        {{{"PBLREPTOPOGRAFICO", "\"9\""}}, "No listed symbol of the project has a block"},
    };
    for (const Caso& caso : casos) {
        Modelo(caso.trocas);
        const int inicio = Saida().size();
        EXPECT_EQ(Executa(), zvsdk::CommandResult::Failed) << caso.mensagem;
        EXPECT_TRUE(Saida().mid(inicio).contains(caso.mensagem))
            << caso.mensagem << "\n"
            << Saida().mid(inicio).toStdString();
        EXPECT_EQ(db().layers().size(), layers) << caso.mensagem;
    }
    // A template that doesn't load is the lists' message.
    QFile::remove(modelo());
    QFile(modelo()).open(QIODevice::WriteOnly);
    EXPECT_EQ(Executa(), zvsdk::CommandResult::Failed);
    EXPECT_TRUE(Saida().contains("The template could not be loaded.")) << Saida().toStdString();
    EXPECT_EQ(db().layers().size(), layers);
    EXPECT_GE(db().objectCount(), objetos);
}

TEST_F(DiagramaTopograficoTest, ARectangleSmallerThanEveryBlockGivesEachItsRowAndPage) {
    Modelo({{"PBLTOPO_PTLIM1", "\"0,0,0\""}, {"PBLTOPO_PTLIM2", "\"1,1\""}});
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto blocos = PorSimbolo(Salvo());
    ASSERT_EQ(blocos.size(), 6u);
    QSet<QString> paginas;
    for (const auto& [simbolo, bloco] : blocos)
        paginas.insert(bloco.layer);
    EXPECT_EQ(paginas.size(), 6);
    // Each sticks out from the left side, its top on the top side.
    EXPECT_EQ(blocos.at(H(k1_)).x, 0.0);
    EXPECT_EQ(blocos.at(H(k1_)).y, 1.0 - 40.0);
}

// ---- a contactor's view that shows the key its item is drawn for and its place as read

class VistaComChave : public DiagramaTopograficoTest {
protected:
    static void SetUpTestSuite() {
        DiagramaTopograficoTest::SetUpTestSuite();
        Vista("TOPO_CT09_10_24DC", 20, 40,
              {{"RELACAO", "?"}, {"HANDLE", ""}, {"ZV_TOPO_SEQUENCIA", ""}});
        Vista("TOPO_BA11", 10, 40, {{"HANDLE", ""}});  // 2101, with each contactor
    }
};

TEST_F(VistaComChave, AViewThatAsksForTheKeyOrThePlaceAsReadGetsThem) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto blocos = PorSimbolo(Salvo());
    const QString k1 = H(k1_), k2 = H(k2_);
    EXPECT_EQ(blocos.at(k1).atributos["HANDLE"].toString(), k1);
    EXPECT_EQ(blocos.at(k2).atributos["HANDLE"].toString(), k2);
    // An accessory's item is its candidate's: its place and its symbol.
    QStringList acessorios;
    for (const Insercao& i : Salvo())
        if (i.ace.size() == 4) acessorios << i.atributos["HANDLE"].toString();
    acessorios.sort();
    EXPECT_EQ(acessorios, QStringList({"*0_" + k1, "*0_" + k2}));
    // The contactors are read in their keys' order, each followed by its accessory.
    bool ok1 = false, ok2 = false;
    const int lugar1 = blocos.at(k1).atributos["ZV_TOPO_SEQUENCIA"].toString().toInt(&ok1);
    const int lugar2 = blocos.at(k2).atributos["ZV_TOPO_SEQUENCIA"].toString().toInt(&ok2);
    ASSERT_TRUE(ok1 && ok2);
    EXPECT_EQ(lugar2, lugar1 + 2);
}

// ---- accessories: the catalogue's (2101 goes with 2001) and those a symbol adds

class AcessoriosTopograficos : public DiagramaTopograficoTest {
protected:
    static void SetUpTestSuite() {
        DiagramaTopograficoTest::SetUpTestSuite();
        Vista("TOPO_BA11", 10, 40, {{"RELACAO", "?"}, {"ZV_KEY", ""}});  // 2101
        Vista("TOPO_AUX11", 12, 30, {{"ZV_KEY", ""}});                   // 3006
    }
    void SetUp() override {
        DiagramaTopograficoTest::SetUp();
        db().registerApplication("ZV_VINC_ADITIVO");
        // -K1 adds two side contacts; -K2 a motor (no front view) and a duct (not listed).
        k1_->setXData("ZV_VINC_ADITIVO", XDataItems().text("2").text("3006").tags());
        k2_->setXData("ZV_VINC_ADITIVO",
                      XDataItems().text("1").text("7401").text("1").text("8503").tags());
    }
    // The accessories' blocks by place and symbol ("#0_2F").
    static std::map<QString, Insercao> PorAcessorio(const std::vector<Insercao>& todas) {
        std::map<QString, Insercao> blocos;
        for (const Insercao& i : todas)
            if (!i.ace.isEmpty()) {
                EXPECT_EQ(i.ace.size(), 4) << i.ace.join('|').toStdString();
                EXPECT_TRUE(i.rep.isEmpty());
                const QString chave = i.ace.value(2) + "_" + i.ace.value(1);
                EXPECT_EQ(blocos.count(chave), 0u) << "two blocks for " << chave.toStdString();
                blocos[chave] = i;
            }
        return blocos;
    }
    static std::map<QString, QString> Handles(const std::map<QString, Insercao>& blocos) {
        std::map<QString, QString> handles;
        for (const auto& [chave, bloco] : blocos)
            handles[chave] = bloco.handle;
        return handles;
    }
};

TEST_F(AcessoriosTopograficos, AccessoriesWithAFrontViewStandBesideTheirSymbolsWhereTheLayoutSays) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto todas = Salvo();
    const auto blocos = PorSimbolo(todas);
    const auto acessorios = PorAcessorio(todas);
    const QString k1 = H(k1_), k2 = H(k2_), q1 = H(q1_);
    std::set<QString> lugares;
    for (const auto& [chave, bloco] : acessorios)
        lugares.insert(chave);
    // The catalogue's auxiliary block on both contactors, the two side contacts of -K1, the
    // catalogue's side contact of -Q1 (whose own view is refused); neither the motor (no
    // front view) nor the duct (not listed).
    EXPECT_EQ(lugares,
              std::set<QString>({"*0_" + k1, "*0_" + k2, "#0_" + k1, "#1_" + k1, "*0_" + q1}));
    EXPECT_EQ(acessorios.at("*0_" + k1).nome, "TOPO_BA11_1");
    EXPECT_EQ(acessorios.at("#1_" + k1).nome, "TOPO_AUX11_1");
    EXPECT_FALSE(Saida().contains("TOPO_M15_4P")) << Saida().toStdString();
    EXPECT_FALSE(Saida().contains("TOPO_CR4060.dwg")) << Saida().toStdString();
    EXPECT_TRUE(Saida().contains("Blocks inserted / pages made: 11 / 2")) << Saida().toStdString();

    // Sorted by RELACAO, each accessory with its symbol's: -G1 (30 wide), -K1 (20), its side
    // contacts (12, 12), its auxiliary block (10) fill the first row: 100 - 84 leaves four
    // gaps of 4. The row is 50 high (-G1); each block centred on it.
    const QString g1 = QString::fromStdString(zvsample::handleText(g1_));
    EXPECT_EQ(blocos.at(g1).x, 0.0);
    EXPECT_EQ(blocos.at(k1).x, 34.0);
    EXPECT_EQ(blocos.at(k1).y, 55.0);
    EXPECT_EQ(acessorios.at("#0_" + k1).x, 58.0);
    EXPECT_EQ(acessorios.at("#0_" + k1).y, 60.0);
    EXPECT_EQ(acessorios.at("#1_" + k1).x, 74.0);
    EXPECT_EQ(acessorios.at("*0_" + k1).x, 90.0);
    EXPECT_EQ(acessorios.at("*0_" + k1).y, 55.0);
    // -K2, its auxiliary block and the side contact of -Q1 under the first row (its top at
    // 100 - 50 - 2 = 48, 40 high): 100 - 42 leaves two gaps of 29.
    EXPECT_EQ(blocos.at(k2).x, 0.0);
    EXPECT_EQ(blocos.at(k2).y, 8.0);
    EXPECT_EQ(acessorios.at("*0_" + k2).x, 49.0);
    EXPECT_EQ(acessorios.at("*0_" + k2).y, 8.0);
    EXPECT_EQ(acessorios.at("*0_" + q1).x, 88.0);
    EXPECT_EQ(acessorios.at("*0_" + q1).y, 13.0);
    EXPECT_EQ(acessorios.at("*0_" + q1).nome, "TOPO_AUX11_1");
    for (const auto& [chave, bloco] : acessorios)
        EXPECT_EQ(bloco.layer, blocos.at(k1).layer) << chave.toStdString();
}

TEST_F(AcessoriosTopograficos, EachAccessoryBlockAndItsSymbolNameEachOther) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto todas = Salvo();
    const auto blocos = PorSimbolo(todas);
    const auto acessorios = PorAcessorio(todas);
    const QString k1 = H(k1_), k2 = H(k2_);
    // The block: representation, symbol, place in the symbol's list, the accessory's key.
    const Insercao& auxiliar = acessorios.at("*0_" + k1);
    EXPECT_EQ(auxiliar.ace, QStringList({"1", k1, "*0", "2101"}));
    EXPECT_EQ(acessorios.at("#1_" + k1).ace, QStringList({"1", k1, "#1", "3006"}));
    // Its attributes: the accessory's own key under its symbol's tag.
    EXPECT_EQ(auxiliar.atributos["RELACAO"].toString(), "-K1");
    EXPECT_EQ(auxiliar.atributos["ZV_KEY"].toString(), "2101");
    // The same key on another symbol: its own symbol's tag, the key's own fields alike.
    EXPECT_EQ(acessorios.at("*0_" + k2).atributos["RELACAO"].toString(), "-K2");
    EXPECT_EQ(acessorios.at("*0_" + k2).atributos["ZV_KEY"].toString(), "2101");
    EXPECT_EQ(acessorios.at("#0_" + k1).atributos["ZV_KEY"].toString(), "3006");
    // The symbol: its own block in its chain, its accessories' blocks in the other.
    EXPECT_EQ(esq_[k1], QStringList({"1", blocos.at(k1).handle}));
    EXPECT_EQ(aceEsq_[k1], QStringList({"1", acessorios.at("#0_" + k1).handle, "1",
                                        acessorios.at("#1_" + k1).handle, "1", auxiliar.handle}));
    EXPECT_EQ(aceEsq_[k2], QStringList({"1", acessorios.at("*0_" + k2).handle}));
    EXPECT_EQ(aceEsq_[H(q1_)], QStringList({"1", acessorios.at("*0_" + H(q1_)).handle}));
    EXPECT_EQ(aceEsq_.size(), 3u);
}

TEST_F(AcessoriosTopograficos, RunsOnTheOutputAddOnlyMissingAccessoriesAndNeverTwice) {
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto primeira = PorAcessorio(Salvo());
    ASSERT_EQ(primeira.size(), 5u);
    const QString k1 = H(k1_), k2 = H(k2_);

    // Keeping the group: all there, nothing drawn.
    ui_->setAnswer("question:89", "no");
    EXPECT_EQ(Executa(), zvsdk::CommandResult::Succeeded);
    EXPECT_TRUE(Saida().contains("Every symbol is on the diagram already; no page was made."));
    EXPECT_EQ(Handles(PorAcessorio(Salvo())), Handles(primeira));

    // One side contact erased by hand and a new one given to -K2, which is drawn already:
    // both accessories come, not -K2 again, and the chains keep one block a place.
    zvdb::DbObject* apagado =
        db().objectByHandle(primeira.at("#1_" + k1).handle.toULongLong(nullptr, 16));
    ASSERT_NE(apagado, nullptr);
    apagado->erase();
    k2_->setXData(
        "ZV_VINC_ADITIVO",
        XDataItems().text("1").text("7401").text("1").text("8503").text("1").text("3006").tags());
    const size_t simbolos = PorSimbolo(Salvo()).size();
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    EXPECT_TRUE(Saida().contains("Blocks inserted / pages made: 2 / 1")) << Saida().toStdString();
    const auto todas = Salvo();
    const auto segunda = PorAcessorio(todas);
    EXPECT_EQ(PorSimbolo(todas).size(), simbolos);
    ASSERT_EQ(segunda.size(), 6u);
    EXPECT_NE(segunda.at("#1_" + k1).handle, primeira.at("#1_" + k1).handle);
    EXPECT_EQ(segunda.at("#0_" + k1).handle, primeira.at("#0_" + k1).handle);
    EXPECT_EQ(segunda.at("#2_" + k2).ace, QStringList({"1", k2, "#2", "3006"}));
    EXPECT_EQ(aceEsq_[k1],
              QStringList({"1", segunda.at("#0_" + k1).handle, "1", segunda.at("*0_" + k1).handle,
                           "1", segunda.at("#1_" + k1).handle}));
    EXPECT_EQ(aceEsq_[k2], QStringList({"1", segunda.at("*0_" + k2).handle, "1",
                                        segunda.at("#2_" + k2).handle}));

    // Deleting the group draws them all again, each once; old pairs don't linger.
    ui_->setAnswer("question:89", "yes");
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto terceira = PorAcessorio(Salvo());
    ASSERT_EQ(terceira.size(), 6u);
    for (const auto& [chave, bloco] : terceira)
        EXPECT_NE(bloco.handle, segunda.at(chave).handle) << chave.toStdString();
    EXPECT_EQ(aceEsq_[k1].size(), 6);
    EXPECT_EQ(aceEsq_[k2].size(), 4);
}

TEST_F(AcessoriosTopograficos, ChainsThatNameAnotherRepresentationsBlocksKeepThemFirst) {
    // -K1 is tied already to blocks of representation 2 (any live objects will do), both
    // for itself and for an accessory; -K2 to nothing.
    for (const char* app : {"KVR_ZV_REPRESENTACAO_ESQ", "KVR_ZV_REPRESENTACAO_ACE_ESQ"})
        db().registerApplication(app);
    const QString k1 = H(k1_), k2 = H(k2_);
    k1_->setXData("KVR_ZV_REPRESENTACAO_ESQ",
                  XDataItems().text("2").text(H(x11_).toStdString()).tags());
    k1_->setXData("KVR_ZV_REPRESENTACAO_ACE_ESQ",
                  XDataItems().text("2").text(H(x12_).toStdString()).tags());
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto todas = Salvo();
    const auto blocos = PorSimbolo(todas);
    const auto acessorios = PorAcessorio(todas);
    ASSERT_EQ(acessorios.size(), 5u);
    // The old pairs stay ahead of this run's; every accessory of -K1 joins the same chain.
    EXPECT_EQ(esq_[k1], QStringList({"2", H(x11_), "1", blocos.at(k1).handle}));
    EXPECT_EQ(aceEsq_[k1], QStringList({"2", H(x12_), "1", acessorios.at("#0_" + k1).handle, "1",
                                        acessorios.at("#1_" + k1).handle, "1",
                                        acessorios.at("*0_" + k1).handle}));
    EXPECT_EQ(esq_[k2], QStringList({"1", blocos.at(k2).handle}));
    EXPECT_EQ(aceEsq_[k2], QStringList({"1", acessorios.at("*0_" + k2).handle}));
}

TEST_F(AcessoriosTopograficos, ChainsGrowOverBothPassesInTheOrderTheirBlocksWentIn) {
    // -K1 adds a terminal too, drawn in the terminals' pass after its other accessories; the
    // terminal -X1:1 adds a side contact, drawn with the ordinary blocks before the terminal.
    k1_->setXData("ZV_VINC_ADITIVO",
                  XDataItems().text("1").text("3006").text("1").text("1001").tags());
    x11_->setXData("ZV_VINC_ADITIVO", XDataItems().text("1").text("3006").tags());
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    const auto todas = Salvo();
    const auto blocos = PorSimbolo(todas);
    const auto acessorios = PorAcessorio(todas);
    const QString k1 = H(k1_), x11 = H(x11_);
    ASSERT_EQ(acessorios.count("#1_" + k1), 1u);
    ASSERT_EQ(acessorios.count("#0_" + x11), 1u);
    EXPECT_EQ(acessorios.at("#1_" + k1).nome, "TOPO_BX2_5_GY_1");
    // The terminal's pass adds to the chain the ordinary pass made.
    EXPECT_EQ(aceEsq_[k1], QStringList({"1", acessorios.at("#0_" + k1).handle, "1",
                                        acessorios.at("*0_" + k1).handle, "1",
                                        acessorios.at("#1_" + k1).handle}));
    EXPECT_EQ(esq_[k1], QStringList({"1", blocos.at(k1).handle}));
    EXPECT_EQ(aceEsq_[x11], QStringList({"1", acessorios.at("#0_" + x11).handle}));
    EXPECT_EQ(esq_[x11], QStringList({"1", blocos.at(x11).handle}));
    // A symbol's chains follow its other data in the order they were first linked.
    const auto ordem = [](const zvdb::DbObject* simbolo) {
        QStringList nomes;
        for (const std::string_view nome : simbolo->xdataApplications())
            if (nome.starts_with("KVR_ZV_REPRESENTACAO"))
                nomes << QString::fromUtf8(nome.data(), int(nome.size()));
        return nomes;
    };
    EXPECT_EQ(ordem(k1_),
              QStringList({"KVR_ZV_REPRESENTACAO_ESQ", "KVR_ZV_REPRESENTACAO_ACE_ESQ"}));
    EXPECT_EQ(ordem(x11_),
              QStringList({"KVR_ZV_REPRESENTACAO_ACE_ESQ", "KVR_ZV_REPRESENTACAO_ESQ"}));
}

TEST_F(AcessoriosTopograficos, AnAccessoryWhoseSymbolIsNotListedIsLeftOutWithIt) {
    // A duct, not on the lists, that adds a side contact: neither is drawn.
    Simbolo("CANALETA", "8503\f1", {{"RELACAO", "-W2"}})
        ->setXData("ZV_VINC_ADITIVO", XDataItems().text("1").text("3006").tags());
    ASSERT_EQ(Executa(), zvsdk::CommandResult::Succeeded) << Saida().toStdString();
    EXPECT_EQ(PorAcessorio(Salvo()).size(), 5u);
}

}  // namespace
