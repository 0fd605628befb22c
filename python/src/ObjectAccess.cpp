// The placed objects as dicts: read through the facade's selection queries and lists, written
// through its selection and editing calls, as a front end edits them. A dict to write may hold
// some of the keys only; the others keep their values.
#include <pybind11/stl.h>

#include <array>
#include <cmath>
#include <optional>
#include <set>

#include "EngineSession.h"
#include "Errors.h"
#include "ReportCollector.h"
#include "WorkingFolder.h"
#include "editor/LumoraWrapper.h"
#include "editor/StringConversion.h"

namespace py = pybind11;

namespace LumoraPython
{
namespace
{
using Lumora::LumoraWrapper;

constexpr const char* ourKindNames[] = {"point light", "spot light", "decal", "path node"};

LumoraWrapper::ObjectKind FacadeKind(int aKind)
{
	if (aKind < EngineSession::POINT_LIGHT || aKind > EngineSession::PATH_NODE)
	{
		throw std::invalid_argument("no object kind " + std::to_string(aKind));
	}
	return static_cast<LumoraWrapper::ObjectKind>(aKind);
}

int Count(const LumoraWrapper& aFacade, int aKind)
{
	switch (aKind)
	{
	case EngineSession::POINT_LIGHT:
		return aFacade.GetPointLights().Count();
	case EngineSession::SPOT_LIGHT:
		return aFacade.GetSpotLights().Count();
	case EngineSession::DECAL:
		return aFacade.GetDecals().Count();
	default:
		return aFacade.GetNodes().Count();
	}
}

template <size_t N> py::tuple Tuple(const std::array<float, N>& someValues, size_t aCount = N)
{
	py::tuple tuple(aCount);
	for (size_t index = 0; index < aCount; ++index)
	{
		tuple[index] = someValues[index];
	}
	return tuple;
}

py::dict ReadObject(LumoraWrapper& aFacade, int aKind, int anIndex)
{
	py::dict values;
	switch (aKind)
	{
	case EngineSession::POINT_LIGHT: {
		Lumora::PointLightStruct light;
		aFacade.TryGetCurrentPointLight(light);
		values["position"] = Tuple(light.pos);
		values["color"] = Tuple(light.col, 3);
		values["falloff"] = light.falloff;
		break;
	}
	case EngineSession::SPOT_LIGHT: {
		Lumora::SpotLightStruct light;
		aFacade.TryGetCurrentSpotLight(light);
		values["position"] = Tuple(light.pos);
		values["color"] = Tuple(light.col, 3);
		values["falloff"] = light.falloff;
		values["direction"] = Tuple(light.direction);
		values["inner_cos"] = light.angles[0];
		values["outer_cos"] = light.angles[1];
		break;
	}
	case EngineSession::DECAL: {
		Lumora::DecalStruct decal;
		aFacade.TryGetCurrentDecal(decal);
		values["position"] = Tuple(decal.pos);
		values["color"] = Tuple(decal.col, 3);
		values["direction"] = Tuple(decal.direction);
		values["type"] = decal.decalID ? Lumora::ToNarrow(*decal.decalID) : std::string();
		values["size"] = decal.size;
		values["depth"] = decal.depth;
		break;
	}
	default: {
		const AI::NGNode& node = aFacade.GetNodes()[anIndex];
		const Vector3<float>& position = node.GetPosition();
		values["position"] = py::make_tuple(position.x, position.y, position.z);
		values["id"] = node.GetID();
		// The nodes it is joined to, by ID, from the edges that end at it.
		std::set<int> links;
		const auto& edges = aFacade.GetEdges();
		for (int edge = 0; edge < edges.Count(); ++edge)
		{
			const int first = edges[edge].GetFirstConnectionID();
			const int second = edges[edge].GetSecondConnectionID();
			if (first == node.GetID() && second != first)
			{
				links.insert(second);
			}
			else if (second == node.GetID() && second != first)
			{
				links.insert(first);
			}
		}
		values["links"] = py::tuple(py::cast(std::vector<int>(links.begin(), links.end())));
		break;
	}
	}
	return values;
}

float Number(const py::dict& someValues, const char* aKey)
{
	const float value = someValues[aKey].cast<float>();
	if (!std::isfinite(value))
	{
		throw std::invalid_argument(std::string(aKey) + " must be finite");
	}
	return value;
}

std::array<float, 3> Vector(const py::dict& someValues, const char* aKey)
{
	const auto values = someValues[aKey].cast<std::vector<float>>();
	if (values.size() != 3 || !std::isfinite(values[0]) || !std::isfinite(values[1]) ||
	    !std::isfinite(values[2]))
	{
		throw std::invalid_argument(std::string(aKey) + " must be three finite numbers");
	}
	return {values[0], values[1], values[2]};
}

// Every value is checked before the first is written, so a bad dict changes nothing.
struct Checked
{
	std::optional<std::array<float, 3>> myPosition;
	std::optional<std::array<float, 3>> myColor;
	std::optional<std::array<float, 3>> myDirection;
	std::optional<float> myFalloff;
	std::optional<float> myInnerCos;
	std::optional<float> myOuterCos;
	std::optional<float> mySize;
	std::optional<float> myDepth;
	std::optional<std::string> myType;
};

Checked Check(const LumoraWrapper& aFacade, int aKind, const py::dict& someValues)
{
	static const std::set<std::string> ourKeys[] = {
	    {"position", "color", "falloff"},
	    {"position", "color", "falloff", "direction", "inner_cos", "outer_cos"},
	    {"position", "color", "direction", "type", "size", "depth"},
	    {"position"},
	};
	for (const auto& [key, value] : someValues)
	{
		const std::string name = key.cast<std::string>();
		if (ourKeys[aKind].count(name) == 0)
		{
			throw std::invalid_argument(std::string("a ") + ourKindNames[aKind] + " has no value '" + name +
			                            "'");
		}
	}
	Checked checked;
	const auto has = [&someValues](const char* aKey) { return someValues.contains(aKey); };
	if (has("position"))
	{
		checked.myPosition = Vector(someValues, "position");
	}
	if (has("color"))
	{
		checked.myColor = Vector(someValues, "color");
		for (const float channel : *checked.myColor)
		{
			if (channel < 0.0f)
			{
				throw std::invalid_argument("colour channels must not be negative (they may exceed 1)");
			}
		}
	}
	if (has("direction"))
	{
		checked.myDirection = Vector(someValues, "direction");
		const auto& d = *checked.myDirection;
		if (d[0] == 0.0f && d[1] == 0.0f && d[2] == 0.0f)
		{
			throw std::invalid_argument("direction must not be zero");
		}
	}
	for (auto [key, slot] : {std::pair{"falloff", &checked.myFalloff}, std::pair{"size", &checked.mySize},
	                         std::pair{"depth", &checked.myDepth}})
	{
		if (has(key))
		{
			*slot = Number(someValues, key);
			if (**slot <= 0.0f)
			{
				throw std::invalid_argument(std::string(key) + " must be above 0");
			}
		}
	}
	if (has("inner_cos") || has("outer_cos"))
	{
		if (!has("inner_cos") || !has("outer_cos"))
		{
			throw std::invalid_argument("inner_cos and outer_cos are set together");
		}
		checked.myInnerCos = Number(someValues, "inner_cos");
		checked.myOuterCos = Number(someValues, "outer_cos");
		if (*checked.myInnerCos > 1.0f || *checked.myOuterCos < -1.0f ||
		    *checked.myInnerCos < *checked.myOuterCos)
		{
			throw std::invalid_argument(
			    "the cone's cosines must satisfy 1 >= inner_cos >= outer_cos >= -1 (the "
			    "inner cone inside the outer)");
		}
	}
	if (has("type"))
	{
		checked.myType = someValues["type"].cast<std::string>();
		if (aFacade.GetDecalTypes().count(*checked.myType) == 0)
		{
			throw std::invalid_argument("no decal type '" + *checked.myType +
			                            "' in the decal type catalogue");
		}
	}
	return checked;
}

// The checked values to the selected object of aKind (Check has refused keys the kind lacks).
void WriteObject(LumoraWrapper& aFacade, int aKind, const Checked& someValues)
{
	if (someValues.myPosition)
	{
		const auto& p = *someValues.myPosition;
		aFacade.SetSelectedPosition(Vector3<float>(p[0], p[1], p[2]));
	}
	if (someValues.myDirection)
	{
		const auto& d = *someValues.myDirection;
		aFacade.SetSelectedDirection(Vector3<float>(d[0], d[1], d[2]));
	}
	if (someValues.myColor)
	{
		const auto& c = *someValues.myColor;
		aKind == EngineSession::POINT_LIGHT  ? aFacade.ChangeColorPointLight(c[0], c[1], c[2])
		: aKind == EngineSession::SPOT_LIGHT ? aFacade.ChangeColorSpotLight(c[0], c[1], c[2])
		                                     : aFacade.ChangeColorDecal(c[0], c[1], c[2]);
	}
	if (someValues.myFalloff)
	{
		aKind == EngineSession::POINT_LIGHT ? aFacade.ChangeFalloffPointLight(*someValues.myFalloff)
		                                    : aFacade.ChangeFalloffSpotLight(*someValues.myFalloff);
	}
	if (someValues.myInnerCos)
	{
		aFacade.ChangeAnglesSpotLight(*someValues.myInnerCos, *someValues.myOuterCos);
	}
	if (someValues.mySize)
	{
		aFacade.ChangeDecalSize(*someValues.mySize);
	}
	if (someValues.myDepth)
	{
		aFacade.ChangeDecalDepth(*someValues.myDepth);
	}
	if (someValues.myType)
	{
		aFacade.ChangeDecalType(Lumora::ToWide(*someValues.myType));
	}
}

void SelectOrThrow(LumoraWrapper& aFacade, int aKind, int anIndex)
{
	if (anIndex < 0 || !aFacade.Select(FacadeKind(aKind), anIndex))
	{
		throw std::out_of_range(std::string("no ") + ourKindNames[aKind] + " " + std::to_string(anIndex) +
		                        " (the level has " + std::to_string(Count(aFacade, aKind)) + ")");
	}
}
} // namespace

py::list EngineSession::GetObjects(int aKind)
{
	RequireLevel();
	FacadeKind(aKind);
	LumoraWrapper& facade = Facade();
	py::list objects;
	for (int index = 0; index < Count(facade, aKind); ++index)
	{
		SelectOrThrow(facade, aKind, index);
		objects.append(ReadObject(facade, aKind, index));
	}
	facade.Select(FacadeKind(aKind), -1);
	return objects;
}

int EngineSession::AddObject(int aKind, const py::dict& someValues)
{
	RequireLevel();
	LumoraWrapper& facade = Facade();
	const Checked checked = Check(facade, aKind, someValues);
	const int before = Count(facade, aKind);
	const size_t mark = ReportCollector::Get().Mark();
	{
		// The facade puts a new object in front of the camera and selects it.
		py::gil_scoped_release unlocked;
		// Selecting nothing of the kind sets the kind's mode and clears the other selections.
		facade.Select(FacadeKind(aKind), -1);
		switch (aKind)
		{
		case POINT_LIGHT:
			facade.AddPointLight();
			break;
		case SPOT_LIGHT:
			facade.AddSpotLight();
			break;
		case DECAL:
			facade.AddDecal();
			break;
		default:
			facade.AddPathNode();
			break;
		}
	}
	if (Count(facade, aKind) != before + 1)
	{
		throw LumoraError(std::string("no ") + ourKindNames[aKind] +
		                  " added: " + ReportCollector::Get().LastSince(mark));
	}
	SelectOrThrow(facade, aKind, before);
	WriteObject(facade, aKind, checked);
	facade.Select(FacadeKind(aKind), -1);
	return before;
}

void EngineSession::SetObject(int aKind, int anIndex, const py::dict& someValues)
{
	RequireLevel();
	LumoraWrapper& facade = Facade();
	FacadeKind(aKind);
	const Checked checked = Check(facade, aKind, someValues);
	SelectOrThrow(facade, aKind, anIndex);
	WriteObject(facade, aKind, checked);
	facade.Select(FacadeKind(aKind), -1);
}

void EngineSession::RemoveObject(int aKind, int anIndex)
{
	RequireLevel();
	LumoraWrapper& facade = Facade();
	FacadeKind(aKind);
	const int before = Count(facade, aKind);
	if (aKind == PATH_NODE && anIndex != before - 1 && anIndex >= 0 && anIndex < before)
	{
		// Removing another node would move the last one, and the edges holding it.
		throw LumoraError("only the last path node (" + std::to_string(before - 1) +
		                  ") can be removed, not " + std::to_string(anIndex));
	}
	SelectOrThrow(facade, aKind, anIndex);
	switch (aKind)
	{
	case POINT_LIGHT:
		facade.RemoveSelectedPointLight();
		break;
	case SPOT_LIGHT:
		facade.RemoveSelectedSpotLight();
		break;
	case DECAL:
		facade.RemoveSelectedDecal();
		break;
	default:
		facade.RemoveSelectedNode();
		break;
	}
	facade.Select(FacadeKind(aKind), -1);
	if (Count(facade, aKind) != before - 1)
	{
		throw LumoraError(std::string(ourKindNames[aKind]) + " " + std::to_string(anIndex) +
		                  " was not removed");
	}
}
} // namespace LumoraPython
