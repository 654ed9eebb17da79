// The export reader on small schematics: the kinds it reads for each EXPORTA value, each
// marked in ZV_LISTA_TIPO, and what a wire's item learns about a terminal at its ends.
#include "readers/CCExportDataReader.h"
#include "readers/FioFixture.h"

#include "export/CEExportacao.h"

#include <QMap>

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
