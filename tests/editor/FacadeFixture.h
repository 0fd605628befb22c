#pragma once
// The fixture for tests that drive the editor facade headless. The facade writes
// "DebugLogger.txt" into the working directory and reads data/ from it, so each test
// runs in its own scratch directory: data/ there holds links to the repository's data
// folders, except data/XML, which is a copy (tests may write level files into it), and
// data/Cubemaps, a folder of links to the shipped files that bakes may write beside.
// The facade is created at 160 x 90 without a window; where no OpenGL 4.5 context can
// be made the test is skipped, except under CI=true. The facade's log makes severe and
// critical reports fatal, so a test that provokes one ends the process: tests assert
// on the log's debug entries only.
//
//   TEST_F(FacadeTest, Something)
//   {
//       Facade().AddPointLight();
//       EXPECT_NE(LogText().find("..."), std::string::npos);
//   }

#include <array>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <epoxy/egl.h>
#include <filesystem>
#include <functional>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "core/Matrix44.h"
#include "core/Vector4.h"
#include "editor/LumoraWrapper.h"
#include "engine/CameraInstance.h"
#include "engine/Engine.h"
#include "platform/gpu/Device.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/TextureView.h"
#include "support/GlSupport.h"
#include "support/TestSupport.h"

class FacadeTest : public testing::Test
{
protected:
	static constexpr int ourWidth = 160;
	static constexpr int ourHeight = 90;

	void SetUp() override
	{
		if (!HasGl())
		{
			ASSERT_FALSE(TestSupport::IsCi()) << "No OpenGL 4.5 core context under CI";
			GTEST_SKIP() << "No OpenGL 4.5 core context";
		}
		MakeDataFolder();
		PrepareData(myScratch.Path() / "data");
		myPreviousDirectory = std::filesystem::current_path();
		std::filesystem::current_path(myScratch.Path());
		myChangedDirectoryFlag = true;
		ASSERT_TRUE(Lumora::LumoraWrapper::Create(0, ourWidth, ourHeight)) << LogText();
		myFacade = Lumora::LumoraWrapper::GetInstance();
		ASSERT_NE(myFacade, nullptr);
	}

	void TearDown() override
	{
		if (myFacade != nullptr)
		{
			Lumora::LumoraWrapper::ShutDown();
			myFacade = nullptr;
		}
		if (myChangedDirectoryFlag)
		{
			std::filesystem::current_path(myPreviousDirectory);
		}
	}

	// Runs before the facade is created, for fixtures that put files of their own into
	// the scratch data folder (its XML folder is a copy; the other folders are links to
	// the repository's data and must not be written).
	virtual void PrepareData(const std::filesystem::path& aDataPath) { static_cast<void>(aDataPath); }

	Lumora::LumoraWrapper& Facade() { return *myFacade; }
	// The facade shut down and created again at another size, headless or on an X11 window
	// (the log starts over).
	void Recreate(int aWidth, int aHeight, uint64_t aWindow = 0)
	{
		Lumora::LumoraWrapper::ShutDown();
		myFacade = nullptr;
		ASSERT_TRUE(Lumora::LumoraWrapper::Create(aWindow, aWidth, aHeight)) << LogText();
		myFacade = Lumora::LumoraWrapper::GetInstance();
	}
	// The back buffer as the last frame left it (RGBA, row 0 at the top, alpha 255), read with
	// the GL context taken for the moment. With $LUMORA_TEST_FRAMES naming a folder, it is also
	// written there as aName.png, for looking at.
	std::vector<uint8_t> ReadFrame(const std::string& aName, int& aWidthOut, int& aHeightOut) const
	{
		Zeph::Engine* engine = Zeph::Engine::GetInstance();
		std::vector<uint8_t> pixels;
		engine->MakeContextCurrent();
		const Gpu::RenderTargetView& view = *engine->GetBackBufferView();
		aWidthOut = view.GetWidth();
		aHeightOut = view.GetHeight();
		const bool readFlag = Gpu::ReadRenderTarget(engine->GetContext(), view, pixels);
		engine->ReleaseContext();
		EXPECT_TRUE(readFlag) << "the back buffer could not be read";
		pixels = TestSupport::Opaque(std::move(pixels));
		if (const char* folder = std::getenv("LUMORA_TEST_FRAMES"); folder != nullptr && *folder != '\0')
		{
			Gpu::SavePng((std::filesystem::path(folder) / (aName + ".png")).string(), aWidthOut, aHeightOut,
			             pixels.data());
		}
		return pixels;
	}
	const std::filesystem::path& ScratchPath() const { return myScratch.Path(); }
	// The whole log as written so far (each entry is flushed as it is written).
	std::string LogText() const { return TestSupport::ReadWholeFile(myScratch.File("DebugLogger.txt")); }

	// The pixel at which the editor camera sees aPosition, through the camera's view and
	// projection (the path the renderer draws with), so clicks there must hit it.
	void PixelOf(const Vector3<float>& aPosition, float& anXOut, float& aYOut) const
	{
		const Zeph::CameraInstance& camera = *myFacade->GetCameraInstance();
		const Vector4<float> clip = Vector4<float>(aPosition) * camera.GetView() * camera.GetProjection();
		anXOut = (clip.x / clip.w + 1.0f) * 0.5f * static_cast<float>(ourWidth);
		aYOut = (1.0f - clip.y / clip.w) * 0.5f * static_cast<float>(ourHeight);
	}

	void ClickAt(const Vector3<float>& aPosition)
	{
		float x = 0.0f;
		float y = 0.0f;
		PixelOf(aPosition, x, y);
		myFacade->DoIntersection(x, y);
	}

	void ClickCentre() { myFacade->DoIntersection(0.5f * ourWidth, 0.5f * ourHeight); }

	// The selected point light, spot light, node and decal (-1 for none), to compare at once.
	std::array<int, 4> Selection() const
	{
		return {myFacade->GetSelectedPoint(), myFacade->GetSelectedSpot(), myFacade->GetSelectedNode(),
		        myFacade->GetSelectedDecal()};
	}

private:
	// One probe per process: a headless context that is made and dropped at once.
	static bool HasGl()
	{
		static const bool ourHasGlFlag = [] {
			Gpu::Device probe;
			const bool result = probe.Init(16, 16);
			if (result)
			{
				probe.Destroy();
			}
			return result;
		}();
		return ourHasGlFlag;
	}

	void MakeDataFolder()
	{
		namespace fs = std::filesystem;
		const fs::path source = fs::path(LUMORA_TEST_SOURCE_ROOT) / "data";
		const fs::path data = myScratch.Path() / "data";
		fs::create_directories(data / "XML");
		for (const fs::directory_entry& entry : fs::directory_iterator(source))
		{
			const fs::path name = entry.path().filename();
			if (name == "XML")
			{
				fs::copy(entry.path(), data / "XML", fs::copy_options::recursive);
				// Tests start from unbaked levels, whatever was baked in the checkout.
				for (const fs::directory_entry& level : fs::directory_iterator(data / "XML/levels"))
				{
					fs::remove(level.path() / "ambient.sh");
					fs::remove(level.path() / "bake.json");
				}
			}
			else if (name == "Cubemaps")
			{
				// Bakes write their cubemaps here: a folder of its own, with links to the
				// shipped files.
				fs::create_directory(data / name);
				for (const fs::directory_entry& file : fs::directory_iterator(entry.path()))
				{
					if (file.is_regular_file())
					{
						fs::create_symlink(file.path(), data / name / file.path().filename());
					}
				}
			}
			else
			{
				fs::create_directory_symlink(entry.path(), data / name);
			}
		}
	}

	TestSupport::ScratchDir myScratch;
	std::filesystem::path myPreviousDirectory;
	bool myChangedDirectoryFlag = false;
	Lumora::LumoraWrapper* myFacade = nullptr;
};

// What breaks the path graph's invariant, empty when it holds: every edge ends at two nodes of
// the node array, each of which holds it, and every edge a node holds is an element of the edge
// array that ends at that node (the references the graph rests on).
inline std::string GraphProblems(const Lumora::LumoraWrapper& aFacade)
{
	const GrowingArray<AI::NGNode>& nodes = aFacade.GetNodes();
	const GrowingArray<AI::NGEdge>& edges = aFacade.GetEdges();
	std::ostringstream problems;
	for (const AI::NGEdge& edge : edges)
	{
		for (const AI::NGNode* end : edge.GetConnections())
		{
			if (end < nodes.begin() || end >= nodes.end())
			{
				problems << "an edge ends outside the nodes; ";
			}
			else if (end->GetEdgeSlots()[0] != &edge && end->GetEdgeSlots()[1] != &edge)
			{
				problems << "node " << end->GetID() << " lost an edge; ";
			}
		}
	}
	for (const AI::NGNode& node : nodes)
	{
		for (const AI::NGEdge* edge : node.GetEdgeSlots())
		{
			if (edge != nullptr &&
			    (edge < edges.begin() || edge >= edges.end() ||
			     (edge->GetConnections()[0] != &node && edge->GetConnections()[1] != &node)))
			{
				problems << "node " << node.GetID() << " holds a stale edge; ";
			}
		}
	}
	return problems.str();
}

// A light's numbers (falloff, angles, colour, position or orientation) in one list, to compare
// whole records at once.
inline std::vector<float> Values(const Zeph::PointLightData& aLight)
{
	return {aLight.myFalloff, aLight.myPosition.x, aLight.myPosition.y, aLight.myPosition.z,
	        aLight.myColor.x, aLight.myColor.y,    aLight.myColor.z,    aLight.myColor.w};
}

inline std::vector<float> Values(const Zeph::SpotLightData& aLight)
{
	std::vector<float> values = {aLight.myFalloff, aLight.myAngles.x, aLight.myAngles.y, aLight.myColor.x,
	                             aLight.myColor.y, aLight.myColor.z,  aLight.myColor.w};
	values.insert(values.end(), aLight.myOrientation.myMatrix, aLight.myOrientation.myMatrix + 16);
	return values;
}

// A render loop on its own thread, as the editor has one: Update and Render without pause until
// Stop. Frames are counted inside the frame (after anObserver, where one is given); a frame step
// that leaves the GL context current on the loop's thread counts as a leak.
class RenderLoop
{
public:
	explicit RenderLoop(Lumora::LumoraWrapper& aFacade,
	                    const std::function<void(const Lumora::LumoraWrapper&)>& anObserver = {})
	    : myFacade(aFacade)
	{
		myFacade.SetFrameObserver([this, anObserver](const Lumora::LumoraWrapper& aFrameFacade) {
			if (anObserver)
			{
				anObserver(aFrameFacade);
			}
			myFrames.fetch_add(1);
		});
		myThread = std::thread([this] {
			while (!myStopFlag.load())
			{
				myFacade.Update(16.0f);
				myFacade.Render();
				if (eglGetCurrentContext() != EGL_NO_CONTEXT)
				{
					myContextLeaks.fetch_add(1);
				}
			}
		});
	}
	~RenderLoop() { Stop(); }

	int Frames() const { return myFrames.load(); }
	int ContextLeaks() const { return myContextLeaks.load(); }

	// Waits until aCount frames more than now have been drawn (30 s at most).
	void WaitForFrames(int aCount) const
	{
		const int target = myFrames.load() + aCount;
		const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
		while (myFrames.load() < target && std::chrono::steady_clock::now() < deadline)
		{
			std::this_thread::sleep_for(std::chrono::milliseconds(1));
		}
	}

	void Stop()
	{
		if (myThread.joinable())
		{
			myStopFlag = true;
			myThread.join();
			myFacade.SetFrameObserver({});
		}
	}

private:
	Lumora::LumoraWrapper& myFacade;
	std::atomic<int> myFrames{0};
	std::atomic<int> myContextLeaks{0};
	std::atomic<bool> myStopFlag{false};
	std::thread myThread;
};

// Decals need the shipped catalogue's "brick", the type every new decal takes; without
// it the test is skipped.
class DecalFacadeTest : public FacadeTest
{
protected:
	void SetUp() override
	{
		FacadeTest::SetUp();
		if (!IsSkipped() && !HasFatalFailure() && Facade().GetDecalTypes().count("brick") == 0)
		{
			GTEST_SKIP() << "The decal type catalogue defines no \"brick\" type";
		}
	}
};
