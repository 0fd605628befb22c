#pragma once
// Effect: materials, their profile_COMMON effects and the images they use.
//
//   const Collada::Material* material = document.FindMaterial(binding->myTarget);
//   const Collada::Effect* effect = document.FindEffect(material->myEffect);
//   if (effect->myDiffuse.myHasTextureFlag)
//   {
//       const Collada::Image* image = document.FindImage(effect->myDiffuse.myImage);
//       open(image->myPath);                          // file:// and %20 already decoded
//   }
//
// A channel's texture names a sampler newparam, whose <source> names a surface newparam, whose
// init_from names the image; the reader follows that chain (or takes an image id given directly,
// as older exporters write it) and stores the image id. The bump channel is not part of
// profile_COMMON: exporters write it as <bump> inside an <extra> of the technique, the profile or
// the effect, and the reader takes the first one found there.

#include <string>

namespace Collada
{
struct Image
{
	std::string myId;
	std::string myName;
	std::string myPath; // as written, with file:// removed, %XX decoded and '\' turned into '/'
	int myLine = 0;
};

struct Channel
{
	bool myHasColorFlag = false;
	float myColor[4] = {0.0f, 0.0f, 0.0f, 1.0f};
	bool myHasTextureFlag = false;
	std::string myImage;    // the image's id
	std::string myTexcoord; // the texcoord symbol, bound by bind_vertex_input
};

enum class Shading
{
	None, // no profile_COMMON
	Constant,
	Lambert,
	Phong,
	Blinn
};

struct Effect
{
	std::string myId;
	std::string myName;
	Shading myShading = Shading::None;
	Channel myEmission;
	Channel myAmbient;
	Channel myDiffuse;
	Channel mySpecular;
	Channel myReflective;
	Channel myBump;
	float myShininess = 0.0f;
	int myLine = 0;
};

struct Material
{
	std::string myId;
	std::string myName;
	std::string myEffect; // the effect's id
	int myLine = 0;
};
} // namespace Collada
