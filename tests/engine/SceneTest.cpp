// Scene objects without a GPU: instance matrices and attachments, room bounds.
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "core/Sphere.h"
#include "engine/Instance.h"
#include "engine/Room.h"
#include "model/ModelNode.h"

namespace
{
std::vector<float> Elements(const Matrix44<float>& aMatrix)
{
	return {aMatrix.myMatrix, aMatrix.myMatrix + 16};
}

std::vector<float> Components(const Vector3<float>& aVector)
{
	return {aVector.x, aVector.y, aVector.z};
}

// Records what the instance tells it.
class Follower : public Zeph::Instance::AttachedObject
{
public:
	explicit Follower(int* aRenderCount) : myRenderCount(aRenderCount) {}
	void UpdateTransform(const Matrix44<float>& anOrientation) override
	{
		myLast = anOrientation;
		++myUpdates;
	}
	void Render() override { ++*myRenderCount; }

	Matrix44<float> myLast;
	int myUpdates = 0;
	int* myRenderCount;
};
} // namespace

TEST(InstanceTest, ScalePositionAndOrientationSetTheMatrixAndAttachedObjectsFollowAllButScale)
{
	Zeph::ModelNode model;
	auto* instance = new Zeph::Instance(&model);
	int renders = 0;
	auto* follower = new Follower(&renders);
	instance->AddAttachedObject(follower);
	instance->SetPosition({4.0f, 5.0f, 6.0f});
	EXPECT_EQ(Elements(follower->myLast), Elements(instance->GetOrientation()));
	instance->SetScale(2.0f, 2.0f, 2.0f);
	// The translation is gone while the position member still holds it.
	EXPECT_EQ(Elements(instance->GetOrientation()),
	          (std::vector<float>{2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 1}));
	EXPECT_EQ(Components(instance->GetPosition()), (std::vector{4.0f, 5.0f, 6.0f}));
	EXPECT_EQ(follower->myUpdates, 1) << "SetScale leaves the attached objects where they are";
	instance->SetPosition({1.0f, 2.0f, 3.0f});
	EXPECT_EQ(Elements(instance->GetOrientation()),
	          (std::vector<float>{2, 0, 0, 0, 0, 2, 0, 0, 0, 0, 2, 0, 1, 2, 3, 1}));

	Matrix44<float> turned = Matrix44<float>::CreateRotateAroundZ(1.0f);
	turned.SetPosition({-7.0f, 8.0f, 9.0f});
	const Matrix44<float> before = instance->GetOrientation();
	instance->SetOrientation(turned);
	EXPECT_EQ(Elements(instance->GetPreviousOrientation()), Elements(before));
	EXPECT_EQ(Components(instance->GetPosition()), (std::vector{-7.0f, 8.0f, 9.0f}));
	EXPECT_EQ(follower->myUpdates, 3);
	EXPECT_EQ(Elements(follower->myLast), Elements(turned));

	// Rendering without an engine queues nothing but still renders the attachments.
	instance->Render();
	EXPECT_EQ(renders, 1);
	delete instance; // deletes the follower (ASan reports a leak otherwise)
}

TEST(InstanceTest, RoomDataReachesTheRootAndTheFirstChildChainOnly)
{
	// root -> {a -> {a0, a1}, b}
	auto* root = new Zeph::ModelNode();
	auto* a = new Zeph::ModelNode();
	a->AddChild(new Zeph::ModelNode());
	a->AddChild(new Zeph::ModelNode());
	root->AddChild(a);
	root->AddChild(new Zeph::ModelNode());
	Zeph::Instance instance(root);
	Zeph::RoomData room;
	room.myRoomIndex = 7;
	instance.SetRoomData(room);

	Zeph::Instance::Node* node = instance.GetRootNode();
	ASSERT_EQ(node->GetChildren().Count(), 2);
	Zeph::Instance::Node* nodeA = node->GetChildren()[0];
	ASSERT_EQ(nodeA->GetChildren().Count(), 2);
	EXPECT_EQ(nodeA->GetModelNode(), a);
	const auto index = [](Zeph::Instance::Node* aNode) {
		return aNode->GetRenderData().myRoomData.myRoomIndex;
	};
	EXPECT_EQ((std::vector{index(node), index(nodeA), index(nodeA->GetChildren()[0]),
	                       index(nodeA->GetChildren()[1]), index(node->GetChildren()[1])}),
	          (std::vector{7, 7, 7, -1, -1}));
	delete root;
}

// The centre and extents are the level tests' (loaded rooms) and the renderer's (the room box).
TEST(RoomTest, SphereInsideIsStrictOnBothSidesOfTheBounds)
{
	const Zeph::Room room({0.0f, 0.0f, 0.0f}, {2.0f, 4.0f, 6.0f});
	struct Case
	{
		Vector3<float> myCentre;
		float myRadius;
		bool myInside;
	};
	const Case cases[] = {
	    {{3.0f, 2.0f, 3.0f}, 1.0f, false},                                      // touches the face x = 2
	    {{3.0f, 2.0f, 3.0f}, 1.5f, true},   {{1.0f, -1.0f, 3.0f}, 1.0f, false}, // touches y = 0 from below
	    {{1.0f, -1.0f, 3.0f}, 1.01f, true}, {{-5.0f, 2.0f, 3.0f}, 1.0f, false},
	};
	for (const Case& test : cases)
	{
		EXPECT_EQ(room.SphereInside(Intersection::Sphere(test.myCentre, test.myRadius)), test.myInside)
		    << "sphere at (" << test.myCentre.x << ", " << test.myCentre.y << ", " << test.myCentre.z
		    << ") radius " << test.myRadius;
	}
}

// Whole numbers are the renderer test's (rooms of equal bounds share their box by this name).
TEST(RoomTest, DebugModelNameWritesTheBoundsWithoutSeparatorsInSixSignificantDigits)
{
	EXPECT_EQ(Zeph::Room::GetDebugModelName({-3.333333f, 0.1f, 100000.0f}, {1234567.0f, 2.0f, 3.0f}),
	          "room-3.333330.11000001.23457e+0623");
}
