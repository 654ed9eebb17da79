// The reader's maps from the connection answers: handle lists, full texts and points, from a
// LISP function that a user's defun has replaced as much as from the product's own, whose
// answers the host gives without their chains.
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "drawing/Attribute.h"
#include "drawing/BlockRecord.h"
#include "drawing/BlockReference.h"
#include "drawing/DxfLoader.h"
#include "drawing/DxfWriter.h"
#include "drawing/Polyline.h"
#include "readers/CCBorneDataReader.h"
#include "readers/LeitorBase.h"
#include "readers/TabelaConexoes.h"
#include "readers/ZVString.h"
#include "sample/ProjectGenerator.h"
#include "sdk/NodeChains.h"

#include <algorithm>
#include <typeinfo>

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
    EXPECT_EQ(leitor.ListaConexoes("7")->ParaLista(), QStringList({"1A", "2B", ""}));
    EXPECT_EQ(leitor.ListaConexoesCompletas("7")->ParaLista(),
              QStringList({"1A#13#NA-1", "2B", "#X#Y"}));
    const std::span<const CEPonto> pontos = *leitor.PontosConexao("7");
    ASSERT_EQ(pontos.size(), 3u);
    EXPECT_EQ(pontos[1].y, 5.0);
    EXPECT_EQ(pontos[1].z, 0.0);  // two reals: z stays 0
    EXPECT_EQ(pontos[2].z, 8.0);  // a fourth real is ignored
    ASSERT_TRUE(leitor.ListaConexoes("8"));
    EXPECT_TRUE(leitor.ListaConexoes("8")->isEmpty());
    // a cable's entries go whole into the handle list
    EXPECT_EQ(leitor.ListaConexoes("W1")->ParaLista(), QStringList({"3C#K"}));
    EXPECT_EQ(leitor.PontoDaConexao("W1", "3C#K").x, 1.0);
}

TEST_F(ConnectionLoadTest, AnEntrysHandleIsTheNumberItsElementsTextNamesAndFindsItsObject) {
    auto* linha = db().modelSpace()->addLwPolyline({{0, 0, 0}, {1, 0, 0}}, false, "0");
    auto* apagada = db().modelSpace()->addLwPolyline({{0, 1, 0}, {1, 1, 0}}, false, "0");
    apagada->erase();
    const QString existe = QString::number(linha->handle(), 16).toUpper();
    const QString foi = QString::number(apagada->handle(), 16);
    CICad::AvaliaLisp(QString("(defun getConexoesTodosFios () '((\"7\" (\"%1#13#NA-1\" 1.0 2.0)"
                              " (\"%2\" 4.0 5.0) (\" 1A\" 1.0 1.0) (\"XYZ#1\" 6.0 7.0)"
                              " (\"#X#Y\" 6.0 7.0))))")
                          .arg(existe, foi));
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    const auto elementos = leitor.ListaConexoes("7");
    ASSERT_TRUE(elementos);
    ASSERT_EQ(elementos->size(), 5);
    for (int i = 0; i < elementos->size(); ++i)
        EXPECT_EQ(elementos->handle(i), ZVString(elementos->value(i)).ParaHandle()) << i;
    EXPECT_EQ(elementos->handle(0), linha->handle());
    EXPECT_EQ(elementos->handle(2), 0x1Au);  // read the long way, as the text would be
    EXPECT_EQ(elementos->handle(5), 0u);
    EXPECT_EQ(elementos->handle(-1), 0u);
    // The object of a number as that of its text: none for 0 or an erased one.
    for (int i = 0; i < elementos->size(); ++i)
        EXPECT_EQ(CICad::IdDoHandleNumero(elementos->handle(i)),
                  CICad::IdDoHandle(elementos->value(i)))
            << i;
    EXPECT_EQ(CICad::IdDoHandleNumero(linha->handle()).handle(), linha->handle());
    EXPECT_TRUE(CICad::IdDoHandleNumero(apagada->handle()).isNull());
    EXPECT_TRUE(CICad::IdDoHandleNumero(0).isNull());
}

TEST_F(ConnectionLoadTest, TheTerminalReaderKeepsHandlesAndPointsButNotTheWholeTexts) {
    CICad::AvaliaLisp(
        "(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0) (\"2B#4#X\" 4.0 "
        "5.0))))");
    CCBorneDataReader bornes;
    bornes.CarregaConexoesFios();
    ASSERT_TRUE(bornes.ListaConexoes("7"));
    EXPECT_EQ(bornes.ListaConexoes("7")->ParaLista(), QStringList({"1A", "2B"}));
    EXPECT_EQ(bornes.PontoDaConexao("7", "2B").y, 5.0);
    ASSERT_TRUE(bornes.ListaConexoesCompletas("7"));
    EXPECT_TRUE(bornes.ListaConexoesCompletas("7")->isEmpty());
    // any other reader keeps them
    LeitorBase base;
    base.CarregaConexoesFios();
    EXPECT_EQ(base.ListaConexoesCompletas("7")->ParaLista(), QStringList({"1A#13#NA-1", "2B#4#X"}));
}

TEST_F(ConnectionLoadTest, ACableOfAWiresNumberTakesItsEntriesButKeepsTheWiresWholeTexts) {
    CICad::AvaliaLisp("(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0))))");
    CICad::AvaliaLisp("(defun getConexoesTodosCabos () '((\"7\" (\"3C\" 4.0 5.0 6.0))))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    leitor.CarregaConexoesCabos();
    EXPECT_EQ(leitor.ListaConexoes("7")->ParaLista(), QStringList({"3C"}));
    EXPECT_EQ(leitor.ListaConexoesCompletas("7")->ParaLista(), QStringList({"1A#13#NA-1"}));
    EXPECT_EQ(leitor.PontoDaConexao("7", "3C").z, 6.0);
}

TEST_F(ConnectionLoadTest, AWireWithoutEntriesBeforeAnotherTakesNoneOfItsEntries) {
    CICad::AvaliaLisp(
        "(defun getConexoesTodosFios () '((\"8\") (\"9\" (\"1A#2#B\" 1.0 2.0 3.0)) (\"10\")))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    ASSERT_TRUE(leitor.ListaConexoes("8"));
    EXPECT_TRUE(leitor.ListaConexoes("8")->isEmpty());
    EXPECT_TRUE(leitor.PontosConexao("8")->empty());
    EXPECT_EQ(leitor.ListaConexoes("9")->ParaLista(), QStringList({"1A"}));
    EXPECT_EQ(leitor.PontosConexao("9")->size(), 1u);
    EXPECT_TRUE(leitor.ListaConexoes("10")->isEmpty());
    EXPECT_FALSE(leitor.ListaConexoes("11"));
}

TEST_F(ConnectionLoadTest, ANumberGivenAgainTakesThePlaceOfTheOneBefore) {
    CICad::AvaliaLisp(
        "(defun getConexoesTodosFios () '((\"7\" (\"1A#1#X\" 1.0 0.0 0.0)) (\"7\" (\"2B#2#Y\" "
        "2.0 0.0 0.0) (\"3C#3#Z\" 3.0 0.0 0.0))))");
    CICad::AvaliaLisp(
        "(defun getConexoesTodosCabos () '((\"7\" (\"4D\" 4.0 0.0 0.0)) (\"7\" (\"5E\" 5.0 "
        "0.0 0.0))))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    EXPECT_EQ(leitor.ListaConexoes("7")->ParaLista(), QStringList({"2B", "3C"}));
    EXPECT_EQ(leitor.PontoDaConexaoCompleta("7", "3C#3#Z").x, 3.0);
    EXPECT_EQ(leitor.PontoDaConexao("7", "1A").x, 0.0);  // the first one's entries are gone
    // each cable of the number keeps the whole texts of the one before: the wire's
    leitor.CarregaConexoesCabos();
    EXPECT_EQ(leitor.ListaConexoes("7")->ParaLista(), QStringList({"5E"}));
    EXPECT_EQ(leitor.ListaConexoesCompletas("7")->ParaLista(), QStringList({"2B#2#Y", "3C#3#Z"}));
    // a whole text's place gives the point of the entry at that place
    EXPECT_EQ(leitor.PontoDaConexaoCompleta("7", "2B#2#Y").x, 5.0);
    EXPECT_EQ(leitor.PontoDaConexaoCompleta("7", "3C#3#Z").x, 0.0);
}

// Numbers of many wires, then of cables: each finds its own entries however the wires
// before it filled the index.
TEST_F(ConnectionLoadTest, EveryNumberOfALargeAnswerFindsItsOwnEntries) {
    constexpr int kFios = 300, kCabos = 500;
    QString fios = "(defun getConexoesTodosFios () '(",
            cabos = "(defun getConexoesTodosCabos () '(";
    for (int i = 0; i < kFios; ++i)
        fios += QString("(\"%1\" (\"%2#C#B\" %1.0 1.0 0.0) (\"%3\" %1.0 2.0 0.0))")
                    .arg(i)
                    .arg(i + 16, 0, 16)
                    .arg(i + 17, 0, 16);
    for (int i = 0; i < kCabos; ++i)
        cabos += QString("(\"W%1\" (\"%2\" %1.0 3.0 0.0))").arg(i).arg(i + 4096, 0, 16);
    CICad::AvaliaLisp(fios + "))");
    CICad::AvaliaLisp(cabos + "))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    // an element asked for before the cables come is the same after, and so is a view of it
    EXPECT_EQ(leitor.ListaConexoes("5")->value(0), "15");
    const QStringView vista = leitor.ListaConexoes("6")->vista(0);
    leitor.CarregaConexoesCabos();
    EXPECT_EQ(vista.toString(), "16");
    for (int i = 0; i < kFios; ++i) {
        const QString numero = QString::number(i);
        const auto elementos = leitor.ListaConexoes(numero);
        ASSERT_TRUE(elementos) << i;
        EXPECT_EQ(elementos->ParaLista(),
                  QStringList({QString::number(i + 16, 16), QString::number(i + 17, 16)}))
            << i;
        EXPECT_EQ(leitor.PontoDaConexao(numero, QString::number(i + 17, 16)).y, 2.0) << i;
        EXPECT_EQ(leitor.PontosConexao(numero)->front().x, double(i)) << i;
    }
    for (int i = 0; i < kCabos; ++i) {
        const auto elementos = leitor.ListaConexoes(QString("W%1").arg(i));
        ASSERT_TRUE(elementos) << i;
        EXPECT_EQ(elementos->value(0), QString::number(i + 4096, 16)) << i;
        EXPECT_EQ(elementos->value(1), QString()) << i;  // past the end: empty
    }
    EXPECT_FALSE(leitor.ListaConexoes(QString::number(kFios)));
}

TEST_F(ConnectionLoadTest, FreedReadsForgetTheWiresAndALaterLoadFindsThemAgain) {
    CICad::AvaliaLisp("(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0))))");
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    const auto antes = leitor.ListaConexoesCompletas("7");
    ASSERT_TRUE(antes);
    // the answer's chain is gone: the texts the table holds are still whole
    EXPECT_EQ(antes->value(0), "1A#13#NA-1");
    leitor.LiberaLeituras();
    EXPECT_FALSE(leitor.ListaConexoes("7"));
    EXPECT_FALSE(leitor.PontosConexao("7"));
    EXPECT_EQ(leitor.PontoDaConexao("7", "1A").x, 0.0);
    leitor.CarregaConexoesFios();
    EXPECT_EQ(leitor.PontoDaConexao("7", "1A").z, 3.0);
}

// The wire numbers of an answer's chain, in its order: the texts that open its wires.
QStringList NumerosDaCadeia(const zvsdk::ResultBuffer* cadeia) {
    QStringList numeros;
    int nivel = 0;
    for (const zvsdk::ResultBuffer* no = cadeia; no; no = no->rbnext) {
        if (no->restype == zvsdk::RTLB) ++nivel;
        if (no->restype == zvsdk::RTLE) --nivel;
        if (no->restype == zvsdk::RTSTR && nivel == 2) numeros << no->rstring;
    }
    return numeros;
}

// What the table holds of each number, in one text.
std::string Conteudo(const TabelaConexoes& tabela, const QStringList& numeros) {
    QString texto;
    for (const QString& numero : numeros) {
        const auto fio = tabela.DoFio(numero);
        texto += numero + (fio ? ":\n" : " missing\n");
        if (!fio) continue;
        for (int i = 0; i < fio->elementos.size(); ++i) {
            const CEPonto& p = fio->pontos[std::size_t(i)];
            texto += QString(" %1 %2 %3 %4 %5\n")
                         .arg(fio->elementos.value(i))
                         .arg(fio->handles[std::size_t(i)])
                         .arg(p.x, 0, 'g', 17)
                         .arg(p.y, 0, 'g', 17)
                         .arg(p.z, 0, 'g', 17);
        }
        for (int i = 0; i < fio->completas.size(); ++i)
            texto += " = " + fio->completas.value(i) + "\n";
    }
    return texto.toStdString();
}

class ProductConnectionLoadTest : public ConnectionLoadTest {
protected:
    void SetUp() override {
        ConnectionLoadTest::SetUp();
        // As a file reads back: the generator's own objects put their tags together when
        // first read, and the host then reads the drawing on one thread only.
        zvsample::ProjectGenerator gerador({3, 120, 6});
        documento_ =
            app_->openDocument(arquivo("gerado.dxf"),
                               zvdb::DxfLoader::load(zvdb::DxfWriter::toText(*gerador.generate())));
    }
    // The wires then the cables, as a reader loads them, with and without the whole texts,
    // and each read with and without the details: the same table from the chains as from
    // the answers without them.
    void MesmaTabelaSemCadeia() {
        for (const auto& [completas, detalhesFios] :
             {std::pair{true, true}, std::pair{false, true}, std::pair{true, false},
              std::pair{false, false}}) {
            SCOPED_TRACE(std::to_string(completas) + " " + std::to_string(detalhesFios));
            TabelaConexoes semCadeia, pelaCadeia;
            QStringList numeros;
            for (const auto& [funcao, detalhes] :
                 {std::pair{"getConexoesTodosFios", detalhesFios},
                  std::pair{"getConexoesTodosCabos", !detalhesFios}}) {
                ASSERT_TRUE(semCadeia.CarregaSemCadeia(funcao, detalhes, completas)) << funcao;
                zvsdk::ResultBuffer* cadeia = CICad::zvInvokeLista(funcao);
                ASSERT_NE(cadeia, nullptr);
                numeros << NumerosDaCadeia(cadeia);
                pelaCadeia.Carrega(cadeia, detalhes, completas);
                CICad::LiberaLista(cadeia);
            }
            EXPECT_GT(numeros.size(), 20);
            EXPECT_EQ(semCadeia.Fios(), pelaCadeia.Fios());
            const std::string esperado = Conteudo(pelaCadeia, numeros);
            EXPECT_EQ(esperado.find("missing"), std::string::npos);
            EXPECT_EQ(Conteudo(semCadeia, numeros), esperado);
        }
    }
};

TEST_F(ProductConnectionLoadTest, TheAnswersWithoutTheirChainsMakeTheSameTable) {
    MesmaTabelaSemCadeia();
}

// A wire's number and a connection's name beyond ASCII are decoded from UTF-8 as the
// chain's texts are.
TEST_F(ProductConnectionLoadTest, NamesBeyondAsciiMakeTheSameTable) {
    bool fio = false;
    int ligacoes = 0;
    std::vector<std::string> guardados;  // the values outlive the edits that copy them
    db().modelSpace()->forEachEntity([&](zvdb::Entity& entidade) {
        std::vector<zvdb::Tag> itens = entidade.xdata("KVR_ZV_WIRE");
        for (std::size_t i = 2; !fio && i < itens.size(); ++i) {
            if (!itens[i].value.starts_with("FIO\f")) continue;
            guardados.push_back("FIO\fN\xc2\xba" + std::string(itens[i].value.substr(4)));
            itens[i].value = guardados.back();
            entidade.setXData("KVR_ZV_WIRE", itens);
            fio = true;
        }
        if (typeid(entidade) != typeid(zvdb::BlockReference)) return;
        for (zvdb::Entity* sub : entidade.subEntities()) {
            auto* atributo = dynamic_cast<zvdb::Attribute*>(sub);
            if (!atributo || !atributo->tag().starts_with("LIGACAO")) continue;
            atributo->setTextValue("\xc3\x87" + std::string(atributo->textValue()));
            ++ligacoes;
        }
    });
    ASSERT_TRUE(fio);
    ASSERT_GT(ligacoes, 0);
    MesmaTabelaSemCadeia();
    // the edits reached the answers
    TabelaConexoes tabela;
    ASSERT_TRUE(tabela.CarregaSemCadeia("getConexoesTodosFios", true, true));
    zvsdk::ResultBuffer* cadeia = CICad::zvInvokeLista("getConexoesTodosFios");
    const QStringList numeros = NumerosDaCadeia(cadeia);
    CICad::LiberaLista(cadeia);
    EXPECT_TRUE(std::any_of(numeros.begin(), numeros.end(),
                            [](const QString& n) { return n.startsWith(u"N\u00ba"); }));
    EXPECT_NE(Conteudo(tabela, numeros).find("#\xc3\x87"), std::string::npos);
}

// The numbers of the product's answers, the wires' then the cables'. Asking both leaves the
// host no index kept for another call.
QStringList NumerosDoProduto() {
    QStringList numeros;
    for (const char* funcao : {"getConexoesTodosFios", "getConexoesTodosCabos"}) {
        zvsdk::ResultBuffer* cadeia = CICad::zvInvokeLista(funcao);
        numeros << NumerosDaCadeia(cadeia);
        CICad::LiberaLista(cadeia);
    }
    return numeros;
}

// The host works a put-off answer out while the reader reads on; the table takes it at
// its first look-up, the same as an answer loaded at once.
TEST_F(ProductConnectionLoadTest, AnAnswerPutOffMakesTheSameTableAsOneLoadedAtOnce) {
    const QStringList numeros = NumerosDoProduto();
    ASSERT_GT(numeros.size(), 20);
    for (const bool completas : {true, false}) {
        SCOPED_TRACE(completas);
        TabelaConexoes adiada, agora;
        ASSERT_TRUE(adiada.Adia("getConexoesTodosFios", true, completas));
        ASSERT_TRUE(adiada.Adia("getConexoesTodosCabos", false, completas));
        agora.CarregaDe("getConexoesTodosFios", true, completas);
        agora.CarregaDe("getConexoesTodosCabos", false, completas);
        EXPECT_EQ(Conteudo(adiada, numeros), Conteudo(agora, numeros));
        EXPECT_EQ(adiada.Fios(), agora.Fios());
    }
}

TEST_F(ProductConnectionLoadTest, AnAnswerPutOffSeesTheDrawingAsItStandsAtTheFirstLookUp) {
    const QStringList numeros = NumerosDoProduto();
    TabelaConexoes antes, adiada, depois;
    antes.CarregaDe("getConexoesTodosFios", true, true);
    antes.CarregaDe("getConexoesTodosCabos", false, true);
    ASSERT_TRUE(adiada.Adia("getConexoesTodosFios", true, true));
    // a wire goes while the answer is worked out
    zvdb::Entity* fio = nullptr;
    db().modelSpace()->forEachEntity([&](zvdb::Entity& entidade) {
        if (!fio && !entidade.xdata("KVR_ZV_WIRE").empty()) fio = &entidade;
    });
    ASSERT_NE(fio, nullptr);
    fio->erase();
    depois.CarregaDe("getConexoesTodosFios", true, true);
    EXPECT_NE(Conteudo(adiada, numeros), Conteudo(antes, numeros));
    EXPECT_EQ(Conteudo(adiada, numeros), Conteudo(depois, numeros));
}

// A function the host does not work out ahead is loaded when asked, after what was put off:
// the answers add up in the order they were asked.
TEST_F(ProductConnectionLoadTest, AUsersFunctionIsNotPutOffAndComesAfterWhatWas) {
    const QString numero = NumerosDoProduto().front();
    CICad::AvaliaLisp(
        QString("(defun getConexoesTodosCabos () '((\"%1\" (\"3C\" 4.0 5.0 6.0))))").arg(numero));
    TabelaConexoes tabela;
    ASSERT_TRUE(tabela.Adia("getConexoesTodosFios", true, true));
    EXPECT_FALSE(tabela.Adia("getConexoesTodosCabos", false, true));
    tabela.CarregaDe("getConexoesTodosCabos", false, true);
    const auto fio = tabela.DoFio(numero);
    ASSERT_TRUE(fio);
    EXPECT_EQ(fio->elementos.ParaLista(), QStringList({"3C"}));
    EXPECT_GT(fio->completas.size(), 0) << "the wire's whole texts, kept by the cable";
}

// A user's function has no answer without a chain: the reader loads it from its chain.
TEST_F(ProductConnectionLoadTest, AUsersFunctionIsLoadedFromItsChain) {
    CICad::AvaliaLisp("(defun getConexoesTodosFios () '((\"7\" (\"1A#13#NA-1\" 1.0 2.0 3.0))))");
    TabelaConexoes tabela;
    EXPECT_FALSE(tabela.CarregaSemCadeia("getConexoesTodosFios", true, true));
    EXPECT_EQ(tabela.Fios(), 0);
    EXPECT_TRUE(tabela.CarregaSemCadeia("getConexoesTodosCabos", false, true));
    EXPECT_GT(tabela.Fios(), 0);
    LeitorBase leitor;
    leitor.CarregaConexoesFios();
    EXPECT_EQ(leitor.ListaConexoesCompletas("7")->ParaLista(), QStringList({"1A#13#NA-1"}));
}

}  // namespace
