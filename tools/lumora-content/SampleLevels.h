#pragma once
// SampleLevels: the two sample levels that ship under data/XML/levels.
//
//   for (const Content::LevelDescription& level : Content::BuildSampleLevels())
//   {
//       Content::WriteLevel("data/XML/levels/" + level.myName + "/", level, error);
//   }
//
// sample_small: one room with a few props, point and spot lights, one decal and a path chain.
// sample_large: eight rooms of six sizes joined door to door around a ring, with props, more than
// thirty lights, decals of every type on walls and floors and a path ring through six of the rooms.
// Rooms stand on y = 0 and are turned only in steps of 90 degrees, so their bounds stay boxes.

#include <vector>

#include "LevelDescription.h"

namespace Content
{
std::vector<LevelDescription> BuildSampleLevels();
} // namespace Content
