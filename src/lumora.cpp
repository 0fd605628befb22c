// liblumora: the shared library that holds every subsystem of the tree.
#include "lumora.h"

namespace Lumora
{
const char* GetVersion() { return LUMORA_VERSION; }
}
