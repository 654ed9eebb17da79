// Pickers and prompts answered and cancelled; templates; a native function overridden.
#include "ProductFixture.h"
#include "drawing/LayerRecord.h"

#include <QDir>
#include <QFile>
#include <QTemporaryDir>

namespace zvproduct::testing {
namespace {

class PickersTest : public ProductFixture {
protected:
    PickersTest() { addGroup("ESQ", 4, {"ESQ$0001$A", "ESQ$0002$A"}); }
};

TEST_F(PickersTest, PagesAnsweredFilteredOrCancelled) {
    ui.answers["pages"] = "ESQ$0002$A;NOPE;ESQ$0001$A";
    EXPECT_EQ(show("(setq pblTmpSelPags (zv_seleciona_paginas 0))"),
              "(\"ESQ$0002$A\" \"ESQ$0001$A\")");
    EXPECT_TRUE(printed.contains("No such page: NOPE"));
    ui.answers["pages"] = "*";
    EXPECT_EQ(show("(zv_seleciona_paginas 1 0)"), "(\"ESQ$0001$A\" \"ESQ$0002$A\")");
    ui.answers["pages"] = "P1#ESQ$0001$A;P2#ESQ$0003$A";
    EXPECT_EQ(show("(zvselpagsolucao 0)"), "(\"P1#ESQ$0001$A\" \"P2#ESQ$0003$A\")");
    ui.answers.clear();
    EXPECT_EQ(show("(list (zv_seleciona_paginas 0) (zvselpagsolucao 0))"), "(nil nil)");
}

TEST_F(PickersTest, StripsAndPrompts) {
    ui.answers["strips"] = "X1, X2";
    EXPECT_EQ(show("(zvSelecionaReguas)"), "(\"X1\" \"X2\")");
    ui.answers.remove("strips");
    EXPECT_EQ(show("(zvSelecionaReguas)"), "nil");
    ui.answers["prompt:Client"] = "ACME";
    ui.answers["prompt:Job"] = "J 1";
    EXPECT_EQ(show("(ENTRA_VIA_DD (LIST \"Client\" \"Job\" ))"), "T");
    EXPECT_EQ(show("*LST_ATRIBS_ENTRADA*"), "(\"ACME\" \"J 1\")");
    EXPECT_EQ(show("(ENTRA_VIA_DD (LIST \"Client\" \"Date\" ))"), "nil");
    EXPECT_EQ(show("*LST_ATRIBS_ENTRADA*"), "nil");
    EXPECT_TRUE(ui.asked.contains("prompt:Date"));
}

TEST_F(PickersTest, TemplateLoadsOrReportsItsError) {
    QTemporaryDir folder;
    const QString good = folder.path() + "/bornes.grt", bad = folder.path() + "/bad.grt";
    {
        QFile file(good);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write("(setq *LINHAS_PAGINA* 30)\n(setq *CAB* \"LST_BORNE_CAB\")\n");
    }
    {
        QFile file(bad);
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write("(setq *LINHAS_PAGINA* 40)\n(setq *CAB* \"X\"\n");
    }
    EXPECT_EQ(show("(ZVCarregaTemplate \"" + good + "\")"), "T");
    EXPECT_EQ(show("(list *LINHAS_PAGINA* *CAB*)"), "(30 \"LST_BORNE_CAB\")");
    show("(setq *LINHAS_PAGINA* nil)");
    QString windowsStyle = good;
    windowsStyle.replace('/', "\\\\");
    EXPECT_EQ(show("(ZVCarregaTemplate \"" + windowsStyle + "\")"), "T")
        << "folders parted by backslashes, as the module names files";
    EXPECT_EQ(show("*LINHAS_PAGINA*"), "30");
    EXPECT_EQ(show("(ZVCarregaTemplate \"" + bad + "\")"), "nil");
    EXPECT_TRUE(printed.contains("; error:")) << printed.toStdString();
    EXPECT_TRUE(printed.contains("bad.grt")) << printed.toStdString();
    printed.clear();
    EXPECT_EQ(show("(ZVCarregaTemplate \"" + folder.path() + "/none.grt\")"), "nil");
    EXPECT_TRUE(printed.contains("template not found")) << printed.toStdString();
}

TEST_F(PickersTest, UserDefunReplacesANativeFunction) {
    EXPECT_EQ(show("(getprimeirapagina)"), "\"ESQ$0001$A\"");
    run("(defun getprimeirapagina () \"MINHA$0001$A\")");
    EXPECT_EQ(show("(getprimeirapagina)"), "\"MINHA$0001$A\"");
    EXPECT_EQ(lisp.call("getprimeirapagina", {}).asString(), "MINHA$0001$A");
}

TEST_F(PickersTest, SheetGridCircuitsSolutionAndLanguage) {
    EXPECT_EQ(show("(BuscarCoordenadas nil \"ESQ\" \"0001\" 10.0 290.0)"), "\"A1\"");
    EXPECT_EQ(show("(BuscarCoordenadas nil \"ESQ\" \"0001\" 419.0 1.0)"), "\"H12\"");
    EXPECT_EQ(show("(BuscarCoordenadas nil \"ESQ\" \"0001\" 500.0 10.0)"), "\"??\"");
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 2)"), "(\"2\" \"\" \"\")");
    auto* settings = database->modelSpace()->addPoint({0, 0, 0}, "ZV_FREEZE");
    settings->setXData("KVR_ZV_PAINEL",
                       zvsample::XDataItems().text("PAINEL_1").text("PAINEL_2").tags());
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 3)"), "(\"3\" \"PAINEL_1\" \"\")");
    run("(setq *ZV_CIRCUITOS_LOCAIS* '((2 \"CL2\" \"Bombas\" \"PAINEL_1\")))");
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 2)"), "(\"CL2\" \"Bombas\" \"PAINEL_1\")");
    EXPECT_EQ(show("(zvsolution_isloaded)"), "nil");
    run("(setq *ZV_SOLUCAO* '(\"/p/a/ProjA.dxf\" \"/p/b/ProjB.dxf\"))");
    EXPECT_EQ(show("(list (zvsolution_isloaded) (zvsolution_getProjFile \"projb.dxf\") "
                   "(zvsolution_getProjFile \"ProjA\") (zvsolution_getProjFile \"C\"))"),
              "(T \"/p/b/ProjB.dxf\" \"/p/a/ProjA.dxf\" nil)");
    run("(setq *_ZV_IDIOMA_ATUAL_* \"ES\")");
    EXPECT_EQ(show("(zv_interno_get_idioma_corrente)"), "\"ES\"");
    EXPECT_EQ(show("(list (zvAlternaStatusBloqueioPalette) (zvAlternaStatusBloqueioPalette))"),
              "(T nil)");
}

// The project's first panel is kept over the layer edits of page swaps; a change of an
// entity is seen, and the first settings point in drawing order gives it.
TEST_F(PickersTest, TheFirstPanelFollowsTheEntitiesAndNotTheLayersStates) {
    database->createLayer("ZV_FREEZE");
    auto* erased = database->modelSpace()->addPoint({0, 0, 0}, "ZV_FREEZE");
    erased->setXData("KVR_ZV_PAINEL", zvsample::XDataItems().text("APAGADO").tags());
    erased->erase();
    database->modelSpace()
        ->addPoint({1, 0, 0}, "OUTRO")
        ->setXData("KVR_ZV_PAINEL", zvsample::XDataItems().text("FORA").tags());
    auto* settings = database->modelSpace()->addPoint({0, 0, 0}, "ZV_FREEZE");
    settings->setXData("KVR_ZV_PAINEL", zvsample::XDataItems().text("PAINEL_1").tags());
    database->modelSpace()
        ->addPoint({2, 0, 0}, "ZV_FREEZE")
        ->setXData("KVR_ZV_PAINEL", zvsample::XDataItems().text("SEGUNDO").tags());
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 3)"), "(\"3\" \"PAINEL_1\" \"\")");
    database->layer("ZV_FREEZE")->setFrozen(true);
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 4)"), "(\"4\" \"PAINEL_1\" \"\")");
    settings->setXData("KVR_ZV_PAINEL", zvsample::XDataItems().text("PAINEL_9").tags());
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 5)"), "(\"5\" \"PAINEL_9\" \"\")");
    settings->erase();
    EXPECT_EQ(show("(zvGetCircuitoLocalInfo 6)"), "(\"6\" \"SEGUNDO\" \"\")");
}

TEST_F(PickersTest, ASolutionFileListsItsProjectsOrChangesNothing) {
    QTemporaryDir pasta;
    ASSERT_TRUE(pasta.isValid());
    QFile arquivo(pasta.filePath("job.zvs"));
    ASSERT_TRUE(arquivo.open(QIODevice::WriteOnly));
    arquivo.write("; job\n\nA.dxf\r\n  b\\B.dxf \n/abs/C.dxf\n");
    arquivo.close();
    const QString base = QDir(pasta.path()).absolutePath();
    EXPECT_EQ(
        show("(zvsolution_load \"" + pasta.filePath("job.zvs") + "\")"),
        QString("(\"" + base + "/A.dxf\" \"" + base + "/b/B.dxf\" \"/abs/C.dxf\")").toStdString());
    EXPECT_EQ(show("(zvsolution_getProjFile \"b\")"),
              QString("\"" + base + "/b/B.dxf\"").toStdString());
    // Unreadable or empty: nil, a message, and the solution stays.
    QFile vazio(pasta.filePath("vazio.zvs"));
    ASSERT_TRUE(vazio.open(QIODevice::WriteOnly));
    vazio.write("; nothing\n\n");
    vazio.close();
    EXPECT_EQ(show("(zvsolution_load \"" + pasta.filePath("vazio.zvs") + "\")"), "nil");
    EXPECT_TRUE(printed.contains("names no project drawing"));
    EXPECT_EQ(show("(zvsolution_load \"" + pasta.filePath("none.zvs") + "\")"), "nil");
    EXPECT_TRUE(printed.contains("can't read"));
    EXPECT_EQ(show("(length *ZV_SOLUCAO*)"), "3");
}

}  // namespace
}  // namespace zvproduct::testing
