#include "platform/xmlscan/NestingScan.h"

#include <cstring>

namespace XmlScan
{
namespace
{
class Scanner
{
public:
	explicit Scanner(std::string_view aText) : myText(aText.substr(0, aText.find('\0'))) {}

	int FindTooDeep(int aMaxDepth)
	{
		int depth = 0;
		while (myAt < myText.size())
		{
			if (myText[myAt] != '<')
			{
				Step();
				continue;
			}
			if (StartsWith("<!--"))
			{
				SkipPast("-->");
			}
			else if (StartsWith("<![CDATA["))
			{
				SkipPast("]]>");
			}
			else if (StartsWith("</"))
			{
				// Inside an element a mismatched end tag stops TinyXML's parse, so counting it down
				// never hides a level the parser would still enter. Outside every element TinyXML
				// passes over it as unknown markup: it closes nothing there.
				depth = depth > 0 ? depth - 1 : 0;
				SkipPast(">");
			}
			else if (OpensElement())
			{
				if (OpenTag())
				{
					++depth;
					if (depth > aMaxDepth)
					{
						return myLine;
					}
				}
			}
			else
			{
				// Declarations, "<!DOCTYPE", processing instructions and anything else TinyXML does
				// not take for an element: it reads them up to the first '>'.
				SkipPast(">");
			}
		}
		return 0;
	}

private:
	bool StartsWith(const char* aPrefix) const
	{
		return myText.compare(myAt, std::strlen(aPrefix), aPrefix) == 0;
	}

	// TinyXML opens an element on '<' followed by a letter, '_' or any byte of a multi-byte
	// UTF-8 sequence.
	bool OpensElement() const
	{
		if (myAt + 1 >= myText.size())
		{
			return false;
		}
		const unsigned char next = static_cast<unsigned char>(myText[myAt + 1]);
		return next == '_' || next >= 127 || (next >= 'a' && next <= 'z') || (next >= 'A' && next <= 'Z');
	}

	void Step()
	{
		if (myText[myAt] == '\n')
		{
			++myLine;
		}
		++myAt;
	}

	void SkipPast(const char* aTerminator)
	{
		const size_t length = std::strlen(aTerminator);
		while (myAt < myText.size() && myText.compare(myAt, length, aTerminator) != 0)
		{
			Step();
		}
		for (size_t index = 0; index < length && myAt < myText.size(); ++index)
		{
			Step();
		}
	}

	// From the '<' of a start tag past its '>'; false for an empty element ("/>") or a tag
	// the text ends inside. Quoted attribute values may hold '>' and "/>".
	bool OpenTag()
	{
		Step();
		while (myAt < myText.size())
		{
			const char c = myText[myAt];
			if (c == '"' || c == '\'')
			{
				Step();
				while (myAt < myText.size() && myText[myAt] != c)
				{
					Step();
				}
				if (myAt < myText.size())
				{
					Step();
				}
			}
			else if (c == '/' && myAt + 1 < myText.size() && myText[myAt + 1] == '>')
			{
				Step();
				Step();
				return false;
			}
			else if (c == '>')
			{
				Step();
				return true;
			}
			else
			{
				Step();
			}
		}
		return false;
	}

	std::string_view myText;
	size_t myAt = 0;
	int myLine = 1;
};
} // namespace

int FindTooDeep(std::string_view aText, int aMaxDepth)
{
	return Scanner(aText).FindTooDeep(aMaxDepth);
}

std::string Describe(int aLine, int aMaxDepth)
{
	return "elements nested deeper than " + std::to_string(aMaxDepth) + " (line " + std::to_string(aLine) +
	       ")";
}
} // namespace XmlScan
