// Shading shared by the deferred light volumes and the ambient pass: decoding the
// G-buffer, the microfacet BRDF (GGX distribution, height-correlated Smith
// visibility, Schlick Fresnel) with an energy-conserving Lambert diffuse, the
// analytic split-sum term for image-based specular, and sRGB conversions.
//
// Every function guards its divisions and normalisations: an empty G-buffer texel
// (normal 0.5, depth -1, material 0) must shade to something finite.

#ifndef LUMORA_LIGHTING_FXH
#define LUMORA_LIGHTING_FXH

const float ourPi = 3.14159265359;
const float ourEpsilon = 1e-5;
// The smallest perceptual roughness shaded; below it a point light's highlight becomes a
// sub-pixel spike that aliases and overflows half floats.
const float ourMinRoughness = 0.045;
// Non-metals reflect about 4% at normal incidence.
const float ourDielectricF0 = 0.04;

// A unit vector, or aFallback where the input is (nearly) zero.
vec3 SafeNormalize(vec3 aVector, vec3 aFallback)
{
	float lengthSquared = dot(aVector, aVector);
	return lengthSquared > 1e-12 ? aVector * inversesqrt(lengthSquared) : aFallback;
}

// The G-buffer holds unit normals as n * 0.5 + 0.5. An empty texel (0.5) decodes to a
// normal facing the camera (-Z in the left-handed view space).
vec3 DecodeNormal(vec4 anEncoded)
{
	return SafeNormalize(anEncoded.xyz * 2.0 - 1.0, vec3(0.0, 0.0, -1.0));
}

vec4 EncodeNormal(vec3 aNormal)
{
	return vec4(aNormal * 0.5 + 0.5, 1.0);
}

float Luminance(vec3 aColor)
{
	return dot(aColor, vec3(0.2126, 0.7152, 0.0722));
}

vec3 LinearToSrgb(vec3 aColor)
{
	vec3 color = clamp(aColor, 0.0, 1.0);
	vec3 low = color * 12.92;
	vec3 high = 1.055 * pow(color, vec3(1.0 / 2.4)) - 0.055;
	return mix(high, low, lessThanEqual(color, vec3(0.0031308)));
}

vec3 SrgbToLinear(vec3 aColor)
{
	vec3 color = clamp(aColor, 0.0, 1.0);
	vec3 low = color / 12.92;
	vec3 high = pow((color + 0.055) / 1.055, vec3(2.4));
	return mix(high, low, lessThanEqual(color, vec3(0.04045)));
}

// Reflectance at normal incidence: 4% for dielectrics, the base colour for metals.
vec3 SpecularF0(vec3 anAlbedo, float aMetalness)
{
	return mix(vec3(ourDielectricF0), anAlbedo, clamp(aMetalness, 0.0, 1.0));
}

vec3 FresnelSchlick(vec3 anF0, float aCosine)
{
	float factor = 1.0 - clamp(aCosine, 0.0, 1.0);
	float factor2 = factor * factor;
	return anF0 + (1.0 - anF0) * (factor2 * factor2 * factor);
}

// GGX / Trowbridge-Reitz normal distribution for alpha = roughness^2.
float DistributionGgx(float aNdotH, float anAlpha)
{
	float alpha2 = anAlpha * anAlpha;
	float denominator = aNdotH * aNdotH * (alpha2 - 1.0) + 1.0;
	return alpha2 / max(ourPi * denominator * denominator, ourEpsilon);
}

// Height-correlated Smith visibility term V = G / (4 NdotL NdotV).
float VisibilitySmithGgx(float aNdotV, float aNdotL, float anAlpha)
{
	float alpha2 = anAlpha * anAlpha;
	float lambdaV = aNdotL * sqrt(aNdotV * aNdotV * (1.0 - alpha2) + alpha2);
	float lambdaL = aNdotV * sqrt(aNdotL * aNdotL * (1.0 - alpha2) + alpha2);
	return 0.5 / max(lambdaV + lambdaL, ourEpsilon);
}

// Outgoing radiance toward aV from one light of incoming radiance aRadiance arriving from
// aL (all unit vectors pointing away from the surface). The diffuse lobe keeps only the
// energy the specular Fresnel term does not reflect, and metals have no diffuse.
vec3 ShadeDirect(vec3 anAlbedo, float aRoughness, float aMetalness, vec3 aN, vec3 aV, vec3 aL,
                 vec3 aRadiance)
{
	float NdotL = dot(aN, aL);
	if (NdotL <= 0.0)
	{
		return vec3(0.0);
	}
	float NdotV = max(dot(aN, aV), 1e-4);
	vec3 H = SafeNormalize(aV + aL, aN);
	float NdotH = clamp(dot(aN, H), 0.0, 1.0);
	float VdotH = clamp(dot(aV, H), 0.0, 1.0);
	float roughness = clamp(aRoughness, ourMinRoughness, 1.0);
	float alpha = roughness * roughness;
	float metalness = clamp(aMetalness, 0.0, 1.0);

	vec3 F = FresnelSchlick(SpecularF0(anAlbedo, metalness), VdotH);
	vec3 specular = F * (DistributionGgx(NdotH, alpha) * VisibilitySmithGgx(NdotV, NdotL, alpha));
	vec3 kd = (1.0 - F) * (1.0 - metalness);
	vec3 diffuse = kd * anAlbedo / ourPi;
	return (diffuse + specular) * aRadiance * NdotL;
}

// The split-sum environment term F0 * A + B, fitted analytically over roughness and
// NdotV (the lookup-table-free approximation for GGX image-based lighting).
vec3 EnvironmentBrdf(vec3 anF0, float aRoughness, float aNdotV)
{
	const vec4 c0 = vec4(-1.0, -0.0275, -0.572, 0.022);
	const vec4 c1 = vec4(1.0, 0.0425, 1.04, -0.04);
	vec4 r = clamp(aRoughness, 0.0, 1.0) * c0 + c1;
	float a004 = min(r.x * r.x, exp2(-9.28 * clamp(aNdotV, 0.0, 1.0))) * r.x + r.y;
	vec2 scaleBias = vec2(-1.04, 1.04) * a004 + r.zw;
	return anF0 * scaleBias.x + scaleBias.y;
}

// How much of a light's intensity reaches a surface aDistance away: the inverse square of the
// distance, as light from a small source spreads, times a window that takes it smoothly to exactly
// zero at aReach (the light volume's bound, so no edge shows where the volume ends). The distance is
// held at least ourLightSourceRadius, a bulb's size, so a surface at the light is bright, not
// infinite. Linear colours are intensities: a colour of 1 lights a surface 1 m away facing the light
// with an irradiance of about 1 (over pi).
const float ourLightSourceRadius = 0.1;

float DistanceAttenuation(float aDistance, float aReach)
{
	if (aReach <= 0.0 || aDistance >= aReach)
	{
		return 0.0;
	}
	float ratio = aDistance / aReach;
	float ratio2 = ratio * ratio;
	float window = clamp(1.0 - ratio2 * ratio2, 0.0, 1.0);
	float distance = max(aDistance, ourLightSourceRadius);
	return window * window / (distance * distance);
}

// View-space position of the pixel at aUv (0,0 top-left) whose linear depth (view z over
// the far plane) is aDepth, for a perspective projection.
vec3 ViewPositionFromDepth(vec2 aUv, float aDepth, mat4 aProjection, float aFarPlane)
{
	float viewZ = aDepth * aFarPlane;
	vec2 ndc = vec2(aUv.x * 2.0 - 1.0, 1.0 - aUv.y * 2.0);
	float scaleX = abs(aProjection[0][0]) > ourEpsilon ? aProjection[0][0] : 1.0;
	float scaleY = abs(aProjection[1][1]) > ourEpsilon ? aProjection[1][1] : 1.0;
	return vec3(ndc.x * viewZ / scaleX, ndc.y * viewZ / scaleY, viewZ);
}

#endif
