#pragma once
// Document: a COLLADA 1.4.1 document read into plain structures, for the model importer.
//
//   Collada::Document document;
//   std::string error;
//   if (!document.Load("data/Models/box.dae", error)) { report(error); return nullptr; }
//   const Collada::VisualScene* scene = document.GetVisualScene();
//   ... walk scene->myNodes, FindGeometry / FindController / FindCamera / FindLight by instance url,
//       instance_material target -> FindMaterial -> FindEffect -> FindImage ...
//
// Loading checks what the importer relies on, so it can index without checks of its own: every
// url and id reference inside the document resolves, every index lies inside its source, and the
// counts agree (accessor count x stride within its array, vcount sum and index list lengths).
// A failure answers false with one message "<document>:<line>: <element>: <what>" and leaves
// the document empty. The one reference left unchecked is instance_material's target (exporters
// bind materials they did not write): FindMaterial answers null for it. Unknown optional elements are
// ignored. References to other files (a url that does not start with '#') are refused.
//
// The document owns everything; pointers it hands out live until the next Load or Destroy.

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "platform/collada/Camera.h"
#include "platform/collada/Effect.h"
#include "platform/collada/Light.h"
#include "platform/collada/Mesh.h"
#include "platform/collada/Node.h"
#include "platform/collada/Skin.h"

namespace Collada
{
class Document
{
public:
	Document() = default;
	~Document() = default;
	Document(const Document&) = delete;
	Document& operator=(const Document&) = delete;

	// Reads a file; the path's components are matched case-insensitively against what exists.
	bool Load(const std::string& aPath, std::string& anErrorOut);
	// As Load; messages name the document aName.
	bool LoadFromMemory(const void* someBytes, size_t aSize, std::string& anErrorOut,
	                    const std::string& aName = "<memory>");
	void Destroy();

	const Asset& GetAsset() const { return myAsset; }
	// The scene's instance_visual_scene, or the first visual scene when the file has no <scene>;
	// null when there is none.
	const VisualScene* GetVisualScene() const { return myScene; }

	const Geometry* FindGeometry(const std::string& anId) const;
	const Controller* FindController(const std::string& anId) const;
	const Material* FindMaterial(const std::string& anId) const;
	const Effect* FindEffect(const std::string& anId) const;
	const Image* FindImage(const std::string& anId) const;
	const Camera* FindCamera(const std::string& anId) const;
	// Of several lights with the id, the first with a technique_common.
	const Light* FindLight(const std::string& anId) const;
	// A node of library_nodes or of any visual scene, at any depth.
	const Node* FindNode(const std::string& anId) const;

	const std::vector<Geometry>& GetGeometries() const { return myGeometries; }
	const std::vector<Controller>& GetControllers() const { return myControllers; }
	const std::vector<Material>& GetMaterials() const { return myMaterials; }
	const std::vector<Effect>& GetEffects() const { return myEffects; }
	const std::vector<Image>& GetImages() const { return myImages; }
	const std::vector<Camera>& GetCameras() const { return myCameras; }
	const std::vector<Light>& GetLights() const { return myLights; }
	const std::vector<std::unique_ptr<VisualScene>>& GetVisualScenes() const { return myVisualScenes; }
	const std::vector<std::unique_ptr<Node>>& GetLibraryNodes() const { return myLibraryNodes; }

private:
	friend class Reader;

	Asset myAsset;
	std::vector<Geometry> myGeometries;
	std::vector<Controller> myControllers;
	std::vector<Material> myMaterials;
	std::vector<Effect> myEffects;
	std::vector<Image> myImages;
	std::vector<Camera> myCameras;
	std::vector<Light> myLights;
	std::vector<std::unique_ptr<VisualScene>> myVisualScenes;
	std::vector<std::unique_ptr<Node>> myLibraryNodes;
	const VisualScene* myScene = nullptr;
};
} // namespace Collada
