// The object, camera and projection matrices every world-space effect shares.
//
// Engine matrices are row-major with row vectors (v * M). They are uploaded
// unchanged into a GLSL mat4, which reads them column by column, so GLSL's M * v
// computes the engine's v * M, and the engine's World * View * Projection is
// written right to left here.

uniform mat4 World;
uniform mat4 View;
uniform mat4 Projection;
// The camera's far plane; every effect the engine loads from its compiled form declares it.
uniform float FarPlane;

vec4 TransformToClip(vec3 aPosition)
{
	return Projection * (View * (World * vec4(aPosition, 1.0)));
}
