#include "platform/collada/Node.h"

#include <array>
#include <cmath>
#include <numbers>

namespace Collada
{
namespace
{
using Vec3 = std::array<float, 3>;

Vec3 Normalized(Vec3 aVector)
{
	const float length =
	    std::sqrt(aVector[0] * aVector[0] + aVector[1] * aVector[1] + aVector[2] * aVector[2]);
	if (!(length > 0.0f))
	{
		return {0.0f, 0.0f, 0.0f};
	}
	return {aVector[0] / length, aVector[1] / length, aVector[2] / length};
}

Vec3 Cross(const Vec3& aLeft, const Vec3& aRight)
{
	return {aLeft[1] * aRight[2] - aLeft[2] * aRight[1], aLeft[2] * aRight[0] - aLeft[0] * aRight[2],
	        aLeft[0] * aRight[1] - aLeft[1] * aRight[0]};
}

float Radians(float aDegrees)
{
	return aDegrees * std::numbers::pi_v<float> / 180.0f;
}

// Sets the 3x3 block from a column-vector matrix given row by row, transposing it into ours.
void SetBlockFromColumnConvention(Matrix44<float>& aMatrix, const float (&aBlock)[3][3])
{
	for (int row = 0; row < 3; ++row)
	{
		for (int column = 0; column < 3; ++column)
		{
			aMatrix.myMatrix[4 * column + row] = aBlock[row][column];
		}
	}
}
} // namespace

Matrix44<float> Transform::GetMatrix() const
{
	Matrix44<float> result;
	const float* v = myValues;
	switch (myKind)
	{
	case TransformKind::Matrix:
		for (int row = 0; row < 4; ++row)
		{
			for (int column = 0; column < 4; ++column)
			{
				result.myMatrix[4 * column + row] = v[4 * row + column];
			}
		}
		break;
	case TransformKind::Translate:
		result.myMatrix[12] = v[0];
		result.myMatrix[13] = v[1];
		result.myMatrix[14] = v[2];
		break;
	case TransformKind::Scale:
		result.myMatrix[0] = v[0];
		result.myMatrix[5] = v[1];
		result.myMatrix[10] = v[2];
		break;
	case TransformKind::Rotate: {
		// Rodrigues' rotation about a unit axis, counter-clockwise looking down the axis.
		const Vec3 axis = Normalized({v[0], v[1], v[2]});
		const float c = std::cos(Radians(v[3]));
		const float s = std::sin(Radians(v[3]));
		const float t = 1.0f - c;
		const float x = axis[0], y = axis[1], z = axis[2];
		const float block[3][3] = {{t * x * x + c, t * x * y - s * z, t * x * z + s * y},
		                           {t * x * y + s * z, t * y * y + c, t * y * z - s * x},
		                           {t * x * z - s * y, t * y * z + s * x, t * z * z + c}};
		SetBlockFromColumnConvention(result, block);
		break;
	}
	case TransformKind::LookAt: {
		// The camera at the eye looking down its -Z at the interest point, +Y towards up.
		const Vec3 eye = {v[0], v[1], v[2]};
		const Vec3 back = Normalized({v[0] - v[3], v[1] - v[4], v[2] - v[5]});
		const Vec3 right = Normalized(Cross({v[6], v[7], v[8]}, back));
		const Vec3 up = Cross(back, right);
		const Vec3 axes[3] = {right, up, back};
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				result.myMatrix[4 * row + column] = axes[row][column];
			}
			result.myMatrix[12 + row] = eye[row];
		}
		break;
	}
	case TransformKind::Skew: {
		// Shear along the translation axis by tan(angle) times the distance along the rotation axis.
		const Vec3 around = Normalized({v[1], v[2], v[3]});
		const Vec3 along = Normalized({v[4], v[5], v[6]});
		const float amount = std::tan(Radians(v[0]));
		float block[3][3] = {{1, 0, 0}, {0, 1, 0}, {0, 0, 1}};
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				block[row][column] += amount * along[row] * around[column];
			}
		}
		SetBlockFromColumnConvention(result, block);
		break;
	}
	}
	return result;
}

const InstanceMaterial* Instance::FindMaterial(const std::string& aSymbol) const
{
	for (const InstanceMaterial& material : myMaterials)
	{
		if (material.mySymbol == aSymbol)
		{
			return &material;
		}
	}
	return nullptr;
}

Matrix44<float> Node::GetLocalMatrix() const
{
	// Column vectors: local = T1 * T2 * ... * Tn. Row vectors: the transposes in reverse order, so
	// each later transform multiplies on the left.
	Matrix44<float> local;
	for (const Transform& transform : myTransforms)
	{
		Matrix44<float> product = transform.GetMatrix();
		product *= local;
		local = product;
	}
	return local;
}
} // namespace Collada
