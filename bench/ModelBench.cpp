// Reading the engine's binary model files (".al"): a lit model (vertex type 4) of
// 100,000 triangles, read from disk through FI_File and parsed, and parsed alone
// from memory. The GPU side of a load (buffers, textures) is not part of this.

#include <benchmark/benchmark.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "engine/FI_File.h"
#include "model/AlFile.h"
#include "model/Model.h"
#include "model/ModelNode.h"

namespace
{
constexpr int ourTriangles = 100000;

// A grid of quads: 50,000 quads, two triangles each, 56-byte vertices.
std::vector<uint8_t> MakeFileImage()
{
	constexpr int quads = ourTriangles / 2;
	constexpr int columns = 250;
	constexpr int rows = quads / columns;
	constexpr int stride = 56;
	const int vertexCount = (columns + 1) * (rows + 1);
	std::vector<float> vertices(static_cast<size_t>(vertexCount) * stride / 4, 0.0f);
	for (int row = 0; row <= rows; ++row)
	{
		for (int column = 0; column <= columns; ++column)
		{
			float* vertex = vertices.data() + static_cast<size_t>(row * (columns + 1) + column) * stride / 4;
			vertex[0] = static_cast<float>(column);
			vertex[1] = static_cast<float>(row);
			vertex[5] = -1.0f;
		}
	}
	std::vector<uint32_t> indices;
	indices.reserve(static_cast<size_t>(ourTriangles) * 3);
	for (int row = 0; row < rows; ++row)
	{
		for (int column = 0; column < columns; ++column)
		{
			const uint32_t corner = static_cast<uint32_t>(row * (columns + 1) + column);
			const uint32_t above = corner + columns + 1;
			indices.insert(indices.end(), {corner, above, above + 1, corner, above + 1, corner + 1});
		}
	}
	Zeph::ModelNode root;
	auto* model = new Zeph::Model();
	model->SetVertexType(4);
	model->SetVertexData(vertexCount, stride, vertices.data(), static_cast<int>(vertices.size() * 4));
	model->SetIndexData(static_cast<int>(indices.size()), Zeph::Model::ourIndexFormatR32, indices.data(),
	                    static_cast<int>(indices.size() * 4));
	Zeph::Surface surface;
	surface.SetIndexCount(static_cast<int>(indices.size()));
	model->GetSurfaces().Add(surface);
	root.SetModel(model);
	std::vector<uint8_t> bytes;
	Zeph::AlFile::Encode(root, bytes);
	return bytes;
}

void BM_AlReadFromDisk(benchmark::State& aState)
{
	const std::vector<uint8_t> image = MakeFileImage();
	const std::string path = (std::filesystem::temp_directory_path() / "lumora-bench-model.al").string();
	{
		std::ofstream out(path, std::ios::binary);
		out.write(reinterpret_cast<const char*>(image.data()), static_cast<std::streamsize>(image.size()));
	}
	for (auto _ : aState)
	{
		FI_File file;
		if (!file.Open(path, FI_File::FileFlags::READ | FI_File::FileFlags::BINARY))
		{
			aState.SkipWithError("cannot open the model file");
			break;
		}
		std::vector<uint8_t> bytes(static_cast<size_t>(file.GetFileSize()));
		file.ReadData(bytes.data(), static_cast<int>(bytes.size()));
		file.Close();
		std::vector<Zeph::AlTextureBinding> bindings;
		std::string error;
		std::unique_ptr<Zeph::ModelNode> tree = Zeph::AlFile::Parse(bytes, bindings, error);
		benchmark::DoNotOptimize(tree.get());
	}
	aState.counters["bytes"] = static_cast<double>(image.size());
	aState.counters["triangles"] = ourTriangles;
	std::filesystem::remove(path);
}
BENCHMARK(BM_AlReadFromDisk)->Unit(benchmark::kMillisecond);

void BM_AlParse(benchmark::State& aState)
{
	const std::vector<uint8_t> image = MakeFileImage();
	for (auto _ : aState)
	{
		std::vector<Zeph::AlTextureBinding> bindings;
		std::string error;
		std::unique_ptr<Zeph::ModelNode> tree = Zeph::AlFile::Parse(image, bindings, error);
		benchmark::DoNotOptimize(tree.get());
	}
	aState.SetBytesProcessed(static_cast<int64_t>(aState.iterations()) * static_cast<int64_t>(image.size()));
}
BENCHMARK(BM_AlParse)->Unit(benchmark::kMillisecond);
} // namespace
