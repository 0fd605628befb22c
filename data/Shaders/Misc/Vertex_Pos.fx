// Models of the vertex types without a lit effect of their own: drawn by position
// alone in one flat colour, so that they show where they are.

#include "../Common/Transforms.fxh"

uniform vec4 Color = vec4(1.0);

vertex VS_Pos
{
	in vec3 POSITION;

	void main()
	{
		gl_Position = TransformToClip(POSITION);
	}
}

fragment PS_Color
{
	out vec4 oColor;

	void main()
	{
		oColor = Color;
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Pos;
		PixelShader = PS_Color;
		CullMode = Back;
		DepthEnable = true;
		DepthWriteMask = All;
		DepthFunc = LessEqual;
	}
}
