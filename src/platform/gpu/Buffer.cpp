#include "platform/gpu/Buffer.h"

#include <vector>

#include "platform/gpu/Context.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
bool Buffer::Init(Context& aContext, const BufferDesc& aDesc, const void* someData)
{
	if (myName != 0 || aDesc.mySize == 0)
	{
		ReportError(__LINE__, "Gpu::Buffer::Init", "Buffer '%s': %s", aDesc.myLabel.c_str(),
		            myName != 0 ? "already initialized" : "size 0");
		return false;
	}
	// Direct3D zero-fills buffers created without data; GL leaves them undefined.
	std::vector<unsigned char> zeros;
	if (someData == nullptr)
	{
		zeros.resize(aDesc.mySize);
		someData = zeros.data();
	}
	myDesc = aDesc;
	myContext = &aContext;
	glCreateBuffers(1, &myName);
	glNamedBufferStorage(myName, static_cast<GLsizeiptr>(aDesc.mySize), someData,
	                     aDesc.myDynamicFlag ? GL_DYNAMIC_STORAGE_BIT : 0);
	LabelObject(GL_BUFFER, myName, aDesc.myLabel);
	LUMORA_GL_CHECK("Gpu::Buffer::Init");
	return true;
}

void Buffer::Destroy()
{
	if (myName != 0)
	{
		myContext->ForgetBuffer(myName);
		glDeleteBuffers(1, &myName);
		myName = 0;
	}
}

bool Buffer::Update(const void* someData, size_t aSize, size_t anOffset)
{
	if (myName == 0 || !myDesc.myDynamicFlag || someData == nullptr || anOffset > myDesc.mySize ||
	    aSize > myDesc.mySize - anOffset)
	{
		ReportError(__LINE__, "Gpu::Buffer::Update",
		            "Buffer '%s' (%zu bytes%s): cannot write %zu bytes at %zu", myDesc.myLabel.c_str(),
		            myDesc.mySize, myDesc.myDynamicFlag ? "" : ", immutable", aSize, anOffset);
		return false;
	}
	glNamedBufferSubData(myName, static_cast<GLintptr>(anOffset), static_cast<GLsizeiptr>(aSize), someData);
	LUMORA_GL_CHECK("Gpu::Buffer::Update");
	return true;
}
} // namespace Gpu
