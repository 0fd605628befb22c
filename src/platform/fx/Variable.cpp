#include "platform/fx/Variable.h"

#include <algorithm>

#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"
#include "platform/gpu/TextureView.h"

namespace Fx
{
void Variable::Init(const VariableDesc& aDesc)
{
	myDesc = aDesc;
	myValidFlag = true;
	myFloats.assign(static_cast<size_t>(GetFloatCount(aDesc.myType) * Elements()), 0.0f);
	myInts.assign(static_cast<size_t>(GetIntCount(aDesc.myType) * Elements()), 0);
	myViews.assign(IsSampler(aDesc.myType) ? static_cast<size_t>(Elements()) : 0, nullptr);
	myVersion = 0;
}

bool Variable::Check(const char* aFunctionName, bool aKindFlag, const char* aKind, const void* someValues,
                     int anOffset, int aCount)
{
	if (!myValidFlag)
	{
		return false;
	}
	if (!aKindFlag)
	{
		Gpu::ReportError(__LINE__, aFunctionName, "Variable '%s' is a %s%s, not %s", myDesc.myName.c_str(),
		                 GetTypeName(myDesc.myType), myDesc.myElementCount > 0 ? " array" : "", aKind);
		return false;
	}
	if (anOffset < 0 || aCount < 0 || anOffset > Elements() - aCount)
	{
		Gpu::ReportError(__LINE__, aFunctionName,
		                 "Elements %d..%d are outside variable '%s' of %d element(s)", anOffset,
		                 anOffset + aCount - 1, myDesc.myName.c_str(), Elements());
		return false;
	}
	if (someValues == nullptr && aCount > 0)
	{
		Gpu::ReportError(__LINE__, aFunctionName, "No values given for variable '%s'", myDesc.myName.c_str());
		return false;
	}
	return true;
}

void Variable::StoreMatrix(int anElement, const float* some16)
{
	if (myDesc.myType == VariableType::Mat4)
	{
		std::copy(some16, some16 + 16, myFloats.begin() + anElement * 16);
		return;
	}
	// GLSL reads a mat3 column by column; the engine's rows become its columns, as for a mat4.
	for (int row = 0; row < 3; ++row)
	{
		std::copy(some16 + row * 4, some16 + row * 4 + 3, myFloats.begin() + anElement * 9 + row * 3);
	}
}

bool Variable::SetMatrix(const float* some16)
{
	return SetMatrixArray(some16, 0, 1);
}

bool Variable::SetMatrixArray(const float* someMatrices, int anOffset, int aCount)
{
	const bool matrixFlag = myDesc.myType == VariableType::Mat4 || myDesc.myType == VariableType::Mat3;
	if (!Check("Fx::Variable::SetMatrix", matrixFlag, "a matrix", someMatrices, anOffset, aCount))
	{
		return false;
	}
	for (int element = 0; element < aCount; ++element)
	{
		StoreMatrix(anOffset + element, someMatrices + element * 16);
	}
	++myVersion;
	return true;
}

bool Variable::SetFloatVector(const float* some4)
{
	return SetFloatVectorArray(some4, 0, 1);
}

bool Variable::SetFloatVectorArray(const float* someVectors, int anOffset, int aCount)
{
	const int components = GetFloatCount(myDesc.myType);
	if (!Check("Fx::Variable::SetFloatVector", components >= 1 && components <= 4, "a float vector",
	           someVectors, anOffset, aCount))
	{
		return false;
	}
	for (int element = 0; element < aCount; ++element)
	{
		std::copy(someVectors + element * 4, someVectors + element * 4 + components,
		          myFloats.begin() + (anOffset + element) * components);
	}
	++myVersion;
	return true;
}

bool Variable::SetFloat(float aValue)
{
	return SetFloatArray(&aValue, 0, 1);
}

bool Variable::SetFloatArray(const float* someValues, int anOffset, int aCount)
{
	if (!Check("Fx::Variable::SetFloat", myDesc.myType == VariableType::Float, "a float", someValues,
	           anOffset, aCount))
	{
		return false;
	}
	std::copy(someValues, someValues + aCount, myFloats.begin() + anOffset);
	++myVersion;
	return true;
}

bool Variable::SetInt(int aValue)
{
	const bool scalarFlag = GetIntCount(myDesc.myType) == 1;
	if (!Check("Fx::Variable::SetInt", scalarFlag, "an int, uint or bool", &aValue, 0, 1))
	{
		return false;
	}
	myInts[0] = myDesc.myType == VariableType::Bool ? (aValue != 0 ? 1 : 0) : aValue;
	++myVersion;
	return true;
}

bool Variable::SetIntVector(const int* some4)
{
	const int components = GetIntCount(myDesc.myType);
	if (!Check("Fx::Variable::SetIntVector", components >= 1, "an integer vector", some4, 0, 1))
	{
		return false;
	}
	std::copy(some4, some4 + components, myInts.begin());
	++myVersion;
	return true;
}

bool Variable::SetResource(Gpu::ShaderResourceView* aView)
{
	return SetResourceArray(&aView, 0, 1);
}

bool Variable::SetResourceArray(Gpu::ShaderResourceView* const* someViews, int anOffset, int aCount)
{
	if (!Check("Fx::Variable::SetResource", IsSampler(myDesc.myType), "a sampler", someViews, anOffset,
	           aCount))
	{
		return false;
	}
	for (int element = 0; element < aCount; ++element)
	{
		Gpu::ShaderResourceView* view = someViews[element];
		if (view && view->GetTarget() != GetSamplerTarget(myDesc.myType))
		{
			Gpu::ReportError(__LINE__, "Fx::Variable::SetResource",
			                 "Variable '%s' is a %s; the view of '%s' cannot be sampled by it",
			                 myDesc.myName.c_str(), GetTypeName(myDesc.myType),
			                 view->GetTexture().GetDesc().myLabel.c_str());
			return false;
		}
	}
	std::copy(someViews, someViews + aCount, myViews.begin() + anOffset);
	++myVersion;
	return true;
}

Gpu::ShaderResourceView* Variable::GetResource(int anElement) const
{
	return anElement >= 0 && anElement < static_cast<int>(myViews.size())
	           ? myViews[static_cast<size_t>(anElement)]
	           : nullptr;
}
} // namespace Fx
