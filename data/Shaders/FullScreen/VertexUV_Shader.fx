// Full-screen passes of the deferred frame: copies and debug views, the shadow
// resolve, the ambient and image-based light, screen-space ambient occlusion,
// eye-adapted tone mapping, bloom, colour grading, the selection outline, motion blur,
// FXAA and the reflection cubemaps' filter. Each technique is one pass drawing the quad
// below with blending (unless it says otherwise), depth and culling off; its main input
// is SourceTexture.

#include "../Common/Transforms.fxh"
#include "../Common/Lighting.fxh"

uniform float ElapsedTime;

// The draw's source and the extra inputs some passes combine.
uniform sampler2D SourceTexture;
uniform sampler2D DiffuseTexture;
uniform sampler2D SecondaryDiffuseTexture;
uniform sampler2D TertiaryDiffuseTexture;
uniform sampler2D QuartaryDiffuseTexture;
uniform sampler2D QuintiaryDiffuseTexture;
uniform sampler2D VelocityTexture;

// 1 / destination size, 1 / source size and the destination size, in texels.
uniform vec2 InvTargetSize;
uniform vec2 InvSourceSize;
uniform vec2 ScreenSize;

// The camera's world transform and the view-space far-plane corners in quad order
// (top-left, top-right, bottom-left, bottom-right); a corner times a linear depth is
// the view-space position on that ray.
uniform mat4 invView;
uniform vec4 FarFrustrumCornersViewSpace[4];

// The G-buffer and the resolved shadow visibility.
uniform sampler2D LinearDepthTexture;
uniform sampler2D AlbedoTexture;
uniform sampler2D NormalTexture;
uniform sampler2D MaterialTexture;
uniform sampler2D ReflectionTexture;
uniform sampler2D ShadowMap;

// Second-order spherical-harmonics irradiance over the level's volume, per colour
// channel, stored as coefficients * 0.5 + 0.5 in UNORM textures.
uniform sampler3D cArTexture;
uniform sampler3D cAgTexture;
uniform sampler3D cAbTexture;
uniform sampler3D cBrTexture;
uniform sampler3D cBgTexture;
uniform sampler3D cBbTexture;
uniform sampler3D cCTexture;
uniform vec4 WorldSize;
uniform vec4 WorldMin;

// The sun's orthographic shadow caster.
uniform mat4 ShadowCasterViewProj;
uniform vec4 LightRadiusUV;
uniform float ShadowBias;
uniform sampler2DShadow ShadowDepthTexture;
// The same depth map read as depths, for the blocker search.
uniform sampler2D ShadowBlockerTexture;

// Ambient occlusion.
uniform vec4 Randvectors[16];
uniform float SSAO_scale;
uniform float SSAO_sample_rad;
uniform float SSAO_bias;
uniform float SSAO_Intensity;
uniform sampler2D AOTexture;

// Exposure and bloom.
uniform float AutoExposureAdjustment = 0.3;
uniform float lumMin = 0.05;
uniform float lumMax = 4.0;
uniform float BloomThreshold = 0.8;
uniform float BloomFactor = 0.25;
uniform float EmissiveMultiplier = 2.0;

// The outline's separable blur taps: offset in .x (horizontal) or .y (vertical), in
// texture-coordinate units; the weight in every component.
uniform vec4 horSampleOffsets[15];
uniform vec4 horSampleWeights[15];
uniform vec4 vertSampleOffsets[15];
uniform vec4 vertSampleWeights[15];

// Colour grading: texel (r, g, b) holds the graded sRGB-encoded colour of the
// sRGB-encoded input (r, g, b) / (size - 1).
uniform sampler3D ColorGradingTex;

// Motion blur.
uniform float BlurFactor;
uniform float BlurScale;

// Reflection filtering.
uniform mat4 ScaleMatrix;
uniform float CubePower;
uniform samplerCube CubeNormals;

sampler SourceTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler DiffuseTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler SecondaryDiffuseTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler TertiaryDiffuseTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler QuartaryDiffuseTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler QuintiaryDiffuseTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler VelocityTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

// G-buffer values are never interpolated across silhouettes.
sampler LinearDepthTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler AlbedoTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler NormalTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler MaterialTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler ReflectionTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler ShadowMap
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler cArTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler cAgTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler cAbTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler cBrTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler cBgTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler cBbTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler cCTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

// Taps outside the shadow map compare against a depth of 1 (lit).
sampler ShadowDepthTexture
{
	Filter = COMPARISON_MIN_MAG_MIP_LINEAR;
	ComparisonFunc = LessEqual;
	AddressU = Border;
	AddressV = Border;
	BorderColor = float4(1.0, 1.0, 1.0, 1.0);
}

sampler ShadowBlockerTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Border;
	AddressV = Border;
	BorderColor = float4(1.0, 1.0, 1.0, 1.0);
}

sampler AOTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler ColorGradingTex
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

sampler CubeNormals
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

// The size of one source texel in texture coordinates: InvSourceSize, or the source's
// own size where the caller did not set it.
vec2 SourceTexelSize()
{
	if (InvSourceSize.x > 0.0 && InvSourceSize.y > 0.0)
	{
		return InvSourceSize;
	}
	return 1.0 / vec2(max(textureSize(SourceTexture, 0), ivec2(1)));
}

// The view-space ray through aUv that reaches the far plane (bilinear in the corners).
vec3 FrustumRayAt(vec2 aUv)
{
	vec3 top = mix(FarFrustrumCornersViewSpace[0].xyz, FarFrustrumCornersViewSpace[1].xyz, aUv.x);
	vec3 bottom = mix(FarFrustrumCornersViewSpace[2].xyz, FarFrustrumCornersViewSpace[3].xyz, aUv.x);
	return mix(top, bottom, aUv.y);
}

// A per-pixel value in 0..1 without visible structure (interleaved gradient noise), used
// to rotate sample patterns so that the blur that follows removes the banding.
float PixelNoise(vec2 aPixel)
{
	return fract(52.9829189 * fract(dot(aPixel, vec2(0.06711056, 0.00583715))));
}

mat2 Rotation(float anAngle)
{
	float s = sin(anAngle);
	float c = cos(anAngle);
	return mat2(c, s, -s, c);
}

vertex VS_Quad
{
	in vec3 POSITION;
	in vec2 TEXCOORD;
	out vec2 vTexCoord;
	out vec3 vFrustumRay;

	void main()
	{
		vTexCoord = TEXCOORD;
		vFrustumRay = FrustumRayAt(TEXCOORD);
		gl_Position = vec4(POSITION.xy, 0.0, 1.0);
	}
}

#include "Basic.fxh"
#include "SceneLighting.fxh"
#include "Occlusion.fxh"
#include "Exposure.fxh"
#include "Outline.fxh"
#include "Fxaa.fxh"
#include "CubemapFilter.fxh"
