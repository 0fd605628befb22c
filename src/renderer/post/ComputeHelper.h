#pragma once
// ComputeHelper: the compute effect (data/Shaders/Compute Shader/Compute_Shader.fx)
// with its "inputData" and "outputData" variables. Every post stage is handed one
// so that a stage can move work to compute later; no stage dispatches anything
// with it yet. The effect belongs to the engine's EffectContainer.

namespace Fx
{
class Variable;
}

namespace Zeph
{
class Effect;

class ComputeHelper
{
public:
	static constexpr const char* ourEffectFile = "data/Shaders/Compute Shader/Compute_Shader.fx";

	ComputeHelper() = default;
	~ComputeHelper() = default;
	ComputeHelper(const ComputeHelper&) = delete;
	ComputeHelper& operator=(const ComputeHelper&) = delete;

	// False, reported, when the effect or one of its variables is missing.
	bool Init();
	void Destroy();

	Effect* GetEffect() const { return myEffect; }
	Fx::Variable* GetInputData() const { return myInputData; }
	Fx::Variable* GetOutputData() const { return myOutputData; }

private:
	Effect* myEffect = nullptr;
	Fx::Variable* myInputData = nullptr;
	Fx::Variable* myOutputData = nullptr;
};
} // namespace Zeph
