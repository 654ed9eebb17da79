// Users' own helper routines (tests/lisp/data/utilities.lsp) running as they would in
// their files: string split and join, replace-all, flatten, CSV line parsing.
#include "LispFixture.h"

namespace {

class UtilitiesTest : public LispFixture {
protected:
    UtilitiesTest() { EXPECT_EQ(ev("(load \"" ZV_TEST_DIR "/data/utilities.lsp\")"), "ALIST-GET"); }
};

}  // namespace

TEST_F(UtilitiesTest, SplitAndJoin) {
    EXPECT_EQ(ev("(str-split \"X1:12:A\" \":\")"), "(\"X1\" \"12\" \"A\")");
    EXPECT_EQ(ev("(str-split \"a,,b,\" \",\")"), "(\"a\" \"\" \"b\" \"\")");
    EXPECT_EQ(ev("(str-split \"a--b\" \"--\")"), "(\"a\" \"b\")");
    EXPECT_EQ(ev("(str-split \"plain\" \";\")"), "(\"plain\")");
    EXPECT_EQ(ev("(str-join '(\"a\" \"b\" \"c\") \", \")"), "\"a, b, c\"");
    EXPECT_EQ(ev("(str-join nil \",\")"), "\"\"");
    EXPECT_EQ(ev("(str-join (str-split \"1;2;3\" \";\") \";\")"), "\"1;2;3\"");
    EXPECT_EQ(ev("(str-replace-all \"ab\" \"a\" \"banana\")"), "\"babnabnab\"");
}

TEST_F(UtilitiesTest, Flatten) {
    EXPECT_EQ(ev("(flatten '(1 (2 (3 4)) ((5)) 6))"), "(1 2 3 4 5 6)");
    EXPECT_EQ(ev("(flatten '((\"K\" . \"V\") (\"A\" . \"B\")))"), "(\"K\" \"V\" \"A\" \"B\")");
    EXPECT_EQ(ev("(flatten nil)"), "nil");
}

TEST_F(UtilitiesTest, CsvLines) {
    EXPECT_EQ(ev("(csv-parse-line \"a,b,c\")"), "(\"a\" \"b\" \"c\")");
    EXPECT_EQ(ev("(csv-parse-line \"\\\"x, y\\\",2,\\\"say \\\"\\\"hi\\\"\\\"\\\"\")"),
              "(\"x, y\" \"2\" \"say \\\"hi\\\"\")");
    EXPECT_EQ(ev("(csv-parse-line \",\")"), "(\"\" \"\")");
    EXPECT_EQ(ev("(csv-parse-line \"só,ção\")"), "(\"só\" \"ção\")");
}

TEST_F(UtilitiesTest, SmallHelpers) {
    EXPECT_EQ(ev("(unique '(3 1 3 2 1))"), "(3 1 2)");
    EXPECT_EQ(ev("(pad-number 7 3)"), "\"007\"");
    EXPECT_EQ(ev("(pad-number 1234 3)"), "\"1234\"");
    EXPECT_EQ(ev("(alist-get \"REGUA\" '((\"REGUA\" . \"X1\")) \"?\")"), "\"X1\"");
    EXPECT_EQ(ev("(alist-get \"NONE\" '((\"REGUA\" . \"X1\")) \"?\")"), "\"?\"");
}
