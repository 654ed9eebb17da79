// The module reads and sets LISP symbols by name, again and again: whichever way a name is
// found (asked a moment ago, remembered, or new), it is always its own symbol.
#include "app/DocumentLisp.h"
#include "sdk/ResultBuffer.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

int valueOf(zvhost::DocumentLisp& lisp, const QString& name) {
    zvsdk::ResultBuffer first;
    if (lisp.lispGetSymbolFirst(name, first) != zvsdk::RTNORM) return -1;
    return first.restype == zvsdk::RTSHORT ? first.rint : -2;
}

void set(zvhost::DocumentLisp& lisp, const QString& name, short value) {
    std::unique_ptr<zvsdk::ResultBuffer, void (*)(zvsdk::ResultBuffer*)> node(
        zvsdk::newShort(value), zvsdk::releaseChain);
    ASSERT_EQ(lisp.lispPutSymbol(name, node.get()), zvsdk::RTNORM);
}

TEST(DocumentLispSymbols, NamesOfOneLengthAskedInTurnEachFindTheirOwnSymbol) {
    zvhost::DocumentLisp lisp([](const QString&) {});
    // more names of one length than are kept at hand, in a text made anew at each ask
    const QStringList names = {"ab1", "ab2", "ab3", "ab4", "ab5", "ab6", "ba1"};
    for (int i = 0; i < names.size(); ++i)
        set(lisp, names[i], short(i + 1));
    for (int round = 0; round < 3; ++round) {
        for (int i = 0; i < names.size(); ++i)
            EXPECT_EQ(valueOf(lisp, QString(names[i].constData(), names[i].size())), i + 1)
                << names[i].toStdString();
        for (int i = int(names.size()) - 1; i >= 0; --i)
            EXPECT_EQ(valueOf(lisp, names[i]), i + 1) << names[i].toStdString();
    }
    // set again after being asked: the new value is read
    set(lisp, "ab2", 20);
    EXPECT_EQ(valueOf(lisp, "ab2"), 20);
    EXPECT_EQ(valueOf(lisp, "ab1"), 1);
    EXPECT_EQ(valueOf(lisp, "ab"), -1);
    EXPECT_EQ(valueOf(lisp, "ab22"), -1);
    EXPECT_EQ(valueOf(lisp, ""), -1);
    // names made up by the hundred push the remembered ones out; they are found again
    for (int i = 0; i < 600; ++i)
        set(lisp, "made" + QString::number(i), short(i));
    EXPECT_EQ(valueOf(lisp, "made7"), 7);
    EXPECT_EQ(valueOf(lisp, "ab2"), 20);
    EXPECT_EQ(valueOf(lisp, "ba1"), 7);
    EXPECT_EQ(valueOf(lisp, "made599"), 599);
    EXPECT_EQ(lisp.interpreter().evalText("(+ ab1 ba1)").asInt(), 8);
}

}  // namespace
