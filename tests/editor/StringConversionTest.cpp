// Strings and records across the front-end boundary: UTF-16 in, UTF-8 inside; the
// decal type change's low-byte conversion.
#include <gtest/gtest.h>
#include <string>

#include "editor/StringConversion.h"

namespace
{
struct RoundTrip
{
	const char16_t* myWide;
	const char* myNarrow;
};
} // namespace

TEST(StringConversionTest, TextRoundTripsBetweenUtf16AndUtf8)
{
	const RoundTrip cases[] = {
	    {u"Level1", "Level1"},                         // plain ASCII, byte for byte
	    {u"", ""},                                     // nothing
	    {u"K\u00e4llare", "K\xc3\xa4llare"},           // two-byte form
	    {u"\u6d1e\u7a9f", "\xe6\xb4\x9e\xe7\xaa\x9f"}, // three-byte forms
	    {u"cave \U0001F987", "cave \xf0\x9f\xa6\x87"}, // a surrogate pair: four bytes
	    {u"a/b c-d_e.f", "a/b c-d_e.f"},               // path punctuation untouched
	};
	for (const RoundTrip& test : cases)
	{
		EXPECT_EQ(Lumora::ToNarrow(test.myWide), test.myNarrow) << test.myNarrow;
		EXPECT_EQ(Lumora::ToWide(test.myNarrow), test.myWide) << test.myNarrow;
	}
}

TEST(StringConversionTest, WhatCannotBeRepresentedBecomesAReplacement)
{
	// Unpaired surrogates have no encoding: the default character, as a code page gives.
	EXPECT_EQ(Lumora::ToNarrow(std::u16string(u"a") + char16_t(0xD800) + u"b"), "a?b");
	EXPECT_EQ(Lumora::ToNarrow(std::u16string(1, char16_t(0xDC00))), "?");
	EXPECT_EQ(Lumora::ToNarrow(std::u16string(1, char16_t(0xD83D))), "?") << "a high surrogate at the end";
	// Malformed UTF-8: each bad byte reads as U+FFFD and decoding goes on.
	EXPECT_EQ(Lumora::ToWide("a\xff"
	                         "b"),
	          u"a\uFFFDb");
	EXPECT_EQ(Lumora::ToWide("\xc3"), u"\uFFFD") << "a sequence cut short";
	EXPECT_EQ(Lumora::ToWide("\xc0\xaf"), u"\uFFFD\uFFFD") << "an overlong '/'";
	EXPECT_EQ(Lumora::ToWide("\xed\xa0\x80"), u"\uFFFD\uFFFD\uFFFD") << "an encoded surrogate";
}

TEST(StringConversionTest, LowBytesKeepsTheLowEightBitsOfEachCharacter)
{
	EXPECT_EQ(Lumora::LowBytes(u"brick"), "brick");
	// U+0162 and U+4142 keep 0x62 ('b') and 0x42 ('B'); no multi-byte form appears.
	EXPECT_EQ(Lumora::LowBytes(u"\u0162\u4142"), "bB");
	EXPECT_EQ(Lumora::LowBytes(u"\u00e4"), "\xe4");
}
