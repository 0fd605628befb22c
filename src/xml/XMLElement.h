#pragma once
// XMLElement: a detached element that saving code fills before handing it to an XML cursor.
//
//   XMLElement position("position");
//   position.AddVector3Attributes(light.myPosition);            // x="..." y="..." z="..."
//   XMLElement record("point-light");
//   record.InsertElement(position);                             // appends a copy
//   xml.InsertElement(record, false);                           // appends a copy again
//
// Every insertion copies the element with all it holds at that moment, so build records from the
// leaves up; changing an XMLElement after inserting it does not reach the copy. The object owns
// its element and is never linked into a document itself.
//
// Kept content. What a section held beside the records a reader took (comments, foreign
// elements, records left out) travels to the next save as text: the reader copies the section
// (XML::CopyCurrentElement), takes out the records it read with RemoveChildren, and keeps the
// rest with GetText; the saver, after writing the records, appends the kept children back:
//
//   XMLElement kept("kept");
//   if (kept.SetText(someKeptText))
//       xml.InsertChildrenOf(kept, false);

#include <concepts>
#include <string>
#include <vector>

#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "core/Vector4.h"

class TiXmlElement;

// The types an attribute can be written from.
template <typename T>
concept XMLWritableValue = std::same_as<T, float> || std::same_as<T, int> || std::same_as<T, std::string>;

class XMLElement
{
public:
	XMLElement(const std::string& anElementName);
	~XMLElement();

	XMLElement(const XMLElement&) = delete;
	XMLElement& operator=(const XMLElement&) = delete;

	// Floats are written with six significant digits (0.1, 2, 0.333333, 1.23457e+06), ints in
	// decimal, strings as they are; setting a name again replaces its value.
	template <XMLWritableValue T> void AddAttribute(std::string aTag, const T& aValue);
	// So that a literal can be written without spelling out std::string.
	void AddAttribute(std::string aTag, const char* aValue);

	void InsertElement(const XMLElement& aChild);

	void AddVector3Attributes(const Vector3<float>& aVector);
	void AddVector4Attributes(const Vector4<float>& aVector);
	// "r-", "u-", "f-", "p-" followed by "x", "y", "z": right, up, forward and position rows.
	void AddMatrixAttributes(const Matrix44<float>& aMatrix);

	// The element with all it holds as one line of XML, and back: SetText replaces the element
	// with the one the text holds (false, and nothing changed, when it holds none).
	std::string GetText() const;
	bool SetText(const std::string& aText);
	// Takes out the children named aTag whose place among them (0, 1, ...) is flagged.
	void RemoveChildren(const std::string& aTag, const std::vector<bool>& someFlags);

private:
	friend class XML;

	TiXmlElement* myElement;
};
