// Editor overlays drawn over the finished frame, with no depth buffer: wire shapes (light
// falloff spheres and cones, direction ticks) and light icons. An icon is a camera-facing
// quad whose TEXCOORD0 runs from -1 to 1 across it; its fragment shader draws the glyph as
// a distance field in pixels, so the edges stay smooth at any size. Tint multiplies the
// colour (the renderer sets it for every overlay it draws: white unless the overlay asks).

#include "../Common/Transforms.fxh"

uniform vec4 Tint = vec4(1.0);

// Pixels from the quad's centre to its edge: the quad is drawn 36 pixels across, the
// glyphs keep within a 13-pixel radius with their outline and the selection halo within 17.
const float ourHalfQuadPixels = 18.0;
const float ourOutlinePixels = 1.5;
const vec3 ourOutlineColor = vec3(0.02, 0.02, 0.03);

vertex VS_Wire
{
	in vec3 POSITION;
	in vec4 COLOR;
	out vec4 vColor;

	void main()
	{
		vColor = COLOR * Tint;
		gl_Position = TransformToClip(POSITION);
	}
}

fragment PS_Wire
{
	in vec4 vColor;
	out vec4 oColor;

	void main()
	{
		oColor = vColor;
	}
}

vertex VS_Icon
{
	in vec3 POSITION;
	in vec2 TEXCOORD0;
	out vec2 vPixel;

	void main()
	{
		vPixel = TEXCOORD0 * ourHalfQuadPixels;
		gl_Position = TransformToClip(POSITION);
	}
}

float CircleDistance(vec2 aPoint, float aRadius)
{
	return length(aPoint) - aRadius;
}

// A segment from aFrom to aTo with round ends, aRadius thick on each side.
float CapsuleDistance(vec2 aPoint, vec2 aFrom, vec2 aTo, float aRadius)
{
	vec2 along = aTo - aFrom;
	float t = clamp(dot(aPoint - aFrom, along) / dot(along, along), 0.0, 1.0);
	return length(aPoint - aFrom - along * t) - aRadius;
}

// A trapezoid centred on the origin, symmetric about y: half-width aBottom at y = -aHalfHeight
// and aTop at y = aHalfHeight.
float TrapezoidDistance(vec2 aPoint, float aBottom, float aTop, float aHalfHeight)
{
	vec2 k1 = vec2(aTop, aHalfHeight);
	vec2 k2 = vec2(aTop - aBottom, 2.0 * aHalfHeight);
	vec2 p = vec2(abs(aPoint.x), aPoint.y);
	vec2 ca = vec2(p.x - min(p.x, p.y < 0.0 ? aBottom : aTop), abs(p.y) - aHalfHeight);
	vec2 cb = p - k1 + k2 * clamp(dot(k1 - p, k2) / dot(k2, k2), 0.0, 1.0);
	float inside = (cb.x < 0.0 && ca.y < 0.0) ? -1.0 : 1.0;
	return inside * sqrt(min(dot(ca, ca), dot(cb, cb)));
}

// The glyph of distance aDistance (in pixels: the quad keeps its size on screen) filled with
// the tint and rimmed with a dark outline, both anti-aliased over a pixel.
vec4 Glyph(float aDistance)
{
	float fill = 1.0 - smoothstep(-0.5, 0.5, aDistance);
	float shape = 1.0 - smoothstep(ourOutlinePixels - 0.5, ourOutlinePixels + 0.5, aDistance);
	vec3 color = mix(ourOutlineColor, Tint.rgb, fill);
	return vec4(color, shape * Tint.a);
}

// A point light: a bulb with eight rays around it.
fragment PS_PointIcon
{
	in vec2 vPixel;
	out vec4 oColor;

	void main()
	{
		float shapeDistance = CircleDistance(vPixel, 5.5);
		for (int ray = 0; ray < 8; ++ray)
		{
			float angle = float(ray) * 0.78539816;
			vec2 direction = vec2(cos(angle), sin(angle));
			shapeDistance = min(shapeDistance, CapsuleDistance(vPixel, direction * 8.0, direction * 10.5, 1.25));
		}
		oColor = Glyph(shapeDistance);
		if (oColor.a <= 0.0)
		{
			discard;
		}
	}
}

// A spot light: a lamp head above the cone of light it throws (the cone in a dimmer tint).
fragment PS_SpotIcon
{
	in vec2 vPixel;
	out vec4 oColor;

	void main()
	{
		float head = CircleDistance(vPixel - vec2(0.0, 6.5), 4.5);
		float beam = TrapezoidDistance(vPixel - vec2(0.0, -3.0), 10.0, 2.5, 8.0);
		float outside = min(head, beam);
		float shape = 1.0 - smoothstep(ourOutlinePixels - 0.5, ourOutlinePixels + 0.5, outside);
		vec3 color = mix(ourOutlineColor, Tint.rgb * 0.55, 1.0 - smoothstep(-0.5, 0.5, beam));
		// The head keeps its own rim across the cone, so it reads as the lamp.
		color = mix(color, ourOutlineColor, 1.0 - smoothstep(ourOutlinePixels - 0.5, ourOutlinePixels + 0.5, head));
		color = mix(color, Tint.rgb, 1.0 - smoothstep(-0.5, 0.5, head));
		oColor = vec4(color, shape * Tint.a);
		if (oColor.a <= 0.0)
		{
			discard;
		}
	}
}

// The selection's ring around an icon, drawn before the icon.
fragment PS_IconHalo
{
	in vec2 vPixel;
	out vec4 oColor;

	void main()
	{
		float shapeDistance = abs(CircleDistance(vPixel, 13.5)) - 1.25;
		oColor = Glyph(shapeDistance);
		if (oColor.a <= 0.0)
		{
			discard;
		}
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Wire;
		PixelShader = PS_Wire;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		DepthEnable = false;
		CullMode = None;
	}
}

technique RenderPointIcon
{
	pass P0
	{
		VertexShader = VS_Icon;
		PixelShader = PS_PointIcon;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		DepthEnable = false;
		CullMode = None;
	}
}

technique RenderSpotIcon
{
	pass P0
	{
		VertexShader = VS_Icon;
		PixelShader = PS_SpotIcon;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		DepthEnable = false;
		CullMode = None;
	}
}

technique RenderIconHalo
{
	pass P0
	{
		VertexShader = VS_Icon;
		PixelShader = PS_IconHalo;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		DepthEnable = false;
		CullMode = None;
	}
}
