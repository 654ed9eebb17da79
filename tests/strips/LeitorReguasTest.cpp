// The strip drawing's reader: which terminals count as wired, and the command from end to
// end on the demo's generated project.
#include "ItensRegua.h"
#include "ProductFolder.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/Database.h"
#include "drawing/DxfLoader.h"
#include "strips/CCBorneDwgDataReader.h"

#include <gtest/gtest.h>

#include <QFile>
#include <QSet>

namespace {

TEST(LeitorReguasTest, ATerminalStaysWithAWireOrAJumperToANumberOfItsOwnStrip) {
    ItensRegua itens;
    CEItemLista* a = itens.Borne("X1", "1");
    CEItemLista* b = itens.Borne("X1", "2");
    CEItemLista* c = itens.Borne("X1", "3");
    CEItemLista* d = itens.Borne("X2", "4");
    CEItemLista* e = itens.Borne("X2", "5");
    e->definirCampo("REGUA", "");
    e->definirCampo("NUMERO", "");
    e->definirCampo("STRIP", "X2");  // a terminal of the second language
    e->definirCampo("NUMBER", "5");
    a->definirCampo("RELACAO_FIM", "-K1:A1");
    b->definirCampo("JUMPER", ",3,");  // to its own strip, empty tokens left out
    c->definirCampo("JUMPER", "4");    // 4 is a number of another strip only
    d->definirCampo("JUMPER", "5");    // reaches 5 through its second-language strip
    VetorItens todos{a, b, c, d, e};
    const CCBorneDwgDataReader::Chaves chaves = CCBorneDwgDataReader::ChavesBornes(todos);
    // One key per language that gives both texts: a's, b's, c's, d's and e's second language.
    EXPECT_EQ(chaves.bornes.size(), 5u);
    EXPECT_TRUE(chaves.bornes.value(CEModeloReguas::ChaveBorne{"X2", "5"}));
    EXPECT_FALSE(chaves.bornes.value(CEModeloReguas::ChaveBorne{"X25", ""}));
    // Only a is wired; the others stay by their jumpers or go.
    EXPECT_EQ(chaves.comFio, std::vector<char>({1, 0, 0, 0, 0}));
    EXPECT_TRUE(CCBorneDwgDataReader::Ligado(*a, chaves));
    EXPECT_TRUE(CCBorneDwgDataReader::Ligado(*b, chaves));
    EXPECT_FALSE(CCBorneDwgDataReader::Ligado(*c, chaves));
    EXPECT_TRUE(CCBorneDwgDataReader::Ligado(*d, chaves));
    EXPECT_FALSE(CCBorneDwgDataReader::Ligado(*e, chaves));  // nothing wired, no jumper
}

TEST(LeitorReguasTest, KeepsNoWiresOrTerminalsReading) {
    // Its terminals' sides copy each wire once or twice, after every symbol was read.
    const CCBorneDwgDataReader leitor;
    EXPECT_FALSE(leitor.GuardaLeiturasDeFios());
    EXPECT_FALSE(leitor.GuardaLeiturasDeBornes());
}

TEST(LeitorReguasTest, EveryBlockTerminalOfTheDemoProjectIsDrawnWhenTheTemplateKeepsThemAll) {
    zvtest::ProductFolder pasta;
    const QString problema = pasta.prepare({"--seed", "1", "--terminals", "120"});
    ASSERT_TRUE(problema.isEmpty()) << problema.toStdString();
    const QStringList base{"--quiet", "--load", pasta.path("produto/config/zvconfig.lsp")};
    const auto desenha = [&](const QString& saida, const QString& todos) {
        QFile modelo(pasta.path("produto/templates/reguas-" + todos + ".grx"));
        EXPECT_TRUE(modelo.open(QIODevice::WriteOnly));
        modelo.write(
            "(load (strcat *DIR_ZVCFG_TEMPL* \"reguas.grx\"))\n(setq *BORNES_SEM_LIG_GRX* " +
            todos.toUtf8() + ")\n");
        modelo.close();
        QStringList args = base;
        args << "--eval"
             << "(setq *DEF_LISTA_BOR_DES* \"reguas-" + todos + ".grx\")" << pasta.project() << "-o"
             << saida << "gerarListaBornesDwg";
        return pasta.zvhost(args);
    };
    const auto bornesDesenhados = [](const QString& arquivo) {
        int n = 0;
        const auto db = zvdb::DxfLoader::loadFile(arquivo.toStdString());
        for (zvdb::Entity* e : db->modelSpace()->entities())
            if (auto* ref = dynamic_cast<zvdb::BlockReference*>(e))
                if (ref->blockName() == "REGUA_BORNE" && ref->layer().starts_with("REGUAS$")) ++n;
        return n;
    };
    zvtest::HostRun r = desenha(pasta.path("todos.dxf"), "T");
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    EXPECT_TRUE(r.out.contains("List created."));
    const int todos = bornesDesenhados(pasta.path("todos.dxf"));
    r = desenha(pasta.path("ligados.dxf"), "nil");
    ASSERT_EQ(r.status, 0) << r.err.toStdString();
    // Without the switch no more are drawn; which ones go is the command tests' business.
    const int ligados = bornesDesenhados(pasta.path("ligados.dxf"));
    // The drawn terminals of the project: every block terminal (the demo has one virtual).
    int noProjeto = 0;
    const auto db = zvdb::DxfLoader::loadFile(pasta.project().toStdString());
    for (zvdb::Entity* e : db->modelSpace()->entities())
        if (auto* ref = dynamic_cast<zvdb::BlockReference*>(e))
            if (ref->blockName().starts_with("BORNE") || ref->blockName().starts_with("BOR-"))
                ++noProjeto;
    EXPECT_EQ(todos, noProjeto);
    EXPECT_GT(ligados, 0);
    EXPECT_LE(ligados, todos);
}

}  // namespace
