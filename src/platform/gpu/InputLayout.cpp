#include "platform/gpu/InputLayout.h"

#include "platform/gpu/Context.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
namespace
{
struct VertexFormat
{
	GLint mySize = 0; // 0: not a vertex format; GL_BGRA for B8G8R8A8
	GLenum myType = 0;
	bool myNormalizedFlag = false;
	bool myIntegerFlag = false;
	uint32_t myBytes = 0;
};

// A default is needed: Dds::Format holds texture-only formats too.
constexpr VertexFormat GetVertexFormat(Dds::Format aFormat)
{
	using Dds::Format;
	switch (aFormat)
	{
	case Format::R32G32B32A32_FLOAT:
		return {4, GL_FLOAT, false, false, 16};
	case Format::R32G32B32_FLOAT:
		return {3, GL_FLOAT, false, false, 12};
	case Format::R32G32_FLOAT:
		return {2, GL_FLOAT, false, false, 8};
	case Format::R32_FLOAT:
		return {1, GL_FLOAT, false, false, 4};
	case Format::R16G16B16A16_FLOAT:
		return {4, GL_HALF_FLOAT, false, false, 8};
	case Format::R16G16_FLOAT:
		return {2, GL_HALF_FLOAT, false, false, 4};
	case Format::R16G16B16A16_UNORM:
		return {4, GL_UNSIGNED_SHORT, true, false, 8};
	case Format::R10G10B10A2_UNORM:
		return {4, GL_UNSIGNED_INT_2_10_10_10_REV, true, false, 4};
	case Format::R8G8B8A8_UNORM:
		return {4, GL_UNSIGNED_BYTE, true, false, 4};
	case Format::R8G8B8A8_SNORM:
		return {4, GL_BYTE, true, false, 4};
	case Format::R8G8B8A8_UINT:
		return {4, GL_UNSIGNED_BYTE, false, true, 4};
	case Format::R8G8B8A8_SINT:
		return {4, GL_BYTE, false, true, 4};
	case Format::B8G8R8A8_UNORM:
		return {GL_BGRA, GL_UNSIGNED_BYTE, true, false, 4};
	default:
		return {};
	}
}

const AttributeLocation* FindLocation(std::span<const AttributeLocation> someLocations,
                                      const InputElement& anElement)
{
	for (const AttributeLocation& location : someLocations)
	{
		if (location.mySemanticName == anElement.mySemanticName &&
		    location.mySemanticIndex == anElement.mySemanticIndex)
		{
			return &location;
		}
	}
	return nullptr;
}
} // namespace

bool InputLayout::Init(Context& aContext, std::span<const InputElement> someElements,
                       std::span<const AttributeLocation> someLocations, const std::string& aLabel)
{
	const char* function = "Gpu::InputLayout::Init";
	if (myVertexArray != 0)
	{
		ReportError(__LINE__, function, "Input layout '%s': already initialized", aLabel.c_str());
		return false;
	}
	GLint maxAttributes = 0;
	glGetIntegerv(GL_MAX_VERTEX_ATTRIBS, &maxAttributes);
	uint32_t slotEnds[ourSlotCount] = {};
	uint64_t usedLocations = 0;
	for (const InputElement& element : someElements)
	{
		const VertexFormat format = GetVertexFormat(element.myFormat);
		const AttributeLocation* location = FindLocation(someLocations, element);
		const char* problem = nullptr;
		if (format.mySize == 0)
		{
			problem = "format is no vertex format";
		}
		else if (element.myInputSlot >= ourSlotCount)
		{
			problem = "input slot out of range";
		}
		else if (location && (location->myLocation < 0 || location->myLocation >= maxAttributes ||
		                      location->myLocation >= 64))
		{
			problem = "attribute location out of range";
		}
		else if (location && (usedLocations & (uint64_t{1} << location->myLocation)) != 0)
		{
			problem = "two elements feed one attribute location";
		}
		if (problem)
		{
			ReportError(__LINE__, function, "Input layout '%s', element %s%u (%s, slot %u): %s",
			            aLabel.c_str(), element.mySemanticName.c_str(), element.mySemanticIndex,
			            Dds::FormatName(element.myFormat), element.myInputSlot, problem);
			Destroy();
			return false;
		}
		if (myVertexArray == 0)
		{
			glCreateVertexArrays(1, &myVertexArray);
		}
		uint32_t& slotEnd = slotEnds[element.myInputSlot];
		const uint32_t offset = element.myAlignedByteOffset == InputElement::ourAppendAligned
		                            ? slotEnd
		                            : element.myAlignedByteOffset;
		slotEnd = offset + format.myBytes;
		if (location == nullptr)
		{
			continue;
		}
		const GLuint attribute = static_cast<GLuint>(location->myLocation);
		usedLocations |= uint64_t{1} << attribute;
		myUsedSlots |= 1u << element.myInputSlot;
		glEnableVertexArrayAttrib(myVertexArray, attribute);
		if (format.myIntegerFlag)
		{
			glVertexArrayAttribIFormat(myVertexArray, attribute, format.mySize, format.myType, offset);
		}
		else
		{
			glVertexArrayAttribFormat(myVertexArray, attribute, format.mySize, format.myType,
			                          format.myNormalizedFlag ? GL_TRUE : GL_FALSE, offset);
		}
		glVertexArrayAttribBinding(myVertexArray, attribute, element.myInputSlot);
	}
	if (myVertexArray == 0)
	{
		// No elements: vertex shaders that build vertices from gl_VertexID still need a vertex array.
		glCreateVertexArrays(1, &myVertexArray);
	}
	myContext = &aContext;
	LabelObject(GL_VERTEX_ARRAY, myVertexArray, aLabel);
	LUMORA_GL_CHECK(function);
	return true;
}

void InputLayout::Destroy()
{
	if (myVertexArray != 0)
	{
		if (myContext)
		{
			myContext->ForgetInputLayout(*this);
		}
		glDeleteVertexArrays(1, &myVertexArray);
		myVertexArray = 0;
	}
	myUsedSlots = 0;
}
} // namespace Gpu
