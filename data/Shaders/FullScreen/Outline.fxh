// The selection outline: the selected objects' flat-colour mask is blurred with the
// caller's 15-tap kernels at a few sizes, and the blurred masks glow around the
// object (never over it) on the final image.

vec4 OutlineBlur(vec2 aUv, bool aHorizontalFlag)
{
	vec4 sum = vec4(0.0);
	for (int tap = 0; tap < 15; ++tap)
	{
		vec2 offset = aHorizontalFlag ? vec2(horSampleOffsets[tap].x, 0.0) : vec2(0.0, vertSampleOffsets[tap].y);
		vec4 weight = aHorizontalFlag ? horSampleWeights[tap] : vertSampleWeights[tap];
		sum += texture(SourceTexture, aUv + offset) * weight;
	}
	return sum;
}

fragment PS_OutlineBlurHorizontal
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = OutlineBlur(vTexCoord, true);
	}
}

fragment PS_OutlineBlurVertical
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = OutlineBlur(vTexCoord, false);
	}
}

// The mask holds colour * coverage in rgb and coverage in alpha, so the glow's colour is
// rgb / alpha; SourceTexture is the sharp mask, which hides the glow inside the object.
fragment PS_Outline
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec4 glow = texture(DiffuseTexture, vTexCoord) + texture(SecondaryDiffuseTexture, vTexCoord) +
		            texture(TertiaryDiffuseTexture, vTexCoord);
		float inside = clamp(texture(SourceTexture, vTexCoord).a, 0.0, 1.0);
		float alpha = clamp(glow.a * 2.0, 0.0, 1.0) * (1.0 - inside);
		vec3 color = glow.a > 1e-4 ? clamp(glow.rgb / glow.a, 0.0, 1.0) : vec3(0.0);
		oColor = vec4(color, alpha);
	}
}

technique HorOutlineBlur
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_OutlineBlurHorizontal;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique VertOutlineBlur
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_OutlineBlurVertical;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique Outline
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Outline;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		SrcBlendAlpha = Zero;
		DestBlendAlpha = One;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
