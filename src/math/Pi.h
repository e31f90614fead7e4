// The one pi.
#pragma once

constexpr double kQexPi = 3.141592653589793;
