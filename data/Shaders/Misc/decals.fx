// Projected decals: a box (the unit cube scaled to the decal's size and depth and
// turned to face along DecalNormal) is drawn over the G-buffer; every scene surface
// inside the box takes the decal's colour and normal map, blended by the decal's
// alpha and faded where the surface turns away from the decal.
//
// Targets: albedo (0), normal (1), material (2), reflection (3). Material and
// reflection get alpha 0, so the blend leaves them as they are; the destination
// alpha of every target is kept.

#include "../Common/Transforms.fxh"
#include "../Common/Lighting.fxh"

uniform mat4 InvWorld;
uniform mat4 InvView;
// World-space normal of the surfaces the decal is laid on (the box's local +Z).
uniform vec4 DecalNormal;

uniform sampler2D DecalTexture;
uniform sampler2D DecalNormalTexture;
// The G-buffer's linear depth, and a copy of its view-space normals (the normal target
// itself is being written).
uniform sampler2D DepthTexture;
uniform sampler2D NormalTexture;

sampler DecalTexture
{
	Filter = ANISOTROPIC;
	MaxAnisotropy = 8;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler DecalNormalTexture
{
	Filter = ANISOTROPIC;
	MaxAnisotropy = 8;
	AddressU = Clamp;
	AddressV = Clamp;
}

vec2 FiniteGradient(vec2 aGradient)
{
	if (any(isnan(aGradient)) || any(isinf(aGradient)))
	{
		return vec2(0.0);
	}
	return clamp(aGradient, vec2(-1.0), vec2(1.0));
}

vertex VS_Box
{
	in vec3 POSITION;

	void main()
	{
		gl_Position = TransformToClip(POSITION);
	}
}

fragment PS_Decal
{
	layout(location = 0) out vec4 oAlbedo;
	layout(location = 1) out vec4 oNormal;
	layout(location = 2) out vec4 oMaterial;
	layout(location = 3) out vec4 oReflection;

	void main()
	{
		ivec2 size = max(textureSize(DepthTexture, 0), ivec2(1));
		ivec2 texel = clamp(ivec2(gl_FragCoord.xy), ivec2(0), size - 1);
		float depth = texelFetch(DepthTexture, texel, 0).r;
		vec3 viewPosition = ViewPositionFromDepth(gl_FragCoord.xy / vec2(size), depth, Projection, FarPlane);
		vec4 world = InvView * vec4(viewPosition, 1.0);
		vec3 local = (InvWorld * world).xyz;
		// The projected coordinate and its gradients are made before any pixel is
		// discarded (gradients are undefined after) and kept finite and bounded: across a
		// depth edge or a degenerate box the coordinate jumps or overflows, and unbounded
		// coordinates stall anisotropic filtering.
		vec2 uv = vec2(local.x + 0.5, 0.5 - local.y);
		uv = any(isnan(uv)) || any(isinf(uv)) ? vec2(0.0) : clamp(uv, vec2(-4.0), vec2(4.0));
		vec2 uvDx = FiniteGradient(dFdx(uv));
		vec2 uvDy = FiniteGradient(dFdy(uv));
		if (depth < 0.0)
		{
			discard;
		}
		if (any(greaterThan(abs(local), vec3(0.5))))
		{
			discard;
		}

		vec3 decalNormal = SafeNormalize(DecalNormal.xyz, vec3(0.0, 1.0, 0.0));
		vec3 surfaceNormal = SafeNormalize(mat3(InvView) * DecodeNormal(texelFetch(NormalTexture, texel, 0)),
		                                   decalNormal);
		// Full strength on surfaces facing the decal, fading out toward 60 degrees and
		// nothing on surfaces that face away.
		float facing = smoothstep(0.5, 0.8, dot(surfaceNormal, decalNormal));
		if (facing <= 0.0)
		{
			discard;
		}

		vec4 color = textureGrad(DecalTexture, uv, uvDx, uvDy);
		float alpha = clamp(color.a * facing, 0.0, 1.0);

		// The decal's tangent frame: its box's right axis, the axis the normal map's green
		// points along (normal x right, as for models) and the normal.
		vec3 right = SafeNormalize(vec3(World[0].xyz), vec3(1.0, 0.0, 0.0));
		right = SafeNormalize(right - decalNormal * dot(right, decalNormal), vec3(1.0, 0.0, 0.0));
		vec3 up = cross(decalNormal, right);
		vec3 tangentNormal = textureGrad(DecalNormalTexture, uv, uvDx, uvDy).xyz * 2.0 - 1.0;
		vec3 worldNormal = SafeNormalize(mat3(right, up, decalNormal) * tangentNormal, decalNormal);
		vec3 viewNormal = SafeNormalize(mat3(View) * worldNormal, vec3(0.0, 0.0, -1.0));

		oAlbedo = vec4(color.rgb, alpha);
		oNormal = vec4(viewNormal * 0.5 + 0.5, alpha);
		oMaterial = vec4(0.0);
		oReflection = vec4(0.0);
	}
}

technique RenderDynamic
{
	pass P0
	{
		VertexShader = VS_Box;
		PixelShader = PS_Decal;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		SrcBlendAlpha = Zero;
		DestBlendAlpha = One;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = Front;
	}
}

technique RenderMesh
{
	pass P0
	{
		VertexShader = VS_Box;
		PixelShader = PS_Decal;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		SrcBlendAlpha = Zero;
		DestBlendAlpha = One;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = Front;
	}
}
