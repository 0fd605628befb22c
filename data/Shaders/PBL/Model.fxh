// The surface side of the lit model effects: textures, light, the fragment stages
// and every technique a model selects. The including effect declares the vertex
// stages VS_Model (outputs below) and VS_Shadow (vTexCoord) and includes
// ../Common/Transforms.fxh before this file.
//
// VS_Model outputs: vTexCoord, vNormal, vTangent, vBinormal (world space) and
// vViewDepth (view-space depth).

// Material textures, bound per surface by the variable names model files use.
uniform sampler2D DiffuseTexture;
uniform sampler2D NormalTexture;
uniform sampler2D RoughnessTexture;
uniform sampler2D AOTexture;
uniform sampler2D SubstanceTexture;

// The forward passes' directional light: the direction the light travels and its colour.
uniform vec4 LightDirection = vec4(0.0, 0.0, 1.0, 0.0);
uniform vec4 LightColor = vec4(1.0);
uniform vec4 EyePos;

// The shadow caster's view and projection (set by the shadow pass).
uniform mat4 ShadowCasterViewProj;

// Alpha-tested techniques drop texels below this coverage.
const float ourAlphaCutoff = 0.5;

fragment PS_Forward
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in float vViewDepth;
	out vec4 oColor;

	void main()
	{
		vec4 albedo = texture(DiffuseTexture, vTexCoord);
		float lambert = max(dot(normalize(vNormal), -normalize(LightDirection.xyz)), 0.0);
		oColor = vec4(albedo.rgb * LightColor.rgb * lambert, albedo.a);
	}
}

fragment PS_ForwardAlphaTest
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in float vViewDepth;
	out vec4 oColor;

	void main()
	{
		vec4 albedo = texture(DiffuseTexture, vTexCoord);
		if (albedo.a < ourAlphaCutoff)
		{
			discard;
		}
		float lambert = max(dot(normalize(vNormal), -normalize(LightDirection.xyz)), 0.0);
		oColor = vec4(albedo.rgb * LightColor.rgb * lambert, 1.0);
	}
}

// The five G-buffer targets in slot order: albedo (sRGB target), normal (world
// space, encoded to 0..1), linear depth (view depth over the far plane), material
// (roughness, ambient occlusion) and reflection (sRGB target).
fragment PS_GBuffer
{
	in vec2 vTexCoord;
	in vec3 vNormal;
	in vec3 vTangent;
	in vec3 vBinormal;
	in float vViewDepth;
	layout(location = 0) out vec4 oAlbedo;
	layout(location = 1) out vec4 oNormal;
	layout(location = 2) out float oLinearDepth;
	layout(location = 3) out vec4 oMaterial;
	layout(location = 4) out vec4 oReflection;

	void main()
	{
		vec3 tangentNormal = texture(NormalTexture, vTexCoord).xyz * 2.0 - 1.0;
		mat3 tangentToWorld = mat3(normalize(vTangent), normalize(vBinormal), normalize(vNormal));
		vec3 normal = normalize(tangentToWorld * tangentNormal);
		oAlbedo = vec4(texture(DiffuseTexture, vTexCoord).rgb, 1.0);
		oNormal = vec4(normal * 0.5 + 0.5, 1.0);
		oLinearDepth = vViewDepth / FarPlane;
		oMaterial = vec4(texture(RoughnessTexture, vTexCoord).r, texture(AOTexture, vTexCoord).r, 0.0, 1.0);
		oReflection = vec4(texture(SubstanceTexture, vTexCoord).rgb, 1.0);
	}
}

// Depth only: the shadow map keeps nothing but depth.
fragment PS_Shadow
{
	in vec2 vTexCoord;

	void main()
	{
	}
}

fragment PS_ShadowAlphaTest
{
	in vec2 vTexCoord;

	void main()
	{
		if (texture(DiffuseTexture, vTexCoord).a < ourAlphaCutoff)
		{
			discard;
		}
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_Forward;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderBase
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_Forward;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderAlphaTest
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_ForwardAlphaTest;
		CullMode = None;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

// The front-face techniques draw geometry whose winding is reversed.
technique RenderFrontFace
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_Forward;
		CullMode = Front;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderGBuffer
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_GBuffer;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderGBufferFrontFace
{
	pass P0
	{
		VertexShader = VS_Model;
		PixelShader = PS_GBuffer;
		CullMode = Front;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBuffer
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_Shadow;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBufferBase
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_Shadow;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBufferAlphaTest
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_ShadowAlphaTest;
		CullMode = None;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}

technique RenderShadowBufferFrontFace
{
	pass P0
	{
		VertexShader = VS_Shadow;
		PixelShader = PS_Shadow;
		CullMode = Front;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}
