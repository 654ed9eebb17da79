// The reader's maps from the connection answers: handle lists, full texts and points, from a
// LISP function that a user's defun has replaced as much as from the product's own.
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "readers/CCBorneDataReader.h"
#include "readers/LeitorBase.h"

namespace {

class ConnectionLoadTest : public FacadeFixture {};

TEST_F(ConnectionLoadTest, EntriesGiveTheirHandleTheirWholeTextAndTheirPoint) {
    CICad::AvaliaLisp(
        "(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0) (\"2B\" 4.0 5.0)"
        " (\"#X#Y\" 6.0 7.0 8.0 9.0)) (\"8\")))");
    CICad::AvaliaLisp("(defun getConexoesTodosCabos () '((\"W1\" (\"3C#K\" 1.0 1.0 1.0))))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    leitor.CarregaConexoesCabos();
    ASSERT_TRUE(leitor.ListaConexoes("7"));
    EXPECT_EQ(*leitor.ListaConexoes("7"), QStringList({"1A", "2B", ""}));
    EXPECT_EQ(*leitor.ListaConexoesCompletas("7"), QStringList({"1A#13#NA-1", "2B", "#X#Y"}));
    const std::vector<CEPonto>& pontos = *leitor.PontosConexao("7");
    ASSERT_EQ(pontos.size(), 3u);
    EXPECT_EQ(pontos[1].y, 5.0);
    EXPECT_EQ(pontos[1].z, 0.0);  // two reals: z stays 0
    EXPECT_EQ(pontos[2].z, 8.0);  // a fourth real is ignored
    ASSERT_TRUE(leitor.ListaConexoes("8"));
    EXPECT_TRUE(leitor.ListaConexoes("8")->isEmpty());
    // a cable's entries go whole into the handle list
    EXPECT_EQ(*leitor.ListaConexoes("W1"), QStringList({"3C#K"}));
    EXPECT_EQ(leitor.PontoDaConexao("W1", "3C#K").x, 1.0);
}

TEST_F(ConnectionLoadTest, TheTerminalReaderKeepsHandlesAndPointsButNotTheWholeTexts) {
    CICad::AvaliaLisp(
        "(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0) (\"2B#4#X\" 4.0 "
        "5.0))))");
    CCBorneDataReader bornes;
    bornes.CarregaConexoesFios();
    ASSERT_TRUE(bornes.ListaConexoes("7"));
    EXPECT_EQ(*bornes.ListaConexoes("7"), QStringList({"1A", "2B"}));
    EXPECT_EQ(bornes.PontoDaConexao("7", "2B").y, 5.0);
    ASSERT_TRUE(bornes.ListaConexoesCompletas("7"));
    EXPECT_TRUE(bornes.ListaConexoesCompletas("7")->isEmpty());
    // any other reader keeps them
    LeitorBase base;
    base.CarregaConexoesFios();
    EXPECT_EQ(*base.ListaConexoesCompletas("7"), QStringList({"1A#13#NA-1", "2B#4#X"}));
}

TEST_F(ConnectionLoadTest, ACableOfAWiresNumberTakesItsEntriesButKeepsTheWiresWholeTexts) {
    CICad::AvaliaLisp("(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0))))");
    CICad::AvaliaLisp("(defun getConexoesTodosCabos () '((\"7\" (\"3C\" 4.0 5.0 6.0))))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    leitor.CarregaConexoesCabos();
    EXPECT_EQ(*leitor.ListaConexoes("7"), QStringList({"3C"}));
    EXPECT_EQ(*leitor.ListaConexoesCompletas("7"), QStringList({"1A#13#NA-1"}));
    EXPECT_EQ(leitor.PontoDaConexao("7", "3C").z, 6.0);
}

}  // namespace
