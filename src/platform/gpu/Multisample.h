#pragma once
// Multisample support of a format, as DXGI's CheckMultisampleQualityLevels gives it:
// 0 quality levels when the sample count is not supported for the format, else 1
// (GL has no vendor quality modes beyond the plain one).

#include "platform/dds/Format.h"

namespace Gpu
{
// Needs a current context. False, reported, when the format has no GL form.
bool CheckMultisampleQualityLevels(Dds::Format aFormat, int aSampleCount, unsigned int& someLevelsOut);
} // namespace Gpu
