// The sun's shadow resolved per pixel, and the ambient light: irradiance from the
// spherical-harmonics volume and the prefiltered reflection, both shaded with the
// G-buffer's material.

// A disc of taps (radius 1) for percentage-closer filtering, rotated per pixel.
const int ourShadowTapCount = 16;
const vec2 ourShadowDisc[16] = vec2[](
    vec2(-0.94201624, -0.39906216), vec2(0.94558609, -0.76890725), vec2(-0.09418410, -0.92938870),
    vec2(0.34495938, 0.29387760), vec2(-0.91588581, 0.45771432), vec2(-0.81544232, -0.87912464),
    vec2(-0.38277543, 0.27676845), vec2(0.97484398, 0.75648379), vec2(0.44323325, -0.97511554),
    vec2(0.53742981, -0.47373420), vec2(-0.26496911, -0.41893023), vec2(0.79197514, 0.19090188),
    vec2(-0.24188840, 0.99706507), vec2(-0.81409955, 0.91437590), vec2(0.19984126, 0.78641367),
    vec2(0.14383161, -0.14100790));

// Sun visibility of a world position on a surface with the given world normal: 1 lit,
// 0 shadowed, 1 outside the caster's box. The receiver is moved off its surface by
// two shadow texels along the normal, so that a surface does not shadow itself where
// it meets the light at a grazing angle.
float SunVisibility(vec3 aWorldPosition, vec3 aWorldNormal, vec2 aPixel)
{
	vec2 mapSize = vec2(max(textureSize(ShadowBlockerTexture, 0), ivec2(1)));
	float texelWorld = 2.0 / max(abs(ShadowCasterViewProj[0][0]) * mapSize.x, ourEpsilon);
	vec3 receiver = aWorldPosition + aWorldNormal * (2.0 * texelWorld);
	vec4 clip = ShadowCasterViewProj * vec4(receiver, 1.0);
	if (abs(clip.w) < ourEpsilon)
	{
		return 1.0;
	}
	vec3 ndc = clip.xyz / clip.w;
	if (!(abs(ndc.x) <= 1.0 && abs(ndc.y) <= 1.0 && ndc.z >= 0.0 && ndc.z <= 1.0))
	{
		return 1.0;
	}
	// Clip y up is texture row 0 (upper-left origin).
	vec2 uv = vec2(ndc.x * 0.5 + 0.5, 0.5 - ndc.y * 0.5);
	float reference = ndc.z - ShadowBias;
	float lightRadius = max(LightRadiusUV.x, 0.0);
	mat2 rotation = Rotation(PixelNoise(aPixel) * 6.28318531);
	vec2 texel = 1.0 / mapSize;

	// Contact-hardening filter: the penumbra widens with the distance (in the caster's
	// normalised depth) between the receiver and the average blocker found nearby, as
	// under a light LightRadiusUV wide; it is at least one texel and at most the light.
	float searchRadius = max(lightRadius * 0.1, texel.x);
	float blockerSum = 0.0;
	float blockerCount = 0.0;
	for (int tap = 0; tap < ourShadowTapCount; ++tap)
	{
		float depth = texture(ShadowBlockerTexture, uv + rotation * ourShadowDisc[tap] * searchRadius).r;
		if (depth < reference)
		{
			blockerSum += depth;
			blockerCount += 1.0;
		}
	}
	if (blockerCount == 0.0)
	{
		return 1.0;
	}
	float blocker = blockerSum / blockerCount;
	float radius = clamp((reference - blocker) * lightRadius, texel.x, lightRadius);
	float lit = 0.0;
	for (int tap = 0; tap < ourShadowTapCount; ++tap)
	{
		vec2 offset = rotation * ourShadowDisc[tap] * radius;
		lit += texture(ShadowDepthTexture, vec3(uv + offset, reference));
	}
	return lit / float(ourShadowTapCount);
}

fragment PS_ShadowMap
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		float depth = texture(LinearDepthTexture, vTexCoord).r;
		if (depth < 0.0)
		{
			oColor = vec4(1.0);
			return;
		}
		vec3 world = (invView * vec4(vFrustumRay * depth, 1.0)).xyz;
		vec3 viewNormal = DecodeNormal(texture(NormalTexture, vTexCoord));
		vec3 worldNormal = SafeNormalize(mat3(invView) * viewNormal, vec3(0.0, 1.0, 0.0));
		oColor = vec4(SunVisibility(world, worldNormal, gl_FragCoord.xy));
	}
}

// Irradiance over pi at a world position for a world normal, from the volume's
// second-order coefficients; zero where there is no volume.
vec3 VolumeIrradianceOverPi(vec3 aWorldPosition, vec3 aNormal)
{
	if (WorldSize.x <= 0.0 || WorldSize.y <= 0.0 || WorldSize.z <= 0.0)
	{
		return vec3(0.0);
	}
	vec3 uvw = (aWorldPosition - WorldMin.xyz) / WorldSize.xyz;
	vec4 cAr = texture(cArTexture, uvw) * 2.0 - 1.0;
	vec4 cAg = texture(cAgTexture, uvw) * 2.0 - 1.0;
	vec4 cAb = texture(cAbTexture, uvw) * 2.0 - 1.0;
	vec4 cBr = texture(cBrTexture, uvw) * 2.0 - 1.0;
	vec4 cBg = texture(cBgTexture, uvw) * 2.0 - 1.0;
	vec4 cBb = texture(cBbTexture, uvw) * 2.0 - 1.0;
	vec3 cC = texture(cCTexture, uvw).rgb * 2.0 - 1.0;

	vec4 linear = vec4(aNormal, 1.0);
	vec4 quadratic = aNormal.xyzz * aNormal.yzzx;
	float last = aNormal.x * aNormal.x - aNormal.y * aNormal.y;
	vec3 irradiance = vec3(dot(cAr, linear), dot(cAg, linear), dot(cAb, linear)) +
	                  vec3(dot(cBr, quadratic), dot(cBg, quadratic), dot(cBb, quadratic)) + cC * last;
	return max(irradiance, vec3(0.0));
}

// Adds the ambient diffuse (dimmed where the sun is blocked), the image-based specular
// and the emissive light of every covered pixel to the lit image.
fragment PS_Ambient
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		float depth = texture(LinearDepthTexture, vTexCoord).r;
		if (depth < 0.0)
		{
			discard;
		}
		vec3 viewPosition = vFrustumRay * depth;
		vec3 viewNormal = DecodeNormal(texture(NormalTexture, vTexCoord));
		vec3 worldPosition = (invView * vec4(viewPosition, 1.0)).xyz;
		vec3 worldNormal = SafeNormalize(mat3(invView) * viewNormal, vec3(0.0, 1.0, 0.0));

		vec3 albedo = texture(AlbedoTexture, vTexCoord).rgb;
		vec4 material = texture(MaterialTexture, vTexCoord);
		float roughness = material.r;
		float metalness = material.g;
		float occlusion = material.b;
		float sun = texture(ShadowMap, vTexCoord).r;

		vec3 diffuse = albedo * (1.0 - metalness) * VolumeIrradianceOverPi(worldPosition, worldNormal) *
		               occlusion * mix(0.35, 1.0, clamp(sun, 0.0, 1.0));

		vec3 toEye = SafeNormalize(-viewPosition, vec3(0.0, 0.0, -1.0));
		float NdotV = clamp(dot(viewNormal, toEye), 0.0, 1.0);
		vec3 specular = texture(ReflectionTexture, vTexCoord).rgb *
		                EnvironmentBrdf(SpecularF0(albedo, metalness), roughness, NdotV) * occlusion;

		vec3 emissive = albedo * material.a * EmissiveMultiplier;
		oColor = vec4(diffuse + specular + emissive, 0.0);
	}
}

technique RenderShadowMap
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_ShadowMap;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderAmbient
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Ambient;
		BlendEnable = true;
		SrcBlend = One;
		DestBlend = One;
		SrcBlendAlpha = One;
		DestBlendAlpha = One;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
