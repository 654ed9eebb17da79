// The dialogs the export dialog opens: format options, columns and one column in detail,
// filters and sort, the name of a new configuration and the list of configurations.
#include "AmbienteDialogos.h"
#include "dialogs/CIDlgExportConfig.h"
#include "dialogs/CIDlgNome.h"
#include "dialogs/CIDlgOpcoes.h"
#include "dialogs/CIDlgPropDetail.h"
#include "dialogs/CIFiltro.h"
#include "dialogs/CISelProps.h"
#include "export/CEExportacao.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDir>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QTableWidget>
#include <QTreeWidget>

using teste::AmbienteDialogos;

namespace {

QStringList Textos(const QComboBox* lista) {
    QStringList textos;
    for (int i = 0; i < lista->count(); ++i)
        textos << lista->itemText(i);
    return textos;
}

QStringList Textos(const QListWidget* lista) {
    QStringList textos;
    for (int i = 0; i < lista->count(); ++i)
        textos << lista->item(i)->text();
    return textos;
}

QString Msg(int numero) {
    return CIMensagens::Mensagem("ZVLISTAS", numero);
}

class Editores : public AmbienteDialogos {
protected:
    std::vector<CEPropExport> TresColunas() {
        std::vector<CEPropExport> colunas = {CEPropExport("REGUA"), CEPropExport("NUMERO"),
                                             CEPropExport("DESCRICAO")};
        colunas[1].Agrupa = true;
        colunas[2].Visivel = false;
        return colunas;
    }
    static std::vector<QString> Tags(const std::vector<CEPropExport>& colunas) {
        std::vector<QString> tags;
        for (const auto& c : colunas)
            tags.push_back(c.Tag);
        return tags;
    }
    CEExportacao exp;
};

}  // namespace

// ---- format options

TEST_F(Editores, OptionsShowTheFormatsKeysWithTheirLabels) {
    const std::pair<int, std::vector<std::pair<QString, int>>> casos[] = {
        {CEExportacao::Csv,
         {{"CSV_CABECALHO_SN", 0x2A}, {"CSV_DELIM_CAMPO", 0x2B}, {"CSV_DELIM_TEXTO", 0x2C}}},
        {CEExportacao::Xml, {{"XML_VAZIAS_SN", 0x30}, {"XML_PROMPT_SN", 0x31}}},
        {CEExportacao::Html,
         {{"HTML_CABECALHO_SN", 0x2A}, {"HTML_CABE_NEG_SN", 0x32}, {"HTML_LARG_TABELA", 0x33}}},
        {CEExportacao::Xlsx,
         {{"XLSX_CABECALHO_SN", 0x2A}, {"XLSX_TEMPLATE", 0x2F}, {"XLSX_LINHA_INI_INT", 0x9B}}},
        {CEExportacao::Emf, {{"DWG_SEPARADOR", 0x70}, {"DWG_NUMERO_DIGITOS", 0x71}}},
        {CEExportacao::Pdf,
         {{"PDF_SMART_SN", 0xFA},
          {"PDF_PAPER_SIZE_PZ", 0x4E},
          {"PDF_ORIENTATION_LP", 0x4F},
          {"PDF_TABELA_ESTILO", 0x6B},
          {"PDF_DPI", 0x6F},
          {"PDF_PESOLINHA_SN", 0xDF},
          {"PDF_WATERMARK", 0x2D}}},
    };
    for (const auto& [formato, chaves] : casos) {
        EXPECT_EQ(CIDlgOpcoes::Chaves(formato), chaves) << formato;
        CIDlgOpcoes d(exp, formato);
        ASSERT_EQ(d.Tabela()->rowCount(), int(chaves.size()));
        for (int i = 0; i < int(chaves.size()); ++i) {
            EXPECT_EQ(d.Tabela()->item(i, 0)->text(), Msg(chaves[size_t(i)].second));
            EXPECT_FALSE(d.Tabela()->item(i, 0)->text().isEmpty());
        }
    }
    for (int formato : {CEExportacao::Png, CEExportacao::Dwg, CEExportacao::Dwf, CEExportacao::Dxf})
        EXPECT_EQ(CIDlgOpcoes::Chaves(formato), CIDlgOpcoes::Chaves(CEExportacao::Emf));
}

TEST_F(Editores, OptionEditorsFollowTheKeysSuffix) {
    QDir(pasta.path()).mkpath("plotstyles");
    for (const char* nome : {"b.ctb", "A.CTB", "c.stb"})
        teste::Grava(pasta.filePath(QString("plotstyles/") + nome), "x");
    exp.SetOpcao("PDF_ORIENTATION_LP", "P");
    exp.SetOpcao("PDF_TABELA_ESTILO", "b.ctb");
    exp.SetOpcao("PDF_SMART_SN", "N");
    CIDlgOpcoes d(exp, CEExportacao::Pdf);
    auto* sn = qobject_cast<QComboBox*>(d.Editor("PDF_SMART_SN"));
    ASSERT_NE(sn, nullptr);
    EXPECT_EQ(Textos(sn), QStringList({"Yes", "No"}));
    EXPECT_EQ(sn->currentText(), "No");
    auto* lp = qobject_cast<QComboBox*>(d.Editor("PDF_ORIENTATION_LP"));
    ASSERT_NE(lp, nullptr);
    EXPECT_EQ(Textos(lp), QStringList({"Landscape", "Portrait"}));
    EXPECT_EQ(lp->currentText(), "Portrait");
    auto* estilo = qobject_cast<QComboBox*>(d.Editor("PDF_TABELA_ESTILO"));
    ASSERT_NE(estilo, nullptr);
    EXPECT_EQ(Textos(estilo), QStringList({"", "A.CTB", "b.ctb"}));
    EXPECT_EQ(estilo->currentText(), "b.ctb");
    auto* papel = qobject_cast<QComboBox*>(d.Editor("PDF_PAPER_SIZE_PZ"));
    ASSERT_NE(papel, nullptr);
    ASSERT_EQ(papel->count(), 10);
    for (int i = 0; i < 10; ++i)
        EXPECT_EQ(papel->itemText(i), Msg(0xBA + i));
    EXPECT_NE(qobject_cast<QLineEdit*>(d.Editor("PDF_DPI")), nullptr);
    EXPECT_NE(qobject_cast<QLineEdit*>(d.Editor("PDF_WATERMARK")), nullptr);
    EXPECT_EQ(d.Editor("CSV_DELIM_CAMPO"), nullptr);

    CIDlgOpcoes x(exp, CEExportacao::Xlsx);
    auto* linha = qobject_cast<QLineEdit*>(x.Editor("XLSX_LINHA_INI_INT"));
    ASSERT_NE(linha, nullptr);
    ASSERT_NE(linha->validator(), nullptr);
    QString texto = "12a";
    int pos = 0;
    EXPECT_EQ(linha->validator()->validate(texto, pos), QValidator::Invalid);
    EXPECT_EQ(qobject_cast<QLineEdit*>(x.Editor("XLSX_TEMPLATE"))->validator(), nullptr);
}

TEST_F(Editores, OptionsConfirmedWriteEveryRowBackAndCancelledWriteNothing) {
    {
        CIDlgOpcoes d(exp, CEExportacao::Csv);
        qobject_cast<QLineEdit*>(d.Editor("CSV_DELIM_CAMPO"))->setText(",");
        qobject_cast<QComboBox*>(d.Editor("CSV_CABECALHO_SN"))->setCurrentIndex(1);
        d.reject();
    }
    EXPECT_EQ(exp.GetOpcao("CSV_DELIM_CAMPO"), ";");
    EXPECT_EQ(exp.GetOpcao("CSV_CABECALHO_SN"), "S");
    CIDlgOpcoes d(exp, CEExportacao::Csv);
    qobject_cast<QLineEdit*>(d.Editor("CSV_DELIM_CAMPO"))->setText(",");
    qobject_cast<QComboBox*>(d.Editor("CSV_CABECALHO_SN"))->setCurrentIndex(1);
    qobject_cast<QLineEdit*>(d.Editor("CSV_DELIM_TEXTO"))->setText("'");
    d.accept();
    EXPECT_EQ(exp.GetOpcao("CSV_DELIM_CAMPO"), ",");
    EXPECT_EQ(exp.GetOpcao("CSV_CABECALHO_SN"), "N");
    EXPECT_EQ(exp.GetOpcao("CSV_DELIM_TEXTO"), "'");
}

TEST_F(Editores, ThePaperListUntouchedStoresTheEntryItShows) {
    // The stored default is no name of the list: the first entry shows, and OK keeps it.
    ASSERT_EQ(exp.GetOpcao("PDF_PAPER_SIZE_PZ"), "ISO A4 (210 x 297 mm)");
    {
        CIDlgOpcoes d(exp, CEExportacao::Pdf);
        EXPECT_EQ(qobject_cast<QComboBox*>(d.Editor("PDF_PAPER_SIZE_PZ"))->currentIndex(), 0);
        d.accept();
    }
    EXPECT_EQ(exp.GetOpcao("PDF_PAPER_SIZE_PZ"), Msg(0xBA));
    // No paper at all shows A4.
    exp.SetOpcao("PDF_PAPER_SIZE_PZ", "");
    CIDlgOpcoes d(exp, CEExportacao::Pdf);
    d.accept();
    EXPECT_EQ(exp.GetOpcao("PDF_PAPER_SIZE_PZ"), "A4 (210 x 297 mm)");
}

// ---- one column

TEST_F(Editores, TheColumnDetailShowsAndSetsEveryField) {
    CEPropExport coluna("REGUA");
    coluna.Titulo = "Régua";
    coluna.Tamanho = "5";
    coluna.Preenche = "0";
    coluna.Literal = true;
    coluna.Direita = true;
    CIDlgPropDetail d(coluna);
    EXPECT_EQ(d.Nome()->text(), "REGUA");
    EXPECT_EQ(d.Titulo()->text(), "Régua");
    EXPECT_EQ(d.Largura()->text(), "5");
    EXPECT_EQ(d.Preenche()->text(), "0");
    EXPECT_TRUE(d.Preenche()->isReadOnly());
    EXPECT_FALSE(d.Agrupa()->isChecked());
    EXPECT_TRUE(d.Literal()->isChecked());
    EXPECT_FALSE(d.Concatena()->isChecked());
    EXPECT_EQ(d.Alinhamento()->currentIndex(), 1);

    d.Nome()->setText("NUMERO");
    d.Titulo()->setText("Nº");
    d.Largura()->setText("3");
    Q_EMIT d.Largura()->textEdited("3");
    EXPECT_FALSE(d.Preenche()->isReadOnly());
    d.Preenche()->setText("-");
    d.Agrupa()->setChecked(true);
    d.Literal()->setChecked(false);
    d.Concatena()->setChecked(true);
    d.Alinhamento()->setCurrentIndex(0);
    d.accept();
    EXPECT_EQ(coluna.Tag, "NUMERO");
    EXPECT_EQ(coluna.Rotulo, "NUMERO");
    EXPECT_EQ(coluna.Titulo, "Nº");
    EXPECT_EQ(coluna.Tamanho, "3");
    EXPECT_EQ(coluna.Preenche, "-");
    EXPECT_TRUE(coluna.Agrupa);
    EXPECT_FALSE(coluna.Literal);
    EXPECT_TRUE(coluna.Concatena);
    EXPECT_FALSE(coluna.Direita);
    EXPECT_TRUE(coluna.Visivel);
}

TEST_F(Editores, AColumnNeedsAFieldAndGetsATitle) {
    CEPropExport nova;
    CIDlgPropDetail d(nova);
    EXPECT_FALSE(d.BotaoOk()->isEnabled());
    d.accept();
    EXPECT_TRUE(nova.Tag.isEmpty());
    d.Nome()->setText("DESCRICAO");
    EXPECT_TRUE(d.BotaoOk()->isEnabled());
    d.accept();
    EXPECT_EQ(nova.Tag, "DESCRICAO");
    EXPECT_EQ(nova.Titulo, "DESCRICAO");
    CEPropExport intacta("A");
    {
        CIDlgPropDetail c(intacta);
        c.Nome()->setText("B");
        c.reject();
    }
    EXPECT_EQ(intacta.Tag, "A");
}

// ---- the columns

TEST_F(Editores, TheColumnsListShowsVisibilityAndTitleInOrder) {
    std::vector<CEPropExport> colunas = TresColunas();
    CISelProps d(colunas);
    EXPECT_EQ(Textos(d.Lista()), QStringList({"REGUA", "NUMERO", "DESCRICAO"}));
    EXPECT_EQ(d.Lista()->item(0)->checkState(), Qt::Checked);
    EXPECT_EQ(d.Lista()->item(2)->checkState(), Qt::Unchecked);
    d.Lista()->setCurrentRow(2);
    d.Sobe();
    EXPECT_EQ(Textos(d.Lista()), QStringList({"REGUA", "DESCRICAO", "NUMERO"}));
    EXPECT_EQ(d.Lista()->currentRow(), 1);
    d.Sobe();
    d.Sobe();  // at the top: nothing
    EXPECT_EQ(Textos(d.Lista()), QStringList({"DESCRICAO", "REGUA", "NUMERO"}));
    d.Lista()->setCurrentRow(1);
    d.Desce();
    d.Desce();
    EXPECT_EQ(Textos(d.Lista()), QStringList({"DESCRICAO", "NUMERO", "REGUA"}));
    d.Lista()->item(0)->setCheckState(Qt::Checked);
    d.Lista()->item(1)->setCheckState(Qt::Unchecked);
    d.Lista()->setCurrentRow(2);
    d.Remove();
    EXPECT_EQ(Textos(d.Lista()), QStringList({"DESCRICAO", "NUMERO"}));
    // Nothing reaches the driver's columns before OK.
    EXPECT_EQ(Tags(colunas), std::vector<QString>({"REGUA", "NUMERO", "DESCRICAO"}));
    d.accept();
    EXPECT_EQ(Tags(colunas), std::vector<QString>({"DESCRICAO", "NUMERO"}));
    EXPECT_TRUE(colunas[0].Visivel);
    EXPECT_FALSE(colunas[1].Visivel);
    EXPECT_TRUE(colunas[1].Agrupa);
}

TEST_F(Editores, ANewColumnGoesToTheEndAndIsTheOnlyGroupKey) {
    std::vector<CEPropExport> colunas = TresColunas();
    CISelProps d(colunas);
    d.MostraDialogo = Mostrador();
    Responde([](QDialog& dlg) {
        auto* p = dynamic_cast<CIDlgPropDetail*>(&dlg);
        EXPECT_NE(p, nullptr);
        if (!p) return int(QDialog::Rejected);
        EXPECT_TRUE(p->Nome()->text().isEmpty());
        p->Nome()->setText("PAGINA");
        p->Agrupa()->setChecked(true);
        p->accept();
        return int(QDialog::Accepted);
    });
    d.Adiciona();
    // A cancelled detail adds nothing.
    Responde([](QDialog&) { return int(QDialog::Rejected); });
    d.Adiciona();
    EXPECT_EQ(Textos(d.Lista()), QStringList({"REGUA", "NUMERO", "DESCRICAO", "PAGINA"}));
    EXPECT_EQ(d.Lista()->currentRow(), 3);
    d.accept();
    ASSERT_EQ(colunas.size(), 4u);
    EXPECT_EQ(colunas[3].Tag, "PAGINA");
    EXPECT_TRUE(colunas[3].Agrupa);
    EXPECT_TRUE(colunas[3].Visivel);
    EXPECT_FALSE(colunas[1].Agrupa);
}

TEST_F(Editores, EditingAColumnChangesItsRowOnly) {
    std::vector<CEPropExport> colunas = TresColunas();
    CISelProps d(colunas);
    d.MostraDialogo = Mostrador();
    Responde([](QDialog& dlg) {
        auto* p = dynamic_cast<CIDlgPropDetail*>(&dlg);
        EXPECT_NE(p, nullptr);
        if (!p) return int(QDialog::Rejected);
        EXPECT_EQ(p->Nome()->text(), "REGUA");
        p->Titulo()->setText("Strip");
        p->accept();
        return int(QDialog::Accepted);
    });
    d.Lista()->setCurrentRow(0);
    d.Edita();
    EXPECT_EQ(Textos(d.Lista()), QStringList({"Strip", "NUMERO", "DESCRICAO"}));
    d.reject();
    EXPECT_EQ(colunas[0].Titulo, "REGUA");
}

TEST_F(Editores, ColumnsConfirmedKeepTheWindowPlaceAndCancelledKeepNothing) {
    std::vector<CEPropExport> colunas = TresColunas();
    {
        CISelProps d(colunas);
        d.Lista()->setCurrentRow(0);
        d.Remove();
        d.reject();
    }
    EXPECT_EQ(colunas.size(), 3u);
    EXPECT_FALSE(QFile::exists(Estado("EXPORTSELPROPS.DAT")));
    CISelProps d(colunas);
    d.setGeometry(120, 80, 520, 420);
    d.accept();
    const QByteArray texto = teste::Le(Estado("EXPORTSELPROPS.DAT"));
    EXPECT_EQ(texto, "120\r\n80\r\n520\r\n420\r\n");
    CISelProps outro(colunas);
    EXPECT_EQ(outro.geometry(), QRect(120, 80, 520, 420));
}

// ---- filters and sort

TEST_F(Editores, FiltersAreAddedChangedAndRemovedInTheList) {
    exp.Colunas = TresColunas();
    exp.Filtros = {CEFiltroExport("REGUA", 0, "X1")};
    CIFiltro d(exp);
    QTreeWidget* lista = d.Lista();
    ASSERT_EQ(lista->topLevelItemCount(), 1);
    EXPECT_EQ(lista->topLevelItem(0)->text(1), "equals");
    // Selecting a row shows it in the edit area.
    EXPECT_EQ(d.Campo()->currentText(), "REGUA");
    EXPECT_EQ(d.Valor()->text(), "X1");
    QStringList operadores;
    for (int i = 0; i < d.Operador()->count(); ++i)
        operadores << d.Operador()->itemText(i);
    QStringList esperados;
    for (int n = 99; n <= 0x6A; ++n)
        esperados << Msg(n);
    EXPECT_EQ(operadores, esperados);
    EXPECT_EQ(Textos(d.Campo()), QStringList({"REGUA", "NUMERO", "DESCRICAO"}));

    d.Campo()->setCurrentText("NUMERO");
    d.Operador()->setCurrentIndex(7);
    d.Valor()->setText("0");
    d.Adiciona();
    ASSERT_EQ(lista->topLevelItemCount(), 2);
    EXPECT_EQ(lista->topLevelItem(1)->text(1), "does not end with");
    lista->setCurrentItem(lista->topLevelItem(0));
    d.Operador()->setCurrentIndex(2);
    d.Altera();
    EXPECT_EQ(lista->topLevelItem(0)->text(1), "contains");
    d.Campo()->setCurrentText("");
    d.Adiciona();  // no field, no row
    EXPECT_EQ(lista->topLevelItemCount(), 2);
    d.Campo()->setCurrentText("PAGINA");
    d.Adiciona();
    lista->setCurrentItem(lista->topLevelItem(1));
    d.Remove();
    EXPECT_EQ(exp.Filtros.size(), 1u);  // nothing before OK
    d.accept();
    ASSERT_EQ(exp.Filtros.size(), 2u);
    EXPECT_EQ(exp.Filtros[0], CEFiltroExport("REGUA", 2, "X1"));
    EXPECT_EQ(exp.Filtros[1], CEFiltroExport("PAGINA", 2, "X1"));
}

TEST_F(Editores, TheSortFieldsMoveBetweenTwoListsAndTheDirectionIsCOrD) {
    exp.Colunas = TresColunas();
    exp.SetOpcao("FLT_NOME_ORDENAR_POR", "NUMERO;PAGINA");
    exp.SetOpcao("FLT_TIPO_ORDEM", "d");
    CIFiltro d(exp);
    EXPECT_EQ(Textos(d.Ordenar()), QStringList({"NUMERO", "PAGINA"}));
    EXPECT_EQ(Textos(d.Disponiveis()), QStringList({"REGUA", "DESCRICAO"}));
    EXPECT_EQ(d.Ordem()->currentIndex(), 1);
    d.Disponiveis()->setCurrentRow(1);
    d.ParaOrdem();
    d.Ordenar()->setCurrentRow(0);
    d.DaOrdem();
    EXPECT_EQ(Textos(d.Ordenar()), QStringList({"PAGINA", "DESCRICAO"}));
    EXPECT_EQ(Textos(d.Disponiveis()), QStringList({"REGUA", "NUMERO"}));
    d.Ordem()->setCurrentIndex(0);
    d.accept();
    EXPECT_EQ(exp.GetOpcao("FLT_NOME_ORDENAR_POR"), "PAGINA;DESCRICAO");
    EXPECT_EQ(exp.GetOpcao("FLT_TIPO_ORDEM"), "C");
    {
        CIFiltro e(exp);
        e.Ordem()->setCurrentIndex(1);
        e.accept();
    }
    EXPECT_EQ(exp.GetOpcao("FLT_TIPO_ORDEM"), "D");
}

TEST_F(Editores, FiltersKeepTheWindowAndTheColumnWidths) {
    std::vector<int> padrao;
    {
        CIFiltro d(exp);
        // No stored widths: 75, or what a heading or an operator needs.
        for (int i = 0; i < 3; ++i) {
            const QTreeWidget* lista = d.Lista();
            padrao.push_back(lista->columnWidth(i));
            EXPECT_GE(padrao.back(), 75);
            EXPECT_GE(padrao.back(),
                      lista->fontMetrics().horizontalAdvance(lista->headerItem()->text(i)));
        }
        EXPECT_EQ(padrao[2], 75);
        EXPECT_GE(padrao[1], d.fontMetrics().horizontalAdvance("does not start with"));
        d.Lista()->setColumnWidth(0, 140);
        d.reject();
    }
    EXPECT_FALSE(QFile::exists(Estado("EXPORTFILTRO.DAT")));
    {
        CIFiltro d(exp);
        d.setGeometry(50, 60, 640, 560);
        d.Lista()->setColumnWidth(0, 140);
        d.Lista()->setColumnWidth(2, 90);
        d.accept();
    }
    EXPECT_EQ(teste::Le(Estado("EXPORTFILTRO.DAT")),
              "50\r\n60\r\n640\r\n560\r\n140\r\n" + QByteArray::number(padrao[1]) + "\r\n90\r\n");
    teste::Grava(Estado("EXPORTFILTRO.DAT"), "50\r\n60\r\n640\r\n560\r\n140\r\n77\r\n90\r\n");
    CIFiltro d(exp);
    EXPECT_EQ(d.geometry(), QRect(50, 60, 640, 560));
    EXPECT_EQ(d.Lista()->columnWidth(0), 140);
    EXPECT_EQ(d.Lista()->columnWidth(1), 77);
    EXPECT_EQ(d.Lista()->columnWidth(2), 90);
}

// ---- names

TEST_F(Editores, TheNameDialogProposesAndTrims) {
    CIDlgNome d("New configuration 2");
    EXPECT_EQ(d.Campo()->text(), "New configuration 2");
    EXPECT_TRUE(d.BotaoOk()->isEnabled());
    d.Campo()->setText("   ");
    EXPECT_FALSE(d.BotaoOk()->isEnabled());
    d.Campo()->setText("  Quadro 1 ");
    EXPECT_EQ(d.Nome(), "Quadro 1");
}

TEST_F(Editores, TheConfigurationListLeavesOutTheUnnamedOne) {
    CIDlgExportConfig d({"", "A", "B"}, "B");
    ASSERT_EQ(d.Lista()->topLevelItemCount(), 2);
    EXPECT_EQ(d.Lista()->topLevelItem(0)->text(0), "A");
    EXPECT_EQ(d.Selecionada(), "B");
    CIDlgExportConfig nenhuma({"", "A"}, "");
    EXPECT_TRUE(nenhuma.Selecionada().isEmpty());
}
