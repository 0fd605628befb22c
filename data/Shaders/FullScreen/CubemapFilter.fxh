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

// The cross u interval, within aLow..aHigh, of a row's texels on one face whose directions are
// aStart + u * aStep (a face's directions are affine along a row; |aStep| = 1) and lie inside
// the cone of directions within acos(aCosine) of aNormal: there (n.d)^2 - c^2 |d|^2 >= 0, a
// quadratic in u. An empty interval has x > y.
vec2 LobeInterval(vec3 aStart, vec3 aStep, float aLow, float aHigh, vec3 aNormal, float aCosine)
{
	float g = dot(aNormal, aStart);
	float h = dot(aNormal, aStep);
	float cosine2 = aCosine * aCosine;
	float a = h * h - cosine2;
	float b = 2.0 * (g * h - cosine2 * dot(aStart, aStep));
	float c = g * g - cosine2 * dot(aStart, aStart);
	float discriminant = b * b - 4.0 * a * c;
	// With a >= 0 the cone runs along the row (wide lobes only): the whole face is kept.
	float root = sqrt(max(discriminant, 0.0));
	vec2 roots = a < 0.0 ? vec2(-b + root, -b - root) / (2.0 * a) : vec2(aLow, aHigh);
	return a < 0.0 && discriminant < 0.0 ? vec2(1.0, -1.0) : vec2(max(roots.x, aLow), min(roots.y, aHigh));
}

// SourceTexture holds a cross (of any size); the output is a cross too, over the draw's viewport,
// of which only the centre face is filtered (the rest is black). Each output texel is the average
// of the source cross weighted by max(0, cos(angle to the texel's direction))^CubePower times the
// source texel's solid angle. Source texels where the lobe is below a hundredth of its peak are
// left out: each row visits only the texels inside that cone (LobeInterval).
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
		int face = size.x / 3;

		// The lobe's reach as an angle, and as distances along the cross's axes: at face point
		// (x, y) an angle covers up to (1 + x^2 + y^2) / sqrt(1 + y^2) of it along x (and the same
		// with x and y swapped), 3 times at most; across an edge the neighbour's own coordinates
		// count, which never exceed 1. The rows come from this window; each row's texels from
		// the lobe's cone itself.
		float reachCosine = pow(1e-2, 1.0 / power);
		float reach = acos(reachCosine);
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
			float v = 3.0 - (float(y) + 0.5) / texelsPerUnit;
			// The row's texels inside the lobe's cone: in the middle rows the left, centre and right
			// faces (directions at cross u = 0 and their change per unit of u, as laid out at the
			// top of this file), elsewhere the top or bottom face alone; the corners hold nothing.
			bool middle = y >= face && y < 2 * face;
			vec3 across = middle ? vec3(0.0, v, 1.0) : y < face ? vec3(0.0, 1.0, 2.0 - v) : vec3(0.0, -1.0, 2.0 + v);
			vec2 span = LobeInterval(across, vec3(1.0, 0.0, 0.0), -1.0, 1.0, normal, reachCosine);
			if (middle)
			{
				vec2 left = LobeInterval(vec3(-1.0, v, 2.0), vec3(0.0, 0.0, 1.0), -3.0, -1.0, normal, reachCosine);
				vec2 right = LobeInterval(vec3(1.0, v, 2.0), vec3(0.0, 0.0, -1.0), 1.0, 3.0, normal, reachCosine);
				// The cone is continuous over the edges, so the faces' intervals join into one.
				span = vec2(left.x <= left.y ? left.x : span.x, right.x <= right.y ? right.y : span.y);
			}
			// The texels whose centres lie in the interval (a hundredth of a texel more, against
			// rounding), within the window.
			int x0 = max(first.x, int(ceil((span.x + 3.0) * texelsPerUnit - 0.51)));
			int x1 = min(last.x, int(floor((span.y + 3.0) * texelsPerUnit - 0.49)));
			for (int x = x0; x <= x1; ++x)
			{
				float u = (float(x) + 0.5) / texelsPerUnit - 3.0;
				vec3 direction = across + vec3(u, 0.0, 0.0);
				if (middle && abs(u) > 1.0)
				{
					direction = u < 0.0 ? vec3(-1.0, v, 2.0 + u) : vec3(1.0, v, 2.0 - u);
				}
				float inverseLength = inversesqrt(dot(direction, direction));
				float cosine = dot(normal, direction) * inverseLength;
				if (cosine <= 0.0)
				{
					continue;
				}
				// pow() for a positive base, written out.
				float weight = exp2(power * log2(cosine)) * inverseLength * inverseLength * inverseLength;
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
