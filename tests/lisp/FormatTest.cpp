// rtos, distof and angtos in every mode, with DIMZIN's default (trailing zeros kept).
#include "LispFixture.h"

using FormatTest = LispFixture;

TEST_F(FormatTest, RtosModes) {
    EXPECT_EQ(ev("(rtos 17.5 1 4)"), "\"1.7500E+01\"");
    EXPECT_EQ(ev("(rtos 17.5 2 4)"), "\"17.5000\"");
    EXPECT_EQ(ev("(rtos 17.5 3 4)"), "\"1'-5.5000\\\"\"");
    EXPECT_EQ(ev("(rtos 17.5 4 4)"), "\"1'-5 1/2\\\"\"");
    EXPECT_EQ(ev("(rtos 17.5 5 4)"), "\"17 1/2\"");
    EXPECT_EQ(ev("(rtos 17.5 2 2)"), "\"17.50\"");
    EXPECT_EQ(ev("(rtos 17.5)"), "\"17.5000\"");
    EXPECT_EQ(ev("(rtos 2 2 0)"), "\"2\"");
    EXPECT_EQ(ev("(rtos -0.125 2 3)"), "\"-0.125\"");
    EXPECT_EQ(ev("(rtos 5.5 3 2)"), "\"5.50\\\"\"");
    EXPECT_EQ(ev("(rtos 24.0 4 2)"), "\"2'\"");
    EXPECT_EQ(ev("(rtos 0.75 5 3)"), "\"3/4\"");
    EXPECT_EQ(ev("(rtos 1.0 9)"), "ERROR: bad argument value: 9");
}

TEST_F(FormatTest, DimzinSuppressesZeros) {
    lisp.units.dimzin = 8;
    EXPECT_EQ(ev("(rtos 17.5 2 4)"), "\"17.5\"");
    EXPECT_EQ(ev("(rtos 17.0 2 4)"), "\"17\"");
    lisp.units.dimzin = 12;
    EXPECT_EQ(ev("(rtos 0.5 2 3)"), "\".5\"");
}

TEST_F(FormatTest, DistofReadsEveryLinearFormat) {
    EXPECT_EQ(ev("(distof \"17.5\" 2)"), "17.5");
    EXPECT_EQ(ev("(distof \"1.7500E+01\" 1)"), "17.5");
    EXPECT_EQ(ev("(distof \"1'-5.5\\\"\" 3)"), "17.5");
    EXPECT_EQ(ev("(distof \"1'-5 1/2\\\"\" 4)"), "17.5");
    EXPECT_EQ(ev("(distof \"17 1/2\" 5)"), "17.5");
    EXPECT_EQ(ev("(distof \"-3/4\")"), "-0.75");
    EXPECT_EQ(ev("(distof \"abc\")"), "nil");
    EXPECT_EQ(ev("(distof \"\")"), "nil");
    EXPECT_EQ(ev("(distof (rtos 1234.5678 4 8))"), "1234.57");
}

TEST_F(FormatTest, AngtosModes) {
    EXPECT_EQ(ev("(angtos 0.785398 0 4)"), "\"45.0000\"");
    EXPECT_EQ(ev("(angtos 0.785398 1 4)"), "\"45d0'0\\\"\"");
    EXPECT_EQ(ev("(angtos 0.785398 2 4)"), "\"50.0000g\"");
    EXPECT_EQ(ev("(angtos 0.785398 3 4)"), "\"0.7854r\"");
    EXPECT_EQ(ev("(angtos 0.785398 4 4)"), "\"N 45d0'0\\\" E\"");
    EXPECT_EQ(ev("(angtos (* pi 1.5) 4)"), "\"S\"");
    EXPECT_EQ(ev("(angtos -1.5708 0 0)"), "\"270\"");
    EXPECT_EQ(ev("(angtos pi)"), "\"180\"");
}
