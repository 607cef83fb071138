// The scans of the event libraries, which a second thread begins while a load is still busy with the
// projects, and which the load then takes one after another and takes part in.
//
// Lives for one load, on whose thread it is used and which holds the monitor meanwhile.
#pragma once

#include <deque>
#include <memory>
#include <string>

#include "core/VXReelixPlugin.h"
#include "events/EventLibraryScan.h"

namespace reelix {

class VXReelixPlugin::EventScansAhead {
  public:
    // Of the plug-in's search paths, in their order.
    explicit EventScansAhead(VXReelixPlugin& plugin);
    // Gives up what nobody took, without waiting for what the thread is about to look at.
    ~EventScansAhead();
    EventScansAhead(const EventScansAhead&) = delete;
    EventScansAhead& operator=(const EventScansAhead&) = delete;

    // The next scan; nil when it's not of this folder.
    std::shared_ptr<EventLibraryScan> take(const std::string& libraryFolder);

  private:
    using Scans = std::deque<std::shared_ptr<EventLibraryScan>>;

    VXReelixPlugin& plugin_;
    Scans scans_;
};

}  // namespace reelix
