// The routes of the manual wire layout as a reader finds them: records of the drawing's
// object store, their segments turned into "end-end" keys with the lists' end labels.
#include "QtPrinters.h"
#include "cad/CELayoutRotasFios.h"
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "drawing/Dictionary.h"
#include "lists/TemplateDouble.h"
#include "readers/LeitorBase.h"
#include "readers/ZVString.h"

namespace {

using Leitor = LeitorBase;
using Rotas = QHash<QString, QString>;

class RouteLookupTest : public FacadeFixture {
protected:
    void SetUp() override {
        FacadeFixture::SetUp();
        bloco_ = db().createBlock("SIMBOLO");
        bloco_->addLine({0, 0, 0}, {10, 0, 0});
        borne_ = simbolo({{"REGUA", "X1"}, {"NUMERO", "7"}});
        // The English tags answer when the Portuguese ones are absent.
        borneIngles_ = simbolo({{"STRIP", "X2"}, {"NUMBER", "3"}});
        rele_ = simbolo({{"RELACAO", "K1"}});
        semRotulo_ = simbolo({{"OUTRO", "?"}});
        modelo_.simbolos["*CHAR_SEP_STD_CFG*"] = ":";
        modelo_.simbolos["*CHAR_SEP_LIG_CFG*"] = "/";
    }

    QString simbolo(const std::vector<std::pair<std::string, std::string>>& atributos) {
        auto* ref = db().modelSpace()->addBlockReference(*bloco_, {0, 0, 0}, {1, 1, 1}, 0, "0");
        double y = 0;
        for (const auto& [tag, valor] : atributos)
            ref->addAttribute(tag, valor, {0, y -= 2, 0}, 1.0);
        return handle(ref);
    }
    static QString handle(const zvdb::DbObject* objeto) {
        return ZVString::DeHandle(objeto->handle());
    }

    void rota(const QString& chave, const QString& dados) {
        CELayoutRotasFios registro;
        registro.strKeyFio = chave;
        registro.strRotaData = dados;
        registro.Gravar();
    }
    Rotas caminhos(Leitor& leitor, const QString& chave) {
        leitor.LeRotasFio(chave, &modelo_);
        const Rotas* achadas = leitor.Caminhos(chave);
        return achadas ? *achadas : Rotas();
    }

    zvdb::BlockRecord* bloco_ = nullptr;
    QString borne_, borneIngles_, rele_, semRotulo_;
    TemplateDouble modelo_;
};

TEST_F(RouteLookupTest, EndLabelsComeFromStripAndNumberOrRelation) {
    Leitor leitor;
    EXPECT_EQ(leitor.RotuloElemento(borne_, "A", &modelo_), "X1:7/A");
    EXPECT_EQ(leitor.RotuloElemento(borne_, "", &modelo_), "X1:7/");
    EXPECT_EQ(leitor.RotuloElemento(borneIngles_, "", &modelo_), "X2:3/");
    EXPECT_EQ(leitor.RotuloElemento(rele_, "13", &modelo_), "K1:13");
    EXPECT_EQ(leitor.RotuloElemento(rele_, "", &modelo_), "K1");
    EXPECT_EQ(leitor.RotuloElemento(semRotulo_, "13", &modelo_), "");
    EXPECT_EQ(leitor.RotuloElemento("FFFFFF", "13", &modelo_), "");
    // Without separators the first is ":"; without a template the export settings speak.
    modelo_.simbolos.clear();
    EXPECT_EQ(leitor.RotuloElemento(borne_, "A", &modelo_), "X1:7A");
    CICad::SetStringLisp("*EXPORT_CHAR_SEP*", ".");
    CICad::SetStringLisp("*EXPORT_CHAR_SEP_LIG*", "_");
    EXPECT_EQ(leitor.RotuloElemento(borne_, "A", nullptr), "X1.7_A");
}

TEST_F(RouteLookupTest, SegmentsBecomeEndToEndRoutes) {
    rota("101", QString("%1:A-%2:13-P1-P2-P3$%3-%2-D1$%1-%2$").arg(borne_, rele_, borneIngles_));
    Leitor leitor;
    // A segment of two parts is skipped; the route keeps all its points.
    EXPECT_EQ(caminhos(leitor, "101"), (Rotas{{"X1:7/A-K1:13", "P1-P2-P3"}, {"X2:3/-K1", "D1"}}));
}

TEST_F(RouteLookupTest, AnEndWithMoreThanOneColonHasNoConnection) {
    rota("7", QString("%1:A:B-%2-R").arg(borne_, rele_));
    Leitor leitor;
    EXPECT_EQ(caminhos(leitor, "7"), (Rotas{{"X1:7/-K1", "R"}}));
}

TEST_F(RouteLookupTest, TheFirstRecordWithSegmentsWins) {
    rota("5", "");
    rota("5", QString("%1-%2-FIRST").arg(rele_, borne_));
    rota("5", QString("%1-%2-SECOND").arg(rele_, borne_));
    Leitor leitor;
    // The store keeps records by key; which came first is the store's order.
    const auto registros = ZVData::CESerializable::CarregarClasse("CELayoutRotasFios");
    QString esperado;
    for (const auto& [chave, campos] : registros)
        if (esperado.isEmpty() && !campos.value("strRotaData").isEmpty())
            esperado = campos.value("strRotaData").section('-', 2);
    EXPECT_EQ(caminhos(leitor, "5"), (Rotas{{"K1-X1:7/", esperado}}));
}

TEST_F(RouteLookupTest, RoutesAreReadOncePerReader) {
    rota("9", QString("%1-%2-OLD").arg(rele_, borne_));
    Leitor leitor;
    EXPECT_EQ(caminhos(leitor, "9"), (Rotas{{"K1-X1:7/", "OLD"}}));
    EXPECT_EQ(caminhos(leitor, "10"), Rotas());
    EXPECT_EQ(leitor.Caminhos("10"), nullptr);
    // A record written later is not seen by this reader, for either key; a new one sees it.
    ZVData::CESerializable::ApagarClasse("CELayoutRotasFios");
    rota("9", QString("%1-%2-NEW").arg(rele_, borne_));
    rota("10", QString("%1-%2-NEW").arg(rele_, borne_));
    EXPECT_EQ(caminhos(leitor, "9"), (Rotas{{"K1-X1:7/", "OLD"}}));
    EXPECT_EQ(caminhos(leitor, "10"), Rotas());
    Leitor novo;
    EXPECT_EQ(caminhos(novo, "9"), (Rotas{{"K1-X1:7/", "NEW"}}));
}

TEST_F(RouteLookupTest, ADrawingWithoutAStoreGainsItAndHasNoRoutes) {
    EXPECT_FALSE(db().namedObjects()->get("ZV_DATA_MGR"));
    Leitor leitor;
    EXPECT_EQ(caminhos(leitor, "1"), Rotas());
    zvdb::Dictionary* loja = db().namedObjects()->getDictionary("ZV_DATA_MGR");
    ASSERT_TRUE(loja);
    EXPECT_TRUE(loja->getDictionary("CELayoutRotasFios"));
}

}  // namespace
