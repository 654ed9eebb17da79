// Each dialog as a user sees it: drawn offscreen, written as PNG (into
// build/tests/dialog-grabs, or the folder of ZV_DIALOG_GRABS), and checked for what a look
// would catch: a window with nothing drawn in it, texts cut short, lists left empty.
#include "AmbienteDialogos.h"
#include "dialogs/CIDlgExportConfig.h"
#include "dialogs/CIDlgExporta.h"
#include "dialogs/CIDlgNome.h"
#include "dialogs/CIDlgOpcoes.h"
#include "dialogs/CIDlgPropDetail.h"
#include "dialogs/CIFiltro.h"
#include "dialogs/CISelProps.h"
#include "export/CEExportConfigs.h"
#include "export/CEExportacao.h"
#include "settings/CIRegistro.h"

#include <QAbstractButton>
#include <QComboBox>
#include <QDir>
#include <QImage>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPixmap>
#include <QTableWidget>
#include <QTest>
#include <QTreeWidget>

namespace {

QString PastaImagens() {
    const QString dada = qEnvironmentVariable("ZV_DIALOG_GRABS");
    const QString pasta = dada.isEmpty() ? QString(ZV_BIN_DIR) + "/../tests/dialog-grabs" : dada;
    QDir().mkpath(pasta);
    return pasta;
}

// The share of the pixels that differ from the window's background.
double Conteudo(const QImage& imagem, const QColor& fundo) {
    if (imagem.isNull()) return 0;
    qint64 diferentes = 0;
    for (int y = 0; y < imagem.height(); ++y)
        for (int x = 0; x < imagem.width(); ++x)
            if (imagem.pixelColor(x, y) != fundo) ++diferentes;
    return double(diferentes) / (double(imagem.width()) * imagem.height());
}

class Aparencia : public teste::AmbienteDialogos {
protected:
    // Shows, grabs and writes the dialog; checks that something is drawn and that every
    // text has the room it needs.
    void Olha(QDialog& d, const QString& nome) {
        d.show();
        ASSERT_TRUE(QTest::qWaitForWindowExposed(&d));
        QApplication::processEvents();
        const QImage imagem = d.grab().toImage();
        EXPECT_TRUE(imagem.save(PastaImagens() + "/" + nome + ".png")) << nome.toStdString();
        EXPECT_GT(Conteudo(imagem, d.palette().color(QPalette::Window)), 0.04)
            << nome.toStdString() << ": the window looks empty";
        EXPECT_FALSE(d.windowTitle().isEmpty()) << nome.toStdString();
        for (const QLabel* rotulo : d.findChildren<QLabel*>()) {
            if (!rotulo->isVisible()) continue;
            EXPECT_FALSE(rotulo->text().isEmpty()) << nome.toStdString();
            EXPECT_GE(rotulo->width(), rotulo->minimumSizeHint().width())
                << nome.toStdString() << ": " << rotulo->text().toStdString() << " is cut";
        }
        for (const QAbstractButton* botao : d.findChildren<QAbstractButton*>()) {
            if (!botao->isVisible() || botao->text().isEmpty()) continue;
            EXPECT_GE(botao->width(), botao->sizeHint().width())
                << nome.toStdString() << ": " << botao->text().toStdString() << " is cut";
        }
        for (const QTreeWidget* arvore : d.findChildren<QTreeWidget*>()) {
            if (!arvore->isVisible()) continue;
            for (int i = 0; i < arvore->columnCount(); ++i) {
                const QString cabecalho = arvore->headerItem()->text(i);
                EXPECT_GE(arvore->columnWidth(i),
                          arvore->fontMetrics().horizontalAdvance(cabecalho))
                    << nome.toStdString() << ": the heading " << cabecalho.toStdString()
                    << " is cut";
            }
        }
        for (const QComboBox* lista : d.findChildren<QComboBox*>()) {
            if (!lista->isVisible() || lista->isEditable()) continue;
            EXPECT_GT(lista->count(), 0) << nome.toStdString() << ": an empty list";
        }
        d.hide();
    }
    std::vector<CEPropExport> Colunas() {
        std::vector<CEPropExport> colunas = {CEPropExport("REGUA"), CEPropExport("NUMERO"),
                                             CEPropExport("DESCRICAO")};
        colunas[2].Visivel = false;
        return colunas;
    }
};

}  // namespace

TEST_F(Aparencia, AnEmptyWindowIsCaught) {
    // The check the grabs rely on tells a window with nothing in it.
    QDialog vazio;
    vazio.resize(400, 300);
    vazio.show();
    ASSERT_TRUE(QTest::qWaitForWindowExposed(&vazio));
    EXPECT_LT(Conteudo(vazio.grab().toImage(), vazio.palette().color(QPalette::Window)), 0.04);
    // And the export dialog before it loads anything has empty lists.
    CEExportConfigs configs;
    CEExportacao exp;
    CIDlgExporta semCarga(&exp, &configs, QString());
    EXPECT_EQ(semCarga.Resumo()->count(), 0);
    EXPECT_EQ(semCarga.Formato()->count(), 0);
}

TEST_F(Aparencia, TheExportDialog) {
    CEExportConfigs configs;
    configs.CarregaConfigs();
    CEExportacao exp;
    CIDlgExporta d(&exp, &configs, QString());
    d.Inicia();
    EXPECT_GT(d.Resumo()->count(), 0);
    EXPECT_FALSE(d.Arquivo()->text().isEmpty());
    Olha(d, "export");
    CIDlgExporta paginas(&exp, &configs, "PAGINAS");
    paginas.Inicia();
    Olha(paginas, "export-pages");
}

TEST_F(Aparencia, TheOptionsOfEachFormat) {
    CEExportacao exp;
    for (int formato : {CEExportacao::Csv, CEExportacao::Xml, CEExportacao::Html,
                        CEExportacao::Xlsx, CEExportacao::Png, CEExportacao::Pdf}) {
        CIDlgOpcoes d(exp, formato);
        EXPECT_GT(d.Tabela()->rowCount(), 0);
        Olha(d, "options-" + CEExportacao::PalavraDeTipoOut(formato).toLower());
        // Every value can be read whole.
        for (int i = 0; i < d.Tabela()->rowCount(); ++i) {
            const QWidget* editor = d.Tabela()->cellWidget(i, 1);
            ASSERT_NE(editor, nullptr);
            EXPECT_GE(d.Tabela()->columnWidth(1), editor->minimumSizeHint().width());
            const QString rotulo = d.Tabela()->item(i, 0)->text();
            EXPECT_GE(d.Tabela()->columnWidth(0), d.fontMetrics().horizontalAdvance(rotulo))
                << rotulo.toStdString() << " is cut";
        }
    }
}

TEST_F(Aparencia, TheColumnsFiltersAndDetail) {
    std::vector<CEPropExport> colunas = Colunas();
    CISelProps props(colunas);
    EXPECT_EQ(props.Lista()->count(), 3);
    Olha(props, "columns");
    CEPropExport coluna("REGUA");
    CIDlgPropDetail detalhe(coluna);
    Olha(detalhe, "column");
    CEExportacao exp;
    exp.Colunas = colunas;
    exp.Filtros = {CEFiltroExport("REGUA", 4, "X"), CEFiltroExport("NUMERO", 1, "0")};
    exp.SetOpcao("FLT_NOME_ORDENAR_POR", "NUMERO");
    CIFiltro filtro(exp);
    EXPECT_EQ(filtro.Lista()->topLevelItemCount(), 2);
    Olha(filtro, "filters");
}

TEST_F(Aparencia, TheNameAndTheListOfConfigurations) {
    CIDlgNome nome("New configuration 1");
    Olha(nome, "name");
    CIDlgExportConfig lista({"", "Painel", "Outra"}, "Painel");
    EXPECT_EQ(lista.Lista()->topLevelItemCount(), 2);
    Olha(lista, "configurations");
}

TEST_F(Aparencia, EveryLanguageFits) {
    for (const auto& [idioma, sufixo] : {std::pair{1, "pt"}, std::pair{3, "es"}}) {
        ASSERT_TRUE(CIRegistro::SetIdiomaMenuSel(idioma));
        CIMensagens::Descarregar();
        CEExportConfigs configs;
        configs.CarregaConfigs();
        CEExportacao exp;
        CIDlgExporta d(&exp, &configs, QString());
        d.Inicia();
        // The texts are the language's own: "Bornes" for terminals in both.
        EXPECT_EQ(d.Tipo()->itemText(0), "Bornes");
        EXPECT_EQ(d.Tipo()->itemText(7), idioma == 1 ? "Tudo" : "Todo");
        Olha(d, QString("export-") + sufixo);
        exp.Colunas = Colunas();
        CIFiltro filtro(exp);
        Olha(filtro, QString("filters-") + sufixo);
        CEPropExport coluna("REGUA");
        CIDlgPropDetail detalhe(coluna);
        Olha(detalhe, QString("column-") + sufixo);
        CIDlgOpcoes opcoes(exp, CEExportacao::Pdf);
        Olha(opcoes, QString("options-pdf-") + sufixo);
        std::vector<CEPropExport> lista = Colunas();
        CISelProps props(lista);
        Olha(props, QString("columns-") + sufixo);
    }
    CIRegistro::SetIdiomaMenuSel(2);
}
