// Reading the engine's binary model files (".al"): a lit model (vertex type 4) of
// 100,000 triangles, read from disk through FI_File and parsed, and parsed alone
// from memory. Beside it the same grid as a COLLADA document, loaded and converted
// into a model tree, and the ratio of the two import times measured in one run.
// The GPU side of a load (buffers, textures) is not part of either.

#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "engine/FI_File.h"
#include "model/AlFile.h"
#include "model/ColladaImport.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "platform/collada/Document.h"

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

// The same grid as a COLLADA document: position, normal, uv, texture tangent and
// binormal all read through <vertices>, one index per corner (vertex type 4).
std::string MakeColladaDocument()
{
	constexpr int quads = ourTriangles / 2;
	constexpr int columns = 250;
	constexpr int rows = quads / columns;
	constexpr int vertexCount = (columns + 1) * (rows + 1);
	std::string positions;
	std::string uvs;
	for (int row = 0; row <= rows; ++row)
	{
		for (int column = 0; column <= columns; ++column)
		{
			positions += std::to_string(column) + " " + std::to_string(row) + " 0 ";
			uvs += std::to_string(static_cast<float>(column) / columns) + " " +
			       std::to_string(static_cast<float>(row) / rows) + " ";
		}
	}
	std::string constant;
	for (int vertex = 0; vertex < vertexCount; ++vertex)
	{
		constant += "0 0 -1 ";
	}
	const auto source = [&](const std::string& anId, int aStride, const std::string& someValues) {
		const std::string count = std::to_string(vertexCount * aStride);
		return "<source id=\"" + anId + "\"><float_array id=\"" + anId + "-a\" count=\"" + count + "\">" +
		       someValues + "</float_array><technique_common><accessor source=\"#" + anId + "-a\" count=\"" +
		       std::to_string(vertexCount) + "\" stride=\"" + std::to_string(aStride) +
		       "\"/></technique_common></source>";
	};
	std::string indices;
	indices.reserve(static_cast<size_t>(ourTriangles) * 3 * 7);
	for (int row = 0; row < rows; ++row)
	{
		for (int column = 0; column < columns; ++column)
		{
			const int corner = row * (columns + 1) + column;
			const int above = corner + columns + 1;
			for (int index : {corner, above + 1, above, corner, corner + 1, above + 1})
			{
				indices += std::to_string(index);
				indices += ' ';
			}
		}
	}
	return "<COLLADA version=\"1.4.1\"><library_geometries><geometry id=\"grid\"><mesh>" +
	       source("p", 3, positions) + source("n", 3, constant) + source("t", 2, uvs) +
	       source("tt", 3, constant) + source("tb", 3, constant) +
	       "<vertices id=\"v\"><input semantic=\"POSITION\" source=\"#p\"/><input semantic=\"NORMAL\" "
	       "source=\"#n\"/><input semantic=\"TEXCOORD\" source=\"#t\"/><input semantic=\"TEXTANGENT\" "
	       "source=\"#tt\"/><input semantic=\"TEXBINORMAL\" source=\"#tb\"/></vertices><triangles count=\"" +
	       std::to_string(ourTriangles) + "\"><input semantic=\"VERTEX\" source=\"#v\" offset=\"0\"/><p>" +
	       indices +
	       "</p></triangles></mesh></geometry></library_geometries><library_visual_scenes><visual_scene "
	       "id=\"s\"><node id=\"grid-node\"><instance_geometry url=\"#grid\"/></node></visual_scene>"
	       "</library_visual_scenes><scene><instance_visual_scene url=\"#s\"/></scene></COLLADA>";
}

std::string WriteTemporary(const std::string& aName, const void* someBytes, size_t aSize)
{
	const std::string path = (std::filesystem::temp_directory_path() / aName).string();
	std::ofstream out(path, std::ios::binary);
	out.write(static_cast<const char*>(someBytes), static_cast<std::streamsize>(aSize));
	return path;
}

// One COLLADA import: the document read from disk and converted into a tree.
bool ImportCollada(const std::string& aPath)
{
	Collada::Document document;
	std::string error;
	if (!document.Load(aPath, error))
	{
		return false;
	}
	std::vector<Zeph::AlTextureBinding> bindings;
	std::unique_ptr<Zeph::ModelNode> tree = Zeph::ColladaImport::Convert(document, bindings, error);
	benchmark::DoNotOptimize(tree.get());
	return tree != nullptr && tree->GetChildren().Count() == 1 &&
	       tree->GetChildren()[0]->GetModel()->GetIndexCount() == ourTriangles * 3;
}

// One ".al" import: the file read through FI_File and parsed.
bool ImportAl(const std::string& aPath)
{
	FI_File file;
	if (!file.Open(aPath, FI_File::FileFlags::READ | FI_File::FileFlags::BINARY))
	{
		return false;
	}
	std::vector<uint8_t> bytes(static_cast<size_t>(file.GetFileSize()));
	file.ReadData(bytes.data(), static_cast<int>(bytes.size()));
	file.Close();
	std::vector<Zeph::AlTextureBinding> bindings;
	std::string error;
	std::unique_ptr<Zeph::ModelNode> tree = Zeph::AlFile::Parse(bytes, bindings, error);
	benchmark::DoNotOptimize(tree.get());
	return tree != nullptr;
}

// The COLLADA import of the 100,000-triangle grid: the time is per 100,000 triangles.
void BM_ColladaImportFromDisk(benchmark::State& aState)
{
	const std::string text = MakeColladaDocument();
	const std::string path = WriteTemporary("lumora-bench-model.dae", text.data(), text.size());
	for (auto _ : aState)
	{
		if (!ImportCollada(path))
		{
			aState.SkipWithError("the COLLADA grid did not import");
			break;
		}
	}
	aState.counters["bytes"] = static_cast<double>(text.size());
	aState.counters["triangles"] = ourTriangles;
	std::filesystem::remove(path);
}
BENCHMARK(BM_ColladaImportFromDisk)->Unit(benchmark::kMillisecond);

// Both imports of the same grid, alternated within one run: the counters give each
// time per 100,000 triangles and how many times slower the COLLADA import is.
void BM_ColladaToAlImportRatio(benchmark::State& aState)
{
	const std::string text = MakeColladaDocument();
	const std::vector<uint8_t> image = MakeFileImage();
	const std::string colladaPath = WriteTemporary("lumora-bench-ratio.dae", text.data(), text.size());
	const std::string alPath = WriteTemporary("lumora-bench-ratio.al", image.data(), image.size());
	using Clock = std::chrono::steady_clock;
	double colladaSeconds = 0.0;
	double alSeconds = 0.0;
	for (auto _ : aState)
	{
		const Clock::time_point start = Clock::now();
		const bool colladaFlag = ImportCollada(colladaPath);
		const Clock::time_point middle = Clock::now();
		const bool alFlag = ImportAl(alPath);
		const Clock::time_point end = Clock::now();
		if (!colladaFlag || !alFlag)
		{
			aState.SkipWithError("an import failed");
			break;
		}
		colladaSeconds += std::chrono::duration<double>(middle - start).count();
		alSeconds += std::chrono::duration<double>(end - middle).count();
	}
	const double iterations = static_cast<double>(aState.iterations());
	if (iterations > 0.0 && alSeconds > 0.0)
	{
		aState.counters["collada_ms_per_100k_tris"] = colladaSeconds * 1000.0 / iterations;
		aState.counters["al_ms_per_100k_tris"] = alSeconds * 1000.0 / iterations;
		aState.counters["collada_over_al"] = colladaSeconds / alSeconds;
	}
	std::filesystem::remove(colladaPath);
	std::filesystem::remove(alPath);
}
BENCHMARK(BM_ColladaToAlImportRatio)->Unit(benchmark::kMillisecond);

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
