#pragma once
// DebugLine: a coloured line between two points (the edges of the path graph): two
// vertices, a line model made from them and an instance of that model. Moving an
// end uploads the vertices again.
//
//   Zeph::DebugLine line;
//   line.Init({{0, 0, 0}, {0, 1, 0, 0}}, {{0, 0, 0}, {0, 1, 0, 0}});
//   line.SetVertexPosition(1, {3, 0, 2});
//   line.Render();                 // queued with the frame like any instance
//   line.Destroy();                // the instance, the model and the vertices
//
// The line owns its model (it is not shared through the model factory). Needs the
// Engine (its context current) from Init to Destroy.
#include "core/GrowingArray.h"
#include "core/Vector3.h"
#include "core/Vector4.h"

namespace Zeph
{
class Instance;
class ModelNode;

class DebugLine
{
public:
	struct Vertex
	{
		Vector3<float> myPosition;
		Vector4<float> myColor;
	};

	DebugLine();
	~DebugLine();
	DebugLine(const DebugLine&) = delete;
	DebugLine& operator=(const DebugLine&) = delete;

	// Makes the model and the instance; false (reported) when they cannot be made.
	bool Init(const Vertex& aFirst, const Vertex& aSecond);
	void Destroy();

	// anIndex 0 or 1; other indices are ignored.
	void SetVertexPosition(int anIndex, const Vector3<float>& aPosition);
	const Vertex& GetVertex(int anIndex) const { return myVertices[anIndex]; }
	void Render();
	Instance* GetInstance() const { return myInstance; }

private:
	GrowingArray<Vertex> myVertices;
	ModelNode* myModelNode = nullptr;
	Instance* myInstance = nullptr;
};
} // namespace Zeph
