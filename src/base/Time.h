// A clock for measuring how long something takes.
#pragma once

#include <cstdint>

// Nanoseconds from some moment on; they never go back.
uint64_t QexTime_Monotonic();

// The moment so many milliseconds from now, for work that is to stop then; for very many the end of time.
constexpr uint64_t kQexNever = UINT64_MAX;
uint64_t QexTime_In(float milliseconds);
