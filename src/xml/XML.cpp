#include "xml/XML.h"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <locale>
#include <sstream>

#include <tinyxml.h>

#include "engine/Debug.h"
#include "engine/EngineReport.h"
#include "platform/paths/Paths.h"
#include "platform/xmlscan/NestingScan.h"
#include "xml/XMLElement.h"

namespace
{
// Every report of the cursor carries this line and function name, whichever operation made it.
constexpr int ourErrorLine = 278;

const TiXmlAttribute* FirstAttributeOf(const TiXmlNode* aNode)
{
	// A comment or text node under the cursor has no attributes; it reads like an element without any.
	const TiXmlElement* element = aNode != nullptr ? aNode->ToElement() : nullptr;
	return element != nullptr ? element->FirstAttribute() : nullptr;
}

// An empty name stands for the first attribute: that is how the level files store single values.
const TiXmlAttribute* AttributeNamed(const TiXmlAttribute* aFirstAttribute, const std::string& aName)
{
	if (aName.empty())
	{
		return aFirstAttribute;
	}
	for (const TiXmlAttribute* attribute = aFirstAttribute; attribute != nullptr;
	     attribute = attribute->Next())
	{
		if (aName == attribute->Name())
		{
			return attribute;
		}
	}
	return nullptr;
}

const char* NameOf(const TiXmlNode* aNode)
{
	return aNode != nullptr ? aNode->Value() : "";
}

// Whether stream extraction reads a finite number of type T from the start of the text, as the
// readers read it (text after the number is let pass: "12abc" reads as 12). "abc", "nan", "inf"
// and a value out of the type's range ("1e40" as a float) do not.
template <typename T> bool ReadsAsNumber(const char* aText)
{
	std::istringstream stream(aText != nullptr ? aText : "");
	stream.imbue(std::locale::classic());
	T value{};
	stream >> value;
	if constexpr (std::same_as<T, float>)
	{
		return !stream.fail() && std::isfinite(value);
	}
	return !stream.fail();
}

// Not the cursor's critical report: a value that is not a number reads as 0 and the editor goes
// on, while a tool that lists problems hears of it with the file, element and attribute.
void ReportNotANumber(const std::string& aMessage)
{
	Zeph::ReportError(__LINE__, "XML::ConvertValue", "%s", aMessage.c_str());
}

// For the numeric readers: true for any other type, or when the attribute's value reads as a
// number; otherwise reported with the attribute and where it stands (aWhere), and false.
template <typename T> bool IsNumberWhereOneGoes(const TiXmlAttribute* anAttribute, const std::string& aWhere)
{
	if constexpr (std::same_as<T, int> || std::same_as<T, float>)
	{
		if (!ReadsAsNumber<T>(anAttribute->Value()))
		{
			ReportNotANumber("Not a number [" + std::string(anAttribute->Value()) + "] in attribute [" +
			                 anAttribute->Name() + "] of " + aWhere);
			return false;
		}
	}
	return true;
}

std::string ReadAll(FILE* aFile)
{
	std::string text;
	char buffer[65536];
	for (size_t count = 0; (count = std::fread(buffer, 1, sizeof(buffer), aFile)) > 0;)
	{
		text.append(buffer, count);
	}
	return text;
}
} // namespace

XML::XML(std::string aFileName)
    : myDocument(nullptr), myCurrentElement(nullptr), myPreviousElement(nullptr), myElementStack(50, 5, true)
{
	LoadDocument(aFileName);
	myPreviousElement = nullptr;
}

XML::~XML()
{
	delete myDocument;
	myDocument = nullptr;
	myCurrentElement = nullptr;
	myPreviousElement = nullptr;
}

void XML::LoadDocument(std::string aFileName)
{
	delete myDocument;
	// The document keeps the name as given, for messages and for saving; the file itself is found
	// whatever the case of its path components.
	myDocument = new TiXmlDocument(aFileName);
	myCurrentElement = nullptr;
	myPreviousElement = nullptr;
	myElementStack.RemoveAll();

	bool loadedFlag = false;
	// Why the file was not read, beyond that it could not be opened.
	std::string reason;
	// A folder opens as a file on Linux and then measures as endless: only a regular file is read.
	const std::string resolved = Paths::Resolve(aFileName);
	std::error_code ignored;
	if (!std::filesystem::is_regular_file(resolved, ignored) && std::filesystem::exists(resolved, ignored))
	{
		reason = ": it is not a file";
	}
	else if (FILE* file = std::fopen(resolved.c_str(), "rb"))
	{
		// TinyXML parses nested elements by recursion: a file nested thousands deep would
		// overflow the stack inside the parser, so such a file is refused before parsing.
		const std::string text = ReadAll(file);
		const int line = XmlScan::FindTooDeep(text, XmlScan::ourMaxDepth);
		if (line > 0)
		{
			reason = ": " + XmlScan::Describe(line, XmlScan::ourMaxDepth);
		}
		else if (std::fseek(file, 0, SEEK_SET) == 0)
		{
			loadedFlag = myDocument->LoadFile(file);
		}
		std::fclose(file);
	}
	if (!loadedFlag)
	{
		// Half a parse is not a document: drop it, so walks find nothing. The error state stays set
		// and keeps SaveFile from writing the empty document over a file that merely failed to parse.
		myDocument->Clear();
		if (!myDocument->Error())
		{
			myDocument->SetError(TiXmlBase::TIXML_ERROR_OPENING_FILE, nullptr, nullptr,
			                     TIXML_ENCODING_UNKNOWN);
		}
		Error("Could not open file [" + aFileName + "]" + reason);
	}
}

std::string XML::GetDocumentName() const
{
	return myDocument != nullptr ? myDocument->ValueStr() : std::string();
}

void XML::Error(const std::string& aMessage)
{
	Debug* log = Debug::GetInstance();
	if (log == nullptr)
	{
		// Tools and tests may run without a log; the message must still reach someone.
		std::fprintf(stderr, "XML::Error: %s\n", aMessage.c_str());
		return;
	}
	// Names come from files and may hold '%': the message is an argument, never the format.
	log->CriticalErrorMessage(ourErrorLine, "XML::Error", "%s", aMessage.c_str());
}

bool XML::HasRootElement() const
{
	return myDocument != nullptr && myDocument->RootElement() != nullptr;
}

bool XML::GoToElement(std::string aFirstLevelName, std::string aSecondLevelName, std::string aThirdLevelName)
{
	myCurrentElement = myDocument != nullptr ? myDocument->RootElement() : nullptr;
	if (myCurrentElement == nullptr)
	{
		return false;
	}
	// Level 1 with an empty name takes any first child, comments included; levels 2 and 3 with an
	// empty name simply stop the walk.
	myCurrentElement = aFirstLevelName.empty() ? myCurrentElement->FirstChild()
	                                           : myCurrentElement->FirstChild(aFirstLevelName);
	if (myCurrentElement != nullptr && !aSecondLevelName.empty())
	{
		myCurrentElement = myCurrentElement->FirstChild(aSecondLevelName);
		if (myCurrentElement != nullptr && !aThirdLevelName.empty())
		{
			myCurrentElement = myCurrentElement->FirstChild(aThirdLevelName);
		}
	}
	return myCurrentElement != nullptr;
}

bool XML::EnterChild(std::string aName)
{
	if (myCurrentElement == nullptr)
	{
		return false;
	}
	TiXmlNode* child = nullptr;
	if (aName.empty())
	{
		child = myCurrentElement->FirstChild();
		while (child != nullptr && child->Type() == TiXmlNode::TINYXML_COMMENT)
		{
			child = child->NextSibling();
		}
	}
	else
	{
		child = myCurrentElement->FirstChild(aName);
	}
	if (child == nullptr)
	{
		return false;
	}
	myCurrentElement = child;
	return true;
}

bool XML::GoToNextSibling(std::string aName)
{
	// Remembered so that ExitChild can find the section again once the walk has run off its end.
	myPreviousElement = myCurrentElement;
	if (myCurrentElement == nullptr)
	{
		return false;
	}
	if (aName.empty())
	{
		TiXmlNode* sibling = myCurrentElement->NextSibling();
		while (sibling != nullptr && sibling->Type() == TiXmlNode::TINYXML_COMMENT)
		{
			sibling = sibling->NextSibling();
		}
		myCurrentElement = sibling;
	}
	else
	{
		myCurrentElement = myCurrentElement->NextSibling(aName);
	}
	return myCurrentElement != nullptr;
}

void XML::ExitChild()
{
	if (myCurrentElement == nullptr)
	{
		myCurrentElement = myPreviousElement;
	}
	// Without any position there is no node to name; the message keeps its usual shape with an
	// empty name rather than inventing a new one.
	TiXmlNode* parent = myCurrentElement != nullptr ? myCurrentElement->Parent() : nullptr;
	if (parent == nullptr)
	{
		Error("Could not find element [" + std::string(NameOf(myCurrentElement)) + "] in [" +
		      GetDocumentName() + "]");
		myCurrentElement = nullptr;
		return;
	}
	myCurrentElement = parent;
}

void XML::InsertElement(const XMLElement& anElement, const bool& aSaveFlag)
{
	// Only an element or the document can hold children that TinyXML writes out; a copy hung under a
	// comment or a text node would vanish silently on save, so that is refused with the same message.
	const bool canHoldFlag = myCurrentElement != nullptr && (myCurrentElement->ToElement() != nullptr ||
	                                                         myCurrentElement->ToDocument() != nullptr);
	if (!canHoldFlag || myCurrentElement->InsertEndChild(*anElement.myElement) == nullptr)
	{
		Error("Could not insert element [" + anElement.myElement->ValueStr() + "] in file [" +
		      GetDocumentName() + "]");
	}
	if (aSaveFlag)
	{
		SaveFile();
	}
}

void XML::InsertChildrenOf(const XMLElement& anElement, const bool& aSaveFlag)
{
	const bool canHoldFlag = myCurrentElement != nullptr && (myCurrentElement->ToElement() != nullptr ||
	                                                         myCurrentElement->ToDocument() != nullptr);
	for (const TiXmlNode* child = anElement.myElement->FirstChild(); child != nullptr;
	     child = child->NextSibling())
	{
		if (!canHoldFlag || myCurrentElement->InsertEndChild(*child) == nullptr)
		{
			Error("Could not insert element [" + child->ValueStr() + "] in file [" + GetDocumentName() + "]");
			break;
		}
	}
	if (aSaveFlag)
	{
		SaveFile();
	}
}

bool XML::CopyCurrentElement(XMLElement& aCopyRef) const
{
	const TiXmlElement* element = myCurrentElement != nullptr ? myCurrentElement->ToElement() : nullptr;
	if (element == nullptr)
	{
		return false;
	}
	TiXmlElement* copy = element->Clone()->ToElement();
	delete aCopyRef.myElement;
	aCopyRef.myElement = copy;
	return true;
}

void XML::InsertElementAtRoot(const XMLElement& anElement, const bool& aSaveFlag)
{
	TiXmlNode* keptElement = myCurrentElement;
	myCurrentElement = myDocument != nullptr ? myDocument->FirstChild("root") : nullptr;
	InsertElement(anElement, aSaveFlag);
	myCurrentElement = keptElement;
}

void XML::ForgetPositionsInside(const TiXmlNode* aSubtree, bool anIncludeRootFlag)
{
	auto isInside = [aSubtree, anIncludeRootFlag](const TiXmlNode* aNode) {
		for (const TiXmlNode* node = aNode; node != nullptr; node = node->Parent())
		{
			if (node == aSubtree)
			{
				return anIncludeRootFlag || aNode != aSubtree;
			}
		}
		return false;
	};
	if (isInside(myCurrentElement))
	{
		myCurrentElement = nullptr;
	}
	if (isInside(myPreviousElement))
	{
		myPreviousElement = nullptr;
	}
	// Entries are cleared rather than dropped, so pushes and pops still pair up; popping one
	// leaves the cursor null, as after a walk that found nothing.
	for (TiXmlNode*& entry : myElementStack)
	{
		if (isInside(entry))
		{
			entry = nullptr;
		}
	}
}

void XML::RemoveChildren()
{
	if (myCurrentElement == nullptr)
	{
		Error("No node set to remove children from");
		return;
	}
	ForgetPositionsInside(myCurrentElement, false);
	myCurrentElement->Clear();
}

void XML::RemoveCurrentElement()
{
	if (myCurrentElement == nullptr)
	{
		Error("No node set to remove");
		return;
	}
	TiXmlNode* parent = myCurrentElement->Parent();
	if (parent == nullptr)
	{
		// Only the document itself has no parent (ExitChild from the root reaches it); deleting it
		// would leave the cursor without anything to stand on.
		Error("Could not remove element [" + std::string(NameOf(myCurrentElement)) + "] in [" +
		      GetDocumentName() + "]");
		return;
	}
	TiXmlNode* removed = myCurrentElement;
	ForgetPositionsInside(removed, true);
	parent->RemoveChild(removed);
	myCurrentElement = nullptr;
}

bool XML::WriteThroughTemporary(const TiXmlDocument& aDocument, const std::string& aFileName)
{
	const std::string target = Paths::PrepareForWrite(aFileName);
	if (target.empty())
	{
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	if (temporary.empty())
	{
		return false;
	}
	// TemporaryFor made the file (empty, ours): every way out below removes it.
	FILE* file = std::fopen(temporary.c_str(), "w");
	if (file == nullptr)
	{
		std::remove(temporary.c_str());
		return false;
	}
	bool writtenFlag = aDocument.SaveFile(file);
	// TinyXML's printing does not look at what fwrite answered: the stream's error state
	// does, and a full disk often shows only when the buffer is flushed at close.
	writtenFlag = std::fflush(file) == 0 && std::ferror(file) == 0 && writtenFlag;
	writtenFlag = std::fclose(file) == 0 && writtenFlag;
	if (!writtenFlag)
	{
		std::remove(temporary.c_str());
		return false;
	}
	return Paths::ReplaceWith(temporary, target);
}

void XML::SaveFile()
{
	const std::string name = GetDocumentName();
	// A document that failed to load holds nothing of its file; writing it would replace a file that
	// is only malformed, and still worth fixing by hand, with an empty one.
	if (myDocument == nullptr || myDocument->Error() || !WriteThroughTemporary(*myDocument, name))
	{
		Error("Could not save file [" + name + "]");
	}
}

void XML::CopyDocument(const std::string& aTargetFileName)
{
	// A document that failed to load counts as none: copying it would only produce an empty file.
	if (myDocument == nullptr || myDocument->Error())
	{
		Error("No document set to copy");
		return;
	}
	// Through a temporary like every other write, so a failed copy leaves an existing target as it was.
	if (!WriteThroughTemporary(*myDocument, aTargetFileName))
	{
		Error("Couldn't copy document [" + GetDocumentName() + "] to [" + aTargetFileName + "]");
	}
}

void XML::CreateEmptyDocument()
{
	const std::string name = GetDocumentName();
	TiXmlDocument emptyDocument(name);
	emptyDocument.LinkEndChild(new TiXmlElement("root"));
	if (!WriteThroughTemporary(emptyDocument, name))
	{
		Error("Could not save file [" + name + "]");
	}
	// Reloaded even after a failed save, so that the cursor shows what the file really holds.
	LoadDocument(name);
}

std::string XML::GetElementName()
{
	if (myCurrentElement == nullptr)
	{
		Error("No node set to get name from");
		return std::string();
	}
	return myCurrentElement->ValueStr();
}

void XML::PushElement()
{
	myElementStack.Add(myCurrentElement != nullptr ? myCurrentElement : myPreviousElement);
}

void XML::PopElement()
{
	if (myElementStack.Count() == 0)
	{
		Error("Stack is empty!\n");
		return;
	}
	myCurrentElement = myElementStack.Last();
	myElementStack.RemoveLast();
}

void XML::GoToLastChild()
{
	TiXmlNode* lastChild = myCurrentElement != nullptr ? myCurrentElement->LastChild() : nullptr;
	if (lastChild == nullptr)
	{
		Error("Node doesn't have a child");
		return;
	}
	myCurrentElement = lastChild;
}

// Every reader that reports returns the type's zero value afterwards: with a log whose critical
// errors are not fatal the caller goes on, and must get a defined value without anything having
// been read through a missing node.

template <XMLReadableValue T> T XML::GetAttribute(const std::string& aName)
{
	if (myCurrentElement == nullptr)
	{
		Error("No Current Element");
		return T{};
	}
	const std::string elementName = myCurrentElement->ValueStr();
	const TiXmlAttribute* firstAttribute = FirstAttributeOf(myCurrentElement);
	if (firstAttribute == nullptr)
	{
		// Single-letter names (the vector components) are left out of this message.
		const std::string label = aName.size() > 1 ? " [" + aName + "]" : std::string();
		Error("Could not get attribute" + label + " in [" + elementName + "] in [" + GetDocumentName() + "]");
		return T{};
	}
	const TiXmlAttribute* attribute = AttributeNamed(firstAttribute, aName);
	if (attribute == nullptr)
	{
		Error("Could not find name [" + aName + "] in [" + elementName + "] in [" + GetDocumentName() + "]");
		return T{};
	}
	if (!IsNumberWhereOneGoes<T>(attribute, "[" + elementName + "] in [" + GetDocumentName() + "]"))
	{
		return T{};
	}
	return ConvertValue<T>(attribute->Value());
}

template <XMLReadableValue T> T XML::GetChildAttribute(const std::string& aTag, const std::string& aName)
{
	if (myCurrentElement == nullptr)
	{
		Error("No Element. [" + aTag + "]");
		return T{};
	}
	const std::string elementName = myCurrentElement->ValueStr();
	const TiXmlNode* child = myCurrentElement->FirstChild(aTag);
	if (child == nullptr)
	{
		Error("Could not find attribute [" + aTag + "] in [" + elementName + "] in [" + GetDocumentName() +
		      "]");
		return T{};
	}
	const TiXmlAttribute* firstAttribute = FirstAttributeOf(child);
	if (firstAttribute == nullptr)
	{
		Error("Could not make attribute [" + aTag + "] in [" + elementName + "] in [" + GetDocumentName() +
		      "]");
		return T{};
	}
	const TiXmlAttribute* attribute = AttributeNamed(firstAttribute, aName);
	if (attribute == nullptr)
	{
		Error("Could not find name [" + aName + "] in [" + aTag + "] in [" + elementName + "] in [" +
		      GetDocumentName() + "]");
		return T{};
	}
	if (!IsNumberWhereOneGoes<T>(attribute,
	                             "[" + aTag + "] in [" + elementName + "] in [" + GetDocumentName() + "]"))
	{
		return T{};
	}
	return ConvertValue<T>(attribute->Value());
}

template <XMLReadableValue T> bool XML::TryGetAttribute(T& aValueRef, std::string aName)
{
	const TiXmlAttribute* attribute = AttributeNamed(FirstAttributeOf(myCurrentElement), aName);
	if (attribute == nullptr)
	{
		return false;
	}
	aValueRef = ConvertValue<T>(attribute->Value());
	return true;
}

template <XMLReadableValue T>
bool XML::TryGetChildAttribute(std::string aTag, T& aValueRef, std::string aName)
{
	const TiXmlNode* child = myCurrentElement != nullptr ? myCurrentElement->FirstChild(aTag) : nullptr;
	const TiXmlAttribute* attribute = AttributeNamed(FirstAttributeOf(child), aName);
	if (attribute == nullptr)
	{
		return false;
	}
	aValueRef = ConvertValue<T>(attribute->Value());
	return true;
}

Vector3<float> XML::GetVector3Attribute(const std::string& aTagName)
{
	Vector3<float> vector(0.0f, 0.0f, 0.0f);
	if (aTagName.empty())
	{
		vector.x = GetAttribute<float>("x");
		vector.y = GetAttribute<float>("y");
		vector.z = GetAttribute<float>("z");
	}
	else
	{
		vector.x = GetChildAttribute<float>(aTagName, "x");
		vector.y = GetChildAttribute<float>(aTagName, "y");
		vector.z = GetChildAttribute<float>(aTagName, "z");
	}
	return vector;
}

Vector4<float> XML::GetVector4Attribute(const std::string& aTagName)
{
	Vector4<float> vector(0.0f, 0.0f, 0.0f, 0.0f);
	if (aTagName.empty())
	{
		vector.x = GetAttribute<float>("r");
		vector.y = GetAttribute<float>("g");
		vector.z = GetAttribute<float>("b");
		vector.w = GetAttribute<float>("a");
	}
	else
	{
		vector.x = GetChildAttribute<float>(aTagName, "r");
		vector.y = GetChildAttribute<float>(aTagName, "g");
		vector.z = GetChildAttribute<float>(aTagName, "b");
		vector.w = GetChildAttribute<float>(aTagName, "a");
	}
	return vector;
}

template <XMLReadableValue T> T XML::ConvertValue(const char* aValueToConvert)
{
	const char* text = aValueToConvert != nullptr ? aValueToConvert : "";
	if constexpr (std::same_as<T, std::string>)
	{
		return std::string(text);
	}
	else if constexpr (std::same_as<T, bool>)
	{
		return std::strcmp(text, "true") == 0 || std::strcmp(text, "yes") == 0;
	}
	else
	{
		// The classic locale, so that a user's locale can never turn "2.5" into 2 or 25.
		std::stringstream stream(std::string(text), std::ios::in | std::ios::out);
		stream.imbue(std::locale::classic());
		// A text that does not start with a number ("abc") reads as 0: the extraction stores 0 on
		// failure, and starting from 0 keeps that true for any library.
		T value{};
		stream >> value;
		return value;
	}
}

template int XML::GetAttribute<int>(const std::string&);
template float XML::GetAttribute<float>(const std::string&);
template bool XML::GetAttribute<bool>(const std::string&);
template std::string XML::GetAttribute<std::string>(const std::string&);

template int XML::GetChildAttribute<int>(const std::string&, const std::string&);
template float XML::GetChildAttribute<float>(const std::string&, const std::string&);
template bool XML::GetChildAttribute<bool>(const std::string&, const std::string&);
template std::string XML::GetChildAttribute<std::string>(const std::string&, const std::string&);

template bool XML::TryGetAttribute<int>(int&, std::string);
template bool XML::TryGetAttribute<float>(float&, std::string);
template bool XML::TryGetAttribute<bool>(bool&, std::string);
template bool XML::TryGetAttribute<std::string>(std::string&, std::string);

template bool XML::TryGetChildAttribute<int>(std::string, int&, std::string);
template bool XML::TryGetChildAttribute<float>(std::string, float&, std::string);
template bool XML::TryGetChildAttribute<bool>(std::string, bool&, std::string);
template bool XML::TryGetChildAttribute<std::string>(std::string, std::string&, std::string);

template int XML::ConvertValue<int>(const char*);
template float XML::ConvertValue<float>(const char*);
template bool XML::ConvertValue<bool>(const char*);
template std::string XML::ConvertValue<std::string>(const char*);
