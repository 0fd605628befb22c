// liblumora: the shared library that holds every subsystem of the tree.
#include "lumora.h"

#include <tinyxml.h>

namespace
{
const char* SanitizerName()
{
#if defined(__SANITIZE_ADDRESS__)
	return "address, undefined";
#elif defined(__SANITIZE_THREAD__)
	return "thread";
#else
	return "none";
#endif
}
} // namespace

namespace Lumora
{
const char* GetVersion()
{
	return LUMORA_VERSION;
}

std::string GetBuildInfo()
{
	std::string info;
	info += "build:      " LUMORA_BUILD_TYPE ", g++ " __VERSION__ ", C++20, sanitizers: ";
	info += SanitizerName();
	info += "\nsubsystems:\n";
	info += "  core      GrowingArray, Vector2/3/4, Matrix33/44, Intersection (Sphere, AABB, Ray)\n";
	info += "  engine    Engine (device, swap chain, back and depth buffers), texture, effect and font\n"
	        "            containers, Instance, Room, Text, DebugLine, Debug log with fatal reports,\n"
	        "            FI_File typed text/binary stream, Camera\n";
	info += "  model     ModelNode, Model, Surface, VertexTypes, ModelFactory, COLLADA and .al import\n";
	info += "  renderer  Renderer with its collector (batches per model) and late list\n";
	info += "  xml       XML cursor and XMLElement builder on TinyXML " +
	        std::to_string(TIXML_MAJOR_VERSION) + "." + std::to_string(TIXML_MINOR_VERSION) + "." +
	        std::to_string(TIXML_PATCH_VERSION) + "\n";
	info += "  platform  paths (case-insensitive lookup, atomic replace), stacktrace (GCC libbacktrace),\n"
	        "            DDS files, GPU layer (OpenGL 4.5 core through libepoxy on EGL, headless or on an\n"
	        "            X11 window), effects (GLSL 4.50 techniques and passes, compiled by lumora-fxc),\n"
	        "            text (fontconfig, FreeType glyph atlas)\n";
	return info;
}
} // namespace Lumora
