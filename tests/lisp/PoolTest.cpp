// The small-object pool gives back the chunks a dead large list took, and only those.
#include "lisp/Value.h"

#include <gtest/gtest.h>

#include <thread>
#include <vector>

namespace {

using zvlisp::Value;

struct Medida {
    std::size_t antes = 0, cheio = 0, soltos = 0, depois = 0, segundaVez = 0;
    bool vivosIntactos = false;
    bool novosServem = false;
};

// Runs on a thread of its own: the pool is per thread, so it starts empty.
Medida Mede() {
    Medida m;
    m.antes = zvlisp::poolChunks();
    std::vector<Value> vivos;
    {
        zvlisp::ListBuilder lista;
        for (int i = 0; i < 200000; ++i) {
            lista.add(Value::string(QString::number(i)));
            // One object in 20,000 outlives the list: its chunk must stay.
            if (i % 20000 == 0) vivos.push_back(Value::string("vivo " + QString::number(i)));
        }
        const Value tudo = lista.take();
        m.cheio = zvlisp::poolChunks();
    }
    m.soltos = zvlisp::trimPool();
    m.depois = zvlisp::poolChunks();
    m.segundaVez = zvlisp::trimPool();
    m.vivosIntactos = true;
    for (std::size_t k = 0; k < vivos.size(); ++k)
        m.vivosIntactos =
            m.vivosIntactos && vivos[k].asString() == "vivo " + QString::number(int(k) * 20000);
    zvlisp::ListBuilder outra;
    for (int i = 0; i < 50000; ++i)
        outra.add(Value::integer(i));
    Value nova = outra.take();
    int soma = 0, contagem = 0;
    for (Value v = nova; !v.isNil(); v = v.asCons()->cdr) {
        soma += v.asCons()->car.asInt() % 7;
        ++contagem;
    }
    int esperada = 0;
    for (int i = 0; i < 50000; ++i)
        esperada += i % 7;
    m.novosServem = contagem == 50000 && soma == esperada;
    return m;
}

TEST(LispPoolTest, ADeadLargeListGivesItsChunksBackAndLiveObjectsStay) {
    Medida m;
    std::thread t([&] { m = Mede(); });
    t.join();
    // 200,000 strings and as many cells: hundreds of chunks.
    EXPECT_GT(m.cheio, m.antes + 300);
    EXPECT_GT(m.soltos, 300u);
    EXPECT_EQ(m.depois, m.cheio - m.soltos);
    // The chunks of the few live objects stay; nothing more is released on a second look.
    EXPECT_GE(m.depois, 1u);
    EXPECT_LE(m.depois, m.antes + 40);
    EXPECT_EQ(m.segundaVez, 0u);
    EXPECT_TRUE(m.vivosIntactos);
    EXPECT_TRUE(m.novosServem);
}

// A small pool is not walked at all: the look costs nothing on the hot path.
TEST(LispPoolTest, ASmallPoolIsLeftAlone) {
    std::size_t soltos = 1;
    std::thread t([&] {
        {
            zvlisp::ListBuilder lista;
            for (int i = 0; i < 1000; ++i)
                lista.add(Value::integer(i));
            const Value tudo = lista.take();
        }
        soltos = zvlisp::trimPool();
    });
    t.join();
    EXPECT_EQ(soltos, 0u);
}

}  // namespace
