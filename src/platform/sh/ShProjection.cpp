#include "platform/sh/ShProjection.h"

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <numbers>
#include <unordered_map>
#include <vector>

#include "platform/gpu/Formats.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"

namespace Sh
{
namespace
{
constexpr int ourFaceCount = 6;
constexpr int ourMaxFaceWidth = 16384; // Direct3D 11's largest cube
constexpr int ourCachedWidthLimit = 128;
// Columns summed side by side: the inner loops run over a fixed count the compiler turns into vector
// instructions, and the lanes are added together once per cube, in a fixed order.
constexpr int ourLanes = 8;

template <typename Real> std::array<Real, ourCoefficientCount> Basis(Real anX, Real aY, Real aZ)
{
	return {Real(0.282094791773878140),
	        Real(-0.488602511902919920) * aY,
	        Real(0.488602511902919920) * aZ,
	        Real(-0.488602511902919920) * anX,
	        Real(0.546274215296039590) * 2 * anX * aY,
	        Real(-1.092548430592079200) * aY * aZ,
	        Real(0.946174695757560080) * aZ * aZ - Real(0.315391565252520050),
	        Real(-1.092548430592079200) * anX * aZ,
	        Real(0.546274215296039590) * (anX * anX - aY * aY)};
}

// The face coordinates (a, b) of a texel centre, and the direction through it before normalising.
double FaceCoordinate(int anIndex, int aWidth)
{
	return -1.0 + (2.0 * anIndex + 1.0) / aWidth;
}

std::array<double, 3> FaceDirection(int aFace, double anA, double aB)
{
	switch (aFace)
	{
	case 0:
		return {1.0, -aB, -anA};
	case 1:
		return {-1.0, -aB, anA};
	case 2:
		return {anA, 1.0, aB};
	case 3:
		return {anA, -1.0, -aB};
	case 4:
		return {anA, -aB, 1.0};
	default:
		return {-anA, -aB, -1.0};
	}
}

int PaddedWidth(int aWidth)
{
	return (aWidth + ourLanes - 1) / ourLanes * ourLanes;
}

size_t FaceTableSize(int aWidth)
{
	return static_cast<size_t>(aWidth) * ourCoefficientCount * static_cast<size_t>(PaddedWidth(aWidth));
}

// Solid angle of a texel at (a, b), up to the constant texel area that the normalisation removes.
double TexelWeight(double anA, double aB)
{
	const double lengthSquared = 1.0 + anA * anA + aB * aB;
	return 4.0 / (lengthSquared * std::sqrt(lengthSquared));
}

// 4 pi over the sum of the weights of all six faces (every face has the same weights).
double WeightScale(int aWidth)
{
	double faceSum = 0.0;
	for (int row = 0; row < aWidth; ++row)
	{
		for (int column = 0; column < aWidth; ++column)
		{
			faceSum += TexelWeight(FaceCoordinate(column, aWidth), FaceCoordinate(row, aWidth));
		}
	}
	return 4.0 * std::numbers::pi / (ourFaceCount * faceSum);
}

// Weight x basis x scale for one face, laid out [row][coefficient][column], rows padded with zeros to
// a whole number of lanes.
void BuildFaceTable(int aFace, int aWidth, double aScale, float* someValues)
{
	const int padded = PaddedWidth(aWidth);
	for (int row = 0; row < aWidth; ++row)
	{
		float* rowValues = someValues + static_cast<size_t>(row) * ourCoefficientCount * padded;
		const double b = FaceCoordinate(row, aWidth);
		for (int column = 0; column < padded; ++column)
		{
			if (column >= aWidth)
			{
				for (int k = 0; k < ourCoefficientCount; ++k)
				{
					rowValues[k * padded + column] = 0.0f;
				}
				continue;
			}
			const double a = FaceCoordinate(column, aWidth);
			const std::array<double, 3> direction = FaceDirection(aFace, a, b);
			const double inverseLength = 1.0 / std::sqrt(1.0 + a * a + b * b);
			const std::array<double, ourCoefficientCount> basis = Basis(
			    direction[0] * inverseLength, direction[1] * inverseLength, direction[2] * inverseLength);
			const double weight = TexelWeight(a, b) * aScale;
			for (int k = 0; k < ourCoefficientCount; ++k)
			{
				rowValues[k * padded + column] = static_cast<float>(weight * basis[k]);
			}
		}
	}
}

using Table = std::vector<float>; // six face tables one after another

std::shared_ptr<const Table> BuildTable(int aWidth)
{
	auto table = std::make_shared<Table>(FaceTableSize(aWidth) * ourFaceCount);
	const double scale = WeightScale(aWidth);
	for (int face = 0; face < ourFaceCount; ++face)
	{
		BuildFaceTable(face, aWidth, scale, table->data() + FaceTableSize(aWidth) * face);
	}
	return table;
}

// The kept table of a width up to ourCachedWidthLimit; null above it.
std::shared_ptr<const Table> CachedTable(int aWidth)
{
	if (aWidth > ourCachedWidthLimit)
	{
		return nullptr;
	}
	static std::mutex ourMutex;
	static std::unordered_map<int, std::shared_ptr<const Table>> ourTables;
	const std::lock_guard lock(ourMutex);
	std::shared_ptr<const Table>& table = ourTables[aWidth];
	if (!table)
	{
		table = BuildTable(aWidth);
	}
	return table;
}

// Sums colour x table over the texels of cubes of one width, face by face.
class Accumulator
{
public:
	Accumulator(int aWidth, int aChannelCount)
	    : myWidth(aWidth), myPadded(PaddedWidth(aWidth)), myChannelCount(aChannelCount),
	      myColors(static_cast<size_t>(myPadded) * 3, 0.0f)
	{
	}

	void Clear()
	{
		for (auto& channel : myLanes)
		{
			for (auto& coefficient : channel)
			{
				coefficient.fill(0.0f);
			}
		}
	}

	// Adds a face whose row r starts at someTexels + r * aRowStride.
	void AddFace(const float* aFaceTable, const float* someTexels, size_t aRowStride)
	{
		float* const red = myColors.data();
		float* const green = red + myPadded;
		float* const blue = green + myPadded;
		for (int row = 0; row < myWidth; ++row)
		{
			const float* texel = someTexels + static_cast<size_t>(row) * aRowStride;
			for (int column = 0; column < myWidth; ++column, texel += myChannelCount)
			{
				red[column] = texel[0];
				green[column] = texel[1];
				blue[column] = texel[2];
			}
			const float* rowTable = aFaceTable + static_cast<size_t>(row) * ourCoefficientCount * myPadded;
			for (int first = 0; first < myPadded; first += ourLanes)
			{
				for (int k = 0; k < ourCoefficientCount; ++k)
				{
					const float* weights = rowTable + k * myPadded + first;
					for (int lane = 0; lane < ourLanes; ++lane)
					{
						myLanes[0][k][lane] += red[first + lane] * weights[lane];
						myLanes[1][k][lane] += green[first + lane] * weights[lane];
						myLanes[2][k][lane] += blue[first + lane] * weights[lane];
					}
				}
			}
		}
	}

	void Write(float* anROut, float* aGOut, float* aBOut) const
	{
		float* const outputs[3] = {anROut, aGOut, aBOut};
		for (int channel = 0; channel < 3; ++channel)
		{
			for (int k = 0; k < ourCoefficientCount; ++k)
			{
				float sum = 0.0f;
				for (const float lane : myLanes[channel][k])
				{
					sum += lane;
				}
				outputs[channel][k] = sum;
			}
		}
	}

private:
	int myWidth;
	int myPadded;
	int myChannelCount;
	std::vector<float> myColors; // one row deinterleaved: red, green, blue, each padded with zeros
	alignas(32) std::array<std::array<std::array<float, ourLanes>, ourCoefficientCount>, 3> myLanes{};
};

// Projects one cube whose face f row r starts at aFaceAt(f) + r * aRowStride.
template <typename FaceAt>
void ProjectOne(const Table* aTable, int aWidth, size_t aRowStride, FaceAt aFaceAt,
                Accumulator& anAccumulator, float* anROut, float* aGOut, float* aBOut)
{
	anAccumulator.Clear();
	if (aTable != nullptr)
	{
		for (int face = 0; face < ourFaceCount; ++face)
		{
			anAccumulator.AddFace(aTable->data() + FaceTableSize(aWidth) * face, aFaceAt(face), aRowStride);
		}
	}
	else
	{
		// Too wide to keep: one face's table at a time.
		std::vector<float> faceTable(FaceTableSize(aWidth));
		const double scale = WeightScale(aWidth);
		for (int face = 0; face < ourFaceCount; ++face)
		{
			BuildFaceTable(face, aWidth, scale, faceTable.data());
			anAccumulator.AddFace(faceTable.data(), aFaceAt(face), aRowStride);
		}
	}
	anAccumulator.Write(anROut, aGOut, aBOut);
}

// What ProjectCubeMap and the texture atlas accept: floats with red, green and blue.
bool IsProjectableFormat(Dds::Format aFormat)
{
	const Gpu::FormatInfo info = Gpu::GetFormatInfo(aFormat);
	return info.myFloatFlag && (info.myUploadFormat == GL_RGBA || info.myUploadFormat == GL_RGB);
}
} // namespace

std::array<float, ourCoefficientCount> EvaluateBasis(float anX, float aY, float aZ)
{
	return Basis(anX, aY, aZ);
}

std::array<float, 3> TexelDirection(int aFace, int aColumn, int aRow, int aWidth)
{
	const double a = FaceCoordinate(aColumn, aWidth);
	const double b = FaceCoordinate(aRow, aWidth);
	const std::array<double, 3> direction = FaceDirection(aFace, a, b);
	const double inverseLength = 1.0 / std::sqrt(1.0 + a * a + b * b);
	return {static_cast<float>(direction[0] * inverseLength),
	        static_cast<float>(direction[1] * inverseLength),
	        static_cast<float>(direction[2] * inverseLength)};
}

bool ProjectCubeTexels(const float* someTexels, int aWidth, int aChannelCount, float* anROut, float* aGOut,
                       float* aBOut)
{
	if (someTexels == nullptr || anROut == nullptr || aGOut == nullptr || aBOut == nullptr || aWidth < 1 ||
	    aWidth > ourMaxFaceWidth || (aChannelCount != 3 && aChannelCount != 4))
	{
		Gpu::ReportError(__LINE__, "Sh::ProjectCubeTexels",
		                 "Cannot project: face width %d, %d channels, texels %s, outputs %s", aWidth,
		                 aChannelCount, someTexels == nullptr ? "missing" : "given",
		                 anROut == nullptr || aGOut == nullptr || aBOut == nullptr ? "missing" : "given");
		return false;
	}
	const std::shared_ptr<const Table> table = CachedTable(aWidth);
	const size_t rowStride = static_cast<size_t>(aWidth) * static_cast<size_t>(aChannelCount);
	const size_t faceStride = rowStride * static_cast<size_t>(aWidth);
	Accumulator accumulator(aWidth, aChannelCount);
	ProjectOne(
	    table.get(), aWidth, rowStride,
	    [&](int aFace) { return someTexels + faceStride * static_cast<size_t>(aFace); }, accumulator, anROut,
	    aGOut, aBOut);
	return true;
}

bool ProjectCubeAtlas(const float* someTexels, int anAtlasWidth, int anAtlasHeight, int aChannelCount,
                      int aFaceWidth, int aCubeCount, float* someCoefficientsOut)
{
	const char* function = "Sh::ProjectCubeAtlas";
	if (someTexels == nullptr || someCoefficientsOut == nullptr || aFaceWidth < 1 ||
	    aFaceWidth > ourMaxFaceWidth || aCubeCount < 0 || (aChannelCount != 3 && aChannelCount != 4))
	{
		Gpu::ReportError(__LINE__, function,
		                 "Cannot project: face width %d, %d cubes, %d channels, texels %s, output %s",
		                 aFaceWidth, aCubeCount, aChannelCount, someTexels == nullptr ? "missing" : "given",
		                 someCoefficientsOut == nullptr ? "missing" : "given");
		return false;
	}
	const int64_t perRow = anAtlasWidth / aFaceWidth;
	const int64_t tiles = static_cast<int64_t>(aCubeCount) * ourFaceCount;
	const int64_t tileRows = perRow > 0 ? (tiles + perRow - 1) / perRow : 0;
	if (perRow < 1 || anAtlasHeight < 0 || tileRows * aFaceWidth > anAtlasHeight)
	{
		Gpu::ReportError(__LINE__, function, "A %dx%d atlas cannot hold %d cubes of %d-texel faces",
		                 anAtlasWidth, anAtlasHeight, aCubeCount, aFaceWidth);
		return false;
	}
	if (aCubeCount == 0)
	{
		return true;
	}
	const std::shared_ptr<const Table> table = CachedTable(aFaceWidth);
	const size_t rowStride = static_cast<size_t>(anAtlasWidth) * static_cast<size_t>(aChannelCount);
	Accumulator accumulator(aFaceWidth, aChannelCount);
	for (int64_t cube = 0; cube < aCubeCount; ++cube)
	{
		auto faceAt = [&](int aFace) {
			const int64_t tile = cube * ourFaceCount + aFace;
			const size_t column = static_cast<size_t>(tile % perRow) * static_cast<size_t>(aFaceWidth);
			const size_t row = static_cast<size_t>(tile / perRow) * static_cast<size_t>(aFaceWidth);
			return someTexels + row * rowStride + column * static_cast<size_t>(aChannelCount);
		};
		float* const out = someCoefficientsOut + cube * ourCubeCoefficientCount;
		ProjectOne(table.get(), aFaceWidth, rowStride, faceAt, accumulator, out, out + ourCoefficientCount,
		           out + 2 * ourCoefficientCount);
	}
	return true;
}

bool ProjectCubeMap(Gpu::Context& aContext, int anOrder, const Gpu::Texture& aCube, float* anROut,
                    float* aGOut, float* aBOut)
{
	const char* function = "Sh::ProjectCubeMap";
	if (anOrder != 3)
	{
		Gpu::ReportError(__LINE__, function, "Order %d is not supported (only 3)", anOrder);
		return false;
	}
	if (anROut == nullptr || aGOut == nullptr || aBOut == nullptr || !aCube.IsInitialized() ||
	    &aCube.GetContext() != &aContext)
	{
		Gpu::ReportError(__LINE__, function, "Cannot project: %s",
		                 !aCube.IsInitialized()             ? "the texture is not initialised"
		                 : &aCube.GetContext() != &aContext ? "the texture belongs to another context"
		                                                    : "an output is missing");
		return false;
	}
	const Gpu::TextureDesc& desc = aCube.GetDesc();
	if (desc.myKind != Gpu::TextureKind::TextureCube || desc.myArraySize != 6 ||
	    !IsProjectableFormat(desc.myFormat))
	{
		Gpu::ReportError(__LINE__, function,
		                 "Texture '%s' is not a single float cube with red, green and blue (%d slices, "
		                 "format %u)",
		                 desc.myLabel.c_str(), desc.myArraySize, static_cast<unsigned>(desc.myFormat));
		return false;
	}
	std::vector<float> texels;
	if (!Gpu::ReadTexture(aCube, 0, 0, ourFaceCount, texels))
	{
		return false;
	}
	return ProjectCubeTexels(texels.data(), aCube.GetMipWidth(0), 4, anROut, aGOut, aBOut);
}

bool ProjectCubeAtlas(Gpu::Context& aContext, const Gpu::Texture& anAtlas, int aFaceWidth, int aCubeCount,
                      float* someCoefficientsOut)
{
	const char* function = "Sh::ProjectCubeAtlas";
	if (!anAtlas.IsInitialized() || &anAtlas.GetContext() != &aContext)
	{
		Gpu::ReportError(__LINE__, function, "Cannot project: %s",
		                 !anAtlas.IsInitialized() ? "the atlas is not initialised"
		                                          : "the atlas belongs to another context");
		return false;
	}
	const Gpu::TextureDesc& desc = anAtlas.GetDesc();
	if (desc.myKind != Gpu::TextureKind::Texture2D || !IsProjectableFormat(desc.myFormat))
	{
		Gpu::ReportError(__LINE__, function,
		                 "Atlas '%s' is not a 2D float texture with red, green and blue "
		                 "(format %u)",
		                 desc.myLabel.c_str(), static_cast<unsigned>(desc.myFormat));
		return false;
	}
	std::vector<float> texels;
	if (!Gpu::ReadTexture(anAtlas, 0, 0, 1, texels))
	{
		return false;
	}
	return ProjectCubeAtlas(texels.data(), anAtlas.GetMipWidth(0), anAtlas.GetMipHeight(0), 4, aFaceWidth,
	                        aCubeCount, someCoefficientsOut);
}
} // namespace Sh
