// Page selection over a solution: the picker's answer as selection entries, open drawings
// taken as they are, others read beside them, and the material list's selection table.
#include "ReaderFixture.h"
#include "drawing/DxfWriter.h"
#include "readers/SelecaoPaginas.h"

#include <QDir>

namespace {

class SolutionTest : public ReaderFixture {
protected:
    void SetUp() override {
        ReaderFixture::SetUp();
        // ProjB lies in a file of its own with two pages.
        zvdb::Database b;
        b.createLayer("ESQ$0002$A");
        b.createLayer("ESQ$0009$A");
        QDir().mkpath(pasta_.filePath("sub"));
        zvdb::DxfWriter::saveFile(b, pasta_.filePath("sub/ProjB.dxf").toStdString());
        QFile solucao(pasta_.filePath("job.zvs"));
        ASSERT_TRUE(solucao.open(QIODevice::WriteOnly));
        solucao.write("; the job\nProjA.dxf\n\n  sub\\ProjB.dxf  \n");
        solucao.close();
    }
    bool Carrega() {
        return CICad::AvaliaLisp("(zvsolution_load \"" + pasta_.filePath("job.zvs") + "\")");
    }
};

TEST_F(SolutionTest, ASolutionFileSetsItsProjectsAsAbsolutePaths) {
    EXPECT_FALSE(CICad::zvInvokeBool("zvsolution_isloaded"));
    ASSERT_TRUE(Carrega());
    EXPECT_EQ(CICad::GetListaLisp("*ZV_SOLUCAO*"),
              QStringList({pasta_.filePath("ProjA.dxf"), pasta_.filePath("sub/ProjB.dxf")}));
    EXPECT_TRUE(CICad::zvInvokeBool("zvsolution_isloaded"));
    EXPECT_EQ(CICad::zvInvokeString("zvsolution_getProjFile", {"projb"}),
              pasta_.filePath("sub/ProjB.dxf"));
    // A file that does not exist changes nothing and says so.
    CICad::AvaliaLisp("(setq r (zvsolution_load \"" + pasta_.filePath("none.zvs") + "\"))");
    EXPECT_TRUE(CICad::GetListaLisp("r").isEmpty());
    EXPECT_EQ(CICad::GetListaLisp("*ZV_SOLUCAO*").size(), 2);
    out_.flush();
    EXPECT_TRUE(saida_.contains("can't read")) << saida_.toStdString();
}

TEST_F(SolutionTest, PagesOfOneProjectMakeOneEntryAndAnOpenProjectIsNotReadAgain) {
    ASSERT_TRUE(Carrega());
    CESelecao selecao;
    MontaSelecaoSolucao({"ProjA.dxf#ESQ$0001$A", "ProjB#ESQ$0002$A", "ProjA.dxf#ESQ$0003$A",
                         "ProjB#ESQ#9", "Nope#P1"},
                        selecao);
    ASSERT_EQ(selecao.size(), 3u);
    // The open drawing: its own database, nothing kept open for it.
    EXPECT_EQ(selecao[0].database, &db());
    EXPECT_EQ(selecao[0].mantida, nullptr);
    EXPECT_EQ(*selecao[0].paginas, QStringList({"ESQ$0001$A", "ESQ$0003$A"}));
    // ProjB from its file, kept open by the entry; a page name keeps its further "#".
    ASSERT_NE(selecao[1].database, nullptr);
    EXPECT_EQ(selecao[1].mantida.get(), selecao[1].database);
    EXPECT_NE(selecao[1].database->layer("ESQ$0009$A"), nullptr);
    EXPECT_EQ(*selecao[1].paginas, QStringList({"ESQ$0002$A", "ESQ#9"}));
    // A key no file answers for: an entry with no database.
    EXPECT_EQ(selecao[2].database, nullptr);
    EXPECT_EQ(*selecao[2].paginas, QStringList({"P1"}));
    EXPECT_EQ(app_->documentCount(), 1);
}

TEST_F(SolutionTest, TheSolutionPickerRunsOnlyWithNoActiveDrawing) {
    ASSERT_TRUE(Carrega());
    ui_->setAnswer("pages", "ProjB#ESQ$0002$A");
    CESelecao selecao(2);
    EXPECT_FALSE(SelecionaPaginasSolucao(selecao));
    EXPECT_TRUE(selecao.empty());
}

TEST_F(SolutionTest, TheMaterialSelectionFollowsTheFlagAndTheSolution) {
    // No solution, no question: the active drawing, all pages.
    CESelecao selecao = SelecaoMateriais();
    ASSERT_EQ(selecao.size(), 1u);
    EXPECT_EQ(selecao[0].database, &db());
    EXPECT_FALSE(selecao[0].paginas.has_value());

    // Asking, and the picker cancelled: no page, not all pages.
    CICad::AvaliaLisp("(setq *SELECAO_PAG_MATTABLE* T)");
    selecao = SelecaoMateriais();
    ASSERT_EQ(selecao.size(), 1u);
    ASSERT_TRUE(selecao[0].paginas.has_value());
    EXPECT_TRUE(selecao[0].paginas->isEmpty());

    // A solution without the question: every open drawing with all its layers.
    ASSERT_TRUE(Carrega());
    CICad::AvaliaLisp("(setq *SELECAO_PAG_MATTABLE* nil)");
    db().createLayer("ESQ$0001$A");
    selecao = SelecaoMateriais();
    ASSERT_EQ(selecao.size(), 1u);
    EXPECT_EQ(selecao[0].database, &db());
    ASSERT_TRUE(selecao[0].paginas.has_value());
    EXPECT_TRUE(selecao[0].paginas->contains("ESQ$0001$A"));
    EXPECT_EQ(*selecao[0].paginas, CICad::GetLayers(&db()));
}

}  // namespace
