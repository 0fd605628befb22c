// Textures through the engine's container: sharing by name, retrying missing files,
// the sRGB conversion, cube and volume files, render-target textures.

#include <filesystem>
#include <tuple>

#include "EngineFixture.h"
#include "engine/Texture.h"
#include "engine/TextureContainer.h"
#include "platform/dds/DdsFile.h"

namespace
{
// Writes a DDS file of two mips (of no particular colour).
void WriteDds(const std::string& aPath, Dds::Format aFormat, uint32_t aSize, uint32_t anArraySize,
              uint32_t aDepth, uint32_t someMisc)
{
	const auto dimension = aDepth > 1 ? Dds::ResourceDimension::Texture3D : Dds::ResourceDimension::Texture2D;
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(image.Init({aSize, aSize, aDepth, anArraySize, 2, someMisc, aFormat, dimension}, error))
	    << error;
	ASSERT_TRUE(Dds::SaveToFile(aPath, image, error)) << error;
}
} // namespace

TEST_F(EngineTest, TexturesAreSharedByNameRetriedWhenMissingAndViewedAsTheFileAndTheSrgbFlagSay)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::TextureContainer& container = Zeph::Engine::GetInstance()->GetTextureContainer();
	// Whatever the engine loaded for itself at start-up is not counted.
	const size_t baseline = container.GetCount();
	const std::string path = myScratch.File("textures/albedo.dds");
	std::filesystem::create_directories(myScratch.Path() / "textures");

	EXPECT_EQ(container.GetTexture(path, false), nullptr) << "not written yet";
	EXPECT_EQ(container.GetCount(), baseline);
	EXPECT_THAT(TakeLog(), testing::Not(testing::HasSubstr("CRITICAL ERROR")))
	    << "a missing texture is the caller's to report";

	WriteDds(path, Dds::Format::R8G8B8A8_UNORM, 16, 1, 1, 0);
	Zeph::Texture* texture = container.GetTexture(path, false);
	ASSERT_NE(texture, nullptr) << "the second request tries the file again";
	EXPECT_EQ(texture->GetImageInfo().myWidth, 16u);

	std::filesystem::remove(path);
	EXPECT_EQ(container.GetTexture(path, true), texture) << "the second request does not touch the file";
	EXPECT_EQ(texture->GetShaderResourceView()->GetFormat(), Dds::Format::R8G8B8A8_UNORM)
	    << "the sRGB flag of a later request changes nothing";
	EXPECT_EQ(container.GetCount(), baseline + 1u);

	WriteDds(path, Dds::Format::R8G8B8A8_UNORM, 8, 1, 1, 0);
	container.Clear();
	EXPECT_EQ(container.GetCount(), 0u);
	Zeph::Texture* reloaded = container.GetTexture(path, false);
	ASSERT_NE(reloaded, nullptr);
	EXPECT_EQ(reloaded->GetImageInfo().myWidth, 8u) << "cleared: the file is read again";

	TestSupport::WriteWholeFile(myScratch.File("textures/broken.dds"), "DDS |not really");
	EXPECT_EQ(container.GetTexture(myScratch.File("textures/broken.dds"), false), nullptr);

	Zeph::TextureContainer ddsOnly({".dds", ".DDS"});
	EXPECT_EQ(ddsOnly.GetTexture(myScratch.File("textures/albedo.png"), false), nullptr);
	EXPECT_THAT(TakeLog(), testing::HasSubstr("Not a texture file this container takes"));
	EXPECT_NE(ddsOnly.GetTexture(path, false), nullptr);

	const struct
	{
		const char* name;
		Dds::Format fileFormat;
		uint32_t arraySize;
		uint32_t depth;
		uint32_t misc;
		bool srgb;
		Dds::Format viewFormat;
		GLenum viewTarget;
		bool reported;
	} cases[] = {
	    {"srgb.dds", Dds::Format::R8G8B8A8_UNORM, 1, 1, 0, true, Dds::Format::R8G8B8A8_UNORM_SRGB,
	     GL_TEXTURE_2D, false},
	    {"bc1.dds", Dds::Format::BC1_UNORM, 1, 1, 0, true, Dds::Format::BC1_UNORM_SRGB, GL_TEXTURE_2D, false},
	    {"float.dds", Dds::Format::R16G16B16A16_FLOAT, 1, 1, 0, true, Dds::Format::R16G16B16A16_FLOAT,
	     GL_TEXTURE_2D, false},
	    {"cube.dds", Dds::Format::R8G8B8A8_UNORM, 6, 1, Dds::MiscTextureCube, false,
	     Dds::Format::R8G8B8A8_UNORM, GL_TEXTURE_CUBE_MAP, false},
	    // Only 2D files are converted, but the flag is not dropped: the volume is viewed as sRGB.
	    {"volume.dds", Dds::Format::R8G8B8A8_UNORM, 1, 4, 0, true, Dds::Format::R8G8B8A8_UNORM_SRGB,
	     GL_TEXTURE_3D, true},
	};
	for (const auto& test : cases)
	{
		SCOPED_TRACE(test.name);
		const std::string path = myScratch.File(test.name);
		WriteDds(path, test.fileFormat, 16, test.arraySize, test.depth, test.misc);
		Zeph::Texture* texture = container.GetTexture(path, test.srgb);
		ASSERT_NE(texture, nullptr) << TakeLog();
		ASSERT_NE(texture->GetShaderResourceView(), nullptr);
		EXPECT_EQ(texture->GetShaderResourceView()->GetFormat(), test.viewFormat);
		EXPECT_EQ(texture->GetShaderResourceView()->GetTarget(), test.viewTarget);
		EXPECT_EQ(texture->GetImageInfo().myFormat, test.fileFormat) << "the image information is the file's";
		EXPECT_EQ(texture->GetImageInfo().myArraySize, test.arraySize);
		EXPECT_EQ(texture->GetRenderTargetView(), nullptr);
		const std::string log = TakeLog();
		EXPECT_EQ(log.find("INVALID TEXTURE FORMAT") != std::string::npos, test.reported) << log;
		EXPECT_EQ(log.find("Zeph::Texture::BindTextureToView") != std::string::npos, test.reported) << log;
	}

	// Render-target textures have both views; one that cannot be made has neither, and says so.
	Zeph::Texture target(96, 48, Dds::Format::R16G16B16A16_FLOAT);
	ASSERT_NE(target.GetRenderTargetView(), nullptr);
	ASSERT_NE(target.GetShaderResourceView(), nullptr);
	EXPECT_EQ(std::tuple(target.GetRenderTargetView()->GetWidth(),
	                     target.GetShaderResourceView()->GetFormat(), target.GetImageInfo().myHeight),
	          std::tuple(96, Dds::Format::R16G16B16A16_FLOAT, 48u));

	Zeph::Texture broken(0, 48, Dds::Format::R8G8B8A8_UNORM);
	EXPECT_EQ(broken.GetRenderTargetView(), nullptr);
	EXPECT_EQ(broken.GetShaderResourceView(), nullptr);
	EXPECT_THAT(TakeLog(), testing::AllOf(testing::HasSubstr("Couldn't Create Texture2D"),
	                                      testing::HasSubstr("Zeph::Texture::Texture")));
}
