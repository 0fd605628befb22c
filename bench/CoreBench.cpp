// GrowingArray against std::vector for the element kinds the engine keeps (a
// light-sized record and a plain int), and the two Matrix44 operations the
// renderer runs per instance per frame.

#include <benchmark/benchmark.h>

#include <cstdint>
#include <random>
#include <vector>

#include "core/GrowingArray.h"
#include "core/Matrix44.h"

namespace
{
// 32 bytes, the shape of a point light: position, radius, colour, intensity.
struct LightRecord
{
	float myPosition[3];
	float myRadius;
	float myColor[3];
	float myIntensity;
};
static_assert(sizeof(LightRecord) == 32);

template <typename T> T MakeElement(int anIndex)
{
	if constexpr (std::is_same_v<T, int>)
	{
		return anIndex;
	}
	else
	{
		const float value = static_cast<float>(anIndex);
		return LightRecord{{value, value, value}, 1.0f, {1.0f, 1.0f, 1.0f}, value};
	}
}

float Weight(int aValue)
{
	return static_cast<float>(aValue);
}
float Weight(const LightRecord& aValue)
{
	return aValue.myIntensity;
}

// The owners' usual setting: 2000 up front, 2000 more each time it fills.
template <typename T> void GrowingArrayAdd(benchmark::State& aState)
{
	const int count = static_cast<int>(aState.range(0));
	for (auto _ : aState)
	{
		GrowingArray<T> array(2000, 2000, true);
		for (int i = 0; i < count; ++i)
		{
			array.Add(MakeElement<T>(i));
		}
		benchmark::DoNotOptimize(array.begin());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * count);
}

template <typename T> void VectorAdd(benchmark::State& aState)
{
	const int count = static_cast<int>(aState.range(0));
	for (auto _ : aState)
	{
		std::vector<T> vector;
		vector.reserve(2000);
		for (int i = 0; i < count; ++i)
		{
			vector.push_back(MakeElement<T>(i));
		}
		benchmark::DoNotOptimize(vector.data());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * count);
}

template <typename T> void GrowingArrayIterate(benchmark::State& aState)
{
	const int count = static_cast<int>(aState.range(0));
	GrowingArray<T> array(2000, 2000, true);
	for (int i = 0; i < count; ++i)
	{
		array.Add(MakeElement<T>(i));
	}
	for (auto _ : aState)
	{
		// Indexed, the way the engine walks its lists.
		float sum = 0.0f;
		for (int i = 0; i < array.Count(); ++i)
		{
			sum += Weight(array[i]);
		}
		benchmark::DoNotOptimize(sum);
	}
	aState.SetItemsProcessed(aState.iterations() * count);
}

template <typename T> void VectorIterate(benchmark::State& aState)
{
	const int count = static_cast<int>(aState.range(0));
	std::vector<T> vector;
	for (int i = 0; i < count; ++i)
	{
		vector.push_back(MakeElement<T>(i));
	}
	for (auto _ : aState)
	{
		float sum = 0.0f;
		for (std::size_t i = 0; i < vector.size(); ++i)
		{
			sum += Weight(vector[i]);
		}
		benchmark::DoNotOptimize(sum);
	}
	aState.SetItemsProcessed(aState.iterations() * count);
}

// Removal order drawn once, so both containers do the same work.
std::vector<int> RemovalIndices(int aCount)
{
	std::mt19937 generator(1234u);
	std::vector<int> indices;
	indices.reserve(static_cast<std::size_t>(aCount));
	for (int remaining = aCount; remaining > 0; --remaining)
	{
		indices.push_back(std::uniform_int_distribution<int>(0, remaining - 1)(generator));
	}
	return indices;
}

// Refilling is outside the timing; each iteration empties a full container by
// swap-with-last removals at random places.
template <typename T> void GrowingArrayRemoveCyclic(benchmark::State& aState)
{
	const int count = static_cast<int>(aState.range(0));
	const std::vector<int> indices = RemovalIndices(count);
	GrowingArray<T> array(count, 2000, true);
	for (auto _ : aState)
	{
		aState.PauseTiming();
		array.RemoveAll();
		for (int i = 0; i < count; ++i)
		{
			array.Add(MakeElement<T>(i));
		}
		aState.ResumeTiming();
		for (const int index : indices)
		{
			array.RemoveCyclicAtIndex(index);
		}
		benchmark::DoNotOptimize(array.begin());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * count);
}

template <typename T> void VectorRemoveCyclic(benchmark::State& aState)
{
	const int count = static_cast<int>(aState.range(0));
	const std::vector<int> indices = RemovalIndices(count);
	std::vector<T> vector;
	vector.reserve(static_cast<std::size_t>(count));
	for (auto _ : aState)
	{
		aState.PauseTiming();
		vector.clear();
		for (int i = 0; i < count; ++i)
		{
			vector.push_back(MakeElement<T>(i));
		}
		aState.ResumeTiming();
		for (const int index : indices)
		{
			vector[static_cast<std::size_t>(index)] = vector.back();
			vector.pop_back();
		}
		benchmark::DoNotOptimize(vector.data());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * count);
}

std::vector<Matrix44<float>> RandomTransforms(int aCount)
{
	std::mt19937 generator(42u);
	std::uniform_real_distribution<float> angle(-3.0f, 3.0f);
	std::uniform_real_distribution<float> offset(-50.0f, 50.0f);
	std::vector<Matrix44<float>> transforms;
	for (int i = 0; i < aCount; ++i)
	{
		Matrix44<float> transform = Matrix44<float>::CreateRotateAroundY(angle(generator)) *
		                            Matrix44<float>::CreateRotateAroundX(angle(generator));
		transform.SetPosition(Vector3<float>(offset(generator), offset(generator), offset(generator)));
		transforms.push_back(transform);
	}
	return transforms;
}

constexpr int ourMatrixCount = 1024;

void Matrix44Product(benchmark::State& aState)
{
	const std::vector<Matrix44<float>> transforms = RandomTransforms(ourMatrixCount);
	const Matrix44<float> viewProjection = RandomTransforms(1)[0];
	std::vector<Matrix44<float>> results(transforms.size());
	for (auto _ : aState)
	{
		for (std::size_t i = 0; i < transforms.size(); ++i)
		{
			results[i] = transforms[i] * viewProjection;
		}
		benchmark::DoNotOptimize(results.data());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * ourMatrixCount);
}

void Matrix44Inverse(benchmark::State& aState)
{
	const std::vector<Matrix44<float>> transforms = RandomTransforms(ourMatrixCount);
	std::vector<Matrix44<float>> results(transforms.size());
	for (auto _ : aState)
	{
		for (std::size_t i = 0; i < transforms.size(); ++i)
		{
			results[i] = transforms[i].Inverse();
		}
		benchmark::DoNotOptimize(results.data());
		benchmark::ClobberMemory();
	}
	aState.SetItemsProcessed(aState.iterations() * ourMatrixCount);
}
} // namespace

BENCHMARK_TEMPLATE(GrowingArrayAdd, LightRecord)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(VectorAdd, LightRecord)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(GrowingArrayAdd, int)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(VectorAdd, int)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(GrowingArrayIterate, LightRecord)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(VectorIterate, LightRecord)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(GrowingArrayIterate, int)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(VectorIterate, int)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(GrowingArrayRemoveCyclic, LightRecord)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(VectorRemoveCyclic, LightRecord)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(GrowingArrayRemoveCyclic, int)->Arg(2000)->Arg(20000);
BENCHMARK_TEMPLATE(VectorRemoveCyclic, int)->Arg(2000)->Arg(20000);
BENCHMARK(Matrix44Product);
BENCHMARK(Matrix44Inverse);
