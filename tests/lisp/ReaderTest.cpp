// The reader: numbers, symbols, strings and their escapes, comments, dotted pairs, and the
// errors of malformed text with their line.
#include "LispFixture.h"
#include "lisp/Reader.h"

using ReaderTest = LispFixture;

TEST_F(ReaderTest, SymbolsIgnoreCaseAndPrintUpperCase) {
    EXPECT_EQ(ev("'abc"), "ABC");
    EXPECT_EQ(ev("(eq 'Foo 'fOO)"), "T");
    EXPECT_EQ(ev("(setq MiXeD 5) mixed"), "5");
    EXPECT_EQ(ev("'(a nil t)"), "(A nil T)");
}

TEST_F(ReaderTest, IntegersAre32BitAndLargerLiteralsReadAsReals) {
    EXPECT_EQ(ev("2147483647"), "2147483647");
    EXPECT_EQ(ev("-2147483648"), "-2147483648");
    EXPECT_EQ(ev("(type 2147483648)"), "REAL");
    EXPECT_EQ(ev("(+ 2147483647 1)"), "-2147483648");
    EXPECT_EQ(ev("(* 65536 65536)"), "0");
    EXPECT_EQ(ev("(type 1.)"), "REAL");
    EXPECT_EQ(ev("1e3"), "1000.0");
    EXPECT_EQ(ev("-.5"), "-0.5");
    EXPECT_EQ(ev("(type '1+)"), "SYM");
    EXPECT_EQ(ev("(type '-)"), "SYM");
}

TEST_F(ReaderTest, StringEscapes) {
    EXPECT_EQ(ev("(strlen \"a\\\\b\")"), "3");
    EXPECT_EQ(ev("(ascii \"\\\"\")"), "34");
    EXPECT_EQ(ev("(vl-string->list \"\\n\\r\\t\\e\")"), "(10 13 9 27)");
    EXPECT_EQ(ev("(ascii \"\\101\")"), "65");
    EXPECT_EQ(ev("(strlen \"\\0123\")"), "2");  // octal takes three digits at most
    EXPECT_EQ(ev("\"tab\\there\""), "\"tab\\there\"");
    EXPECT_EQ(ev("(ascii \"ção\")"), "231");
}

TEST_F(ReaderTest, CommentsAndDottedPairs) {
    EXPECT_EQ(ev("; a comment\n(+ 1 ;| block\n comment |; 2)"), "3");
    EXPECT_EQ(ev("'(a . b)"), "(A . B)");
    EXPECT_EQ(ev("'(1 2 . 3)"), "(1 2 . 3)");
    EXPECT_EQ(ev("'(1 . (2 3))"), "(1 2 3)");
    EXPECT_EQ(ev("(cdr '(\"K\" . \"V\"))"), "\"V\"");
}

TEST_F(ReaderTest, MalformedTextFailsWithItsLine) {
    EXPECT_EQ(ev("(+ 1 2"), "ERROR: malformed list on input");
    EXPECT_EQ(ev("\"open"), "ERROR: malformed string on input");
    EXPECT_EQ(ev(")"), "ERROR: extra right paren on input");
    EXPECT_EQ(ev("'( . a)"), "ERROR: misplaced dot on input");
    zvlisp::Reader reader(lisp.symbols(), "(a)\n\n(b\n", "x.lsp");
    zvlisp::Value form;
    ASSERT_TRUE(reader.next(form));
    EXPECT_EQ(reader.formLine(), 1);
    try {
        reader.next(form);
        FAIL() << "no error";
    } catch (const zvlisp::LispError& error) {
        EXPECT_EQ(error.file, "x.lsp");
        EXPECT_EQ(error.line, 4);
        EXPECT_TRUE(reader.incomplete());
    }
}

TEST_F(ReaderTest, DeepNestingIsAnErrorNotACrash) {
    const QString deep = QString(5000, '(') + QString(5000, ')');
    EXPECT_EQ(ev(deep), "ERROR: nesting too deep on input");
}
