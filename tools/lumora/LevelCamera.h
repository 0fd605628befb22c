#pragma once
// The camera the level pictures are taken from: the editor's camera walked from its start
// into the level's first room, looking across it (lumora render's default, the README's
// level picture and the level frame benchmark).
//
//   LumoraTool::WalkIntoTheFirstRoom(session.Editor());
namespace Lumora
{
class LumoraWrapper;
}

namespace LumoraTool
{
void WalkIntoTheFirstRoom(Lumora::LumoraWrapper& anEditor);
} // namespace LumoraTool
