// The data writers on small item vectors: whole files compared byte for byte, workbooks
// read back with openpyxl, and failures that must leave the old file as it was.
#include "ItensTeste.h"
#include "QtPrinters.h"
#include "export/CCCsvWriter.h"
#include "export/CCHtmlWriter.h"
#include "export/CCXlsxWriter.h"
#include "export/CCXmlWriter.h"
#include "export/CEExcelFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QImage>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QTemporaryDir>

#include <gtest/gtest.h>

#include <csignal>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

using zvtest::Coluna;
using zvtest::NovoItem;

namespace {

QByteArray Le(const QString& caminho) {
    QFile f(caminho);
    return f.open(QIODevice::ReadOnly) ? f.readAll() : QByteArray();
}

void Grava(const QString& caminho, const QByteArray& bytes) {
    QFile f(caminho);
    ASSERT_TRUE(f.open(QIODevice::WriteOnly | QIODevice::Truncate));
    ASSERT_EQ(f.write(bytes), bytes.size());
}

// The items of the small exports: two terminals and one with odd characters.
class Escritores : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(pasta.isValid());
        itens.push_back(NovoItem({{"REGUA", "X1"}, {"NUMERO", "1"}, {"HANDLE", "2A3"}}));
        itens.push_back(NovoItem({{"REGUA", "X1"}, {"NUMERO", "2"}, {"HANDLE", "2A4"}}));
        itens.push_back(NovoItem(
            {{"REGUA", "A&B \"<c>\" 'd'"}, {"NUMERO", QString::fromUtf8("ç")}, {"HANDLE", "FF"}}));
        colunas = {Coluna("REGUA"), Coluna("NUMERO")};
    }
    void TearDown() override { itens.destruirItens(); }
    QString Caminho(const QString& nome) const { return pasta.filePath(nome); }

    QTemporaryDir pasta;
    CEExportacao exp;
    VetorItens itens;
    std::vector<CEPropExport> colunas;
};

}  // namespace

TEST_F(Escritores, CsvWithTheDefaults) {
    CCCsvWriter csv(&exp);
    ASSERT_TRUE(csv.Escreve(itens, colunas, Caminho("a.csv"))) << csv.Erro().toStdString();
    EXPECT_EQ(Le(Caminho("a.csv")),
              "\"REGUA\";\"NUMERO\"\r\n"
              "\"X1\";\"1\"\r\n"
              "\"X1\";\"2\"\r\n"
              "\"A&B \"<c>\" 'd'\";\"\xe7\"\r\n");
}

TEST_F(Escritores, CsvDelimitersWidthsAndHiddenColumns) {
    exp.SetOpcao("CSV_DELIM_TEXTO", "");
    exp.SetOpcao("CSV_DELIM_CAMPO", "||");
    CEPropExport oculta = Coluna("HANDLE");
    oculta.Visivel = false;
    CEPropExport numero = Coluna("NUMERO", "NUM");
    numero.Tamanho = "5";
    numero.Preenche = "0";
    numero.Direita = true;
    CEPropExport regua = Coluna("REGUA", "ABCDE");
    regua.Tamanho = "3";
    CCCsvWriter csv(&exp);
    itens.resize(2);
    ASSERT_TRUE(csv.Escreve(itens, {oculta, numero, regua}, Caminho("b.csv")));
    EXPECT_EQ(Le(Caminho("b.csv")),
              "NUM  ||ABC\r\n"
              "00001||X1 \r\n"
              "00002||X1 \r\n");
    itens.resize(3, nullptr);  // TearDown frees what is left; the third is freed here
}

TEST_F(Escritores, CsvEmptyListAndNoHeader) {
    CCCsvWriter csv(&exp);
    ASSERT_TRUE(csv.Escreve({}, colunas, Caminho("c.csv")));
    EXPECT_EQ(Le(Caminho("c.csv")), "\"REGUA\";\"NUMERO\"\r\n");
    exp.SetOpcao("CSV_CABECALHO_SN", "N");
    ASSERT_TRUE(csv.Escreve({}, colunas, Caminho("c.csv")));
    EXPECT_TRUE(QFileInfo::exists(Caminho("c.csv")));
    EXPECT_EQ(Le(Caminho("c.csv")), "");
}

TEST_F(Escritores, CsvBrokenEllipsisAndCharactersBeyondLatin1) {
    CEItemLista item;
    item.definirCampo("REGUA", QString("a") + QChar(0x00C3) + QChar(0x201A) + "b");
    item.definirCampo("NUMERO", QString::fromUtf8("Ω\nfim"));
    CCCsvWriter csv(&exp);
    exp.SetOpcao("CSV_CABECALHO_SN", "N");
    ASSERT_TRUE(csv.Escreve({&item}, colunas, Caminho("d.csv")));
    // A line feed in a value breaks the line; nothing prevents it.
    EXPECT_EQ(Le(Caminho("d.csv")), "\"a...b\";\"?\nfim\"\r\n");
}

TEST_F(Escritores, HtmlTable) {
    CCHtmlWriter html(&exp);
    itens.push_back(NovoItem({{"REGUA", ""}, {"NUMERO", "3"}}));
    ASSERT_TRUE(html.Escreve(itens, colunas, Caminho("a.html")));
    EXPECT_EQ(Le(Caminho("a.html")),
              "<header>\r\n</header>\r\n<body>\r\n<table border=\"1\" >\r\n"
              "<tr>\r\n<td><b>REGUA</b></td>\r\n<td><b>NUMERO</b></td>\r\n</tr>\r\n"
              "<tr>\r\n<td>X1</td>\r\n<td>1</td>\r\n</tr>\r\n"
              "<tr>\r\n<td>X1</td>\r\n<td>2</td>\r\n</tr>\r\n"
              "<tr>\r\n<td>A&amp;B &quot;&lt;c&gt;&quot; &apos;d&apos;</td>\r\n"
              "<td>\xe7</td>\r\n</tr>\r\n"
              "<tr>\r\n<td>&nbsp</td>\r\n<td>3</td>\r\n</tr>\r\n"
              "</table>\r\n</body>\r\n");
}

TEST_F(Escritores, HtmlOptions) {
    exp.SetOpcao("HTML_LARG_TABELA", "");
    exp.SetOpcao("HTML_CABE_NEG_SN", "N");
    CCHtmlWriter html(&exp);
    itens.resize(1);
    ASSERT_TRUE(html.Escreve(itens, {Coluna("REGUA", "A<B")}, Caminho("b.html")));
    EXPECT_EQ(Le(Caminho("b.html")),
              "<header>\r\n</header>\r\n<body>\r\n<table border=\"0\" >\r\n"
              "<tr>\r\n<td>A&lt;B</td>\r\n</tr>\r\n"
              "<tr>\r\n<td>X1</td>\r\n</tr>\r\n</table>\r\n</body>\r\n");
    exp.SetOpcao("HTML_CABECALHO_SN", "N");
    ASSERT_TRUE(html.Escreve(itens, {Coluna("REGUA")}, Caminho("b.html")));
    EXPECT_FALSE(Le(Caminho("b.html")).contains("A&lt;B"));
    itens.resize(3, nullptr);
}

TEST(EscapaHtml, DoublyEncodedCapitalsAndTheDeadRows) {
    const QString prefixo = QString(QChar(0x00C3)) + QChar(0x0192) + QChar(0x00C2);
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(prefixo + QChar(0x20AC)), "&Agrave;");
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(prefixo + QChar(0x0081)), "&Aacute;");
    EXPECT_EQ(CCHtmlWriter::EscapaHtml("x" + prefixo + QChar(0x201A) + "y"), "x&Acirc;y");
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(prefixo + QChar(0x0192)), "&Atilde;");
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(prefixo + QChar(0x201E)), "&Auml;");
    // The pair alone anywhere is "&Aring;", which also eats the start of every later key.
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(QString("a") + QChar(0x00C3) + QChar(0x0192) + "b"),
              "a&Aring;b");
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(prefixo + QChar(0x2020)),
              "&Aring;" + QString(QChar(0x00C2)) + QChar(0x2020));
    // Plain accented letters are left alone; the apostrophe and quote are named.
    EXPECT_EQ(CCHtmlWriter::EscapaHtml(QString::fromUtf8("Ação")), QString::fromUtf8("Ação"));
    EXPECT_EQ(CCHtmlWriter::EscapaHtml("\"'&"), "&quot;&apos;&amp;");
}

TEST_F(Escritores, XmlDocument) {
    CCXmlWriter xml(&exp);
    CEPropExport regua = Coluna("REGUA", "Strip");
    CEPropExport expressao = Coluna("{REGUA}:{NUMERO}", "Both");
    ASSERT_TRUE(xml.Escreve(itens, {regua, expressao, Coluna("FALTA")}, Caminho("a.xml")));
    EXPECT_EQ(Le(Caminho("a.xml")),
              "<?xml version='1.0' encoding='UTF-8' ?>\r\n<proj>\r\n"
              "  <comp handle=\"2A3\" >\r\n"
              "    <prop tag=\"REGUA\" prompt=\"Strip\" >X1</prop>\r\n"
              "  </comp>\r\n"
              "  <comp handle=\"2A4\" >\r\n"
              "    <prop tag=\"REGUA\" prompt=\"Strip\" >X1</prop>\r\n"
              "  </comp>\r\n"
              "  <comp handle=\"FF\" >\r\n"
              "    <prop tag=\"REGUA\" prompt=\"Strip\" >A&amp;B &amp;quot;&lt;c&gt;&amp;quot; "
              "&apos;d&apos;</prop>\r\n"
              "  </comp>\r\n"
              "</proj>\r\n\r\n");
}

TEST_F(Escritores, XmlEmptyPropertiesAndNoPrompt) {
    exp.SetOpcao("XML_VAZIAS_SN", "S");
    exp.SetOpcao("XML_PROMPT_SN", "N");
    CCXmlWriter xml(&exp);
    CEItemLista vazio;
    vazio.ids.push_back(OdDbObjectId(reinterpret_cast<zvdb::Database*>(8), 0x1B));
    ASSERT_TRUE(xml.Escreve({itens[0], &vazio}, {Coluna("{REGUA}-{NUMERO}"), Coluna("FALTA")},
                            Caminho("b.xml")));
    EXPECT_EQ(Le(Caminho("b.xml")),
              "<?xml version='1.0' encoding='UTF-8' ?>\r\n<proj>\r\n"
              "  <comp handle=\"2A3\" >\r\n"
              "    <prop tag=\"{REGUA}-{NUMERO}\" >X1-1</prop>\r\n"
              "    <prop tag=\"FALTA\" ></prop>\r\n"
              "  </comp>\r\n"
              "  <comp handle=\"1B\" >\r\n"
              "    <prop tag=\"{REGUA}-{NUMERO}\" >-</prop>\r\n"
              "    <prop tag=\"FALTA\" ></prop>\r\n"
              "  </comp>\r\n"
              "</proj>\r\n\r\n");
}

TEST_F(Escritores, XmlWithAsciiDataParses) {
    CCXmlWriter xml(&exp);
    itens.resize(2);
    ASSERT_TRUE(xml.Escreve(itens, colunas, Caminho("c.xml")));
    QProcess p;
    p.start("/usr/bin/python3", {"-c",
                                 "import sys,xml.dom.minidom as m; d=m.parse(sys.argv[1]); "
                                 "print(len(d.getElementsByTagName('prop')))",
                                 Caminho("c.xml")});
    ASSERT_TRUE(p.waitForFinished(60000));
    EXPECT_EQ(p.exitCode(), 0) << p.readAllStandardError().constData();
    EXPECT_EQ(p.readAllStandardOutput().trimmed(), "4");
    itens.resize(3, nullptr);
}

// ---- failures: the target is never half-written, the old file stays

class FalhasEscrita : public Escritores, public ::testing::WithParamInterface<int> {
protected:
    std::unique_ptr<CCExportWriter> Writer() {
        switch (GetParam()) {
            case CEExportacao::Csv:
                return std::make_unique<CCCsvWriter>(&exp);
            case CEExportacao::Html:
                return std::make_unique<CCHtmlWriter>(&exp);
            case CEExportacao::Xml:
                return std::make_unique<CCXmlWriter>(&exp);
            default:
                return std::make_unique<CCXlsxWriter>(&exp);
        }
    }
};

TEST_P(FalhasEscrita, AFullDiskKeepsTheOldFile) {
    const QString alvo = Caminho("alvo");
    Grava(alvo, "conteudo antigo");
    // Enough rows that the new file is well past the child's file-size limit.
    VetorItens muitos;
    for (int i = 0; i < 4000; ++i)
        muitos.push_back(itens[size_t(i % 3)]);
    auto writer = Writer();
    const pid_t filho = fork();
    ASSERT_GE(filho, 0);
    if (filho == 0) {
        std::signal(SIGXFSZ, SIG_IGN);
        rlimit limite{16384, 16384};
        setrlimit(RLIMIT_FSIZE, &limite);
        const bool ok = writer->Escreve(muitos, colunas, alvo);
        _exit(!ok && writer->Erro().startsWith("could not save " + alvo) ? 0 : 1);
    }
    int estado = 0;
    ASSERT_EQ(waitpid(filho, &estado, 0), filho);
    ASSERT_TRUE(WIFEXITED(estado));
    EXPECT_EQ(WEXITSTATUS(estado), 0);
    EXPECT_EQ(Le(alvo), "conteudo antigo");
    EXPECT_EQ(QDir(pasta.path()).entryList(QDir::Files | QDir::Hidden).size(), 1);
}

TEST_P(FalhasEscrita, AMissingFolderSaysSo) {
    auto writer = Writer();
    EXPECT_FALSE(writer->Escreve(itens, colunas, Caminho("nao/existe/x")));
    EXPECT_TRUE(writer->Erro().startsWith("could not save ")) << writer->Erro().toStdString();
    EXPECT_TRUE(writer->Erro().contains("No such file or directory"));
}

TEST_P(FalhasEscrita, AReadOnlyFolderSaysSo) {
    if (geteuid() == 0) GTEST_SKIP() << "root writes into read-only folders";
    auto writer = Writer();
    ASSERT_TRUE(QDir(pasta.path()).mkdir("ro"));
    const QString alvo = Caminho("ro/x");
    QFile::setPermissions(Caminho("ro"), QFileDevice::ReadOwner | QFileDevice::ExeOwner);
    EXPECT_FALSE(writer->Escreve(itens, colunas, alvo));
    EXPECT_TRUE(writer->Erro().contains("Permission denied")) << writer->Erro().toStdString();
    QFile::setPermissions(Caminho("ro"),
                          QFileDevice::ReadOwner | QFileDevice::WriteOwner | QFileDevice::ExeOwner);
    EXPECT_FALSE(QFileInfo::exists(alvo));
}

INSTANTIATE_TEST_SUITE_P(Formatos, FalhasEscrita,
                         ::testing::Values(int(CEExportacao::Csv), int(CEExportacao::Html),
                                           int(CEExportacao::Xml), int(CEExportacao::Xlsx)),
                         [](const auto& info) {
                             return CEExportacao::PalavraDeTipoOut(info.param).toStdString();
                         });

// ---- workbooks, read back with openpyxl

namespace {

QJsonArray LePasta(const QString& caminho) {
    QProcess p;
    p.start("/usr/bin/python3", {ZV_TEST_DIR "/le_xlsx.py", caminho});
    if (!p.waitForFinished(120000) || p.exitCode() != 0) {
        ADD_FAILURE() << "openpyxl could not read " << caminho.toStdString() << ": "
                      << p.readAllStandardError().constData();
        return {};
    }
    return QJsonDocument::fromJson(p.readAllStandardOutput()).array();
}

QJsonObject Celulas(const QJsonArray& pasta, int folha = 0) {
    return pasta.at(folha).toObject().value("celulas").toObject();
}

}  // namespace

TEST_F(Escritores, XlsxNewWorkbook) {
    CEItemLista formula;
    formula.definirCampo("REGUA", "=SUM(A1:A2)");
    formula.definirCampo("NUMERO", QString::fromUtf8("-1 Ω _x0041_ \x01 "));
    itens.push_back(&formula);
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve(itens, colunas, Caminho("a.xlsx"))) << xlsx.Erro().toStdString();
    itens.pop_back();
    const QJsonArray pasta = LePasta(Caminho("a.xlsx"));
    ASSERT_EQ(pasta.size(), 1);
    const QJsonObject c = Celulas(pasta);
    EXPECT_EQ(c.size(), 10);
    EXPECT_EQ(c["A1"].toString(), "REGUA");
    EXPECT_EQ(c["B1"].toString(), "NUMERO");
    EXPECT_EQ(c["A2"].toString(), "X1");
    EXPECT_EQ(c["B3"].toString(), "2");
    EXPECT_EQ(c["A4"].toString(), "A&B \"<c>\" 'd'");
    EXPECT_EQ(c["B4"].toString(), QString::fromUtf8("ç"));
    // Text that looks like a formula stays text.
    EXPECT_EQ(c["A5"].toString(), "=SUM(A1:A2)");
    const QJsonObject estilos = pasta.at(0).toObject().value("estilos").toObject();
    EXPECT_EQ(estilos["A5"].toObject()["tipo"].toString(), "s");
    EXPECT_EQ(estilos["B2"].toObject()["tipo"].toString(), "s");
}

TEST_F(Escritores, XlsxStartRowHeaderAndHiddenColumns) {
    const std::pair<const char*, const char*> casos[] = {{"", "A1"},    {"0", "A1"}, {"1", "A1"},
                                                         {" 2 ", "A2"}, {"x", "A1"}, {"5", "A5"}};
    for (const auto& [inicio, primeira] : casos) {
        exp.SetOpcao("XLSX_LINHA_INI_INT", inicio);
        CCXlsxWriter xlsx(&exp);
        CEPropExport oculta = Coluna("HANDLE");
        oculta.Visivel = false;
        ASSERT_TRUE(xlsx.Escreve(itens, {oculta, Coluna("NUMERO", "N")}, Caminho("b.xlsx")));
        const QJsonObject c = Celulas(LePasta(Caminho("b.xlsx")));
        EXPECT_EQ(c[primeira].toString(), "N") << "start " << inicio;
        EXPECT_EQ(c.size(), 4) << "start " << inicio;  // the hidden column leaves no gap
    }
    exp.SetOpcao("XLSX_LINHA_INI_INT", "");
    exp.SetOpcao("XLSX_CABECALHO_SN", "N");
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve(itens, colunas, Caminho("c.xlsx")));
    EXPECT_EQ(Celulas(LePasta(Caminho("c.xlsx")))["A1"].toString(), "X1");
}

TEST_F(Escritores, XlsxIsTheSameBytesEveryTime) {
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve(itens, colunas, Caminho("1.xlsx")));
    ASSERT_TRUE(xlsx.Escreve(itens, colunas, Caminho("2.xlsx")));
    EXPECT_FALSE(Le(Caminho("1.xlsx")).isEmpty());
    EXPECT_EQ(Le(Caminho("1.xlsx")), Le(Caminho("2.xlsx")));
}

class ModeloXlsx : public Escritores {
protected:
    void SetUp() override {
        Escritores::SetUp();
        QImage imagem(8, 8, QImage::Format_RGB32);
        imagem.fill(Qt::red);
        ASSERT_TRUE(imagem.save(Caminho("logo.png")));
        QProcess p;
        p.start("/usr/bin/python3",
                {ZV_TEST_DIR "/faz_modelo_xlsx.py", Caminho("modelo.xlsx"), Caminho("logo.png")});
        ASSERT_TRUE(p.waitForFinished(120000));
        ASSERT_EQ(p.exitCode(), 0) << p.readAllStandardError().constData();
        modelo = Le(Caminho("modelo.xlsx"));
        exp.SetOpcao("XLSX_TEMPLATE", "  " + Caminho("modelo.xlsx") + " ");
    }
    QByteArray modelo;
};

TEST_F(ModeloXlsx, FillsTheFirstSheetFromItsStartRowAndKeepsTheRest) {
    exp.SetOpcao("XLSX_LINHA_INI_INT", "4");
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve(itens, colunas, Caminho("saida.xlsx"))) << xlsx.Erro().toStdString();
    EXPECT_EQ(Le(Caminho("modelo.xlsx")), modelo);  // the template is never written
    const QJsonArray pasta = LePasta(Caminho("saida.xlsx"));
    ASSERT_EQ(pasta.size(), 2);
    const QJsonObject folha = pasta.at(0).toObject();
    EXPECT_EQ(folha["nome"].toString(), "Lista");
    const QJsonObject c = folha["celulas"].toObject();
    // Above the start row everything stays, formula, merge, fill and all.
    EXPECT_EQ(c["A1"].toString(), "Lista de bornes");
    EXPECT_EQ(c["D1"].toString(), "=1+2");
    EXPECT_EQ(c["B2"].toString(), "Cliente");
    const QJsonObject estilos = folha["estilos"].toObject();
    EXPECT_TRUE(estilos["A1"].toObject()["negrito"].toBool());
    EXPECT_EQ(estilos["B2"].toObject()["cor"].toString(), "FFFFFF00");
    EXPECT_EQ(folha["mescladas"].toArray(), QJsonArray({"A1:C1"}));
    EXPECT_EQ(folha["imagens"].toInt(), 1);
    // The written range: an overwritten cell keeps its style; a formula beside it stays.
    EXPECT_EQ(c["A4"].toString(), "REGUA");
    EXPECT_TRUE(estilos["A4"].toObject()["negrito"].toBool());
    EXPECT_EQ(c["E4"].toString(), "=SUM(1,2)");
    EXPECT_EQ(c["A7"].toString(), "A&B \"<c>\" 'd'");
    EXPECT_EQ(c["B7"].toString(), QString::fromUtf8("ç"));
    EXPECT_EQ(c["F9"].toString(), "fica");
    EXPECT_EQ(c.size(), 13);
    const QJsonObject outra = pasta.at(1).toObject();
    EXPECT_EQ(outra["nome"].toString(), "Outra");
    EXPECT_EQ(outra["celulas"].toObject()["A1"].toString(), "nao mexer");
    EXPECT_EQ(outra["celulas"].toObject()["B2"].toString(), "42");
}

TEST_F(ModeloXlsx, OverwrittenFormulasLeaveNoTrace) {
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve(itens,
                             {Coluna("REGUA"), Coluna("NUMERO"), Coluna("X"), Coluna("HANDLE")},
                             Caminho("saida.xlsx")));
    const QJsonObject c = Celulas(LePasta(Caminho("saida.xlsx")));
    EXPECT_EQ(c["D1"].toString(), "HANDLE");
    EXPECT_EQ(c["D2"].toString(), "2A3");
    EXPECT_EQ(c["A1"].toString(), "REGUA");
}

TEST_F(ModeloXlsx, NothingToWriteSavesTheTemplateAsItCame) {
    exp.SetOpcao("XLSX_CABECALHO_SN", "N");
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve({}, colunas, Caminho("igual.xlsx")));
    EXPECT_EQ(Le(Caminho("igual.xlsx")), modelo);
}

TEST_F(ModeloXlsx, ATemplateThatIsNoWorkbookIsRefused) {
    Grava(Caminho("falso.xlsx"), "isto nao e um zip");
    Grava(Caminho("saida.xlsx"), "antigo");
    exp.SetOpcao("XLSX_TEMPLATE", Caminho("falso.xlsx"));
    CCXlsxWriter xlsx(&exp);
    EXPECT_FALSE(xlsx.Escreve(itens, colunas, Caminho("saida.xlsx")));
    EXPECT_TRUE(xlsx.Erro().contains("not a workbook")) << xlsx.Erro().toStdString();
    EXPECT_EQ(Le(Caminho("saida.xlsx")), "antigo");

    // A zip that holds no workbook.
    QProcess p;
    p.start("/usr/bin/python3", {"-c",
                                 "import sys,zipfile; z=zipfile.ZipFile(sys.argv[1],'w'); "
                                 "z.writestr('a.txt','x'); z.close()",
                                 Caminho("zip.xlsx")});
    ASSERT_TRUE(p.waitForFinished(60000));
    exp.SetOpcao("XLSX_TEMPLATE", Caminho("zip.xlsx"));
    EXPECT_FALSE(xlsx.Escreve(itens, colunas, Caminho("saida.xlsx")));
    EXPECT_TRUE(xlsx.Erro().contains("xl/workbook.xml")) << xlsx.Erro().toStdString();
    EXPECT_EQ(Le(Caminho("saida.xlsx")), "antigo");
}

TEST_F(ModeloXlsx, AMissingTemplateGivesANewWorkbook) {
    exp.SetOpcao("XLSX_TEMPLATE", Caminho("nao-existe.xlsx"));
    CCXlsxWriter xlsx(&exp);
    ASSERT_TRUE(xlsx.Escreve(itens, colunas, Caminho("nova.xlsx")));
    const QJsonArray pasta = LePasta(Caminho("nova.xlsx"));
    ASSERT_EQ(pasta.size(), 1);
    EXPECT_EQ(Celulas(pasta)["A1"].toString(), "REGUA");
}

TEST(ExcelFile, CellReferences) {
    EXPECT_EQ(zv::CEExcelFile::Referencia(0, 0), "A1");
    EXPECT_EQ(zv::CEExcelFile::Referencia(9, 25), "Z10");
    EXPECT_EQ(zv::CEExcelFile::Referencia(0, 26), "AA1");
    EXPECT_EQ(zv::CEExcelFile::Referencia(0, 701), "ZZ1");
    EXPECT_EQ(zv::CEExcelFile::Referencia(0, 702), "AAA1");
    EXPECT_EQ(zv::CEExcelFile::Referencia(1048575, 16383), "XFD1048576");
}

TEST(ExcelFile, CellsBeyondTheSheetAreRefused) {
    QTemporaryDir pasta;
    zv::CEExcelFile f;
    ASSERT_TRUE(f.Abre(QString()));
    f.SetCelula(0, 0, "ok");
    f.SetCelula(zv::CEExcelFile::kMaxLinhas, 0, "fora");
    EXPECT_FALSE(f.Salva(pasta.filePath("x.xlsx")));
    EXPECT_TRUE(f.Erro().contains("beyond")) << f.Erro().toStdString();
    EXPECT_FALSE(QFileInfo::exists(pasta.filePath("x.xlsx")));
}

TEST(ExcelFile, TheLastWriteOfACellWins) {
    QTemporaryDir pasta;
    zv::CEExcelFile f;
    ASSERT_TRUE(f.Abre(QString()));
    f.SetCelula(0, 2, "c");
    f.SetCelula(0, 0, "a");
    f.SetCelula(0, 2, "C");
    ASSERT_TRUE(f.Salva(pasta.filePath("x.xlsx"))) << f.Erro().toStdString();
    const QJsonObject c = Celulas(LePasta(pasta.filePath("x.xlsx")));
    EXPECT_EQ(c.size(), 2);
    EXPECT_EQ(c["A1"].toString(), "a");
    EXPECT_EQ(c["C1"].toString(), "C");
}
