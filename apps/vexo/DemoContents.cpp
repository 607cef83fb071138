#include "apps/vexo/DemoContents.h"

namespace vexo {
namespace {

using enum DemoProjectKind;

std::vector<DemoProject> demoProjects() {
    return {
        {"Alps 2009",
         project,
         "2009-08-23 20;15;00",
         {{"Tiny.3gp", "176x144", 6},
          {"Mobile.m4v", "640x360", 6},
          {"Medium.mov", "1280x720", 6},
          {"HD.mov", "1920x1080", 6}}},
        {"Summer Blockbuster", trailer, "2011-06-18 11;02;40", {{"HD.mov", "1280x720", 5}}},
        {"Cutting Room", project, "2012-03-02 22;48;19", {}},
        {"Coming Soon", trailer, "2012-09-14 08;30;00", {}},
        {"Skate Park",
         project,
         "2010-04-11 17;25;51",
         {{"Medium.mov", "960x540", 3}},
         platform::PropertyListFormat::xml},
        {"Family/Grandma’s 80th Birthday",
         project,
         "2010-11-28 19;00;12",
         {{"Mobile.m4v", "480x272", 75, /*framesPerSecond=*/1}}},
        {"Family/2008/First Steps", project, "2008-10-05 15;44;07", {{"Mobile.3gp", "320x240", 4}}},
        // Names are bytes to the file system: quotes, symbols beyond the first plane and line ends are
        // allowed.
        {"Lena’s \"Best Of\" 🎬\n(final)", project, "2011-12-30 23;11;36", {{"Mobile.m4v", "640x360", 8}}},
        {"The Complete and Unabridged Story of How We Repainted the Kitchen, Lost the Cat, Found It Again "
         "and "
         "Decided to Move House",
         project,
         "2012-01-15 13;37;00",
         {{"Medium.mov", "854x480", 12}}},
    };
}

// Each way of dating a clip, some together: the attribute, the file's name, and neither, which leaves the day
// on which the file was made.
std::vector<DemoEvent> demoEvents() {
    return {
        {"Ski Trip",
         {{{"M2U00017.mp4", "1280x720", 4}, "2007-02-17 10;15;00"},
          {{"M2U00018.mp4", "1280x720", 3}, "2007-02-18 14;08;21"}}},
        {"New Year’s Eve",
         {{{"MVI_0412.mov", "640x480", 5}, "2008-12-31 23;59;59"},
          {{"MVI_0413.mov", "640x480", 3}, "2009-01-01 00;04;12"}}},
        {"Beach Holiday",
         {{{"clip-2009-07-04 18;30;05.mov", "1280x720", 3}},
          {{"clip-2009-07-05 09;12;44.mov", "1280x720", 6}},
          {{"clip-2009-07-05 09;31;02.mov", "1280x720", 2}}}},
        {"School Play",
         {{{"clip-2010-05-21 19;02;30.m4v", "960x540", 7}},
          {{"clip-2010-05-21 19;48;09.m4v", "960x540", 3}}}},
        {"Concert", {{{"clip-2011-10-08 21;40;00.mov", "640x360", 4}, "2012-10-06 21;41;10"}}},
        {"Camping",
         {{{"clip-2012-06-30 07;45;00.3gp", "320x240", 3}},
          {{"clip-2012-06-30 21;15;33.mp4", "1280x720", 4}}}},
        {"Birthday",
         {{{"Birthday.mp4", "1280x720", 5}}, {{"Cake 🎂 \"slow motion\" \x1b[7m.m4v", "640x360", 3}}}},
    };
}

}  // namespace

DemoContents demoContents() {
    return {demoProjects(), demoEvents()};
}

}  // namespace vexo
