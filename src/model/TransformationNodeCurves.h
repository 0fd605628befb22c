#pragma once
// TransformationNodeCurves: a transformation animated by up to seven curves, a
// rotation about an axis by an angle followed by a translation.
//
//   auto* node = new Zeph::TransformationNodeCurves();
//   node->SetRotationAxis({0, 1, 0});
//   node->SetCurve(Zeph::TransformationNodeCurves::CURVE_ANGLE, angleCurve);   // degrees
//   Matrix44<float> local = node->GetTransformationForTime(0.5);
//
// The curve slots follow the document's qualifiers: the rotation ".X", ".Y", ".Z"
// and ".ANGLE" (the four slots model files store first), then the translation ".X",
// ".Y", ".Z" (the three after them). A slot without a curve takes the node's value
// at time 0. The two integers and two floats that files store with the node belong
// to the animation layers; they are kept and written back unchanged.
// Owns its curves.
#include <array>
#include <memory>

#include "core/Vector3.h"
#include "model/AnimationCurve.h"
#include "model/TransformationNode.h"

namespace Zeph
{
class TransformationNodeCurves : public TransformationNode
{
public:
	enum CurveSlot
	{
		CURVE_ROTATION_X = 0,
		CURVE_ROTATION_Y = 1,
		CURVE_ROTATION_Z = 2,
		CURVE_ANGLE = 3,
		CURVE_TRANSLATION_X = 4,
		CURVE_TRANSLATION_Y = 5,
		CURVE_TRANSLATION_Z = 6,
		CURVE_SLOT_COUNT = 7,
	};

	TransformationNodeCurves() : TransformationNode(TransformationNode_Curves) {}

	// Rotation about the (normalised) axis by the angle in degrees, then the
	// translation, with row vectors: v * R * T. A zero axis rotates nothing. The
	// node's own matrix is not part of it (the importer stores its result there).
	Matrix44<float> GetTransformationForTime(double aTime) const override;

	// Takes ownership; null clears the slot.
	void SetCurve(CurveSlot aSlot, AnimationCurve* aCurve) { myCurves[aSlot].reset(aCurve); }
	const AnimationCurve* GetCurve(int aSlot) const { return myCurves[static_cast<size_t>(aSlot)].get(); }

	void SetRotationAxis(const Vector3<float>& anAxis) { myRotationAxis = anAxis; }
	const Vector3<float>& GetRotationAxis() const { return myRotationAxis; }
	void SetTranslation(const Vector3<float>& aTranslation) { myTranslation = aTranslation; }
	const Vector3<float>& GetTranslation() const { return myTranslation; }
	void SetAngle(float anAngle) { myAngle = anAngle; }
	float GetAngle() const { return myAngle; }

	void SetParameters(int aFirst, float aSecond, float aThird, int aFourth);
	int GetFirstParameter() const { return myFirstParameter; }
	float GetSecondParameter() const { return mySecondParameter; }
	float GetThirdParameter() const { return myThirdParameter; }
	int GetFourthParameter() const { return myFourthParameter; }

private:
	std::array<std::unique_ptr<AnimationCurve>, CURVE_SLOT_COUNT> myCurves;
	Vector3<float> myRotationAxis{0.0f, 0.0f, 0.0f};
	Vector3<float> myTranslation{0.0f, 0.0f, 0.0f};
	float myAngle = 0.0f;
	int myFirstParameter = 0;
	float mySecondParameter = 0.0f;
	float myThirdParameter = 0.0f;
	int myFourthParameter = 0;
};
} // namespace Zeph
