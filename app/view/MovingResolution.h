#pragma once
// MovingResolution: how much smaller the view is drawn while the camera moves. The engine draws
// a moving camera's frames at 1/divisor of the width and height; the divisor follows the time
// those frames take, so that a flight keeps to a frame budget on whatever draws it: a frame over
// the budget makes the next one smaller, and one that would still fit comfortably a step larger
// (frame time taken to grow with the pixel count) makes it sharper.
//
//   myDivisor = NextMovingDivisor(myDivisor, frameMs);
namespace LumoraEditor
{
// The budget of a frame drawn while the camera moves (20 frames a second).
constexpr double ourMovingFrameBudgetMs = 50.0;
constexpr int ourSmallestMovingDivisor = 2;
constexpr int ourLargestMovingDivisor = 4;

// The divisor for the next moving frame after one drawn at aDivisor took aFrameMs.
int NextMovingDivisor(int aDivisor, double aFrameMs);
} // namespace LumoraEditor
