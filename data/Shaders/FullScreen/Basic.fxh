// Copies and views of one texture, colour grading and motion blur.

fragment PS_Copy
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = texture(SourceTexture, vTexCoord);
	}
}

// The texture coordinate turned about the centre by the upper-left 2x2 of ScaleMatrix
// (row vectors, as every engine matrix).
fragment PS_CopyRotated
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec2 uv = mat2(ScaleMatrix) * (vTexCoord - 0.5) + 0.5;
		oColor = texture(SourceTexture, uv);
	}
}

// Linear depth as grey; texels without geometry (negative depth) are black.
fragment PS_Depth
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		float depth = texture(SourceTexture, vTexCoord).r;
		oColor = vec4(vec3(depth < 0.0 ? 0.0 : clamp(depth, 0.0, 1.0)), 1.0);
	}
}

fragment PS_RToWhite
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = vec4(vec3(texture(SourceTexture, vTexCoord).r), 1.0);
	}
}

// Looks the sRGB-encoded colour up in the grading volume, sampling texel centres so that
// an identity volume changes nothing, and decodes the graded colour to linear.
fragment PS_ColorGrade
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec4 color = texture(SourceTexture, vTexCoord);
		vec3 size = vec3(max(textureSize(ColorGradingTex, 0), ivec3(1)));
		vec3 uvw = LinearToSrgb(color.rgb) * ((size - 1.0) / size) + 0.5 / size;
		oColor = vec4(SrgbToLinear(texture(ColorGradingTex, uvw).rgb), color.a);
	}
}

// Averages the source along the pixel's motion: VelocityTexture.xy is the screen motion in
// texture-coordinate units per frame, scaled by BlurFactor * BlurScale and limited to a
// tenth of the screen.
fragment PS_MotionBlur
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	const int ourTapCount = 12;

	void main()
	{
		vec2 velocity = texture(VelocityTexture, vTexCoord).xy * (BlurFactor * BlurScale);
		float speed = length(velocity);
		if (!(speed < 1e6))
		{
			velocity = vec2(0.0);
		}
		else if (speed > 0.1)
		{
			velocity *= 0.1 / speed;
		}
		vec4 sum = vec4(0.0);
		for (int tap = 0; tap < ourTapCount; ++tap)
		{
			float t = (float(tap) + 0.5) / float(ourTapCount) - 0.5;
			sum += texture(SourceTexture, vTexCoord + velocity * t);
		}
		oColor = sum / float(ourTapCount);
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Copy;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderRotated
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_CopyRotated;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderDepth
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Depth;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderRToWhite
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_RToWhite;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique ColorGrade
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_ColorGrade;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderFullBlur
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_MotionBlur;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
