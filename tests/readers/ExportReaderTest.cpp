// The export reader on small schematics: the kinds it reads for each EXPORTA value, each
// marked in ZV_LISTA_TIPO, and what a wire's item learns about a terminal at its ends.
#include "readers/BornesLidos.h"
#include "readers/CCBorneDataReader.h"
#include "readers/CCExportDataReader.h"
#include "readers/FioFixture.h"

#include "export/CEExportacao.h"
#include "settings/CIMensagens.h"

#include <QMap>

#include <algorithm>
#include <functional>
#include <utility>

namespace {

class ExportReaderTest : public FioFixture {
protected:
    void SetUp() override {
        FioFixture::SetUp();
        ASSERT_TRUE(lisp("(setq *EXPORT_CHAR_SEP* \":\" *EXPORT_ORDEM_REL* \"1\")"));
    }
    void TearDown() override {
        lidos_.destruirItens();
        FioFixture::TearDown();
    }

    // A wire with INVERTIDO among its fields.
    zvdb::Polyline* fioInvertido(const std::vector<zvdb::Point3>& pontos, const std::string& numero,
                                 const std::string& invertido) {
        zvdb::Polyline* linha = fio(pontos, numero);
        linha->setXData("KVR_ZV_WIRE", zvsample::XDataItems()
                                           .text("10006\f1")
                                           .text("1")
                                           .text("FIO\f" + numero)
                                           .text("INVERTIDO\f" + invertido)
                                           .tags());
        return linha;
    }

    // X1:1 and X1:2 wired to the coil -K1 by wires 1 and 2, and -K1's second connection
    // on wire 3 to nothing else: two terminals, one component, three wires.
    void projeto() {
        x1_ = borne("X1", "1", {20, 200, 0});
        x2_ = borne("X1", "2", {60, 200, 0});
        k1_ = componente("-K1", {{"A1", {20, 100, 0}}, {"A2", {60, 100, 0}}});
        fio({{20, 190, 0}, {20, 100, 0}}, "1");
        fio({{60, 190, 0}, {60, 100, 0}}, "2");
    }

    // Reads with EXPORTA set (unset for a negative value); the reader's result is kept.
    const VetorItens& le(int exporta, CEExportacao* exportacao = nullptr) {
        if (exporta < 0)
            EXPECT_TRUE(lisp("(setq EXPORTA nil)"));
        else
            EXPECT_TRUE(lisp("(setq EXPORTA " + QString::number(exporta) + ")"));
        CCExportDataReader leitor;
        leitor.Exportacao = exportacao;
        std::unique_ptr<VetorItens> itens(leitor.Le(&db(), nullptr, true, std::nullopt));
        EXPECT_TRUE(itens);
        if (itens) lidos_.insert(lidos_.end(), itens->begin(), itens->end());
        return lidos_;
    }
    // How many items of each kind.
    QMap<QString, int> tipos() const {
        QMap<QString, int> conta;
        for (const CEItemLista* item : lidos_)
            ++conta[item->valorCampo("ZV_LISTA_TIPO")];
        return conta;
    }
    const CEItemLista* doFio(const QString& numero) const {
        for (const CEItemLista* item : lidos_)
            if (item->valorCampo("ZV_LISTA_TIPO") == "FIO" && item->valorCampo("FIO") == numero)
                return item;
        return nullptr;
    }

    zvdb::BlockReference* x1_ = nullptr;
    zvdb::BlockReference* x2_ = nullptr;
    zvdb::BlockReference* k1_ = nullptr;
    VetorItens lidos_;
};

// ---- kinds read for each EXPORTA value

TEST_F(ExportReaderTest, TerminalsAloneForOneAndEveryItemMarked) {
    projeto();
    le(1);
    const QMap<QString, int> conta = tipos();
    EXPECT_EQ(conta.value("BORNE"), 2);
    EXPECT_EQ(conta.value("FIO"), 0);
    EXPECT_EQ(conta.value("COMP"), 0);
    for (const CEItemLista* item : lidos_) {
        const QString tipo = item->valorCampo("ZV_LISTA_TIPO");
        EXPECT_TRUE(tipo == "BORNE" || tipo == "ACE") << tipo.toStdString();
    }
    QStringList numeros;
    for (const CEItemLista* item : lidos_)
        if (item->valorCampo("ZV_LISTA_TIPO") == "BORNE")
            numeros << item->valorCampo("REGUA") + ":" + item->valorCampo("NUMERO");
    numeros.sort();
    EXPECT_EQ(numeros, QStringList({"X1:1", "X1:2"}));
}

TEST_F(ExportReaderTest, ComponentsTellTerminalsFromOtherSymbols) {
    projeto();
    le(3);
    const QMap<QString, int> conta = tipos();
    EXPECT_EQ(conta.value("BORNE"), 2);
    EXPECT_EQ(conta.value("COMP"), 1);
    EXPECT_EQ(conta.value("FIO"), 0);
    for (const CEItemLista* item : lidos_)
        if (item->valorCampo("ZV_LISTA_TIPO") == "COMP") {
            EXPECT_EQ(item->valorCampo("RELACAO"), "-K1");
            EXPECT_EQ(item->valorCampo("HANDLE"), handle(k1_));
        }
}

// The symbols' kinds by handle, as "handle=kind", sorted; accessories are left out.
QStringList TiposPorHandle(const VetorItens& itens) {
    QStringList texto;
    for (const CEItemLista* item : itens)
        if (item->valorCampo("ZV_LISTA_TIPO") != "ACE")
            texto << item->valorCampo("HANDLE") + "=" + item->valorCampo("ZV_LISTA_TIPO");
    texto.sort();
    return texto;
}

// The walk tells each terminal as it reads it; the symbols it drops on the way (a terminal
// that is not listed, read right before a component that takes its place) tell nothing of
// those kept after them. A reader with hooks of its own is told by the block names.
TEST_F(ExportReaderTest, TerminalsAreToldAmongSymbolsTheWalkDrops) {
    projeto();
    zvdb::BlockReference* fora = borne("X9", "1", {100, 200, 0});
    fora->setXData("KVR_ZV", zvsample::XDataItems().text("1106\f1").tags());
    // A block of its own, made after the terminals' and named after it.
    zvdb::BlockReference* k2 = componente("-K2", {{"A1", {140, 100, 0}}}, "RELE");
    le(3);
    const QStringList esperado = QStringList({handle(x1_) + "=BORNE", handle(x2_) + "=BORNE",
                                              handle(k1_) + "=COMP", handle(k2) + "=COMP"});
    QStringList ordenado = esperado;
    ordenado.sort();
    EXPECT_EQ(TiposPorHandle(lidos_), ordenado);
    // Both terminals read their sides from the points the walk read: the element and the
    // wire at the cut point under _INI, nothing at the insertion point.
    QStringList lados;
    for (const CEItemLista* item : lidos_) {
        if (item->valorCampo("ZV_LISTA_TIPO") != "BORNE") continue;
        lados << item->valorCampo("NUMERO") + ">" + item->valorCampo("RELACAO_INI") + "/" +
                     item->valorCampo("FIO_SEGINI") + "|" + item->valorCampo("RELACAO_FIM");
    }
    lados.sort();
    EXPECT_EQ(lados, QStringList({"1>-K1:A1/1|", "2>-K1:A2/2|"}));
    lidos_.destruirItens();

    struct ComLados : CCExportDataReader {
        int lados = 0;
        void LerLadoIni(CEItemLista&, const OdDbObjectId&, CETemplate&) override { ++lados; }
    };
    ComLados proprio;
    std::unique_ptr<VetorItens> itens(proprio.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(itens);
    EXPECT_GT(proprio.lados, 0);
    EXPECT_EQ(TiposPorHandle(*itens), ordenado);
    itens->destruirItens();
}

// The records of a walk: items kept in the order read; the dropped leave records behind,
// at the place the next kept item takes, maybe at the very address it gets.
TEST(BornesLidosTest, OnlyTheKeptTerminalsAnswerAtTheirPlaces) {
    const auto id = [](std::uint64_t handle) { return OdDbObjectId(nullptr, handle); };
    CEItemLista a, b, c, d;
    a.ids = {id(0xA)};
    b.ids = {id(0xB)};
    c.ids = {id(0xC)};
    d.ids = {id(0xD)};
    BornesLidos lidos;
    lidos.Anota(0, a, id(0xA), {});
    // A terminal dropped at place 1, then one kept there; a dropped one at place 2 whose
    // item's address the component kept there got.
    lidos.Anota(1, d, id(0x1D), {});
    lidos.Anota(1, b, id(0xB), {});
    lidos.Anota(2, c, id(0x2C), {});
    lidos.Anota(4, d, id(0xD), {});
    EXPECT_TRUE(lidos.Eh(0, a));
    EXPECT_TRUE(lidos.Eh(1, b));
    EXPECT_FALSE(lidos.Eh(2, c));
    // A place without records, and an item of no entity.
    EXPECT_FALSE(lidos.Eh(3, a));
    CEItemLista vazio;
    EXPECT_FALSE(lidos.Eh(4, vazio));
    EXPECT_TRUE(lidos.Eh(4, d));
    lidos.Limpa();
    EXPECT_FALSE(lidos.Eh(0, a));
}

TEST_F(ExportReaderTest, WiresAloneForTwoAndWiresWithComponentsWhenUnset) {
    projeto();
    le(2);
    EXPECT_EQ(tipos(), (QMap<QString, int>{{"FIO", 2}}));
    lidos_.destruirItens();
    // Unset counts as wires and components.
    le(-1);
    const QMap<QString, int> conta = tipos();
    EXPECT_EQ(conta.value("FIO"), 2);
    EXPECT_EQ(conta.value("COMP"), 1);
    EXPECT_EQ(conta.value("BORNE"), 2);
}

TEST_F(ExportReaderTest, FerrulesForEightBreakAtEveryElement) {
    projeto();
    le(8);
    const QMap<QString, int> conta = tipos();
    EXPECT_EQ(conta.keys(), QStringList({"ANILHA"}));
    EXPECT_EQ(conta.value("ANILHA"), 2);
}

TEST_F(ExportReaderTest, TheExportsPagesLimitTheWires) {
    projeto();
    fio({{20, 190, 0}, {20, 100, 0}}, "7", kPagina2);
    CEExportacao exportacao;
    exportacao.SetOpcao("PAGINAS", kPagina2);
    le(2, &exportacao);
    ASSERT_EQ(lidos_.size(), 1u);
    EXPECT_EQ(lidos_[0]->valorCampo("FIO"), "7");
}

TEST_F(ExportReaderTest, NoDatabaseReadsNothing) {
    CCExportDataReader leitor;
    EXPECT_EQ(leitor.Le(nullptr, nullptr, true, std::nullopt), nullptr);
}

// ---- the ends of a wire

TEST_F(ExportReaderTest, AnInvertedWireHasTheTerminalsEndUnderIni) {
    x1_ = borne("X1", "1", {20, 200, 0});
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}});
    fioInvertido({{20, 190, 0}, {20, 100, 0}}, "1", "s");
    le(2);
    const CEItemLista* fio1 = doFio("1");
    ASSERT_TRUE(fio1);
    // The terminal's end: the component across it, with the terminal's handle.
    EXPECT_EQ(fio1->valorCampo("HANDLE_INI"), handle(x1_));
    EXPECT_EQ(fio1->valorCampo("RELACAO_INI"), "-K1:A1");
    EXPECT_EQ(fio1->valorCampo("TAG_INI"), "-K1:A1");
    EXPECT_EQ(fio1->valorCampo("ETIQUETA_INI"), "-K1:A1");
    EXPECT_EQ(fio1->valorCampo("REL_INI"), "-K1");
    EXPECT_EQ(fio1->valorCampo("LIG_INI"), "A1");
    // The component's end is no terminal: the hook leaves it as the wire reader made it.
    EXPECT_EQ(fio1->valorCampo("HANDLE_FIM"), handle(k1_));
    EXPECT_EQ(fio1->valorCampo("REL_FIM"), "-K1");
}

TEST_F(ExportReaderTest, AWireNotInvertedHasTheTerminalsEndUnderFim) {
    x1_ = borne("X1", "1", {20, 200, 0});
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}});
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    le(2);
    const CEItemLista* fio1 = doFio("1");
    ASSERT_TRUE(fio1);
    EXPECT_EQ(fio1->valorCampo("HANDLE_FIM"), handle(x1_));
    EXPECT_EQ(fio1->valorCampo("RELACAO_FIM"), "-K1:A1");
    EXPECT_EQ(fio1->valorCampo("LIG_FIM"), "A1");
    EXPECT_EQ(fio1->valorCampo("HANDLE_INI"), handle(x1_));
}

TEST_F(ExportReaderTest, AReaderReadingAgainComposesWithTheSettingsOfTheNewRead) {
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {60, 200, 0});
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}, {"A2", {60, 100, 0}}});
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    fio({{60, 190, 0}, {60, 100, 0}}, "2");
    ASSERT_TRUE(lisp("(setq EXPORTA 2)"));
    CCExportDataReader leitor;
    // Both wires' terminal ends, as "wire=relation".
    const auto relacoes = [&] {
        std::unique_ptr<VetorItens> itens(leitor.Le(&db(), nullptr, true, std::nullopt));
        QStringList texto;
        for (const CEItemLista* item : *itens)
            texto << item->valorCampo("FIO") + "=" + item->valorCampo("RELACAO_FIM");
        texto.sort();
        itens->destruirItens();
        return texto;
    };
    EXPECT_EQ(relacoes(), QStringList({"1=-K1:A1", "2=-K1:A2"}));
    ASSERT_TRUE(lisp("(setq *EXPORT_CHAR_SEP* \"/\" *EXPORT_ORDEM_REL* \"2\")"));
    EXPECT_EQ(relacoes(), QStringList({"1=A1/-K1", "2=A2/-K1"}));
    // Outside a read an end is composed with the settings as they are then.
    ASSERT_TRUE(lisp("(setq *EXPORT_CHAR_SEP* \"-\")"));
    CEItemLista item;
    item.definirCampo("RELACAO_X", "-K5");
    leitor.CompoeRelacao("_X", item, nullptr, "7", "");
    EXPECT_EQ(item.valorCampo("RELACAO_X"), "7--K5");
}

TEST_F(ExportReaderTest, AWireBetweenComponentsIsLeftAsTheWireReaderMadeIt) {
    componente("-K1", {{"A1", {20, 200, 0}}});
    componente("-K2", {{"A1", {20, 100, 0}}});
    fio({{20, 200, 0}, {20, 100, 0}}, "5");
    le(2);
    ASSERT_EQ(lidos_.size(), 1u);
    CCFioDataReader fios;
    std::unique_ptr<VetorItens> lidos(fios.LeFios(std::nullopt, nullptr, nullptr));
    ASSERT_EQ(lidos->size(), 1u);
    const CEItemLista& exportado = *lidos_[0];
    const CEItemLista& lido = *lidos->front();
    QStringList nomes = exportado.campos.keys();
    nomes.sort();
    QStringList nomesLidos = lido.campos.keys();
    nomesLidos.sort();
    EXPECT_EQ(nomes, nomesLidos);
    for (const QString& nome : nomes)
        EXPECT_EQ(exportado.valorCampo(nome), lido.valorCampo(nome)) << nome.toStdString();
    EXPECT_EQ(exportado.valorCampo("REL_INI"), "-K1");
    lidos->destruirItens();
}

TEST_F(ExportReaderTest, TwoTerminalsWithoutSeparatorJoinStripAndNumber) {
    ASSERT_TRUE(lisp("(setq *EXPORT_CHAR_SEP* nil)"));
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {20, 100, 0});
    fio({{20, 190, 0}, {20, 100, 0}}, "9");
    le(2);
    const CEItemLista* fio9 = doFio("9");
    ASSERT_TRUE(fio9);
    EXPECT_EQ(fio9->valorCampo("REL_FIM"), "X12");
    EXPECT_EQ(fio9->valorCampo("RELACAO_FIM"), "X12");
}

// ---- composing one end

class ExportRelationTest : public ExportReaderTest {
protected:
    CEItemLista item;
    CCExportDataReader leitor;
};

TEST_F(ExportRelationTest, RelationAndConnectionInTheOrderAsked) {
    item.definirCampo("TAG_X", "-K3");
    leitor.CompoeRelacao("_X", item, nullptr, "13", "1F");
    EXPECT_EQ(item.valorCampo("REL_X"), "-K3");
    EXPECT_EQ(item.valorCampo("LIG_X"), "13");
    EXPECT_EQ(item.valorCampo("HANDLE_X"), "1F");
    for (const char* campo : {"RELACAO_X", "TAG_X", "ETIQUETA_X"})
        EXPECT_EQ(item.valorCampo(campo), "-K3:13") << campo;
    ASSERT_TRUE(lisp("(setq *EXPORT_ORDEM_REL* \"2\" *EXPORT_CHAR_SEP* \"/\")"));
    leitor.CompoeRelacao("_X", item, nullptr, "14", QString());
    EXPECT_EQ(item.valorCampo("RELACAO_X"), "14/-K3:13");
    // No handle leaves the one there.
    EXPECT_EQ(item.valorCampo("HANDLE_X"), "1F");
}

TEST_F(ExportRelationTest, StripAndNumberStandForAMissingRelation) {
    item.definirCampo("STRIP_F", "X4");
    item.definirCampo("NUMBER_F", "7");
    leitor.CompoeRelacao("_F", item, nullptr, "", "");
    EXPECT_EQ(item.valorCampo("REL_F"), "X4:7");
    EXPECT_EQ(item.valorCampo("RELACAO_F"), "X4:7");
    // A connection text first, then strip and number written over it.
    CEItemLista outro;
    outro.definirCampo("REGUA_F", "X4");
    outro.definirCampo("NUMERO_F", "8");
    leitor.CompoeRelacao("_F", outro, nullptr, "B", "");
    EXPECT_EQ(outro.valorCampo("ETIQUETA_F"), "X4:8");
    EXPECT_EQ(outro.valorCampo("LIG_F"), "B");
    // Once composed, the relation found is the one joined with a connection.
    leitor.CompoeRelacao("_F", outro, nullptr, "C", "");
    EXPECT_EQ(outro.valorCampo("ETIQUETA_F"), "X4:8:C");
    EXPECT_EQ(outro.valorCampo("REL_F"), "X4:8");
    // The other order turns the relation round, not REL; a connection changes neither.
    ASSERT_TRUE(lisp("(setq *EXPORT_ORDEM_REL* \"2\" *EXPORT_CHAR_SEP* \"/\")"));
    CEItemLista terceiro;
    terceiro.definirCampo("STRIP_F", "X5");
    terceiro.definirCampo("NUMBER_F", "9");
    leitor.CompoeRelacao("_F", terceiro, nullptr, "D", "");
    EXPECT_EQ(terceiro.valorCampo("REL_F"), "X5/9");
    EXPECT_EQ(terceiro.valorCampo("LIG_F"), "D");
    for (const char* campo : {"RELACAO_F", "TAG_F", "ETIQUETA_F"})
        EXPECT_EQ(terceiro.valorCampo(campo), "9/X5") << campo;
}

TEST_F(ExportRelationTest, AStripWithoutNumberAndNothingElseLeavesTheRelationFields) {
    item.definirCampo("REGUA_I", "X9");
    leitor.CompoeRelacao("_I", item, nullptr, "", "");
    for (const char* campo : {"RELACAO_I", "TAG_I", "ETIQUETA_I"})
        EXPECT_FALSE(item.temCampo(campo)) << campo;
    EXPECT_EQ(item.valorCampo("REL_I"), "X9:");
    // A relation found stands for REL whatever the strip says.
    item.definirCampo("TAG_I", "-A1");
    leitor.CompoeRelacao("_I", item, nullptr, "", "");
    EXPECT_EQ(item.valorCampo("REL_I"), "-A1");
    EXPECT_EQ(item.valorCampo("TAG_I"), "-A1");
}

// The relation's names under a suffix no item has had yet are not numbered by looking for
// them; once an item has them, they are found.
TEST_F(ExportRelationTest, NamesNoItemHasYetAreFoundOnceAnItemHasThem) {
    const QString sufixo = "_NOVO_Q7";
    leitor.CompoeRelacao(sufixo, item, nullptr, "", "");
    EXPECT_EQ(CamposItem::numeroSeHouver("STRIP" + sufixo), CamposItem::kSemNome);
    EXPECT_EQ(CamposItem::numeroSeHouver("TAG" + sufixo), CamposItem::kSemNome);
    EXPECT_EQ(item.valorCampo("REL" + sufixo), ":");
    CEItemLista outro;
    outro.definirCampo("STRIP" + sufixo, "X2");
    outro.definirCampo("NUMBER" + sufixo, "3");
    leitor.CompoeRelacao(sufixo, outro, nullptr, "", "");
    EXPECT_EQ(outro.valorCampo("REL" + sufixo), "X2:3");
    EXPECT_EQ(outro.valorCampo("TAG" + sufixo), "X2:3");
    CEItemLista terceiro;
    terceiro.definirCampo("ETIQUETA" + sufixo, "-K9");
    leitor.CompoeRelacao(sufixo, terceiro, nullptr, "A1", "");
    EXPECT_EQ(terceiro.valorCampo("RELACAO" + sufixo), "-K9:A1");
    EXPECT_EQ(terceiro.valorCampo("REL" + sufixo), "-K9");
}

TEST_F(ExportRelationTest, ATemplateGivesTheSeparatorAndOrder) {
    modelo_.simbolos["*CHAR_SEP_STD_CFG*"] = "-";
    modelo_.simbolos["*ORDEM_CONCAT_STD*"] = "0";
    item.definirCampo("RELACAO_S", "-Q1");
    leitor.CompoeRelacao("_S", item, &modelo_, "2", "");
    EXPECT_EQ(item.valorCampo("TAG_S"), "2--Q1");
}

TEST_F(ExportRelationTest, AFieldWithoutHeadingAnswersItsTag) {
    EXPECT_EQ(leitor.PromptCampo("CAMPO_QUE_NAO_HA", false), "CAMPO_QUE_NAO_HA");
    EXPECT_EQ(leitor.PromptCampo("O'BRIEN", true), "O'BRIEN");
}

}  // namespace

namespace {

// ---- a terminal's own sides, read with the components

class ExportTerminalSidesTest : public ExportReaderTest {
protected:
    const CEItemLista* borneLido(const QString& numero) const {
        for (const CEItemLista* item : lidos_)
            if (item->valorCampo("ZV_LISTA_TIPO") == "BORNE" &&
                item->valorCampo("NUMERO") == numero)
                return item;
        return nullptr;
    }
    OdDbObjectId id(const zvdb::DbObject* objeto) { return OdDbObjectId(&db(), objeto->handle()); }
    // What `leitor` reads, and how many positions it asked the LISP side for.
    std::pair<std::unique_ptr<VetorItens>, int> LeContando(CCExportDataReader& leitor) {
        EXPECT_TRUE(
            lisp("(progn (setq chamadas 0) (defun BuscarCoordenadas (e g p x y) "
                 "(setq chamadas (1+ chamadas)) \"B2\"))"));
        std::unique_ptr<VetorItens> itens(leitor.Le(&db(), nullptr, true, std::nullopt));
        return {std::move(itens), CICad::GetIntLisp("chamadas", -1)};
    }
    // The side fields of an item, by name.
    static QMap<QString, QString> lados(const CEItemLista& item) {
        QMap<QString, QString> campos;
        for (const char* nome : {"RELACAO_INI", "RELACAO_FIM", "FIO_SEGINI", "FIO_SEGFIM",
                                 "REGUA_INI", "NUMERO_FIM", "HANDLE_INI", "HANDLE_FIM"})
            if (item.temCampo(nome)) campos.insert(nome, item.valorCampo(nome));
        return campos;
    }
    // Two reads of one drawing give, item by item in the same order, the same fields; the
    // terminals' sides of the second, sorted, each as `lado` puts it.
    static QStringList mesmosItens(const VetorItens& a, const VetorItens& b,
                                   const std::function<QString(const CEItemLista&)>& lado) {
        EXPECT_EQ(a.size(), b.size());
        QStringList vizinhos;
        for (size_t i = 0; i < std::min(a.size(), b.size()); ++i) {
            EXPECT_EQ(a[i]->campos.keys(), b[i]->campos.keys()) << i;
            EXPECT_EQ(a[i]->campos.values(), b[i]->campos.values()) << i;
            if (b[i]->valorCampo("ZV_LISTA_TIPO") == "BORNE") vizinhos << lado(*b[i]);
        }
        vizinhos.sort();
        return vizinhos;
    }
    // X1:1 has -K1 at its cut point (wire 1) and X1:2 at its insertion point (wire 5): those
    // two wires.
    std::pair<const zvdb::Polyline*, const zvdb::Polyline*> duasBornesLigadas() {
        x1_ = borne("X1", "1", {20, 200, 0});
        x2_ = borne("X1", "2", {60, 200, 0});
        k1_ = componente("-K1", {{"A1", {20, 100, 0}}});
        const zvdb::Polyline* um = fio({{20, 190, 0}, {20, 100, 0}}, "1");
        return {um, fio({{20, 200, 0}, {20, 220, 0}, {60, 220, 0}, {60, 200, 0}}, "5")};
    }
    // One wire runs from -K1 through both points of an equipment's terminal, 2 apart, to
    // -K2: the points alone are too close to tell apart, the connection names are not.
    void equipamento(bool comDados) {
        zvdb::BlockReference* ref = simbolo("BORNE_EQ", {20, 200, 0},
                                            {{"REGUA", "XE", {24, 197, 0}},
                                             {"NUMERO", "1", {24, 194, 0}},
                                             {"LIGACAO1", "1", {20, 200, 0}},
                                             {"LIGACAO2", "2", {20, 198, 0}}},
                                            "1001");
        ref->setXData("KVR_ZV_PTS_CORTE",
                      zvsample::XDataItems().point({20, 200, 0}).point({20, 198, 0}).tags());
        if (comDados) ref->setXData("KVR_ZV_EQUIPO", zvsample::XDataItems().text("EQUIPO").tags());
        componente("-K1", {{"A1", {20, 300, 0}}});
        componente("-K2", {{"A1", {20, 100, 0}}});
        fio({{20, 300, 0}, {20, 200, 0}, {20, 198, 0}, {20, 100, 0}}, "7");
    }
};

TEST_F(ExportTerminalSidesTest, ATerminalCarriesTheElementsAndWiresAtItsTwoPoints) {
    // X1:1 has -K1 at its cut point (wire 1) and X1:2 at its insertion point (wire 5);
    // X1:3 is wired to nothing.
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {60, 200, 0});
    borne("X1", "3", {100, 200, 0});
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}});
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    fio({{20, 200, 0}, {20, 220, 0}, {60, 220, 0}, {60, 200, 0}}, "5");
    le(3);
    const CEItemLista* um = borneLido("1");
    ASSERT_TRUE(um);
    // The cut point's element under _INI, the insertion point's under _FIM.
    EXPECT_EQ(um->valorCampo("RELACAO_INI"), "-K1:A1");
    EXPECT_EQ(um->valorCampo("HANDLE_INI"), handle(k1_));
    EXPECT_EQ(um->valorCampo("LIG_INI"), "A1");
    EXPECT_EQ(um->valorCampo("FIO_SEGINI"), "1");
    EXPECT_EQ(um->valorCampo("RELACAO_FIM"), "X1:2");
    EXPECT_EQ(um->valorCampo("HANDLE_FIM"), handle(x2_));
    EXPECT_EQ(um->valorCampo("FIO_SEGFIM"), "5");
    // Its own fields stay its own.
    EXPECT_EQ(um->valorCampo("HANDLE"), handle(x1_));
    EXPECT_EQ(um->valorCampo("NUMERO"), "1");
    const CEItemLista* tres = borneLido("3");
    ASSERT_TRUE(tres);
    EXPECT_TRUE(lados(*tres).isEmpty());
    EXPECT_FALSE(tres->temCampo("REL_INI"));
    EXPECT_FALSE(tres->temCampo("REL_FIM"));
}

TEST_F(ExportTerminalSidesTest, ComponentsAndTerminalsKeepNoSpareRoomOnceRead) {
    duasBornesLigadas();
    le(3);
    ASSERT_TRUE(borneLido("1") && borneLido("2"));
    // A large project holds hundreds of thousands of these: their arrays are as long as
    // their fields, not as long as their growth made them.
    for (const CEItemLista* item : lidos_) {
        EXPECT_GT(item->campos.size(), 0);
        EXPECT_EQ(item->campos.todos().capacity(), item->campos.todos().size())
            << item->valorCampo("ZV_LISTA_TIPO").toStdString();
    }
    EXPECT_TRUE(borneLido("1")->temCampo("FIO_SEGFIM"));
}

// A reader that keeps no wire's or terminal's reading gives the sides the very fields a
// keeping one gives: the wire between two terminals is read once for each, and each of those
// terminals again as the other's neighbour. The components' readings stay kept.
TEST_F(ExportTerminalSidesTest, WiresAndTerminalsReadApartGiveTheSameSidesAndAreNotKept) {
    const auto [um, ponte] = duasBornesLigadas();
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    struct Avulso : CCExportDataReader {
        Avulso() {
            GuardaFios = false;
            GuardaBornes = false;
        }
    };
    CCExportDataReader guarda;
    Avulso avulso;
    EXPECT_TRUE(guarda.GuardaLeiturasDeFios() && guarda.GuardaLeiturasDeBornes());
    EXPECT_FALSE(avulso.GuardaLeiturasDeFios() || avulso.GuardaLeiturasDeBornes());
    std::unique_ptr<VetorItens> guardados(guarda.Le(&db(), nullptr, true, std::nullopt));
    std::unique_ptr<VetorItens> avulsos(avulso.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(guardados && avulsos);
    for (const zvdb::DbObject* objeto :
         std::initializer_list<const zvdb::DbObject*>{ponte, um, x1_, x2_}) {
        EXPECT_TRUE(guarda.LeituraGuardada(id(objeto)));
        EXPECT_FALSE(avulso.LeituraGuardada(id(objeto)));
    }
    EXPECT_TRUE(avulso.LeituraGuardada(id(k1_)));
    // Item by item, in the same order, the same fields.
    EXPECT_EQ(mesmosItens(*guardados, *avulsos,
                          [](const CEItemLista& b) -> QString {
                              return b.valorCampo("NUMERO") + ">" + b.valorCampo("RELACAO_FIM") +
                                     "/" + b.valorCampo("FIO_SEGFIM");
                          }),
              QStringList({"1>X1:2/5", "2>X1:1/5"}));
    guardados->destruirItens();
    avulsos->destruirItens();
}

// A reader that keeps no symbol the walk reads, and few of those the sides read, gives the
// sides the very fields a reader that keeps them all gives: each component the sides meet is
// read again, and the first one goes once two more came after it.
TEST_F(ExportTerminalSidesTest, ComponentsReadAgainForTheSidesGiveTheSameSidesAndFewAreKept) {
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {60, 200, 0});
    borne("X1", "3", {100, 200, 0});
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}});
    const zvdb::BlockReference* k2 = componente("-K2", {{"A1", {60, 100, 0}}});
    const zvdb::BlockReference* k3 = componente("-K3", {{"A1", {100, 100, 0}}});
    const zvdb::BlockReference* solto = componente("-K4", {{"A1", {300, 100, 0}}});
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    fio({{60, 190, 0}, {60, 100, 0}}, "2");
    fio({{100, 190, 0}, {100, 100, 0}}, "3");
    fio({{20, 200, 0}, {20, 220, 0}, {60, 220, 0}, {60, 200, 0}}, "5");
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    struct Poucos : CCExportDataReader {
        Poucos() {
            GuardaFios = false;
            GuardaBornes = false;
            GuardaSimbolos = false;
            LimitaEntidadesGuardadas(1);
        }
    };
    CCExportDataReader todos;
    Poucos poucos;
    std::unique_ptr<VetorItens> inteiros(todos.Le(&db(), nullptr, true, std::nullopt));
    std::unique_ptr<VetorItens> relidos(poucos.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(inteiros && relidos);
    for (const zvdb::DbObject* objeto :
         std::initializer_list<const zvdb::DbObject*>{k1_, k2, k3, solto})
        EXPECT_TRUE(todos.LeituraGuardada(id(objeto)));
    // The walk kept none; the sides read -K1, -K2 and -K3 in turn, one at a time.
    EXPECT_FALSE(poucos.LeituraGuardada(id(solto)));
    EXPECT_FALSE(poucos.LeituraGuardada(id(k1_)));
    EXPECT_TRUE(poucos.LeituraGuardada(id(k3)));
    // Item by item, in the same order, the same fields.
    EXPECT_EQ(mesmosItens(*inteiros, *relidos,
                          [](const CEItemLista& b) -> QString {
                              return b.valorCampo("NUMERO") + ">" + b.valorCampo("RELACAO_INI") +
                                     "/" + b.valorCampo("FIO_SEGINI");
                          }),
              QStringList({"1>-K1:A1/1", "2>-K2:A1/2", "3>-K3:A1/3"}));
    inteiros->destruirItens();
    relidos->destruirItens();
}

// A reader whose sides keep few names (as the strip drawing's) reads their neighbours and wires
// with only the values those keep: it asks for no position the sides drop, and its items are a
// full read's, less the names dropped under the sides' suffixes.
TEST_F(ExportTerminalSidesTest, NeighboursReadForFewNamesGiveTheSidesAFullReadGives) {
    const auto [um, ponte] = duasBornesLigadas();
    Q_UNUSED(um);
    Q_UNUSED(ponte);
    componente("-K2", {{"A1", {60, 100, 0}}});
    fio({{60, 190, 0}, {60, 100, 0}}, "2");
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    static const auto doLado = [](const QString& nome) {
        for (const char* sufixo : {"_INI", "_FIM", "_SEGINI", "_SEGFIM"})
            if (nome.endsWith(QLatin1String(sufixo))) return true;
        return false;
    };
    static const auto fica = [](const QString& nome) {
        for (const char* base : {"RELACAO", "TAG", "ETIQUETA", "REGUA", "STRIP", "REGLETA",
                                 "NUMERO", "NUMBER", "HANDLE", "REL", "LIG", "FIO", "DESCRICAO"})
            for (const char* sufixo : {"_INI", "_FIM", "_SEGINI", "_SEGFIM"})
                if (nome == QLatin1String(base) + QLatin1String(sufixo)) return true;
        return nome.startsWith(QLatin1String("LIG_"));
    };
    struct Filtrado : CCExportDataReader {
        explicit Filtrado(bool lados) {
            GuardaFios = false;
            GuardaBornes = false;
            GuardaSimbolos = false;
            LimitaEntidadesGuardadas(1);
            FiltraSufixos(fica);
            if (!lados) CopiasDosLados({});
        }
    };
    CCExportDataReader inteiro;
    const std::unique_ptr<VetorItens> inteiros = LeContando(inteiro).first;
    Filtrado cheios(false);
    const auto [lidosCheios, chamadasCheios] = LeContando(cheios);
    Filtrado poucos(true);
    const auto [lidosPoucos, chamadasPoucos] = LeContando(poucos);
    ASSERT_TRUE(inteiros && lidosCheios && lidosPoucos);
    // The walk asks for the position of each symbol it reads; the sides' full readings of the
    // two components, and of the two terminals as each other's neighbour, ask again.
    EXPECT_EQ(chamadasCheios, chamadasPoucos + 4);
    EXPECT_EQ(mesmosItens(*lidosCheios, *lidosPoucos,
                          [](const CEItemLista& b) -> QString {
                              return b.valorCampo("NUMERO") + "<" + b.valorCampo("RELACAO_INI") +
                                     ">" + b.valorCampo("RELACAO_FIM") + "/" +
                                     b.valorCampo("FIO_SEGINI") + "/" + b.valorCampo("FIO_SEGFIM") +
                                     (b.valorCampo("DESCRICAO_INI").isEmpty() ? "" : "/D");
                          }),
              QStringList({"1<-K1:A1>X1:2/1/5/D", "2<-K2:A1>X1:1/2/5/D"}));
    ASSERT_EQ(inteiros->size(), lidosPoucos->size());
    for (size_t i = 0; i < inteiros->size(); ++i) {
        QMap<QString, QString> esperados, vistos;
        for (auto it = (*inteiros)[i]->campos.constBegin(); it != (*inteiros)[i]->campos.constEnd();
             ++it)
            if (!doLado(it.key()) || fica(it.key())) esperados.insert(it.key(), it.value());
        for (auto it = (*lidosPoucos)[i]->campos.constBegin();
             it != (*lidosPoucos)[i]->campos.constEnd(); ++it)
            vistos.insert(it.key(), it.value());
        EXPECT_EQ(vistos, esperados) << i;
    }
    inteiros->destruirItens();
    lidosCheios->destruirItens();
    lidosPoucos->destruirItens();
}

// A reader may drop a component's fields as the walk makes it, and a terminal's once its sides
// are read: the sides read the drawing's objects, not those items, so each item is the one a
// full read gives, less what was dropped.
TEST_F(ExportTerminalSidesTest, FieldsDroppedAsItemsAreMadeLeaveTheOthersAsAFullReadGivesThem) {
    duasBornesLigadas();
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    static const auto fica = [](const QString& nome) {
        return nome == "ZV_LISTA_TIPO" || nome == "NUMERO" || nome.startsWith("RELACAO");
    };
    struct Cortador : CCExportDataReader {
        int componentes = 0, bornes = 0;
        static void Corta(CEItemLista& item) {
            item.campos.reter([](std::uint32_t nome) { return fica(CamposItem::nome(nome)); });
        }
        void ComponenteLido(CEItemLista& item) override { Corta(item), ++componentes; }
        void LadosLidos(CEItemLista& borne) override { Corta(borne), ++bornes; }
    };
    CCExportDataReader inteiro;
    Cortador cortador;
    std::unique_ptr<VetorItens> inteiros(inteiro.Le(&db(), nullptr, true, std::nullopt));
    std::unique_ptr<VetorItens> cortados(cortador.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(inteiros && cortados);
    EXPECT_EQ(cortador.componentes, 1);
    EXPECT_EQ(cortador.bornes, 2);
    ASSERT_EQ(inteiros->size(), cortados->size());
    QStringList vizinhos;
    for (size_t i = 0; i < inteiros->size(); ++i) {
        const CEItemLista& a = *(*inteiros)[i];
        const CEItemLista& b = *(*cortados)[i];
        // The accessories that follow their owners are no business of the hooks.
        const QString tipo = a.valorCampo("ZV_LISTA_TIPO");
        const bool cortado = tipo == "COMP" || tipo == "BORNE";
        QMap<QString, QString> esperados, vistos;
        for (auto it = a.campos.constBegin(); it != a.campos.constEnd(); ++it)
            if (!cortado || fica(it.key())) esperados.insert(it.key(), it.value());
        for (auto it = b.campos.constBegin(); it != b.campos.constEnd(); ++it)
            vistos.insert(it.key(), it.value());
        EXPECT_EQ(vistos, esperados) << i;
        if (cortado) {
            EXPECT_LT(b.campos.size(), a.campos.size()) << i;
        }
        if (b.valorCampo("ZV_LISTA_TIPO") == "BORNE")
            vizinhos << b.valorCampo("NUMERO") + "<" + b.valorCampo("RELACAO_INI") + ">" +
                            b.valorCampo("RELACAO_FIM");
    }
    vizinhos.sort();
    EXPECT_EQ(vizinhos, QStringList({"1<-K1:A1>X1:2", "2<>X1:1"}));
    inteiros->destruirItens();
    cortados->destruirItens();
}

// The terminals' places and layers come from their readings as the walk makes them; a second
// walk finds the readings kept and asks the references: the sides are the same.
TEST_F(ExportTerminalSidesTest, ASecondWalkOverKeptReadingsGivesTheSameSides) {
    duasBornesLigadas();
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    CCExportDataReader leitor;
    std::unique_ptr<VetorItens> primeiros(leitor.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(primeiros);
    EXPECT_TRUE(leitor.LeituraGuardada(id(x1_)));
    std::unique_ptr<VetorItens> segundos(leitor.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(segundos);
    EXPECT_EQ(mesmosItens(*primeiros, *segundos,
                          [](const CEItemLista& b) -> QString {
                              return b.valorCampo("NUMERO") + "<" + b.valorCampo("RELACAO_INI") +
                                     ">" + b.valorCampo("RELACAO_FIM") + "/" +
                                     b.valorCampo("FIO_SEGFIM");
                          }),
              QStringList({"1<-K1:A1>X1:2/5", "2<>X1:1/5"}));
    primeiros->destruirItens();
    segundos->destruirItens();
}

TEST_F(ExportTerminalSidesTest, AnInvertedTerminalSwapsItsSides) {
    x1_ = borne("X1", "1", {20, 200, 0});
    x1_->addAttribute("INVERTIDO", "s", {24, 191, 0}, 1.0);
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}});
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    le(3);
    const CEItemLista* um = borneLido("1");
    ASSERT_TRUE(um);
    EXPECT_EQ(um->valorCampo("RELACAO_FIM"), "-K1:A1");
    EXPECT_EQ(um->valorCampo("FIO_SEGFIM"), "1");
    EXPECT_FALSE(um->temCampo("RELACAO_INI"));
    EXPECT_FALSE(um->temCampo("FIO_SEGINI"));
}

TEST_F(ExportTerminalSidesTest, TheSidesAreThoseTheTerminalListReads) {
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {60, 200, 0});
    k1_ = componente("-K1", {{"A1", {20, 100, 0}}, {"A2", {60, 100, 0}}});
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    fio({{60, 190, 0}, {60, 100, 0}}, "2");
    fio({{20, 200, 0}, {20, 220, 0}, {60, 220, 0}, {60, 200, 0}}, "5");
    le(3);
    CCBorneDataReader lista;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(lista.LerDados(&db(), std::nullopt, modelo_, progresso));
    ASSERT_TRUE(lidos);
    ASSERT_EQ(lidos->size(), 2u);
    for (const CEItemLista* daLista : *lidos) {
        const CEItemLista* exportado = borneLido(daLista->valorCampo("NUMERO"));
        ASSERT_TRUE(exportado);
        EXPECT_FALSE(lados(*exportado).isEmpty());
        EXPECT_EQ(lados(*exportado), lados(*daLista));
    }
    lidos->destruirItens();
}

TEST_F(ExportTerminalSidesTest, EachSideAloneOrBothTogetherReadTheWiresOfBothPoints) {
    // X1:1 is wired at its insertion point only, X1:2 at its cut point only, X1:3 at both.
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {60, 200, 0});
    borne("X1", "3", {100, 200, 0});
    k1_ = componente(
        "-K1",
        {{"A1", {20, 300, 0}}, {"A2", {60, 100, 0}}, {"A3", {100, 100, 0}}, {"A4", {100, 300, 0}}});
    fio({{20, 200, 0}, {20, 300, 0}}, "1");
    fio({{60, 190, 0}, {60, 100, 0}}, "2");
    fio({{100, 190, 0}, {100, 100, 0}}, "3");
    fio({{100, 200, 0}, {100, 300, 0}}, "4");
    le(3);
    const CEItemLista* um = borneLido("1");
    const CEItemLista* dois = borneLido("2");
    const CEItemLista* tres = borneLido("3");
    ASSERT_TRUE(um && dois && tres);
    EXPECT_EQ(um->valorCampo("FIO_SEGFIM"), "1");
    EXPECT_EQ(dois->valorCampo("FIO_SEGINI"), "2");
    EXPECT_EQ(tres->valorCampo("FIO_SEGINI"), "3");
    EXPECT_EQ(tres->valorCampo("FIO_SEGFIM"), "4");
    CCBorneDataReader lista;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(lista.LerDados(&db(), std::nullopt, modelo_, progresso));
    ASSERT_TRUE(lidos);
    ASSERT_EQ(lidos->size(), 3u);
    for (const CEItemLista* daLista : *lidos) {
        const CEItemLista* exportado = borneLido(daLista->valorCampo("NUMERO"));
        ASSERT_TRUE(exportado);
        EXPECT_EQ(lados(*exportado), lados(*daLista));
    }
    lidos->destruirItens();
}

TEST_F(ExportTerminalSidesTest, AContactOnATerminalNamesItsComponent) {
    // The coil comes first in the block table, the contact after the terminal: the
    // terminal's side is read once both are known.
    k1_ = componente("-K1", {{"A1", {200, 100, 0}}});
    x1_ = borne("X1", "1", {20, 200, 0});
    const zvdb::BlockReference* contato = componente("-K1", {{"13", {20, 100, 0}}}, "NA-1");
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    le(3);
    const CEItemLista* um = borneLido("1");
    ASSERT_TRUE(um);
    EXPECT_EQ(um->valorCampo("HANDLE_INI"), handle(k1_));
    EXPECT_NE(um->valorCampo("HANDLE_INI"), handle(contato));
    // The contact's connection, the component's relation.
    EXPECT_EQ(um->valorCampo("RELACAO_INI"), "-K1:13");
    EXPECT_EQ(um->valorCampo("REL_INI"), "-K1");
}

// Two contacts of one component, each on a terminal: both sides take the component's fields.
// A reader whose sides keep few names reads the component for them with only the values they
// keep (and no position), and gives them what a reader of whole readings gives.
TEST_F(ExportTerminalSidesTest, AComponentOfTwoContactsGivesBothSidesWhatAWholeReadingGives) {
    k1_ = componente("-K1", {{"A1", {200, 100, 0}}});
    x1_ = borne("X1", "1", {20, 200, 0});
    x2_ = borne("X1", "2", {60, 200, 0});
    componente("-K1", {{"13", {20, 100, 0}}}, "NA-1");
    componente("-K1", {{"21", {60, 100, 0}}}, "NF-1");
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    fio({{60, 190, 0}, {60, 100, 0}}, "2");
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    static const auto fica = [](const QString& nome) {
        return nome.startsWith(QLatin1String("RELACAO_")) ||
               nome.startsWith(QLatin1String("HANDLE_")) ||
               nome.startsWith(QLatin1String("REL_")) || nome.startsWith(QLatin1String("LIG_")) ||
               nome.startsWith(QLatin1String("FIO_"));
    };
    struct Filtrado : CCExportDataReader {
        explicit Filtrado(bool lados) {
            GuardaSimbolos = false;
            FiltraSufixos(fica);
            if (!lados) CopiasDosLados({});
        }
    };
    Filtrado cheio(false);
    const auto [cheios, chamadasCheio] = LeContando(cheio);
    Filtrado poucos(true);
    const auto [lidos, chamadasPoucos] = LeContando(poucos);
    ASSERT_TRUE(cheios && lidos);
    // Full readings ask for the positions of the component, once for both sides, and of the
    // two wires; the walk's five symbols ask in both reads.
    EXPECT_EQ(chamadasPoucos, 5);
    EXPECT_EQ(chamadasCheio, chamadasPoucos + 3);
    EXPECT_TRUE(poucos.LeituraGuardada(id(k1_)));
    const QString k1 = handle(k1_);
    EXPECT_EQ(mesmosItens(*cheios, *lidos,
                          [&k1](const CEItemLista& b) -> QString {
                              return b.valorCampo("NUMERO") + "<" + b.valorCampo("RELACAO_INI") +
                                     (b.valorCampo("HANDLE_INI") == k1 ? "=K1" : "") + "/" +
                                     b.valorCampo("FIO_SEGINI");
                          }),
              QStringList({"1<-K1:13=K1/1", "2<-K1:21=K1/2"}));
    cheios->destruirItens();
    lidos->destruirItens();
}

// The reader names a contact's component while it keeps its readings; once it gave them back,
// the contact stands for itself.
TEST_F(ExportTerminalSidesTest, TheComponentsRelationsGoWithTheReadings) {
    k1_ = componente("-K1", {{"A1", {200, 100, 0}}});
    const zvdb::BlockReference* contato = componente("-K1", {{"13", {20, 100, 0}}}, "NA-1");
    ASSERT_TRUE(lisp("(setq EXPORTA 3)"));
    CCExportDataReader leitor;
    std::unique_ptr<VetorItens> itens(leitor.Le(&db(), nullptr, true, std::nullopt));
    ASSERT_TRUE(itens);
    const auto copia = [&] {
        CEItemLista item;
        leitor.CopiaAtributos("_X", item, handle(contato));
        return item.valorCampo("HANDLE_X");
    };
    EXPECT_EQ(copia(), handle(k1_));
    leitor.LiberaLeituras();
    EXPECT_EQ(copia(), handle(contato));
    itens->destruirItens();
}

// The block names that make a terminal (BORNE..., BOR-...) and a contact (NA-...) count in
// any case; a name that only starts alike does not.
TEST_F(ExportTerminalSidesTest, TerminalAndContactBlockNamesCountInAnyCase) {
    k1_ = componente("-K1", {{"A1", {200, 100, 0}}});
    x1_ = simbolo("borne_1", {20, 200, 0},
                  {{"REGUA", "X1", {24, 197, 0}}, {"NUMERO", "1", {24, 194, 0}}}, "1001");
    x1_->setXData("KVR_ZV_PTS_CORTE",
                  zvsample::XDataItems().point({20, 200, 0}).point({20, 190, 0}).tags());
    x2_ = simbolo("Bor-2", {60, 200, 0},
                  {{"REGUA", "X1", {64, 197, 0}}, {"NUMERO", "2", {64, 194, 0}}}, "1001");
    const zvdb::BlockReference* quase =
        simbolo("BORN_3", {100, 200, 0},
                {{"REGUA", "X1", {104, 197, 0}}, {"NUMERO", "3", {104, 194, 0}}}, "1001");
    const zvdb::BlockReference* contato = componente("-K1", {{"13", {20, 100, 0}}}, "nA-1");
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    le(3);
    QMap<QString, QString> tipoPorHandle;
    for (const CEItemLista* item : lidos_)
        tipoPorHandle.insert(item->valorCampo("HANDLE"), item->valorCampo("ZV_LISTA_TIPO"));
    EXPECT_EQ(tipoPorHandle.value(handle(x1_)), "BORNE");
    EXPECT_EQ(tipoPorHandle.value(handle(x2_)), "BORNE");
    EXPECT_EQ(tipoPorHandle.value(handle(quase)), "COMP");
    EXPECT_EQ(tipoPorHandle.value(handle(k1_)), "COMP");
    // The lower-case terminal's side is read, and its contact names the component.
    const CEItemLista* um = borneLido("1");
    ASSERT_TRUE(um);
    EXPECT_EQ(um->valorCampo("HANDLE_INI"), handle(k1_));
    EXPECT_NE(um->valorCampo("HANDLE_INI"), handle(contato));
    EXPECT_EQ(um->valorCampo("RELACAO_INI"), "-K1:13");
}

TEST_F(ExportTerminalSidesTest, AnEquipmentsConnectionNameTellsItsEntryOnTheWire) {
    equipamento(true);
    le(3);
    const CEItemLista* eq = borneLido("1");
    ASSERT_TRUE(eq);
    // Connection 1 (the insertion point) meets -K1, connection 2 (the cut point) -K2.
    EXPECT_EQ(eq->valorCampo("RELACAO_FIM"), "-K1:A1");
    EXPECT_EQ(eq->valorCampo("RELACAO_INI"), "-K2:A1");
}

TEST_F(ExportTerminalSidesTest, WithoutTheEquipmentsDataThePointsMixUpItsSides) {
    equipamento(false);
    le(3);
    const CEItemLista* eq = borneLido("1");
    ASSERT_TRUE(eq);
    EXPECT_EQ(eq->valorCampo("RELACAO_FIM"), "-K2:A1");
    EXPECT_EQ(eq->valorCampo("RELACAO_INI"), "-K1:A1");
}

// ---- the other side of a wire's terminal end

TEST_F(ExportReaderTest, AWiresTerminalEndTellsTheWireAcrossTheTerminal) {
    // Wire 1 ends at X1:1's cut point; wire 9 leaves its insertion point to -K2.
    x1_ = borne("X1", "1", {20, 200, 0});
    componente("-K1", {{"A1", {20, 100, 0}}});
    componente("-K2", {{"A1", {20, 300, 0}}}, "BOBINA2");
    fio({{20, 190, 0}, {20, 100, 0}}, "1");
    fio({{20, 200, 0}, {20, 300, 0}}, "9");
    le(2);
    const CEItemLista* fio1 = doFio("1");
    const CEItemLista* fio9 = doFio("9");
    ASSERT_TRUE(fio1);
    ASSERT_TRUE(fio9);
    // Each wire's terminal end names the other wire under the second suffix.
    EXPECT_EQ(fio1->valorCampo("FIO_SEGINI"), "9");
    EXPECT_EQ(fio9->valorCampo("FIO_SEGINI"), "1");
    // A wire's end away from the terminal keeps its own stretch.
    EXPECT_EQ(fio1->valorCampo("FIO_SEGFIM"), "1");
}

// ---- messages

TEST_F(ExportReaderTest, TheTerminalExportSaysNothingOfRepeatedNumbers) {
    // Two strips that both start at 1, the first bridged: the terminal list says its
    // jumpers stay unlinked, the export, which draws no jumpers, does not.
    borne("X1", "1", {20, 200, 0})->addAttribute("JUMPER", "2", {24, 191, 0}, 1.0);
    borne("X1", "2", {60, 200, 0});
    borne("X2", "1", {100, 200, 0});
    const QString aviso = CIMensagens::Mensagem("ZVLISTAS", 329);
    ASSERT_FALSE(aviso.isEmpty());
    le(1);
    EXPECT_EQ(tipos().value("BORNE"), 3);
    EXPECT_FALSE(saida().contains(aviso)) << saida().toStdString();
    CCBorneDataReader lista;
    CIProgress progresso;
    std::unique_ptr<VetorItens> lidos(lista.LerDados(&db(), std::nullopt, modelo_, progresso));
    ASSERT_TRUE(lidos);
    EXPECT_TRUE(saida().contains(aviso)) << saida().toStdString();
    lidos->destruirItens();
}

}  // namespace
