// Reflection filtering (Renderer::PrefilterReflection): a cube face and its four neighbours laid
// out as a cross, blurred with a cosine-power lobe, and the blurred face taken out of the cross.
//
// A cross is three face widths square: the face in the centre and each neighbour unfolded across
// the edge it shares with it, so the cross is continuous over every edge; its corners are empty.
// With cross coordinates (u, v), both -3..3, the centre face at -1..1 and v pointing up, the texel
// at (u, v) looks along, in the centre face's own frame (x right, y up, z its axis):
//
//   centre (u, v, 1)   right (1, v, 2 - u)   left (-1, v, 2 + u)   top (u, 1, 2 - v)   bottom (u, -1, 2 + v)
//
// These are unnormalised directions whose dominant component is 1, so a texel's solid angle is
// its area over |d|^3 and the filter needs no table of faces: only angles between directions
// count, and the centre face's frame serves for all of them.

// The direction of cross point aCross in the centre face's frame; w is 0 in the empty corners.
vec4 CrossDirection(vec2 aCross)
{
	bool insideX = abs(aCross.x) <= 1.0;
	bool insideY = abs(aCross.y) <= 1.0;
	if (insideX && insideY)
	{
		return vec4(aCross, 1.0, 1.0);
	}
	if (insideY)
	{
		return aCross.x > 0.0 ? vec4(1.0, aCross.y, 2.0 - aCross.x, 1.0) : vec4(-1.0, aCross.y, 2.0 + aCross.x, 1.0);
	}
	if (insideX)
	{
		return aCross.y > 0.0 ? vec4(aCross.x, 1.0, 2.0 - aCross.y, 1.0) : vec4(aCross.x, -1.0, 2.0 + aCross.y, 1.0);
	}
	return vec4(0.0);
}

// SourceTexture holds a cross (of any size); the output is a cross too, over the draw's viewport,
// of which only the centre face is filtered (the rest is black). Each output texel is the average
// of the source cross weighted by max(0, cos(angle to the texel's direction))^CubePower times the
// source texel's solid angle. Source texels whose weight is below a hundredth of the lobe's peak
// are left out.
fragment PS_BlurCubemap
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec2 centre = vec2(vTexCoord.x * 6.0 - 3.0, 3.0 - vTexCoord.y * 6.0);
		if (abs(centre.x) > 1.0 || abs(centre.y) > 1.0)
		{
			oColor = vec4(0.0);
			return;
		}
		vec3 normal = normalize(vec3(centre, 1.0));
		float power = max(CubePower, 1.0);
		ivec2 size = textureSize(SourceTexture, 0);
		float texelsPerUnit = float(size.x) / 6.0;

		// The lobe's reach as an angle, and as distances along the cross's axes: at face point
		// (x, y) an angle covers up to (1 + x^2 + y^2) / sqrt(1 + y^2) of it along x (and the same
		// with x and y swapped), 3 times at most; across an edge the neighbour's own coordinates
		// count, which never exceed 1.
		float reach = acos(pow(1e-2, 1.0 / power));
		vec2 nearest = max(abs(centre) - 3.0 * reach, 0.0);
		vec2 farthest = min(abs(centre) + 3.0 * reach, 1.0);
		vec2 halfWidth = reach * (1.0 + dot(farthest, farthest)) / sqrt(1.0 + nearest.yx * nearest.yx) +
		                 1.0 / texelsPerUnit;
		ivec2 first = ivec2(floor(vec2(centre.x - halfWidth.x + 3.0, 3.0 - centre.y - halfWidth.y) * texelsPerUnit));
		ivec2 last = ivec2(ceil(vec2(centre.x + halfWidth.x + 3.0, 3.0 - centre.y + halfWidth.y) * texelsPerUnit));
		first = clamp(first, ivec2(0), size - 1);
		last = clamp(last, ivec2(0), size - 1);

		vec4 sum = vec4(0.0);
		float total = 0.0;
		for (int y = first.y; y <= last.y; ++y)
		{
			for (int x = first.x; x <= last.x; ++x)
			{
				vec2 cross = vec2((float(x) + 0.5) / texelsPerUnit - 3.0, 3.0 - (float(y) + 0.5) / texelsPerUnit);
				vec4 direction = CrossDirection(cross);
				if (direction.w == 0.0)
				{
					continue;
				}
				float length2 = dot(direction.xyz, direction.xyz);
				float cosine = dot(normal, direction.xyz) * inversesqrt(length2);
				if (cosine <= 0.0)
				{
					continue;
				}
				float weight = pow(cosine, power) * inversesqrt(length2 * length2 * length2);
				sum += texelFetch(SourceTexture, ivec2(x, y), 0) * weight;
				total += weight;
			}
		}
		oColor = total > 0.0 ? sum / total : vec4(0.0);
	}
}

// SourceTexture holds a cross in its top-left corner, InvSourceSize its size (three face widths);
// the output is that cross's centre face over the whole viewport.
fragment PS_ReflectionCross
{
	in vec2 vTexCoord;
	in vec3 vFrustumRay;
	out vec4 oColor;

	void main()
	{
		vec2 region = 1.0 / (InvSourceSize * vec2(textureSize(SourceTexture, 0)));
		oColor = textureLod(SourceTexture, (vTexCoord + 1.0) / 3.0 * region, 0.0);
	}
}

technique BlurCubemap
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_BlurCubemap;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}

technique RenderReflectionCross
{
	pass P0
	{
		VertexShader = VS_Quad;
		PixelShader = PS_ReflectionCross;
		BlendEnable = false;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
