// Sprites: a textured, tinted quad given directly in clip space (x and y in
// -1..1, y up, z the depth), alpha-blended over what is drawn, with no depth test.

uniform sampler2D SpriteTexture;
uniform vec4 SpriteColor;

sampler SpriteTexture
{
	Filter = MIN_MAG_MIP_LINEAR;
	AddressU = Clamp;
	AddressV = Clamp;
	AddressW = Clamp;
}

vertex VS_Sprite
{
	in vec3 POSITION;
	in vec2 TEXCOORD0;
	out vec2 vTexCoord;

	void main()
	{
		vTexCoord = TEXCOORD0;
		gl_Position = vec4(POSITION, 1.0);
	}
}

fragment PS_Sprite
{
	in vec2 vTexCoord;
	out vec4 oColor;

	void main()
	{
		oColor = texture(SpriteTexture, vTexCoord) * SpriteColor;
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Sprite;
		PixelShader = PS_Sprite;
		BlendEnable = true;
		SrcBlend = SrcAlpha;
		DestBlend = InvSrcAlpha;
		BlendOp = Add;
		SrcBlendAlpha = One;
		DestBlendAlpha = InvSrcAlpha;
		BlendOpAlpha = Add;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
