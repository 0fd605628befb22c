#pragma once
// FakeEngine: an EngineApi that keeps the lists the engine would keep, by the engine's rules
// (an addition appends, a removal moves the last object into the place), and records every
// call. Tests drive the document, panels and tools on it without a window or a GPU.
#include <QString>
#include <QStringList>
#include <array>
#include <vector>

#include "bridge/EngineApi.h"

namespace LumoraEditor
{
class FakeEngine : public EngineApi
{
public:
	void AddObject(const ObjectState& aState) override
	{
		myLists[static_cast<int>(aState.myKind)].push_back(aState);
		myCalls << QStringLiteral("add %1").arg(KindName(aState.myKind));
	}
	void ApplyState(int anIndex, const ObjectState& aState) override
	{
		auto& list = myLists[static_cast<int>(aState.myKind)];
		if (anIndex >= 0 && anIndex < static_cast<int>(list.size()))
		{
			list[anIndex] = aState;
		}
		myCalls << QStringLiteral("apply %1 %2").arg(KindName(aState.myKind)).arg(anIndex);
	}
	void RemoveObject(Kind aKind, int anIndex) override
	{
		auto& list = myLists[static_cast<int>(aKind)];
		if (anIndex >= 0 && anIndex < static_cast<int>(list.size()))
		{
			list[anIndex] = list.back();
			list.pop_back();
		}
		myCalls << QStringLiteral("remove %1 %2").arg(KindName(aKind)).arg(anIndex);
	}
	void SelectObject(Kind aKind, int anIndex) override
	{
		mySelectedKind = aKind;
		mySelectedIndex = anIndex;
	}

	std::array<std::vector<ObjectState>, ourKindCount> myLists;
	QStringList myCalls;
	Kind mySelectedKind = Kind::POINT_LIGHT;
	int mySelectedIndex = -1;
};
} // namespace LumoraEditor
