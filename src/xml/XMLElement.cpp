#include "xml/XMLElement.h"

#include <cstdio>
#include <locale>
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

void XMLElement::RemoveChildren(const std::string& aTag, const std::vector<bool>& someFlags)
{
	// Matched by name as the cursor's walk matches them, so the places agree with the reader's.
	size_t place = 0;
	TiXmlNode* child = myElement->FirstChild(aTag);
	while (child != nullptr)
	{
		TiXmlNode* next = child->NextSibling(aTag);
		if (place < someFlags.size() && someFlags[place])
		{
			myElement->RemoveChild(child);
		}
		++place;
		child = next;
	}
}
