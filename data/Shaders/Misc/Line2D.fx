// Lines in world space (AI path edges, light outlines): coloured per vertex,
// hidden behind geometry but never hiding each other or what is drawn later.

#include "../Common/Transforms.fxh"

vertex VS_Line
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

fragment PS_Line
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
		VertexShader = VS_Line;
		PixelShader = PS_Line;
		DepthEnable = true;
		DepthWriteMask = Zero;
		DepthFunc = LessEqual;
		CullMode = None;
	}
}
