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

// The surface's view-space position under this fragment and its G-buffer texel; false where
// the G-buffer holds no geometry. The rest of the surface is read by ReadMaterial only for
// pixels the light reaches: most of a volume's pixels lie outside the reach.
bool ReadPosition(vec2 aFragCoord, out GBufferSurface aSurface, out ivec2 aTexel)
{
	ivec2 size = max(textureSize(DepthTexture, 0), ivec2(1));
	aTexel = clamp(ivec2(aFragCoord), ivec2(0), size - 1);
	float depth = texelFetch(DepthTexture, aTexel, 0).r;
	if (depth < 0.0)
	{
		return false;
	}
	aSurface.myPosition = ViewPositionFromDepth(aFragCoord / vec2(size), depth, Projection, FarPlane);
	return true;
}

void ReadMaterial(ivec2 aTexel, inout GBufferSurface aSurface)
{
	vec4 material = texelFetch(MaterialTexture, aTexel, 0);
	aSurface.myAlbedo = texelFetch(AlbedoTexture, aTexel, 0).rgb;
	aSurface.myNormal = DecodeNormal(texelFetch(NormalTexture, aTexel, 0));
	aSurface.myToEye = SafeNormalize(-aSurface.myPosition, vec3(0.0, 0.0, -1.0));
	aSurface.myRoughness = material.r;
	aSurface.myMetalness = material.g;
}

// The light's view-space direction from the surface (the surface's normal where the surface
// is at the light) and its distance.
vec3 DirectionToLight(GBufferSurface aSurface, vec3 aFallback, out float aDistance)
{
	vec3 toLight = LightPosition.xyz - aSurface.myPosition;
	aDistance = length(toLight);
	return SafeNormalize(toLight, aFallback);
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
