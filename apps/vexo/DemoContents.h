// What a sample home holds: a library small enough to look over, with one of everything that a library can
// hold.
#pragma once

#include <string>
#include <vector>

#include "platform/PropertyList.h"

namespace vexo {

struct DemoMovie {
    std::string name;  // of the file; its ending chooses the format
    std::string size;  // pixels: "640x360"
    double seconds;
    int framesPerSecond = 5;
};

enum class DemoProjectKind { project, trailer };

struct DemoProject {
    std::string name;  // a path below the library, without the ending of a package
    DemoProjectKind kind;
    std::string changed;             // local time: "2009-08-23 20;15;00"
    std::vector<DemoMovie> renders;  // the rendered movies
    platform::PropertyListFormat format = platform::PropertyListFormat::binary;
};

struct DemoClip {
    DemoMovie movie;
    std::string recorded = {};  // the date that the clip's extended attribute gives; empty for none
};

struct DemoEvent {
    std::string name;
    std::vector<DemoClip> clips;
};

struct DemoContents {
    std::vector<DemoProject> projects;
    std::vector<DemoEvent> events;
};

DemoContents demoContents();

}  // namespace vexo
