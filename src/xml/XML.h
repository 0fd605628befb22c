#pragma once
// XML: a cursor over one TinyXML document, for reading and rewriting the editor's XML files.
//
//   XML xml("data/XML/levels/demo/lights.xml");          // loads at once; any spelling of the path
//   xml.GoToElement("point-lights", "", "");             // cursor on <point-lights> under the root
//   if (xml.EnterChild("point-light"))
//   {
//       do
//       {
//           Vector3<float> position = xml.GetVector3Attribute("position");
//           float falloff = xml.GetChildAttribute<float>("falloff", "");   // "" = first attribute
//       } while (xml.GoToNextSibling("point-light"));
//   }
//   xml.ExitChild();                                     // back on <point-lights>
//
// Writing: stand on a section, RemoveChildren(), InsertElement() records built with XMLElement
// (each insertion appends a copy), then SaveFile() once. Saving writes a temporary next to the
// file and renames it over the original, so a failed save leaves the old file as it was.
//
// The object owns its document. Node positions (the cursor, the previous position, the pushed
// stack) point into it and die with it. Every failure is reported through XML::Error to the
// Debug log as a critical error; when the log is configured so that critical errors return,
// readers yield the type's zero value ("" / 0 / 0.0f / false) and nothing reads through a
// missing node. Walks (GoToElement, EnterChild, GoToNextSibling) and the Try readers report
// nothing and answer false. A number reader that finds no number ("abc", "nan", "inf", "1e40"
// as a float) yields 0 and reports it at the error level, naming file, element and attribute:
// a hand-edited value is a problem to list, not the end of the editor.

#include <concepts>
#include <string>

#include "core/GrowingArray.h"
#include "core/Vector3.h"
#include "core/Vector4.h"

class TiXmlDocument;
class TiXmlNode;
class XMLElement;

// The types an attribute's text can be read as.
template <typename T>
concept XMLReadableValue =
    std::same_as<T, std::string> || std::same_as<T, int> || std::same_as<T, float> || std::same_as<T, bool>;

class XML
{
public:
	XML(std::string aFileName);
	~XML();

	XML(const XML&) = delete;
	XML& operator=(const XML&) = delete;

	// Whether the file was read and parsed into a document with a root element.
	bool HasRootElement() const;

	// Walks down from the root element through up to three levels; an empty name at level 1
	// takes the root's first child of any kind, an empty name at levels 2 and 3 stops there.
	bool GoToElement(std::string aFirstLevelName, std::string aSecondLevelName, std::string aThirdLevelName);
	// Empty name: the first child that is not a comment. On false the cursor stays.
	bool EnterChild(std::string aName);
	// Empty name: the next sibling that is not a comment. On false the cursor is null.
	bool GoToNextSibling(std::string aName);
	// To the parent; after a failed GoToNextSibling, to the parent of the last sibling visited.
	void ExitChild();

	void InsertElement(const XMLElement& anElement, const bool& aSaveFlag);
	void RemoveChildren();
	void SaveFile();
	void Error(const std::string& aMessage);

	// An empty name takes the element's first attribute, whatever it is called.
	template <XMLReadableValue T> T GetAttribute(const std::string& aName);
	template <XMLReadableValue T> T GetChildAttribute(const std::string& aTag, const std::string& aName);
	// As the Get readers, but a failure answers false, leaves aValueRef alone and reports nothing.
	template <XMLReadableValue T> bool TryGetAttribute(T& aValueRef, std::string aName);
	template <XMLReadableValue T>
	bool TryGetChildAttribute(std::string aTag, T& aValueRef, std::string aName);

	// Attributes "x", "y", "z" of the child aTagName, or of the cursor element when it is empty.
	Vector3<float> GetVector3Attribute(const std::string& aTagName);
	// Attributes "r", "g", "b", "a" into x, y, z, w, found the same way.
	Vector4<float> GetVector4Attribute(const std::string& aTagName);

	// Numbers are read by stream extraction in the classic locale ("12abc" is 12, "3.9" as int
	// is 3); bool is true only for "true" and "yes". Needs no document, hence static.
	template <XMLReadableValue T> static T ConvertValue(const char* aValueToConvert);

	void LoadDocument(std::string aFileName);
	void CopyDocument(const std::string& aTargetFileName);
	// Replaces the file with a document holding one empty "root" element and reloads it.
	void CreateEmptyDocument();
	// As InsertElement, into the document's first "root" element; the cursor stays where it was.
	void InsertElementAtRoot(const XMLElement& anElement, const bool& aSaveFlag);
	// Appends a copy of each child of anElement (comments and text too) at the cursor, as
	// InsertElement appends one element: how kept content goes back into a section.
	void InsertChildrenOf(const XMLElement& anElement, const bool& aSaveFlag);
	// A copy of the element under the cursor with everything it holds; false, with aCopyRef as
	// it was, when the cursor is on no element.
	bool CopyCurrentElement(XMLElement& aCopyRef) const;
	void RemoveCurrentElement();
	std::string GetElementName();
	// PushElement saves the cursor (or the previous position when the cursor is null);
	// PopElement returns to the last saved position.
	void PushElement();
	void PopElement();
	void GoToLastChild();

private:
	// The document's name (its file name as given), for messages and for saving.
	std::string GetDocumentName() const;
	// Positions that would dangle once aSubtree is deleted are cleared.
	void ForgetPositionsInside(const TiXmlNode* aSubtree, bool anIncludeRootFlag);
	// Writes the document to a temporary beside aFileName and renames it over the file.
	static bool WriteThroughTemporary(const TiXmlDocument& aDocument, const std::string& aFileName);

	TiXmlDocument* myDocument;
	TiXmlNode* myCurrentElement;
	TiXmlNode* myPreviousElement;
	GrowingArray<TiXmlNode*, unsigned short> myElementStack;
};
