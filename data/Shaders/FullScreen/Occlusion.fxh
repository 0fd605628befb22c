// Screen-space ambient occlusion from the G-buffer's view-space normals and linear
// depth, a depth-aware separable blur that removes its per-pixel noise, and its
// application to a colour.
//
// Occlusion of a sample q seen from p with normal n: max(0, dot(n, (q - p) / |q - p|) -
// SSAO_bias) / (1 + |q - p| * SSAO_scale); SSAO_sample_rad is the sampling radius in
// world units and SSAO_Intensity scales the average.
//
// The sixteen taps are interleaved over each 2 x 2 block of pixels: every pixel takes four
// of them (one from each quarter of the reach), turned by its own noise angle, and the
// blur, which spans the block several times over, gathers the sixteen back. That is a
// quarter of the occlusion's cost for the same tap pattern after the blur. The occlusion
// buffer carries the pixel's linear depth in its other three channels (24 bits), so that
// each blur tap reads one texel instead of two.

const int ourOcclusionTapCount = 16;
const int ourTapsPerPixel = 4;

// The directions the taps take where Randvectors was not set.
const vec2 ourOcclusionDirections[4] = vec2[](vec2(1.0, 0.0), vec2(-1.0, 0.0), vec2(0.0, 1.0), vec2(0.0, -1.0));

// Linear depth (0..1 of the far plane) in three UNORM8 channels; all zero means no geometry.
vec3 PackDepth(float aDepth)
{
	uint code = uint(clamp(aDepth, 0.0, 1.0) * 16777215.0 + 0.5);
	code = max(code, 1u);
	return vec3(float(code >> 16u), float((code >> 8u) & 255u), float(code & 255u)) / 255.0;
}

// The depth PackDepth stored, or a negative value where there was no geometry.
float UnpackDepth(vec3 aPacked)
{
	uvec3 bytes = uvec3(aPacked * 255.0 + 0.5);
	uint code = (bytes.x << 16u) | (bytes.y << 8u) | bytes.z;
	return code == 0u ? -1.0 : float(code) / 16777215.0;
}

fragment PS_Occlusion
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		ivec2 pixel = ivec2(gl_FragCoord.xy);
		ivec2 depthSize = textureSize(LinearDepthTexture, 0);
		float depth = texelFetch(LinearDepthTexture, pixel, 0).r;
		vec3 position = vFrustumRay * depth;
		if (depth <= 0.0 || position.z <= ourEpsilon || SSAO_sample_rad <= 0.0)
		{
			oColor = vec4(1.0, depth <= 0.0 ? vec3(0.0) : PackDepth(depth));
			return;
		}
		vec3 normal = DecodeNormal(texelFetch(NormalTexture, pixel, 0));

		// World-sized radius to texture coordinates at this depth: the far plane spans
		// 2 * |corner.xy| view units across the screen at view depth corner.z.
		vec3 corner = FarFrustrumCornersViewSpace[1].xyz;
		vec2 halfExtent = abs(corner.xy) / max(abs(corner.z), ourEpsilon);
		vec2 radius = SSAO_sample_rad / max(2.0 * position.z * halfExtent, vec2(ourEpsilon));
		// Close to the camera the radius would cover most of the screen.
		radius *= min(1.0, 0.1 / max(radius.x, radius.y));

		mat2 rotation = Rotation(PixelNoise(gl_FragCoord.xy) * 6.28318531);
		int firstTap = (pixel.x & 1) + 2 * (pixel.y & 1);
		float occlusion = 0.0;
		for (int step = 0; step < ourTapsPerPixel; ++step)
		{
			int tap = firstTap + step * (ourOcclusionTapCount / ourTapsPerPixel);
			vec2 direction = Randvectors[tap].xy;
			direction = dot(direction, direction) > 1e-8 ? normalize(direction)
			                                             : ourOcclusionDirections[tap % 4];
			// Taps spread from a tenth of the radius out to all of it, denser near the pixel.
			float reach = (float(tap) + 1.0) / float(ourOcclusionTapCount);
			reach = mix(0.1, 1.0, reach * reach);
			vec2 uv = vTexCoord + rotation * direction * radius * reach;
			ivec2 tapPixel = clamp(ivec2(floor(uv * vec2(depthSize))), ivec2(0), depthSize - 1);
			float tapDepth = texelFetch(LinearDepthTexture, tapPixel, 0).r;
			// The tap's view position on the ray through its texel's centre.
			vec3 toSample = FrustumRayAt((vec2(tapPixel) + 0.5) / vec2(depthSize)) * tapDepth - position;
			float tapDistance = length(toSample);
			if (tapDepth < 0.0 || tapDistance < 1e-4 || tapDistance > SSAO_sample_rad * 4.0)
			{
				continue;
			}
			occlusion += max(0.0, dot(normal, toSample / tapDistance) - SSAO_bias) /
			             (1.0 + tapDistance * max(SSAO_scale, 0.0));
		}
		float visibility = clamp(1.0 - occlusion / float(ourTapsPerPixel) * SSAO_Intensity, 0.0, 1.0);
		oColor = vec4(visibility, PackDepth(depth));
	}
}

// A nine-tap Gaussian along aStep (one texel) over the occlusion buffer that ignores texels
// whose depth differs from the centre's, so occlusion does not bleed across silhouettes.
// The packed depth passes through for the next blur.
vec4 DepthAwareBlur(ivec2 aPixel, ivec2 aStep)
{
	const float weights[5] = float[](0.227027, 0.194595, 0.121622, 0.054054, 0.016216);
	ivec2 lastTexel = textureSize(SourceTexture, 0) - 1;
	vec4 center = texelFetch(SourceTexture, aPixel, 0);
	float centerDepth = UnpackDepth(center.gba);
	if (centerDepth <= 0.0)
	{
		return center;
	}
	float sum = center.r * weights[0];
	float weightSum = weights[0];
	for (int tap = 1; tap < 5; ++tap)
	{
		for (int side = -1; side <= 1; side += 2)
		{
			vec4 texel = texelFetch(SourceTexture, clamp(aPixel + aStep * (tap * side), ivec2(0), lastTexel), 0);
			float depth = UnpackDepth(texel.gba);
			float difference = (depth - centerDepth) / centerDepth;
			float weight = depth < 0.0 ? 0.0 : weights[tap] / (1.0 + difference * difference * 1000.0);
			sum += texel.r * weight;
			weightSum += weight;
		}
	}
	return vec4(sum / weightSum, center.gba);
}

fragment PS_BlurHorizontal
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = DepthAwareBlur(ivec2(gl_FragCoord.xy), ivec2(1, 0));
	}
}

fragment PS_BlurVertical
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = DepthAwareBlur(ivec2(gl_FragCoord.xy), ivec2(0, 1));
	}
}

// Source and occlusion are the same size as the target.
fragment PS_ApplyOcclusion
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		ivec2 pixel = ivec2(gl_FragCoord.xy);
		vec4 color = texelFetch(SourceTexture, pixel, 0);
		oColor = vec4(color.rgb * texelFetch(AOTexture, pixel, 0).r, color.a);
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
