#include "renderer/post/ComputeHelper.h"

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/fx/Variable.h"

namespace Zeph
{
bool ComputeHelper::Init()
{
	const char* function = "Zeph::ComputeHelper::Init";
	Destroy();
	Engine* engine = Engine::GetInstance();
	Effect* effect = engine != nullptr ? engine->GetEffectContainer().GetEffect(ourEffectFile) : nullptr;
	if (effect == nullptr)
	{
		ReportCritical(__LINE__, function, "Cannot load the compute effect %s", ourEffectFile);
		return false;
	}
	Fx::Variable* input = effect->GetEffect()->GetVariableByName("inputData");
	Fx::Variable* output = effect->GetEffect()->GetVariableByName("outputData");
	if (!input->IsValid())
	{
		ReportCritical(__LINE__, function, "myInputData is invalid");
	}
	if (!output->IsValid())
	{
		ReportCritical(__LINE__, function, "myOutputData is invalid");
	}
	if (!input->IsValid() || !output->IsValid())
	{
		return false;
	}
	myEffect = effect;
	myInputData = input;
	myOutputData = output;
	return true;
}

void ComputeHelper::Destroy()
{
	myEffect = nullptr;
	myInputData = nullptr;
	myOutputData = nullptr;
}
} // namespace Zeph
