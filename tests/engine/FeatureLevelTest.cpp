// A driver below OpenGL 4.5 core plays the Direct3D device that offers only a lower
// feature level. Mesa reads MESA_GL_VERSION_OVERRIDE once per process, so the engine
// is created in a death-test child that starts afresh ("threadsafe" style) with it set.

#include <bitset>
#include <cstdlib>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <optional>
#include <sys/wait.h>
#include <unistd.h>

#include "engine/Debug.h"
#include "engine/Engine.h"
#include "platform/gpu/Device.h"
#include "support/GlSupport.h"
#include "support/TestSupport.h"

namespace
{
constexpr const char* ourLogVariable = "LUMORA_FEATURE_LEVEL_LOG";

// Runs in the child: a log at the path the parent chose, then the engine on GL 4.1.
void CreateEngineOnOlderGl(unsigned long someFatalLevels)
{
	Debug::Create(std::getenv(ourLogVariable), std::bitset<4>(someFatalLevels));
	Gpu::WindowHandle window = 0;
	const bool createdFlag = Zeph::Engine::Create(window, 320, 240);
	const bool registeredFlag = Zeph::Engine::GetInstance() != nullptr;
	Zeph::Engine::ShutDown();
	Debug::Destroy();
	std::_Exit(createdFlag ? 1 : (registeredFlag ? 3 : 2));
}
} // namespace

TEST(EngineFeatureLevelTest, OlderGlFailsCreateWithTheFeatureLevelReport)
{
	// The child re-runs this test from the top: it must not choose a log path of its own.
	const bool childFlag = std::getenv(ourLogVariable) != nullptr;
	if (!childFlag)
	{
		// Only the parent checks that GL exists at all; the child's GL is the older one.
		Gpu::Device device;
		if (!device.Init(16, 16))
		{
			ASSERT_FALSE(TestSupport::IsCi()) << "No OpenGL 4.5 core context under CI";
			GTEST_SKIP() << "No OpenGL 4.5 core context";
		}
		device.Destroy();
	}
	GTEST_FLAG_SET(death_test_style, "threadsafe");
	std::optional<TestSupport::ScratchDir> scratch;
	if (!childFlag)
	{
		scratch.emplace();
	}
	for (const unsigned long fatalLevels : {0ul, 12ul})
	{
		SCOPED_TRACE(fatalLevels);
		const std::string log =
		    childFlag ? std::string() : scratch->File(std::to_string(fatalLevels) + ".txt");
		if (!childFlag)
		{
			setenv(ourLogVariable, log.c_str(), 1);
			setenv("MESA_GL_VERSION_OVERRIDE", "4.1", 1);
		}
		// Create returns false and the instance stays registered until ShutDown; under the
		// editor's levels (12) the report itself ends the process.
		EXPECT_EXIT(
		    CreateEngineOnOlderGl(fatalLevels),
		    [fatalLevels](int aStatus) {
			    const bool exitedFlag = WIFEXITED(aStatus);
			    return fatalLevels == 0 ? exitedFlag && WEXITSTATUS(aStatus) == 3 : !exitedFlag;
		    },
		    "");
		if (childFlag)
		{
			continue;
		}
		unsetenv("MESA_GL_VERSION_OVERRIDE");
		unsetenv(ourLogVariable);
		EXPECT_THAT(TestSupport::ReadWholeFile(log),
		            testing::AllOf(testing::HasSubstr("\"Direct3D Feature Level 11 unsupported.\n\""),
		                           testing::HasSubstr("\"Zeph::Engine::D3DDeviceSetup\""),
		                           testing::Not(testing::HasSubstr("D3DCreateDevice Failed."))));
	}
}
