// Item records, their fields, the natural ordering and the vector operations.
#include "readers/CEItemLista.h"
#include "readers/VetorItens.h"
#include "readers/ZVString.h"

#include "QtPrinters.h"

#include <gtest/gtest.h>

#include <QSet>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <functional>
#include <map>
#include <memory>
#include <random>
#include <vector>

namespace {

// Items owned by the test; the vectors only point at them.
class Itens {
public:
    CEItemLista* novo(std::initializer_list<std::pair<const char*, const char*>> campos) {
        auto item = std::make_unique<CEItemLista>();
        for (const auto& [k, v] : campos)
            item->definirCampo(k, v);
        donos_.push_back(std::move(item));
        return donos_.back().get();
    }

private:
    std::vector<std::unique_ptr<CEItemLista>> donos_;
};

QStringList Valores(const VetorItens& v, const QString& campo) {
    QStringList valores;
    for (const CEItemLista* item : v)
        valores << item->valorCampo(campo);
    return valores;
}

TEST(ZVStringTest, SplitTreatsSeparatorsAsASetAndDropsEmptyTokens) {
    EXPECT_EQ(ZVString("$$ESQ$0001$$A$").Divide("$"), QStringList({"ESQ", "0001", "A"}));
    EXPECT_EQ(ZVString("a;b,c").Divide(",;"), QStringList({"a", "b", "c"}));
    EXPECT_TRUE(ZVString(";;;").Divide(";").isEmpty());
}

TEST(ZVStringTest, SplitInTwoAndThreeLeaveOutputsAloneOnTheWrongCount) {
    QString a = "old-a", b = "old-b", c = "old-c";
    EXPECT_TRUE(ZVString("KEY").DivideEmDois("\f", a, b));
    EXPECT_EQ(a, "KEY");
    EXPECT_EQ(b, "");
    a = "old-a", b = "old-b";
    EXPECT_FALSE(ZVString("x\fy\fz").DivideEmDois("\f", a, b));
    EXPECT_EQ(a, "old-a");
    EXPECT_EQ(b, "old-b");
    EXPECT_FALSE(ZVString("x\fy").DivideEmTres("\f", a, b, c));
    EXPECT_EQ(c, "old-c");
    EXPECT_TRUE(ZVString("x\fy\fz").DivideEmTres("\f", a, b, c));
    EXPECT_EQ(QStringList({a, b, c}), QStringList({"x", "y", "z"}));
}

TEST(ZVStringTest, SplitInTwoDropsEmptyTokensAndAcceptsItselfAsOutput) {
    QString a = "old-a", b = "old-b";
    EXPECT_TRUE(ZVString("\f\fKEY\f\fSTD\f").DivideEmDois("\f", a, b));
    EXPECT_EQ(a, "KEY");
    EXPECT_EQ(b, "STD");
    EXPECT_TRUE(ZVString("A;B").DivideEmDois("$;", a, b));
    EXPECT_EQ(QStringList({a, b}), QStringList({"A", "B"}));
    a = "old-a", b = "old-b";
    EXPECT_FALSE(ZVString("").DivideEmDois("\f", a, b));
    EXPECT_FALSE(ZVString("\f\f").DivideEmDois("\f", a, b));
    EXPECT_FALSE(ZVString("a$b;c").DivideEmDois("$;", a, b));
    EXPECT_EQ(QStringList({a, b}), QStringList({"old-a", "old-b"}));
    // the text split into its own first part and another
    ZVString texto("NOME\fVALOR");
    QString valor;
    EXPECT_TRUE(texto.DivideEmDois("\f", texto, valor));
    EXPECT_EQ(texto, "NOME");
    EXPECT_EQ(valor, "VALOR");
    ZVString so("SO");
    EXPECT_TRUE(so.DivideEmDois("\f", a, so));
    EXPECT_EQ(a, "SO");
    EXPECT_EQ(so, "");
}

TEST(ZVStringTest, PrefixNumbersAndHandles) {
    EXPECT_TRUE(ZVString("BORNE_X").ComecaCom("BORNE"));
    EXPECT_FALSE(ZVString("BOR").ComecaCom("BORNE"));
    EXPECT_FALSE(ZVString("borne").ComecaCom("BORNE"));
    EXPECT_EQ(ZVString::DeReal(2.5), "2.500000");
    EXPECT_EQ(ZVString::DeReal(2.456, 2), "2.46");
    EXPECT_EQ(ZVString::DeReal(7.0, 0), "7");
    EXPECT_EQ(ZVString::DeHandle(0x2AF), "2AF");
    EXPECT_EQ(ZVString::DeHandle(0), "0");
    EXPECT_EQ(ZVString::DeHandle(0x10), "10");
    EXPECT_EQ(ZVString::DeHandle(0xFFFFFFFFFFFFFFFFu), "FFFFFFFFFFFFFFFF");
    EXPECT_EQ(ZVString::DeHandle(0xABCDEF0123456789u), "ABCDEF0123456789");
    EXPECT_EQ(ZVString("2af").ParaHandle(), 0x2AFu);
    EXPECT_EQ(ZVString("xyz").ParaHandle(), 0u);
    EXPECT_EQ(ZVString("").ParaHandle(), 0u);
    EXPECT_EQ(ZVString("12G").ParaHandle(), 0u);
    EXPECT_EQ(ZVString("2AF#X1#BORNE").ParaHandle(), 0u);
    EXPECT_EQ(ZVString("fFfFfFfFfFfFfFf").ParaHandle(), 0xFFFFFFFFFFFFFFFu);
    EXPECT_EQ(ZVString("FFFFFFFFFFFFFFFF").ParaHandle(), 0xFFFFFFFFFFFFFFFFu);
    EXPECT_EQ(ZVString(" 2AF ").ParaHandle(), 0x2AFu);
}

TEST(ZVStringTest, RealsAreWrittenAsPrintfWritesThem) {
    // Ties in binary round to even, as printf does; signs, zeros and the large and the tiny
    // as it writes them too.
    const double valores[] = {0.125, 0.375, 2.5,  3.5,    -2.5,        1.0 / 3.0, 2.456,
                              -0.0,  0.0,   1e-7, 5e-7,   123456.789,  1e20,      -1e22,
                              1e300, 0.5,   1.5,  0.0625, 999.9999995, 1150.0,    0.045};
    for (const double v : valores)
        for (const int precisao : {-1, 0, 1, 2, 3, 6, 9}) {
            char esperado[512];
            std::snprintf(esperado, sizeof esperado, "%.*f", precisao < 0 ? 6 : precisao, v);
            EXPECT_EQ(ZVString::DeReal(v, precisao), QString::fromLatin1(esperado))
                << v << " " << precisao;
        }
}

TEST(ZVStringTest, NaturalFormPadsShortDigitRunsOnly) {
    EXPECT_EQ(ZVString::FormaNatural("X2"), "X0000000002");
    EXPECT_EQ(ZVString::FormaNatural("A10B7"), "A0000000010B0000000007");
    EXPECT_EQ(ZVString::FormaNatural("123456789012"), "123456789012");
    EXPECT_EQ(ZVString::FormaNatural("0123456789"), "0123456789");
    EXPECT_EQ(ZVString::FormaNatural(""), "");
}

TEST(ItemRecordTest, FieldAccessDistinguishesEmptyFromAbsent) {
    CEItemLista item;
    item.definirCampo("REGUA", "");
    QString valor = "unchanged";
    EXPECT_TRUE(item.obterCampo("REGUA", valor));
    EXPECT_EQ(valor, "");
    valor = "unchanged";
    EXPECT_FALSE(item.obterCampo("NUMERO", valor));
    EXPECT_EQ(valor, "unchanged");
    EXPECT_FALSE(obterCampo(nullptr, "REGUA", valor));
    EXPECT_EQ(item.valorCampo("NUMERO"), "");
    item.definirCampoInteiro("QTD", -3);
    item.definirCampoReal("LENGTH", 1.25, 1);
    EXPECT_EQ(item.valorCampo("QTD"), "-3");
    EXPECT_EQ(item.valorCampo("LENGTH"), "1.2");
}

TEST(ItemRecordTest, CopiesOverwriteAndSuffixGetsItsUnderscore) {
    CEItemLista origem, destino;
    origem.definirCampo("TAG", "K1");
    origem.definirCampo("LAYER", "ESQ$1$A");
    destino.definirCampo("TAG", "old");
    destino.copiarCampos(origem);
    EXPECT_EQ(destino.valorCampo("TAG"), "K1");
    destino.copiarCamposComSufixo(origem, "FIM");
    EXPECT_EQ(destino.valorCampo("TAG_FIM"), "K1");
    EXPECT_EQ(destino.valorCampo("LAYER_FIM"), "ESQ$1$A");
    EXPECT_FALSE(destino.temCampo("TAG__FIM"));
    CEItemLista semSufixo;
    semSufixo.copiarCamposComSufixo(origem, "");
    EXPECT_EQ(semSufixo.valorCampo("TAG"), "K1");
    EXPECT_EQ(semSufixo.campos.size(), 2);
    const QString nomes = destino.textoCampos();
    EXPECT_EQ(nomes.count(' '), destino.campos.size());
    EXPECT_TRUE(nomes.contains("TAG_FIM "));
    // A second copy under the same suffix replaces what the first put and keeps the rest;
    // names made in any order end up in the item's order.
    CEItemLista outra;
    outra.definirCampo("ZZ_NOVO", "z");
    outra.definirCampo("TAG", "K2");
    outra.definirCampo("AA_NOVO", "a");
    destino.definirCampo("PROPRIO_FIM", "fica");
    destino.copiarCamposComSufixo(outra, "FIM");
    EXPECT_EQ(destino.valorCampo("TAG_FIM"), "K2");
    EXPECT_EQ(destino.valorCampo("LAYER_FIM"), "ESQ$1$A");
    EXPECT_EQ(destino.valorCampo("PROPRIO_FIM"), "fica");
    EXPECT_EQ(destino.valorCampo("ZZ_NOVO_FIM"), "z");
    EXPECT_EQ(destino.valorCampo("AA_NOVO_FIM"), "a");
    const auto& todos = destino.campos.todos();
    EXPECT_TRUE(std::is_sorted(todos.begin(), todos.end(),
                               [](const auto& a, const auto& b) { return a.nome < b.nome; }));
    EXPECT_EQ(destino.campos.size(), 7);
}

// Items of one run keep one copy of each field name; their fields stay as they were.
TEST(ItemRecordTest, ItemsOfARunShareTheirFieldNames) {
    CEItemLista a, b;
    for (CEItemLista* item : {&a, &b}) {
        item->definirCampo(QString("NUMERO") + "_FIM", item == &a ? "1" : "2");
        item->definirCampo(QString("REGUA"), "X1");
        item->partilharNomes();
    }
    EXPECT_EQ(a.valorCampo("NUMERO_FIM"), "1");
    EXPECT_EQ(b.valorCampo("NUMERO_FIM"), "2");
    EXPECT_EQ(b.campos.size(), 2);
    auto nome = [](const CEItemLista& item, const QString& chave) {
        return item.campos.find(chave).key().constData();
    };
    EXPECT_EQ(nome(a, "NUMERO_FIM"), nome(b, "NUMERO_FIM"));
    EXPECT_EQ(nome(a, "REGUA"), nome(b, "REGUA"));
}

// The flat field store: names in any order, overwrites, merges and removals.
TEST(ItemRecordTest, FieldsInAnyOrderAreFoundOverwrittenMergedAndRemoved) {
    CEItemLista item;
    std::vector<int> ordem(500);
    for (int i = 0; i < 500; ++i)
        ordem[size_t(i)] = (i * 7919) % 500;  // a permutation: 7919 is prime
    for (int i : ordem)
        item.definirCampo("F" + QString::number(i), "v" + QString::number(i));
    ASSERT_EQ(item.campos.size(), 500);
    for (int i = 0; i < 500; ++i)
        EXPECT_EQ(item.valorCampo("F" + QString::number(i)), "v" + QString::number(i)) << i;
    item.definirCampo("F250", "novo");
    EXPECT_EQ(item.campos.size(), 500);
    EXPECT_EQ(item.valorCampo("F250"), "novo");

    CEItemLista destino;
    destino.definirCampo("F1", "antigo");
    destino.definirCampo("SO_DESTINO", "fica");
    destino.definirCampo("F499", "antigo");
    destino.copiarCampos(item);
    EXPECT_EQ(destino.campos.size(), 501);
    EXPECT_EQ(destino.valorCampo("F1"), "v1");
    EXPECT_EQ(destino.valorCampo("F499"), "v499");
    EXPECT_EQ(destino.valorCampo("SO_DESTINO"), "fica");
    EXPECT_EQ(destino.valorCampo("F250"), "novo");

    EXPECT_EQ(destino.campos.remove("F3"), 1);
    EXPECT_EQ(destino.campos.remove("F3"), 0);
    EXPECT_EQ(destino.campos.remove("NUNCA_USADO_EM_LUGAR_NENHUM"), 0);
    EXPECT_FALSE(destino.temCampo("F3"));
    EXPECT_TRUE(item.temCampo("F3"));
    EXPECT_EQ(destino.campos.size(), 500);

    // Iteration visits each field once with its own value.
    QSet<QString> vistos;
    for (auto it = destino.campos.constBegin(); it != destino.campos.constEnd(); ++it) {
        const int antes = vistos.size();
        vistos.insert(it.key());
        EXPECT_EQ(vistos.size(), antes + 1) << qPrintable(it.key());
        EXPECT_EQ(it.value(), destino.valorCampo(it.key()));
    }
    EXPECT_EQ(vistos.size(), 500);
    const QStringList nomes = destino.campos.keys(), valores = destino.campos.values();
    ASSERT_EQ(nomes.size(), 500);
    ASSERT_EQ(valores.size(), 500);
    for (int i = 0; i < nomes.size(); ++i)
        EXPECT_EQ(destino.campos[nomes[i]], valores[i]) << qPrintable(nomes[i]);
    EXPECT_EQ(QSet<QString>(nomes.begin(), nomes.end()), vistos);
    const QString* semCopia = destino.campo("SO_DESTINO");
    ASSERT_NE(semCopia, nullptr);
    EXPECT_EQ(*semCopia, "fica");
    EXPECT_EQ(destino.campo("F3"), nullptr);
}

// A batch kept as names in one place and values in another merges as a batch of fields does:
// from the middle of the item's names, past its last one, or not at all when empty.
TEST(ItemRecordTest, ABatchOfNamesAndValuesKeptApartMergesInPlace) {
    std::vector<std::uint32_t> nomes;
    for (const char* nome : {"VISTA_1", "VISTA_2", "VISTA_3", "VISTA_4", "VISTA_5", "VISTA_6"})
        nomes.push_back(CamposItem::numero(nome));
    const QStringList valores{"v1", "v2", "v3", "v4", "v5", "v6"};
    CEItemLista item;
    for (const std::size_t i : {0, 1, 3})
        item.definirCampo(nomes[i], "antes");
    auto junta = [&](std::vector<std::size_t> lugares) {
        std::sort(lugares.begin(), lugares.end(),
                  [&](std::size_t x, std::size_t y) { return nomes[x] < nomes[y]; });
        item.campos.juntarOrdenados(
            lugares.size(), [&](std::size_t j) { return nomes[lugares[j]]; },
            [&](std::size_t j) -> const QString& { return valores[int(lugares[j])]; });
    };
    auto texto = [&] {
        QStringList vistos;
        for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it)
            vistos << it.key() + "=" + it.value();
        vistos.sort();
        return vistos.join(' ');
    };
    junta({1, 2});
    EXPECT_EQ(texto(), "VISTA_1=antes VISTA_2=v2 VISTA_3=v3 VISTA_4=antes");
    junta({});
    EXPECT_EQ(texto(), "VISTA_1=antes VISTA_2=v2 VISTA_3=v3 VISTA_4=antes");
    junta({3, 4, 5});
    EXPECT_EQ(texto(), "VISTA_1=antes VISTA_2=v2 VISTA_3=v3 VISTA_4=v4 VISTA_5=v5 VISTA_6=v6");
    junta({0});
    EXPECT_EQ(item.valorCampo("VISTA_1"), "v1");
    EXPECT_EQ(item.campos.size(), 6);
    for (std::size_t i = 1; i < item.campos.todos().size(); ++i)
        EXPECT_LT(item.campos.todos()[i - 1].nome, item.campos.todos()[i].nome);
}

// Batches merged one after another, some with names all after the item's (appended), some
// among them, some starting at the item's last name, given by copy or handed over: the item
// follows a map in which the batch's values win, in name order.
TEST(ItemRecordTest, BatchesAfterAmongAndOnTheItemsNamesMergeAsAMapWould) {
    std::vector<std::uint32_t> nomes;
    for (int i = 0; i < 40; ++i)
        nomes.push_back(CamposItem::numero(QString("JUNTA_%1").arg(i)));
    std::sort(nomes.begin(), nomes.end());
    std::mt19937 sorteio(3);
    for (int rodada = 0; rodada < 300; ++rodada) {
        CEItemLista item;
        std::map<std::uint32_t, QString> ref;
        const int inicio = int(sorteio() % 10);
        for (int i = 0; i < inicio; ++i) {
            const std::uint32_t nome = nomes[sorteio() % 20];
            item.definirCampo(nome, "i" + QString::number(i));
            ref[nome] = "i" + QString::number(i);
        }
        for (int lote = 0; lote < 4; ++lote) {
            // From the item's last name on, from past it, or from anywhere.
            const std::uint32_t ultimo = ref.empty() ? 0 : ref.rbegin()->first;
            const auto depois = std::upper_bound(nomes.begin(), nomes.end(), ultimo);
            const auto noUltimo = std::lower_bound(nomes.begin(), nomes.end(), ultimo);
            const auto desde = lote % 3 == 0 ? nomes.begin() : lote % 3 == 1 ? depois : noUltimo;
            std::vector<std::uint32_t> escolhidos;
            for (auto it = desde; it != nomes.end(); ++it)
                if (sorteio() % 3 == 0 || it == desde) escolhidos.push_back(*it);
            if (desde == nomes.end()) escolhidos.clear();
            std::vector<QString> valores;
            for (const std::uint32_t nome : escolhidos) {
                valores.push_back(QString("r%1l%2n%3").arg(rodada).arg(lote).arg(nome));
                ref[nome] = valores.back();
            }
            const auto nome = [&](std::size_t j) { return escolhidos[j]; };
            if (rodada % 2)
                item.campos.juntarOrdenados(
                    escolhidos.size(), nome,
                    [&](std::size_t j) -> QString&& { return std::move(valores[j]); });
            else
                item.campos.juntarOrdenados(
                    escolhidos.size(), nome,
                    [&](std::size_t j) -> const QString& { return valores[j]; });
            ASSERT_EQ(item.campos.size(), int(ref.size()));
            auto esperado = ref.begin();
            for (const CamposItem::Campo& campo : item.campos.todos()) {
                EXPECT_EQ(campo.nome, esperado->first);
                EXPECT_EQ(campo.valor, esperado->second);
                ++esperado;
            }
        }
    }
}

// A batch merged into an item: new names go in their place, equal names take the batch's
// value, the item's other fields stay; names with a suffix are the joined names.
TEST(ItemRecordTest, ASortedBatchMergesIntoTheFieldsInPlace) {
    auto numerado = [](const char* nome, const char* valor) {
        return CamposItem::Campo{CamposItem::numero(nome), valor};
    };
    std::vector<CamposItem::Campo> lote{numerado("LOTE_B", "b2"), numerado("LOTE_D", "d2"),
                                        numerado("LOTE_E", "e2"), numerado("LOTE_A", "a2")};
    std::sort(lote.begin(), lote.end(),
              [](const auto& x, const auto& y) { return x.nome < y.nome; });
    CEItemLista item;
    item.definirCampo("LOTE_A", "a1");
    item.definirCampo("LOTE_C", "c1");
    item.definirCampo("LOTE_E", "e1");
    item.definirCampo("LOTE_F", "f1");
    item.campos.juntarOrdenados(lote);
    EXPECT_EQ(item.campos.size(), 6);
    const QStringList esperados{"LOTE_A=a2", "LOTE_B=b2", "LOTE_C=c1",
                                "LOTE_D=d2", "LOTE_E=e2", "LOTE_F=f1"};
    QStringList vistos;
    for (auto it = item.campos.constBegin(); it != item.campos.constEnd(); ++it)
        vistos << it.key() + "=" + it.value();
    vistos.sort();
    EXPECT_EQ(vistos, esperados);
    for (std::size_t i = 1; i < item.campos.todos().size(); ++i)
        EXPECT_LT(item.campos.todos()[i - 1].nome, item.campos.todos()[i].nome);
    // Into an empty item, and a batch of names the item all has.
    CEItemLista vazio;
    vazio.campos.juntarOrdenados(lote);
    EXPECT_EQ(vazio.campos.size(), 4);
    EXPECT_EQ(vazio.valorCampo("LOTE_E"), "e2");
    vazio.campos.juntarOrdenados(item.campos.todos());
    EXPECT_EQ(vazio.campos.size(), 6);
    EXPECT_EQ(vazio.valorCampo("LOTE_C"), "c1");

    const std::uint32_t a = CamposItem::numero("LOTE_A");
    const std::uint32_t fim = CamposItem::numeroComSufixo(a, "_FIM");
    EXPECT_EQ(CamposItem::nome(fim), "LOTE_A_FIM");
    EXPECT_EQ(CamposItem::numeroComSufixo(a, "_FIM"), fim);
    EXPECT_EQ(CamposItem::numero("LOTE_A_FIM"), fim);
    EXPECT_EQ(CamposItem::numeroComSufixo(a, ""), a);
}

// Fields handed over leave the item empty and keep their order and their very texts.
TEST(ItemRecordTest, FieldsHandedOverLeaveNoneBehind) {
    CEItemLista item;
    item.definirCampo("ENTREGA_B", "2");
    item.definirCampo("ENTREGA_A", "1");
    const QString* antes = item.campo("ENTREGA_B");
    const QChar* texto = antes->constData();
    const std::vector<CamposItem::Campo> campos = item.campos.retirar();
    EXPECT_TRUE(item.campos.isEmpty());
    EXPECT_FALSE(item.temCampo("ENTREGA_A"));
    ASSERT_EQ(campos.size(), 2u);
    EXPECT_LT(campos[0].nome, campos[1].nome);
    EXPECT_EQ(CamposItem::nome(campos[0].nome), "ENTREGA_B");
    EXPECT_EQ(campos[0].valor, "2");
    EXPECT_EQ(campos[1].valor, "1");
    // Moved, not copied: the value is the same text in memory.
    EXPECT_EQ(campos[0].valor.constData(), texto);
    // The item takes new fields afterwards as a new one would.
    item.definirCampo("ENTREGA_A", "3");
    EXPECT_EQ(item.campos.size(), 1);
    EXPECT_EQ(item.valorCampo("ENTREGA_A"), "3");
}

// An array handed back comes empty, whatever it held, and the item fills it again.
TEST(ItemRecordTest, AnArrayHandedBackComesEmptyAndKeepsItsRoom) {
    CEItemLista item;
    for (const char* nome : {"VOLTA_A", "VOLTA_B", "VOLTA_C"})
        item.definirCampo(nome, "x");
    std::vector<CamposItem::Campo> campos = item.campos.retirar();
    const std::size_t lugar = campos.capacity();
    item.campos.reaproveitar(std::move(campos));
    EXPECT_TRUE(item.campos.isEmpty());
    EXPECT_FALSE(item.temCampo("VOLTA_B"));
    item.definirCampo("VOLTA_C", "1");
    EXPECT_EQ(item.campos.size(), 1);
    EXPECT_EQ(item.valorCampo("VOLTA_C"), "1");
    // The room is the array's own: taken out again, it has at least what it had.
    EXPECT_GE(item.campos.retirar().capacity(), lugar);
}

// Compacted with room for more, an item keeps its fields and takes that many more in place.
TEST(ItemRecordTest, AnArrayCompactedWithRoomTakesThatManyMoreWithoutMoving) {
    CEItemLista item;
    for (const char* nome : {"FOLGA_C", "FOLGA_A", "FOLGA_E"})
        item.definirCampo(nome, nome);
    item.campos.compactar(2);
    EXPECT_EQ(item.campos.size(), 3);
    EXPECT_EQ(item.valorCampo("FOLGA_A"), "FOLGA_A");
    EXPECT_EQ(item.valorCampo("FOLGA_E"), "FOLGA_E");
    const CamposItem::Campo* antes = item.campos.todos().data();
    item.definirCampo("FOLGA_B", "b");
    item.definirCampo("FOLGA_D", "d");
    EXPECT_EQ(item.campos.todos().data(), antes);
    EXPECT_EQ(item.campos.keys(),
              QStringList({"FOLGA_C", "FOLGA_A", "FOLGA_E", "FOLGA_B", "FOLGA_D"}));
    // None left: the next field moves the array.
    EXPECT_EQ(item.campos.todos().capacity(), 5u);
    item.campos.compactar(0);
    EXPECT_EQ(item.campos.todos().capacity(), 5u);
}

// Fields every read of an item gives, in one list: names and values in order, and each
// looked up by name and by number.
QStringList Leitura(const CamposItem& campos) {
    QStringList texto;
    for (auto it = campos.constBegin(); it != campos.constEnd(); ++it) {
        const QString* porNumero = campos.procura(CamposItem::numero(it.key()));
        texto << it.key() + "=" + it.value() + "|" + campos.value(it.key()) + "|" +
                     (porNumero ? *porNumero : "-") + "|" + *campos.find(it.key());
    }
    EXPECT_EQ(texto.size(), campos.size());
    EXPECT_EQ(campos.todos().size(), std::size_t(campos.size()));
    EXPECT_EQ(campos.keys().size(), campos.size());
    EXPECT_EQ(campos.values().size(), campos.size());
    return texto;
}

// Shared fields read as the item's own did; a change of any kind copies them into that item
// alone, and the items still sharing see nothing of it.
TEST(ItemRecordTest, SharedFieldsReadAsOwnOnesAndAChangeCopiesThemForThatItemAlone) {
    CEItemLista origem;
    for (const char* nome : {"PART_C", "PART_A", "PART_E", "PART_B"})
        origem.definirCampo(nome, QString(nome).toLower());
    const QStringList antes = Leitura(origem.campos);
    const QStringList nomes = origem.campos.keys();
    CamposItem unidade = origem.campos;
    unidade.partilhar();
    EXPECT_TRUE(unidade.partilhado());
    EXPECT_EQ(Leitura(unidade), antes);
    EXPECT_EQ(unidade.keys(), nomes);
    EXPECT_FALSE(unidade.contains("PART_D"));
    EXPECT_EQ(unidade.remove("PART_D"), 0);
    unidade.compactar();
    unidade.compactar(3);
    EXPECT_TRUE(unidade.partilhado());

    // One way of changing the fields each: they all leave the other copies as they were.
    using Mudanca = std::function<void(CamposItem&)>;
    const std::vector<std::pair<const char*, Mudanca>> mudancas = {
        {"insert", [](CamposItem& c) { c.insert("PART_D", "d"); }},
        {"insert over", [](CamposItem& c) { c.insert("PART_A", "novo"); }},
        {"remove", [](CamposItem& c) { c.remove("PART_E"); }},
        {"juntar",
         [](CamposItem& c) {
             CamposItem outro;
             outro.insert("PART_A", "junto");
             outro.insert("PART_F", "f");
             c.juntar(outro);
         }},
        {"reter", [](CamposItem& c) { c.reter([](std::uint32_t n) { return n % 2 == 0; }); }},
        {"reservar", [](CamposItem& c) { c.reservar(20); }},
        {"clear", [](CamposItem& c) { c.clear(); }},
        {"retirar", [](CamposItem& c) { EXPECT_EQ(c.retirar().size(), 4u); }},
    };
    for (const auto& [nome, muda] : mudancas) {
        CamposItem copia = unidade, irma = unidade;
        ASSERT_TRUE(copia.partilhaCom(unidade));
        // What the change gives on fields that were never shared.
        CamposItem propria = origem.campos;
        muda(propria);
        muda(copia);
        EXPECT_FALSE(copia.partilhaCom(unidade)) << nome;
        EXPECT_EQ(Leitura(copia), Leitura(propria)) << nome;
        EXPECT_TRUE(irma.partilhaCom(unidade)) << nome;
        EXPECT_EQ(Leitura(irma), antes) << nome;
        EXPECT_EQ(Leitura(unidade), antes) << nome;
    }
    // Copied with the room asked for: the next fields go in without moving them.
    CamposItem copia = unidade;
    copia.reservar(6);
    const CamposItem::Campo* lugar = copia.todos().data();
    copia.insert("PART_D", "d");
    copia.insert("PART_F", "f");
    EXPECT_EQ(copia.todos().data(), lugar);
}

// Asking for a name no item ever had does not add it to the program's name table.
TEST(ItemRecordTest, LookingUpAnUnknownNameLeavesTheNameTableAlone) {
    CEItemLista item;
    item.definirCampo("CONHECIDO", "1");
    const std::uint32_t antes = CamposItem::numero("CONHECIDO");
    EXPECT_FALSE(item.temCampo("JAMAIS_DEFINIDO_7F3A"));
    EXPECT_TRUE(item.valorCampo("JAMAIS_DEFINIDO_7F3A").isNull());
    EXPECT_EQ(item.campos.find("JAMAIS_DEFINIDO_7F3A"), item.campos.constEnd());
    // A new name gets the next number: the unknown one above took none.
    const std::uint32_t novo = CamposItem::numero("OUTRO_NOME_NOVO_7F3A");
    EXPECT_GT(novo, antes);
    EXPECT_EQ(CamposItem::nome(novo), "OUTRO_NOME_NOVO_7F3A");
    EXPECT_EQ(CamposItem::numero("JAMAIS_DEFINIDO_7F3A"), novo + 1);
}

TEST(OrderingTest, NumbersSortNaturallyAndLeadingZerosTieOnRawText) {
    Itens itens;
    VetorItens v{itens.novo({{"N", "10"}}), itens.novo({{"N", "2"}}), itens.novo({{"N", "1"}}),
                 itens.novo({{"N", "01"}}), itens.novo({{"N", "X"}})};
    v.ordenar({"N"});
    EXPECT_EQ(Valores(v, "N"), QStringList({"01", "1", "2", "10", "X"}));
}

TEST(OrderingTest, LongDigitRunsSortByTheirCodeUnits) {
    Itens itens;
    // Twelve digits stay unpadded: "9" padded to "0000000009" sorts before them, and the
    // two long runs compare as text.
    VetorItens v{itens.novo({{"N", "200000000000"}}), itens.novo({{"N", "9"}}),
                 itens.novo({{"N", "100000000000"}})};
    v.ordenar({"N"});
    EXPECT_EQ(Valores(v, "N"), QStringList({"9", "100000000000", "200000000000"}));
}

TEST(OrderingTest, LaterKeysDecideOnlyTiesAndAbsentFieldsAreEmpty) {
    Itens itens;
    VetorItens v{itens.novo({{"R", "X2"}, {"N", "1"}}), itens.novo({{"R", "X10"}, {"N", "1"}}),
                 itens.novo({{"R", "X2"}, {"N", "0"}}), itens.novo({{"N", "5"}})};
    v.ordenar({"R", "N"});
    EXPECT_EQ(Valores(v, "R"), QStringList({"", "X2", "X2", "X10"}));
    EXPECT_EQ(Valores(v, "N"), QStringList({"5", "0", "1", "1"}));
    // A field that neither item has does not decide.
    EXPECT_EQ(VetorItens::compararItens(v[1], v[1], {"MISSING"}), 0);
    EXPECT_LT(VetorItens::compararItens(v[1], v[2], {"MISSING", "N"}), 0);
}

TEST(OrderingTest, CaseAndCodeUnitsDecideBeforeAnythingElse) {
    Itens itens;
    VetorItens v{itens.novo({{"T", "b"}}), itens.novo({{"T", "B"}}), itens.novo({{"T", "a"}}),
                 itens.novo({{"T", QString::fromUtf8("Á").toUtf8().constData()}})};
    v.ordenar({"T"});
    EXPECT_EQ(Valores(v, "T"), QStringList({"B", "a", "b", QString::fromUtf8("Á")}));
}

TEST(OrderingTest, TiedItemsEndUpWhereAnItemByItemComparisonSortPutsThem) {
    // The order of items whose keys tie is part of the lists' output: it must be the order
    // a sort comparing the items field by field gives, ties included. Enough items that the
    // sort partitions instead of inserting, with few distinct texts so that most tie.
    Itens itens;
    VetorItens v;
    const char* grupos[] = {"X2", "X10", "x2", "", "01", "1", "B"};
    const char* numeros[] = {"3", "03", "10", "2", "A1", "A01"};
    std::uint32_t semente = 7;
    auto sorteio = [&semente](std::uint32_t limite) {
        semente = semente * 1103515245u + 12345u;
        return (semente >> 16) % limite;
    };
    for (int i = 0; i < 400; ++i) {
        CEItemLista* item = itens.novo({{"ID", ""}});
        item->definirCampoInteiro("ID", i);
        if (sorteio(9) != 0) item->definirCampo("G", grupos[sorteio(7)]);
        item->definirCampo("N", numeros[sorteio(6)]);
        v.push_back(item);
    }
    const QStringList campos = {"G", "N"};
    VetorItens esperado = v;
    std::sort(esperado.begin(), esperado.end(), [&](const CEItemLista* a, const CEItemLista* b) {
        return VetorItens::compararItens(a, b, campos) < 0;
    });
    v.ordenar(campos);
    EXPECT_EQ(Valores(v, "ID"), Valores(esperado, "ID"));
    // Many items tie, and some of the tied ones leave their first order: the sort is not
    // stable, so the comparison above did test the order of ties.
    int empates = 0, trocados = 0;
    for (size_t i = 0; i + 1 < v.size(); ++i)
        if (VetorItens::compararItens(v[i], v[i + 1], campos) == 0) {
            ++empates;
            if (v[i]->valorCampo("ID").toInt() > v[i + 1]->valorCampo("ID").toInt()) ++trocados;
        }
    EXPECT_GT(empates, 300);
    EXPECT_GT(trocados, 0);
}

TEST(OrderingTest, ManyDistinctTextsSortAsTheirComparisonDoes) {
    // Thousands of distinct texts, with digit runs short and long, leading zeros and texts
    // that differ only there, many appearing more than once and some fields absent: the
    // order must still be the one a field-by-field comparison gives.
    Itens itens;
    VetorItens v;
    std::uint32_t semente = 5;
    auto sorteio = [&semente](std::uint32_t limite) {
        semente = semente * 1103515245u + 12345u;
        return (semente >> 16) % limite;
    };
    auto texto = [&sorteio]() {
        QString t;
        for (std::uint32_t partes = 1 + sorteio(4); partes > 0; --partes) {
            if (sorteio(2)) {
                t += QChar(u"AaBx-:"[sorteio(6)]);
            } else {
                if (sorteio(5) == 0) t += '0';
                t += QString::number(sorteio(3) == 0 ? 100000000000ull + sorteio(50) : sorteio(40));
            }
        }
        return t;
    };
    for (int i = 0; i < 3000; ++i) {
        CEItemLista* item = itens.novo({{"ID", ""}});
        item->definirCampoInteiro("ID", i);
        item->definirCampo("A", texto());
        if (sorteio(7) != 0) item->definirCampo("B", texto());
        v.push_back(item);
    }
    const QStringList campos = {"B", "A"};
    QSet<QString> distintos;
    for (const CEItemLista* item : v)
        distintos.insert(item->valorCampo("A"));
    EXPECT_GT(distintos.size(), 1000);
    EXPECT_LT(distintos.size(), 3000);
    VetorItens esperado = v;
    std::sort(esperado.begin(), esperado.end(), [&](const CEItemLista* a, const CEItemLista* b) {
        return VetorItens::compararItens(a, b, campos) < 0;
    });
    VetorItens estavel = v;
    std::stable_sort(estavel.begin(), estavel.end(),
                     [&](const CEItemLista* a, const CEItemLista* b) {
                         return VetorItens::compararItens(a, b, campos) < 0;
                     });
    VetorItens ordenado = v;
    ordenado.ordenar(campos);
    EXPECT_EQ(Valores(ordenado, "ID"), Valores(esperado, "ID"));
    v.ordenarEstavel(campos);
    EXPECT_EQ(Valores(v, "ID"), Valores(estavel, "ID"));
}

TEST(OrderingTest, TextsAlikeForLongOrBeyondLatinSortAsTheirComparisonDoes) {
    // Texts that differ only far into their natural forms, by a unit from 0xFF on, by an
    // embedded null or by ending early, each unit class beside the digits: every pair must
    // come out as the field-by-field comparison orders it.
    const QString inicio = "X12:34-";
    const QChar unidades[] = {QChar(0),     QChar('/'),   QChar('0'),    QChar('9'),
                              QChar(':'),   QChar('A'),   QChar(0xFE),   QChar(0xFF),
                              QChar(0x100), QChar(0x3A9), QChar(0xFFFF), QChar('a')};
    Itens itens;
    VetorItens v;
    int id = 0;
    for (const QString& base : QStringList{QString(), inicio, inicio + inicio, inicio + "777777"}) {
        for (const QChar a : unidades) {
            for (const QChar b : unidades) {
                CEItemLista* item = itens.novo({{"ID", ""}});
                item->definirCampoInteiro("ID", id++);
                item->definirCampo("T", base + a + b);
                v.push_back(item);
            }
            CEItemLista* item = itens.novo({{"ID", ""}});
            item->definirCampoInteiro("ID", id++);
            item->definirCampo("T", base + a);
            v.push_back(item);
        }
    }
    std::reverse(v.begin(), v.end());
    VetorItens esperado = v;
    std::stable_sort(esperado.begin(), esperado.end(),
                     [](const CEItemLista* a, const CEItemLista* b) {
                         return VetorItens::compararItens(a, b, {"T"}) < 0;
                     });
    v.ordenarEstavel({"T"});
    EXPECT_EQ(Valores(v, "T"), Valores(esperado, "T"));
    EXPECT_EQ(Valores(v, "ID"), Valores(esperado, "ID"));
}

TEST(OrderingTest, AStableSortKeepsTiedItemsInTheirFirstOrder) {
    // Enough items that an unstable sort would move ties (the test above shows it does).
    Itens itens;
    VetorItens v;
    const char* grupos[] = {"X2", "X10", "", "1", "01"};
    std::uint32_t semente = 11;
    for (int i = 0; i < 400; ++i) {
        semente = semente * 1103515245u + 12345u;
        CEItemLista* item = itens.novo({{"ID", ""}});
        item->definirCampoInteiro("ID", i);
        item->definirCampo("G", grupos[(semente >> 16) % 5]);
        v.push_back(item);
    }
    VetorItens esperado = v;
    std::stable_sort(esperado.begin(), esperado.end(),
                     [](const CEItemLista* a, const CEItemLista* b) {
                         return VetorItens::compararItens(a, b, {"G"}) < 0;
                     });
    v.ordenarEstavel({"G"});
    EXPECT_EQ(Valores(v, "ID"), Valores(esperado, "ID"));
    // Sorting again changes nothing.
    v.ordenarEstavel({"G"});
    EXPECT_EQ(Valores(v, "ID"), Valores(esperado, "ID"));
}

TEST(VectorTest, MergeKeepsPointersOnceInOrder) {
    Itens itens;
    CEItemLista* a = itens.novo({{"N", "a"}});
    CEItemLista* b = itens.novo({{"N", "b"}});
    CEItemLista* c = itens.novo({{"N", "a"}});  // same content as a, another item
    VetorItens destino{a};
    VetorItens origem{b, a, c, b};
    destino.juntarSemRepetir(origem);
    EXPECT_EQ(destino, VetorItens({a, b, c}));
    destino.juntarSemRepetir(origem);
    EXPECT_EQ(destino, VetorItens({a, b, c}));
    // A batch with nothing in common goes in whole and in its order; one repeat among many
    // is still dropped.
    CEItemLista* d = itens.novo({{"N", "d"}});
    CEItemLista* e = itens.novo({{"N", "e"}});
    destino.juntarSemRepetir(VetorItens{e, d});
    EXPECT_EQ(destino, VetorItens({a, b, c, e, d}));
    CEItemLista* f = itens.novo({{"N", "f"}});
    destino.juntarSemRepetir(VetorItens{f, c});
    EXPECT_EQ(destino, VetorItens({a, b, c, e, d, f}));
    VetorItens repetidoAqui{a, a};
    repetidoAqui.juntarSemRepetir(VetorItens{f});
    EXPECT_EQ(repetidoAqui, VetorItens({a, a, f}));
}

TEST(VectorTest, InsertRemoveReverse) {
    Itens itens;
    CEItemLista* a = itens.novo({});
    CEItemLista* b = itens.novo({});
    CEItemLista* c = itens.novo({});
    CEItemLista* d = itens.novo({});
    VetorItens v{a, d};
    v.inserirVariosEm(VetorItens{b, c}, 1);
    EXPECT_EQ(v, VetorItens({a, c, b, d}));
    v.removerEm(1);
    EXPECT_EQ(v, VetorItens({a, b, d}));
    v.removerEm(9);
    EXPECT_EQ(v.size(), 3u);
    v.inserirEm(c, 0);
    EXPECT_EQ(v, VetorItens({c, a, b, d}));
    v.inverter();
    EXPECT_EQ(v, VetorItens({d, b, a, c}));
}

TEST(VectorTest, FilterSharesItemsAndKeepsOrder) {
    Itens itens;
    CEItemLista* x1a = itens.novo({{"REGUA", "X1"}, {"LADO", "A"}});
    CEItemLista* x2 = itens.novo({{"REGUA", "X2"}, {"LADO", "A"}});
    CEItemLista* x1b = itens.novo({{"REGUA", "X1"}, {"LADO", "B"}});
    CEItemLista* x1a2 = itens.novo({{"REGUA", "X1"}, {"LADO", "A"}});
    VetorItens v{x1a, nullptr, x2, x1b, x1a2};
    EXPECT_EQ(v.filtrar({{"REGUA", "X1"}}), VetorItens({x1a, x1b, x1a2}));
    EXPECT_EQ(v.filtrar({{"REGUA", "X1"}, {"LADO", "A"}}), VetorItens({x1a, x1a2}));
    EXPECT_TRUE(v.filtrar({{"REGUA", "X9"}}).empty());
}

}  // namespace

// Names and suffixes are found by the texts asked with, whatever became of texts asked with
// before: a text changed after a look-up, a text freed and another made in its place.
TEST(ItemRecordTest, NamesAndSuffixesAreFoundByTheTextsAskedWithNow) {
    CEItemLista item;
    item.definirCampo("PRIMEIRO_LOOKUP", "1");
    item.definirCampo("SEGUNDO_LOOKUP", "2");
    QString nome = QStringLiteral("PRIMEIRO_LOOKUP");
    nome.detach();
    EXPECT_EQ(item.valorCampo(nome), "1");
    nome.replace(0, 8, "SEGUNDO_");  // same length, written in place when not shared
    nome.chop(0);
    ASSERT_EQ(nome, "SEGUNDO__LOOKUP");
    EXPECT_FALSE(item.temCampo(nome));
    nome = QStringLiteral("SEGUNDO_LOOKUP");
    EXPECT_EQ(item.valorCampo(nome), "2");
    // Texts made and freed one after another, each asked once.
    for (int i = 0; i < 200; ++i) {
        QString texto = QString(i % 2 ? "PRIMEIRO" : "SEGUNDO") + "_LOOKUP";
        EXPECT_EQ(item.valorCampo(texto), i % 2 ? "1" : "2") << i;
        QString ausente = "AUSENTE_LOOKUP_" + QString::number(i);
        EXPECT_FALSE(item.temCampo(ausente));
    }
    // A suffix changed after it was used names other fields.
    const std::uint32_t base = CamposItem::numero(QStringLiteral("BASE_LOOKUP"));
    QString sufixo = QStringLiteral("_AA");
    sufixo.detach();
    EXPECT_EQ(CamposItem::nome(CamposItem::numeroComSufixo(base, sufixo)), "BASE_LOOKUP_AA");
    sufixo[1] = QLatin1Char('B');
    EXPECT_EQ(CamposItem::nome(CamposItem::numeroComSufixo(base, sufixo)), "BASE_LOOKUP_BA");
    for (int i = 0; i < 100; ++i) {
        const QString outro = "_" + QString::number(i);
        EXPECT_EQ(CamposItem::nome(CamposItem::numeroComSufixo(base, outro)),
                  "BASE_LOOKUP" + outro);
    }
    // A name absent when first asked is found once some item has it.
    const QString tardio = QStringLiteral("TARDIO_LOOKUP");
    EXPECT_FALSE(item.temCampo(tardio));
    item.definirCampo(tardio, "3");
    EXPECT_EQ(item.valorCampo(tardio), "3");
}
