// Screen-space ambient occlusion from the G-buffer's view-space normals and linear
// depth, a depth-aware separable blur that removes its per-pixel noise, and its
// application to a colour.
//
// Occlusion of a sample q seen from p with normal n: max(0, dot(n, (q - p) / |q - p|) -
// SSAO_bias) / (1 + |q - p| * SSAO_scale); SSAO_sample_rad is the sampling radius in
// world units and SSAO_Intensity scales the average.

const int ourOcclusionTapCount = 16;

// The directions the taps take where Randvectors was not set.
const vec2 ourOcclusionDirections[4] = vec2[](vec2(1.0, 0.0), vec2(-1.0, 0.0), vec2(0.0, 1.0), vec2(0.0, -1.0));

// View-space position of the G-buffer texel at aUv; w = 0 where there is no geometry.
vec4 ViewPositionAt(vec2 aUv)
{
	float depth = texture(LinearDepthTexture, aUv).r;
	return depth < 0.0 ? vec4(0.0) : vec4(FrustumRayAt(aUv) * depth, 1.0);
}

fragment PS_Occlusion
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		float depth = texture(LinearDepthTexture, vTexCoord).r;
		vec3 position = vFrustumRay * depth;
		if (depth <= 0.0 || position.z <= ourEpsilon || SSAO_sample_rad <= 0.0)
		{
			oColor = vec4(1.0);
			return;
		}
		vec3 normal = DecodeNormal(texture(NormalTexture, vTexCoord));

		// World-sized radius to texture coordinates at this depth: the far plane spans
		// 2 * |corner.xy| view units across the screen at view depth corner.z.
		vec3 corner = FarFrustrumCornersViewSpace[1].xyz;
		vec2 halfExtent = abs(corner.xy) / max(abs(corner.z), ourEpsilon);
		vec2 radius = SSAO_sample_rad / max(2.0 * position.z * halfExtent, vec2(ourEpsilon));
		// Close to the camera the radius would cover most of the screen.
		radius *= min(1.0, 0.1 / max(radius.x, radius.y));

		mat2 rotation = Rotation(PixelNoise(gl_FragCoord.xy) * 6.28318531);
		float occlusion = 0.0;
		for (int tap = 0; tap < ourOcclusionTapCount; ++tap)
		{
			vec2 direction = Randvectors[tap].xy;
			direction = dot(direction, direction) > 1e-8 ? normalize(direction)
			                                             : ourOcclusionDirections[tap % 4];
			// Taps spread from a tenth of the radius out to all of it, denser near the pixel.
			float reach = (float(tap) + 1.0) / float(ourOcclusionTapCount);
			reach = mix(0.1, 1.0, reach * reach);
			vec4 tapPosition = ViewPositionAt(vTexCoord + rotation * direction * radius * reach);
			vec3 toSample = tapPosition.xyz - position;
			float tapDistance = length(toSample);
			if (tapPosition.w == 0.0 || tapDistance < 1e-4 || tapDistance > SSAO_sample_rad * 4.0)
			{
				continue;
			}
			occlusion += max(0.0, dot(normal, toSample / tapDistance) - SSAO_bias) /
			             (1.0 + tapDistance * max(SSAO_scale, 0.0));
		}
		float visibility = clamp(1.0 - occlusion / float(ourOcclusionTapCount) * SSAO_Intensity, 0.0, 1.0);
		oColor = vec4(visibility);
	}
}

// A nine-tap Gaussian along aDirection (one texel) that ignores texels whose depth differs
// from the centre's, so occlusion does not bleed across silhouettes.
vec4 DepthAwareBlur(vec2 aUv, vec2 aDirection)
{
	const float weights[5] = float[](0.227027, 0.194595, 0.121622, 0.054054, 0.016216);
	vec4 center = texture(SourceTexture, aUv);
	float centerDepth = texture(LinearDepthTexture, aUv).r;
	if (centerDepth <= 0.0)
	{
		return center;
	}
	vec4 sum = center * weights[0];
	float weightSum = weights[0];
	for (int tap = 1; tap < 5; ++tap)
	{
		for (int side = -1; side <= 1; side += 2)
		{
			vec2 uv = aUv + aDirection * float(tap * side);
			float depth = texture(LinearDepthTexture, uv).r;
			float difference = abs(depth - centerDepth) / centerDepth;
			float weight = depth < 0.0 ? 0.0 : weights[tap] * exp(-difference * difference * 1000.0);
			sum += texture(SourceTexture, uv) * weight;
			weightSum += weight;
		}
	}
	return sum / weightSum;
}

fragment PS_BlurHorizontal
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = DepthAwareBlur(vTexCoord, vec2(SourceTexelSize().x, 0.0));
	}
}

fragment PS_BlurVertical
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = DepthAwareBlur(vTexCoord, vec2(0.0, SourceTexelSize().y));
	}
}

fragment PS_ApplyOcclusion
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec4 color = texture(SourceTexture, vTexCoord);
		oColor = vec4(color.rgb * texture(AOTexture, vTexCoord).r, color.a);
	}
}

technique RenderSSAO
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Occlusion;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderBilaterialHorz
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_BlurHorizontal;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderBilaterialVert
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_BlurVertical;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderApplySSAO
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_ApplyOcclusion;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
