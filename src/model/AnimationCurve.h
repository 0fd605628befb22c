#pragma once
// AnimationCurve: one animated value as keys of (time, value), evaluated at a time.
//
//   Zeph::AnimationCurve curve;
//   curve.AddKey(0.0, 1.0);
//   curve.AddKey(2.0, 3.0);
//   double value = curve.Evaluate(1.0);   // 2.0
//
// Model files store a curve as two numbers of the animation layers (kept and
// written back unchanged), then the keys. Files hold only the time and the value of
// a key, no tangents or interpolation kind, so the curve interpolates linearly
// between keys and holds the first and the last value outside them.
#include <cstddef>
#include <vector>

namespace Zeph
{
struct AnimationKey
{
	double myTime = 0.0;
	double myValue = 0.0;
};

class AnimationCurve
{
public:
	// At most this many keys: model files count them in 16 bits.
	static constexpr int ourMaxKeyCount = 65535;

	// Keys are kept in the order added; Evaluate expects rising times, as files store them.
	void AddKey(double aTime, double aValue) { myKeys.push_back({aTime, aValue}); }
	const std::vector<AnimationKey>& GetKeys() const { return myKeys; }
	void ReserveKeys(int aCount) { myKeys.reserve(static_cast<size_t>(aCount)); }

	// 0 for a curve without keys.
	double Evaluate(double aTime) const;

	void SetParameters(double aFirst, double aSecond)
	{
		myFirstParameter = aFirst;
		mySecondParameter = aSecond;
	}
	double GetFirstParameter() const { return myFirstParameter; }
	double GetSecondParameter() const { return mySecondParameter; }

private:
	double myFirstParameter = 0.0;
	double mySecondParameter = 0.0;
	std::vector<AnimationKey> myKeys;
};
} // namespace Zeph
