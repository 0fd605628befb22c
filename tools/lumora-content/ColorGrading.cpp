#include "ColorGrading.h"

#include <algorithm>
#include <array>
#include <cmath>

#include "platform/dds/Format.h"

namespace Content
{
namespace
{
using Color = std::array<double, 3>;

double SmoothStep(double anEdge0, double anEdge1, double aValue)
{
	const double t = std::clamp((aValue - anEdge0) / (anEdge1 - anEdge0), 0.0, 1.0);
	return t * t * (3.0 - 2.0 * t);
}

// Works on the encoded values, which is where a colourist's curves live. Every step keeps each
// channel growing with its own input: the lift is affine, the saturation weight of a channel's own
// value stays positive, and the highlight gains change slowly compared with the values they scale.
Color Warm(const Color& aColor)
{
	constexpr Color lift = {0.035, 0.028, 0.022};
	constexpr double saturation = 1.12;
	constexpr Color highlightGain = {0.05, 0.015, -0.06};
	Color color;
	for (size_t channel = 0; channel < 3; ++channel)
	{
		color[channel] = lift[channel] + aColor[channel] * (1.0 - lift[channel]);
	}
	const double luma = 0.2126 * color[0] + 0.7152 * color[1] + 0.0722 * color[2];
	const double highlight = SmoothStep(0.45, 1.0, luma);
	for (size_t channel = 0; channel < 3; ++channel)
	{
		const double saturated = luma + (color[channel] - luma) * saturation;
		color[channel] = saturated * (1.0 + highlightGain[channel] * highlight);
	}
	return color;
}

uint8_t ToByte(double aValue)
{
	return static_cast<uint8_t>(std::lround(std::clamp(aValue, 0.0, 1.0) * 255.0));
}
} // namespace

const char* GradingFileName(GradingKind aKind)
{
	switch (aKind)
	{
	case GradingKind::Neutral:
		return "default.dds";
	case GradingKind::Warm:
		return "warm.dds";
	}
	return "unknown.dds";
}

bool BuildGradingLookup(GradingKind aKind, Dds::Image& anImageOut, std::string& anErrorOut)
{
	Dds::ImageInfo info;
	info.myWidth = ourGradingSize;
	info.myHeight = ourGradingSize;
	info.myDepth = ourGradingSize;
	info.myResourceDimension = Dds::ResourceDimension::Texture3D;
	info.myFormat = Dds::Format::R8G8B8A8_UNORM;
	if (!anImageOut.Init(info, anErrorOut))
	{
		return false;
	}
	uint8_t* out = anImageOut.Data(0, 0);
	const double last = ourGradingSize - 1;
	for (uint32_t blue = 0; blue < ourGradingSize; ++blue)
	{
		for (uint32_t green = 0; green < ourGradingSize; ++green)
		{
			for (uint32_t red = 0; red < ourGradingSize; ++red)
			{
				Color color = {red / last, green / last, blue / last};
				if (aKind == GradingKind::Warm)
				{
					color = Warm(color);
				}
				*out++ = ToByte(color[0]);
				*out++ = ToByte(color[1]);
				*out++ = ToByte(color[2]);
				*out++ = 255;
			}
		}
	}
	return true;
}
} // namespace Content
