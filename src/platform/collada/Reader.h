#pragma once
// Reader: fills a Collada::Document from a parsed TinyXML tree. Internal to the document; the
// first fault ends the read with a message naming the document, the line and the element.

#include <string>

class TiXmlElement;

namespace Collada
{
class Document;

class Reader
{
public:
	Reader(Document& aDocument, const std::string& aName) : myDocument(aDocument), myName(aName) {}

	// False with anErrorOut set on the first fault; the document is then partly filled.
	bool Read(const TiXmlElement& aRoot, std::string& anErrorOut);

private:
	Document& myDocument;
	std::string myName;
};
} // namespace Collada
