#include "core/ObjectState.h"

namespace LumoraEditor
{
const char* KindName(Kind aKind)
{
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
		return "point light";
	case Kind::SPOT_LIGHT:
		return "spot light";
	case Kind::DECAL:
		return "decal";
	case Kind::PATH_NODE:
		return "path node";
	}
	return "object";
}

const char* KindPluralTitle(Kind aKind)
{
	switch (aKind)
	{
	case Kind::POINT_LIGHT:
		return "Point lights";
	case Kind::SPOT_LIGHT:
		return "Spot lights";
	case Kind::DECAL:
		return "Decals";
	case Kind::PATH_NODE:
		return "Path nodes";
	}
	return "Objects";
}

bool HasColor(Kind aKind)
{
	return aKind != Kind::PATH_NODE;
}

bool HasFalloff(Kind aKind)
{
	return aKind == Kind::POINT_LIGHT || aKind == Kind::SPOT_LIGHT;
}

bool HasDirection(Kind aKind)
{
	return aKind == Kind::SPOT_LIGHT || aKind == Kind::DECAL;
}
} // namespace LumoraEditor
