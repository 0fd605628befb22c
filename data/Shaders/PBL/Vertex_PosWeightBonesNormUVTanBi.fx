// Skinned lit models (vertex type 6: position, four bone weights and indices,
// normal, texture coordinate, tangent, binormal): forward, G-buffer and shadow
// techniques. Each vertex is the weighted sum of its four bones' transforms.

#include "../Common/Transforms.fxh"

// The skeleton's bone matrices in model space (engine convention, row vectors).
const int ourBoneCount = 64;
uniform mat4 Bones[64];

mat4 SkinMatrix(vec4 someWeights, ivec4 someBones)
{
	ivec4 bones = clamp(someBones, ivec4(0), ivec4(ourBoneCount - 1));
	return Bones[bones.x] * someWeights.x + Bones[bones.y] * someWeights.y + Bones[bones.z] * someWeights.z +
	       Bones[bones.w] * someWeights.w;
}

vertex VS_Model
{
	in vec3 POSITION;
	in vec4 WEIGHTS;
	in ivec4 BONES;
	in vec3 NORMAL;
	in vec2 TEXCOORD;
	in vec3 TANGENT;
	in vec3 BINORMAL;
	out vec2 vTexCoord;
	out vec3 vNormal;
	out vec3 vTangent;
	out vec3 vBinormal;
	out vec3 vWorldPosition;
	out float vViewDepth;

	void main()
	{
		mat4 skin = World * SkinMatrix(WEIGHTS, BONES);
		vec4 world = skin * vec4(POSITION, 1.0);
		vec4 view = View * world;
		mat3 rotation = mat3(skin);
		vTexCoord = TEXCOORD;
		vNormal = rotation * NORMAL;
		vTangent = rotation * TANGENT;
		vBinormal = rotation * BINORMAL;
		vWorldPosition = world.xyz;
		vViewDepth = view.z;
		gl_Position = Projection * view;
	}
}

vertex VS_Shadow
{
	in vec3 POSITION;
	in vec4 WEIGHTS;
	in ivec4 BONES;
	in vec3 NORMAL;
	in vec2 TEXCOORD;
	in vec3 TANGENT;
	in vec3 BINORMAL;
	out vec2 vTexCoord;

	void main()
	{
		vTexCoord = TEXCOORD;
		gl_Position = ShadowCasterViewProj * (World * (SkinMatrix(WEIGHTS, BONES) * vec4(POSITION, 1.0)));
	}
}

#include "Model.fxh"
