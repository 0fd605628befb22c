// Transformation kinds: a hierarchy multiplies its children in order, curves
// evaluate their keys, and the stored values stand in for missing curves.
#include <cmath>
#include <gtest/gtest.h>
#include <numbers>

#include "model/TransformationNodeCurves.h"
#include "model/TransformationNodeHierarchy.h"

namespace
{
Zeph::TransformationNode* Fixed(const Matrix44<float>& aMatrix)
{
	auto* node = new Zeph::TransformationNode();
	node->SetOrientation(aMatrix);
	return node;
}

Matrix44<float> Translation(float anX, float aY, float aZ)
{
	Matrix44<float> matrix;
	matrix.SetPosition({anX, aY, aZ});
	return matrix;
}
} // namespace

TEST(TransformationNodeTest, AHierarchyAppliesItsFirstChildFirst)
{
	Zeph::TransformationNodeHierarchy hierarchy;
	hierarchy.SetOrientation(Translation(7.0f, 7.0f, 7.0f));
	EXPECT_EQ(hierarchy.GetTransformationForTime(0.0).GetPosition().x, 7.0f) << "no children: its own matrix";

	const float quarter = static_cast<float>(std::numbers::pi / 2.0);
	hierarchy.AddChild(Fixed(Translation(1.0f, 0.0f, 0.0f)));
	hierarchy.AddChild(Fixed(Matrix44<float>::CreateRotateAroundZ(quarter)));
	// The origin moved to (1, 0, 0) and then turned a quarter about z; the other
	// order would leave it at (1, 0, 0).
	const Matrix44<float> rotation = Matrix44<float>::CreateRotateAroundZ(quarter);
	const Vector3<float> position = hierarchy.GetTransformationForTime(0.0).GetPosition();
	EXPECT_NEAR(position.x, rotation.myMatrix[0], 1e-6f);
	EXPECT_NEAR(position.y, rotation.myMatrix[1], 1e-6f);
	EXPECT_NEAR(std::fabs(position.y), 1.0f, 1e-6f);
	EXPECT_NEAR(position.z, 0.0f, 1e-6f);
}

TEST(TransformationNodeTest, CurvesInterpolateTheirKeysAndHoldTheEnds)
{
	Zeph::AnimationCurve curve;
	EXPECT_EQ(curve.Evaluate(1.0), 0.0) << "no keys";
	curve.AddKey(1.0, 10.0);
	curve.AddKey(3.0, 20.0);
	curve.AddKey(4.0, -20.0);
	struct Case
	{
		double myTime;
		double myValue;
	};
	const Case cases[] = {{0.0, 10.0}, {1.0, 10.0},  {2.0, 15.0}, {3.0, 20.0},
	                      {3.5, 0.0},  {4.0, -20.0}, {9.0, -20.0}};
	for (const Case& test : cases)
	{
		EXPECT_DOUBLE_EQ(curve.Evaluate(test.myTime), test.myValue) << "at " << test.myTime;
	}
}

TEST(TransformationNodeTest, ACurvesNodeRotatesAboutItsAxisThenTranslates)
{
	Zeph::TransformationNodeCurves node;
	node.SetRotationAxis({2.0f, 0.0f, 0.0f}); // normalised
	node.SetAngle(90.0f);
	node.SetTranslation({1.0f, 2.0f, 3.0f});
	node.SetOrientation(Translation(50.0f, 50.0f, 50.0f)); // not part of the evaluation
	const Matrix44<float> expected =
	    Matrix44<float>::CreateRotateAroundX(static_cast<float>(std::numbers::pi / 2.0));
	Matrix44<float> atZero = node.GetTransformationForTime(0.0);
	for (int i = 0; i < 12; ++i)
	{
		EXPECT_NEAR(atZero.myMatrix[i], expected.myMatrix[i], 1e-6f) << "element " << i;
	}
	EXPECT_EQ(atZero.GetPosition().x, 1.0f);
	EXPECT_EQ(atZero.GetPosition().z, 3.0f);

	// Curves replace the stored values: the angle goes 0 -> 180 over two seconds,
	// the translation's y is keyed.
	auto* angle = new Zeph::AnimationCurve();
	angle->AddKey(0.0, 0.0);
	angle->AddKey(2.0, 180.0);
	node.SetCurve(Zeph::TransformationNodeCurves::CURVE_ANGLE, angle);
	auto* y = new Zeph::AnimationCurve();
	y->AddKey(1.0, -4.0);
	node.SetCurve(Zeph::TransformationNodeCurves::CURVE_TRANSLATION_Y, y);
	atZero = node.GetTransformationForTime(0.0);
	EXPECT_NEAR(atZero.myMatrix[5], 1.0f, 1e-6f) << "angle 0 at time 0";
	EXPECT_EQ(atZero.GetPosition().y, -4.0f);
	const Matrix44<float> atKey = node.GetTransformationForTime(2.0);
	EXPECT_NEAR(atKey.myMatrix[5], -1.0f, 1e-6f) << "half a turn at the last key";
	EXPECT_NEAR(atKey.myMatrix[0], 1.0f, 1e-6f) << "about x";
	const Matrix44<float> between = node.GetTransformationForTime(1.0);
	EXPECT_NEAR(between.myMatrix[5], 0.0f, 1e-6f) << "a quarter turn half-way";

	Zeph::TransformationNodeCurves noAxis;
	noAxis.SetAngle(90.0f);
	EXPECT_EQ(noAxis.GetTransformationForTime(0.0).myMatrix[0], 1.0f) << "a zero axis rotates nothing";
}
