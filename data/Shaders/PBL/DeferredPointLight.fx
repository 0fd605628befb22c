// A deferred point light: its bounding sphere (World scales the unit sphere to a bit
// more than the light's reach) is drawn over the G-buffer, and each covered surface
// adds the light's microfacet shading to the lit image.

#include "../Common/Transforms.fxh"
#include "../Common/Lighting.fxh"
#include "DeferredLight.fxh"

vertex VS_Volume
{
	in vec3 POSITION;

	void main()
	{
		gl_Position = TransformToClip(POSITION);
	}
}

fragment PS_PointLight
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
		float attenuation = DistanceAttenuation(distanceToLight, LightFalloff);
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
// reach are shaded once even with the camera inside the volume.
technique Render
{
	pass P0
	{
		VertexShader = VS_Volume;
		PixelShader = PS_PointLight;
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
