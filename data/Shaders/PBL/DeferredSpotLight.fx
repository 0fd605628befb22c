// A deferred spot light: its cone (apex at the origin along +Z, length 1, radius 1 at
// the base, shaped by Scale and placed by World) is drawn over the G-buffer, and each
// covered surface inside the cone adds the light's microfacet shading.

#include "../Common/Transforms.fxh"
#include "../Common/Lighting.fxh"
#include "DeferredLight.fxh"

// Shapes the unit cone before World places it (row vectors: p * Scale * World).
uniform mat4 Scale;
// The cone's axis in view space, and the cosines of its inner (full light) and outer
// (no light) half-angles.
uniform vec4 LightDirection;
uniform vec2 LightAngles;

vertex VS_Volume
{
	in vec3 POSITION;

	void main()
	{
		gl_Position = Projection * (View * (World * (Scale * vec4(POSITION, 1.0))));
	}
}

// 1 inside the inner cone, 0 outside the outer one, smooth between.
float ConeFactor(vec3 aToLight)
{
	vec3 axis = SafeNormalize(LightDirection.xyz, vec3(0.0, 0.0, 1.0));
	float cosine = dot(-aToLight, axis);
	float cosOuter = LightAngles.y;
	float cosInner = max(LightAngles.x, cosOuter + 1e-4);
	return cosine <= cosOuter ? 0.0 : smoothstep(cosOuter, cosInner, cosine);
}

fragment PS_SpotLight
{
	out vec4 oColor;

	void main()
	{
		GBufferSurface surface;
		if (!ReadSurface(gl_FragCoord.xy, surface))
		{
			discard;
		}
		float distanceToLight;
		vec3 toLight = DirectionToLight(surface, distanceToLight);
		float attenuation = DistanceAttenuation(distanceToLight, LightFalloff) * ConeFactor(toLight);
		if (attenuation <= 0.0)
		{
			discard;
		}
		vec3 radiance = max(LightColor.rgb, vec3(0.0)) * attenuation;
		oColor = vec4(ShadeDirect(surface.myAlbedo, surface.myRoughness, surface.myMetalness, surface.myNormal,
		                          surface.myToEye, toLight, radiance),
		              0.0);
	}
}

// Back faces pass where they lie behind the scene's surface, so the pixels the light can
// reach are shaded once even with the camera inside the cone.
technique Render
{
	pass P0
	{
		VertexShader = VS_Volume;
		PixelShader = PS_SpotLight;
		BlendEnable = true;
		SrcBlend = One;
		DestBlend = One;
		SrcBlendAlpha = One;
		DestBlendAlpha = One;
		DepthEnable = true;
		DepthWriteMask = Zero;
		DepthFunc = GreaterEqual;
		CullMode = Front;
	}
}

technique RenderMesh
{
	pass P0
	{
		VertexShader = VS_Volume;
		PixelShader = PS_VolumeMesh;
		BlendEnable = false;
		DepthEnable = true;
		DepthWriteMask = Zero;
		DepthFunc = LessEqual;
		FillMode = Wireframe;
		CullMode = None;
	}
}
