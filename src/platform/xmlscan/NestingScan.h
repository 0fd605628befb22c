#pragma once
// NestingScan: how deeply a text's XML elements nest, found without parsing it. TinyXML
// parses an element's children by recursion, one stack frame chain per level, so a
// document nested tens of thousands deep (damaged or hostile) overflows the stack inside
// the parser. Every TinyXML load asks this scan first and refuses such a text:
//
//   const int line = XmlScan::FindTooDeep(text, XmlScan::ourMaxDepth);
//   if (line > 0) { refuse: "elements nested deeper than 512 (line N)" }
//
// The scan follows TinyXML's rules for what opens an element and what it passes over
// (comments, CDATA sections, declarations and other "<!" / "<?" markup, quoted attribute
// values), so it never counts fewer levels than the parser would recurse through. It
// keeps no state and allocates nothing.
#include <string>
#include <string_view>

namespace XmlScan
{
// Deeper than any file the editor reads: level files nest a handful of elements, and a
// COLLADA document nests its scene nodes (at most 256 deep, the importer's own limit)
// under a few more. TinyXML's parse takes about 240 bytes of stack per level (measured
// with Debian's build), so 512 levels need some 120 KiB, which any thread has.
constexpr int ourMaxDepth = 512;

// The line (from 1) on which the elements of aText first nest deeper than aMaxDepth;
// 0 when they never do. A zero byte ends the text, as it ends TinyXML's parse.
int FindTooDeep(std::string_view aText, int aMaxDepth);

// The reason given when a text is refused: "elements nested deeper than <max> (line <n>)".
std::string Describe(int aLine, int aMaxDepth);
} // namespace XmlScan
