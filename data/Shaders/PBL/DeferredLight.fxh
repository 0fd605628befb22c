// What the deferred point and spot lights share: the G-buffer they read, the light's
// view-space position, colour and reach, and the lit surface at a pixel. The
// including effect declares VS_Volume and includes ../Common/Transforms.fxh and
// ../Common/Lighting.fxh before this file.

uniform vec4 LightPosition;
uniform vec4 LightColor;
uniform float LightFalloff;

uniform sampler2D AlbedoTexture;
uniform sampler2D NormalTexture;
uniform sampler2D DepthTexture;
uniform sampler2D MaterialTexture;

// One G-buffer texel, with its view-space position and the direction to the camera.
struct GBufferSurface
{
	vec3 myAlbedo;
	vec3 myNormal;
	vec3 myPosition;
	vec3 myToEye;
	float myRoughness;
	float myMetalness;
};

// The surface under this fragment; false where the G-buffer holds no geometry.
bool ReadSurface(vec2 aFragCoord, out GBufferSurface aSurface)
{
	ivec2 size = max(textureSize(DepthTexture, 0), ivec2(1));
	ivec2 texel = clamp(ivec2(aFragCoord), ivec2(0), size - 1);
	float depth = texelFetch(DepthTexture, texel, 0).r;
	if (depth < 0.0)
	{
		return false;
	}
	vec4 material = texelFetch(MaterialTexture, texel, 0);
	aSurface.myAlbedo = texelFetch(AlbedoTexture, texel, 0).rgb;
	aSurface.myNormal = DecodeNormal(texelFetch(NormalTexture, texel, 0));
	aSurface.myPosition = ViewPositionFromDepth(aFragCoord / vec2(size), depth, Projection, FarPlane);
	aSurface.myToEye = SafeNormalize(-aSurface.myPosition, vec3(0.0, 0.0, -1.0));
	aSurface.myRoughness = material.r;
	aSurface.myMetalness = material.g;
	return true;
}

// The light's view-space direction from the surface and its distance.
vec3 DirectionToLight(GBufferSurface aSurface, out float aDistance)
{
	vec3 toLight = LightPosition.xyz - aSurface.myPosition;
	aDistance = length(toLight);
	return SafeNormalize(toLight, aSurface.myNormal);
}

// The volume's outline in the light's colour, for looking at where lights are.
fragment PS_VolumeMesh
{
	out vec4 oColor;

	void main()
	{
		oColor = vec4(LightColor.rgb, 1.0);
	}
}
