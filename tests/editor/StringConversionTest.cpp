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
	    {u"K\u00e4llare", "K\xc3\xa4llare"},           // two-byte form
	    {u"\u6d1e\u7a9f", "\xe6\xb4\x9e\xe7\xaa\x9f"}, // three-byte forms
	    {u"cave \U0001F987", "cave \xf0\x9f\xa6\x87"}, // a surrogate pair: four bytes
	};
	for (const RoundTrip& test : cases)
	{
		EXPECT_EQ(Lumora::ToNarrow(test.myWide), test.myNarrow) << test.myNarrow;
		EXPECT_EQ(Lumora::ToWide(test.myNarrow), test.myWide) << test.myNarrow;
	}
}

TEST(StringConversionTest, WhatCannotBeRepresentedBecomesAReplacement)
{
	// Unpaired surrogates (a low one alone, a high one at the end) have no encoding: the default
	// character, as a code page gives.
	EXPECT_EQ(Lumora::ToNarrow(std::u16string(u"a") + char16_t(0xDC00) + u"b" + char16_t(0xD83D)), "a?b?");
	// Malformed UTF-8: each bad byte reads as U+FFFD and decoding goes on (a cut sequence, an
	// overlong '/', an encoded surrogate).
	EXPECT_EQ(Lumora::ToWide("a\xff"
	                         "b\xc3"),
	          u"a\uFFFDb\uFFFD");
	EXPECT_EQ(Lumora::ToWide("\xc0\xaf\xed\xa0\x80"), u"\uFFFD\uFFFD\uFFFD\uFFFD\uFFFD");
}

TEST(StringConversionTest, LowBytesKeepsTheLowEightBitsOfEachCharacter)
{
	// U+0162 and U+4142 keep 0x62 ('b') and 0x42 ('B'); no multi-byte form appears.
	EXPECT_EQ(Lumora::LowBytes(u"r\u0162\u4142\u00e4"), "rbB\xe4");
}
