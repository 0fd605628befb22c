// The compute helper's effect. The effect layer has no compute stage, so the helper's
// buffers are textures and its work a full-screen pass: "Render" copies inputData into
// the bound target, which the helper reads back as outputData.

#include "../Common/Transforms.fxh"

uniform sampler2D inputData;
uniform sampler2D outputData;

sampler inputData
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

sampler outputData
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

vertex VS_Quad
{
	in vec3 POSITION;
	in vec2 TEXCOORD;
	out vec2 vTexCoord;

	void main()
	{
		vTexCoord = TEXCOORD;
		gl_Position = vec4(POSITION.xy, 0.0, 1.0);
	}
}

fragment PS_Copy
{
	in vec2 vTexCoord;
	out vec4 oColor;

	void main()
	{
		oColor = texture(inputData, vTexCoord);
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
