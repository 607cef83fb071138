// What the tests of the event library share: event folders on disk with clips whose dates a test chooses.
#pragma once

#include "events/EventOrder.h"
#include "platform/CalendarDate.h"
#include "tests/support/ForwardingFiles.h"
#include "tests/support/PluginTest.h"

namespace testing_support {

class EventsTest : public PluginTest {
  protected:
    std::string library() const { return home().path("Movies/Reelix Events"); }
    static std::string inLibrary(const std::string& relative) { return "Movies/Reelix Events/" + relative; }

    // A clip file "<event>/<name>" in the default library; a date goes into its attribute.
    std::string addClip(const std::string& relative, const std::string& date = "") {
        const std::string clip = home().writeFile(inLibrary(relative));
        if (!date.empty())
            setExtendedAttribute(clip, "user.date", date);
        return clip;
    }
    // The same, told to have been made at "2008-12-31 23;59;59", or at no known time.
    std::string addClipMadeAt(const std::string& relative, const std::string& creation) {
        const std::string clip = addClip(relative);
        platform::FileAttributes attributes;
        if (!creation.empty())
            attributes.creationDate =
                platform::Date::sinceReferenceDate(date(creation)->secondsSinceReferenceDate());
        files.attributes[clip] = attributes;
        return clip;
    }
    static platform::CalendarDateRef date(const std::string& text) {
        return platform::CalendarDate::dateWithString(text, "%Y-%m-%d %H;%M;%S");
    }

    void sortOldestFirst() { plugin()._mostRecentEventFirst = false; }

    // Scans one folder as a reload does, with an empty flat list.
    vexo::VXMediaGroupRef scan(const std::optional<std::string>& path) {
        platform::Locked monitor(plugin()._monitor);
        plugin()._flatEventGroupsList = std::make_unique<ExposedPlugin::Groups>();
        ExposedPlugin::OrderedEvents events;
        return plugin()._createReelixEventsFolderForPath(path, events);
    }
    vexo::VXMediaGroupRef scan() { return scan(library()); }
    // The only event of the default library.
    vexo::VXMediaGroupRef scannedEvent() {
        const auto scanned = scan();
        EXPECT_EQ(scanned->childGroups().size(), 1u);
        return scanned->childGroups().front();
    }

    std::string text(const vexo::VXMediaGroupRef& group) const { return treeText(group, home().path()); }
    // "2008, 2008-12-31T23:59:59Z to none"
    static std::string attributesText(const vexo::VXMediaGroup& event) {
        const auto attributes = event.attributes();
        const platform::Value* year = platform::find(*attributes, reelix::VXReelixEventCreationYear);
        return (year ? std::to_string(year->integer() ? *year->integer() : -9999) : "none") + ", " +
               dateText(*attributes, reelix::VXReelixEventOldestClipDate) + " to " +
               dateText(*attributes, reelix::VXReelixEventNewestClipDate);
    }
    static std::vector<std::string> names(const ExposedPlugin::Groups& groups) {
        std::vector<std::string> names;
        for (const auto& group : groups)
            names.push_back(group->name().value_or("<none>"));
        return names;
    }
    static std::vector<std::string> names(const vexo::VXMediaGroupList& groups) {
        return names(ExposedPlugin::Groups(groups.begin(), groups.end()));
    }
    static std::vector<std::string> clipNames(const vexo::VXMediaGroupRef& group) {
        std::vector<std::string> names;
        for (const auto& clip : group->mediaObjects())
            names.push_back(clip->name());
        return names;
    }

    ForwardingFiles files{environment};

  private:
    static std::string dateText(const platform::Dictionary& attributes, std::string_view key) {
        const platform::Value* value = platform::find(attributes, key);
        return value && value->date() ? platform::iso8601String(*value->date()) : "none";
    }

    platform::ServicesScope scope_{servicesWith(files, environment)};
};

}  // namespace testing_support
