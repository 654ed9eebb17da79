// The diagram's layout on candidate keys alone: corners, rows, pages and insertion points.
#include "topographic/CCDiagramaTopografico.h"

#include <gtest/gtest.h>

#include <QStringList>

namespace {

using D = CCDiagramaTopografico;

// Blocks drawn from the origin: width by height.
D::Extensoes Caixas(const std::vector<std::pair<QString, std::pair<double, double>>>& caixas) {
    D::Extensoes e;
    for (const auto& [chave, tamanho] : caixas)
        e.insert(chave, D::ExtensaoAbsoluta(0, tamanho.first, 0, tamanho.second));
    return e;
}

QStringList Texto(const std::vector<D::Linha>& linhas) {
    QStringList t;
    for (const D::Linha& linha : linhas) {
        QStringList l;
        for (const QString& c : linha)
            l << c;
        t << l.join(' ');
    }
    return t;
}

std::vector<QString> Chaves(const QStringList& l) {
    return std::vector<QString>(l.begin(), l.end());
}

D::Retangulo Retangulo(double esquerda, double base, double largura, double altura) {
    return D::RetanguloDe({esquerda, base, 0}, {esquerda + largura, base + altura, 0});
}

}  // namespace

TEST(ChavesTopograficas, KeysSortAsTheirTextsWhateverTheirLengthsAndCharacters) {
    QString comNulo("1A");
    comNulo.append(QChar(0)).append("2");
    // Handles and accessories' keys, texts that share their first eight characters or are
    // shorter than eight, and texts with characters past ASCII or a null among them.
    const QStringList textos = {"",
                                "1",
                                "1A",
                                "1A2",
                                "1A2B3C4",
                                "1A2B3C4D",
                                "1A2B3C4D5",
                                "1A2B3C4D6",
                                "1A2B3C4E",
                                "*0_1A2B",
                                "*0_1A2B3C4D",
                                "*1_1A2B",
                                "#10_1A2B",
                                "#1_1A2B",
                                "a",
                                "A",
                                "\x7f",
                                QString::fromUtf8("1A2B\u00e9"),
                                QString::fromUtf8("1A2B\u00e93C4D"),
                                QString::fromUtf8("\u0100"),
                                comNulo,
                                "1A"};
    for (const QString& a : textos)
        for (const QString& b : textos)
            EXPECT_EQ(D::ChaveDeOrdem(a) < D::ChaveDeOrdem(b), a < b)
                << a.toStdString() << " / " << b.toStdString();
}

TEST(CantosTopograficos, TwoOrThreeNumbersAreAPointAnythingElseIsNot) {
    CEPonto p;
    ASSERT_TRUE(D::LeCanto("20,30", p));
    EXPECT_EQ(p.x, 20.0);
    EXPECT_EQ(p.y, 30.0);
    EXPECT_EQ(p.z, 0.0);
    ASSERT_TRUE(D::LeCanto(" 1.5 , -2 , 7 ", p));
    EXPECT_EQ(p.x, 1.5);
    EXPECT_EQ(p.y, -2.0);
    EXPECT_EQ(p.z, 7.0);
    // Single precision only.
    ASSERT_TRUE(D::LeCanto("0.1,0.2", p));
    EXPECT_EQ(p.x, double(0.1f));
    EXPECT_NE(p.x, 0.1);
    for (const char* ruim : {"", "abc", "20", "1,2,3,4", "1,,2", "x,y", "1;2", "nan,1", "1,inf"}) {
        p = {5, 5, 5};
        EXPECT_FALSE(D::LeCanto(ruim, p)) << ruim;
        EXPECT_EQ(p.x, 0.0) << ruim;
        EXPECT_EQ(p.y, 0.0) << ruim;
        EXPECT_EQ(p.z, 0.0) << ruim;
    }
}

TEST(CantosTopograficos, TheRectangleIsTheSameFromEitherPairOfCorners) {
    for (const auto& [a, b] : {std::pair<CEPonto, CEPonto>{{20, 20, 0}, {360, 280, 0}},
                               {{360, 280, 0}, {20, 20, 0}},
                               {{20, 280, 0}, {360, 20, 0}}}) {
        const D::Retangulo r = D::RetanguloDe(a, b);
        EXPECT_EQ(r.esquerda, 20.0);
        EXPECT_EQ(r.topo, 280.0);
        EXPECT_EQ(r.largura, 340.0);
        EXPECT_EQ(r.altura, 260.0);
    }
}

TEST(CantosTopograficos, AnExtentAcrossAnAxisIsReadByAbsoluteValues) {
    const D::Extensao e = D::ExtensaoAbsoluta(-2, 2, -1, 9);
    EXPECT_EQ(e.Largura(), 0.0);
    EXPECT_EQ(e.Altura(), 8.0);
    EXPECT_EQ(e.MenorX(), 2.0);
    const D::Extensao f = D::ExtensaoAbsoluta(3, 10, 0, 4);
    EXPECT_EQ(f.Largura(), 7.0);
    EXPECT_EQ(f.MenorX(), 3.0);
}

TEST(LinhasTopograficas, BlocksFillARowUntilTheWidthAndAWideOneStandsAlone) {
    const auto e = Caixas({{"A", {30, 5}},
                           {"B", {30, 5}},
                           {"C", {30, 5}},
                           {"D", {150, 5}},
                           {"E", {10, 5}},
                           {"F", {10, 5}}});
    // 30+30+30 = 90 < 100; the 150 wide block gets a row of its own.
    EXPECT_EQ(Texto(D::LinhasBlocos(Chaves({"A", "B", "C", "D", "E", "F"}), e, 100, 0, 0)),
              QStringList({"A B C", "D", "E F"}));
    // The margin counts with every block: 35+35 = 70, +35 = 105 is not below 100.
    EXPECT_EQ(Texto(D::LinhasBlocos(Chaves({"A", "B", "C", "E"}), e, 100, 5, 0)),
              QStringList({"A B", "C E"}));
    // A row that reaches the width exactly is full.
    const auto g = Caixas({{"G", {50, 5}}, {"H", {50, 5}}, {"I", {1, 5}}});
    EXPECT_EQ(Texto(D::LinhasBlocos(Chaves({"G", "H", "I"}), g, 100, 0, 0)),
              QStringList({"G", "H I"}));
}

TEST(LinhasTopograficas, ColumnsLimitTheBlocksOfARow) {
    D::Extensoes e;
    QStringList chaves;
    for (int i = 0; i < 7; ++i) {
        chaves << QString::number(i);
        e.insert(chaves.back(), D::ExtensaoAbsoluta(0, 5, 0, 5));
    }
    EXPECT_EQ(Texto(D::LinhasBlocos(Chaves(chaves), e, 1000, 0, 3)),
              QStringList({"0 1 2", "3 4 5", "6"}));
    EXPECT_EQ(Texto(D::LinhasBlocos(Chaves(chaves), e, 1000, 0, 0)),
              QStringList({"0 1 2 3 4 5 6"}));
}

TEST(LinhasTopograficas, RowsGoOnPagesByHeightAndByTheRowLimit) {
    const auto e = Caixas(
        {{"A", {10, 40}}, {"B", {10, 60}}, {"C", {10, 30}}, {"D", {10, 500}}, {"E", {10, 10}}});
    const std::vector<D::Linha> linhas = {{"A"}, {"B"}, {"C"}, {"D"}, {"E"}};
    // H 100, margin 5: 40 (+5), 60 would end at 105: new page; a block taller than the
    // page still goes in, on a page of its own.
    const auto paginas = D::Paginas(linhas, e, 100, 5, 0);
    ASSERT_EQ(paginas.size(), 4u);
    EXPECT_EQ(paginas[0].size(), 1u);
    EXPECT_EQ(paginas[1].size(), 2u);  // B 60 +5, C 30: 95
    EXPECT_EQ(paginas[2].size(), 1u);  // D alone
    EXPECT_EQ(paginas[3].size(), 1u);
    EXPECT_EQ(paginas[3][0][0], "E");
    // At most two rows a page, even when more would fit.
    const auto baixas =
        Caixas({{"1", {5, 1}}, {"2", {5, 1}}, {"3", {5, 1}}, {"4", {5, 1}}, {"5", {5, 1}}});
    const auto duas = D::Paginas({{"1"}, {"2"}, {"3"}, {"4"}, {"5"}}, baixas, 1000, 0, 2);
    ASSERT_EQ(duas.size(), 3u);
    EXPECT_EQ(duas[0].size(), 2u);
    EXPECT_EQ(duas[2].size(), 1u);
    EXPECT_TRUE(D::Paginas({}, baixas, 100, 0, 0).empty());
}

TEST(PosicoesTopograficas, ARowIsJustifiedToTheFullWidthAndCentredOnItsHeight) {
    // Widths 10, 20 and 10 in a width of 100: left edges at 0, 40 and 90.
    const auto e = Caixas({{"A", {10, 20}}, {"B", {20, 10}}, {"C", {10, 20}}, {"D", {30, 8}}});
    const D::Retangulo r = Retangulo(20, 20, 100, 200);
    const std::vector<D::Pagina> paginas = {{{"A", "B", "C"}, {"D"}}};
    const auto p = D::PosicoesBlocos(paginas, e, r, 5);
    EXPECT_EQ(p["A"].x, 20.0);
    EXPECT_EQ(p["B"].x, 60.0);
    EXPECT_EQ(p["C"].x, 110.0);
    // The row's height is 20 below the top (220): B, 10 high, is centred in it.
    EXPECT_EQ(p["A"].y, 200.0);
    EXPECT_EQ(p["B"].y, 205.0);
    EXPECT_EQ(p["C"].y, 200.0);
    // A row of one block: its left edge on the left side; the row starts 20 + 5 lower.
    EXPECT_EQ(p["D"].x, 20.0);
    EXPECT_EQ(p["D"].y, 220.0 - 25.0 - 8.0);
    EXPECT_EQ(p["D"].z, 0.0);
}

TEST(PosicoesTopograficas, ABlockDrawnRightOfItsOriginIsMovedBackToTheEdge) {
    D::Extensoes e;
    e.insert("A", D::ExtensaoAbsoluta(4, 14, 0, 10));
    const auto p = D::PosicoesBlocos({{{"A"}}}, e, Retangulo(0, 0, 100, 100), 0);
    EXPECT_EQ(p["A"].x, -4.0);
    // Every page starts again at the top.
    const auto q = D::PosicoesBlocos({{{"A"}}, {{"B"}}}, Caixas({{"A", {5, 10}}, {"B", {5, 4}}}),
                                     Retangulo(0, 0, 100, 100), 0);
    EXPECT_EQ(q["A"].y, 90.0);
    EXPECT_EQ(q["B"].y, 96.0);
}

TEST(BornesTopograficos, ANewStripLeavesOneStepAndTheFirstTerminalStandsOneStepLeft) {
    const std::vector<D::Borne> bornes = {{"T1", 6, "X1"}, {"T2", 6, "X1"}, {"T3", 6, "X2"}};
    const auto linhas = D::LinhasBornes(bornes, 100, 0);
    EXPECT_EQ(Texto(linhas), QStringList({"T1 T2 T3 T3"}));
    const auto e = Caixas({{"T1", {6, 45}}, {"T2", {6, 45}}, {"T3", {6, 45}}});
    const QHash<QString, double> passos = {{"T1", 6}, {"T2", 6}, {"T3", 6}};
    const auto p = D::PosicoesBornes(D::Paginas(linhas, e, 200, 0, 0), e, passos,
                                     Retangulo(20, 20, 100, 200), 0);
    EXPECT_EQ(p["T1"].x, 14.0);
    EXPECT_EQ(p["T2"].x, 20.0);
    EXPECT_EQ(p["T3"].x, 32.0);  // one step of gap after X1
    EXPECT_EQ(p["T1"].y, 220.0 - 45.0);
}

TEST(BornesTopograficos, TerminalsBreakRowsByStepAndMarginButNotByColumns) {
    std::vector<D::Borne> bornes;
    for (int i = 0; i < 7; ++i)
        bornes.push_back({QString("T%1").arg(i), 10, "X1"});
    // Width 35, margin 4: 10+4, 20+4, 30+4 join; 40 does not: it starts the next row.
    EXPECT_EQ(Texto(D::LinhasBornes(bornes, 35, 4)), QStringList({"T0 T1 T2", "T3 T4 T5", "T6"}));
    // A terminal wider than the rectangle goes alone.
    EXPECT_EQ(Texto(D::LinhasBornes({{"A", 50, "X"}, {"B", 5, "X"}}, 20, 0)),
              QStringList({"A", "B"}));
    // Steps of nothing never hang the layout.
    EXPECT_EQ(Texto(D::LinhasBornes({{"A", 0, "X"}, {"B", 0, "X"}}, 10, 20)),
              QStringList({"A", "B"}));
    EXPECT_EQ(Texto(D::LinhasBornes({{"A", 0, "X"}, {"B", 0, "X"}}, 10, 0)), QStringList({"A B"}));
}

TEST(BornesTopograficos, ALayoutOfManyTerminalsIsLinear) {
    std::vector<D::Borne> bornes;
    D::Extensoes e;
    QHash<QString, double> passos;
    for (int i = 0; i < 100000; ++i) {
        const QString chave = QString::number(i, 16).toUpper();
        bornes.push_back({chave, 6, "X" + QString::number(i / 37)});
        e.insert(chave, D::ExtensaoAbsoluta(0, 6, 0, 45));
        passos.insert(chave, 6);
    }
    const auto linhas = D::LinhasBornes(bornes, 340, 5);
    const auto paginas = D::Paginas(linhas, e, 260, 5, 4);
    const auto p = D::PosicoesBornes(paginas, e, passos, Retangulo(20, 20, 340, 260), 5);
    EXPECT_EQ(p.size(), 100000);
    size_t entradas = 0;
    for (const auto& l : linhas)
        entradas += l.size();
    // Every terminal once, and one doubled entry per strip after the first.
    EXPECT_EQ(entradas, 100000u + (99999 / 37));
    for (const auto& pagina : paginas)
        EXPECT_LE(pagina.size(), 4u);
}
