// An animation as it plays: frames, their speed and the part of them that is repeated.
#pragma once

class Playback {
  public:
    // An animation of so many frames, from its first on. Fewer than two stand still.
    void Start(unsigned frames, unsigned perSecond);
    // Other frames, as a file was written anew; goes on where it was.
    void Keep(unsigned frames, unsigned perSecond);

    void Tick(double seconds);
    void Step(int frames);  // stops, and goes to a whole frame
    void Scrub(double frame);
    void SetRange(double first, double last);  // frames that repeat
    void SetSpeed(double speed);               // times the scene's own, from -16 to 16
    void Play(bool plays) { plays_ = plays; }

    bool Plays() const { return plays_ && Last() > 0; }
    double Frame() const { return frame_; }
    double Speed() const { return speed_; }
    double First() const { return first_; }
    double Until() const { return until_; }
    double Last() const { return frames_ > 1 ? frames_ - 1 : 0; }
    double PerSecond() const { return perSecond_; }

  private:
    unsigned frames_ = 0;
    double perSecond_ = 30, frame_ = 0, speed_ = 1, first_ = 0, until_ = 0;
    bool plays_ = true;
};
