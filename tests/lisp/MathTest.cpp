// Arithmetic, comparison, bits and geometry against the dialect's documented results.
#include "LispFixture.h"

using MathTest = LispFixture;

TEST_F(MathTest, IntegerAndRealArithmetic) {
    EXPECT_EQ(ev("(/ 100 20.0 2)"), "2.5");
    EXPECT_EQ(ev("(/ 7 2)"), "3");
    EXPECT_EQ(ev("(/ -7 2)"), "-3");
    EXPECT_EQ(ev("(/ 7 2.0)"), "3.5");
    EXPECT_EQ(ev("(+ 1 2 3.0)"), "6.0");
    EXPECT_EQ(ev("(- 10)"), "-10");
    EXPECT_EQ(ev("(- 10 1 2)"), "7");
    EXPECT_EQ(ev("(* 2 3 4)"), "24");
    EXPECT_EQ(ev("(+)"), "0");
    EXPECT_EQ(ev("(1+ 1.5)"), "2.5");
    EXPECT_EQ(ev("(1- 0)"), "-1");
    EXPECT_EQ(ev("(/ 1.0 0)"), "ERROR: divide by zero");
    EXPECT_EQ(ev("(/ -2147483648 -1)"), "-2147483648");
}

TEST_F(MathTest, RemChainsLeftToRight) {
    EXPECT_EQ(ev("(rem 26 7 2)"), "1");
    EXPECT_EQ(ev("(rem 42 12)"), "6");
    EXPECT_EQ(ev("(rem -7 2)"), "-1");
    EXPECT_EQ(ev("(rem 9.0 2)"), "1.0");
    EXPECT_EQ(ev("(rem 5 0)"), "ERROR: divide by zero");
}

TEST_F(MathTest, FunctionsAndConversions) {
    EXPECT_EQ(ev("(abs -3)"), "3");
    EXPECT_EQ(ev("(abs -3.5)"), "3.5");
    EXPECT_EQ(ev("(max 1 3 2)"), "3");
    EXPECT_EQ(ev("(max 1 3.0 2)"), "3.0");
    EXPECT_EQ(ev("(min 4 -1 2)"), "-1");
    EXPECT_EQ(ev("(gcd 81 57)"), "3");
    EXPECT_EQ(ev("(fix 3.7)"), "3");
    EXPECT_EQ(ev("(fix -3.7)"), "-3");
    EXPECT_EQ(ev("(type (fix 1e20))"), "REAL");
    EXPECT_EQ(ev("(float 3)"), "3.0");
    EXPECT_EQ(ev("(sqrt 16)"), "4.0");
    EXPECT_EQ(ev("(sqrt -1)"), "ERROR: function undefined for argument: -1");
    EXPECT_EQ(ev("(expt 2 10)"), "1024");
    EXPECT_EQ(ev("(expt 2.0 3)"), "8.0");
    EXPECT_EQ(ev("(expt 2 -1)"), "0");
    EXPECT_EQ(ev("(exp 0)"), "1.0");
    EXPECT_EQ(ev("(log 1)"), "0.0");
    EXPECT_EQ(ev("(log 0)"), "ERROR: function undefined for argument: 0");
    EXPECT_EQ(ev("(sin 0)"), "0.0");
    EXPECT_EQ(ev("(cos 0)"), "1.0");
    EXPECT_EQ(ev("(atan 1)"), "0.785398");
    EXPECT_EQ(ev("(atan 1 0)"), "1.5708");
    EXPECT_EQ(ev("pi"), "3.14159");
    EXPECT_EQ(ev("(/ 1 3.0)"), "0.333333");
    EXPECT_EQ(ev("1e20"), "1.0e+20");
}

TEST_F(MathTest, Comparison) {
    EXPECT_EQ(ev("(= 4 4.0)"), "T");
    EXPECT_EQ(ev("(= 499 499 500)"), "nil");
    EXPECT_EQ(ev("(= \"me\" \"me\")"), "T");
    EXPECT_EQ(ev("(= \"me\" \"Me\")"), "nil");
    EXPECT_EQ(ev("(/= 10 20)"), "T");
    EXPECT_EQ(ev("(/= 10 20 10 20 20)"), "nil");
    EXPECT_EQ(ev("(< 1 2 3)"), "T");
    EXPECT_EQ(ev("(< 1 3 2)"), "nil");
    EXPECT_EQ(ev("(< \"a\" \"b\")"), "T");
    EXPECT_EQ(ev("(>= 3 3 1)"), "T");
    EXPECT_EQ(ev("(<= 1 1 0)"), "nil");
    EXPECT_EQ(ev("(> 2 \"a\")"), "ERROR: bad argument type: numberp: \"a\"");
    EXPECT_EQ(ev("(zerop 0.0)"), "T");
    EXPECT_EQ(ev("(minusp -0.1)"), "T");
    EXPECT_EQ(ev("(equal 1.123456 1.123457)"), "nil");
    EXPECT_EQ(ev("(equal 1.123456 1.123457 0.000001)"), "T");
    EXPECT_EQ(ev("(equal '(1 (2 \"x\")) (list 1 (list 2 \"x\")))"), "T");
    EXPECT_EQ(ev("(eq '(1) '(1))"), "nil");
    EXPECT_EQ(ev("(setq f '(a)) (eq f f)"), "T");
}

TEST_F(MathTest, Bits) {
    EXPECT_EQ(ev("(logand 7 15 3)"), "3");
    EXPECT_EQ(ev("(logior 1 2 4)"), "7");
    EXPECT_EQ(ev("(lsh 2 1)"), "4");
    EXPECT_EQ(ev("(lsh 40 -2)"), "10");
    EXPECT_EQ(ev("(lsh 16384 1)"), "32768");
    EXPECT_EQ(ev("(~ 3)"), "-4");
    EXPECT_EQ(ev("(boole 1 12 5)"), "4");
    EXPECT_EQ(ev("(boole 6 6 5)"), "3");
    EXPECT_EQ(ev("(boole 7 1 2 4)"), "7");
}

TEST_F(MathTest, Geometry) {
    EXPECT_EQ(ev("(distance '(1.0 2.5 3.0) '(7.7 2.5 3.0))"), "6.7");
    EXPECT_EQ(ev("(distance '(0 0) '(3 4 12))"), "5.0");
    EXPECT_EQ(ev("(angle '(1.0 1.0) '(1.0 4.0))"), "1.5708");
    EXPECT_EQ(ev("(angle '(0 0) '(0 -1))"), "4.71239");
    EXPECT_EQ(ev("(polar '(1 1 3.5) 0.785398 1.414214)"), "(2.0 2.0 3.5)");
    EXPECT_EQ(ev("(inters '(1 1) '(9 9) '(4 1) '(4 2))"), "nil");
    EXPECT_EQ(ev("(inters '(1 1) '(9 9) '(4 1) '(4 2) nil)"), "(4.0 4.0)");
    EXPECT_EQ(ev("(inters '(1 1) '(9 9) '(4 1) '(4 7))"), "(4.0 4.0)");
    EXPECT_EQ(ev("(inters '(0 0) '(1 0) '(0 1) '(1 1) nil)"), "nil");
    EXPECT_EQ(ev("(distance '(0 0) 5)"), "ERROR: bad argument type: 2D/3D point: 5");
}
