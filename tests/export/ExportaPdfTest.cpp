// The project's pages as one PDF, printed page by page by the host and joined: the paper,
// the pages and their texts, the bookmarks and links of the navigable PDF, bad input.
#include "ZvhostRun.h"

#include "app/Application.h"
#include "app/ConsoleUserInterface.h"
#include "app/DrawingFiles.h"
#include "app/HostDocument.h"
#include "drawing/Database.h"
#include "export/CEExportaPaginas.h"
#include "export/CEExportaPdf.h"
#include "export/CENavegacaoPdf.h"
#include "module/CIProgress.h"

#include <QDir>
#include <QFile>
#include <QGuiApplication>
#include <QImage>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QRegularExpression>
#include <QTemporaryDir>

#include <gtest/gtest.h>

namespace {

QString Ferramenta(const QString& programa, const QStringList& argumentos, int* status = nullptr) {
    QProcess processo;
    processo.start(programa, argumentos);
    processo.waitForFinished(120000);
    if (status) *status = processo.exitCode();
    return QString::fromUtf8(processo.readAllStandardOutput());
}

class ExportaPdfTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        if (!QCoreApplication::instance()) {
            if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM"))
                qputenv("QT_QPA_PLATFORM", "offscreen");
            static int argc = 1;
            static char nome[] = "export_tests";
            static char* argv[] = {nome, nullptr};
            static QGuiApplication app(argc, argv);
        }
    }
    void SetUp() override {
        ASSERT_TRUE(pasta_.isValid());
        qputenv("ZV_DATA_DIR", pasta_.path().toUtf8());
        qputenv("TMPDIR", pasta_.path().toUtf8());
        const QString projeto = pasta_.filePath("projeto.dxf");
        const zvtest::HostRun gerado = zvtest::runZvhost(
            {"generate", "--out", projeto, "--seed", "5", "--terminals", "40", "--pages", "4"});
        ASSERT_EQ(gerado.status, 0) << gerado.err.toStdString();
        auto ui = std::make_unique<zvhost::ConsoleUserInterface>(out_, err_, false);
        app_ = std::make_unique<zvhost::Application>(std::move(ui), out_);
        app_->setExecutableFolder(QString(ZV_BIN_DIR));
        QString erro;
        auto desenho = zvhost::readDrawing(projeto, &erro);
        ASSERT_TRUE(desenho) << erro.toStdString();
        documento_ = app_->openDocument(projeto, std::move(desenho));
        ASSERT_NE(documento_, nullptr);
    }
    QString saida() {
        out_.flush();
        return saida_;
    }
    // The pages' texts, one entry a page.
    QStringList Textos(const QString& pdf) {
        return Ferramenta("pdftotext", {"-layout", pdf, "-"}).split('\f', Qt::SkipEmptyParts);
    }
    QJsonObject Json(const QString& pdf) {
        return QJsonDocument::fromJson(
                   Ferramenta("qpdf", {"--json=2", "--json-key=outlines", "--json-key=pages",
                                       "--json-key=qpdf", pdf})
                       .toUtf8())
            .object();
    }

    QTemporaryDir pasta_;
    QString saida_, erros_;
    QTextStream out_{&saida_}, err_{&erros_};
    std::unique_ptr<zvhost::Application> app_;
    zvhost::HostDocument* documento_ = nullptr;
};

TEST_F(ExportaPdfTest, PagesArePrintedInOrderOnTheChosenPaperAndJoined) {
    const QString alvo = pasta_.filePath("saida/projeto.pdf");
    QDir().mkpath(pasta_.filePath("saida"));
    CIProgress progresso;
    CEExportaPdf exporta({{"PAGINAS", "COMANDO$0002$A;CAPA$0001$A;COMANDO$0001$A"},
                          {"PDF_PAPER_SIZE_PZ", "A3 (420 x 297 mm)"},
                          {"PDF_ORIENTATION_LP", "L"},
                          {"PDF_SMART_SN", "N"}},
                         &progresso);
    ASSERT_TRUE(exporta.Exporta(alvo)) << saida().toStdString();
    int status = -1;
    Ferramenta("qpdf", {"--check", alvo}, &status);
    EXPECT_EQ(status, 0);
    const QString info = Ferramenta("pdfinfo", {alvo});
    EXPECT_TRUE(info.contains(QRegularExpression("Pages:\\s+3\\n"))) << info.toStdString();
    EXPECT_TRUE(info.contains(
        QRegularExpression("Page size:\\s+(1190\\.\\d+|1191) x (841\\.\\d+|842) pts")))
        << info.toStdString();
    // The order of the list, not of the project: the cover is the second page.
    const QStringList textos = Textos(alvo);
    ASSERT_EQ(textos.size(), 3);
    EXPECT_TRUE(textos[1].contains("PAINEL DE COMANDO")) << textos[1].toStdString();
    EXPECT_FALSE(textos[0].contains("PAINEL DE COMANDO"));
    EXPECT_EQ(exporta.PaginasImpressas,
              QStringList({"COMANDO$0002$A", "CAPA$0001$A", "COMANDO$0001$A"}));
    // The one-page files are gone, and no temporary file is left beside the target.
    EXPECT_TRUE(QDir(pasta_.path()).entryList({"*.pdf"}, QDir::Files).isEmpty());
    EXPECT_EQ(QDir(pasta_.filePath("saida")).entryList(QDir::Files | QDir::Hidden),
              QStringList{"projeto.pdf"});
}

TEST_F(ExportaPdfTest, AnUnknownPaperFallsBackToTheFirstRowAndMissingPagesAreSaid) {
    const QString alvo = pasta_.filePath("fallback.pdf");
    CEExportaPdf exporta({{"PAGINAS", "NADA$0001$A;COMANDO$0001$A"},
                          {"PDF_PAPER_SIZE_PZ", "ISO A4 (210 x 297 mm)"},
                          {"PDF_ORIENTATION_LP", "L"}},
                         nullptr);
    ASSERT_TRUE(exporta.Exporta(alvo));
    EXPECT_TRUE(saida().contains("Invalid sheet size. Using A0 (1.189 x 841 mm)"));
    EXPECT_TRUE(saida().contains("no such page: NADA$0001$A"));
    const QString info = Ferramenta("pdfinfo", {alvo});
    EXPECT_TRUE(info.contains(QRegularExpression("Pages:\\s+1\\n")));
    EXPECT_TRUE(
        info.contains(QRegularExpression("Page size:\\s+337\\d(\\.\\d+)? x 238\\d(\\.\\d+)? pts")))
        << info.toStdString();
    // Nothing to print: no file, and an old one stays.
    QFile antigo(pasta_.filePath("velho.pdf"));
    ASSERT_TRUE(antigo.open(QIODevice::WriteOnly));
    antigo.write("old");
    antigo.close();
    CEExportaPdf nada({{"PAGINAS", "NADA$0001$A"}}, nullptr);
    EXPECT_FALSE(nada.Exporta(antigo.fileName()));
    ASSERT_TRUE(antigo.open(QIODevice::ReadOnly));
    EXPECT_EQ(antigo.readAll(), QByteArray("old"));
}

TEST_F(ExportaPdfTest, TheNavigablePdfHasGroupAndPageBookmarksAndLinksBetweenPages) {
    const QString alvo = pasta_.filePath("navegavel.pdf");
    CEExportaPdf exporta({{"PDF_PAPER_SIZE_PZ", "A3 (420 x 297 mm)"},
                          {"PDF_ORIENTATION_LP", "L"},
                          {"PDF_SMART_SN", "S"}},
                         nullptr);
    ASSERT_TRUE(exporta.Exporta(alvo)) << saida().toStdString();
    int status = -1;
    const QString check = Ferramenta("qpdf", {"--check", alvo}, &status);
    EXPECT_EQ(status, 0) << check.toStdString();
    const int paginas = exporta.PaginasImpressas.size();
    ASSERT_GE(paginas, 5);
    const QJsonObject json = Json(alvo);
    const QJsonArray outlines = json["outlines"].toArray();
    ASSERT_EQ(outlines.size(), 4) << QJsonDocument(json).toJson().left(3000).toStdString();
    // The project's groups in order, each with its pages, each going to its page.
    const QJsonArray grupos = outlines[0].toObject()["kids"].toArray();
    ASSERT_GE(grupos.size(), 3);
    EXPECT_EQ(grupos[0].toObject()["title"].toString(), "CAPA");
    int vistas = 0;
    for (const QJsonValue grupo : grupos)
        for (const QJsonValue pagina : grupo.toObject()["kids"].toArray()) {
            const QJsonObject p = pagina.toObject();
            EXPECT_EQ(exporta.PaginasImpressas.indexOf(p["title"].toString()),
                      p["destpageposfrom1"].toInt() - 1)
                << p["title"].toString().toStdString();
            ++vistas;
        }
    EXPECT_EQ(vistas, paginas);
    // Components have bookmarks that zoom on their page.
    const QJsonArray componentes = outlines[1].toObject()["kids"].toArray();
    EXPECT_FALSE(componentes.isEmpty());
    // Cross references: link annotations on one page, each pointing to another page.
    const QJsonObject objetos = json["qpdf"].toArray()[1].toObject();
    int links = 0;
    for (auto it = objetos.begin(); it != objetos.end(); ++it) {
        const QJsonObject valor = it.value().toObject()["value"].toObject();
        if (valor["/Subtype"].toString() != "/Link") continue;
        ++links;
        const QJsonArray destino = valor["/Dest"].toArray();
        ASSERT_EQ(destino.size(), 6);
        EXPECT_EQ(destino[1].toString(), "/FitR");
        EXPECT_NE(destino[0].toString(), valor["/P"].toString());
        const QJsonArray caixa = valor["/Rect"].toArray();
        ASSERT_EQ(caixa.size(), 4);
        EXPECT_LT(caixa[0].toDouble(), caixa[2].toDouble());
        EXPECT_GE(caixa[0].toDouble(), 0.0);
        EXPECT_LE(caixa[3].toDouble(), 842.0);
    }
    EXPECT_GT(links, 0);
    EXPECT_EQ(outlines[3].toObject()["kids"].toArray().size(), links);
}

TEST_F(ExportaPdfTest, BoxesBecomePdfRectanglesGrownAndClipped) {
    CENavegacaoPdf::GeometriaPagina pagina;
    pagina.Largura = 420, pagina.Altura = 297, pagina.OrigemX = 0, pagina.OrigemY = 0;
    pagina.LarguraPdf = 1190.55, pagina.AlturaPdf = 841.89;
    const double k = 1190.55 / 420;
    const QRectF r = CENavegacaoPdf::ParaPdf(QRectF(100, 100, 10, 10), pagina);
    // Around the box's centre (105, 105), 2.2 times as large.
    EXPECT_NEAR(r.center().x(), 105 * k, 0.01);
    EXPECT_NEAR(r.center().y(), 105 * k, 0.01);
    EXPECT_NEAR(r.width(), 22 * k, 0.01);
    // A box at the sheet's edge is clipped to it.
    const QRectF canto = CENavegacaoPdf::ParaPdf(QRectF(415, 290, 5, 7), pagina);
    EXPECT_NEAR(canto.right(), 1190.55, 0.01);
    EXPECT_NEAR(canto.bottom(), 841.89, 0.01);
    pagina.Rotacao = 180;
    EXPECT_EQ(CENavegacaoPdf::ParaPdf(QRectF(100, 100, 10, 10), pagina), QRectF(0, 0, 0, 0));
}

TEST(ComandoImpressaoTest, TheAnswersFollowTheHostsPromptOrder) {
    const QStringList c = CEExportaPdf::ComandoImpressao("A4 (210 x 297 mm)", false, true, 0, 0,
                                                         420, 297, "50", "", true, "C:\\t\\a.pdf");
    ASSERT_EQ(c.size(), 27);
    EXPECT_EQ(c.mid(0, 4), QStringList({"_-PRINT", "_Y", "Model", "PDF"}));
    EXPECT_EQ(c.mid(5, 3), QStringList({"M", "297.0", "210.0"}));
    EXPECT_EQ(c[12], "_P");
    EXPECT_EQ(c.mid(14, 3), QStringList({"_S", "420,297", "0,0"}));
    EXPECT_EQ(c.mid(17, 2), QStringList({"_R", "100"}));
    EXPECT_EQ(c.mid(19, 3), QStringList({"_F", "_C", "_N"}));
    EXPECT_EQ(c[22], "_Y");
    EXPECT_EQ(c[24], "C:\\\\t\\\\a.pdf");
    const QStringList semJanela = CEExportaPdf::ComandoImpressao(
        "A3 (420 x 297 mm)", true, false, 0, 0, 0, 0, "", "mono.ctb", false, "/x.pdf");
    EXPECT_EQ(semJanela[14], "_A");
    EXPECT_FALSE(semJanela.contains("_R"));
    EXPECT_EQ(semJanela.mid(17, 2), QStringList({"_Y", "mono.ctb"}));
    EXPECT_EQ(CEExportaPdf::ComandoImpressao("A3 (420 x 297 mm)", true, false, 0, 0, 0, 0, "1000",
                                             "", false, "/x.pdf")[16],
              "600");
}

}  // namespace

namespace {

TEST(NomeArquivoTest, PagesAreNumberedBeforeTheExtension) {
    EXPECT_EQ(CEExportaPaginas::NomeArquivo("/a/lista.png", 1, 2, "_", 3), "/a/lista_001.png");
    EXPECT_EQ(CEExportaPaginas::NomeArquivo("/a/lista.png", 1000, 1200, "_", 3),
              "/a/lista_1000.png");
    EXPECT_EQ(CEExportaPaginas::NomeArquivo("lista", 1, 2, "_", 3), "_001lista");
    EXPECT_EQ(CEExportaPaginas::NomeArquivo("/a/lista.png", 1, 1, "_", 3), "/a/lista.png");
}

TEST_F(ExportaPdfTest, PagesBecomeFilesOfTheirOwnInTheListsOrder) {
    CEExportaPaginas png({{"PAGINAS", "COMANDO$0002$A;CAPA$0001$A"}});
    ASSERT_TRUE(png.Exporta(CEExportaPaginas::PNG, pasta_.filePath("pagina.png")))
        << saida().toStdString();
    ASSERT_EQ(png.Arquivos,
              QStringList({pasta_.filePath("pagina_001.png"), pasta_.filePath("pagina_002.png")}));
    QImage comando(png.Arquivos[0]), capa(png.Arquivos[1]);
    ASSERT_FALSE(comando.isNull());
    ASSERT_FALSE(capa.isNull());
    EXPECT_NE(comando, capa);
    CEExportaPaginas emf({{"PAGINAS", "COMANDO$0001$A"}});
    ASSERT_TRUE(emf.Exporta(CEExportaPaginas::EMF, pasta_.filePath("pagina.emf")));
    QFile metafile(pasta_.filePath("pagina.emf"));
    ASSERT_TRUE(metafile.open(QIODevice::ReadOnly));
    EXPECT_EQ(metafile.read(44).mid(40), QByteArray(" EMF"));
    CEExportaPaginas dxf({{"PAGINAS", "FORCA$0001$A;COMANDO$0001$A"}});
    ASSERT_TRUE(dxf.Exporta(CEExportaPaginas::DXF, pasta_.filePath("pagina.dxf")))
        << saida().toStdString();
    EXPECT_TRUE(QFile::exists(pasta_.filePath("pagina_001.dxf")));
    EXPECT_TRUE(QFile::exists(pasta_.filePath("pagina_002.dxf")));
}

TEST_F(ExportaPdfTest, DwgAndDwfPagesAreRefusedWithAMessageAndNothingIsWritten) {
    for (int formato : {CEExportaPaginas::DWG, CEExportaPaginas::DWF}) {
        CEExportaPaginas paginas({{"PAGINAS", "COMANDO$0001$A"}});
        EXPECT_FALSE(paginas.Exporta(formato, pasta_.filePath("pagina.dwg")));
        EXPECT_TRUE(paginas.Arquivos.isEmpty());
    }
    EXPECT_EQ(saida().count("not available in this edition; no file was written"), 2)
        << saida().toStdString();
    EXPECT_FALSE(QFile::exists(pasta_.filePath("pagina.dwg")));
}

}  // namespace
