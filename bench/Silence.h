// Leaves the engine's log out while it lives: its lines would mix with the measurements.
#pragma once

#include "Qex.h"

class Silence {
  public:
    Silence() : level_(QexLog_SetLevel(QEX_LOG_NONE)) {}
    ~Silence() { QexLog_SetLevel(level_); }
    Silence(const Silence&) = delete;
    Silence& operator=(const Silence&) = delete;

  private:
    int32_t level_;
};
