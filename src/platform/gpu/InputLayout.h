#pragma once
// InputLayout: how vertex buffer bytes become vertex shader inputs, described as
// Direct3D 11 describes them, realised as a vertex array object.
//
//   const Gpu::InputElement elements[] = {
//       {"POSITION", 0, Dds::Format::R32G32B32_FLOAT, 0, 0},
//       {"COLOR", 0, Dds::Format::R8G8B8A8_UNORM, 0, Gpu::InputElement::ourAppendAligned},
//   };
//   const Gpu::AttributeLocation locations[] = {{"POSITION", 0, 0}, {"COLOR", 0, 1}};
//   Gpu::InputLayout layout;
//   layout.Init(context, elements, locations, "mesh vertices");
//   context.SetInputLayout(&layout);
//
// GLSL has no semantics, so the program's reflection (the effect system) says
// which attribute location each (semantic name, index) pair feeds; an element the
// program does not read has no location and is left out, as Direct3D ignores it.
// Buffers are not part of the layout: the context attaches the buffers set per
// slot to the layout's vertex array when it draws.

#include <cstdint>
#include <epoxy/gl.h>
#include <span>
#include <string>
#include <vector>

#include "platform/dds/Format.h"

namespace Gpu
{
class Context;

struct InputElement
{
	// Direct3D's D3D11_APPEND_ALIGNED_ELEMENT: right after the previous element of the same slot.
	static constexpr uint32_t ourAppendAligned = 0xffffffffu;

	std::string mySemanticName;
	uint32_t mySemanticIndex = 0;
	Dds::Format myFormat = Dds::Format::UNKNOWN;
	uint32_t myInputSlot = 0;
	uint32_t myAlignedByteOffset = 0;
};

struct AttributeLocation
{
	std::string mySemanticName;
	uint32_t mySemanticIndex = 0;
	int myLocation = 0;
};

class InputLayout
{
public:
	// Vertex buffer slots, as many as GL guarantees attribute bindings.
	static constexpr uint32_t ourSlotCount = 16;

	InputLayout() = default;
	~InputLayout() = default;
	InputLayout(const InputLayout&) = delete;
	InputLayout& operator=(const InputLayout&) = delete;

	// Reports and returns false for a format that is no vertex format, a slot
	// beyond ourSlotCount, or two elements feeding the same location.
	bool Init(Context& aContext, std::span<const InputElement> someElements,
	          std::span<const AttributeLocation> someLocations, const std::string& aLabel);
	void Destroy();

	GLuint GetVertexArray() const { return myVertexArray; }
	// Bit n set: slot n feeds at least one attribute.
	uint32_t GetUsedSlots() const { return myUsedSlots; }

private:
	Context* myContext = nullptr;
	GLuint myVertexArray = 0;
	uint32_t myUsedSlots = 0;
};
} // namespace Gpu
