// Who listens to which watched folder. A folder is watched while somebody listens to it.
//
// Several may listen to one folder: it can be reached by several paths, and be part of one watched tree and
// on the way to another. Not thread-safe.
#pragma once

#include <unordered_map>
#include <vector>

#include "framework/pathwatcher/FileEvents.h"

namespace vexo {

class EventListener {
  public:
    // May add and remove listeners, itself included. After an event with IN_IGNORED the watch is gone.
    virtual void heard(const FileEvent& event) = 0;

  protected:
    ~EventListener() = default;
};

class Watches {
  public:
    // `events` must outlive the object.
    explicit Watches(FileEvents& events) : events_(events) {}

    // Listening twice to one folder counts once.
    WatchResult add(const std::string& folder, std::uint32_t kinds, EventListener& listener);
    // Requires: called before the listener goes, whether it listens or not.
    void remove(int watch, EventListener& listener);

    // Tells all who listen. Events of unknown watches are the last of removed ones.
    void dispatch(const FileEvent& event);

    // Nobody listens to anything any more, and the queue of events is a new one.
    void reopen();

    std::size_t count() const { return listeners_.size(); }

  private:
    void forget(int watch);

    using Listeners = std::unordered_map<int, std::vector<EventListener*>>;

    FileEvents& events_;
    Listeners listeners_;
    Listeners::value_type* latest_ = nullptr;  // whose event was dispatched last: events come in runs
    std::vector<EventListener*> hearing_;      // those told of the current event; nil for who was removed
};

}  // namespace vexo
