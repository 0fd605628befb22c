#pragma once
// The bake spread over this process and helper processes on this machine (lumora bake
// --jobs N), with the same results, byte for byte, as the bake in one process.
//
// Each bounce of the ambient bake is split into ranges of cells holding about as many
// probes each; the helpers bake theirs into part files while this process bakes the
// last, and the bounce's parts are merged into the volume the next bounce is lit by. The
// rooms' cubemaps are dealt out in turn. A helper that fails or dies has its share baked
// here. Every output is written through a temporary and renamed into place once all of
// that phase is baked: a bake that fails or is cancelled leaves it as it was.
#include <string>

#include "Commands.h"

namespace LumoraTool
{
class BakeWorkers;
class EditorSession;

// How many processes besides this one are worth starting for the bake someOptions asks
// for: at most aJobs - 1, and no more than there are probes or rooms to share.
int CountUsefulWorkers(EditorSession& aSession, const BakeOptions& someOptions, int aJobs);

// Bakes the loaded level's ambient volume into its ambient.sh, records it and prints what
// was written; false (said on standard error) when it failed or was cancelled.
bool BakeAmbientInParallel(EditorSession& aSession, const BakeOptions& someOptions, BakeWorkers& someWorkers);
// Bakes the loaded level's room cubemaps lit by anAmbientFile (empty: the level's own
// ambient.sh as loaded), records them and prints what was written.
bool BakeReflectionsInParallel(EditorSession& aSession, const BakeOptions& someOptions,
                               BakeWorkers& someWorkers, const std::string& anAmbientFile);
} // namespace LumoraTool
