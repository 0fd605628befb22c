#pragma once
// The facade in a scratch working directory (FacadeFixture.h) with catalogues of our own:
// two model entity types and one that is not a model, two decal types. Level files are
// written by the tests into data/XML/levels/<level>/.
#include <filesystem>
#include <string>

#include "editor/FacadeFixture.h"
#include "support/TestSupport.h"

inline const char* const ourEntityTypesText = R"(<root>
	<entities>
		<entity id="crate">
			<visual-component type="model" filepath="data/models/crate.dae" cast-shadow="false" />
		</entity>
		<entity id="pillar">
			<visual-component type="model" filepath="data/models/pillar.dae" />
		</entity>
		<entity id="lamp">
			<visual-component type="light" filepath="data/models/pillar.dae" />
		</entity>
	</entities>
</root>
)";

inline const char* const ourDecalTypesText = R"(<root>
	<decal id="bricks">
		<texture path="data/textures/bricks_albedo.dds" />
		<normal path="data/textures/bricks_normal.dds" />
	</decal>
	<decal id="wood">
		<texture path="data/textures/wood_albedo.dds" />
		<normal path="data/textures/wood_normal.dds" />
	</decal>
</root>
)";

class LevelTest : public FacadeTest
{
protected:
	void PrepareData(const std::filesystem::path& aDataPath) override
	{
		TestSupport::WriteWholeFile((aDataPath / "XML" / "EntityTypes.xml").string(), ourEntityTypesText);
		TestSupport::WriteWholeFile((aDataPath / "XML" / "DecalTypes.xml").string(), ourDecalTypesText);
	}

	// Relative to the working directory, as the facade spells it.
	static std::string LevelFile(const std::string& aLevel, const std::string& aFile)
	{
		return "data/XML/levels/" + aLevel + "/" + aFile;
	}

	static void WriteLevelFile(const std::string& aLevel, const std::string& aFile,
	                           const std::string& someText)
	{
		std::filesystem::create_directories("data/XML/levels/" + aLevel);
		TestSupport::WriteWholeFile(LevelFile(aLevel, aFile), someText);
	}

	static std::string ReadLevelFile(const std::string& aLevel, const std::string& aFile)
	{
		return TestSupport::ReadWholeFile(LevelFile(aLevel, aFile));
	}

	// How often aText occurs in aWhole.
	static int CountOf(const std::string& aWhole, const std::string& aText)
	{
		int count = 0;
		for (std::size_t at = aWhole.find(aText); at != std::string::npos; at = aWhole.find(aText, at + 1))
		{
			++count;
		}
		return count;
	}

	// Entries the log holds at the error levels (the facade ends the process on severe and
	// critical ones, so these are the survivable errors).
	int ErrorEntryCount() const { return CountOf(LogText(), "\"Error Type:\"\"ERROR\""); }
};
