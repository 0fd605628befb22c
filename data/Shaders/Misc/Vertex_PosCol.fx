// Vertex-coloured geometry in world space: debug shapes, gizmos and helpers.

#include "../Common/Transforms.fxh"

vertex VS_PosCol
{
	in vec3 POSITION;
	in vec4 COLOR;
	out vec4 vColor;

	void main()
	{
		vColor = COLOR;
		gl_Position = TransformToClip(POSITION);
	}
}

fragment PS_VertexColor
{
	in vec4 vColor;
	out vec4 oColor;

	void main()
	{
		oColor = vColor;
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_PosCol;
		PixelShader = PS_VertexColor;
		FillMode = Solid;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = Less;
	}
}

technique RenderWireFrame
{
	pass P0
	{
		VertexShader = VS_PosCol;
		PixelShader = PS_VertexColor;
		FillMode = Wireframe;
		CullMode = None;
	}
}
