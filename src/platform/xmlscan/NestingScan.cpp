#include "platform/xmlscan/NestingScan.h"

#include <cctype>
#include <cstring>

namespace XmlScan
{
namespace
{
class Scanner
{
public:
	explicit Scanner(std::string_view aText) : myText(aText) {}

	int FindTooDeep(int aMaxDepth)
	{
		int depth = 0;
		while (More())
		{
			if (myText[myAt] != '<')
			{
				StepCharacter();
				continue;
			}
			if (StartsWith("<!--"))
			{
				SkipPast("-->", true);
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
			else if (StartsWithCaseless("<?xml"))
			{
				SkipDeclaration();
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
				// "<!DOCTYPE", processing instructions and anything else TinyXML does not take for
				// an element or a declaration: it reads them up to the first '>'.
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

	bool StartsWithCaseless(const char* aPrefix) const
	{
		const size_t length = std::strlen(aPrefix);
		if (myText.size() - myAt < length)
		{
			return false;
		}
		for (size_t index = 0; index < length; ++index)
		{
			if (std::tolower(static_cast<unsigned char>(myText[myAt + index])) != aPrefix[index])
			{
				return false;
			}
		}
		return true;
	}

	bool AtWhiteSpace() const
	{
		return More() && std::isspace(static_cast<unsigned char>(myText[myAt])) != 0;
	}

	void SkipWhiteSpace()
	{
		while (AtWhiteSpace())
		{
			Step();
		}
	}

	// "<?xml" up to its end as TinyXML reads a declaration: its version, encoding and standalone
	// attributes with their quoted values (which may hold '>'), anything else passed over up to
	// white space or '>'. A declaration the parser would reject ends its parse: what the scan
	// counts after that only errs on the safe side.
	void SkipDeclaration()
	{
		for (int index = 0; index < 5; ++index)
		{
			Step();
		}
		while (More())
		{
			if (myText[myAt] == '>')
			{
				Step();
				return;
			}
			SkipWhiteSpace();
			if (StartsWithCaseless("version") || StartsWithCaseless("encoding") ||
			    StartsWithCaseless("standalone"))
			{
				SkipAttribute();
			}
			else
			{
				while (More() && myText[myAt] != '>' && !AtWhiteSpace())
				{
					Step();
				}
			}
		}
	}

	// name = value, the value quoted or up to white space, '/' or '>'.
	void SkipAttribute()
	{
		while (More() && myText[myAt] != '=' && myText[myAt] != '>' && !AtWhiteSpace())
		{
			Step();
		}
		SkipWhiteSpace();
		if (myAt >= myText.size() || myText[myAt] != '=')
		{
			return;
		}
		Step();
		SkipWhiteSpace();
		if (More() && (myText[myAt] == '"' || myText[myAt] == '\''))
		{
			const char quote = myText[myAt];
			Step();
			while (More() && myText[myAt] != quote)
			{
				StepCharacter();
			}
			if (More())
			{
				Step();
			}
			return;
		}
		while (More() && myText[myAt] != '/' && myText[myAt] != '>' && !AtWhiteSpace())
		{
			Step();
		}
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

	// TinyXML parses the text as a C string: it ends at a NUL met where a character starts. A NUL
	// right after a UTF-8 lead byte belongs to that character (StepCharacter steps over it), and
	// the parser reads on past it.
	bool More() const { return myAt < myText.size() && myText[myAt] != '\0'; }

	void Step()
	{
		if (myText[myAt] == '\n')
		{
			++myLine;
		}
		++myAt;
	}

	// TinyXML reads text, comments and quoted values a UTF-8 character at a time, the length
	// given by the first byte: a '<' or a quote right after a lead byte belongs to its
	// character, not to the markup.
	void StepCharacter()
	{
		const unsigned char lead = static_cast<unsigned char>(myText[myAt]);
		const size_t length = lead >= 0xC2 && lead <= 0xDF   ? 2
		                      : lead >= 0xE0 && lead <= 0xEF ? 3
		                      : lead >= 0xF0 && lead <= 0xF4 ? 4
		                                                     : 1;
		for (size_t index = 0; index < length && myAt < myText.size(); ++index)
		{
			Step();
		}
	}

	void SkipPast(const char* aTerminator, bool aCharactersFlag = false)
	{
		const size_t length = std::strlen(aTerminator);
		while (More() && myText.compare(myAt, length, aTerminator) != 0)
		{
			if (aCharactersFlag)
			{
				StepCharacter();
			}
			else
			{
				Step();
			}
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
		while (More())
		{
			const char c = myText[myAt];
			if (c == '"' || c == '\'')
			{
				Step();
				while (More() && myText[myAt] != c)
				{
					StepCharacter();
				}
				if (More())
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
