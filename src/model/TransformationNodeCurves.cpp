#include "model/TransformationNodeCurves.h"

#include <cmath>
#include <numbers>

namespace Zeph
{
void TransformationNodeCurves::SetParameters(int aFirst, float aSecond, float aThird, int aFourth)
{
	myFirstParameter = aFirst;
	mySecondParameter = aSecond;
	myThirdParameter = aThird;
	myFourthParameter = aFourth;
}

Matrix44<float> TransformationNodeCurves::GetTransformationForTime(double aTime) const
{
	const auto value = [&](int aSlot, float aDefault) {
		const AnimationCurve* curve = GetCurve(aSlot);
		return curve != nullptr ? curve->Evaluate(aTime) : static_cast<double>(aDefault);
	};
	double x = value(CURVE_ROTATION_X, myRotationAxis.x);
	double y = value(CURVE_ROTATION_Y, myRotationAxis.y);
	double z = value(CURVE_ROTATION_Z, myRotationAxis.z);
	const double angle = value(CURVE_ANGLE, myAngle) * std::numbers::pi / 180.0;

	Matrix44<float> result;
	const double length = std::sqrt(x * x + y * y + z * z);
	if (length > 0.0)
	{
		x /= length;
		y /= length;
		z /= length;
		const double c = std::cos(angle);
		const double s = std::sin(angle);
		const double t = 1.0 - c;
		// The engine's rotation builders' convention: CreateRotateAroundX for the x axis.
		const double rotation[9] = {
		    t * x * x + c,     t * x * y - s * z, t * x * z + s * y, //
		    t * x * y + s * z, t * y * y + c,     t * y * z - s * x, //
		    t * x * z - s * y, t * y * z + s * x, t * z * z + c,
		};
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				result.myMatrix[4 * row + column] = static_cast<float>(rotation[3 * row + column]);
			}
		}
	}
	result.myMatrix[12] = static_cast<float>(value(CURVE_TRANSLATION_X, myTranslation.x));
	result.myMatrix[13] = static_cast<float>(value(CURVE_TRANSLATION_Y, myTranslation.y));
	result.myMatrix[14] = static_cast<float>(value(CURVE_TRANSLATION_Z, myTranslation.z));
	return result;
}
} // namespace Zeph
