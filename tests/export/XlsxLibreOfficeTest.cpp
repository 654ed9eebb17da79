// Workbooks as a spreadsheet program reads them: a new workbook and a filled template are
// converted headless by LibreOffice Calc (one start for both) and the result is read back
// with openpyxl, cell by cell, against what the writer was given.
#include "ItensTeste.h"
#include "export/CCXlsxWriter.h"
#include "export/CEExcelFile.h"

#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QImage>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QProcess>
#include <QStandardPaths>
#include <QTemporaryDir>
#include <QUrl>

#include <gtest/gtest.h>

using zvtest::Coluna;
using zvtest::NovoItem;

namespace {

// A cold start of the office suite with a new profile takes some 10 s on a busy machine.
constexpr int kLimiteConversao = 240;

QString Soffice() {
    for (const char* nome : {"soffice", "libreoffice"}) {
        const QString caminho = QStandardPaths::findExecutable(nome);
        if (!caminho.isEmpty()) return caminho;
    }
    return QString();
}

bool Executa(const QString& programa, const QStringList& argumentos, QByteArray* saida,
             QString& erro, int segundos = 120) {
    QProcess p;
    p.start("timeout", QStringList{"-k", "10", QString::number(segundos), programa} + argumentos);
    if (!p.waitForFinished((segundos + 20) * 1000)) {
        p.kill();
        p.waitForFinished();
        erro = programa + " did not finish";
        return false;
    }
    if (saida) *saida = p.readAllStandardOutput();
    if (p.exitStatus() != QProcess::NormalExit || p.exitCode() != 0) {
        erro = programa + " " + argumentos.join(' ') + " ended with " +
               QString::number(p.exitCode()) + ": " + QString::fromUtf8(p.readAllStandardError());
        return false;
    }
    return true;
}

// Every sheet of a workbook as a script prints it: le_xlsx.py (openpyxl: styles, merges,
// images) or celulas_xlsx.py (the cells' values and kinds, from the file's XML).
QJsonArray LePasta(const QString& caminho, const char* script = "celulas_xlsx.py") {
    QByteArray json;
    QString erro;
    if (!Executa("/usr/bin/python3", {QString(ZV_TEST_DIR "/") + script, caminho}, &json, erro)) {
        ADD_FAILURE() << script << " could not read " << caminho.toStdString() << ": "
                      << erro.toStdString();
        return {};
    }
    return QJsonDocument::fromJson(json).array();
}

// The texts that a spreadsheet could take for something else: formulas, numbers, dates,
// truth values, percentages, escapes of the file format, characters beyond the BMP.
const QString kArmadilhas[] = {
    "=SUM(A1:A2)",
    "+1",
    "-",
    "@x",
    "=",
    "-1 " + QString(QChar(0x03A9)),
    "007",
    "1.50",
    "1E3",
    "2026-03-07",
    "07/03/2026",
    "TRUE",
    "50%",
    "R$ 1,00",
    "_x0041_",
    "a_x000D_b",
    " leading",
    "trailing ",
    "two\nlines",
    "tab\there",
    "cr\r\nlf",
    QString("bell") + QChar(0x07) + QChar(0x01),
    "A&B \"<c>\" 'd'",
    QString::fromUtf8("ç ã € Ω"),
    QString::fromUtf8("plug \xF0\x9F\x94\x8C"),
    QString(2000, 'w'),
};

class XlsxNoCalc : public ::testing::Test {
protected:
    void SetUp() override {
        ASSERT_TRUE(pasta.isValid());
        // Two values a row: the trap and the row's number, so a shifted row shows.
        int n = 0;
        for (const QString& texto : kArmadilhas)
            itens.push_back(NovoItem({{"TEXTO", texto}, {"N", QString::number(++n)}}));
        itens.push_back(NovoItem({{"TEXTO", "vazio a seguir"}, {"N", ""}}));
        colunas = {Coluna("TEXTO", "Texto"), Coluna("N", "=N")};
    }
    void TearDown() override { itens.destruirItens(); }
    QString Caminho(const QString& nome) const { return pasta.filePath(nome); }

    // What the writer was asked to put in the first sheet, from a zero-based start row:
    // texts, each as {"valor", "tipo": "s"}.
    QJsonObject Escrito(int inicio) const {
        QJsonObject celulas;
        const auto texto = [](const QString& valor) {
            return QJsonObject{{"valor", valor}, {"tipo", "s"}};
        };
        int linha = inicio;
        for (size_t c = 0; c < colunas.size(); ++c)
            celulas[zv::CEExcelFile::Referencia(linha, int(c))] = texto(colunas[c].Titulo);
        for (const CEItemLista* item : itens) {
            ++linha;
            for (size_t c = 0; c < colunas.size(); ++c)
                celulas[zv::CEExcelFile::Referencia(linha, int(c))] =
                    texto(item->valorCampo(colunas[c].Tag));
        }
        return celulas;
    }

    QTemporaryDir pasta;
    CEExportacao exp;
    VetorItens itens;
    std::vector<CEPropExport> colunas;
};

// The cells as Calc read them against the expected values and kinds; an expected empty
// text may be no cell at all. Calc keeps a line break in a cell as a line feed alone.
void Compara(const QJsonObject& esperadas, const QJsonObject& lidas, const char* onde) {
    SCOPED_TRACE(onde);
    for (auto it = esperadas.begin(); it != esperadas.end(); ++it) {
        const std::string ref = it.key().toStdString();
        const QJsonObject esperada = it.value().toObject();
        const QString valor = esperada["valor"].toString().replace("\r\n", "\n");
        if (valor.isEmpty() && !lidas.contains(it.key())) continue;
        ASSERT_TRUE(lidas.contains(it.key())) << ref << " is missing";
        const QJsonObject lida = lidas[it.key()].toObject();
        EXPECT_EQ(lida["valor"].toString().toStdString(), valor.toStdString()) << "cell " << ref;
        EXPECT_EQ(lida["tipo"].toString().toStdString(), esperada["tipo"].toString().toStdString())
            << "cell " << ref << " " << valor.toStdString();
    }
    for (auto it = lidas.begin(); it != lidas.end(); ++it)
        EXPECT_TRUE(esperadas.contains(it.key()))
            << "cell " << it.key().toStdString()
            << " appeared: " << it.value().toObject()["valor"].toString().toStdString();
}

}  // namespace

TEST_F(XlsxNoCalc, NewAndTemplateWorkbooksReadAsWritten) {
    const QString soffice = Soffice();
    if (soffice.isEmpty())
        GTEST_SKIP() << "soffice (LibreOffice Calc) is not installed, so the workbooks were NOT "
                        "checked in it; ./zv deps installs libreoffice-calc-nogui";

    // A new workbook.
    CCXlsxWriter nova(&exp);
    ASSERT_TRUE(nova.Escreve(itens, colunas, Caminho("nova.xlsx"))) << nova.Erro().toStdString();

    // A template with styles, a merged title, formulas, an image and a second sheet, filled
    // from its fourth row.
    QImage imagem(8, 8, QImage::Format_RGB32);
    imagem.fill(Qt::blue);
    ASSERT_TRUE(imagem.save(Caminho("logo.png")));
    QString erro;
    ASSERT_TRUE(
        Executa("/usr/bin/python3",
                {ZV_TEST_DIR "/faz_modelo_xlsx.py", Caminho("modelo.xlsx"), Caminho("logo.png")},
                nullptr, erro))
        << erro.toStdString();
    CEExportacao comModelo;
    comModelo.SetOpcao("XLSX_TEMPLATE", Caminho("modelo.xlsx"));
    comModelo.SetOpcao("XLSX_LINHA_INI_INT", "4");
    CCXlsxWriter preenchida(&comModelo);
    ASSERT_TRUE(preenchida.Escreve(itens, colunas, Caminho("preenchida.xlsx")))
        << preenchida.Erro().toStdString();

    // One start converts both, with a profile of its own so that no user's settings count.
    ASSERT_TRUE(QDir(pasta.path()).mkpath("calc"));
    const QString perfil = QUrl::fromLocalFile(Caminho("perfil")).toString();
    ASSERT_TRUE(
        Executa(soffice,
                {"--headless", "--norestore", "--nolockcheck", "-env:UserInstallation=" + perfil,
                 "--convert-to", "xlsx:Calc MS Excel 2007 XML", "--outdir", Caminho("calc"),
                 Caminho("nova.xlsx"), Caminho("preenchida.xlsx")},
                nullptr, erro, kLimiteConversao))
        << erro.toStdString();
    ASSERT_TRUE(QFileInfo::exists(Caminho("calc/nova.xlsx"))) << "Calc did not read nova.xlsx";
    ASSERT_TRUE(QFileInfo::exists(Caminho("calc/preenchida.xlsx")))
        << "Calc did not read preenchida.xlsx";

    // Text stays text: no number, date, truth value or formula is made of it.
    {
        const QJsonArray pastaNova = LePasta(Caminho("calc/nova.xlsx"));
        ASSERT_EQ(pastaNova.size(), 1);
        Compara(Escrito(0), pastaNova.at(0).toObject()["celulas"].toObject(), "new workbook");
    }

    // The template: every cell it had stays unless the export wrote over it, its formulas
    // as formulas, and the rest of the workbook comes through.
    const QJsonArray original = LePasta(Caminho("modelo.xlsx"));
    const QJsonArray calc = LePasta(Caminho("calc/preenchida.xlsx"));
    ASSERT_EQ(original.size(), 2);
    ASSERT_EQ(calc.size(), 2);
    QJsonObject esperadas = original.at(0).toObject()["celulas"].toObject();
    ASSERT_EQ(esperadas["D1"].toObject()["tipo"].toString(), "f");  // above the written rows
    ASSERT_EQ(esperadas["E4"].toObject()["tipo"].toString(), "f");  // beside them
    const QJsonObject escritas = Escrito(3);
    for (auto it = escritas.begin(); it != escritas.end(); ++it)
        esperadas[it.key()] = it.value();
    EXPECT_EQ(calc.at(0).toObject()["nome"].toString(), "Lista");
    Compara(esperadas, calc.at(0).toObject()["celulas"].toObject(), "filled template");
    EXPECT_EQ(calc.at(1).toObject()["nome"].toString(), "Outra");
    Compara(original.at(1).toObject()["celulas"].toObject(),
            calc.at(1).toObject()["celulas"].toObject(), "second sheet");

    const QJsonObject folha =
        LePasta(Caminho("calc/preenchida.xlsx"), "le_xlsx.py").at(0).toObject();
    const QJsonObject estilos = folha["estilos"].toObject();
    EXPECT_TRUE(estilos["A1"].toObject()["negrito"].toBool());
    EXPECT_TRUE(estilos["A4"].toObject()["negrito"].toBool());  // written over, style kept
    EXPECT_EQ(estilos["B2"].toObject()["cor"].toString(), "FFFFFF00");
    EXPECT_EQ(folha["mescladas"].toArray(), QJsonArray({"A1:C1"}));
    EXPECT_EQ(folha["imagens"].toInt(), 1);
}
