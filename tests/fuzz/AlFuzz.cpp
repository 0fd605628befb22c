// .al model files: any bytes parse or fail with a message naming the byte; a parsed tree keeps
// every guarantee the renderer relies on and writes back to a file that reads the same.

#include <span>
#include <string>
#include <vector>

#include "FuzzEntries.h"
#include "ModelTreeGuarantees.h"

int LumoraFuzz::Al(const uint8_t* someData, size_t aSize)
{
	std::vector<Zeph::AlTextureBinding> bindings;
	std::string error;
	const std::unique_ptr<Zeph::ModelNode> tree =
	    Zeph::AlFile::Parse(std::span<const uint8_t>(someData, aSize), bindings, error);
	if (!tree)
	{
		Require(error.find(" at byte ") != std::string::npos && bindings.empty());
		return 0;
	}
	CheckModelTree(*tree, bindings);
	return 0;
}
