// The surface side of the lit model effects: textures, light, the fragment stages
// and every technique a model selects. The including effect declares the vertex
// stages VS_Model (outputs below) and VS_Shadow (vTexCoord) and includes
// ../Common/Transforms.fxh before this file.
//
// VS_Model outputs: vTexCoord, vNormal, vTangent, vBinormal, vWorldPosition (world
// space) and vViewDepth (view-space depth).

#include "../Common/Lighting.fxh"

// Material textures, bound per surface by the variable names model files use.
uniform sampler2D DiffuseTexture;
uniform sampler2D NormalTexture;
uniform sampler2D RoughnessTexture;
uniform sampler2D AOTexture;
uniform sampler2D SubstanceTexture;
// How much of the base colour the surface emits (0..1); the ambient pass scales it.
uniform float EmissiveAmount = 0.0;

// The room's environment for reflections: a prefiltered cube map (rougher mips for
// rougher surfaces) captured at EnvBoxPos, whose walls are the box EnvBoxMin..EnvBoxMax.
uniform samplerCube CubeMap;
uniform vec4 EnvBoxPos;
uniform vec4 EnvBoxMin;
uniform vec4 EnvBoxMax;

sampler CubeMap
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

// The forward passes' directional light: the direction the light travels and its colour.
uniform vec4 LightDirection = vec4(0.0, 0.0, 1.0, 0.0);
uniform vec4 LightColor = vec4(1.0);
uniform vec4 EyePos;

// The sun's orthographic shadow caster (set by the shadow pass), the filter radius in
// shadow-map texture coordinates (x) and the depth bias the shadow lookups use.
uniform mat4 ShadowCasterViewProj;
uniform vec4 LightRadiusUV;
uniform float ShadowBias;

// The selection outline's flat colour.
const vec4 ourOutlineColor = vec4(1.0, 0.55, 0.1, 1.0);

// Alpha-tested techniques drop texels below this coverage.
const float ourAlphaCutoff = 0.5;

fragment PS_Forward
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in vec3 vWorldPosition;
	in float vViewDepth;
	out vec4 oColor;

	void main()
	{
		vec4 albedo = texture(DiffuseTexture, vTexCoord);
		float lambert = max(dot(normalize(vNormal), -normalize(LightDirection.xyz)), 0.0);
		oColor = vec4(albedo.rgb * LightColor.rgb * lambert, albedo.a);
	}
}

fragment PS_ForwardAlphaTest
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in vec3 vWorldPosition;
	in float vViewDepth;
	out vec4 oColor;

	void main()
	{
		vec4 albedo = texture(DiffuseTexture, vTexCoord);
		if (albedo.a < ourAlphaCutoff)
		{
			discard;
		}
		float lambert = max(dot(normalize(vNormal), -normalize(LightDirection.xyz)), 0.0);
		oColor = vec4(albedo.rgb * LightColor.rgb * lambert, 1.0);
	}
}

// The camera's world position from the view matrix (a rotation and a translation).
vec3 CameraWorldPosition()
{
	return -(transpose(mat3(View)) * View[3].xyz);
}

// The direction to look the environment up in: the reflected ray from aPosition meets the
// room's box, and the cube map is read toward that point from where it was captured. A
// box that is empty on some axis means no box: the plain reflected direction.
vec3 BoxProjectedDirection(vec3 aPosition, vec3 aDirection)
{
	if (any(lessThanEqual(EnvBoxMax.xyz, EnvBoxMin.xyz)))
	{
		return aDirection;
	}
	vec3 direction = vec3(abs(aDirection.x) < 1e-6 ? 1e-6 : aDirection.x,
	                      abs(aDirection.y) < 1e-6 ? 1e-6 : aDirection.y,
	                      abs(aDirection.z) < 1e-6 ? 1e-6 : aDirection.z);
	vec3 toFarWall = max((EnvBoxMax.xyz - aPosition) / direction, (EnvBoxMin.xyz - aPosition) / direction);
	float distanceToWall = min(min(toFarWall.x, toFarWall.y), toFarWall.z);
	if (!(distanceToWall > 0.0))
	{
		return aDirection;
	}
	return SafeNormalize(aPosition + aDirection * distanceToWall - EnvBoxPos.xyz, aDirection);
}

// The five G-buffer targets in slot order: albedo (sRGB target), view-space normal
// (encoded to 0..1), linear depth (view depth over the far plane), material (roughness,
// metalness, ambient occlusion, emissive amount) and the prefiltered reflection (sRGB
// target).
void WriteGBuffer(vec2 aTexCoord, vec3 aNormal, vec3 aTangent, vec3 aBinormal, vec3 aWorldPosition,
                  float aViewDepth, vec3 anAlbedo, out vec4 anAlbedoOut, out vec4 aNormalOut,
                  out float aDepthOut, out vec4 aMaterialOut, out vec4 aReflectionOut)
{
	vec3 normal = SafeNormalize(aNormal, vec3(0.0, 1.0, 0.0));
	vec3 tangent = SafeNormalize(aTangent, vec3(0.0));
	vec3 binormal = SafeNormalize(aBinormal, vec3(0.0));
	vec3 tangentNormal = texture(NormalTexture, aTexCoord).xyz * 2.0 - 1.0;
	vec3 worldNormal =
	    SafeNormalize(tangent * tangentNormal.x + binormal * tangentNormal.y + normal * tangentNormal.z, normal);
	vec3 viewNormal = SafeNormalize(mat3(View) * worldNormal, vec3(0.0, 0.0, -1.0));

	float roughness = clamp(texture(RoughnessTexture, aTexCoord).r, 0.0, 1.0);
	float metalness = clamp(texture(SubstanceTexture, aTexCoord).r, 0.0, 1.0);
	float occlusion = clamp(texture(AOTexture, aTexCoord).r, 0.0, 1.0);

	vec3 fromEye = SafeNormalize(aWorldPosition - CameraWorldPosition(), vec3(0.0, 0.0, 1.0));
	vec3 reflected = BoxProjectedDirection(aWorldPosition, reflect(fromEye, worldNormal));
	float lastMip = float(max(textureQueryLevels(CubeMap) - 1, 0));

	anAlbedoOut = vec4(anAlbedo, 1.0);
	aNormalOut = EncodeNormal(viewNormal);
	aDepthOut = aViewDepth / max(FarPlane, ourEpsilon);
	aMaterialOut = vec4(roughness, metalness, occlusion, clamp(EmissiveAmount, 0.0, 1.0));
	aReflectionOut = vec4(textureLod(CubeMap, reflected, roughness * lastMip).rgb, 1.0);
}

fragment PS_GBuffer
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in vec3 vWorldPosition;
	in float vViewDepth;
	layout(location = 0) out vec4 oAlbedo;
	layout(location = 1) out vec4 oNormal;
	layout(location = 2) out float oLinearDepth;
	layout(location = 3) out vec4 oMaterial;
	layout(location = 4) out vec4 oReflection;

	void main()
	{
		WriteGBuffer(vTexCoord, vNormal, vTangent, vBinormal, vWorldPosition, vViewDepth,
		             texture(DiffuseTexture, vTexCoord).rgb, oAlbedo, oNormal, oLinearDepth, oMaterial, oReflection);
	}
}

fragment PS_GBufferAlphaTest
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in vec3 vWorldPosition;
	in float vViewDepth;
	layout(location = 0) out vec4 oAlbedo;
	layout(location = 1) out vec4 oNormal;
	layout(location = 2) out float oLinearDepth;
	layout(location = 3) out vec4 oMaterial;
	layout(location = 4) out vec4 oReflection;

	void main()
	{
		vec4 albedo = texture(DiffuseTexture, vTexCoord);
		if (albedo.a < ourAlphaCutoff)
		{
			discard;
		}
		WriteGBuffer(vTexCoord, vNormal, vTangent, vBinormal, vWorldPosition, vViewDepth, albedo.rgb, oAlbedo,
		             oNormal, oLinearDepth, oMaterial, oReflection);
	}
}

// The selected objects' mask for the outline glow: flat colour, seen through everything.
fragment PS_OutlineMask
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in vec3 vWorldPosition;
	in float vViewDepth;
	out vec4 oColor;

	void main()
	{
		oColor = ourOutlineColor;
	}
}

// Depth only: the shadow map keeps nothing but depth.
fragment PS_Shadow
{
	in vec2 vTexCoord;

	void main()
	{
	}
}

fragment PS_ShadowAlphaTest
{
	in vec2 vTexCoord;

	void main()
	{
		if (texture(DiffuseTexture, vTexCoord).a < ourAlphaCutoff)
		{
			discard;
		}
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_Forward;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderBase
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_Forward;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderAlphaTest
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_ForwardAlphaTest;
		CullMode = None;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

// The front-face techniques draw geometry whose winding is reversed.
technique RenderFrontFace
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_Forward;
		CullMode = Front;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderGBuffer
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_GBuffer;
		BlendEnable = false;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderGBufferFrontFace
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_GBuffer;
		BlendEnable = false;
		CullMode = Front;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderGBufferAlphaTest
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_GBufferAlphaTest;
		BlendEnable = false;
		CullMode = None;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderOutlineMask
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_OutlineMask;
		BlendEnable = false;
		CullMode = None;
		DepthEnable = false;
		DepthWriteMask = Zero;
	}
}

technique RenderShadowBuffer
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_Shadow;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBufferBase
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_Shadow;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBufferAlphaTest
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_ShadowAlphaTest;
		CullMode = None;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBufferFrontFace
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_Shadow;
		CullMode = Front;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}
