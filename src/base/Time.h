// A clock for measuring how long something takes.
#pragma once

#include <cstdint>

// Nanoseconds from some moment on; they never go back.
uint64_t QexTime_Monotonic();
