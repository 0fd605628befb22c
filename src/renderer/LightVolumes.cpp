#include "renderer/LightVolumes.h"

#include <algorithm>
#include <cmath>

#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/ShaderFiles.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "platform/fx/Pass.h"
#include "platform/fx/Technique.h"
#include "platform/gpu/Context.h"
#include "renderer/RenderTargetCollector.h"
#include "renderer/RenderTargetHelper.h"

namespace Zeph
{
namespace LightVolumes
{
namespace
{
struct LightVariables
{
	Fx::Variable* myPosition = nullptr;
	Fx::Variable* myColor = nullptr;
	Fx::Variable* myFalloff = nullptr;
	Fx::Variable* myDirection = nullptr;
	Fx::Variable* myAngles = nullptr;
	Fx::Variable* myScale = nullptr;
};

// The light effect and technique with the volume's buffers bound; false when any is missing.
bool Prepare(EffectType anEffectType, const Model* aVolume, const char* aTechnique,
             const RenderTargetCollector& aCollector, Effect*& anEffectOut, Fx::Technique*& aTechniqueOut,
             LightVariables& someVariablesOut)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr || aVolume == nullptr || aVolume->GetSurfaces().Count() == 0)
	{
		return false;
	}
	anEffectOut = engine->GetEffectContainer().GetEffect(ShaderFiles[anEffectType]);
	if (anEffectOut == nullptr || anEffectOut->GetEffect() == nullptr)
	{
		return false;
	}
	Fx::Effect* fx = anEffectOut->GetEffect();
	aTechniqueOut = fx->GetTechniqueByName(aTechnique);
	if (!aTechniqueOut->IsValid() || !aVolume->SetupBuffers(engine->GetContext()))
	{
		return false;
	}
	someVariablesOut.myPosition = fx->GetVariableByName("LightPosition");
	someVariablesOut.myColor = fx->GetVariableByName("LightColor");
	someVariablesOut.myFalloff = fx->GetVariableByName("LightFalloff");
	someVariablesOut.myDirection = fx->GetVariableByName("LightDirection");
	someVariablesOut.myAngles = fx->GetVariableByName("LightAngles");
	someVariablesOut.myScale = fx->GetVariableByName("Scale");
	anEffectOut->SetViewMatrix(aCollector.GetView());
	anEffectOut->SetProjectionMatrix(aCollector.GetProjection());
	anEffectOut->SetFarPlane(aCollector.GetFarPlane());
	engine->GetContext().SetPrimitiveTopology(aVolume->GetSurfaces()[0].GetPrimitiveTopology());
	return true;
}

void Draw(const Model& aVolume, Fx::Technique& aTechnique)
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	const Surface& surface = aVolume.GetSurfaces()[0];
	for (int pass = 0; pass < aTechnique.GetPassCount(); ++pass)
	{
		if (aTechnique.GetPassByIndex(pass)->Apply(context))
		{
			context.DrawIndexed(static_cast<uint32_t>(surface.GetIndexCount()),
			                    static_cast<uint32_t>(surface.GetStartIndex()), 0);
		}
	}
}
} // namespace

VolumeModel Load(const char* aFileName)
{
	VolumeModel volume;
	Engine* engine = Engine::GetInstance();
	if (engine != nullptr)
	{
		volume.myModel =
		    RenderTargetHelper::FindFirstModel(engine->GetModelFactory().GetModel(aFileName), volume.myLocal);
	}
	return volume;
}

Matrix44<float> PointLightWorld(const PointLightData& aLight)
{
	Matrix44<float> world;
	const float scale = aLight.myFalloff * 1.2f;
	world.myMatrix[0] = scale;
	world.myMatrix[5] = scale;
	world.myMatrix[10] = scale;
	world.SetPosition(aLight.myPosition);
	return world;
}

Matrix44<float> SpotLightScale(const SpotLightData& aLight)
{
	const float outer = std::clamp(aLight.myAngles.y, -1.0f, 1.0f);
	const float radius = std::tan(std::acos(outer)) * aLight.myFalloff * 1.1f;
	Matrix44<float> scale;
	scale.myMatrix[0] = radius;
	scale.myMatrix[5] = radius;
	scale.myMatrix[10] = aLight.myFalloff;
	return scale;
}

// What a spot light lights lies within its falloff distance of the apex and inside
// its cone: bounded around the middle of the axis for narrow cones, by the range
// around the apex for wide ones.
bool IsSpotLightCulled(const RenderTargetCollector& aCollector, const SpotLightData& aLight)
{
	const Matrix44<float> scale = SpotLightScale(aLight);
	const float length = aLight.myFalloff;
	const float baseRadius = scale.myMatrix[0];
	const float* m = aLight.myOrientation.myMatrix;
	const Vector3<float> apex = aLight.myOrientation.GetPosition();
	Vector3<float> axis(m[8], m[9], m[10]);
	const float axisLength = std::sqrt(axis.x * axis.x + axis.y * axis.y + axis.z * axis.z);
	if (!(axisLength > 0.0f) || !std::isfinite(baseRadius))
	{
		return aCollector.IsCulled(apex, length);
	}
	axis = axis * (1.0f / axisLength);
	const float middleRadius = std::sqrt(0.25f * length * length + baseRadius * baseRadius);
	if (middleRadius < length)
	{
		return aCollector.IsCulled(apex + axis * (0.5f * length), middleRadius * 1.05f);
	}
	return aCollector.IsCulled(apex, length);
}

void DrawPointLights(const RenderTargetCollector& aCollector, const VolumeModel& aVolume,
                     const char* aTechnique)
{
	Effect* effect = nullptr;
	Fx::Technique* technique = nullptr;
	LightVariables variables;
	if (aCollector.GetPointLights().Count() == 0 ||
	    !Prepare(EFFECT_DEFERRED_POINT_LIGHT, aVolume.myModel, aTechnique, aCollector, effect, technique,
	             variables))
	{
		return;
	}
	for (const PointLightData& light : aCollector.GetPointLights())
	{
		// Nothing beyond the falloff distance is lit.
		if (aCollector.IsCulled(light.myPosition, light.myFalloff))
		{
			continue;
		}
		effect->SetWorldMatrix(aVolume.myLocal * PointLightWorld(light));
		const Vector4<float> position =
		    Vector4<float>(light.myPosition.x, light.myPosition.y, light.myPosition.z, 1.0f) *
		    aCollector.GetView();
		variables.myPosition->SetFloatVector(&position.x);
		variables.myColor->SetFloatVector(&light.myColor.x);
		variables.myFalloff->SetFloat(light.myFalloff);
		Draw(*aVolume.myModel, *technique);
	}
}

void DrawSpotLights(const RenderTargetCollector& aCollector, const VolumeModel& aVolume,
                    const char* aTechnique)
{
	Effect* effect = nullptr;
	Fx::Technique* technique = nullptr;
	LightVariables variables;
	if (aCollector.GetSpotLights().Count() == 0 ||
	    !Prepare(EFFECT_DEFERRED_SPOT_LIGHT, aVolume.myModel, aTechnique, aCollector, effect, technique,
	             variables))
	{
		return;
	}
	for (const SpotLightData& light : aCollector.GetSpotLights())
	{
		if (IsSpotLightCulled(aCollector, light))
		{
			continue;
		}
		effect->SetWorldMatrix(light.myOrientation);
		const Matrix44<float> scale = aVolume.myLocal * SpotLightScale(light);
		variables.myScale->SetMatrix(scale.myMatrix);
		const Vector3<float> apex = light.myOrientation.GetPosition();
		const Vector4<float> position = Vector4<float>(apex.x, apex.y, apex.z, 1.0f) * aCollector.GetView();
		const float* m = light.myOrientation.myMatrix;
		const Vector4<float> direction = Vector4<float>(m[8], m[9], m[10], 0.0f) * aCollector.GetView();
		variables.myPosition->SetFloatVector(&position.x);
		variables.myColor->SetFloatVector(&light.myColor.x);
		variables.myFalloff->SetFloat(light.myFalloff);
		variables.myDirection->SetFloatVector(&direction.x);
		const float angles[4] = {light.myAngles.x, light.myAngles.y, 0.0f, 0.0f};
		variables.myAngles->SetFloatVector(angles);
		Draw(*aVolume.myModel, *technique);
	}
}
} // namespace LightVolumes
} // namespace Zeph
