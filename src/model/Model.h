#pragma once
// Model: the drawable part of a model node: vertex and index data with their GPU
// buffers, the vertex layout matched against the effect's vertex inputs, the
// surfaces drawn from the index buffer, the techniques, and child models that are
// initialised and switched together with this one.
//
//   Zeph::Model* model = new Zeph::Model();
//   model->SetVertexData(8, 28, vertices, sizeof(vertices));
//   model->SetIndexData(36, Zeph::Model::ourIndexFormatR32, indices, sizeof(indices));
//   model->SetInputLayoutDesc(elements);
//   model->SetEffect(effect);                          // shared, owned by the EffectContainer
//   model->GetSurfaces().Add(surface);
//   if (!model->Init()) { ... reported ... }           // buffers, layout, technique pointers
//
// A model tree is shared by every Instance of it and owned by the ModelFactory (or,
// for a single line, by its DebugLine). Needs the Engine (its context current) from
// Init on; the GPU objects are released with the model.
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "core/GrowingArray.h"
#include "core/Sphere.h"
#include "model/ModelAnimationData.h"
#include "model/Surface.h"
#include "platform/gpu/Buffer.h"
#include "platform/gpu/InputLayout.h"

namespace Fx
{
class Technique;
}

namespace Zeph
{
class Effect;

class Model
{
public:
	// DXGI numbers of the two index formats.
	static constexpr int ourIndexFormatR32 = 42;
	static constexpr int ourIndexFormatR16 = 57;

	Model();
	~Model();
	Model(const Model&) = delete;
	Model& operator=(const Model&) = delete;

	// InitVertexBuffer, InitIndexBuffer and the technique pointers (set to the
	// effect's current technique), then the child models. A null object skips its
	// own part. False after the first failing step's report.
	bool Init();
	// An immutable vertex buffer (dynamic when SetDynamicVertexBufferFlag was set)
	// and the input layout from the layout description and the vertex inputs of the
	// first pass of the effect's current technique.
	bool InitVertexBuffer();
	bool InitIndexBuffer();
	// Uploads the vertex data again (a model whose buffer was made dynamic).
	bool UpdateVertexBuffer();

	// Sets the render, G-buffer and shadow technique names and pointers from aName,
	// then the child models'. A null object keeps its own.
	void SetTechniqueByName(const std::string& aName);
	void SetIsShadowCasterFlag(bool aFlag) { myIsShadowCasterFlag = aFlag; }
	bool GetIsShadowCasterFlag() const { return myIsShadowCasterFlag; }

	void SetIsNullObject(bool aFlag) { myIsNullObject = aFlag; }
	bool IsNullObject() const { return myIsNullObject; }
	int GetModelID() const { return myModelID; }
	// Model files store the id; a loaded model keeps the stored one.
	void SetModelID(int anID) { myModelID = anID; }
	void SetVertexType(int aType) { myVertexType = aType; }
	int GetVertexType() const { return myVertexType; }

	void SetVertexData(int aCount, int aStride, const void* someData, int aSize);
	void SetIndexData(int aCount, int aFormat, const void* someData, int aSize);
	int GetVertexCount() const { return myVertexCount; }
	int GetVertexStride() const { return myVertexStride; }
	std::span<uint8_t> GetVertexData() { return myVertexData; }
	std::span<const uint8_t> GetVertexData() const { return myVertexData; }
	int GetIndexCount() const { return myIndexCount; }
	int GetIndexFormat() const { return myIndexFormat; }
	std::span<const uint8_t> GetIndexData() const { return myIndexData; }

	void SetInputLayoutDesc(std::span<const Gpu::InputElement> someElements);
	const GrowingArray<Gpu::InputElement>& GetInputLayoutDesc() const { return myInputLayoutDesc; }
	void SetDynamicVertexBufferFlag(bool aFlag) { myDynamicVertexBufferFlag = aFlag; }

	void SetEffect(Effect* anEffect) { myEffect = anEffect; }
	Effect* GetEffect() const { return myEffect; }
	const std::string& GetTechniqueName() const { return myTechniqueName; }
	// The three names model files store; SetNames sets the render technique name
	// without looking it up (SetTechniqueByName does that).
	void SetNames(const std::string& aFirstName, const std::string& aTechniqueName,
	              const std::string& aThirdName);
	const std::string& GetFirstName() const { return myFirstName; }
	const std::string& GetThirdName() const { return myThirdName; }
	const std::string& GetGBufferTechniqueName() const { return myGBufferTechniqueName; }
	const std::string& GetShadowTechniqueName() const { return myShadowTechniqueName; }
	Fx::Technique* GetRenderTechnique() const { return myRenderTechnique; }
	Fx::Technique* GetGBufferTechnique() const { return myGBufferTechnique; }
	Fx::Technique* GetShadowTechnique() const { return myShadowTechnique; }

	GrowingArray<Surface>& GetSurfaces() { return mySurfaces; }
	const GrowingArray<Surface>& GetSurfaces() const { return mySurfaces; }
	// Takes ownership.
	void AddChildModel(Model* aModel) { myChildModels.Add(aModel); }
	const GrowingArray<Model*>& GetChildModels() const { return myChildModels; }
	ModelAnimationData& GetAnimationData() { return myAnimationData; }
	const ModelAnimationData& GetAnimationData() const { return myAnimationData; }

	// Binds the layout and the buffers for drawing this model's surfaces; false when
	// the model has nothing to draw with.
	bool SetupBuffers(Gpu::Context& aContext) const;

	// A sphere around the vertex positions in model space, remade whenever the vertex
	// buffer is made or updated; a negative radius means unknown (never culled).
	const Intersection::Sphere& GetLocalBounds() const { return myLocalBounds; }

private:
	void ReleaseBuffers();
	void ComputeLocalBounds();

	static int ourModelCounter;

	bool myIsNullObject = false;
	int myModelID;
	int myVertexType = -1;
	int myIndexCount = 0;
	int myIndexFormat = ourIndexFormatR32;
	std::vector<uint8_t> myIndexData;
	int myVertexCount = 0;
	int myVertexStride = 0;
	std::vector<uint8_t> myVertexData;
	std::string myFirstName;
	std::string myTechniqueName = "Render";
	std::string myThirdName = "NULL";
	GrowingArray<Surface> mySurfaces;
	ModelAnimationData myAnimationData;
	GrowingArray<Model*> myChildModels;

	std::string myGBufferTechniqueName;
	std::string myShadowTechniqueName = "RenderShadowBuffer";
	Fx::Technique* myRenderTechnique = nullptr;
	Fx::Technique* myGBufferTechnique = nullptr;
	Fx::Technique* myShadowTechnique = nullptr;
	Effect* myEffect = nullptr;
	std::unique_ptr<Gpu::Buffer> myVertexBuffer;
	std::unique_ptr<Gpu::Buffer> myIndexBuffer;
	std::unique_ptr<Gpu::InputLayout> myInputLayout;
	GrowingArray<Gpu::InputElement> myInputLayoutDesc;
	bool myDynamicVertexBufferFlag = false;
	Intersection::Sphere myLocalBounds{Vector3<float>(0.0f, 0.0f, 0.0f), -1.0f};
	bool myIsShadowCasterFlag = false;
};
} // namespace Zeph
