#pragma once
// ShaderFiles: the effect file of each effect type. Rows 15 to 17 keep their
// lower-case folder; the file layer finds them in the one data/ tree all the same.
// Row 20 is the editor's overlays (light icons and wires), drawn over the finished frame.

#include <array>

namespace Zeph
{
enum EffectType
{
	EFFECT_POSITION = 0,
	EFFECT_LIT_MODEL = 4,
	EFFECT_SKINNED_MODEL = 6,
	EFFECT_SPRITE = 10,
	EFFECT_SKYBOX = 11,
	EFFECT_TERRAIN = 12,
	EFFECT_FULL_SCREEN = 13,
	EFFECT_FOG_OF_WAR = 14,
	EFFECT_DECAL = 15,
	EFFECT_LIGHTNING = 16,
	EFFECT_LINE = 17,
	EFFECT_DEFERRED_POINT_LIGHT = 18,
	EFFECT_DEFERRED_SPOT_LIGHT = 19,
	EFFECT_OVERLAY = 20,
	EFFECT_TYPE_COUNT = 21,
};

inline constexpr std::array<const char*, EFFECT_TYPE_COUNT> ShaderFiles = {
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 0
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 1
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 2
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 3
    "data/Shaders/PBL/Vertex_PosNormUVTanBiNorm.fx",        // 4
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 5
    "data/Shaders/PBL/Vertex_PosWeightBonesNormUVTanBi.fx", // 6
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 7
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 8
    "data/Shaders/Misc/Vertex_Pos.fx",                      // 9
    "data/Shaders/Sprite/Sprite.fx",                        // 10
    "data/Shaders/SkyBox/SkyBox.fx",                        // 11
    "data/Shaders/Terrain/Terrain.fx",                      // 12
    "data/Shaders/FullScreen/VertexUV_Shader.fx",           // 13
    "data/Shaders/FoW/FoW_Shader.fx",                       // 14
    "data/shaders/misc/decals.fx",                          // 15
    "data/shaders/misc/lightning.fx",                       // 16
    "data/shaders/misc/Line2D.fx",                          // 17
    "data/Shaders/PBL/DeferredPointLight.fx",               // 18
    "data/Shaders/PBL/DeferredSpotLight.fx",                // 19
    "data/Shaders/Misc/Overlay.fx",                         // 20
};
} // namespace Zeph
