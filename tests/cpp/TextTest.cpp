// Text at the edges: validation of UTF-8, the Windows-1252 fallback, counting in
// UTF-16 code units, and ASCII-only case folding.
#include <dexmor/platform/Text.hpp>

#include <gtest/gtest.h>

using namespace OrvexKavorCore::text;

TEST(Text, StrictUtf8) {
    // Empty, ASCII, é € 😀, U+10FFFF.
    for (const char* valid : {"", "plain ASCII", "\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80", "\xF4\x8F\xBF\xBF"})
        EXPECT_TRUE(isValidUtf8(valid)) << valid;
    // Overlong NUL, overlong, a surrogate, above U+10FFFF, truncated, a stray continuation.
    for (const char* invalid : {"\xC0\x80", "\xE0\x80\xAF", "\xED\xA0\x80", "\xF4\x90\x80\x80", "\xE2\x82", "\x80"}) {
        EXPECT_FALSE(isValidUtf8(invalid)) << invalid;
    }
}

TEST(Text, Windows1252Fallback) {
    EXPECT_EQ(decodeStoredText("d\xC3\xA9j\xC3\xA0"), "d\xC3\xA9j\xC3\xA0"); // valid UTF-8 stays
    EXPECT_EQ(decodeStoredText("d\xE9j\xE0"), "d\xC3\xA9j\xC3\xA0");         // é à in Windows-1252
    EXPECT_EQ(windows1252ToUtf8("\x80\x99\x9F"), "\xE2\x82\xAC\xE2\x84\xA2\xC5\xB8");
    // The five undefined bytes become the C1 controls of the same number.
    EXPECT_EQ(windows1252ToUtf8("\x81\x8D\x8F\x90\x9D"), "\xC2\x81\xC2\x8D\xC2\x8F\xC2\x90\xC2\x9D");
    EXPECT_EQ(latin1ToUtf8("a\xFF"), "a\xC3\xBF");
}

TEST(Text, Utf16CountingNeverSplitsACharacter) {
    const std::string smile = "\xF0\x9F\x98\x80"; // one character, two UTF-16 units
    EXPECT_EQ(utf16Length("ab\xC3\xA9" + smile), 5u);
    EXPECT_EQ(truncateToUtf16Units("abc", 2), "ab");
    EXPECT_EQ(truncateToUtf16Units("a" + smile, 2), "a"); // the pair would straddle the limit
    EXPECT_EQ(truncateToUtf16Units("a" + smile, 3), "a" + smile);
    EXPECT_EQ(truncateToUtf16Units("\xC3\xA9\xC3\xA9", 1), "\xC3\xA9");
}

// (ASCII-only case folding shows in the library's and the file's name look-ups.)
TEST(Text, CaseFoldingCoversAsciiLettersOnly) {
    EXPECT_FALSE(equalsIgnoringAsciiCase("abc", "abcd"));
    EXPECT_LT(compareIgnoringAsciiCase("Apple", "banana"), 0);
}
