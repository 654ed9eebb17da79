// The message files: tables by section, loaded once, in the language of the settings file.
#include "AmbienteTeste.h"
#include "cad/CICad.h"
#include "settings/CIRegistro.h"

namespace {

const QString kSemArquivo = QStringLiteral("Arquivo nÃƒÂ£o existe.");

class CIMensagensTest : public AmbienteTeste {
protected:
    // A message file with one language per entry, each a list of (number, text).
    static QByteArray Arquivo(const QList<QList<QPair<int, QString>>>& linguas) {
        QString xml = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<mensagens>\n";
        for (const auto& lingua : linguas) {
            xml += "  <idioma>\n    <lista>\n";
            for (const auto& [numero, texto] : lingua)
                xml += QString("      <msg numero=\"%1\" texto=\"%2\"/>\n")
                           .arg(numero)
                           .arg(texto.toHtmlEscaped());
            xml += "    </lista>\n  </idioma>\n";
        }
        return (xml + "</mensagens>\n").toUtf8();
    }

    static QByteArray TresLinguas() {
        return Arquivo({{{63, "Lista concluída."}, {88, "Template inválido."}},
                        {{63, "List finished."}, {88, "Bad template."}},
                        {{63, "Lista terminada."}, {88, "Plantilla inválida."}}});
    }

    bool EscreveListas(const QByteArray& conteudo) {
        return Escreve(PastaPrograma() + "/ZVListas.config", conteudo);
    }

    int LinhasDeCarga() const {
        return int(Le(CICad::ArquivoLog())
                       .count("Loading " + PastaPrograma().toUtf8() + "/ZVListas.config"));
    }
};

TEST_F(CIMensagensTest, AMissingFileGivesItsAnswerAndIsLookedForAgain) {
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), kSemArquivo);
    EXPECT_EQ(CIMensagens::Mensagem("SECAO_DESCONHECIDA", 63), kSemArquivo);
    ASSERT_TRUE(EscreveListas(TresLinguas()));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "List finished.");
}

TEST_F(CIMensagensTest, ANumberThatTheTableLacksGivesEmptyText) {
    ASSERT_TRUE(EscreveListas(TresLinguas()));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 88), "Bad template.");
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 64), QString());
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", -63), QString());
}

TEST_F(CIMensagensTest, TheLanguageComesFromTheSettingsAndZeroMeansEnglish) {
    ASSERT_TRUE(EscreveListas(TresLinguas()));
    EXPECT_EQ(CIMensagens::IdiomaAtual(), 2);
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "List finished.");
    const QList<QPair<QString, QString>> casos = {{"1", "Lista concluída."},
                                                  {"2", "List finished."},
                                                  {"3", "Lista terminada."},
                                                  {"0", "List finished."},
                                                  {"", "List finished."}};
    for (const auto& [idioma, texto] : casos) {
        CIRegistro::GravarRegistro("IdiomaMenuSel", idioma);
        CIMensagens::Descarregar();
        EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), texto) << idioma.toStdString();
    }
    CIRegistro::SetIdiomaMenuSel(0);
    EXPECT_EQ(CIMensagens::IdiomaAtual(), 2);
    CIRegistro::SetIdiomaMenuSel(3);
    EXPECT_EQ(CIMensagens::IdiomaAtual(), 3);
}

TEST_F(CIMensagensTest, ATableIsReadOnceAndKeepsItsLanguage) {
    CIRegistro::SetIdiomaMenuSel(1);
    ASSERT_TRUE(EscreveListas(TresLinguas()));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "Lista concluída.");
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 88), "Template inválido.");
    EXPECT_EQ(LinhasDeCarga(), 1);

    // Neither a new file nor a new language reaches a table already loaded.
    ASSERT_TRUE(EscreveListas(Arquivo({{{63, "Outro texto."}}})));
    CIRegistro::SetIdiomaMenuSel(3);
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "Lista concluída.");
    EXPECT_EQ(LinhasDeCarga(), 1);

    CIMensagens::Descarregar();
    CIRegistro::SetIdiomaMenuSel(1);
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "Outro texto.");
    EXPECT_EQ(LinhasDeCarga(), 2);
}

TEST_F(CIMensagensTest, SectionsHaveTablesOfTheirOwnAndTwoShareOneFile) {
    ASSERT_TRUE(EscreveListas(TresLinguas()));
    ASSERT_TRUE(Escreve(PastaPrograma() + "/ZVINC.config",
                        Arquivo({{{17, "pt"}}, {{17, "Two layers: "}}, {{17, "es"}}})));
    ASSERT_TRUE(Escreve(PastaPrograma() + "/ZVPaletteMsg.config",
                        Arquivo({{{5, "pt"}}, {{5, "Palette"}}, {{5, "es"}}})));
    EXPECT_EQ(CIMensagens::Mensagem("ZVINC", 17), "Two layers: ");
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 17), QString());
    EXPECT_EQ(CIMensagens::Mensagem("ZVPALETTE", 5), "Palette");
    EXPECT_EQ(CIMensagens::Mensagem("ZVVIEWER", 5), "Palette");
    EXPECT_EQ(CIMensagens::Mensagem("ZVCABOS", 5), kSemArquivo);
    EXPECT_EQ(CIMensagens::Mensagem("zvlistas", 63), kSemArquivo);
}

TEST_F(CIMensagensTest, TheProductNameIsReplacedEverywhere) {
    ASSERT_TRUE(EscreveListas(
        Arquivo({{}, {{1, "[PRODUCTNAME] and [PRODUCTNAME] ([SHORTPRODUCTNAME])[PRODUCTNAME]"}}})));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 1),
              "Ferrovolt Electrical and Ferrovolt Electrical (FV)Ferrovolt Electrical");
}

TEST_F(CIMensagensTest, AFileWithoutTheLanguageGivesEmptyTexts) {
    ASSERT_TRUE(EscreveListas(Arquivo({{{63, "Lista concluída."}}})));
    CIRegistro::SetIdiomaMenuSel(3);
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), QString());
    CIMensagens::Descarregar();
    CIRegistro::SetIdiomaMenuSel(-1);
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), QString());
    CIMensagens::Descarregar();
    CIRegistro::SetIdiomaMenuSel(1);
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "Lista concluída.");
}

TEST_F(CIMensagensTest, OnlyTheOrderOfAttributesCountsAndOnlyTheFirstChildIsRead) {
    ASSERT_TRUE(EscreveListas(R"(<?xml version="1.0" encoding="UTF-8"?>
<!-- languages -->
<a>
  <um/>
  <dois>
    <!-- the messages -->
    <x>
      <m zz="5" aa="Cinco"/>
      <n b="6" a="Seis" c="ignored"/>
      <o yy="7" xx="Sete&#10;linhas"/>
      <p only="8"/>
      <q/>
    </x>
    <y><m n="9" t="Nove"/></y>
  </dois>
  <tres><x><m n="5" t="Cinco em espanhol"/></x></tres>
</a>)"));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 5), "Cinco");
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 6), "Seis");
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 7), "Sete\nlinhas");
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 8), QString());
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 9), QString());
}

TEST_F(CIMensagensTest, ABrokenFileGivesEmptyTextsAndIsReadAgainLater) {
    ASSERT_TRUE(EscreveListas("<mensagens><idioma/><idioma><lista><msg n=\"63\" t=\"x\"/>"));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), QString());
    ASSERT_TRUE(EscreveListas(TresLinguas()));
    EXPECT_EQ(CIMensagens::Mensagem("ZVLISTAS", 63), "List finished.");
}

}  // namespace
