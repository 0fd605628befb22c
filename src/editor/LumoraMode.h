#pragma once
// LumoraMode: what the editor shows and edits. Stored as an int: any other value is
// kept as given, and then no marker geometry is drawn and nothing can be picked.

namespace Lumora
{
enum LumoraMode : int
{
	LIGHT_MODE = 0, // light gizmos drawn; picking, moving and turning act on lights
	NODE_MODE = 1,  // path nodes and edges drawn, each node with a red marker light
	DECAL_MODE = 2, // the selected decal's box drawn; editing acts on decals
};
} // namespace Lumora
