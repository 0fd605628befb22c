#include "xml/XMLElement.h"

#include <algorithm>
#include <cstdio>
#include <locale>
#include <set>
#include <sstream>

#include <tinyxml.h>

#include "engine/Debug.h"

namespace
{
// Six significant digits in general notation, whatever the user's locale says about decimal points.
std::string FloatText(float aValue)
{
	std::ostringstream stream;
	stream.imbue(std::locale::classic());
	stream << aValue;
	return stream.str();
}

// Appends a copy of every attribute of aSource that aTarget does not hold yet.
void AddMissingAttributes(TiXmlElement& aTarget, const TiXmlElement& aSource)
{
	for (const TiXmlAttribute* attribute = aSource.FirstAttribute(); attribute != nullptr;
	     attribute = attribute->Next())
	{
		if (aTarget.Attribute(attribute->Name()) == nullptr)
		{
			aTarget.SetAttribute(attribute->Name(), attribute->Value());
		}
	}
}
} // namespace

XMLElement::XMLElement(const std::string& anElementName) : myElement(new TiXmlElement(anElementName))
{
}

XMLElement::~XMLElement()
{
	delete myElement;
	myElement = nullptr;
}

template <XMLWritableValue T> void XMLElement::AddAttribute(std::string aTag, const T& aValue)
{
	if constexpr (std::same_as<T, float>)
	{
		myElement->SetAttribute(aTag, FloatText(aValue));
	}
	else if constexpr (std::same_as<T, int>)
	{
		myElement->SetAttribute(aTag, std::to_string(aValue));
	}
	else
	{
		// Stored as it is; TinyXML escapes '<', '&' and quotes when the document is written.
		myElement->SetAttribute(aTag, aValue);
	}
}

template void XMLElement::AddAttribute<float>(std::string, const float&);
template void XMLElement::AddAttribute<int>(std::string, const int&);
template void XMLElement::AddAttribute<std::string>(std::string, const std::string&);

void XMLElement::AddAttribute(std::string aTag, const char* aValue)
{
	AddAttribute<std::string>(aTag, std::string(aValue != nullptr ? aValue : ""));
}

void XMLElement::InsertElement(const XMLElement& aChild)
{
	if (myElement->InsertEndChild(*aChild.myElement) != nullptr)
	{
		return;
	}
	Debug* log = Debug::GetInstance();
	if (log == nullptr)
	{
		// Without a log the refusal still has to be seen.
		std::fprintf(stderr,
		             "XMLElement::InsertElement: Could not insert element [ %s ] into element [ %s ]\n",
		             aChild.myElement->Value(), myElement->Value());
		return;
	}
	log->CriticalErrorMessage(20, "XMLElement::InsertElement",
	                          "Could not insert element [ %s ] into element [ %s ]",
	                          aChild.myElement->Value(), myElement->Value());
}

void XMLElement::AddVector3Attributes(const Vector3<float>& aVector)
{
	AddAttribute("x", aVector.x);
	AddAttribute("y", aVector.y);
	AddAttribute("z", aVector.z);
}

void XMLElement::AddVector4Attributes(const Vector4<float>& aVector)
{
	AddAttribute("r", aVector.x);
	AddAttribute("g", aVector.y);
	AddAttribute("b", aVector.z);
	AddAttribute("a", aVector.w);
}

void XMLElement::AddMatrixAttributes(const Matrix44<float>& aMatrix)
{
	static const char* const ourRowPrefixes[4] = {"r-", "u-", "f-", "p-"};
	static const char* const ourAxisNames[3] = {"x", "y", "z"};
	for (int row = 0; row < 4; ++row)
	{
		for (int column = 0; column < 3; ++column)
		{
			AddAttribute(std::string(ourRowPrefixes[row]) + ourAxisNames[column],
			             aMatrix.myMatrix[4 * row + column]);
		}
	}
}

std::string XMLElement::GetText() const
{
	TiXmlPrinter printer;
	printer.SetStreamPrinting();
	myElement->Accept(&printer);
	return printer.Str();
}

bool XMLElement::SetText(const std::string& aText)
{
	TiXmlDocument document;
	document.Parse(aText.c_str());
	const TiXmlElement* parsed = document.Error() ? nullptr : document.RootElement();
	if (parsed == nullptr)
	{
		return false;
	}
	TiXmlElement* copy = parsed->Clone()->ToElement();
	delete myElement;
	myElement = copy;
	return true;
}

void XMLElement::RemoveValue(const std::string& aTag, const std::string& aName)
{
	TiXmlElement* holder = aTag.empty() ? myElement : myElement->FirstChildElement(aTag);
	if (holder == nullptr)
	{
		return;
	}
	if (!aName.empty())
	{
		holder->RemoveAttribute(aName);
	}
	else if (const TiXmlAttribute* first = holder->FirstAttribute())
	{
		const std::string name = first->Name();
		holder->RemoveAttribute(name);
	}
}

void XMLElement::RemoveChildren(const std::string& aTag, const std::vector<bool>& someFlags,
                                const std::string& aParentTag)
{
	TiXmlNode* parent = aParentTag.empty() ? myElement : myElement->FirstChild(aParentTag);
	if (parent == nullptr)
	{
		return;
	}
	// Matched by name as the cursor's walk matches them, so the places agree with the reader's.
	size_t place = 0;
	TiXmlNode* child = parent->FirstChild(aTag);
	while (child != nullptr)
	{
		TiXmlNode* next = child->NextSibling(aTag);
		if (place < someFlags.size() && someFlags[place])
		{
			parent->RemoveChild(child);
		}
		++place;
		child = next;
	}
}

bool XMLElement::HasContentBeyond(const std::vector<std::string>& someTags) const
{
	if (myElement->FirstAttribute() != nullptr)
	{
		return true;
	}
	std::set<std::string> seen;
	for (const TiXmlNode* child = myElement->FirstChild(); child != nullptr; child = child->NextSibling())
	{
		const TiXmlElement* element = child->ToElement();
		if (element == nullptr || element->FirstAttribute() != nullptr || element->FirstChild() != nullptr)
		{
			return true;
		}
		const std::string& name = element->ValueStr();
		const bool listedFlag = std::find(someTags.begin(), someTags.end(), name) != someTags.end();
		if (!listedFlag || !seen.insert(name).second)
		{
			return true;
		}
	}
	return false;
}

void XMLElement::AddKept(const XMLElement& aKept)
{
	AddMissingAttributes(*myElement, *aKept.myElement);
	// Only the first kept child of a name stands for the child that the reader read; a second
	// one was never read and goes back as it was.
	std::set<std::string> seen;
	for (const TiXmlNode* child = aKept.myElement->FirstChild(); child != nullptr;
	     child = child->NextSibling())
	{
		const TiXmlElement* element = child->ToElement();
		const bool firstFlag = element != nullptr && seen.insert(element->ValueStr()).second;
		TiXmlElement* target = firstFlag ? myElement->FirstChildElement(element->ValueStr()) : nullptr;
		if (target == nullptr)
		{
			myElement->InsertEndChild(*child);
			continue;
		}
		AddMissingAttributes(*target, *element);
		for (const TiXmlNode* grandchild = element->FirstChild(); grandchild != nullptr;
		     grandchild = grandchild->NextSibling())
		{
			target->InsertEndChild(*grandchild);
		}
	}
}
