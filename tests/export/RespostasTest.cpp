// The export dialog answered from a script, through the command-line host's answers.
#include "QtPrinters.h"
#include "app/ConsoleUserInterface.h"
#include "export/CEExportConfigs.h"
#include "export/CEExportacao.h"
#include "export/RespostasExportacao.h"

#include <QTextStream>

#include <gtest/gtest.h>

using RespostasExportacao::Resultado;

namespace {

class Respostas : public ::testing::Test {
protected:
    void SetUp() override {
        const QByteArray texto =
            "{}\r\n-CFG_ATIVO=Painel\r\n\r\n"
            "{Painel}\r\n[]\r\nTIPO_IN=FIOS\r\n"
            "[FIOS]\r\nTIPO_IN=FIOS\r\nTIPO_OUT=XLSX\r\nXLSX_LINHA_INI_INT=3\r\n"
            "*FIO*S*N*Fio*N*N*N**\r\n*{FIO}/{SEQUENCIA}*S*N*Rotulo*S*N*N*6*-\r\n"
            "#FIO#3#X\r\n"
            "[BORNES]\r\nTIPO_OUT=CSV\r\nCSV_DELIM_CAMPO=,\r\n*REGUA*S*N*Regua*N*N*N**\r\n"
            "\r\n{Outra}\r\n[]\r\nTIPO_IN=CABOS\r\n[CABOS]\r\nTIPO_OUT=PDF\r\n";
        ASSERT_TRUE(configs.LeTexto(texto));
    }
    Resultado Preenche(const QString& tipo, const QStringList& respostas) {
        for (const QString& r : respostas)
            EXPECT_TRUE(ui.addAnswer(r)) << r.toStdString();
        return RespostasExportacao::Preenche(exp, configs, tipo, ui, 1, &erro);
    }

    QString saida, erros;
    QTextStream out{&saida}, err{&erros};
    zvhost::ConsoleUserInterface ui{out, err, false};
    CEExportConfigs configs;
    CEExportacao exp;
    QString erro;
};

}  // namespace

TEST_F(Respostas, TheActiveConfigurationAndItsLastKind) {
    ASSERT_EQ(Preenche("", {"export:file=/tmp/x.xlsx"}), Resultado::Confirmado);
    EXPECT_EQ(exp.TipoIn, CEExportacao::Fios);
    EXPECT_EQ(exp.TipoOut, CEExportacao::Xlsx);
    EXPECT_EQ(exp.TipoOutPagina, CEExportacao::Xlsx);
    EXPECT_EQ(exp.Arquivo, "/tmp/x.xlsx");
    EXPECT_EQ(exp.GetOpcao("XLSX_LINHA_INI_INT"), "3");
    ASSERT_EQ(exp.Colunas.size(), 2u);
    EXPECT_EQ(exp.Colunas[0].Tag, "FIO");
    EXPECT_EQ(exp.Colunas[1].Tag, "{FIO}/{SEQUENCIA}");
    // The dialog's own load sets what the stored row says, the literal flag included.
    EXPECT_TRUE(exp.Colunas[1].Literal);
    EXPECT_EQ(exp.Colunas[1].Tamanho, "6");
    EXPECT_EQ(exp.Colunas[1].Preenche, "-");
    ASSERT_EQ(exp.Filtros.size(), 1u);
    EXPECT_EQ(exp.Filtros[0], CEFiltroExport("FIO", 3, "X"));
    EXPECT_TRUE(erros.isEmpty()) << erros.toStdString();
}

TEST_F(Respostas, TheCommandsKindAndAnswersOverride) {
    ASSERT_EQ(Preenche("BORNES", {"export:format=HTML", "export:option:HTML_LARG_TABELA=3",
                                  "export:option:CSV_DELIM_CAMPO==", "export:pages=A;B",
                                  "export:file=/tmp/b.html"}),
              Resultado::Confirmado);
    EXPECT_EQ(exp.TipoIn, CEExportacao::Bornes);
    EXPECT_EQ(exp.TipoOut, CEExportacao::Html);
    EXPECT_EQ(exp.GetOpcao("HTML_LARG_TABELA"), "3");
    EXPECT_EQ(exp.GetOpcao("CSV_DELIM_CAMPO"), "=");
    EXPECT_EQ(exp.GetOpcao("PAGINAS"), "A;B");
    ASSERT_EQ(exp.Colunas.size(), 1u);
    EXPECT_EQ(exp.Colunas[0].Titulo, "Regua");
}

TEST_F(Respostas, AnotherConfigurationAndKind) {
    ASSERT_EQ(Preenche("", {"export:config=Outra", "export:type=ANILHAS", "export:file=f"}),
              Resultado::Confirmado);
    EXPECT_EQ(exp.TipoIn, CEExportacao::Anilhas);
    // No stored rows for the kind: its default columns, and the first data format.
    ASSERT_EQ(exp.Colunas.size(), 1u);
    EXPECT_EQ(exp.Colunas[0].Tag, "ANILHA");
    EXPECT_EQ(exp.TipoOut, CEExportacao::Csv);
}

TEST_F(Respostas, AStoredPageFormatIsNotKeptForADataList) {
    ASSERT_EQ(Preenche("", {"export:config=Outra", "export:file=f"}), Resultado::Confirmado);
    EXPECT_EQ(exp.TipoIn, CEExportacao::Cabos);
    EXPECT_EQ(exp.TipoOut, CEExportacao::Csv);
    EXPECT_EQ(exp.Colunas.size(), 4u);
}

TEST_F(Respostas, WithoutAFileTheDialogIsCancelledAndStderrSaysWhy) {
    EXPECT_EQ(Preenche("BORNES", {"export:format=CSV"}), Resultado::Cancelado);
    EXPECT_TRUE(erros.contains("export:file")) << erros.toStdString();
    EXPECT_TRUE(exp.Arquivo.isEmpty());
}

TEST_F(Respostas, BadAnswersAreRefusedWithTheirReason) {
    const std::pair<QStringList, const char*> casos[] = {
        {{"export:config=Nenhuma"}, "Nenhuma"},
        {{"export:type=bornes"}, "bornes"},
        {{"export:format=XLS"}, "XLS"},
        {{"export:format=PDF"}, "PDF"},
        {{"export:type=PAGINAS", "export:format=CSV"}, "CSV"},
        {{"export:formato=CSV"}, "export:formato"},
        {{"export:option:=1"}, "export:option:"},
        {{"export:file="}, "export:file"},
    };
    for (const auto& [respostas, motivo] : casos) {
        CEExportacao novo;
        zvhost::ConsoleUserInterface outra{out, err, false};
        for (const QString& r : respostas)
            outra.addAnswer(r);
        if (!respostas.join(' ').contains("export:file")) outra.addAnswer("export:file=x");
        QString porque;
        EXPECT_EQ(RespostasExportacao::Preenche(novo, configs, "", outra, 1, &porque),
                  Resultado::Invalido)
            << respostas.join(' ').toStdString();
        EXPECT_TRUE(porque.contains(motivo)) << porque.toStdString();
    }
}

TEST(ConsoleAnswers, PresetAnswersAndNamesNeverCancel) {
    QString saida, erros;
    QTextStream out{&saida}, err{&erros};
    zvhost::ConsoleUserInterface ui{out, err, false};
    ui.addAnswer("export:option:B=2");
    ui.addAnswer("export:option:A=1");
    ui.addAnswer("export:type=FIOS");
    EXPECT_EQ(ui.presetAnswer("export:type").value_or("-"), "FIOS");
    EXPECT_FALSE(ui.presetAnswer("export:format").has_value());
    EXPECT_EQ(ui.presetAnswerNames("export:option:"),
              (QStringList{"export:option:A", "export:option:B"}));
    EXPECT_TRUE(erros.isEmpty());
    ui.showFile("/tmp/saida.csv");
    EXPECT_EQ(saida, "/tmp/saida.csv\n");
}
