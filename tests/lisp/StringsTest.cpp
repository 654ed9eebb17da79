// String functions, conversions and wcmatch against the dialect's documented results.
#include "LispFixture.h"

using StringsTest = LispFixture;

TEST_F(StringsTest, Basics) {
    EXPECT_EQ(ev("(strcat \"a\" \"bout\")"), "\"about\"");
    EXPECT_EQ(ev("(strcat)"), "\"\"");
    EXPECT_EQ(ev("(substr \"abcde\" 3 2)"), "\"cd\"");
    EXPECT_EQ(ev("(substr \"abcde\" 2)"), "\"bcde\"");
    EXPECT_EQ(ev("(substr \"abcde\" 9)"), "\"\"");
    EXPECT_EQ(ev("(substr \"abcde\" 0)"), "ERROR: bad argument value: positive 0");
    EXPECT_EQ(ev("(strlen \"abcd\" \"ef\")"), "6");
    EXPECT_EQ(ev("(strlen \"ação\")"), "4");
    EXPECT_EQ(ev("(strcase \"Sample\")"), "\"SAMPLE\"");
    EXPECT_EQ(ev("(strcase \"Sample\" t)"), "\"sample\"");
    EXPECT_EQ(ev("(strcase \"ção\")"), "\"ÇÃO\"");
    EXPECT_EQ(ev("(ascii \"BIG\")"), "66");
    EXPECT_EQ(ev("(ascii \"\")"), "0");
    EXPECT_EQ(ev("(chr 65)"), "\"A\"");
    EXPECT_EQ(ev("(chr 8364)"), "\"€\"");
}

TEST_F(StringsTest, Conversions) {
    EXPECT_EQ(ev("(itoa -17)"), "\"-17\"");
    EXPECT_EQ(ev("(atoi \"97\")"), "97");
    EXPECT_EQ(ev("(atoi \"3.9\")"), "3");
    EXPECT_EQ(ev("(atoi \" -12abc\")"), "-12");
    EXPECT_EQ(ev("(atoi \"abc\")"), "0");
    EXPECT_EQ(ev("(atof \"97.1\")"), "97.1");
    EXPECT_EQ(ev("(atof \"3\")"), "3.0");
    EXPECT_EQ(ev("(atof \"1.5e2x\")"), "150.0");
    EXPECT_EQ(ev("(atof \"x\")"), "0.0");
    EXPECT_EQ(ev("(read \"(a b . c)\")"), "(A B . C)");
    EXPECT_EQ(ev("(read \"hello world\")"), "HELLO");
    EXPECT_EQ(ev("(read \"\")"), "nil");
    EXPECT_EQ(ev("(read \"(\")"), "ERROR: malformed list on input");
    EXPECT_EQ(ev("(vl-prin1-to-string \"a\\\"b\")"), "\"\\\"a\\\\\\\"b\\\"\"");
    EXPECT_EQ(ev("(vl-princ-to-string '(\"a\" 1.5))"), "\"(a 1.5)\"");
}

TEST_F(StringsTest, VlStringFunctions) {
    EXPECT_EQ(ev("(vl-string-search \"x\" \"abc\")"), "nil");
    EXPECT_EQ(ev("(vl-string-search \"foo\" \"pfooyey on you\")"), "1");
    EXPECT_EQ(ev("(vl-string-search \"o\" \"pfooyey on you\" 4)"), "8");
    EXPECT_EQ(ev("(vl-string-subst \"Obi-wan\" \"Ben\" \"Ben Ben Kenobi\")"),
              "\"Obi-wan Ben Kenobi\"");
    EXPECT_EQ(ev("(vl-string-subst \"x\" \"Ben\" \"Ben Ben\" 1)"), "\"Ben x\"");
    EXPECT_EQ(ev("(vl-string-trim \" \\t\\n\" \" \\t\\n  Hi there  \\n\")"), "\"Hi there\"");
    EXPECT_EQ(ev("(vl-string-left-trim \"12\" \"1212abc12\")"), "\"abc12\"");
    EXPECT_EQ(ev("(vl-string-right-trim \"12\" \"1212abc12\")"), "\"1212abc\"");
    EXPECT_EQ(ev("(vl-string-translate \"abc\" \"123\" \"a cab\")"), "\"1 312\"");
    EXPECT_EQ(ev("(vl-string-position (ascii \"z\") \"azbdc\")"), "1");
    EXPECT_EQ(ev("(vl-string-position 122 \"azbzlmnqc\" nil t)"), "3");
    EXPECT_EQ(ev("(vl-string-position 122 \"abc\")"), "nil");
    EXPECT_EQ(ev("(vl-string->list \"AB\")"), "(65 66)");
    EXPECT_EQ(ev("(vl-list->string '(49 50))"), "\"12\"");
    EXPECT_EQ(ev("(vl-symbolp 'a)"), "T");
    EXPECT_EQ(ev("(vl-symbolp \"a\")"), "nil");
}

TEST_F(StringsTest, WildcardsWithTheFullPatternSyntax) {
    EXPECT_EQ(ev("(wcmatch \"Name\" \"N*\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"Name\" \"???,~*m*,N*\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"Name\" \"*`,*\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"a,b\" \"*`,*\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"Name\" \"n*\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"X12\" \"X#*\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"XA2\" \"X#*\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"A1\" \"@#\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"-\" \".\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"a\" \".\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"bat\" \"[bc]at\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"rat\" \"[~bc]at\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"cat\" \"[~bc]at\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"K7\" \"K[0-9]\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"Ka\" \"K[0-9]\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"abc\" \"~abc\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"abd\" \"~abc\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"a*b\" \"a`*b\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"axb\" \"a`*b\")"), "nil");
    EXPECT_EQ(ev("(wcmatch \"\" \"*\")"), "T");
    EXPECT_EQ(ev("(wcmatch \"aaaaaaaaaaaaaaaaaaaaaaaaaaaaab\" \"*a*a*a*a*a*a*c\")"), "nil");
}

TEST_F(StringsTest, TableNames) {
    EXPECT_EQ(ev("(snvalid \"hocus-pocus\")"), "T");
    EXPECT_EQ(ev("(snvalid \"hocus pocus\")"), "T");
    EXPECT_EQ(ev("(snvalid \"hocus%pocus\")"), "T");
    EXPECT_EQ(ev("(snvalid \"hocus?pocus\")"), "nil");
    EXPECT_EQ(ev("(snvalid \"\")"), "nil");
    EXPECT_EQ(ev("(snvalid \"hocus|pocus\")"), "nil");
    EXPECT_EQ(ev("(snvalid \"hocus|pocus\" 1)"), "T");
    EXPECT_EQ(ev("(snvalid \"|hocus\" 1)"), "nil");
}
