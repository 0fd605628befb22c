#include "platform/fx/Technique.h"

namespace Fx
{
void Technique::Destroy(Gpu::Context& aContext)
{
	for (std::unique_ptr<Pass>& pass : myPasses)
	{
		pass->Destroy(aContext);
	}
	myPasses.clear();
	myValidFlag = false;
}

Pass* Technique::GetPassByIndex(int anIndex)
{
	return anIndex >= 0 && anIndex < GetPassCount() ? myPasses[static_cast<size_t>(anIndex)].get() : nullptr;
}

Pass* Technique::GetPassByName(const char* aName)
{
	for (std::unique_ptr<Pass>& pass : myPasses)
	{
		if (aName && pass->GetName() == aName)
		{
			return pass.get();
		}
	}
	return nullptr;
}
} // namespace Fx
