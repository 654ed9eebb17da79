// The plain text-to-real rule of templates and list sums: what it accepts as the leading
// number, how it rounds, and what it gives for text that is no number.
#include "lists/CETemplateLisp.h"

#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <limits>

namespace {

double Real(const QString& texto) {
    return CETemplateLisp::TextoParaReal(texto);
}

TEST(TemplateNumberTest, TheLeadingNumberCountsAndWhatFollowsItIsIgnored) {
    EXPECT_EQ(Real("12"), 12.0);
    EXPECT_EQ(Real("12abc"), 12.0);
    EXPECT_EQ(Real("2.5 m"), 2.5);
    // The comma is no decimal mark, whatever the locale.
    EXPECT_EQ(Real("1,5"), 1.0);
    EXPECT_EQ(Real("1."), 1.0);
    EXPECT_EQ(Real(".5"), 0.5);
    EXPECT_EQ(Real("+.5"), 0.5);
    EXPECT_EQ(Real("-2.25"), -2.25);
    EXPECT_EQ(Real("3e2"), 300.0);
    EXPECT_EQ(Real("3E-2"), 0.03);
    EXPECT_EQ(Real("3e+2x"), 300.0);
    // An exponent mark without digits is not part of the number.
    EXPECT_EQ(Real("1e"), 1.0);
    EXPECT_EQ(Real("1e+"), 1.0);
    EXPECT_EQ(Real("7e-x"), 7.0);
    // Leading zeros, and a hexadecimal text read as its leading zero.
    EXPECT_EQ(Real("000000000000000000000000000001.5"), 1.5);
    EXPECT_EQ(Real("0x10"), 0.0);
}

TEST(TemplateNumberTest, BlanksBeforeTheNumberAreSkippedUnicodeOnesToo) {
    EXPECT_EQ(Real(" \t\n 12"), 12.0);
    EXPECT_EQ(Real(QString(QChar(0x00A0)) + "5"), 5.0);
    EXPECT_EQ(Real(QString(QChar(0x2003)) + "-5"), -5.0);
    // A blank between the sign and the digits ends the number before it starts.
    EXPECT_EQ(Real("- 5"), 0.0);
}

TEST(TemplateNumberTest, TextThatIsNoNumberIsZero) {
    for (const QString& texto :
         {QString(), QString(""), QString("   "), QString("abc"), QString("-"), QString("+"),
          QString("."), QString(".e1"), QString("+-1"), QString("e5")}) {
        const double valor = Real(texto);
        EXPECT_EQ(valor, 0.0) << texto.toStdString();
        EXPECT_FALSE(std::signbit(valor)) << texto.toStdString();
    }
    // Only ASCII digits are digits.
    EXPECT_EQ(Real(QString(QChar(0x0663))), 0.0);
    EXPECT_EQ(Real(QString(QChar(0xFF13))), 0.0);
}

TEST(TemplateNumberTest, RoundsToTheNearestDoubleAndKeepsTheSignOfZero) {
    EXPECT_EQ(Real("0.1"), 0.1);
    EXPECT_EQ(Real("0.30000000000000004"), 0.1 + 0.2);
    EXPECT_EQ(Real("1.7976931348623157e308"), DBL_MAX);
    EXPECT_EQ(Real("4.9e-324"), std::numeric_limits<double>::denorm_min());
    EXPECT_EQ(Real("2.4703282292062328e-324"), std::numeric_limits<double>::denorm_min());
    EXPECT_EQ(Real("123456789012345678901234567890"), 123456789012345678901234567890.0);
    // A mantissa far longer than a double holds still rounds on all its digits.
    EXPECT_EQ(Real(QString(900, '1') + "e-700"), 1.1111111111111111e199);
    EXPECT_TRUE(std::signbit(Real("-0")));
    EXPECT_TRUE(std::signbit(Real("-0.0e5")));
}

TEST(TemplateNumberTest, BeyondADoubleIsAnInfinityAndBelowItZero) {
    EXPECT_EQ(Real("1e400"), std::numeric_limits<double>::infinity());
    EXPECT_EQ(Real("-1e400"), -std::numeric_limits<double>::infinity());
    EXPECT_EQ(Real("1.7976931348623159e308"), std::numeric_limits<double>::infinity());
    EXPECT_EQ(Real("0.0001e312"), 1e308);
    EXPECT_EQ(Real("1e99999999999999999999"), std::numeric_limits<double>::infinity());
    // Too small gives a plain zero, without the sign.
    for (const char* texto : {"1e-400", "-1e-400", "2.4703282292062327e-324", "100000e-330",
                              "-1e-99999999999999999999"}) {
        const double valor = Real(texto);
        EXPECT_EQ(valor, 0.0) << texto;
        EXPECT_FALSE(std::signbit(valor)) << texto;
    }
}

}  // namespace
