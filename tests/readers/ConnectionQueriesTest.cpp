// The reader base's point and neighbour queries on small drawings built by the tests: the
// wire under a point, the element next to a symbol along a wire, the cut point of a
// two-point symbol and the connection attribute nearest a point.
#include "QtPrinters.h"
#include "cad/CICad.h"
#include "cad/FacadeFixture.h"
#include "drawing/Attribute.h"
#include "drawing/Dictionary.h"
#include "drawing/Polyline.h"
#include "drawing/XRecord.h"
#include "lists/TemplateDouble.h"
#include "readers/CCBorneDataReader.h"
#include "readers/CCDataReader.h"
#include "readers/CEAtributo.h"
#include "readers/CEListaAtributos.h"
#include "readers/LeitorBase.h"
#include "readers/ZVString.h"
#include "sample/XDataItems.h"
#include "sdk/LispInterface.h"

namespace {

const std::string kPagina = "ESQ$0001$A";

class ConnectionQueriesTest : public FacadeFixture {
protected:
    void SetUp() override {
        FacadeFixture::SetUp();
        db().createLayer(kPagina);
        db().createLayer("ESQ$0002$A");
    }

    OdDbObjectId id(const zvdb::DbObject* objeto) { return OdDbObjectId(&db(), objeto->handle()); }
    QString handle(const zvdb::DbObject* objeto) { return ZVString::DeHandle(objeto->handle()); }

    // A numbered wire polyline.
    zvdb::Polyline* fio(const std::vector<zvdb::Point3>& pontos, const std::string& numero,
                        const std::string& layer = kPagina) {
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline(pontos, false, layer);
        linha->setXData(
            "KVR_ZV_WIRE",
            zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f" + numero).tags());
        return linha;
    }

    zvdb::BlockRecord& bloco(const std::string& nome) {
        if (zvdb::BlockRecord* achado = db().block(nome)) return *achado;
        zvdb::BlockRecord* feito = db().createBlock(nome);
        feito->addLine({0, 0, 0}, {0, -10, 0});
        return *feito;
    }

    // A project symbol with its cut point 10 below the insertion point.
    zvdb::BlockReference* simbolo(const std::string& nome, zvdb::Point3 em) {
        auto* ref = db().modelSpace()->addBlockReference(bloco(nome), em, {1, 1, 1}, 0, kPagina);
        ref->setXData("KVR_ZV", zvsample::XDataItems().text("1001\f1").tags());
        ref->setXData("KVR_ZV_PTS_CORTE",
                      zvsample::XDataItems().point(em).point({em.x, em.y - 10, em.z}).tags());
        return ref;
    }

    // The reader reads the wire's catch radius when it is made.
    std::unique_ptr<LeitorBase> leitor(std::optional<double> espessura = std::nullopt) {
        if (espessura) CICad::SetRealLisp("*ESPESSURA_BARRAMENTO*", *espessura);
        return std::make_unique<LeitorBase>();
    }
};

// ---- the wire under a point

TEST_F(ConnectionQueriesTest, APointCatchesAWireWithinTheBusBarThicknessOnly) {
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100.4, 0}), id(w));
    EXPECT_EQ(r->FioNoPonto(layer, {50, 99.6, 0}), id(w));
    // The radius is open: a point exactly at the thickness is off the wire.
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 100.5, 0}).isNull());
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 101.0, 0}).isNull());
    // The line distance is taken in the plane: height does not move a point off the wire.
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100, 5}), id(w));
    // Other layers' wires are not looked at.
    EXPECT_TRUE(r->FioNoPonto("ESQ$0002$A", {50, 100, 0}).isNull());
}

// The layer's polylines as getFiosPorLayer gives them: one of another layer, a lone vertex
// and what is no polyline are passed over, and the wires after them still found.
TEST_F(ConnectionQueriesTest, APagesWiresAreOnlyItsPolylinesOfTwoVerticesOrMore) {
    const zvdb::Polyline* outro = fio({{0, 100, 0}, {100, 100, 0}}, "1", "ESQ$0002$A");
    const zvdb::Polyline* ponto = fio({{50, 100, 0}}, "2");
    auto* ref = simbolo("NA-1", {50, 100, 0});
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "3");
    const zvdb::Polyline* w2 = fio({{0, 200, 0}, {100, 200, 0}}, "4");
    CICad::AvaliaLisp(QString("(defun getFiosPorLayer (layer) '(\"%1\" \"%2\" \"%3\" \"%4\" "
                              "\"%5\"))")
                          .arg(handle(outro), handle(ponto), handle(ref), handle(w), handle(w2)));
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100, 0}), id(w));
    EXPECT_EQ(r->FioNoPonto(layer, {100, 200.2, 0}), id(w2));
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 150, 0}).isNull());
}

TEST_F(ConnectionQueriesTest, WithoutTheSymbolTheRadiusIsATenth) {
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor();
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100.09, 0}), id(w));
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 100.15, 0}).isNull());
}

TEST_F(ConnectionQueriesTest, APointBeyondEitherEndOfASegmentIsOff) {
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    // On the segment's line but past its ends: the line distance is zero, the point is out.
    EXPECT_TRUE(r->FioNoPonto(layer, {100.6, 100, 0}).isNull());
    EXPECT_TRUE(r->FioNoPonto(layer, {-0.6, 100, 0}).isNull());
    EXPECT_TRUE(r->FioNoPonto(layer, {150, 100, 0}).isNull());
    EXPECT_TRUE(r->FioNoPonto(layer, {-50, 100, 0}).isNull());
    // Near an end point it is on, whatever side.
    EXPECT_EQ(r->FioNoPonto(layer, {100.4, 100, 0}), id(w));
    EXPECT_EQ(r->FioNoPonto(layer, {-0.4, 100, 0}), id(w));
    // End points are measured in three dimensions.
    EXPECT_TRUE(r->FioNoPonto(layer, {100.3, 100, 0.45}).isNull());
    EXPECT_EQ(r->FioNoPonto(layer, {100.3, 100, 0.3}), id(w));
}

TEST_F(ConnectionQueriesTest, JustPastAnEndAPointIsOutOnlyWhenItIsFartherOutThanOffTheLine) {
    // 0.6 from the end point, 0.45 off the line and 0.4 past the end: the segment's length
    // plus the line distance still exceeds the distance to the far end, so the point is on.
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {100.4, 100.45, 0}), id(w));
    EXPECT_EQ(r->FioNoPonto(layer, {-0.4, 99.55, 0}), id(w));
    // Farther past the end than off the line: out.
    EXPECT_TRUE(r->FioNoPonto(layer, {100.5, 100.3, 0}).isNull());
}

TEST_F(ConnectionQueriesTest, VerticalSlopedAndZeroLengthSegments) {
    const zvdb::Polyline* vertical = fio({{10, 0, 0}, {10, 50, 0}}, "1");
    const zvdb::Polyline* inclinado = fio({{200, 0, 0}, {230, 40, 0}}, "2");
    const zvdb::Polyline* ponto = fio({{300, 300, 0}, {300, 300, 0}}, "3");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {10.4, 25, 0}), id(vertical));
    EXPECT_TRUE(r->FioNoPonto(layer, {10.6, 25, 0}).isNull());
    EXPECT_TRUE(r->FioNoPonto(layer, {10, 50.6, 0}).isNull());
    EXPECT_EQ(r->FioNoPonto(layer, {10, 50.4, 0}), id(vertical));
    // 0.4 and 0.6 from the middle of a 3-4-5 segment, along its normal (-0.8, 0.6).
    EXPECT_EQ(r->FioNoPonto(layer, {214.68, 20.24, 0}), id(inclinado));
    EXPECT_TRUE(r->FioNoPonto(layer, {214.52, 20.36, 0}).isNull());
    // A segment of no length is caught at its point only.
    EXPECT_EQ(r->FioNoPonto(layer, {300, 300.4, 0}), id(ponto));
    EXPECT_TRUE(r->FioNoPonto(layer, {300, 301, 0}).isNull());
}

TEST_F(ConnectionQueriesTest, TheFirstWireOfTheLayerWinsOverACloserOne) {
    const zvdb::Polyline* primeiro = fio({{0, 300, 0}, {100, 300, 0}}, "1");
    const zvdb::Polyline* segundo = fio({{0, 300.3, 0}, {100, 300.3, 0}}, "2");
    const zvdb::Polyline* dobra = fio({{0, 400, 0}, {50, 400, 0}, {50, 450, 0}}, "3");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 300.4, 0}), id(primeiro));
    EXPECT_EQ(r->FioNoPonto(layer, {50, 300.75, 0}), id(segundo));
    // A bend: each segment is looked at.
    EXPECT_EQ(r->FioNoPonto(layer, {50.3, 430, 0}), id(dobra));
}

// On a page of many wires the grid must answer as trying every wire in order would: each
// wire also stands alone on a layer of its own, which tells whether it is under a point,
// and the page's answer is the first wire that is.
TEST_F(ConnectionQueriesTest, OnAPageOfManyWiresTheFirstWireUnderThePointWins) {
    std::uint64_t semente = 12345;
    auto sorteio = [&semente](double de, double ate) {
        semente = semente * 6364136223846793005ULL + 1442695040888963407ULL;
        return de + (ate - de) * double(semente >> 11) / double(1ULL << 53);
    };
    constexpr int kFios = 150;
    std::vector<std::vector<zvdb::Point3>> tracados;
    std::vector<const zvdb::Polyline*> naPagina;
    std::vector<QString> sozinhos;
    for (int w = 0; w < kFios; ++w) {
        // Mostly short wires, some crossing much of the page, bends of up to four segments.
        const double alcance = w % 10 == 0 ? 400 : 40;
        std::vector<zvdb::Point3> pontos{{sorteio(0, 500), sorteio(0, 300), 0}};
        const int segmentos = 1 + w % 4;
        for (int k = 0; k < segmentos; ++k) {
            const zvdb::Point3& ultimo = pontos.back();
            pontos.push_back(
                k % 2 ? zvdb::Point3{ultimo.x, ultimo.y + sorteio(-alcance, alcance), 0}
                      : zvdb::Point3{ultimo.x + sorteio(-alcance, alcance), ultimo.y, 0});
        }
        tracados.push_back(pontos);
        naPagina.push_back(fio(pontos, std::to_string(w + 1)));
        const std::string proprio = "ESQ$" + std::to_string(1000 + w) + "$A";
        db().createLayer(proprio);
        fio(pontos, std::to_string(w + 1), proprio);
        sozinhos.push_back(QString::fromStdString(proprio));
    }
    auto r = leitor(0.5);
    const QString pagina = QString::fromStdString(kPagina);
    int achados = 0;
    for (int q = 0; q < 3000; ++q) {
        // Points on and beside the wires' segments, and anywhere on the page.
        zvdb::Point3 p{sorteio(-10, 510), sorteio(-10, 310), 0};
        if (q % 3 != 0) {
            const std::vector<zvdb::Point3>& t = tracados[std::size_t(q) % tracados.size()];
            const std::size_t k = std::size_t(q / 3) % (t.size() - 1);
            const double u = sorteio(-0.02, 1.02);
            p = {t[k].x + u * (t[k + 1].x - t[k].x) + sorteio(-0.7, 0.7),
                 t[k].y + u * (t[k + 1].y - t[k].y) + sorteio(-0.7, 0.7), 0};
        }
        const CEPonto ponto{p.x, p.y, p.z};
        OdDbObjectId esperado;
        for (int w = 0; w < kFios && esperado.isNull(); ++w)
            if (!r->FioNoPonto(sozinhos[std::size_t(w)], ponto).isNull())
                esperado = id(naPagina[std::size_t(w)]);
        achados += !esperado.isNull();
        ASSERT_EQ(r->FioNoPonto(pagina, ponto), esperado) << q << " at " << p.x << ", " << p.y;
    }
    // Both kinds of answer were asked for many times.
    EXPECT_GT(achados, 1000);
    EXPECT_LT(achados, 2900);
}

TEST_F(ConnectionQueriesTest, ALayersWiresAreAskedForOncePerReader) {
    fio({{0, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 200, 0}).isNull());
    const zvdb::Polyline* depois = fio({{0, 200, 0}, {100, 200, 0}}, "2");
    // The drawing does not change during a run: the first answer for the layer stays.
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 200, 0}).isNull());
    EXPECT_EQ(leitor()->FioNoPonto(layer, {50, 200, 0}), id(depois));
}

// A redefined getFiosPorLayer may answer wires of any layer: only the asked layer's count.
TEST_F(ConnectionQueriesTest, OnlyTheWiresOfTheAskedLayerAreTakenFromTheAnswer) {
    const std::string acentuado = "ESQ$0003$\xC3\x89";  // É
    db().createLayer(acentuado);
    const zvdb::Polyline* aqui = fio({{0, 100, 0}, {100, 100, 0}}, "1", acentuado);
    const zvdb::Polyline* outro = fio({{0, 200, 0}, {100, 200, 0}}, "2", "ESQ$0002$A");
    const zvdb::Polyline* prefixo = fio({{0, 300, 0}, {100, 300, 0}}, "3", "ESQ$0003$");
    CICad::AvaliaLisp(QString("(defun getFiosPorLayer (l) (list \"%1\" \"%2\" \"%3\"))")
                          .arg(handle(outro), handle(aqui), handle(prefixo)));
    auto r = leitor(0.5);
    const QString layer = QString::fromUtf8(acentuado.c_str());
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100, 0}), id(aqui));
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 200, 0}).isNull());
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 300, 0}).isNull());
}

TEST_F(ConnectionQueriesTest, AWireVertexMovedInLispIsSeenByTheNextQuestion) {
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor(0.5);
    const QString layer = QString::fromStdString(kPagina);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100, 0}), id(w));
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 200, 0}).isNull());
    // The first vertex goes up to (0 300): the wire now passes (50 200), no longer (50 100).
    ASSERT_TRUE(documento_->lisp()->lispEvaluate("(entmod (list (cons -1 (handent \"" + handle(w) +
                                                 "\")) '(10 0.0 300.0)))"));
    ASSERT_EQ(w->vertices().front().y, 300.0);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 200, 0}), id(w));
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 100, 0}).isNull());
}

// The host hands a page's wires over with the vertices its connection walk read: a reader
// made after an edit, with the connections read again, sees the wire where it went.
TEST_F(ConnectionQueriesTest, AWireMovedInLispAfterTheConnectionsWereReadIsSeenWhereItWent) {
    const zvdb::Polyline* w = fio({{0, 100, 0}, {100, 100, 0}}, "1");
    const QString layer = QString::fromStdString(kPagina);
    CICad::LiberaLista(CICad::zvInvokeLista("getConexoesTodosFios"));
    auto r = leitor(0.5);
    EXPECT_EQ(r->FioNoPonto(layer, {50, 100, 0}), id(w));
    EXPECT_TRUE(r->FioNoPonto(layer, {50, 200, 0}).isNull());
    ASSERT_TRUE(documento_->lisp()->lispEvaluate("(entmod (list (cons -1 (handent \"" + handle(w) +
                                                 "\")) '(10 0.0 300.0)))"));
    EXPECT_EQ(r->FioNoPonto(layer, {50, 200, 0}), id(w));
    CICad::LiberaLista(CICad::zvInvokeLista("getConexoesTodosFios"));
    auto depois = leitor(0.5);
    EXPECT_EQ(depois->FioNoPonto(layer, {50, 200, 0}), id(w));
    EXPECT_TRUE(depois->FioNoPonto(layer, {50, 100, 0}).isNull());
}

// A wire's position comes from its first vertex, also after the wire moved.
TEST_F(ConnectionQueriesTest, AWirePositionFollowsItsFirstVertex) {
    ASSERT_TRUE(documento_->lisp()->lispEvaluate(
        "(defun BuscarCoordenadas (e g p x y) (strcat g \"/\" p \":\" (rtos x 2 1) \";\" "
        "(rtos y 2 1)))"));
    const zvdb::Polyline* w = fio({{10, 100, 0}, {100, 100, 0}}, "1");
    auto r = leitor(0.5);
    EXPECT_EQ(r->Posicao(id(w)), "ESQ/0001:10.0;100.0");
    // once the wires of its page are indexed too
    EXPECT_EQ(r->FioNoPonto(QString::fromStdString(kPagina), {50, 100, 0}), id(w));
    EXPECT_EQ(r->Posicao(id(w)), "ESQ/0001:10.0;100.0");
    ASSERT_TRUE(documento_->lisp()->lispEvaluate("(entmod (list (cons -1 (handent \"" + handle(w) +
                                                 "\")) '(10 20.0 300.0)))"));
    EXPECT_EQ(r->Posicao(id(w)), "ESQ/0001:20.0;300.0");
    EXPECT_EQ(r->FioNoPonto(QString::fromStdString(kPagina), {60, 200, 0}), id(w));
    EXPECT_EQ(r->Posicao(id(w)), "ESQ/0001:20.0;300.0");
}

// Each wire of an indexed page, given in any order and of one vertex too, takes its own first
// vertex.
TEST_F(ConnectionQueriesTest, EachWireOfAnIndexedPageTakesItsOwnFirstVertex) {
    ASSERT_TRUE(documento_->lisp()->lispEvaluate(
        "(defun BuscarCoordenadas (e g p x y) (strcat (rtos x 2 0) \";\" (rtos y 2 0)))"));
    std::vector<const zvdb::Polyline*> fios;
    for (int k = 0; k < 5; ++k)
        fios.push_back(fio({{double(k), 100.0 + k, 0}, {100, 100.0 + k, 0}}, std::to_string(k)));
    fios.push_back(db().modelSpace()->addLwPolyline({{7, 8, 0}}, false, kPagina));
    QStringList respostas;
    for (auto it = fios.rbegin(); it != fios.rend(); ++it)
        respostas << "\"" + handle(*it) + "\"";
    CICad::AvaliaLisp("(defun getFiosPorLayer (l) (list " + respostas.join(' ') + "))");
    auto r = leitor(0.5);
    EXPECT_EQ(r->FioNoPonto(QString::fromStdString(kPagina), {50, 102, 0}), id(fios[2]));
    for (int k = 0; k < 5; ++k)
        EXPECT_EQ(r->Posicao(id(fios[size_t(k)])), QString("%1;%2").arg(k).arg(100 + k));
    EXPECT_EQ(r->Posicao(id(fios[5])), "7;8");
}

// A wire read for one copy alone asks the position function only when the copy keeps the
// position under its suffix; a reading kept for other copies always has it.
TEST_F(ConnectionQueriesTest, AWireReadForOneCopyLeavesOutThePositionItsCopyDrops) {
    ASSERT_TRUE(documento_->lisp()->lispEvaluate(
        "(progn (setq chamadas 0) (defun BuscarCoordenadas (e g p x y) (setq chamadas (1+ "
        "chamadas)) \"B2\"))"));
    const zvdb::Polyline* w = fio({{10, 100, 0}, {100, 100, 0}}, "7");
    struct Leitor : LeitorBase {
        explicit Leitor(bool guarda) { GuardaFios = guarda; }
        void Filtra(std::function<bool(const QString&)> fica) { FiltraSufixos(std::move(fica)); }
    };
    const auto chamadas = [] { return CICad::GetIntLisp("chamadas", -1); };
    const auto copia = [&](bool guarda, const QString& fica) -> QString {
        Leitor leitor(guarda);
        leitor.Filtra([fica](const QString& nome) { return nome == "FIO_SEGINI" || nome == fica; });
        CEItemLista item;
        leitor.CopiaEntidade("_SEGINI", item, id(w), nullptr);
        return QString("%1 %2 %3")
            .arg(item.campos.size())
            .arg(item.valorCampo("FIO_SEGINI"), item.valorCampo("POSICAO_SEGINI"));
    };
    EXPECT_EQ(copia(false, "POSICAO_SEGINI"), "2 7 B2");
    EXPECT_EQ(chamadas(), 1);
    EXPECT_EQ(copia(false, "LAYER_SEGINI"), "2 7 ");
    EXPECT_EQ(chamadas(), 1);
    EXPECT_EQ(copia(true, "LAYER_SEGINI"), "2 7 ");
    EXPECT_EQ(chamadas(), 2);
    // One reader asks its filter once per suffix: each suffix keeps its own answer.
    Leitor leitor(false);
    leitor.Filtra([](const QString& nome) {
        return nome == "FIO_SEGINI" || nome == "FIO_SEGFIM" || nome == "POSICAO_SEGINI";
    });
    QStringList posicoes;
    for (const char* sufixo : {"_SEGINI", "_SEGFIM", "_SEGINI", "_SEGFIM"}) {
        CEItemLista item;
        leitor.CopiaEntidade(sufixo, item, id(w), nullptr);
        posicoes << item.valorCampo(QLatin1String("FIO") + sufixo) + "@" +
                        item.valorCampo(QLatin1String("POSICAO") + sufixo);
    }
    EXPECT_EQ(posicoes, QStringList({"7@B2", "7@", "7@B2", "7@"}));
    EXPECT_EQ(chamadas(), 4);
}

// ---- neighbours along a wire

class NeighbourTest : public ConnectionQueriesTest {
protected:
    void SetUp() override {
        ConnectionQueriesTest::SetUp();
        // 101: K -> T (T's insertion point); 102: T's cut point -> U.
        k = simbolo("NA-1", {20, 200, 0});
        t = simbolo("BORNE_1", {20, 150, 0});
        u = simbolo("BORNE_1", {20, 100, 0});
        fio({{20, 190, 0}, {20, 150, 0}}, "101");
        fio({{20, 140, 0}, {20, 100, 0}}, "102");
        // 103 runs straight through V: A -> V -> B.
        a = simbolo("NA-1", {60, 210, 0});
        v = simbolo("BORNE_1", {60, 150, 0});
        b = simbolo("BORNE_1", {60, 90, 0});
        fio({{60, 200, 0}, {60, 150, 0}, {60, 90, 0}}, "103");
        // 104 touches W twice, at its insertion and at its cut point: C -> W -> W -> D.
        c = simbolo("NA-1", {100, 210, 0});
        w = simbolo("BORNE_1", {100, 150, 0});
        d = simbolo("BORNE_1", {100, 90, 0});
        fio({{100, 200, 0}, {100, 150, 0}, {100, 140, 0}, {100, 90, 0}}, "104");
        // 105 touches S only.
        s = simbolo("BORNE_1", {150, 200, 0});
        fio({{150, 200, 0}, {150, 180, 0}}, "105");
        r = leitor();
        r->CarregaConexoesFios();
    }
    QString vizinho(const zvdb::DbObject* de, zvdb::Point3 p, bool anterior) {
        return r->VizinhoNaConexao(id(de), {p.x, p.y, p.z}, anterior);
    }

    zvdb::BlockReference *k, *t, *u, *a, *v, *b, *c, *w, *d, *s;
    std::unique_ptr<LeitorBase> r;
};

TEST_F(NeighbourTest, TheWireHoldsItsElementsInOrderWithTheirPoints) {
    const auto elementos = r->ListaConexoes("104");
    ASSERT_TRUE(elementos);
    EXPECT_EQ(elementos->ParaLista(), QStringList({handle(c), handle(w), handle(w), handle(d)}));
    const auto pontos = r->PontosConexao("104");
    ASSERT_TRUE(pontos);
    ASSERT_EQ(pontos->size(), 4u);
    EXPECT_DOUBLE_EQ((*pontos)[2].y, 140.0);
    const CEPonto primeiro = r->PontoDaConexao("104", handle(w));
    EXPECT_DOUBLE_EQ(primeiro.y, 150.0);
    const CEPonto nenhum = r->PontoDaConexao("104", handle(k));
    EXPECT_DOUBLE_EQ(nenhum.x, 0.0);
    EXPECT_DOUBLE_EQ(nenhum.y, 0.0);
}

TEST_F(NeighbourTest, EachEndOfATerminalSeesItsOwnWire) {
    EXPECT_EQ(vizinho(t, {20, 150, 0}, true), handle(k));
    EXPECT_EQ(vizinho(t, {20, 150, 0}, false), "");
    EXPECT_EQ(vizinho(t, {20, 140, 0}, false), handle(u));
    // First on its wire: nothing before it.
    EXPECT_EQ(vizinho(t, {20, 140, 0}, true), "");
    EXPECT_EQ(vizinho(u, {20, 100, 0}, true), handle(t));
    // A point on no wire has no neighbour.
    EXPECT_EQ(vizinho(t, {40, 150, 0}, true), "");
}

TEST_F(NeighbourTest, TheElementMatchesWithinThreeUnitsOfItsPoint) {
    // Points on wire 101 at 2.5 and 3.5 from T's point.
    EXPECT_EQ(vizinho(t, {20, 152.5, 0}, true), handle(k));
    EXPECT_EQ(vizinho(t, {20, 153.5, 0}, true), "");
}

TEST_F(NeighbourTest, AWireThroughATerminalGivesOneNeighbourEachWay) {
    EXPECT_EQ(vizinho(v, {60, 150, 0}, false), handle(b));
    EXPECT_EQ(vizinho(v, {60, 150, 0}, true), handle(a));
    // The neighbour's own view: the terminal is before B.
    EXPECT_EQ(vizinho(b, {60, 90, 0}, true), handle(v));
}

TEST_F(NeighbourTest, ATerminalTwiceOnAWireIsFoundAtTheOccurrenceNearThePoint) {
    EXPECT_EQ(vizinho(w, {100, 140, 0}, false), handle(d));
    EXPECT_EQ(vizinho(w, {100, 150, 0}, true), handle(c));
    // The terminal itself is never its own neighbour.
    EXPECT_EQ(vizinho(w, {100, 150, 0}, false), "");
    EXPECT_EQ(vizinho(w, {100, 140, 0}, true), "");
}

TEST_F(NeighbourTest, AWireWithOneElementGivesNoNeighbour) {
    ASSERT_TRUE(r->ListaConexoes("105"));
    EXPECT_EQ(r->ListaConexoes("105")->size(), 1);
    EXPECT_EQ(vizinho(s, {150, 200, 0}, false), "");
    EXPECT_EQ(vizinho(s, {150, 200, 0}, true), "");
}

// A terminal's side takes the element the neighbour question gives (looking the other way
// when it gives none), its object, the wire there and the element's first point on it.
TEST_F(NeighbourTest, ATerminalsSideIsWhatTheNeighbourAndPointQueriesGive) {
    zvdb::BlockReference* fora = simbolo("BORNE_1", {300, 300, 0});
    int lados = 0;
    for (const zvdb::BlockReference* borne : {t, u, v, b, w, d, s, fora}) {
        for (const bool insercao : {true, false}) {
            const CCBorneDataReader::LadoBorne lado =
                CCBorneDataReader::AchaLado(*r, id(borne), insercao);
            const CEPonto p = CICad::GetPosicao(id(borne));
            const CEPonto q = r->PontoDeCorte(id(borne));
            const CEPonto ponto = insercao ? p : q;
            EXPECT_DOUBLE_EQ(lado.ponto.y, ponto.y);
            EXPECT_DOUBLE_EQ(lado.outro.y, (insercao ? q : p).y);
            QString esperado = r->VizinhoNaConexao(id(borne), ponto, !insercao);
            if (esperado.isEmpty()) esperado = r->VizinhoNaConexao(id(borne), ponto, insercao);
            const std::string onde = handle(borne).toStdString() + (insercao ? " ini" : " fim");
            EXPECT_EQ(lado.vizinho.toString(), esperado) << onde;
            if (esperado.isEmpty()) {
                EXPECT_TRUE(lado.elemento.isNull()) << onde;
                EXPECT_TRUE(lado.fio.isNull()) << onde;
                continue;
            }
            ++lados;
            EXPECT_EQ(lado.elemento, CICad::IdDoHandle(esperado)) << onde;
            EXPECT_EQ(lado.fio, r->FioNoPonto(r->LayerDe(id(borne)), ponto)) << onde;
            EXPECT_EQ(lado.numeroFio, r->NumeroDoFio(lado.fio)) << onde;
            EXPECT_EQ(lado.fioNumerado, r->EhFioNumerado(lado.fio)) << onde;
            const CEPonto noFio = r->PontoDaConexao(r->NumeroDoFio(lado.fio), esperado);
            EXPECT_DOUBLE_EQ(lado.pontoElemento.x, noFio.x) << onde;
            EXPECT_DOUBLE_EQ(lado.pontoElemento.y, noFio.y) << onde;
        }
    }
    EXPECT_EQ(lados, 8);
    // W stands twice on wire 104: the element's point is its first entry's, at W's insertion.
    const CCBorneDataReader::LadoBorne emD = CCBorneDataReader::AchaLado(*r, id(d), true);
    EXPECT_EQ(emD.vizinho.toString(), handle(w));
    EXPECT_DOUBLE_EQ(emD.pontoElemento.y, 150.0);
}

// The wires of a numbered side answer the wire at the terminal's other point; the other side,
// whose point that is, takes it as its own wire instead of looking for one.
TEST_F(NeighbourTest, ATerminalsSecondSideTakesTheWireTheFirstFoundAtItsPoint) {
    TemplateDouble modelo;
    CEItemLista item;
    const CCBorneDataReader::LadoBorne primeiro = CCBorneDataReader::AchaLado(*r, id(t), true);
    ASSERT_TRUE(primeiro.fioNumerado);
    EXPECT_EQ(primeiro.numeroFio, "101");
    const std::optional<OdDbObjectId> outro =
        CCBorneDataReader::LeFiosLado(*r, item, id(t), primeiro, true, &modelo);
    ASSERT_TRUE(outro);
    EXPECT_EQ(*outro, r->FioNoPonto(r->LayerDe(id(t)), primeiro.outro));
    EXPECT_EQ(r->NumeroDoFio(*outro), "102");
    CCBorneDataReader::LadoBorne oposto = primeiro;
    oposto.fioOutro = outro;
    const CCBorneDataReader::LadoBorne segundo =
        CCBorneDataReader::AchaLado(*r, id(t), false, &oposto);
    EXPECT_EQ(segundo.fio, *outro);
    EXPECT_EQ(segundo.numeroFio, "102");
    EXPECT_EQ(segundo.vizinho.toString(), handle(u));
    EXPECT_EQ(segundo.vizinho.toString(),
              CCBorneDataReader::AchaLado(*r, id(t), false).vizinho.toString());
    // Told that no wire is there, the side has no neighbour, though one is on the drawing.
    oposto.fioOutro = OdDbObjectId();
    EXPECT_TRUE(CCBorneDataReader::AchaLado(*r, id(t), false, &oposto).vizinho.isEmpty());
    // A side whose wire has no number of its own reads no wires and looks for none.
    CCBorneDataReader::LadoBorne semNumero = primeiro;
    semNumero.fioNumerado = false;
    CEItemLista vazio;
    EXPECT_FALSE(CCBorneDataReader::LeFiosLado(*r, vazio, id(t), semNumero, true, &modelo));
    EXPECT_EQ(vazio.campos.size(), 0);
}

// A neighbour erased after the connections were loaded answers by a handle that no longer
// opens: the terminal's side stays blank, with no placeholder fields of a missing block.
TEST_F(NeighbourTest, ANeighbourThatDoesNotOpenLeavesTheSideBlank) {
    CCBorneDataReader terminais;
    terminais.CarregaConexoesFios();
    TemplateDouble modelo;
    CEItemLista vivo;
    terminais.LerLadoIni(vivo, id(t), modelo);
    EXPECT_EQ(vivo.valorCampo("HANDLE_FIM"), handle(k));
    k->erase();
    CEItemLista item;
    terminais.LerLadoIni(item, id(t), modelo);
    terminais.LerLadoFim(item, id(t), modelo);
    // The cut side still sees U on wire 102; the insertion side, whose K is gone, nothing.
    EXPECT_EQ(item.valorCampo("HANDLE_INI"), handle(u));
    EXPECT_FALSE(item.temCampo("HANDLE_FIM"));
    EXPECT_FALSE(item.temCampo("DESCRICAO_FIM"));
    EXPECT_FALSE(item.temCampo("POSICAO_FIM"));
    // No field of the element; wire 101 itself still stands and the cut side reads it.
    for (const QString& campo : item.textoCampos().split(' ', Qt::SkipEmptyParts))
        EXPECT_FALSE(campo.endsWith("_FIM")) << campo.toStdString();
    EXPECT_FALSE(item.valorCampo("LAYER_SEGFIM").isEmpty());
}

// A reader that keeps few entities read reads the dropped ones again: every side of every
// terminal gets what a reader that keeps them all gives, also a symbol wired to two terminals
// and copied under both sides' suffixes.
TEST_F(NeighbourTest, EntitiesReadAgainAfterBeingDroppedGiveTheSameSides) {
    // 201: M -> X (X's insertion point); 202: Y's cut point -> M.
    zvdb::BlockReference* m = simbolo("NA-1", {200, 200, 0});
    m->addAttribute("TAG", "-M1", {200, 205, 0}, 2.5);
    // Each terminal's relation names the connection nearest its wire's end.
    m->addAttribute("LIGACAO1", "A1", {200, 188, 0}, 2.5);
    m->addAttribute("LIGACAO2", "A2", {200, 202, 0}, 2.5);
    zvdb::BlockReference* x = simbolo("BORNE_1", {200, 150, 0});
    zvdb::BlockReference* y = simbolo("BORNE_1", {200, 260, 0});
    fio({{200, 190, 0}, {200, 150, 0}}, "201");
    fio({{200, 250, 0}, {200, 200, 0}}, "202");
    CCBorneDataReader todos, poucos;
    poucos.LimitaEntidadesGuardadas(1);
    todos.CarregaConexoesFios();
    poucos.CarregaConexoesFios();
    TemplateDouble modelo;
    modelo.simbolos["*CHAR_SEP_STD_CFG*"] = ":";
    modelo.simbolos["*ORDEM_CONCAT_STD*"] = "1";
    auto lados = [&](CCDataReader& leitor, const zvdb::BlockReference* borne) {
        CEItemLista item;
        leitor.LerLadoIni(item, id(borne), modelo);
        leitor.LerLadoFim(item, id(borne), modelo);
        return item;
    };
    const std::vector<zvdb::BlockReference*> bornes = {x, t, y, u, v, x, b, w, d, s, y, t};
    for (int volta = 0; volta < 2; ++volta)
        for (const zvdb::BlockReference* borne : bornes) {
            const CEItemLista esperado = lados(todos, borne);
            const CEItemLista item = lados(poucos, borne);
            EXPECT_EQ(item.campos.keys(), esperado.campos.keys()) << handle(borne).toStdString();
            EXPECT_EQ(item.campos.values(), esperado.campos.values())
                << handle(borne).toStdString();
        }
    const CEItemLista emX = lados(poucos, x);
    const CEItemLista emY = lados(poucos, y);
    EXPECT_EQ(emX.valorCampo("HANDLE_FIM"), handle(m));
    EXPECT_EQ(emX.valorCampo("TAG_FIM"), "-M1:A1");
    EXPECT_FALSE(emX.temCampo("HANDLE_INI"));
    EXPECT_EQ(emY.valorCampo("HANDLE_INI"), handle(m));
    EXPECT_EQ(emY.valorCampo("TAG_INI"), "-M1:A2");
    EXPECT_FALSE(emY.temCampo("HANDLE_FIM"));
    EXPECT_EQ(emX.valorCampo("FIO_SEGFIM"), "201") << emX.textoCampos().toStdString();
    EXPECT_EQ(emY.valorCampo("FIO_SEGINI"), "202");
}

// The neighbour's relation and connection, joined the way each template says; a terminal
// whose INVERTIDO reads "S" in any case has its sides' suffixes swapped.
TEST_F(NeighbourTest, ASideJoinsRelationAndConnectionAsItsTemplateSays) {
    k->addAttribute("RELACAO", "-K1", {20, 205, 0}, 2.5);
    k->addAttribute("LIGACAO", "A1", {20, 190, 0}, 2.5);
    CCBorneDataReader terminais;
    terminais.CarregaConexoesFios();
    TemplateDouble antes, depois;
    antes.simbolos["*CHAR_SEP_STD_CFG*"] = ":";
    antes.simbolos["*ORDEM_CONCAT_STD*"] = "1";
    depois.simbolos["*CHAR_SEP_STD_CFG*"] = ".";
    depois.simbolos["*ORDEM_CONCAT_STD*"] = "0";
    CEItemLista primeiro, segundo;
    terminais.LerLadoIni(primeiro, id(t), antes);
    terminais.LerLadoIni(segundo, id(t), depois);
    EXPECT_EQ(primeiro.valorCampo("RELACAO_FIM"), "-K1:A1");
    EXPECT_EQ(segundo.valorCampo("TAG_FIM"), "A1.-K1");
    // U+017F (long s) upper-cases to S; U+00DF (sharp s) to SS, U+0160 to itself.
    for (const char* invertido : {"S", "s", "\xc5\xbf"}) {
        CEItemLista item;
        item.definirCampo("INVERTIDO", invertido);
        terminais.LerLadoIni(item, id(t), antes);
        EXPECT_EQ(item.valorCampo("RELACAO_INI"), "-K1:A1") << invertido;
        EXPECT_FALSE(item.temCampo("RELACAO_FIM")) << invertido;
    }
    for (const char* reto : {"SS", "N", " S", "", "\xc3\x9f", "\xc5\xa0", "t"}) {
        CEItemLista item;
        item.definirCampo("INVERTIDO", reto);
        terminais.LerLadoIni(item, id(t), antes);
        EXPECT_EQ(item.valorCampo("ETIQUETA_FIM"), "-K1:A1") << reto;
        EXPECT_FALSE(item.temCampo("RELACAO_INI")) << reto;
    }
}

// ---- wire numbers, cut points and connection attributes

TEST_F(ConnectionQueriesTest, AWireNumberComesFromItsNamedFieldInAnyLanguage) {
    zvdb::Polyline* ingles = db().modelSpace()->addLwPolyline({{0, 0, 0}, {1, 0, 0}}, false);
    ingles->setXData("KVR_ZV_WIRE",
                     zvsample::XDataItems().text("10006\f1").text("1").text("wire\f7A").tags());
    zvdb::Polyline* curto = db().modelSpace()->addLwPolyline({{0, 0, 0}, {1, 0, 0}}, false);
    curto->setXData("KVR_ZV_WIRE", zvsample::XDataItems().text("10006\f1").text("FIO\f9").tags());
    auto r = leitor();
    EXPECT_EQ(r->NumeroDoFio(id(ingles)), "7A");
    EXPECT_TRUE(r->EhFioNumerado(id(ingles)));
    // The number is read from the third item on.
    EXPECT_EQ(r->NumeroDoFio(id(curto)), "");
    EXPECT_FALSE(r->EhFioNumerado(id(curto)));
    EXPECT_EQ(r->NumeroDoFio(id(fio({{0, 0, 0}, {1, 1, 0}}, "12"))), "12");
}

// The field texts are split as any other: empty parts skipped, a text of three parts is
// no field; the name is upper-cased as Qt does it, also beyond ASCII.
TEST_F(ConnectionQueriesTest, AWireNumberFieldIsSplitAndNamedAsAnyFieldText) {
    auto numero = [&](std::vector<std::string> campos) {
        zvsample::XDataItems itens;
        itens.text("10006\f1").text("1");
        for (const std::string& campo : campos)
            itens.text(campo);
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline({{0, 0, 0}, {1, 0, 0}}, false);
        linha->setXData("KVR_ZV_WIRE", itens.tags());
        auto r = leitor();
        return r->EhFioNumerado(id(linha)) ? r->NumeroDoFio(id(linha)) : QString("none");
    };
    EXPECT_EQ(numero({"\f\fFio\f\f8B\f"}), "8B");
    EXPECT_EQ(numero({"FIO\f1\f2", "Alambre\f3"}), "3");
    EXPECT_EQ(numero({"CABO"}), "");
    EXPECT_EQ(numero({"\f", "", "FIOS\f1", "FI\f1",
                      "WIRE\f\xce\xa9"
                      "1"}),
              QString::fromUtf8("\xce\xa9"
                                "1"));
    // U+0131 (dotless i) upper-cases to I; U+00CD does not.
    EXPECT_EQ(numero({"f\xc4\xb1o\f4"}), "4");
    EXPECT_EQ(numero({"F\xc3\x8dO\f5"}), "none");
    EXPECT_EQ(numero({"C\xc3\x81\x42O\f6", "cAbO\f7"}), "7");
}

TEST_F(ConnectionQueriesTest, TheCutPointIsTheStoredPointThatIsNotTheInsertion) {
    auto r = leitor();
    auto ponto = [&](const zvdb::DbObject* ref) {
        const CEPonto p = r->PontoDeCorte(id(ref));
        return QString("%1,%2,%3").arg(p.x).arg(p.y).arg(p.z);
    };
    EXPECT_EQ(ponto(simbolo("BORNE_1", {5, 50, 0})), "5,40,0");
    // Stored the other way round: the first point is the cut point.
    auto* trocado = db().modelSpace()->addBlockReference(bloco("NA-1"), {8, 8, 0});
    trocado->setXData("KVR_ZV_PTS_CORTE",
                      zvsample::XDataItems().point({8, -2, 0}).point({8, 8, 0}).tags());
    EXPECT_EQ(ponto(trocado), "8,-2,0");
    // Without cut points: the third key item, as a point.
    auto* chave = db().modelSpace()->addBlockReference(bloco("NA-1"), {1, 1, 0});
    chave->setXData("KVR_ZV",
                    zvsample::XDataItems().text("1001\f1").text("x").point({3, 4, 5}).tags());
    EXPECT_EQ(ponto(chave), "3,4,5");
    // One point only and a short key: the origin.
    auto* curto = db().modelSpace()->addBlockReference(bloco("NA-1"), {1, 1, 0});
    curto->setXData("KVR_ZV_PTS_CORTE", zvsample::XDataItems().point({7, 7, 0}).tags());
    curto->setXData("KVR_ZV", zvsample::XDataItems().text("1001\f1").tags());
    EXPECT_EQ(ponto(curto), "0,0,0");
}

TEST_F(ConnectionQueriesTest, TheNearestConnectionAttributeOfAnyLanguageIsCopied) {
    auto* ref = db().modelSpace()->addBlockReference(bloco("BOBINA"), {0, 0, 0});
    ref->addAttribute("LIGACAO1", "A1", {0, 0, 0}, 2.5);
    ref->addAttribute("RELACAO", "-K1", {6, 0, 0}, 2.5);
    ref->addAttribute("Connection2", "A2", {10, 0, 0}, 2.5);
    ref->addAttribute("CONEXION3", "A3", {20, 0, 0}, 2.5);
    auto r = leitor();
    auto valor = [&](CEPonto p) {
        const std::unique_ptr<zv::CEAtributo> a = r->AtributoConexaoProximo(id(ref), p);
        return a ? a->GetTag() + "=" + a->GetValor() : QString("none");
    };
    EXPECT_EQ(valor({9, 0, 0}), "Connection2=A2");
    EXPECT_EQ(valor({6, 0, 0}), "Connection2=A2");  // the label nearer still is no connection
    EXPECT_EQ(valor({30, 1, 0}), "CONEXION3=A3");
    EXPECT_EQ(valor({-1, 0, 0}), "LIGACAO1=A1");
    // Equally near: the first one stays.
    EXPECT_EQ(valor({5, 3, 0}), "LIGACAO1=A1");
    EXPECT_EQ(valor({5, 0, 0}), "LIGACAO1=A1");
    auto* sem = db().modelSpace()->addBlockReference(bloco("BOBINA"), {0, 0, 0});
    sem->addAttribute("RELACAO", "-K2", {0, 0, 0}, 2.5);
    EXPECT_EQ(r->AtributoConexaoProximo(id(sem), {0, 0, 0}), nullptr);
}

}  // namespace

// An element not read just before gives its connection attributes as an attribute list
// would: tag and value trimmed, its object and visibility, an erased attribute left out.
TEST_F(ConnectionQueriesTest, AConnectionAttributeReadAloneIsTheAttributeListsOne) {
    auto* ref = db().modelSpace()->addBlockReference(bloco("BOBINA"), {0, 0, 0});
    zvdb::Attribute* oculta = ref->addAttribute("  ligacao7 ", " B7  ", {0, 0, 0}, 2.5);
    oculta->setInvisible(true);
    ref->addAttribute("RELACAO", "-K7", {0, 1, 0}, 2.5);
    zvdb::Attribute* apagada = ref->addAttribute("LIGACAO8", "B8", {0, 0, 0}, 2.5);
    apagada->erase();
    ref->addAttribute("CONEXION9", "", {50, 0, 0}, 2.5);
    auto r = leitor();
    std::unique_ptr<zv::CEListaAtributos> lista;
    CICad::GetAtributos(id(ref), lista, false, false);
    ASSERT_TRUE(lista);
    ASSERT_EQ(lista->Quantidade(), 3);
    for (const auto& [p, lugar] :
         std::vector<std::pair<CEPonto, int>>{{{1, 0, 0}, 0}, {{49, 0, 0}, 2}}) {
        const zv::CEAtributo* achado = r->ConexaoProxima(id(ref), p);
        ASSERT_NE(achado, nullptr);
        const zv::CEAtributo& esperado = (*lista)[lugar];
        EXPECT_EQ(achado->GetTag(), esperado.GetTag());
        EXPECT_EQ(achado->GetValor(), esperado.GetValor());
        EXPECT_EQ(achado->GetId(), esperado.GetId());
        EXPECT_EQ(achado->IsInvisivel(), esperado.IsInvisivel());
    }
    const zv::CEAtributo* primeira = r->ConexaoProxima(id(ref), {1, 0, 0});
    EXPECT_EQ(primeira->GetTag().toUpper(), "LIGACAO7");
    EXPECT_EQ(primeira->GetValor(), "B7");
    EXPECT_TRUE(primeira->IsInvisivel());
    EXPECT_EQ(primeira->GetId(), id(oculta));
}

// ---- what a reader keeps for the run

// A wire's number and an entity's fields are read once; a change to the drawing is seen by
// the next question.
TEST_F(ConnectionQueriesTest, KeptNumbersAndFieldsFollowAChangeOfTheDrawing) {
    zvdb::Polyline* w = fio({{0, 0, 0}, {10, 0, 0}}, "5");
    zvdb::BlockReference* k = simbolo("NA-1", {50, 50, 0});
    k->addAttribute("TAG", "K1", {50, 50, 0}, 2.5);
    auto r = leitor();
    EXPECT_EQ(r->NumeroDoFio(id(w)), "5");
    CEItemLista primeiro;
    r->CopiaEntidade("_FIM", primeiro, id(k), nullptr);
    EXPECT_EQ(primeiro.valorCampo("TAG_FIM"), "K1");

    w->setXData("KVR_ZV_WIRE",
                zvsample::XDataItems().text("10006\f1").text("1").text("FIO\f6").tags());
    k->attribute("TAG")->setTextValue("K2");
    EXPECT_EQ(r->NumeroDoFio(id(w)), "6");
    EXPECT_TRUE(r->EhFioNumerado(id(w)));
    CEItemLista segundo;
    r->CopiaEntidade("_FIM", segundo, id(k), nullptr);
    EXPECT_EQ(segundo.valorCampo("TAG_FIM"), "K2");
}

// A block's constant attributes are kept per block, and a symbol's attributes for the
// connection question that follows its reading: both follow a change of the drawing.
TEST_F(ConnectionQueriesTest, KeptConstantsAndAttributesFollowAChangeOfTheDrawing) {
    zvdb::BlockRecord& definicao = bloco("NA-C");
    zvdb::Attribute* fabricante =
        definicao.addAttributeDefinition("FAB", "Maker", "X1", {0, 0, 0}, 2.5);
    fabricante->setInteger(70, 2, "AcDbAttributeDefinition");
    zvdb::BlockReference* k = simbolo("NA-C", {50, 50, 0});
    k->addAttribute("LIGACAO1", "A1", {50, 50, 0}, 2.5);
    zvdb::BlockReference* q = simbolo("NA-C", {80, 50, 0});
    q->addAttribute("LIGACAO1", "B1", {80, 50, 0}, 2.5);
    auto r = leitor();
    auto ligacao = [&](const zvdb::BlockReference* ref) {
        const std::unique_ptr<zv::CEAtributo> a = r->AtributoConexaoProximo(id(ref), {0, 0, 0});
        return a ? a->GetValor() : QString("none");
    };
    CEItemLista primeiro;
    r->LeBloco("_INI", primeiro, id(k), nullptr);
    EXPECT_EQ(primeiro.valorCampo("FAB_INI"), "X1");
    EXPECT_EQ(primeiro.valorCampo("LIGACAO1_INI"), "A1");
    EXPECT_EQ(ligacao(k), "A1");

    // Read, then edited before its connections are asked for.
    CEItemLista segundo;
    r->LeBloco("_FIM", segundo, id(q), nullptr);
    EXPECT_EQ(segundo.valorCampo("FAB_FIM"), "X1");
    q->attribute("LIGACAO1")->setTextValue("B2");
    EXPECT_EQ(ligacao(q), "B2");

    // The definition's constant changed: the next symbol of the block shows the new value.
    fabricante->setTextValue("X2");
    CEItemLista terceiro;
    r->LeBloco("", terceiro, id(k), nullptr);
    EXPECT_EQ(terceiro.valorCampo("FAB"), "X2");
    // No longer constant: the block gives no FAB at all.
    fabricante->setInteger(70, 0, "AcDbAttributeDefinition");
    CEItemLista quarto;
    r->LeBloco("", quarto, id(q), nullptr);
    EXPECT_FALSE(quarto.campos.contains("FAB"));
}

// A copy gives the item what reading the entity under the suffix gives it: the same fields,
// the QTD of its own, or "1" only where the item has no QTD under that suffix yet.
TEST_F(ConnectionQueriesTest, ACopyOfAnEntityEqualsReadingItUnderTheSuffix) {
    zvdb::BlockReference* k = simbolo("NA-1", {50, 50, 0});
    k->addAttribute("TAG", "K1", {50, 50, 0}, 2.5);
    zvdb::BlockReference* q = simbolo("NA-1", {80, 50, 0});
    q->addAttribute("QTD", "4", {80, 50, 0}, 2.5);
    zvdb::Polyline* w = fio({{0, 0, 0}, {10, 0, 0}}, "5");
    auto r = leitor();
    for (const zvdb::DbObject* entidade : std::initializer_list<const zvdb::DbObject*>{k, q, w}) {
        for (const QString& antes : {QString(), QString("7")}) {
            CEItemLista lido, copiado;
            if (!antes.isEmpty()) {
                lido.definirCampo("QTD_INI", antes);
                copiado.definirCampo("QTD_INI", antes);
            }
            r->LeEntidade("_INI", lido, id(entidade), nullptr);
            r->CopiaEntidade("_INI", copiado, id(entidade), nullptr);
            EXPECT_EQ(copiado.campos.keys(), lido.campos.keys());
            EXPECT_EQ(copiado.campos.values(), lido.campos.values());
        }
    }
    CEItemLista item;
    r->CopiaEntidade("_INI", item, id(q), nullptr);
    EXPECT_EQ(item.valorCampo("QTD_INI"), "4");
    item.definirCampo("QTD_FIM", "9");
    r->CopiaEntidade("_FIM", item, id(k), nullptr);
    EXPECT_EQ(item.valorCampo("QTD_FIM"), "9");
    r->CopiaEntidade("", item, id(k), nullptr);
    EXPECT_EQ(item.valorCampo("QTD"), "1");
    EXPECT_EQ(item.valorCampo("TAG"), "K1");
}

// Symbols with the same fields share the work of renaming them, never their values: each
// copy under each suffix equals reading that symbol under it, also after one of them gained
// a field or changed a value.
TEST_F(ConnectionQueriesTest, CopiesOfSymbolsWithTheSameFieldsKeepTheirOwnValues) {
    std::vector<zvdb::BlockReference*> simbolos;
    for (int i = 0; i < 3; ++i) {
        zvdb::BlockReference* k = simbolo("NA-1", {50.0 + 30 * i, 50, 0});
        k->addAttribute("TAG", std::string("K") + char('0' + i), {50.0 + 30 * i, 50, 0}, 2.5);
        k->addAttribute("LIGACAO1", std::string("A") + char('0' + i), {50.0 + 30 * i, 55, 0}, 2.5);
        simbolos.push_back(k);
    }
    simbolos[2]->addAttribute("EXTRA", "E", {110, 60, 0}, 2.5);
    auto r = leitor();
    auto confere = [&](const QString& sufixo, const zvdb::BlockReference* k,
                       const QString& qtd = QString()) {
        CEItemLista lido, copiado;
        for (CEItemLista* item : {&lido, &copiado}) {
            item->definirCampo("FIO", "1");
            if (!qtd.isNull()) item->definirCampo("QTD" + sufixo, qtd);
        }
        r->LeEntidade(sufixo, lido, id(k), nullptr);
        r->CopiaEntidade(sufixo, copiado, id(k), nullptr);
        EXPECT_EQ(copiado.campos.keys(), lido.campos.keys()) << sufixo.toStdString();
        EXPECT_EQ(copiado.campos.values(), lido.campos.values()) << sufixo.toStdString();
        return copiado;
    };
    for (const QString& sufixo : {QString("_INI"), QString("_FIM"), QString()})
        for (const zvdb::BlockReference* k : simbolos) {
            EXPECT_EQ(confere(sufixo, k).valorCampo("QTD" + sufixo), "1");
            // The "1" only where the item has no QTD under the suffix, whatever copy came
            // before.
            EXPECT_EQ(confere(sufixo, k, "7").valorCampo("QTD" + sufixo), "7");
            EXPECT_EQ(confere(sufixo, k, "").valorCampo("QTD" + sufixo), "1");
        }
    EXPECT_EQ(confere("_FIM", simbolos[1]).valorCampo("TAG_FIM"), "K1");
    EXPECT_EQ(confere("_INI", simbolos[2]).valorCampo("EXTRA_INI"), "E");
    EXPECT_FALSE(confere("_INI", simbolos[0]).campos.contains("EXTRA_INI"));

    simbolos[0]->addAttribute("EXTRA", "F", {50, 60, 0}, 2.5);
    simbolos[1]->attribute("TAG")->setTextValue("K9");
    EXPECT_EQ(confere("_INI", simbolos[0]).valorCampo("EXTRA_INI"), "F");
    EXPECT_EQ(confere("_FIM", simbolos[1]).valorCampo("TAG_FIM"), "K9");
    EXPECT_EQ(confere("_FIM", simbolos[2]).valorCampo("TAG_FIM"), "K2");
    EXPECT_FALSE(confere("", simbolos[1]).campos.contains("EXTRA"));
}

// A cable core's number is its record's CABO attribute and the core; cores of one cable share
// the record, and a new cable number is seen once the drawing changed.
TEST_F(ConnectionQueriesTest, CoresOfACableTakeItsNumberAndFollowItsChange) {
    const std::string caminho[] = {"ZV_CABOS"};
    zvdb::XRecord* registro = db().dictionaryAt(caminho, true)->getOrCreateXRecord("W1");
    auto nomeia = [&](const std::string& numero) {
        registro->setXData("KVR_ZV_ATT_VIRTUAL",
                           zvsample::XDataItems().text("CABO\f" + numero + "\fN").tags());
    };
    nomeia("W1");
    auto via = [&](int n) {
        zvdb::Polyline* linha = db().modelSpace()->addLwPolyline({{0, 0, 0}, {9, 0, 0}}, false);
        const std::string h = ZVString::DeHandle(registro->handle()).toStdString();
        linha->setXData("KVR_ZV_CABO",
                        zvsample::XDataItems()
                            .text("2010" + std::to_string(n) + "\f" + std::to_string(n))
                            .text(h)
                            .text(h)
                            .tags());
        return linha;
    };
    zvdb::Polyline* um = via(1);
    zvdb::Polyline* dois = via(2);
    auto r = leitor();
    EXPECT_EQ(r->NumeroDoFio(id(um)), "W1\f20101");
    EXPECT_EQ(r->NumeroDoFio(id(dois)), "W1\f20102");
    EXPECT_FALSE(r->EhFioNumerado(id(um)));
    nomeia("W7");
    EXPECT_EQ(r->NumeroDoFio(id(dois)), "W7\f20102");
    // A record without a cable number: the core has none either.
    registro->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("COR\fAZUL\fN").tags());
    EXPECT_EQ(r->NumeroDoFio(id(um)), "");
}

// The wire at a side's point gives its entries with the number NumeroDoFio tells, read for
// that question alone or kept by an earlier one, and a change of the drawing is seen.
TEST_F(ConnectionQueriesTest, AWiresEntriesComeWithItsNumberKeptOrNot) {
    const std::string caminho[] = {"ZV_CABOS"};
    zvdb::XRecord* registro = db().dictionaryAt(caminho, true)->getOrCreateXRecord("W1");
    registro->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW1\fN").tags());
    zvdb::Polyline* nucleo = db().modelSpace()->addLwPolyline({{0, 0, 0}, {9, 0, 0}}, false);
    const std::string h = ZVString::DeHandle(registro->handle()).toStdString();
    nucleo->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20101\f1").text(h).text(h).tags());
    const zvdb::Polyline* proprio = fio({{0, 50, 0}, {9, 50, 0}}, "12");
    auto r = leitor();
    auto numero = [&](const zvdb::DbObject* linha) -> QString {
        QString texto = "unset";
        bool numerado = true;
        r->EntradasDoFio(id(linha), texto, numerado);
        return texto + (numerado ? " own" : " core");
    };
    EXPECT_EQ(numero(proprio), "12 own");
    EXPECT_EQ(numero(nucleo), "W1\f20101 core");
    // Kept by the plain question, then asked again after the cable was renamed.
    EXPECT_EQ(r->NumeroDoFio(id(nucleo)), "W1\f20101");
    EXPECT_EQ(numero(nucleo), "W1\f20101 core");
    registro->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW7\fN").tags());
    EXPECT_EQ(numero(nucleo), "W7\f20101 core");
    EXPECT_EQ(r->NumeroDoFio(id(nucleo)), "W7\f20101");
}

// The core is the first part of the core's first text when that text has one or two parts
// (empty ones skipped), else nothing; the first two items must be texts, and the records
// are the text items after them, the first with a cable number giving it.
TEST_F(ConnectionQueriesTest, ACoresNumberTakesItsCoreFromItsFirstTextAndItsCableFromTheRecords) {
    const std::string caminho[] = {"ZV_CABOS"};
    zvdb::Dictionary* cabos = db().dictionaryAt(caminho, true);
    zvdb::XRecord* registro = cabos->getOrCreateXRecord("W3");
    registro->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("CABO\fW3\fN").tags());
    zvdb::XRecord* semNumero = cabos->getOrCreateXRecord("W4");
    semNumero->setXData("KVR_ZV_ATT_VIRTUAL", zvsample::XDataItems().text("COR\fAZUL\fN").tags());
    const std::string h = ZVString::DeHandle(registro->handle()).toStdString();
    const std::string sem = ZVString::DeHandle(semNumero->handle()).toStdString();
    // Items by code: texts (1000), 32-bit integers (1071) and points (1010, its x y z).
    using Itens = std::vector<std::pair<int, std::string>>;
    const std::vector<std::pair<Itens, QString>> casos = {
        {{{1000, "7\f20101"}, {1000, h}, {1000, h}}, "W3\f7"},
        {{{1000, "7"}, {1000, "x"}, {1000, h}}, "W3\f7"},
        {{{1000, "\f7\f\f"}, {1000, h}, {1000, h}}, "W3\f7"},
        {{{1000, "\xce\xa9\f1"}, {1000, h}, {1000, h}}, QString::fromUtf8("W3\f\xce\xa9")},
        {{{1000, "7\f8\f9"}, {1000, h}, {1000, h}}, "W3\f"},
        {{{1000, ""}, {1000, h}, {1000, h}}, "W3\f"},
        {{{1000, "7"}, {1000, h}}, ""},
        {{{1010, ""}, {1000, h}, {1000, h}}, ""},
        {{{1000, "7"}, {1071, "5"}, {1000, h}}, ""},
        // Past records that name nothing or no cable number, and items that are no texts.
        {{{1000, "7"}, {1000, h}, {1000, "FFFFF"}, {1071, "3"}, {1000, sem}, {1000, h}}, "W3\f7"},
        {{{1000, "7"}, {1000, h}, {1010, ""}, {1000, sem}}, ""},
    };
    for (const auto& [itens, esperado] : casos) {
        zvsample::XDataItems xdata;
        for (const auto& [codigo, texto] : itens) {
            if (codigo == 1010)
                xdata.point({1, 2, 3});
            else
                xdata.add(codigo, texto);
        }
        zvdb::Polyline* nucleo = db().modelSpace()->addLwPolyline({{0, 0, 0}, {9, 0, 0}}, false);
        nucleo->setXData("KVR_ZV_CABO", xdata.tags());
        auto r = leitor();
        EXPECT_EQ(r->NumeroDoFio(id(nucleo)), esperado) << itens.front().second;
        EXPECT_FALSE(r->EhFioNumerado(id(nucleo)));
    }
}

// The record's texts are split as its virtual attributes are: the first of three fields
// named CABO or CABLE in any case gives the cable's number.
TEST_F(ConnectionQueriesTest, ACableNumberIsTheRecordsVirtualAttributeOfThatName) {
    const std::string caminho[] = {"ZV_CABOS"};
    zvdb::XRecord* registro = db().dictionaryAt(caminho, true)->getOrCreateXRecord("W2");
    zvdb::Polyline* nucleo = db().modelSpace()->addLwPolyline({{0, 0, 0}, {9, 0, 0}}, false);
    const std::string h = ZVString::DeHandle(registro->handle()).toStdString();
    nucleo->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20101\f1").text(h).text(h).tags());
    auto r = leitor();
    const std::vector<std::pair<std::vector<std::string>, QString>> casos = {
        {{"cable\fC9\fN"}, "C9"},
        {{"\fCABO\f\fS"}, " "},
        {{"CABO\fX\fN\fextra", "Cable\fY\fN"}, "Y"},
        {{"CABO\fX\fN\f"}, "X"},
        {{"CABO\fZ"}, ""},
        {{"CABO\f\f\fN"}, ""},
        {{"RELACAO\f-W\fN",
          "C\xc3\x81"
          "BO\fQ\fN",
          "CABLE\f\xce\xa9\fS"},
         QString::fromUtf8("\xce\xa9")},
    };
    for (const auto& [textos, numero] : casos) {
        zvsample::XDataItems itens;
        for (const std::string& texto : textos)
            itens.text(texto);
        registro->setXData("KVR_ZV_ATT_VIRTUAL", itens.tags());
        // What the record's attributes say, as the facade lists them.
        std::unique_ptr<zv::CEListaAtributos> atributos;
        CICad::GetAtributosVirtuais(id(registro), atributos);
        QString esperado;
        for (int a = 0; atributos && a < atributos->Quantidade() && esperado.isEmpty(); ++a) {
            const QString tag = (*atributos)[a].GetTag().toUpper();
            if (tag == "CABO" || tag == "CABLE")
                esperado = (*atributos)[a].GetValor() + QChar(0x0C) + "20101";
        }
        EXPECT_EQ(esperado, numero.isEmpty() ? QString() : numero + QChar(0x0C) + "20101");
        EXPECT_EQ(r->NumeroDoFio(id(nucleo)), esperado) << textos.front();
    }
}

// The key and standard come from the first of KVR_ZV, KVR_ZV_WIRE and KVR_ZV_CABO that has
// items, from its first text item; an application with items but no text gives none.
TEST_F(ConnectionQueriesTest, TheKeyComesFromTheFirstApplicationWithItems) {
    auto* ref =
        db().modelSpace()->addBlockReference(bloco("NA-1"), {0, 0, 0}, {1, 1, 1}, 0, kPagina);
    ref->setXData("KVR_ZV_CABO", zvsample::XDataItems().text("20003\fIEC").tags());
    auto r = leitor();
    EXPECT_EQ(r->ChaveDaEntidade(id(ref)), "20003");
    EXPECT_EQ(r->NormaDaEntidade(id(ref)), "IEC");
    ref->setXData("KVR_ZV_WIRE",
                  zvsample::XDataItems().point({1, 2, 3}).text("10006\fNEMA").tags());
    EXPECT_EQ(r->ChaveDaEntidade(id(ref)), "10006");
    EXPECT_EQ(r->NormaDaEntidade(id(ref)), "NEMA");
    ref->setXData("KVR_ZV", zvsample::XDataItems().point({1, 2, 3}).tags());
    EXPECT_EQ(r->ChaveDaEntidade(id(ref)), "");
    auto* sem = db().modelSpace()->addBlockReference(bloco("NA-1"), {0, 0, 0});
    EXPECT_EQ(r->ChaveDaEntidade(id(sem)), "");
}
