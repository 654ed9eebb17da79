// The reader's maps from the connection answers: handle lists, full texts and points, from a
// LISP function that a user's defun has replaced as much as from the product's own.
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "readers/CCBorneDataReader.h"
#include "readers/LeitorBase.h"

#include <unistd.h>

#include <cstdio>
#include <memory>
#include <vector>

namespace {

// Pages of the process in memory now.
long PaginasResidentes() {
    long total = 0, residentes = 0;
    FILE* f = std::fopen("/proc/self/statm", "r");
    if (!f) return -1;
    const int lidos = std::fscanf(f, "%ld %ld", &total, &residentes);
    std::fclose(f);
    return lidos == 2 ? residentes : -1;
}

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

#if defined(__GLIBC__)
TEST_F(ConnectionLoadTest, WhatTheReadsHeldGoesBackToTheSystemWhenTheyAreFreed) {
    // 30,000 wires of two entries each: some megabytes of small texts and lists.
    CICad::AvaliaLisp(
        "(defun getConexoesTodosFios (/ r i) (setq i 0)"
        " (repeat 30000 (setq r (cons (list (itoa i) (list \"1A#1#X\" 1.0 2.0 3.0)"
        " (list \"2B#2#Y\" 4.0 5.0 6.0)) r)) (setq i (1+ i))) r)");
    auto leitor = std::make_unique<LeitorBase>();
    leitor->CarregaConexoesFios();
    ASSERT_TRUE(leitor->ListaConexoes("29999"));
    // What a list keeps after the reading comes after the reads in the heap.
    std::vector<std::unique_ptr<char[]>> itens;
    for (int i = 0; i < 20000; ++i)
        itens.push_back(std::make_unique<char[]>(100));
    const long antes = PaginasResidentes();
    ASSERT_GT(antes, 0);
    leitor->LiberaLeituras();
    const long depois = PaginasResidentes();
    const long megabyte = 1024 * 1024 / sysconf(_SC_PAGESIZE);
    EXPECT_LT(depois, antes - 2 * megabyte) << antes << " pages before, " << depois << " after";
    EXPECT_FALSE(leitor->ListaConexoes("29999"));
}
#endif

}  // namespace
