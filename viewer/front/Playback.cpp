// Frames from seconds.
#include "front/Playback.h"

#include <algorithm>
#include <cmath>

void Playback::Start(unsigned frames, unsigned perSecond) {
    Keep(frames, perSecond);
    frame_ = first_ = 0;
    until_ = Last();
}

void Playback::Keep(unsigned frames, unsigned perSecond) {
    const bool whole = until_ >= Last();
    frames_ = frames;
    perSecond_ = perSecond ? perSecond : 30;
    SetRange(first_, whole ? Last() : until_);
    frame_ = std::clamp(frame_, 0.0, Last());
}

void Playback::Tick(double seconds) {
    if (!Plays() || !std::isfinite(seconds)) return;
    const double length = until_ - first_;
    if (!(length > 0)) return;
    double behind = std::fmod(frame_ + seconds * perSecond_ * speed_ - first_, length);
    if (behind < 0) behind += length;
    frame_ = first_ + behind;
}

void Playback::Step(int frames) {
    plays_ = false;
    const double whole = frames > 0 ? std::floor(frame_) : std::ceil(frame_);
    Scrub(whole + frames);
}

void Playback::Scrub(double frame) {
    frame_ = std::clamp(std::isfinite(frame) ? frame : 0, 0.0, Last());
}

void Playback::SetRange(double first, double last) {
    first_ = std::clamp(first, 0.0, Last());
    until_ = std::clamp(last, first_, Last());
}

void Playback::SetSpeed(double speed) {
    speed_ = std::clamp(speed, -16.0, 16.0);
}
