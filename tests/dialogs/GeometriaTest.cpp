// The files that keep where the filter and column dialogs stood: one integer a line, lines
// of at most 2000 characters, at least four values or the defaults stay.
#include "AmbienteDialogos.h"
#include "dialogs/CIFiltro.h"
#include "dialogs/CISelProps.h"
#include "dialogs/JanelaDialogo.h"
#include "export/CEExportacao.h"

#include <QTreeWidget>

using namespace JanelaDialogo;

TEST(ArquivoGeometria, ReadsOneDecimalNumberALine) {
    const auto v = LeValores("10\r\n-20\r\n300\r\n400\r\n", 4);
    ASSERT_TRUE(v.has_value());
    EXPECT_EQ(*v, std::vector<int>({10, -20, 300, 400}));
    // A line counts as its leading number, 0 without one; lines end in CR LF or LF.
    EXPECT_EQ(LeValores(" 7px\nabc\n+3\n44", 4), std::vector<int>({7, 0, 3, 44}));
}

TEST(ArquivoGeometria, FewerThanFourValuesLeaveTheDefaults) {
    EXPECT_FALSE(LeValores("1\r\n2\r\n3\r\n", 4).has_value());
    EXPECT_FALSE(LeValores("", 7).has_value());
    // A file of seven lines may stop after four.
    EXPECT_EQ(LeValores("1\r\n2\r\n3\r\n4\r\n", 7), std::vector<int>({1, 2, 3, 4}));
}

TEST(ArquivoGeometria, LinesPastThoseWantedAreIgnored) {
    EXPECT_EQ(LeValores("1\n2\n3\n4\n5\n6\n", 4), std::vector<int>({1, 2, 3, 4}));
    EXPECT_EQ(LeValores("1\n2\n3\n4\n5\n6\n7\n8\n", 7)->size(), 7u);
    // A long line after those wanted is never read.
    EXPECT_EQ(LeValores("1\n2\n3\n4\n" + QByteArray(5000, '9') + "\n", 4)->size(), 4u);
}

TEST(ArquivoGeometria, ALineOfMoreThan2000CharactersEndsTheReading) {
    const QByteArray longa2000 = "5" + QByteArray(1999, ' ');
    const QByteArray longa2001 = "5" + QByteArray(2000, ' ');
    EXPECT_EQ(LeValores("1\n2\n3\n" + longa2000 + "\n", 4), std::vector<int>({1, 2, 3, 5}));
    EXPECT_FALSE(LeValores("1\n2\n3\n" + longa2001 + "\n", 4).has_value());
    // What was read before the long line counts when it is enough.
    EXPECT_EQ(LeValores("1\n2\n3\n4\n5\n" + longa2001 + "\n7\n", 7),
              std::vector<int>({1, 2, 3, 4, 5}));
}

TEST(ArquivoGeometria, WritesWhatItReads) {
    const std::vector<int> valores = {3, -4, 500, 600, 75, 80, 120};
    const QByteArray texto = TextoValores(valores);
    EXPECT_EQ(texto, "3\r\n-4\r\n500\r\n600\r\n75\r\n80\r\n120\r\n");
    EXPECT_EQ(LeValores(texto, 7), valores);
}

namespace {

class GeometriaDialogos : public teste::AmbienteDialogos {};

}  // namespace

TEST_F(GeometriaDialogos, TheFilesLieInZvdlgBelowTheProfileRoot) {
    EXPECT_EQ(PastaEstado(), pasta.filePath("ZVDLG"));
    EXPECT_TRUE(QDir(pasta.filePath("ZVDLG")).exists());
    EXPECT_EQ(PastaEstilos(), pasta.filePath("plotstyles"));
    EXPECT_FALSE(LeArquivo(Estado("EXPORTFILTRO.DAT"), 7).has_value());
}

TEST_F(GeometriaDialogos, ABadFileLeavesTheDialogAsItWas) {
    CEExportacao exp;
    int larguraPadrao = 0;
    QSize tamanhoPadrao;
    {
        CIFiltro d(exp);
        larguraPadrao = d.Lista()->columnWidth(0);
        tamanhoPadrao = d.size();
    }
    QDir().mkpath(pasta.filePath("ZVDLG"));
    // Three values: not enough.
    teste::Grava(Estado("EXPORTFILTRO.DAT"), "10\r\n10\r\n900\r\n");
    {
        CIFiltro d(exp);
        EXPECT_EQ(d.size(), tamanhoPadrao);
        EXPECT_EQ(d.Lista()->columnWidth(0), larguraPadrao);
    }
    // Four values: the placement, and the widths keep their default.
    teste::Grava(Estado("EXPORTFILTRO.DAT"), "10\r\n20\r\n700\r\n580\r\n");
    {
        CIFiltro d(exp);
        EXPECT_EQ(d.geometry(), QRect(10, 20, 700, 580));
        EXPECT_EQ(d.Lista()->columnWidth(0), larguraPadrao);
    }
    // A size too small for a window is not applied.
    std::vector<CEPropExport> colunas;
    QRect padrao;
    {
        CISelProps d(colunas);
        padrao = d.geometry();
    }
    teste::Grava(Estado("EXPORTSELPROPS.DAT"), "10\r\n20\r\n0\r\n-5\r\n");
    CISelProps d(colunas);
    EXPECT_EQ(d.geometry(), padrao);
}
