// The look-ups of the lists against the demo catalogue in SQLite: every operation, the
// fallback texts, the cache of a run, and a key that breaks its statement.
#include "CatalogoTeste.h"

#include "catalogue/CECacheCatalogo.h"
#include "catalogue/CEConexaoCatalogo.h"
#include "catalogue/CEConsultasCatalogo.h"
#include "settings/CIMensagens.h"
#include "settings/CIRegistro.h"

namespace {

const QChar kSep(0x000C);

class ConsultasSqliteTest : public CatalogoTeste {
protected:
    void SetUp() override {
        CatalogoTeste::SetUp();
        UsarDemo("1");
    }
    CEConexaoCatalogo& Conexao() { return *CEConexaoCatalogo::ObterCatalogo(); }
};

TEST_F(ConsultasSqliteTest, DescriptionsFollowTheCatalogueLanguage) {
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Fonte chaveada 24 Vcc 5 A");
    EXPECT_EQ(consultas.DescricaoFio("10008"), "Cabo flexível 2,5 mm² preto");
    EXPECT_EQ(consultas.DescricaoCabo("20003"), "Cabo de comando 7x0,75 mm² numerado");
    CIRegistro::SetLibLang("2");
    EXPECT_EQ(consultas.DescricaoComp("7001"), "Switch-mode power supply 24 V DC 5 A");
    CIRegistro::SetLibLang("3");
    EXPECT_EQ(consultas.DescricaoFio("10010"), "Cable flexible 2,5 mm² verde-amarillo");
    EXPECT_EQ(Conexao().UltimaInstrucao(),
              "select rtrim(WENU_DESCR) as WENU_DESCR from BDWENUS where WENU_KEY = '10010' AND "
              "WENU_KEY_LANG = '3'");
}

TEST_F(ConsultasSqliteTest, ListFlagsMaterialTypeAndBlocks) {
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.ListaComp("7001", "1"), "S");
    EXPECT_EQ(Conexao().UltimaInstrucao(),
              "select ZV_LISTA from BDZV where ZV_KEY='7001' and\tZV_KEY_NOR ='1'");
    EXPECT_EQ(consultas.ListaComp("8503", "2"), "N");
    EXPECT_EQ(consultas.ListaComp("7001", "9"), "");  // no row for that standard
    EXPECT_EQ(consultas.ListaFio("10001", "1"), "S");
    EXPECT_EQ(consultas.ListaCabo("20004", "2"), "S");
    EXPECT_EQ(consultas.MaterialSap("7001"), "100070011");
    EXPECT_EQ(consultas.MaterialSap("10001"), "");  // wires carry type F, not C
    EXPECT_EQ(consultas.TipoComp("1001"), "5");
    EXPECT_EQ(consultas.TipoComp("8502"), "18");
    EXPECT_EQ(consultas.BlocoRepresentacao("1001", "1", "2"), "REGUA_BX2_5_GY");
    EXPECT_EQ(consultas.BlocoRepresentacao("2001", "2", "1"), "TOPO_CT09_10_24DC");
    EXPECT_EQ(consultas.BlocoRepresentacao("7401", "1", "1"), "");  // motors have no front view
}

TEST_F(ConsultasSqliteTest, UserColumnsAccessoriesAndPrompts) {
    CEConsultasCatalogo consultas;
    const QStringList comp = consultas.ColunasComp("1001");
    EXPECT_EQ(comp.first(), "USER_KEY" + QString(kSep) + "1001");
    EXPECT_TRUE(comp.contains("FABRICANTE" + QString(kSep) + "Bornax"));
    EXPECT_TRUE(comp.contains("LARGURA_MM" + QString(kSep) + "5.2"));
    EXPECT_TRUE(consultas.ColunasFio("10013").contains("COR" + QString(kSep) + "GNYE"));
    EXPECT_TRUE(consultas.ColunasCabo("20006").contains("VIAS" + QString(kSep) + "12"));
    EXPECT_TRUE(consultas.ColunasComp("4242").isEmpty());

    EXPECT_EQ(consultas.AcessoriosDe("6003"), (QStringList{"6202#2", "6203#0"}));
    EXPECT_EQ(consultas.AcessoriosDe("9001"), QStringList{"9011#16"});
    EXPECT_TRUE(consultas.AcessoriosDe("7001").isEmpty());

    EXPECT_EQ(consultas.PromptCampo("TENSAO", false), "Tensão");
    EXPECT_EQ(consultas.PromptCampo("SECAO_MM2", true), "Seção (mm²)");
    EXPECT_EQ(consultas.PromptCampo("NAO_EXISTE", false), "NAO_EXISTE");
}

TEST_F(ConsultasSqliteTest, PageGroupsByLanguage) {
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.GrupoNome("3", "2"), "Power diagrams");
    EXPECT_EQ(consultas.GrupoNome("4", "3"), "Esquemas de mando");
    EXPECT_EQ(consultas.GrupoDescricao("3", "1"), "TITULO");
    EXPECT_EQ(consultas.GrupoDescricao("6", "1"), "TITULO_LISTA");
    EXPECT_EQ(consultas.GrupoSequencial("6", "1"), "1");
    EXPECT_EQ(consultas.GrupoSequencial("3", "1"), "0");
    EXPECT_EQ(consultas.GrupoNome("99", "1"), "");
}

TEST_F(ConsultasSqliteTest, MissingDescriptionsTakeTheirMessageInTheCache) {
    CEConsultasCatalogo consultas;
    EXPECT_EQ(consultas.DescricaoComp("4242"), "");
    CIRegistro::SetLibLang("4");  // a language the catalogue has no texts in
    EXPECT_EQ(consultas.DescricaoComp("7001"), "");

    CECacheCatalogo cache;
    const QString comp = CIMensagens::Mensagem("ZVLISTAS", 108);
    ASSERT_FALSE(comp.isEmpty());
    EXPECT_EQ(cache.DescricaoComp("7001"), comp);
    EXPECT_EQ(cache.DescricaoCabo("20001"), CIMensagens::Mensagem("ZVLISTAS", 109));
    EXPECT_EQ(cache.DescricaoFio("10001"), CIMensagens::Mensagem("ZVLISTAS", 110));
    // The message stands in the cache like a description: no second statement.
    const int antes = Conexao().InstrucoesEnviadas();
    EXPECT_EQ(cache.DescricaoComp("7001"), comp);
    EXPECT_EQ(Conexao().InstrucoesEnviadas(), antes);
    EXPECT_TRUE(Caixas().isEmpty()) << Caixas().toStdString();
}

TEST_F(ConsultasSqliteTest, TheCacheAsksOncePerKeyAndUpperCasesFlags) {
    ASSERT_TRUE(Conexao().Executar(
        "insert into BDZV (ZV_KEY, ZV_KEY_NOR, ZV_LISTA) values ('7777', '1', 's')"));
    CECacheCatalogo cache;
    const QStringList chaves = {"1001", "2001", "3001", "7777"};
    const int antes = Conexao().InstrucoesEnviadas();
    for (int i = 0; i < 400; ++i) {
        const QString& chave = chaves[i % chaves.size()];
        cache.ListaComp(chave, "1");
        cache.ListaComp(chave, "2");
        cache.TipoComp(chave);
    }
    // Four keys in two standards, and four types.
    EXPECT_EQ(Conexao().InstrucoesEnviadas() - antes, 12);
    EXPECT_EQ(cache.ListaComp("7777", "1"), "S");
    EXPECT_EQ(cache.Consultas().ListaComp("7777", "1"), "s");
    EXPECT_EQ(cache.ListaComp("7777", "2"), "");
    EXPECT_EQ(cache.BlocoRepresentacao("1001", "1", "1"), "TOPO_BX2_5_GY");
    EXPECT_EQ(cache.BlocoRepresentacao("1001", "1", "2"), "REGUA_BX2_5_GY");
}

TEST_F(ConsultasSqliteTest, KeysFromDrawingsNeverChangeAStatement) {
    ConfereChavesDeDesenhos();
}

TEST(ConexaoCatalogo, FailedStatementsAreCutAfter47Characters) {
    const QString curta = QString(50, 'x');
    EXPECT_EQ(CEConexaoCatalogo::InstrucaoCortada(curta), curta);
    EXPECT_EQ(CEConexaoCatalogo::InstrucaoCortada(QString(51, 'y')), QString(47, 'y') + "...");
    EXPECT_EQ(CEConexaoCatalogo::InstrucaoCortada(""), "");
}

}  // namespace
