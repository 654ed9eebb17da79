// Code pages and escapes of drawing text.
#include "drawing/TextCodec.h"

#include <gtest/gtest.h>

using zvdb::TextCodec;

TEST(TextCodec, EscapesBecomeCharacters) {
    std::string out;
    EXPECT_TRUE(TextCodec::decodeEscapes("a\\U+00E7b\\U+03A9", out));
    EXPECT_EQ(out, "açbΩ");
    EXPECT_TRUE(TextCodec::decodeEscapes("\\M+18140", out))
        << "Shift_JIS 0x8140 is the ideographic space";
    EXPECT_EQ(out, "\u3000");
    EXPECT_FALSE(TextCodec::decodeEscapes("plain \\P text", out));
    EXPECT_TRUE(TextCodec::decodeEscapes("\\U+12 stays", out));
    EXPECT_EQ(out, "\\U+12 stays") << "a short escape is text";
}

TEST(TextCodec, CodePagesRoundTrip) {
    EXPECT_TRUE(TextCodec::isKnownCodePage("ANSI_1252"));
    EXPECT_TRUE(TextCodec::isKnownCodePage("ansi_1251"));
    EXPECT_TRUE(TextCodec::isKnownCodePage("ANSI_932"));
    EXPECT_EQ(TextCodec::toUtf8("\xC0\xEB\xFF", "ANSI_1251"), "Аля");
    EXPECT_EQ(TextCodec::fromUtf8("Аля Ω", "ANSI_1251"), "\xC0\xEB\xFF \\U+03A9");
    EXPECT_EQ(TextCodec::fromUtf8("€", "ANSI_1252"), "\x80");
    EXPECT_EQ(TextCodec::toUtf8("\x80", ""), "€") << "no code page reads as 1252";
}

TEST(TextCodec, RecognisesAsciiAndUtf8) {
    EXPECT_TRUE(TextCodec::isAscii("plain text of some length, over eight bytes"));
    EXPECT_FALSE(TextCodec::isAscii("plain text of some length ç"));
    EXPECT_TRUE(TextCodec::isValidUtf8("ação Ω"));
    EXPECT_FALSE(TextCodec::isValidUtf8("a\xE7\xE3o"));
    EXPECT_FALSE(TextCodec::isValidUtf8("\xE2\x82"));
}
