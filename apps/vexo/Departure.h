// The end of a program in which something may be waiting for a file system that doesn't answer. Nothing but
// the end of the process gets a thread out of that.
#pragma once

namespace vexo {

// One at a time, of the main thread.
class Departure {
  public:
    static constexpr unsigned secondsAtMost = 10;  // a busy machine may need some

    Departure() = default;
    // The program got away by itself.
    ~Departure();
    Departure(const Departure&) = delete;
    Departure& operator=(const Departure&) = delete;

    // From now on the object has to go within `secondsAtMost`, or the process is ended with a message.
    void begin();

  private:
    bool hasBegun_ = false;
};

// Begins a departure when it goes, in whatever way its scope is left.
class DepartureAtEnd {
  public:
    explicit DepartureAtEnd(Departure& departure) : departure_(departure) {}
    ~DepartureAtEnd() { departure_.begin(); }
    DepartureAtEnd(const DepartureAtEnd&) = delete;
    DepartureAtEnd& operator=(const DepartureAtEnd&) = delete;

  private:
    Departure& departure_;
};

}  // namespace vexo
