// Transformation kinds: a hierarchy multiplies its children in order, curves
// replace the stored values, and the stored values stand in for missing curves.
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
	const Vector3<float> position = hierarchy.GetTransformationForTime(0.0).GetPosition();
	EXPECT_NEAR(std::fabs(position.x) + std::fabs(position.z), 0.0f, 1e-6f);
	EXPECT_NEAR(std::fabs(position.y), 1.0f, 1e-6f);
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

	// Curves replace the stored values; the editor evaluates at time 0, where a curve whose
	// first key comes later holds that key's value.
	auto* angle = new Zeph::AnimationCurve();
	angle->AddKey(1.0, 180.0);
	angle->AddKey(2.0, 0.0);
	node.SetCurve(Zeph::TransformationNodeCurves::CURVE_ANGLE, angle);
	auto* y = new Zeph::AnimationCurve();
	y->AddKey(1.0, -4.0);
	node.SetCurve(Zeph::TransformationNodeCurves::CURVE_TRANSLATION_Y, y);
	atZero = node.GetTransformationForTime(0.0);
	EXPECT_NEAR(atZero.myMatrix[5], -1.0f, 1e-6f) << "half a turn about x";
	EXPECT_NEAR(atZero.myMatrix[0], 1.0f, 1e-6f) << "about x";
	EXPECT_EQ(atZero.GetPosition().y, -4.0f);

	Zeph::TransformationNodeCurves noAxis;
	noAxis.SetAngle(90.0f);
	EXPECT_EQ(noAxis.GetTransformationForTime(0.0).myMatrix[0], 1.0f) << "a zero axis rotates nothing";
}
