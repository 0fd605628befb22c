#pragma once
// EffectParser: reads the declarations of an effect source (stage blocks, sampler
// states, techniques and passes, uniforms, vertex inputs) and assembles each
// stage's GLSL. It checks what the declarations say; the GLSL itself is checked
// by the driver afterwards (Fx::CompileFromFile).
//
//   Fx::EffectSource source;          // loaded, includes expanded
//   Fx::EffectDesc desc;
//   std::string messages;
//   if (!Fx::ParseEffect(source, desc, messages)) { ... "file(line): error: ..." lines ... }
//
// Uniforms and vertex inputs are read from the declarations themselves, not from
// GL reflection, so a variable that a pass optimises away is still a variable.
// Preprocessor conditions are not evaluated: a uniform inside #if 0 still counts.

#include <string>

#include "platform/fx/EffectDesc.h"
#include "platform/fx/EffectSource.h"

namespace Fx
{
bool ParseEffect(const EffectSource& aSource, EffectDesc& aDescOut, std::string& someMessages);
} // namespace Fx
