// Random and mutated text through the reader and the evaluator: every run ends, with a
// value or a reported error, and the interpreter keeps working afterwards.
#include "LispFixture.h"
#include "LispFuzzing.h"

#include <QFile>

#include <pthread.h>

#include <random>

TEST(RobustnessTest, RandomAndMutatedProgramsNeverCrash) {
    QFile seedFile(ZV_TEST_DIR "/data/utilities.lsp");
    ASSERT_TRUE(seedFile.open(QIODevice::ReadOnly));
    const QString seed = QString::fromUtf8(seedFile.readAll());
    std::mt19937 random(20261122);
    int failures = 0, successes = 0;
    for (int round = 0; round < 4000; ++round) {
        const QString text =
            round % 2 ? LispFuzzing::randomProgram(random) : LispFuzzing::mutate(seed, random);
        LispFuzzing::Result result = LispFuzzing::run(text.toUtf8());
        ASSERT_TRUE(result.stillWorks) << text.toStdString();
        (result.ok ? successes : failures)++;
    }
    // Both outcomes happen: the generator exercises real evaluation, not only errors.
    EXPECT_GT(successes, 100);
    EXPECT_GT(failures, 100);
}

TEST(RobustnessTest, ArbitraryBytesAreReadOrRejected) {
    std::mt19937 random(7);
    std::uniform_int_distribution<int> byte(0, 255), length(0, 200);
    for (int round = 0; round < 2000; ++round) {
        QByteArray bytes;
        for (int i = length(random); i > 0; --i)
            bytes += char(byte(random));
        ASSERT_TRUE(LispFuzzing::run(bytes).stillWorks);
    }
}

namespace {
void* deepRecursion(void* result) {
    zvlisp::Interpreter lisp;
    lisp.evaluate("(defun down (n) (cons n (down (1+ n))))");
    const bool failed = !lisp.evaluate("(down 0)");
    zvlisp::Value sum;
    *static_cast<bool*>(result) = failed && lisp.evaluate("(+ 1 2)", &sum) && sum.asInt() == 3;
    return nullptr;
}
}  // namespace

TEST(RobustnessTest, RecursionStopsBeforeASmallThreadStackRunsOut) {
    pthread_attr_t attr;
    pthread_attr_init(&attr);
    pthread_attr_setstacksize(&attr, 2 << 20);
    bool stoppedCleanly = false;
    pthread_t thread;
    ASSERT_EQ(pthread_create(&thread, &attr, deepRecursion, &stoppedCleanly), 0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attr);
    EXPECT_TRUE(stoppedCleanly);
}
