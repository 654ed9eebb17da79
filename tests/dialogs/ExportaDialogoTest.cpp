// The export dialog: what it loads, what each field does to the driver, the questions on
// OK and Cancel, and the configurations it makes, opens, saves and deletes.
#include "AmbienteDialogos.h"
#include "cad/CICad.h"
#include "dialogs/CIDlgExportConfig.h"
#include "dialogs/CIDlgExporta.h"
#include "dialogs/CIDlgNome.h"
#include "dialogs/CIDlgOpcoes.h"
#include "dialogs/CIDlgPropDetail.h"
#include "dialogs/CIFiltro.h"
#include "dialogs/CISelProps.h"
#include "export/CEExportConfigs.h"
#include "export/CEExportacao.h"
#include "export/RespostasExportacao.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDir>
#include <QLineEdit>
#include <QListWidget>
#include <QPushButton>
#include <QStandardPaths>
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

// Every field of a column, for comparisons.
QStringList Campos(const CEPropExport& c) {
    return {c.Tag,
            c.Titulo,
            c.Tamanho,
            c.Preenche,
            c.Visivel ? "visible" : "hidden",
            c.Agrupa ? "groups" : "-",
            c.Literal ? "literal" : "-",
            c.Concatena ? "joins" : "-",
            c.Direita ? "right" : "left"};
}

std::vector<QStringList> Campos(const std::vector<CEPropExport>& colunas) {
    std::vector<QStringList> campos;
    for (const CEPropExport& c : colunas)
        campos.push_back(Campos(c));
    return campos;
}

std::vector<std::pair<QString, QString>> Pares(const MapaOrdenado& mapa) {
    std::vector<std::pair<QString, QString>> pares(mapa.begin(), mapa.end());
    std::sort(pares.begin(), pares.end());
    return pares;
}

class Exporta : public AmbienteDialogos {
protected:
    void SetUp() override {
        AmbienteDialogos::SetUp();
        configs.CarregaConfigs();
        ASSERT_EQ(configs.ObtemConfigAtiva(), "Painel");
    }
    CIDlgExporta& Abre(const QString& tipo = QString()) {
        dialogo = std::make_unique<CIDlgExporta>(&exp, &configs, tipo);
        dialogo->MostraDialogo = Mostrador();
        dialogo->Inicia();
        return *dialogo;
    }
    // As a user picks an entry of a list: the entry with that datum.
    static void Escolhe(QComboBox* lista, int dado) {
        const int i = lista->findData(dado);
        ASSERT_GE(i, 0) << dado;
        lista->setCurrentIndex(i);
        Q_EMIT lista->activated(i);
    }
    QString Titulo(const QString& config, bool modificada = false) const {
        return CIMensagens::Mensagem("ZVLISTAS", 1) + " - " + config + (modificada ? "*" : "");
    }

    CEExportConfigs configs;
    CEExportacao exp;
    std::unique_ptr<CIDlgExporta> dialogo;
};

}  // namespace

TEST_F(Exporta, StartsWithTheActiveConfigurationAndTheKindItExportedLast) {
    CIDlgExporta& d = Abre();
    EXPECT_EQ(d.NomeConfig, "Painel");
    EXPECT_EQ(d.TipoPalavra, "FIOS");
    EXPECT_EQ(d.TipoAnterior, CEExportacao::Fios);
    EXPECT_EQ(d.windowTitle(), "FV Export - Painel");
    EXPECT_EQ(d.Tipo()->currentText(), "Wires");
    EXPECT_EQ(Textos(d.Tipo()),
              QStringList({"Terminals", "Wires", "Ferrules", "Components", "Wires and components",
                           "Pages", "Cables", "Everything"}));
    EXPECT_EQ(Textos(d.Formato()),
              QStringList({"CSV file", "XML file", "HTML page", "Excel workbook"}));
    EXPECT_EQ(d.Formato()->currentText(), "Excel workbook");
    const CEExportacao& r = d.Rascunho();
    EXPECT_EQ(r.TipoIn, CEExportacao::Fios);
    EXPECT_EQ(r.TipoOut, CEExportacao::Xlsx);
    EXPECT_EQ(r.TipoOutPagina, CEExportacao::Xlsx);
    EXPECT_EQ(r.GetOpcao("XLSX_LINHA_INI_INT"), "3");
    ASSERT_EQ(r.Colunas.size(), 2u);
    EXPECT_TRUE(r.Colunas[1].Literal);
    EXPECT_EQ(Textos(d.Resumo()), QStringList({"Fio", "Rotulo"}));
    ASSERT_EQ(r.Filtros.size(), 1u);
    // An empty file field takes the drawing's folder and name with the format's extension.
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("projeto.xlsx"));
    EXPECT_EQ(d.Arquivo()->cursorPosition(), d.Arquivo()->text().size());
    EXPECT_TRUE(d.BotaoFiltros()->isEnabled());
    EXPECT_FALSE(d.BotaoPaginas()->isEnabled());
    EXPECT_TRUE(d.BotaoExcluir()->isEnabled());
    EXPECT_FALSE(d.Modificada());
}

TEST_F(Exporta, TheCommandsKindWinsOverTheLastOne) {
    CIDlgExporta& d = Abre("BORNES");
    EXPECT_EQ(d.Rascunho().TipoIn, CEExportacao::Bornes);
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Html);
    EXPECT_EQ(d.Rascunho().GetOpcao("HTML_LARG_TABELA"), "2");
    ASSERT_EQ(d.Rascunho().Colunas.size(), 2u);
    EXPECT_TRUE(d.Rascunho().Colunas[1].Direita);
    // Only the visible columns are listed.
    EXPECT_EQ(Textos(d.Resumo()), QStringList({"Regua"}));
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("projeto.html"));
}

TEST_F(Exporta, LoadsAKindAsTheScriptedAnswersDo) {
    for (const QString tipo : {"", "BORNES", "CABOS", "PAGINAS"}) {
        CEExportConfigs outras;
        outras.CarregaConfigs();
        CEExportacao respondida;
        zvhost::ConsoleUserInterface roteiro{out, err, false};
        roteiro.addAnswer("export:file=x");
        ASSERT_EQ(RespostasExportacao::Preenche(respondida, outras, tipo, roteiro,
                                                CIMensagens::IdiomaAtual(), nullptr),
                  RespostasExportacao::Resultado::Confirmado);
        const CEExportacao& r = Abre(tipo).Rascunho();
        EXPECT_EQ(r.TipoIn, respondida.TipoIn) << tipo.toStdString();
        EXPECT_EQ(r.TipoOut, respondida.TipoOut) << tipo.toStdString();
        EXPECT_EQ(Campos(r.Colunas), Campos(respondida.Colunas)) << tipo.toStdString();
        EXPECT_EQ(r.Filtros, respondida.Filtros) << tipo.toStdString();
        EXPECT_EQ(Pares(r.Opcoes), Pares(respondida.Opcoes)) << tipo.toStdString();
    }
}

TEST_F(Exporta, ChangingTheKindLoadsItsSectionAndCrossingToPagesChangesTheFormats) {
    CIDlgExporta& d = Abre();
    Escolhe(d.Tipo(), CEExportacao::Paginas);
    EXPECT_EQ(d.TipoPalavra, "PAGINAS");
    EXPECT_EQ(d.Rascunho().TipoIn, CEExportacao::Paginas);
    EXPECT_EQ(Textos(d.Formato()), QStringList({"PNG image", "DWG drawing", "DWF drawing",
                                                "DXF drawing", "EMF image", "PDF document"}));
    EXPECT_EQ(d.Formato()->currentIndex(), 0);
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Png);
    EXPECT_EQ(d.Rascunho().TipoOutPagina, CEExportacao::Png);
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("projeto.png"));
    EXPECT_TRUE(d.BotaoPaginas()->isEnabled());
    EXPECT_FALSE(d.BotaoFiltros()->isEnabled());
    // Whole pages have no columns to list.
    EXPECT_TRUE(d.Resumo()->isHidden());

    Escolhe(d.Tipo(), CEExportacao::Bornes);
    EXPECT_FALSE(d.Resumo()->isHidden());
    EXPECT_EQ(Textos(d.Formato()).size(), 4);
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Html);
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("projeto.html"));
    EXPECT_EQ(Textos(d.Resumo()), QStringList({"Regua"}));
    EXPECT_TRUE(d.BotaoFiltros()->isEnabled());
    EXPECT_FALSE(d.BotaoPaginas()->isEnabled());

    // A kind the configuration never exported starts from its default columns.
    Escolhe(d.Tipo(), CEExportacao::Cabos);
    EXPECT_EQ(d.Rascunho().TipoIn, CEExportacao::Cabos);
    EXPECT_EQ(Campos(d.Rascunho().Colunas),
              Campos(CEExportacao::ColunasPadrao(CEExportacao::Cabos, 2)));
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Csv);
    EXPECT_FALSE(d.Modificada());
    EXPECT_EQ(d.windowTitle(), Titulo("Painel"));
}

TEST_F(Exporta, ChangingTheFormatSetsBothFormatsAndReplacesTheExtension) {
    CIDlgExporta& d = Abre();
    d.Arquivo()->setText("/saida/a.b.csv");
    Escolhe(d.Formato(), CEExportacao::Xml);
    EXPECT_EQ(d.Arquivo()->text(), "/saida/a.b.xml");
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Xml);
    EXPECT_EQ(d.Rascunho().TipoOutPagina, CEExportacao::Xml);
    EXPECT_TRUE(d.Modificada());
    EXPECT_EQ(d.windowTitle(), Titulo("Painel", true));

    Escolhe(d.Tipo(), CEExportacao::Paginas);
    Escolhe(d.Formato(), CEExportacao::Pdf);
    EXPECT_EQ(d.Arquivo()->text(), "/saida/a.b.pdf");
    EXPECT_TRUE(d.BotaoPaginas()->isEnabled());
}

TEST_F(Exporta, TheFileNameRule) {
    EXPECT_EQ(CIDlgExporta::NomeArquivo("a.b.csv", ".xml", "x"), "a.b.xml");
    EXPECT_EQ(CIDlgExporta::NomeArquivo("", ".csv", "/d/projeto.dxf"), "/d/projeto.csv");
    EXPECT_EQ(CIDlgExporta::NomeArquivo("lista", ".html", "x"), "lista.html");
    // The last extension goes wherever it stands; other dots stay.
    EXPECT_EQ(CIDlgExporta::NomeArquivo("a.csv.b.csv", ".xlsx", "x"), "a.b.xlsx");
    // Dots of the folders are no extension.
    EXPECT_EQ(CIDlgExporta::NomeArquivo("/p.q/nome", ".csv", "x"), "/p.q/nome.csv");
    EXPECT_EQ(CIDlgExporta::NomeArquivo("C:\\p.q\\n.pdf", ".png", "x"), "C:\\p.q\\n.png");

    EXPECT_EQ(CIDlgExporta::ArquivoPadrao(), pasta.filePath("projeto.dxf"));
    // A drawing whose folder is gone: the user's documents folder.
    app->openDocument(pasta.filePath("sumiu/outro.dxf"));
    QString documentos = QStandardPaths::writableLocation(QStandardPaths::DocumentsLocation);
    if (documentos.isEmpty()) documentos = QDir::rootPath();
    if (!documentos.endsWith('/')) documentos += '/';
    EXPECT_EQ(CIDlgExporta::ArquivoPadrao(), documentos + "outro.dxf");
}

TEST_F(Exporta, BrowseOffersTheFormatAndItsAnswerReplacesTheFile) {
    CIDlgExporta& d = Abre("BORNES");
    QStringList pedidos;
    QString resposta = "/escolhido/lista.html";
    d.EscolheArquivo = [&](const QString& filtro, const QString& inicio, const QString&) {
        pedidos << filtro + " @ " + inicio;
        return resposta;
    };
    d.Procura();
    EXPECT_EQ(d.Arquivo()->text(), "/escolhido/lista.html");
    ASSERT_EQ(pedidos.size(), 1);
    EXPECT_EQ(pedidos[0], "HTML page|*.HTML| @ " + pasta.filePath("projeto.html"));
    // A cancelled file dialog keeps the text.
    resposta.clear();
    d.Procura();
    EXPECT_EQ(d.Arquivo()->text(), "/escolhido/lista.html");
    Escolhe(d.Tipo(), CEExportacao::Paginas);
    d.Procura();
    EXPECT_TRUE(pedidos.last().startsWith("PNG image|*.BMP| @ /escolhido/lista.png"))
        << pedidos.last().toStdString();
}

TEST_F(Exporta, ThePagesPickedAreJoinedEachFollowedByASemicolon) {
    CIDlgExporta& d = Abre("PAGINAS");
    bool escondido = false;
    d.show();
    d.EscolhePaginas = [&]() -> std::optional<QStringList> {
        escondido = !d.isVisible();
        return QStringList{"ESQ$0001$A", "ESQ$0002$A"};
    };
    d.SelecionaPaginas();
    EXPECT_TRUE(escondido);
    EXPECT_TRUE(d.isVisible());
    EXPECT_EQ(d.Rascunho().GetOpcao("PAGINAS"), "ESQ$0001$A;ESQ$0002$A;");
    EXPECT_EQ(d.Paginas()->text(), "ESQ$0001$A;ESQ$0002$A;");
    d.EscolhePaginas = [] { return std::optional<QStringList>(); };
    d.SelecionaPaginas();
    EXPECT_EQ(d.Rascunho().GetOpcao("PAGINAS"), "ESQ$0001$A;ESQ$0002$A;");
    d.hide();
}

TEST_F(Exporta, OkFillsTheDriverWithWhatTheDialogShows) {
    CIDlgExporta& d = Abre();
    d.Arquivo()->setText(pasta.filePath("fios.xlsx"));
    d.accept();
    EXPECT_EQ(d.result(), QDialog::Accepted);
    EXPECT_EQ(exp.TipoIn, CEExportacao::Fios);
    EXPECT_EQ(exp.TipoOut, CEExportacao::Xlsx);
    EXPECT_EQ(exp.TipoOutPagina, CEExportacao::Xlsx);
    EXPECT_EQ(exp.Arquivo, pasta.filePath("fios.xlsx"));
    EXPECT_EQ(Campos(exp.Colunas), Campos(d.Rascunho().Colunas));
    EXPECT_EQ(exp.Filtros, d.Rascunho().Filtros);
    EXPECT_EQ(exp.GetOpcao("XLSX_LINHA_INI_INT"), "3");
    EXPECT_TRUE(perguntas.empty());
    EXPECT_EQ(teste::Le(ArquivoConfig()), teste::kConfiguracoes);
}

TEST_F(Exporta, AFileThatExistsIsAskedAbout) {
    teste::Grava(pasta.filePath("velho.xlsx"), "old");
    CIDlgExporta& d = Abre();
    d.Arquivo()->setText(pasta.filePath("velho.xlsx"));
    RespondePergunta(0x37, QMessageBox::No);
    d.accept();
    EXPECT_NE(d.result(), QDialog::Accepted);
    EXPECT_TRUE(exp.Arquivo.isEmpty());
    RespondePergunta(0x37, QMessageBox::Yes);
    d.accept();
    EXPECT_EQ(d.result(), QDialog::Accepted);
    EXPECT_EQ(exp.Arquivo, pasta.filePath("velho.xlsx"));
    EXPECT_EQ(perguntas, std::vector<int>({0x37, 0x37}));
}

TEST_F(Exporta, UnsavedChangesAreAskedAboutOnOk) {
    CIDlgExporta& d = Abre();
    Escolhe(d.Formato(), CEExportacao::Csv);
    RespondePergunta(0xFF, QMessageBox::Cancel);
    d.accept();
    EXPECT_NE(d.result(), QDialog::Accepted);
    EXPECT_EQ(exp.TipoOut, CEExportacao::Csv);  // still the driver's own
    EXPECT_TRUE(exp.Arquivo.isEmpty());
    RespondePergunta(0xFF, QMessageBox::Yes);
    d.accept();
    EXPECT_EQ(d.result(), QDialog::Accepted);
    EXPECT_EQ(exp.Arquivo, pasta.filePath("projeto.csv"));
    // Yes saved the section with its new format.
    CEExportConfigs lidas;
    lidas.CarregaConfigs();
    EXPECT_EQ(lidas.ObtemSecao("Painel", "FIOS").Opcoes.valor("TIPO_OUT"), "CSV");
    EXPECT_FALSE(d.Modificada());
}

TEST_F(Exporta, NoOnOkExportsWithoutSaving) {
    CIDlgExporta& d = Abre();
    Escolhe(d.Formato(), CEExportacao::Html);
    RespondePergunta(0xFF, QMessageBox::No);
    d.accept();
    EXPECT_EQ(d.result(), QDialog::Accepted);
    EXPECT_EQ(exp.TipoOut, CEExportacao::Html);
    EXPECT_EQ(teste::Le(ArquivoConfig()), teste::kConfiguracoes);
}

TEST_F(Exporta, CancelLeavesTheDriverAndTheFilesUntouched) {
    const CEExportacao novo;
    CIDlgExporta& d = Abre("BORNES");
    Escolhe(d.Formato(), CEExportacao::Xlsx);
    Responde([](QDialog& dlg) {
        auto* opcoes = dynamic_cast<CIDlgOpcoes*>(&dlg);
        EXPECT_NE(opcoes, nullptr);
        if (!opcoes) return int(QDialog::Rejected);
        qobject_cast<QLineEdit*>(opcoes->Editor("XLSX_TEMPLATE"))->setText("modelo.xlsx");
        opcoes->accept();
        return int(QDialog::Accepted);
    });
    d.AbreOpcoes();
    EXPECT_EQ(d.Rascunho().GetOpcao("XLSX_TEMPLATE"), "modelo.xlsx");
    // Cancel, then the question: cancel stays, no leaves.
    d.show();
    RespondePergunta(0xFF, QMessageBox::Cancel);
    d.reject();
    EXPECT_TRUE(d.isVisible());
    RespondePergunta(0xFF, QMessageBox::No);
    d.reject();
    EXPECT_FALSE(d.isVisible());
    EXPECT_EQ(d.result(), QDialog::Rejected);
    EXPECT_EQ(exp.TipoIn, novo.TipoIn);
    EXPECT_EQ(exp.TipoOut, novo.TipoOut);
    EXPECT_TRUE(exp.Arquivo.isEmpty());
    EXPECT_TRUE(exp.Colunas.empty());
    EXPECT_TRUE(exp.Filtros.empty());
    EXPECT_EQ(Pares(exp.Opcoes), Pares(novo.Opcoes));
    EXPECT_EQ(teste::Le(ArquivoConfig()), teste::kConfiguracoes);
    EXPECT_FALSE(QDir(pasta.filePath("ZVDLG")).exists() &&
                 !QDir(pasta.filePath("ZVDLG")).isEmpty());
}

TEST_F(Exporta, CancelWithoutChangesAsksNothing) {
    CIDlgExporta& d = Abre();
    d.reject();
    EXPECT_EQ(d.result(), QDialog::Rejected);
    EXPECT_TRUE(perguntas.empty());
}

TEST_F(Exporta, ANewConfigurationGetsAFreeNameAndRefusesOneInUse) {
    teste::Grava(ArquivoConfig(), teste::kConfiguracoes + "{new CONFIGURATION}\r\n[]\r\n");
    configs.CarregaConfigs();
    CIDlgExporta& d = Abre();
    QStringList propostos;
    const auto nome = [&](const QString& digitado) {
        Responde([&, digitado](QDialog& dlg) {
            auto* pedido = dynamic_cast<CIDlgNome*>(&dlg);
            EXPECT_NE(pedido, nullptr);
            if (!pedido) return int(QDialog::Rejected);
            propostos << pedido->Campo()->text();
            pedido->Campo()->setText(digitado);
            return int(QDialog::Accepted);
        });
    };
    nome("painel");
    RespondePergunta(0x101, QMessageBox::Ok);
    nome("Painel");
    RespondePergunta(0x100, QMessageBox::Ok);
    nome("  Quadro ");
    d.NovaConfig();
    // Names compare without regard to case: "New configuration" is taken.
    EXPECT_EQ(propostos, QStringList({"New configuration 1", "painel", "Painel"}));
    EXPECT_EQ(d.NomeConfig, "Quadro");
    EXPECT_EQ(d.windowTitle(), Titulo("Quadro", true));
    EXPECT_TRUE(d.BotaoExcluir()->isEnabled());
    // Nothing is stored until it is saved.
    EXPECT_EQ(configs.Config("Quadro"), nullptr);
    EXPECT_TRUE(d.SalvaConfig());
    EXPECT_EQ(d.windowTitle(), Titulo("Quadro"));
    CEExportConfigs lidas;
    lidas.CarregaConfigs();
    EXPECT_EQ(lidas.ObtemConfigAtiva(), "Quadro");
    ASSERT_NE(lidas.Config("Quadro"), nullptr);
    EXPECT_EQ(lidas.Config("Quadro")->Secao("")->Opcoes.valor("TIPO_IN"), "FIOS");
    EXPECT_EQ(lidas.Config("Quadro")->Secao("FIOS")->Colunas.size(), 2u);
    // Painel is still there as it was.
    EXPECT_EQ(lidas.Config("Painel")->Secao("FIOS")->Colunas.size(), 2u);
}

TEST_F(Exporta, ANewConfigurationCancelledChangesNothing) {
    CIDlgExporta& d = Abre();
    Responde([](QDialog& dlg) {
        auto* pedido = dynamic_cast<CIDlgNome*>(&dlg);
        EXPECT_NE(pedido, nullptr);
        // The first free name is offered as it is.
        if (pedido) {
            EXPECT_EQ(pedido->Campo()->text(), "New configuration");
        }
        return int(QDialog::Rejected);
    });
    d.NovaConfig();
    EXPECT_EQ(d.NomeConfig, "Painel");
    EXPECT_FALSE(d.Modificada());
}

TEST_F(Exporta, OpenListsTheNamedConfigurationsAndLoadsTheOnePicked) {
    CIDlgExporta& d = Abre();
    Responde([](QDialog& dlg) {
        auto* lista = dynamic_cast<CIDlgExportConfig*>(&dlg);
        EXPECT_NE(lista, nullptr);
        if (!lista) return int(QDialog::Rejected);
        QTreeWidget* t = lista->Lista();
        EXPECT_EQ(t->columnCount(), 1);
        EXPECT_EQ(t->columnWidth(0), 300);
        QStringList nomes;
        for (int i = 0; i < t->topLevelItemCount(); ++i)
            nomes << t->topLevelItem(i)->text(0);
        EXPECT_EQ(nomes, QStringList({"Painel", "Outra"}));
        EXPECT_EQ(lista->Selecionada(), "Painel");
        t->setCurrentItem(t->topLevelItem(1));
        return int(QDialog::Accepted);
    });
    d.AbreConfig();
    EXPECT_EQ(d.NomeConfig, "Outra");
    EXPECT_EQ(d.windowTitle(), Titulo("Outra"));
    EXPECT_EQ(d.Rascunho().TipoIn, CEExportacao::Paginas);
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Pdf);
    EXPECT_EQ(d.Formato()->currentText(), "PDF document");
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("projeto.pdf"));
    EXPECT_TRUE(d.BotaoPaginas()->isEnabled());
}

TEST_F(Exporta, DeleteAsksThenRemovesTheConfigurationAndLoadsTheFirst) {
    CIDlgExporta& d = Abre();
    RespondePergunta(0x104, QMessageBox::No);
    d.ExcluiConfig();
    EXPECT_EQ(teste::Le(ArquivoConfig()), teste::kConfiguracoes);
    RespondePergunta(0x104, QMessageBox::Yes);
    d.ExcluiConfig();
    const QByteArray depois = teste::Le(ArquivoConfig());
    EXPECT_FALSE(depois.contains("{Painel}"));
    EXPECT_TRUE(depois.contains("{Outra}"));
    EXPECT_TRUE(d.NomeConfig.isEmpty());
    EXPECT_FALSE(d.BotaoExcluir()->isEnabled());
    EXPECT_EQ(d.Rascunho().TipoIn, CEExportacao::Bornes);
    // The unnamed configuration is never deleted.
    d.ExcluiConfig();
    EXPECT_EQ(teste::Le(ArquivoConfig()), depois);
}

TEST_F(Exporta, AConfigurationEditedInTheDialogIsWrittenAndReadBackUnchanged) {
    CIDlgExporta& d = Abre();
    // Columns: the first hidden, a new one with every field set, moved to the top.
    Responde([this](QDialog& dlg) {
        auto* colunas = dynamic_cast<CISelProps*>(&dlg);
        EXPECT_NE(colunas, nullptr);
        if (!colunas) return int(QDialog::Rejected);
        colunas->Lista()->item(0)->setCheckState(Qt::Unchecked);
        Responde([](QDialog& detalhe) {
            auto* p = dynamic_cast<CIDlgPropDetail*>(&detalhe);
            EXPECT_NE(p, nullptr);
            if (!p) return int(QDialog::Rejected);
            p->Nome()->setText("{REGUA}:{NUMERO}");
            p->Titulo()->setText("A*B");
            p->Largura()->setText("8");
            Q_EMIT p->Largura()->textEdited("8");
            p->Preenche()->setText(".");
            p->Agrupa()->setChecked(true);
            p->Concatena()->setChecked(true);
            p->Alinhamento()->setCurrentIndex(1);
            p->accept();
            return int(QDialog::Accepted);
        });
        colunas->Adiciona();
        colunas->Sobe();
        colunas->Sobe();
        colunas->accept();
        return int(QDialog::Accepted);
    });
    d.AbreColunas();
    // Filters and the sort.
    Responde([](QDialog& dlg) {
        auto* filtro = dynamic_cast<CIFiltro*>(&dlg);
        EXPECT_NE(filtro, nullptr);
        if (!filtro) return int(QDialog::Rejected);
        filtro->Campo()->setCurrentText("REGUA");
        filtro->Operador()->setCurrentIndex(4);
        filtro->Valor()->setText("X#1");
        filtro->Adiciona();
        filtro->Disponiveis()->setCurrentRow(0);
        filtro->ParaOrdem();
        filtro->Ordem()->setCurrentIndex(1);
        filtro->accept();
        return int(QDialog::Accepted);
    });
    d.AbreFiltros();
    // Options of the workbook.
    Responde([](QDialog& dlg) {
        auto* opcoes = dynamic_cast<CIDlgOpcoes*>(&dlg);
        EXPECT_NE(opcoes, nullptr);
        if (!opcoes) return int(QDialog::Rejected);
        qobject_cast<QComboBox*>(opcoes->Editor("XLSX_CABECALHO_SN"))->setCurrentIndex(1);
        qobject_cast<QLineEdit*>(opcoes->Editor("XLSX_TEMPLATE"))->setText("modelo.xlsx");
        opcoes->accept();
        return int(QDialog::Accepted);
    });
    d.AbreOpcoes();
    EXPECT_EQ(d.windowTitle(), Titulo("Painel", true));

    const CEExportacao& r = d.Rascunho();
    ASSERT_EQ(r.Colunas.size(), 3u);
    EXPECT_EQ(Campos(r.Colunas[0]), QStringList({"{REGUA}:{NUMERO}", "A*B", "8", ".", "visible",
                                                 "groups", "-", "joins", "right"}));
    EXPECT_FALSE(r.Colunas[1].Visivel);
    ASSERT_EQ(r.Filtros.size(), 2u);
    EXPECT_EQ(r.Filtros[1], CEFiltroExport("REGUA", 4, "X#1"));
    EXPECT_EQ(r.GetOpcao("FLT_NOME_ORDENAR_POR"), "FIO");
    EXPECT_EQ(r.GetOpcao("FLT_TIPO_ORDEM"), "D");
    EXPECT_EQ(r.GetOpcao("XLSX_CABECALHO_SN"), "N");

    ASSERT_TRUE(d.SalvaConfig());
    EXPECT_EQ(d.windowTitle(), Titulo("Painel"));
    CEExportConfigs lidas;
    lidas.CarregaConfigs();
    CEExportacao relida;
    RespostasExportacao::CarregaTela(relida, lidas, "Painel", "FIOS", 2);
    EXPECT_EQ(Campos(relida.Colunas), Campos(r.Colunas));
    EXPECT_EQ(relida.Filtros, r.Filtros);
    EXPECT_EQ(relida.TipoOut, r.TipoOut);
    for (const auto& [chave, padrao] : CEExportSecao::OpcoesPadrao())
        EXPECT_EQ(relida.GetOpcao(chave), r.GetOpcao(chave)) << chave.toStdString();
    // A second dialog on the file shows the same.
    CIDlgExporta outro(&exp, &lidas, QString());
    outro.Inicia();
    EXPECT_EQ(Textos(outro.Resumo()), Textos(d.Resumo()));
    EXPECT_EQ(Textos(outro.Resumo()), QStringList({"A*B", "Rotulo"}));
}

TEST_F(Exporta, OkWithoutAFileStaysInTheDialog) {
    CIDlgExporta& d = Abre();
    d.show();
    d.Arquivo()->setText("  ");
    d.accept();
    EXPECT_TRUE(d.isVisible());
    EXPECT_NE(d.result(), QDialog::Accepted);
    EXPECT_TRUE(exp.Arquivo.isEmpty());
    EXPECT_TRUE(exp.Colunas.empty());
    d.hide();
}

TEST_F(Exporta, ASaveThatFailsKeepsTheUnsavedMarkAndTheOldFile) {
    CIDlgExporta& d = Abre();
    Escolhe(d.Formato(), CEExportacao::Csv);
    ASSERT_TRUE(
        documento->lisp()->lispEvaluate("(setq *DIR_ZVCFG* \"" + pasta.path() + "/nao/existe/\")"));
    EXPECT_FALSE(d.SalvaConfig());
    EXPECT_TRUE(d.Modificada());
    EXPECT_EQ(d.windowTitle(), Titulo("Painel", true));
    EXPECT_EQ(teste::Le(ArquivoConfig()), teste::kConfiguracoes);
    EXPECT_FALSE(QDir(pasta.filePath("nao")).exists());
}

TEST_F(Exporta, BrowseGoesThroughTheHostsFileDialogWithThePaletteLocked) {
    CIDlgExporta& d = Abre("BORNES");
    ASSERT_TRUE(ui->addAnswer("export:file=" + pasta.filePath("escolhido.html")));
    ASSERT_TRUE(documento->lisp()->lispEvaluate(
        "(progn (defun zvAlternaStatusBloqueioPalette () (setq trocas (1+ trocas))) "
        "(setq trocas 0))"));
    d.Procura();
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("escolhido.html"));
    // Locked before the file dialog and unlocked after it.
    EXPECT_EQ(CICad::GetIntLisp("trocas"), 2);
}

TEST_F(Exporta, WithoutAnyStoredConfigurationItStartsFromTheDefaults) {
    ASSERT_TRUE(QFile::remove(ArquivoConfig()));
    CEExportConfigs nenhuma;
    nenhuma.CarregaConfigs();
    ASSERT_TRUE(nenhuma.Configs.empty());
    CIDlgExporta d(&exp, &nenhuma, QString());
    d.MostraDialogo = Mostrador();
    d.Inicia();
    EXPECT_TRUE(d.NomeConfig.isEmpty());
    EXPECT_EQ(d.windowTitle(), Titulo(""));
    EXPECT_FALSE(d.BotaoExcluir()->isEnabled());
    EXPECT_EQ(d.Rascunho().TipoIn, CEExportacao::Bornes);
    EXPECT_EQ(d.Rascunho().TipoOut, CEExportacao::Csv);
    EXPECT_EQ(Campos(d.Rascunho().Colunas),
              Campos(CEExportacao::ColunasPadrao(CEExportacao::Bornes, 2)));
    EXPECT_EQ(d.Arquivo()->text(), pasta.filePath("projeto.csv"));
    EXPECT_TRUE(d.SalvaConfig());
    CEExportConfigs lidas;
    lidas.CarregaConfigs();
    ASSERT_NE(lidas.Config(""), nullptr);
    EXPECT_EQ(lidas.Config("")->Secao("BORNES")->Colunas.size(),
              CEExportacao::ColunasPadrao(CEExportacao::Bornes, 2).size());
    d.accept();
    EXPECT_EQ(d.result(), QDialog::Accepted);
    EXPECT_EQ(exp.Arquivo, pasta.filePath("projeto.csv"));
}
