// The bounding sphere a model tree gets when the factory stores it.
#include <gtest/gtest.h>
#include <memory>
#include <vector>

#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"

namespace
{
// A model of the vertex type whose vertices hold the positions at the stride's start.
Zeph::Model* ModelWith(int aVertexType, int aStride, const std::vector<Vector3<float>>& somePositions)
{
	std::vector<float> data(somePositions.size() * static_cast<size_t>(aStride) / 4, 99.0f);
	for (size_t vertex = 0; vertex < somePositions.size(); ++vertex)
	{
		float* at = data.data() + vertex * static_cast<size_t>(aStride) / 4;
		at[0] = somePositions[vertex].x;
		at[1] = somePositions[vertex].y;
		at[2] = somePositions[vertex].z;
	}
	auto* model = new Zeph::Model();
	model->SetVertexType(aVertexType);
	model->SetVertexData(static_cast<int>(somePositions.size()), aStride, data.data(),
	                     static_cast<int>(data.size() * 4));
	return model;
}
} // namespace

// The box of the first model (depth first) mirrored in x: its centre and half its diagonal.
TEST(BoundingSphereTest, TheBoxOfTheFirstModelIsMirroredInX)
{
	struct Case
	{
		const char* myName;
		int myType;
		int myStride;
		std::vector<Vector3<float>> myPositions;
		Vector3<float> myCentre;
		float myRadius;
	};
	const Case cases[] = {
	    {"two lit vertices, x swapped after mirroring",
	     4,
	     56,
	     {{1, 0, 0}, {3, 0, 4}},
	     {-2, 0, 2},
	     2.2360680f},
	    {"skinned vertices", 6, 64, {{0, -2, 0}, {2, 2, 0}}, {-1, 0, 0}, 2.2360680f},
	    {"other types count as the origin", 2, 32, {{5, 5, 5}, {-5, 1, 1}}, {0, 0, 0}, 0.0f},
	};
	for (const Case& test : cases)
	{
		Zeph::ModelNode root;
		root.SetModel(ModelWith(test.myType, test.myStride, test.myPositions));
		const Intersection::Sphere sphere = Zeph::ModelFactory::ComputeBoundingSphere(root);
		EXPECT_EQ((std::vector{sphere.myPosition.x, sphere.myPosition.y, sphere.myPosition.z}),
		          (std::vector{test.myCentre.x, test.myCentre.y, test.myCentre.z}))
		    << test.myName;
		EXPECT_NEAR(sphere.myRadius, test.myRadius, 1e-5f) << test.myName;
	}

	// A root without a model: the first child's grandchild comes before the second child.
	Zeph::ModelNode root;
	auto* first = new Zeph::ModelNode();
	auto* deep = new Zeph::ModelNode();
	deep->SetModel(ModelWith(4, 56, {{4, 0, 0}}));
	first->AddChild(deep);
	auto* second = new Zeph::ModelNode();
	second->SetModel(ModelWith(4, 56, {{8, 0, 0}}));
	root.AddChild(first);
	root.AddChild(second);
	EXPECT_FLOAT_EQ(Zeph::ModelFactory::ComputeBoundingSphere(root).myPosition.x, -4.0f);
}
