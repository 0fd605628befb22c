// Eye adaptation, tone mapping and bloom.
//
// Luminance chain: RenderLum writes log(luminance) per pixel, DownSampleLog averages it
// down to one texel, AdaptLuminance moves last frame's adapted luminance a tenth of the
// way toward exp(average log), and ToneMap scales the image by AutoExposureAdjustment
// over that luminance before rolling off the highlights.

// The average of the source texels under this destination texel (texel-exact, up to
// 16 x 16 taps; a larger footprint is strided).
vec4 SourceFootprintAverage(vec2 aUv)
{
	ivec2 size = max(textureSize(SourceTexture, 0), ivec2(1));
	vec2 halfTarget = max(InvTargetSize, vec2(0.0)) * 0.5;
	ivec2 first = clamp(ivec2(floor((aUv - halfTarget) * vec2(size) + 1e-3)), ivec2(0), size - 1);
	ivec2 last = clamp(ivec2(ceil((aUv + halfTarget) * vec2(size) - 1e-3)) - 1, first, size - 1);
	ivec2 extent = last - first + 1;
	ivec2 stride = max((extent + 15) / 16, ivec2(1));
	vec4 sum = vec4(0.0);
	float count = 0.0;
	for (int y = first.y; y <= last.y; y += stride.y)
	{
		for (int x = first.x; x <= last.x; x += stride.x)
		{
			sum += texelFetch(SourceTexture, ivec2(x, y), 0);
			count += 1.0;
		}
	}
	return sum / max(count, 1.0);
}

// Identity up to the knee, then an exponential shoulder that meets it with the same slope
// and approaches 1; values already below the knee pass a second application unchanged.
vec3 ToneCurve(vec3 aColor)
{
	const float knee = 0.6;
	vec3 color = max(aColor, vec3(0.0));
	vec3 shoulder = knee + (1.0 - knee) * (1.0 - exp(-(color - knee) / (1.0 - knee)));
	return mix(color, shoulder, greaterThan(color, vec3(knee)));
}

bool IsFinite(float aValue)
{
	return !isnan(aValue) && !isinf(aValue);
}

fragment PS_LogLuminance
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		float luminance = Luminance(max(texture(SourceTexture, vTexCoord).rgb, vec3(0.0)));
		// A broken pixel must not poison the running average for good.
		luminance = IsFinite(luminance) ? min(luminance, 65504.0) : 0.0;
		oColor = vec4(log(luminance + 1e-4));
	}
}

fragment PS_DownSampleLog
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = vec4(SourceFootprintAverage(vTexCoord).r);
	}
}

fragment PS_AdaptLuminance
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		float target = clamp(exp(SourceFootprintAverage(vTexCoord).r), lumMin, max(lumMin, lumMax));
		float previous = texture(DiffuseTexture, vec2(0.5)).r;
		if (!IsFinite(previous) || previous <= 0.0)
		{
			previous = target;
		}
		float adapted = previous + (target - previous) * 0.1;
		oColor = vec4(IsFinite(adapted) ? adapted : 0.5);
	}
}

fragment PS_ToneMap
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		// The source is the target's size; the adapted luminance is one texel.
		vec4 color = texelFetch(SourceTexture, ivec2(gl_FragCoord.xy), 0);
		float adapted = texelFetch(DiffuseTexture, ivec2(0), 0).r;
		float exposure = AutoExposureAdjustment / (IsFinite(adapted) ? max(adapted, 1e-4) : 1.0);
		oColor = vec4(ToneCurve(color.rgb * exposure), color.a);
	}
}

// Bloom's bright pass: what exceeds the threshold, averaged over the destination texel.
fragment PS_DownSampleHiPass
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec4 color = SourceFootprintAverage(vTexCoord);
		oColor = vec4(max(color.rgb - BloomThreshold, vec3(0.0)), 1.0);
	}
}

fragment PS_DownSample
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = SourceFootprintAverage(vTexCoord);
	}
}

// Nine-tap Gaussian (sigma about two texels) in five bilinear fetches.
vec4 GaussianBlur(vec2 aUv, vec2 aTexel)
{
	const float offsets[3] = float[](0.0, 1.3846153846, 3.2307692308);
	const float weights[3] = float[](0.2270270270, 0.3162162162, 0.0702702703);
	vec4 sum = texture(SourceTexture, aUv) * weights[0];
	for (int tap = 1; tap < 3; ++tap)
	{
		sum += texture(SourceTexture, aUv + aTexel * offsets[tap]) * weights[tap];
		sum += texture(SourceTexture, aUv - aTexel * offsets[tap]) * weights[tap];
	}
	return sum;
}

fragment PS_HorizontalBlur
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = GaussianBlur(vTexCoord, vec2(SourceTexelSize().x, 0.0));
	}
}

fragment PS_VerticalBlur
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = GaussianBlur(vTexCoord, vec2(0.0, SourceTexelSize().y));
	}
}

fragment PS_Bloom
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec4 color = texelFetch(SourceTexture, ivec2(gl_FragCoord.xy), 0);
		vec3 glow = texture(DiffuseTexture, vTexCoord).rgb + texture(SecondaryDiffuseTexture, vTexCoord).rgb +
		            texture(TertiaryDiffuseTexture, vTexCoord).rgb;
		oColor = vec4(color.rgb + glow * BloomFactor, color.a);
	}
}

technique RenderLum
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_LogLuminance;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique DownSampleLog
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_DownSampleLog;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique AdaptLuminance
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_AdaptLuminance;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique ToneMap
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_ToneMap;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique DownSamplePointHiPass
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_DownSampleHiPass;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique DownSamplePoint
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_DownSample;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique HorBlur
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_HorizontalBlur;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique VertBlur
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_VerticalBlur;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique Bloom
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Bloom;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
