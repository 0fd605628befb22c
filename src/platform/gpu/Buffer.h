#pragma once
// Buffer: vertex, index and constant data in GPU memory.
//
//   Gpu::BufferDesc desc{.myKind = Gpu::BufferKind::Constant, .mySize = sizeof(FrameConstants),
//                        .myDynamicFlag = true, .myLabel = "frame constants"};
//   Gpu::Buffer constants;
//   constants.Init(device.GetContext(), desc, nullptr);
//   constants.Update(&frame, sizeof(frame));      // dynamic buffers only
//
// Storage is immutable in size (glNamedBufferStorage); only a dynamic buffer may
// change its contents afterwards, as with Direct3D's usage flags. The kind picks
// where it binds later (vertex/index/uniform block); GL itself does not care.
// Destroying a buffer unbinds it from the context it was made for, as releasing a bound
// Direct3D buffer never left a dangling binding: GL reuses the name at once, and a later
// draw would otherwise read the new buffer (or none) where the old one was bound.

#include <cstddef>
#include <epoxy/gl.h>
#include <string>

namespace Gpu
{
class Context;

enum class BufferKind
{
	Vertex,
	Index,
	Constant,
};

struct BufferDesc
{
	BufferKind myKind = BufferKind::Vertex;
	size_t mySize = 0;
	bool myDynamicFlag = false;
	std::string myLabel;
};

class Buffer
{
public:
	Buffer() = default;
	~Buffer() = default;
	Buffer(const Buffer&) = delete;
	Buffer& operator=(const Buffer&) = delete;

	// someData: mySize bytes of initial contents; null leaves them zero.
	bool Init(Context& aContext, const BufferDesc& aDesc, const void* someData);
	void Destroy();
	bool Update(const void* someData, size_t aSize, size_t anOffset = 0);

	GLuint GetName() const { return myName; }
	const BufferDesc& GetDesc() const { return myDesc; }

private:
	BufferDesc myDesc;
	Context* myContext = nullptr;
	GLuint myName = 0;
};
} // namespace Gpu
