#pragma once
// Effect: one effect of the engine with the variables that every effect may have
// (matrices, eye, light, point lights, environment box, far plane) resolved once at
// load. Other variables and techniques are reached by name.
//
//   Zeph::Effect* effect = engine->GetEffectContainer().GetEffect(Zeph::ShaderFiles[Zeph::EFFECT_LINE]);
//   effect->SetWorldMatrix(world);
//   effect->SetViewMatrix(view);
//   effect->SetProjectionMatrix(projection);
//   Fx::Technique* technique = effect->GetTechnique();
//   for (int pass = 0; pass < technique->GetPassCount(); ++pass) {
//   technique->GetPassByIndex(pass)->Apply(context); ... draw ... }
//
// An effect variable that a file does not declare is an invalid variable: setting it
// does nothing. Needs the Engine (its context current).

#include <cstdint>
#include <memory>
#include <span>
#include <string>

#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "core/Vector4.h"
#include "platform/fx/Effect.h"

namespace Zeph
{
class Effect
{
public:
	Effect() = default;
	~Effect();
	Effect(const Effect&) = delete;
	Effect& operator=(const Effect&) = delete;

	// Loads the compiled form, aFileName + "al", and resolves the common variables,
	// reporting the ones an effect must have when they are missing.
	bool Init(const std::string& aFileName);
	// Creates the effect from compiled bytes with its "Render" technique and nothing
	// else resolved; false without a report (the caller reports).
	bool InitFromCompiled(std::span<const uint8_t> someCompiled, const std::string& aFileName);

	void SetWorldMatrix(const Matrix44<float>& aMatrix);
	void SetPrevWorldMatrix(const Matrix44<float>& aMatrix);
	void SetViewMatrix(const Matrix44<float>& aMatrix);
	void SetPrevViewMatrix(const Matrix44<float>& aMatrix);
	void SetProjectionMatrix(const Matrix44<float>& aMatrix);
	void SetEyePosition(const Vector3<float>& aPosition);
	void SetEnvironmentBox(const Vector4<float>& aPosition, const Vector4<float>& aMax,
	                       const Vector4<float>& aMin);
	void SetDirectionalLight(const Vector4<float>& aDirection, const Vector4<float>& aColor);
	// Four point lights at once: colours, positions and ranges, four of each.
	void SetPointLights(const Vector4<float>* someColors, const Vector4<float>* somePositions,
	                    const float* someRanges);
	void SetFarPlane(float aFarPlane);
	// "Time" is looked up by name on each call.
	void SetTime(float aTime);
	// False when the effect has no variable of that name.
	bool SetShaderResource(const std::string& aName, Gpu::ShaderResourceView* aView);

	Fx::Technique* GetTechnique() const { return myTechnique; }
	void SetTechnique(Fx::Technique* aTechnique) { myTechnique = aTechnique; }
	// The named technique, an invalid one when the effect has none of that name.
	void SetTechnique(const std::string& aName);

	Fx::Effect* GetEffect() const { return myEffect.get(); }
	const std::string& GetFileName() const { return myFileName; }

private:
	bool CreateEffect(std::span<const uint8_t> someCompiled, const std::string& aFileName);
	void ResolveVariables();

	std::unique_ptr<Fx::Effect> myEffect;
	Fx::Variable* myProjectionMatrixVariable = nullptr;
	Fx::Variable* myWorldMatrixVariable = nullptr;
	Fx::Variable* myViewMatrixVariable = nullptr;
	Fx::Variable* myPrevViewMatrixVariable = nullptr;
	Fx::Variable* myPrevWorldMatrixVariable = nullptr;
	Fx::Technique* myTechnique = nullptr;
	Fx::Variable* myLightColorVariable = nullptr;
	Fx::Variable* myLightDirectionVariable = nullptr;
	Fx::Variable* myEyePositionVariable = nullptr;
	Fx::Variable* myEnvBoxPosVariable = nullptr;
	Fx::Variable* myEnvBoxMaxVariable = nullptr;
	Fx::Variable* myEnvBoxMinVariable = nullptr;
	Fx::Variable* myPointLightColorsVariable = nullptr;
	Fx::Variable* myPointLightPositionsVariable = nullptr;
	Fx::Variable* myPointLightRangesVariable = nullptr;
	Fx::Variable* myFarPlaneVariable = nullptr;
	std::string myFileName;
};
} // namespace Zeph
