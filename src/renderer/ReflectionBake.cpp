// The reflection bake: one 256-texel cubemap at the centre of every room, rendered through
// the deferred passes, its mips 1..8 filtered into ever wider cosine-power lobes for rough
// surfaces, saved as "data/Cubemaps/" + level + "/" + room id + ".dds".
#include <algorithm>
#include <cmath>
#include <memory>
#include <numbers>

#include "core/Matrix44.h"
#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/Room.h"
#include "engine/Texture.h"
#include "engine/TextureContainer.h"
#include "platform/fx/Effect.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/Texture.h"
#include "platform/gpu/TextureSaver.h"
#include "platform/paths/Paths.h"
#include "renderer/BakeProgress.h"
#include "renderer/CubemapContainer.h"
#include "renderer/DynamicCubemap.h"
#include "renderer/ProbeHelper.h"
#include "renderer/Renderer.h"

namespace Zeph
{
namespace
{
constexpr float ourBlack[4] = {0.0f, 0.0f, 0.0f, 0.0f};
constexpr const char* ourCubeNormalsFile = "data/Cubemaps/normaltest.dds";
// The last mip of a 256-texel cube; mip m gets the lobe cos^p with p = 8192^((8 - m) / 8),
// from 2^11.375 at mip 1 down to 1 (a cosine over the hemisphere) at mip 8.
constexpr int ourLastMip = 8;
constexpr double ourSharpestPower = 8192.0;
// The blur of mip m sums the cross halved clamp(m - 1, 1, 4) times, and mip 2 a cross of its own
// resolution (halved twice): a source texel is then at most 0.9 of the lobe's standard deviation
// (1/sqrt(p) radians) wide, which widens the lobe by under 4 %, and the wide lobes of the last mips
// sum a 48-texel cross instead of a 768-texel one.
constexpr int ourCrossHalvings = 4;

enum Square
{
	RIGHT,
	LEFT,
	TOP,
	BOTTOM,
	SQUARE_COUNT
};

struct Neighbour
{
	int myFace;
	float myAngle; // 0: drawn as it is; otherwise turned by this angle through "RenderRotated"
};

// The faces that border each face along its right, left, top and bottom edges, turned so that
// the cross unfolds the cube continuously across every shared edge (faces +X, -X, +Y, -Y, +Z, -Z
// with the face cameras' up vectors).
constexpr float ourPi = std::numbers::pi_v<float>;
constexpr Neighbour ourCross[DynamicCubemap::ourFaceCount][SQUARE_COUNT] = {
    {{5, 0.0f}, {4, 0.0f}, {2, ourPi / 2.0f}, {3, -ourPi / 2.0f}},
    {{4, 0.0f}, {5, 0.0f}, {2, -ourPi / 2.0f}, {3, ourPi / 2.0f}},
    {{0, -ourPi / 2.0f}, {1, ourPi / 2.0f}, {5, ourPi}, {4, 0.0f}},
    {{0, ourPi / 2.0f}, {1, -ourPi / 2.0f}, {4, 0.0f}, {5, ourPi}},
    {{0, 0.0f}, {1, 0.0f}, {2, 0.0f}, {3, 0.0f}},
    {{1, 0.0f}, {0, 0.0f}, {2, ourPi}, {3, -ourPi}},
};

Gpu::Viewport SquareViewport(int aColumn, int aRow, int aSize)
{
	Gpu::Viewport viewport;
	viewport.myTopLeftX = static_cast<float>(aColumn * aSize);
	viewport.myTopLeftY = static_cast<float>(aRow * aSize);
	viewport.myWidth = static_cast<float>(aSize);
	viewport.myHeight = static_cast<float>(aSize);
	return viewport;
}

Fx::Variable* FullScreenVariable(FullScreenHelper& aHelper, const char* aName)
{
	Effect* effect = aHelper.GetEffect();
	return effect != nullptr && effect->GetEffect() != nullptr ? effect->GetEffect()->GetVariableByName(aName)
	                                                           : nullptr;
}

// Draws face aFace into the centre square of the cross and its four neighbours around it.
void DrawCross(FullScreenHelper& aHelper, Fx::Variable* aScaleMatrix,
               Gpu::ShaderResourceView* const* someFaces, int aFace, int aSize, Gpu::RenderTargetView* aCross)
{
	aHelper.Process("Render", someFaces[aFace], aSize, aSize, aCross, SquareViewport(1, 1, aSize));
	const int places[SQUARE_COUNT][2] = {{2, 1}, {0, 1}, {1, 0}, {1, 2}};
	for (int square = 0; square < SQUARE_COUNT; ++square)
	{
		const Neighbour& neighbour = ourCross[aFace][square];
		const Gpu::Viewport viewport = SquareViewport(places[square][0], places[square][1], aSize);
		if (neighbour.myAngle == 0.0f)
		{
			aHelper.Process("Render", someFaces[neighbour.myFace], aSize, aSize, aCross, viewport);
			continue;
		}
		if (aScaleMatrix != nullptr)
		{
			aScaleMatrix->SetMatrix(Matrix44<float>::CreateRotateAroundZ(neighbour.myAngle).myMatrix);
		}
		aHelper.Process("RenderRotated", someFaces[neighbour.myFace], aSize, aSize, aCross, viewport);
	}
}
} // namespace

void Renderer::GenerateReflections(const GrowingArray<Room*>& someRooms, const std::string& aLevel,
                                   const std::vector<std::string>* someBakedRooms)
{
	Engine* engine = Engine::GetInstance();
	DynamicCubemap* cube = myProbeHelper ? myProbeHelper->GetReflectionCubemap() : nullptr;
	if (engine == nullptr || cube == nullptr || cube->GetTexture() == nullptr)
	{
		myBakeMonitor.End(BakeResult::FAILED, "the reflection cubemap could not be made");
		return;
	}
	const auto baked = [someBakedRooms](const Room& aRoom) {
		return someBakedRooms == nullptr || std::find(someBakedRooms->begin(), someBakedRooms->end(),
		                                              aRoom.GetID()) != someBakedRooms->end();
	};
	const int count = someRooms.Count();
	int bakedCount = 0;
	for (int index = 0; index < count; ++index)
	{
		bakedCount += baked(*someRooms[index]) ? 1 : 0;
	}
	myBakeMonitor.Begin(BakePhase::REFLECTIONS, 0, bakedCount, 0);
	Gpu::Context& context = engine->GetContext();
	DeferredRenderTargetHelper gbuffer;
	gbuffer.Init(cube->GetSize(), cube->GetSize());
	myBakingProgress = 0;
	// Each cubemap goes to a temporary beside its file; they replace the files together
	// once every room is done, so a cancelled bake leaves every file as it was.
	std::vector<std::pair<std::string, std::string>> staged;
	bool cancelledFlag = false;
	int done = 0;
	for (int index = 0; index < count && !cancelledFlag; ++index)
	{
		const Room* room = someRooms[index];
		if (!baked(*room))
		{
			continue;
		}
		// A room ID such as "../cubemap" would write over a file outside the level's folder.
		const std::string file = CubemapContainer::GetRoomFile(aLevel, room->GetID());
		if (file.empty())
		{
			ReportError(__LINE__, "Zeph::Renderer::GenerateReflections",
			            "Room %d has the ID [%s], which cannot name a cubemap file: not baked", index,
			            room->GetID().c_str());
			myBakingProgress = BakeProgress(++done, bakedCount);
			myBakeMonitor.AddRoom();
			continue;
		}
		cancelledFlag = !RenderRoomReflection(*cube, *room, gbuffer);
		if (cancelledFlag)
		{
			break;
		}
		// A file that cannot be written leaves the room with its old cubemap; the save
		// reports it, the bake goes on.
		std::string temporary;
		if (Gpu::SaveTextureToDds(context, *cube->GetTexture(), file, &temporary))
		{
			staged.emplace_back(temporary, file);
		}
		myBakingProgress = BakeProgress(++done, bakedCount);
		myBakeMonitor.AddRoom();
	}
	// A cancel that came while the last room was filtered or saved still wins: nothing is
	// replaced yet.
	cancelledFlag = cancelledFlag || myBakeMonitor.IsCancelRequested();
	for (const auto& [temporary, target] : staged)
	{
		if (cancelledFlag)
		{
			Paths::Discard(temporary);
		}
		else
		{
			Gpu::ReplaceWithStaged(temporary, target);
		}
	}
	myCollector.Reset();
	gbuffer.Destroy();
	myBakeMonitor.End(cancelledFlag ? BakeResult::CANCELLED : BakeResult::FINISHED,
	                  cancelledFlag ? "every cubemap is left as it was" : "");
}

bool Renderer::RenderRoomReflection(DynamicCubemap& aCube, const Room& aRoom,
                                    DeferredRenderTargetHelper& aGBuffer)
{
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	// The filter of the previous room drew through viewports of its own.
	context.SetViewport(aCube.GetViewport());
	for (int face = 0; face < DynamicCubemap::ourFaceCount; ++face)
	{
		if (myBakeMonitor.IsCancelRequested())
		{
			return false;
		}
		RenderProbeFace(aCube, face, aRoom.GetCenterPosition(), aGBuffer, true);
	}
	if (myBakeMonitor.IsCancelRequested())
	{
		return false;
	}
	PrefilterReflection(aCube);
	return true;
}

bool Renderer::GenerateReflectionPart(const GrowingArray<Room*>& someRooms, const std::string& aRoomID,
                                      const std::string& anOutFile)
{
	Engine* engine = Engine::GetInstance();
	DynamicCubemap* cube = myProbeHelper ? myProbeHelper->GetReflectionCubemap() : nullptr;
	const Room* room = nullptr;
	for (int index = 0; index < someRooms.Count() && room == nullptr; ++index)
	{
		room = someRooms[index]->GetID() == aRoomID ? someRooms[index] : nullptr;
	}
	if (engine == nullptr || cube == nullptr || cube->GetTexture() == nullptr || room == nullptr)
	{
		myBakeMonitor.End(BakeResult::FAILED, room == nullptr
		                                          ? "the level has no room with the ID '" + aRoomID + "'"
		                                          : std::string("the reflection cubemap could not be made"));
		return false;
	}
	myBakeMonitor.Begin(BakePhase::REFLECTIONS, 0, 1, 0);
	myBakingProgress = 0;
	DeferredRenderTargetHelper gbuffer;
	gbuffer.Init(cube->GetSize(), cube->GetSize());
	const bool renderedFlag = RenderRoomReflection(*cube, *room, gbuffer);
	const bool savedFlag =
	    renderedFlag && Gpu::SaveTextureToDds(engine->GetContext(), *cube->GetTexture(), anOutFile);
	myCollector.Reset();
	gbuffer.Destroy();
	if (renderedFlag)
	{
		myBakingProgress = 100;
		myBakeMonitor.AddRoom();
	}
	myBakeMonitor.End(!renderedFlag ? BakeResult::CANCELLED
	                  : savedFlag   ? BakeResult::FINISHED
	                                : BakeResult::FAILED,
	                  !renderedFlag ? "nothing written"
	                  : savedFlag   ? ""
	                                : "cannot write " + anOutFile);
	return savedFlag;
}

void Renderer::PrefilterReflection(DynamicCubemap& aCube)
{
	Engine* engine = Engine::GetInstance();
	Texture* cross = myProbeHelper ? myProbeHelper->GetFilterTarget() : nullptr;
	Gpu::Texture* cubeTexture = aCube.GetTexture();
	Effect* effect = myFullScreenHelper.GetEffect();
	if (engine == nullptr || cross == nullptr || cross->GetRenderTargetView() == nullptr ||
	    cubeTexture == nullptr || effect == nullptr)
	{
		return;
	}
	Gpu::Context& context = engine->GetContext();
	const int size = aCube.GetSize();
	const int crossSize = static_cast<int>(cross->GetImageInfo().myWidth);
	const int lastMip = std::min(ourLastMip, cubeTexture->GetMipLevels() - 1);
	Fx::Variable* scaleMatrix = FullScreenVariable(myFullScreenHelper, "ScaleMatrix");
	Fx::Variable* cubePower = FullScreenVariable(myFullScreenHelper, "CubePower");
	Texture* normals = engine->GetTextureContainer().GetTexture(ourCubeNormalsFile, false);

	// Mip 0 of each face as a plain 2D texture: the full-screen passes read SourceTexture as one.
	Gpu::ShaderResourceView* faces[DynamicCubemap::ourFaceCount] = {};
	for (int face = 0; face < DynamicCubemap::ourFaceCount; ++face)
	{
		Gpu::ShaderResourceDesc desc;
		desc.myDimension = Gpu::ViewDimension::Texture2D;
		desc.myFirstSlice = face;
		desc.mySliceCount = 1;
		desc.myMipCount = 1;
		faces[face] = cubeTexture->CreateShaderResourceView(desc);
	}
	// The cross halved again and again: each texel the 2 x 2 average of the level above.
	std::unique_ptr<Texture> halves[ourCrossHalvings];
	for (int level = 0; level < ourCrossHalvings; ++level)
	{
		const int halfSize = crossSize >> (level + 1);
		halves[level] = std::make_unique<Texture>(halfSize, halfSize, Dds::Format::R16G16B16A16_FLOAT);
	}

	context.ClearRenderTargetView(*cross->GetRenderTargetView(), ourBlack);
	for (int face = 0; face < DynamicCubemap::ourFaceCount; ++face)
	{
		DrawCross(myFullScreenHelper, scaleMatrix, faces, face, size, cross->GetRenderTargetView());
		for (int level = 0; level < ourCrossHalvings; ++level)
		{
			myFullScreenHelper.Process("Render", level == 0 ? cross : halves[level - 1].get(),
			                           halves[level].get());
		}
		for (int mip = 1; mip <= lastMip; ++mip)
		{
			const int mipSize = std::max(1, size >> mip);
			Texture blurred(crossSize, crossSize, Dds::Format::R16G16B16A16_FLOAT);
			Texture filtered(mipSize, mipSize, Dds::Format::R16G16B16A16_FLOAT);
			if (blurred.GetRenderTargetView() == nullptr || filtered.GetResource() == nullptr)
			{
				continue;
			}
			if (cubePower != nullptr)
			{
				cubePower->SetFloat(
				    static_cast<float>(std::pow(ourSharpestPower, (ourLastMip - mip) * 0.125)));
			}
			effect->SetShaderResource("CubeNormals",
			                          normals != nullptr ? normals->GetShaderResourceView() : nullptr);
			const int halvings = mip == 2 ? 2 : std::clamp(mip - 1, 1, ourCrossHalvings);
			Texture* source = halves[halvings - 1].get();
			const int sourceSize = static_cast<int>(source->GetImageInfo().myWidth);
			// The blurred cross at the mip's size, in the target's top-left corner; only its
			// centre face is filtered.
			myFullScreenHelper.Process("BlurCubemap", source->GetShaderResourceView(), sourceSize, sourceSize,
			                           blurred.GetRenderTargetView(), SquareViewport(0, 0, mipSize * 3));
			myFullScreenHelper.Process("RenderReflectionCross", blurred.GetShaderResourceView(), mipSize * 3,
			                           mipSize * 3, filtered.GetRenderTargetView(),
			                           SquareViewport(0, 0, mipSize));
			context.CopySubresourceRegion(*cubeTexture, mip, face, 0, 0, 0, *filtered.GetResource(), 0, 0);
		}
	}
	effect->SetShaderResource("CubeNormals", nullptr);
	for (Gpu::ShaderResourceView* view : faces)
	{
		if (view != nullptr)
		{
			cubeTexture->DestroyView(view);
		}
	}
}
} // namespace Zeph
