#include "chart/MarkupText.h"

#include <gtest/gtest.h>

#include <string>

namespace vantor::analyze {
namespace {

TEST(PrintableTest, LeavesTextAsItIs) {
    EXPECT_EQ(Printable("disk-0 <a&b>"), "disk-0 <a&b>");
    EXPECT_EQ(Printable("Gerät ☎ 𝄞"), "Gerät ☎ 𝄞");
    EXPECT_EQ(Printable(""), "");
}

TEST(PrintableTest, ShowsBytesThatAreNoUtf8) {
    EXPECT_EQ(Printable("a\xff"
                        "b"),
              "a\\xffb");
    EXPECT_EQ(Printable("\xc3"), "\\xc3");                             // cut
    EXPECT_EQ(Printable("\xe2\x82z"), "\\xe2\\x82z");                  // cut by another character
    EXPECT_EQ(Printable("\xc0\xaf"), "\\xc0\\xaf");                    // overlong
    EXPECT_EQ(Printable("\xe0\x80\xaf"), "\\xe0\\x80\\xaf");           // overlong
    EXPECT_EQ(Printable("\xed\xa0\x80"), "\\xed\\xa0\\x80");           // a surrogate
    EXPECT_EQ(Printable("\xf4\x90\x80\x80"), "\\xf4\\x90\\x80\\x80");  // beyond the last one
}

TEST(PrintableTest, ShowsWhatWouldBeHiddenOrRefused) {
    EXPECT_EQ(Printable(std::string("a\0b", 3)), "a\\x00b");
    EXPECT_EQ(Printable("a\nb\tc\x1b[1m\x7f"), "a\\x0ab\\x09c\\x1b[1m\\x7f");
    EXPECT_EQ(Printable("\u0085\u202e\ufeff\uffff"), "\\u0085\\u202e\\ufeff\\uffff");
}

TEST(EscapedTest, ReplacesWhatMeansSomethingToXml) {
    EXPECT_EQ(Escaped("<a href=\"b\">'c' & d</a>"),
              "&lt;a href=&quot;b&quot;&gt;&#39;c&#39; &amp; d&lt;/a&gt;");
    EXPECT_EQ(Escaped("]]>"), "]]&gt;");
}

TEST(ColumnsTest, CountsCharactersAndAllowsTwoForThoseOfUnknownWidth) {
    EXPECT_EQ(Columns("abc"), 3U);
    EXPECT_EQ(Columns("äb"), 3U);
    EXPECT_EQ(Columns("𝄞"), 2U);
}

TEST(ShortenedTest, LeavesWhatFits) { EXPECT_EQ(Shortened("storage", 7), "storage"); }

TEST(ShortenedTest, KeepsBeginningAndEnd) {
    EXPECT_EQ(Shortened("storage-adapter-17", 10), "stor…r-17");
    EXPECT_EQ(Shortened("abcdef", 3), "a…");
    EXPECT_EQ(Shortened("abcdef", 0), "a…");
}

TEST(ShortenedTest, NeverCutsACharacterAndNeverTakesMore) {
    const std::string name = "äöü𝄞-middle-ßéñ𝄞";
    for (std::size_t columns = 4; columns <= Columns(name); ++columns) {
        const std::string text = Shortened(name, columns);
        EXPECT_LE(Columns(text), columns);
        EXPECT_EQ(Printable(text), text);
    }
}

}  // namespace
}  // namespace vantor::analyze
