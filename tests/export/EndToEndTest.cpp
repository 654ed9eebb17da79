// The terminal export through zvhost on a generated project, with a stored configuration
// in the product folder: the CSV holds the drawing's terminals (listed by ezdxf from the
// same file), and the same export as a workbook reads back with openpyxl.
#include "ProductFolder.h"
#include "QtPrinters.h"

#include <QFile>
#include <QImage>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QRegularExpression>

#include <gtest/gtest.h>

#include <algorithm>

namespace {

class ExportEndToEnd : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        produto_ = new zvtest::ProductFolder;
        erroPreparo_ = new QString(produto_->prepare({"--seed", "5", "--terminals", "80"}));
        if (!erroPreparo_->isEmpty()) return;
        // A configuration of the test's own beside the product's: the kind of each row, and
        // strip and number in whichever language the drawing writes them.
        QFile config(produto_->path("produto/config/cfgexportacao_2014.ini"));
        if (!config.open(QIODevice::Append)) {
            *erroPreparo_ = "no export configuration to add to";
            return;
        }
        config.write(
            "\r\n{Teste}\r\n[]\r\nTIPO_IN=BORNES\r\n[BORNES]\r\nTIPO_IN=BORNES\r\n"
            "TIPO_OUT=CSV\r\nCSV_CABECALHO_SN=S\r\nCSV_DELIM_CAMPO=;\r\n"
            "FLT_NOME_ORDENAR_POR=ZV_LISTA_TIPO;STRIP;REGUA;NUMBER;NUMERO\r\nFLT_TIPO_ORDEM=C\r\n"
            "*ZV_LISTA_TIPO*S*N*Tipo*N*N*N*0* \r\n"
            "*{REGUA}{STRIP}{REGLETA}*S*N*Regua*N*N*N*0* \r\n"
            "*{NUMERO}{NUMBER}*S*N*Numero*N*N*S*4*0\r\n"
            "*RELACAO_INI*S*N*Interno*N*N*N*0* \r\n"
            "*RELACAO_FIM*S*N*Externo*N*N*N*0* \r\n"
            "*ZV_KEY*S*N*Codigo*N*N*N*0* \r\n");
    }
    static void TearDownTestSuite() {
        delete produto_;
        delete erroPreparo_;
        produto_ = nullptr;
        erroPreparo_ = nullptr;
    }
    void SetUp() override { ASSERT_TRUE(erroPreparo_->isEmpty()) << erroPreparo_->toStdString(); }

    // exportacaoBornes with the test's stored configuration in the format asked.
    zvtest::HostRun exporta(const QString& formato, const QString& alvo) const {
        return produto_->zvhost({"--quiet", "--load", produto_->path("produto/config/zvconfig.lsp"),
                                 "--answer", "export:config=Teste", "--answer",
                                 "export:type=BORNES", "--answer", "export:format=" + formato,
                                 "--answer", "export:file=" + alvo, produto_->project(),
                                 "exportacaoBornes"});
    }

    // The drawing's terminals as ezdxf reads them: strip, number and key of each.
    static QList<QStringList> terminaisDoDesenho() {
        QProcess p;
        p.start("/usr/bin/python3", {ZV_TEST_DIR "/bornes_desenho.py", produto_->project()});
        EXPECT_TRUE(p.waitForFinished(300000));
        EXPECT_EQ(p.exitCode(), 0) << p.readAllStandardError().constData();
        QList<QStringList> resultado;
        for (const QString& linha : QString::fromUtf8(p.readAllStandardOutput()).split('\n'))
            if (!linha.trimmed().isEmpty()) resultado << linha.trimmed().split(';');
        return resultado;
    }

    // The rows of a CSV file whose fields are quoted and cut by ";".
    static QList<QStringList> linhas(const QString& caminho) {
        QFile f(caminho);
        EXPECT_TRUE(f.open(QIODevice::ReadOnly)) << caminho.toStdString();
        const QString texto = QString::fromLatin1(f.readAll());
        EXPECT_TRUE(texto.endsWith("\r\n"));
        QList<QStringList> resultado;
        for (const QString& linha : texto.split("\r\n", Qt::SkipEmptyParts)) {
            QStringList campos;
            for (QString campo : linha.split(';')) {
                if (campo.size() >= 2 && campo.startsWith('"') && campo.endsWith('"'))
                    campo = campo.mid(1, campo.size() - 2);
                campos << campo;
            }
            resultado << campos;
        }
        return resultado;
    }

    static zvtest::ProductFolder* produto_;
    static QString* erroPreparo_;
};

zvtest::ProductFolder* ExportEndToEnd::produto_ = nullptr;
QString* ExportEndToEnd::erroPreparo_ = nullptr;

TEST_F(ExportEndToEnd, TerminalsToCsvAreTheTerminalsOfTheDrawing) {
    const QString alvo = produto_->path("bornes.csv");
    const zvtest::HostRun run = exporta("CSV", alvo);
    ASSERT_EQ(run.status, 0) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains(alvo)) << run.out.toStdString();

    const QList<QStringList> exportadas = linhas(alvo);
    ASSERT_FALSE(exportadas.isEmpty());
    // The header is cut to the column's width like the values.
    EXPECT_EQ(exportadas.front(),
              QStringList({"Tipo", "Regua", "Nume", "Interno", "Externo", "Codigo"}));
    const QList<QStringList> desenho = terminaisDoDesenho();
    ASSERT_GT(desenho.size(), 10);

    // Strip, number (padded in front with "0" to four places) and key of each terminal.
    QStringList esperadas, obtidas;
    for (const QStringList& t : desenho) {
        ASSERT_EQ(t.size(), 3);
        esperadas << t[0] + "|" + t[1].rightJustified(4, '0', true) + "|" + t[2];
    }
    int ligadas = 0, acessorios = 0;
    QList<QStringList> bornes;
    for (const QStringList& t : exportadas.mid(1)) {
        ASSERT_EQ(t.size(), 6);
        // Terminals come with their accessories, and nothing else.
        ASSERT_TRUE(t[0] == "BORNE" || t[0] == "ACE") << t[0].toStdString();
        if (t[0] == "ACE") {
            ++acessorios;
            continue;
        }
        bornes << t;
        obtidas << t[1] + "|" + t[2] + "|" + t[5];
        if (!t[3].isEmpty() || !t[4].isEmpty()) ++ligadas;
    }
    ASSERT_EQ(bornes.size(), desenho.size());
    EXPECT_GT(acessorios, 0);
    // Sorted by strip, then number within the strip; the drawing's order is its own.
    for (int i = 1; i < bornes.size(); ++i)
        if (bornes[i][1] == bornes[i - 1][1]) {
            EXPECT_LE(bornes[i - 1][2].toInt(), bornes[i][2].toInt()) << i;
        }
    QStringList ordenadas = obtidas;
    std::sort(ordenadas.begin(), ordenadas.end());
    esperadas.sort();
    EXPECT_EQ(ordenadas, esperadas);
    // The generated terminals are wired: their sides say what they meet.
    EXPECT_GT(ligadas, bornes.size() / 2);

    // The same project and configuration give the same bytes.
    const QString segundo = produto_->path("bornes2.csv");
    ASSERT_EQ(exporta("CSV", segundo).status, 0);
    QFile a(alvo), b(segundo);
    ASSERT_TRUE(a.open(QIODevice::ReadOnly) && b.open(QIODevice::ReadOnly));
    EXPECT_EQ(a.readAll(), b.readAll());
}

TEST_F(ExportEndToEnd, TerminalsToXlsxReadBackWithOpenpyxl) {
    const QString csv = produto_->path("bornes-x.csv");
    ASSERT_EQ(exporta("CSV", csv).status, 0);
    const QString alvo = produto_->path("bornes.xlsx");
    const zvtest::HostRun run = exporta("XLSX", alvo);
    ASSERT_EQ(run.status, 0) << run.err.toStdString();

    QProcess p;
    p.start("/usr/bin/python3", {ZV_TEST_DIR "/le_xlsx.py", alvo});
    ASSERT_TRUE(p.waitForFinished(120000));
    ASSERT_EQ(p.exitCode(), 0) << p.readAllStandardError().constData();
    const QJsonArray pasta = QJsonDocument::fromJson(p.readAllStandardOutput()).array();
    ASSERT_FALSE(pasta.isEmpty());
    const QJsonObject celulas = pasta.at(0).toObject().value("celulas").toObject();

    // The headings whole (the CSV cuts them to the width), then every cell of the rows is
    // the CSV's cell at the same place.
    EXPECT_EQ(celulas.value("A1").toString(), "Tipo");
    EXPECT_EQ(celulas.value("C1").toString(), "Numero");
    const QList<QStringList> linhasCsv = linhas(csv);
    ASSERT_GT(linhasCsv.size(), 10);
    int vistas = 0;
    for (int r = 1; r < linhasCsv.size(); ++r)
        for (int c = 0; c < linhasCsv[r].size(); ++c) {
            const QString endereco = QString(QChar('A' + c)) + QString::number(r + 1);
            const QString valor = celulas.value(endereco).toString();
            if (linhasCsv[r][c].isEmpty()) {
                EXPECT_FALSE(celulas.contains(endereco) && !valor.isEmpty())
                    << endereco.toStdString();
                continue;
            }
            EXPECT_EQ(valor, linhasCsv[r][c]) << endereco.toStdString();
            ++vistas;
        }
    EXPECT_GT(vistas, linhasCsv.size());
    EXPECT_FALSE(celulas.contains("A" + QString::number(linhasCsv.size() + 1)));
}

}  // namespace

namespace {

// The page kind through the same command: every page of the project into one PDF, and the
// pages named into numbered images.
TEST_F(ExportEndToEnd, ThePageKindWritesThePagesAsOnePdfOrAsOneImageAPage) {
    const auto pagina = [&](const QString& formato, const QString& alvo, const QString& paginas) {
        QStringList args{"--quiet", "--load", produto_->path("produto/config/zvconfig.lsp")};
        for (const QString& a : QStringList{"export:config=Completa", "export:type=PAGINAS",
                                            "export:format=" + formato, "export:file=" + alvo})
            args << "--answer" << a;
        if (!paginas.isEmpty())
            args << "--answer"
                 << "export:pages=" + paginas;
        return produto_->zvhost(args << produto_->project() << "exportacao");
    };
    const QString pdf = produto_->path("paginas.pdf");
    const zvtest::HostRun r = pagina("PDF", pdf, QString());
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    QProcess check;
    check.start("qpdf", {"--check", pdf});
    ASSERT_TRUE(check.waitForFinished(60000));
    EXPECT_EQ(check.exitCode(), 0) << check.readAllStandardOutput().constData();
    QProcess info;
    info.start("qpdf", {"--show-npages", pdf});
    ASSERT_TRUE(info.waitForFinished(60000));
    // One PDF page for each page of the project's registry: cover, index, power and
    // schematic pages and the panel layout.
    const QString lista =
        produto_
            ->zvhost({"--quiet", "--eval",
                      "(princ (strcat \"pages=\" (itoa (length (buscalistapaginas)))))",
                      produto_->project()})
            .out;
    const QRegularExpressionMatch n = QRegularExpression("pages=(\\d+)").match(lista);
    ASSERT_TRUE(n.hasMatch()) << lista.toStdString();
    EXPECT_EQ(QString::fromLatin1(info.readAllStandardOutput()).trimmed(), n.captured(1));

    const zvtest::HostRun png =
        pagina("PNG", produto_->path("pg.png"), "COMANDO$0001$A;COMANDO$0002$A");
    ASSERT_EQ(png.status, 0) << png.err.toStdString();
    for (const char* nome : {"pg_001.png", "pg_002.png"}) {
        QImage imagem(produto_->path(nome));
        EXPECT_FALSE(imagem.isNull()) << nome;
    }
    EXPECT_FALSE(QFile::exists(produto_->path("pg_003.png")));
}

}  // namespace
