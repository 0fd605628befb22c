#pragma once
// CameraPlacement: the editor camera as the view keeps it (position, yaw about the world's up,
// pitch about its own right axis, positive looking down; radians) and the axes the engine
// derives from it (left-handed, y up: yaw 0 looks along +z).
#include <array>
#include <cmath>

namespace LumoraEditor
{
struct CameraPlacement
{
	std::array<float, 3> myPosition{};
	float myYaw = 0.0f;
	float myPitch = 0.0f;

	std::array<float, 3> Forward() const
	{
		const float cosPitch = std::cos(myPitch);
		return {-std::sin(myYaw) * cosPitch, -std::sin(myPitch), std::cos(myYaw) * cosPitch};
	}
	std::array<float, 3> Right() const { return {std::cos(myYaw), 0.0f, std::sin(myYaw)}; }
	// Forward x right: the camera's up.
	std::array<float, 3> Up() const
	{
		const auto f = Forward();
		const auto r = Right();
		return {f[1] * r[2] - f[2] * r[1], f[2] * r[0] - f[0] * r[2], f[0] * r[1] - f[1] * r[0]};
	}
	std::array<float, 3> InFront(float aDistance) const
	{
		const auto f = Forward();
		return {myPosition[0] + f[0] * aDistance, myPosition[1] + f[1] * aDistance,
		        myPosition[2] + f[2] * aDistance};
	}
	bool operator==(const CameraPlacement&) const = default;
};
} // namespace LumoraEditor
