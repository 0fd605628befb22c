#include "engine/Effect.h"

#include <vector>

#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/FI_File.h"

namespace Zeph
{
namespace
{
void SetMatrix(Fx::Variable* aVariable, const Matrix44<float>& aMatrix)
{
	if (aVariable != nullptr)
	{
		aVariable->SetMatrix(aMatrix.myMatrix);
	}
}

void SetVector(Fx::Variable* aVariable, const Vector4<float>& aVector)
{
	if (aVariable != nullptr)
	{
		const float values[4] = {aVector.x, aVector.y, aVector.z, aVector.w};
		aVariable->SetFloatVector(values);
	}
}
} // namespace

Effect::~Effect()
{
	if (myEffect)
	{
		myEffect->Destroy();
	}
}

bool Effect::CreateEffect(std::span<const uint8_t> someCompiled, const std::string& aFileName)
{
	auto effect = std::make_unique<Fx::Effect>();
	if (!effect->Init(Engine::GetInstance()->GetContext(), someCompiled, aFileName))
	{
		return false;
	}
	if (myEffect)
	{
		myEffect->Destroy();
	}
	myEffect = std::move(effect);
	myFileName = aFileName;
	return true;
}

bool Effect::InitFromCompiled(std::span<const uint8_t> someCompiled, const std::string& aFileName)
{
	if (!CreateEffect(someCompiled, aFileName))
	{
		return false;
	}
	myTechnique = myEffect->GetTechniqueByName("Render");
	return true;
}

bool Effect::Init(const std::string& aFileName)
{
	const std::string compiledName = aFileName + "al";
	std::vector<uint8_t> bytes;
	FI_File file;
	if (file.Open(compiledName, FI_File::FileFlags::READ | FI_File::FileFlags::BINARY))
	{
		const int size = file.GetFileSize();
		if (size > 0)
		{
			bytes.resize(static_cast<size_t>(size));
			if (!file.ReadData(bytes.data(), size))
			{
				bytes.clear();
			}
		}
		file.Close();
	}
	if (bytes.empty())
	{
		// Not fatal on its own: the report that follows is the failure; this one says which file.
		ReportDebug(__LINE__, "Zeph::Effect::Init", "Cannot read the compiled effect %s (the build makes it)",
		            compiledName.c_str());
	}
	if (bytes.empty() || !CreateEffect(bytes, aFileName))
	{
		ReportCritical(__LINE__, "Zeph::Effect::Init", "Cant Create Effect");
		return false;
	}
	ResolveVariables();
	return true;
}

void Effect::ResolveVariables()
{
	const char* function = "Zeph::Effect::Init";
	Fx::Effect& effect = *myEffect;
	myWorldMatrixVariable = effect.GetVariableByName("World");
	myViewMatrixVariable = effect.GetVariableByName("View");
	myProjectionMatrixVariable = effect.GetVariableByName("Projection");
	myPrevViewMatrixVariable = effect.GetVariableByName("PrevView");
	myPrevWorldMatrixVariable = effect.GetVariableByName("PrevWorld");
	myLightColorVariable = effect.GetVariableByName("LightColor");
	myLightDirectionVariable = effect.GetVariableByName("LightDirection");
	myEyePositionVariable = effect.GetVariableByName("EyePos");
	myPointLightColorsVariable = effect.GetVariableByName("PointLightColors");
	myPointLightPositionsVariable = effect.GetVariableByName("PointLightPositions");
	myPointLightRangesVariable = effect.GetVariableByName("PointLightRanges");
	myFarPlaneVariable = effect.GetVariableByName("FarPlane");
	myEnvBoxPosVariable = effect.GetVariableByName("EnvBoxPos");
	myEnvBoxMaxVariable = effect.GetVariableByName("EnvBoxMax");
	myEnvBoxMinVariable = effect.GetVariableByName("EnvBoxMin");
	myTechnique = effect.GetTechniqueByName("Render");
	if (!myWorldMatrixVariable->IsValid())
	{
		ReportCritical(__LINE__, function, "myWorldMatrixVariable is invalid, %s", myFileName.c_str());
	}
	if (!myViewMatrixVariable->IsValid())
	{
		ReportCritical(__LINE__, function, "myViewMatrixVariable is invalid, %s", myFileName.c_str());
	}
	if (!myProjectionMatrixVariable->IsValid())
	{
		ReportCritical(__LINE__, function, "myProjectionMatrixVariable is invalid, %s", myFileName.c_str());
	}
	if (!myFarPlaneVariable->IsValid())
	{
		ReportCritical(__LINE__, function, "myFarPlaneVariable is invalid");
	}
}

void Effect::SetWorldMatrix(const Matrix44<float>& aMatrix)
{
	SetMatrix(myWorldMatrixVariable, aMatrix);
}

void Effect::SetPrevWorldMatrix(const Matrix44<float>& aMatrix)
{
	SetMatrix(myPrevWorldMatrixVariable, aMatrix);
}

void Effect::SetViewMatrix(const Matrix44<float>& aMatrix)
{
	SetMatrix(myViewMatrixVariable, aMatrix);
}

void Effect::SetPrevViewMatrix(const Matrix44<float>& aMatrix)
{
	SetMatrix(myPrevViewMatrixVariable, aMatrix);
}

void Effect::SetProjectionMatrix(const Matrix44<float>& aMatrix)
{
	SetMatrix(myProjectionMatrixVariable, aMatrix);
}

void Effect::SetEyePosition(const Vector3<float>& aPosition)
{
	SetVector(myEyePositionVariable, Vector4<float>(aPosition));
}

void Effect::SetEnvironmentBox(const Vector4<float>& aPosition, const Vector4<float>& aMax,
                               const Vector4<float>& aMin)
{
	SetVector(myEnvBoxPosVariable, aPosition);
	SetVector(myEnvBoxMaxVariable, aMax);
	SetVector(myEnvBoxMinVariable, aMin);
}

void Effect::SetDirectionalLight(const Vector4<float>& aDirection, const Vector4<float>& aColor)
{
	SetVector(myLightDirectionVariable, aDirection);
	SetVector(myLightColorVariable, aColor);
}

void Effect::SetPointLights(const Vector4<float>* someColors, const Vector4<float>* somePositions,
                            const float* someRanges)
{
	// Vector4<float> is exactly four floats, so an array of them is the array of float4 the effect takes.
	static_assert(sizeof(Vector4<float>) == 4 * sizeof(float));
	if (myPointLightColorsVariable != nullptr)
	{
		myPointLightColorsVariable->SetFloatVectorArray(&someColors[0].x, 0, 4);
	}
	if (myPointLightPositionsVariable != nullptr)
	{
		myPointLightPositionsVariable->SetFloatVectorArray(&somePositions[0].x, 0, 4);
	}
	if (myPointLightRangesVariable != nullptr)
	{
		myPointLightRangesVariable->SetFloatArray(someRanges, 0, 4);
	}
}

void Effect::SetFarPlane(float aFarPlane)
{
	if (myFarPlaneVariable != nullptr)
	{
		myFarPlaneVariable->SetFloat(aFarPlane);
	}
}

void Effect::SetTime(float aTime)
{
	if (myEffect)
	{
		myEffect->GetVariableByName("Time")->SetFloat(aTime);
	}
}

bool Effect::SetShaderResource(const std::string& aName, Gpu::ShaderResourceView* aView)
{
	return myEffect && myEffect->GetVariableByName(aName.c_str())->SetResource(aView);
}

void Effect::SetTechnique(const std::string& aName)
{
	if (myEffect)
	{
		myTechnique = myEffect->GetTechniqueByName(aName.c_str());
	}
}
} // namespace Zeph
