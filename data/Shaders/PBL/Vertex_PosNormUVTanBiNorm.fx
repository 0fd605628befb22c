// Lit models (vertex type 4: position, normal, texture coordinate, tangent,
// binormal): forward, G-buffer and shadow techniques.

#include "../Common/Transforms.fxh"

vertex VS_Model
{
	in vec3 POSITION;
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
		vec4 world = World * vec4(POSITION, 1.0);
		vec4 view = View * world;
		mat3 rotation = mat3(World);
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
	in vec3 NORMAL;
	in vec2 TEXCOORD;
	in vec3 TANGENT;
	in vec3 BINORMAL;
	out vec2 vTexCoord;

	void main()
	{
		vTexCoord = TEXCOORD;
		gl_Position = ShadowCasterViewProj * (World * vec4(POSITION, 1.0));
	}
}

#include "Model.fxh"
