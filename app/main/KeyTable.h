#pragma once
// Every key and mouse binding of the editor, as Help ▸ Keys lists them.
#include <QString>
#include <vector>

namespace LumoraEditor
{
struct KeyBinding
{
	const char* myKeys;
	const char* myWhat;
};

const std::vector<KeyBinding>& KeyBindings();
QString KeyTableHtml();
} // namespace LumoraEditor
