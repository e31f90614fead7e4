// The axes of a scene that may point up.
#pragma once

enum class UpAxis { kX, kY, kZ, kMinusX, kMinusY, kMinusZ };
constexpr const char* kUpAxisNames[] = {"x", "y", "z", "-x", "-y", "-z"};  // in that order
