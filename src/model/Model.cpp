#include "model/Model.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/fx/Effect.h"
#include "platform/fx/Technique.h"

namespace Zeph
{
int Model::ourModelCounter = 0;

namespace
{
struct TechniqueNames
{
	const char* myGiven;
	const char* myGBuffer; // null: unchanged
	const char* myShadow;
};

// The G-buffer and shadow techniques that go with a render technique.
constexpr TechniqueNames ourTechniqueNames[] = {
    {"Render", "RenderGBuffer", "RenderShadowBuffer"},
    {"RenderBase", nullptr, "RenderShadowBufferBase"},
    {"RenderAlphaTest", nullptr, "RenderShadowBufferAlphaTest"},
    {"RenderFrontFace", "RenderGBufferFrontFace", "RenderShadowBufferFrontFace"},
};
} // namespace

Model::Model()
    : myModelID(ourModelCounter++), mySurfaces(4, 4), myChildModels(10, 10), myInputLayoutDesc(10, 10)
{
}

Model::~Model()
{
	myChildModels.DeleteAll();
	ReleaseBuffers();
}

void Model::ReleaseBuffers()
{
	// The layout tells the context to forget it, which needs the context current:
	// models die at shutdown (context current) or with their owner on the GL thread.
	if (myInputLayout)
	{
		myInputLayout->Destroy();
		myInputLayout.reset();
	}
	if (myVertexBuffer)
	{
		myVertexBuffer->Destroy();
		myVertexBuffer.reset();
	}
	if (myIndexBuffer)
	{
		myIndexBuffer->Destroy();
		myIndexBuffer.reset();
	}
}

void Model::SetVertexData(int aCount, int aStride, const void* someData, int aSize)
{
	myVertexCount = aCount;
	myVertexStride = aStride;
	const size_t size = aSize > 0 ? static_cast<size_t>(aSize) : 0;
	myVertexData.assign(size, 0);
	if (someData != nullptr && size > 0)
	{
		std::memcpy(myVertexData.data(), someData, size);
	}
}

void Model::SetIndexData(int aCount, int aFormat, const void* someData, int aSize)
{
	myIndexCount = aCount;
	myIndexFormat = aFormat;
	const size_t size = aSize > 0 ? static_cast<size_t>(aSize) : 0;
	myIndexData.assign(size, 0);
	if (someData != nullptr && size > 0)
	{
		std::memcpy(myIndexData.data(), someData, size);
	}
}

void Model::SetNames(const std::string& aFirstName, const std::string& aTechniqueName,
                     const std::string& aThirdName)
{
	myFirstName = aFirstName;
	myTechniqueName = aTechniqueName;
	myThirdName = aThirdName;
}

void Model::SetInputLayoutDesc(std::span<const Gpu::InputElement> someElements)
{
	myInputLayoutDesc.RemoveAll();
	for (const Gpu::InputElement& element : someElements)
	{
		myInputLayoutDesc.Add(element);
	}
}

bool Model::Init()
{
	if (!myIsNullObject)
	{
		if (!InitVertexBuffer() || !InitIndexBuffer())
		{
			return false;
		}
		if (myEffect != nullptr)
		{
			myRenderTechnique = myEffect->GetTechnique();
			myGBufferTechnique = myEffect->GetTechnique();
		}
	}
	for (Model* child : myChildModels)
	{
		if (!child->Init())
		{
			return false;
		}
	}
	return true;
}

bool Model::InitVertexBuffer()
{
	const char* function = "Zeph::Model::InitVertexBuffer";
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr || myVertexData.empty())
	{
		ReportCritical(__LINE__, function, "Cant Create Vertex Buffer");
		return false;
	}
	if (myInputLayout)
	{
		myInputLayout->Destroy();
		myInputLayout.reset();
	}
	if (myVertexBuffer)
	{
		myVertexBuffer->Destroy();
		myVertexBuffer.reset();
	}
	ComputeLocalBounds();
	Gpu::BufferDesc desc;
	desc.myKind = Gpu::BufferKind::Vertex;
	desc.mySize = myVertexData.size();
	desc.myDynamicFlag = myDynamicVertexBufferFlag;
	desc.myLabel = "model vertices";
	myVertexBuffer = std::make_unique<Gpu::Buffer>();
	if (!myVertexBuffer->Init(engine->GetContext(), desc, myVertexData.data()))
	{
		myVertexBuffer.reset();
		ReportCritical(__LINE__, function, "Cant Create Vertex Buffer");
		return false;
	}
	Fx::Technique* technique = myEffect != nullptr ? myEffect->GetTechnique() : nullptr;
	Fx::Pass* pass = technique != nullptr ? technique->GetPassByIndex(0) : nullptr;
	myInputLayout = std::make_unique<Gpu::InputLayout>();
	if (pass == nullptr || !myInputLayout->Init(engine->GetContext(),
	                                            std::span<const Gpu::InputElement>(myInputLayoutDesc.begin(),
	                                                                               myInputLayoutDesc.end()),
	                                            pass->GetVertexInputs(), "model layout"))
	{
		myInputLayout.reset();
		ReportCritical(__LINE__, function, "Cant Create Input Layout");
		return false;
	}
	return true;
}

bool Model::InitIndexBuffer()
{
	if (myIndexBuffer)
	{
		myIndexBuffer->Destroy();
		myIndexBuffer.reset();
	}
	const bool knownFormat = myIndexFormat == ourIndexFormatR32 || myIndexFormat == ourIndexFormatR16;
	if (Engine::GetInstance() == nullptr || myIndexData.empty() || !knownFormat)
	{
		ReportCritical(__LINE__, "Zeph::Model::InitIndexBuffer", "Cant Create Index Buffer");
		return false;
	}
	Gpu::BufferDesc desc;
	desc.myKind = Gpu::BufferKind::Index;
	desc.mySize = myIndexData.size();
	desc.myLabel = "model indices";
	myIndexBuffer = std::make_unique<Gpu::Buffer>();
	if (!myIndexBuffer->Init(Engine::GetInstance()->GetContext(), desc, myIndexData.data()))
	{
		myIndexBuffer.reset();
		ReportCritical(__LINE__, "Zeph::Model::InitIndexBuffer", "Cant Create Index Buffer");
		return false;
	}
	return true;
}

bool Model::UpdateVertexBuffer()
{
	if (!myVertexBuffer || myVertexBuffer->GetDesc().mySize != myVertexData.size())
	{
		ReportCritical(__LINE__, "Zeph::Model::UpdateVertexBuffer",
		               "The vertex data no longer fits the vertex buffer");
		return false;
	}
	ComputeLocalBounds();
	return myVertexBuffer->Update(myVertexData.data(), myVertexData.size());
}

void Model::ComputeLocalBounds()
{
	myLocalBounds = Intersection::Sphere(Vector3<float>(0.0f, 0.0f, 0.0f), -1.0f);
	// The position is the first element (every vertex type the importer makes starts
	// with it) or one with an explicit offset; anything else stays unknown.
	uint32_t offset = Gpu::InputElement::ourAppendAligned;
	for (int index = 0; index < myInputLayoutDesc.Count(); ++index)
	{
		const Gpu::InputElement& element = myInputLayoutDesc[index];
		if (element.mySemanticName == "POSITION" && element.mySemanticIndex == 0 &&
		    element.myInputSlot == 0 &&
		    (element.myFormat == Dds::Format::R32G32B32_FLOAT ||
		     element.myFormat == Dds::Format::R32G32B32A32_FLOAT))
		{
			offset = index == 0 && element.myAlignedByteOffset == Gpu::InputElement::ourAppendAligned
			             ? 0
			             : element.myAlignedByteOffset;
			break;
		}
	}
	const size_t stride = static_cast<size_t>(myVertexStride);
	const size_t count = static_cast<size_t>(std::max(myVertexCount, 0));
	if (offset == Gpu::InputElement::ourAppendAligned || stride == 0 || count == 0 ||
	    offset + 3 * sizeof(float) > stride || count * stride > myVertexData.size())
	{
		return;
	}
	const auto position = [&](size_t aVertex) {
		float xyz[3];
		std::memcpy(xyz, myVertexData.data() + aVertex * stride + offset, sizeof(xyz));
		return Vector3<float>(xyz[0], xyz[1], xyz[2]);
	};
	Vector3<float> minimum = position(0);
	Vector3<float> maximum = minimum;
	for (size_t vertex = 1; vertex < count; ++vertex)
	{
		const Vector3<float> p = position(vertex);
		minimum.Set(std::min(minimum.x, p.x), std::min(minimum.y, p.y), std::min(minimum.z, p.z));
		maximum.Set(std::max(maximum.x, p.x), std::max(maximum.y, p.y), std::max(maximum.z, p.z));
	}
	const Vector3<float> centre = (minimum + maximum) * 0.5f;
	float radiusSquared = 0.0f;
	for (size_t vertex = 0; vertex < count; ++vertex)
	{
		const Vector3<float> d = position(vertex) - centre;
		radiusSquared = std::max(radiusSquared, d.x * d.x + d.y * d.y + d.z * d.z);
	}
	if (std::isfinite(radiusSquared))
	{
		myLocalBounds = Intersection::Sphere(centre, std::sqrt(radiusSquared));
	}
}

void Model::SetTechniqueByName(const std::string& aName)
{
	if (!myIsNullObject)
	{
		myTechniqueName = aName;
		const TechniqueNames* names = nullptr;
		for (const TechniqueNames& entry : ourTechniqueNames)
		{
			if (aName == entry.myGiven)
			{
				names = &entry;
			}
		}
		if (names != nullptr)
		{
			if (names->myGBuffer != nullptr)
			{
				myGBufferTechniqueName = names->myGBuffer;
			}
			myShadowTechniqueName = names->myShadow;
		}
		Fx::Effect* effect = myEffect != nullptr ? myEffect->GetEffect() : nullptr;
		if (effect != nullptr)
		{
			myRenderTechnique = effect->GetTechniqueByName(myTechniqueName.c_str());
			myGBufferTechnique = effect->GetTechniqueByName(myGBufferTechniqueName.c_str());
			if (names != nullptr)
			{
				myShadowTechnique = effect->GetTechniqueByName(myShadowTechniqueName.c_str());
			}
		}
	}
	for (Model* child : myChildModels)
	{
		child->SetTechniqueByName(aName);
	}
}

bool Model::SetupBuffers(Gpu::Context& aContext) const
{
	if (myIsNullObject || !myVertexBuffer || !myIndexBuffer || !myInputLayout)
	{
		return false;
	}
	aContext.SetInputLayout(myInputLayout.get());
	const Gpu::IndexFormat format =
	    myIndexFormat == ourIndexFormatR16 ? Gpu::IndexFormat::UInt16 : Gpu::IndexFormat::UInt32;
	return aContext.SetVertexBuffer(0, myVertexBuffer.get(), static_cast<uint32_t>(myVertexStride), 0) &&
	       aContext.SetIndexBuffer(myIndexBuffer.get(), format, 0);
}
} // namespace Zeph
