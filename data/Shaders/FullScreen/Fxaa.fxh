// Fast approximate anti-aliasing of the final image: find the local edge from luma
// contrast, walk along it in both directions to its ends, and resample across it
// by how far the pixel is from the nearer end; thin features get a sub-pixel blend.

const float ourFxaaEdgeThreshold = 0.125;
const float ourFxaaEdgeThresholdMin = 0.0312;
const float ourFxaaSubpixel = 0.75;
const int ourFxaaSearchSteps = 10;
const float ourFxaaStepSizes[10] = float[](1.0, 1.5, 2.0, 2.0, 2.0, 2.0, 4.0, 4.0, 8.0, 8.0);

// Perceptual luma of a linear colour.
float FxaaLuma(vec4 aColor)
{
	return sqrt(Luminance(clamp(aColor.rgb, 0.0, 1.0)));
}

float FxaaLumaAt(vec2 aUv)
{
	return FxaaLuma(textureLod(SourceTexture, aUv, 0.0));
}

vec4 Fxaa(vec2 aUv, vec2 aTexel)
{
	vec4 centerColor = textureLod(SourceTexture, aUv, 0.0);
	float lumaM = FxaaLuma(centerColor);
	float lumaN = FxaaLumaAt(aUv + vec2(0.0, -aTexel.y));
	float lumaS = FxaaLumaAt(aUv + vec2(0.0, aTexel.y));
	float lumaW = FxaaLumaAt(aUv + vec2(-aTexel.x, 0.0));
	float lumaE = FxaaLumaAt(aUv + vec2(aTexel.x, 0.0));
	float lumaMax = max(max(max(lumaN, lumaS), max(lumaW, lumaE)), lumaM);
	float lumaMin = min(min(min(lumaN, lumaS), min(lumaW, lumaE)), lumaM);
	float range = lumaMax - lumaMin;
	if (range < max(ourFxaaEdgeThresholdMin, lumaMax * ourFxaaEdgeThreshold))
	{
		return centerColor;
	}
	float lumaNW = FxaaLumaAt(aUv + vec2(-aTexel.x, -aTexel.y));
	float lumaNE = FxaaLumaAt(aUv + vec2(aTexel.x, -aTexel.y));
	float lumaSW = FxaaLumaAt(aUv + vec2(-aTexel.x, aTexel.y));
	float lumaSE = FxaaLumaAt(aUv + vec2(aTexel.x, aTexel.y));

	// Sub-pixel aliasing: how much the centre differs from its neighbourhood's low-pass.
	float lowPass = (2.0 * (lumaN + lumaS + lumaW + lumaE) + lumaNW + lumaNE + lumaSW + lumaSE) / 12.0;
	float subpixel = clamp(abs(lowPass - lumaM) / range, 0.0, 1.0);
	subpixel = (-2.0 * subpixel + 3.0) * subpixel * subpixel;
	float subpixelBlend = subpixel * subpixel * ourFxaaSubpixel;

	// A horizontal edge changes luma vertically.
	float edgeHorizontal = abs(lumaNW + lumaSW - 2.0 * lumaW) + 2.0 * abs(lumaN + lumaS - 2.0 * lumaM) +
	                       abs(lumaNE + lumaSE - 2.0 * lumaE);
	float edgeVertical = abs(lumaNW + lumaNE - 2.0 * lumaN) + 2.0 * abs(lumaW + lumaE - 2.0 * lumaM) +
	                     abs(lumaSW + lumaSE - 2.0 * lumaS);
	bool horizontalFlag = edgeHorizontal >= edgeVertical;

	// The neighbour across the edge with the larger contrast decides the side.
	float lumaBefore = horizontalFlag ? lumaN : lumaW;
	float lumaAfter = horizontalFlag ? lumaS : lumaE;
	float gradientBefore = abs(lumaBefore - lumaM);
	float gradientAfter = abs(lumaAfter - lumaM);
	float stepLength = horizontalFlag ? aTexel.y : aTexel.x;
	bool beforeFlag = gradientBefore >= gradientAfter;
	float lumaAcross = beforeFlag ? lumaBefore : lumaAfter;
	if (beforeFlag)
	{
		stepLength = -stepLength;
	}
	float gradientScaled = max(gradientBefore, gradientAfter) * 0.25;
	float lumaLocalAverage = 0.5 * (lumaAcross + lumaM);

	// Walk along the edge, half a texel toward the chosen side, until the luma there
	// leaves the edge's average on either end.
	vec2 edgeUv = aUv;
	vec2 along = horizontalFlag ? vec2(aTexel.x, 0.0) : vec2(0.0, aTexel.y);
	if (horizontalFlag)
	{
		edgeUv.y += stepLength * 0.5;
	}
	else
	{
		edgeUv.x += stepLength * 0.5;
	}
	vec2 uvNegative = edgeUv - along;
	vec2 uvPositive = edgeUv + along;
	float endNegative = FxaaLumaAt(uvNegative) - lumaLocalAverage;
	float endPositive = FxaaLumaAt(uvPositive) - lumaLocalAverage;
	bool doneNegative = abs(endNegative) >= gradientScaled;
	bool donePositive = abs(endPositive) >= gradientScaled;
	for (int searchStep = 0; searchStep < ourFxaaSearchSteps && !(doneNegative && donePositive); ++searchStep)
	{
		if (!doneNegative)
		{
			uvNegative -= along * ourFxaaStepSizes[searchStep];
			endNegative = FxaaLumaAt(uvNegative) - lumaLocalAverage;
			doneNegative = abs(endNegative) >= gradientScaled;
		}
		if (!donePositive)
		{
			uvPositive += along * ourFxaaStepSizes[searchStep];
			endPositive = FxaaLumaAt(uvPositive) - lumaLocalAverage;
			donePositive = abs(endPositive) >= gradientScaled;
		}
	}

	float distanceNegative = horizontalFlag ? aUv.x - uvNegative.x : aUv.y - uvNegative.y;
	float distancePositive = horizontalFlag ? uvPositive.x - aUv.x : uvPositive.y - aUv.y;
	bool negativeNearerFlag = distanceNegative < distancePositive;
	float nearest = min(distanceNegative, distancePositive);
	float spanLength = max(distanceNegative + distancePositive, 1e-6);
	// Only the end where the luma moves the way the centre does belongs to this edge.
	bool centerBelowFlag = lumaM - lumaLocalAverage < 0.0;
	bool goodSpanFlag = ((negativeNearerFlag ? endNegative : endPositive) < 0.0) != centerBelowFlag;
	float edgeBlend = goodSpanFlag ? 0.5 - nearest / spanLength : 0.0;

	float offset = max(edgeBlend, subpixelBlend);
	vec2 finalUv = aUv;
	if (horizontalFlag)
	{
		finalUv.y += offset * stepLength;
	}
	else
	{
		finalUv.x += offset * stepLength;
	}
	return vec4(textureLod(SourceTexture, finalUv, 0.0).rgb, centerColor.a);
}

fragment PS_Fxaa
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		oColor = Fxaa(vTexCoord, SourceTexelSize());
	}
}

technique RenderFXAA
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_Fxaa;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
