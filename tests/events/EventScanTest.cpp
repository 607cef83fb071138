// Scanning one event library folder into events and clips.
#include "platform/Path.h"
#include "tests/events/EventsTest.h"

namespace testing_support {
namespace {

using platform::Array;
using platform::Dictionary;
using reelix::iconCache;
using testing::ElementsAre;
using testing::IsEmpty;
using vexo::VXMediaObjectRef;

class EventScanTest : public EventsTest {
  protected:
    // A file that the host knows as a movie only by its metadata.
    std::string addClipWithMetadata(const std::string& relative, Dictionary properties,
                                    const std::string& date = "") {
        const std::string clip = addClip(relative, date);
        environment.metadata.set(clip, std::move(properties));
        return clip;
    }
    std::vector<std::string> flatNames() {
        platform::Locked monitor(plugin()._monitor);
        return names(*plugin()._flatEventGroupsList);
    }
};

Dictionary mediaTypes(Array types) {
    return {{std::string(vexo::kMDItemMediaTypes), std::move(types)}};
}

Dictionary contentTypes(Array tree) {
    return {{std::string(vexo::kMDItemContentTypeTree), std::move(tree)}};
}

// --- The library -------------------------------------------------------------------------------------------

TEST_F(EventScanTest, NoPathAnswersNil) {
    EXPECT_EQ(scan(std::nullopt), nullptr);
}

TEST_F(EventScanTest, MissingFolderAnswersNil) {
    EXPECT_EQ(scan(), nullptr);
}

TEST_F(EventScanTest, EmptyFolderAnswersNil) {
    home().makeFolder(inLibrary(""));
    EXPECT_EQ(scan(), nullptr);
}

TEST_F(EventScanTest, LibraryThatIsAFileOrAFifoAnswersNil) {
    EXPECT_EQ(scan(home().writeFile("file")), nullptr);
    EXPECT_EQ(scan(home().makeFifo("fifo")), nullptr);
}

TEST_F(EventScanTest, LibraryThatIsALinkIsReadAndKeepsItsName) {
    home().writeFile("elsewhere/Trip/a.mov");
    home().makeLink("Movies/Reelix Events", home().path("elsewhere"));
    const auto scanned = scan(library());
    ASSERT_TRUE(scanned);
    EXPECT_EQ(scanned->childGroups().front()->ID(), library() + "/Trip");
}

TEST_F(EventScanTest, LibraryOfHiddenEntriesAndFilesAnswersALibraryWithoutChildren) {
    home().writeFile(inLibrary(".hidden event/a.mov"));
    home().writeFile(inLibrary("file.mov"));
    home().writeFile(inLibrary("Invisible/a.mov"));
    home().writeFile(inLibrary(".hidden"), "Invisible\n");
    const auto scanned = scan();
    ASSERT_TRUE(scanned);
    EXPECT_THAT(scanned->childGroups(), IsEmpty());
    EXPECT_THAT(flatNames(), IsEmpty());
}

TEST_F(EventScanTest, LibraryGroupHasItsFields) {
    addClip("Trip/a.mov");
    setModificationTime(library(), 1e9);
    const auto scanned = scan();
    EXPECT_EQ(scanned->typeIdentifier(), vexo::VXReelixEventLibraryGroupTypeIdentifier);
    EXPECT_EQ(scanned->ID(), library());
    EXPECT_EQ(scanned->name(), "Event Library");
    EXPECT_EQ(scanned->parentID(), library());
    EXPECT_EQ(scanned->path(), library());
    EXPECT_EQ(scanned->modificationDate()->secondsSince1970(), 1e9);
    EXPECT_EQ(scanned->icon(), iconCache().calendarIcon.get());
    EXPECT_THAT(*scanned->attributes(), IsEmpty());
    EXPECT_EQ(scanned->ownMediaObjects(), std::nullopt);
}

TEST_F(EventScanTest, LibraryGroupHasTheLocalizedName) {
    environment.bundle->replacedStrings["ReelixEventLibrary"] = "Ereignisse 100 %";
    addClip("Trip/a.mov");
    EXPECT_EQ(scan()->name(), "Ereignisse 100 %");
}

TEST_F(EventScanTest, TreeOfALibrary) {
    addClip("Beach/clip-2009-07-04 18;30;05.mov");
    addClip("Beach/sunset.mp4", "2009-07-05 09;00;00");
    addClip("Camping/fire.m4v", "2008-12-31 23;59;59");
    home().makeFolder(inLibrary("Empty"));
    home().writeFile(inLibrary("Notes/readme.txt"));
    EXPECT_EQ(
        text(scan()),
        R"(EventLibrary home/Movies/Reelix Events "Event Library" <home/Movies/Reelix Events> icon=Reelix-icon-calendar
  Event home/Movies/Reelix Events/Beach "Beach" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2009
    * home/Movies/Reelix Events/Beach/clip-2009-07-04 18;30;05.mov "Jul 4, 2009, 18:30:05"
    * home/Movies/Reelix Events/Beach/sunset.mp4 "Jul 5, 2009, 09:00:00"
  Event home/Movies/Reelix Events/Camping "Camping" <home/Movies/Reelix Events> icon=Reelix-icon-event year=2008
    * home/Movies/Reelix Events/Camping/fire.m4v "Dec 31, 2008, 23:59:59"
)");
    EXPECT_THAT(flatNames(), ElementsAre("Beach", "Camping", "Notes"));
}

// --- Events ------------------------------------------------------------------------------------------------

TEST_F(EventScanTest, EventGroupHasItsFields) {
    const std::string clip = addClip("Trip/a.mov");
    setModificationTime(library() + "/Trip", 1e9);
    const auto event = scannedEvent();
    EXPECT_EQ(event->typeIdentifier(), vexo::VXReelixEventGroupTypeIdentifier);
    EXPECT_EQ(event->ID(), library() + "/Trip");
    EXPECT_EQ(event->name(), "Trip");
    EXPECT_EQ(event->parentID(), library());
    EXPECT_EQ(event->path(), library() + "/Trip");
    EXPECT_EQ(event->modificationDate()->secondsSince1970(), 1e9);
    EXPECT_EQ(event->icon(), iconCache().eventIcon.get());
    EXPECT_THAT(event->childGroups(), IsEmpty());
    ASSERT_TRUE(event->ownMediaObjects());
    EXPECT_EQ(event->ownMediaObjects()->size(), 1u);
}

TEST_F(EventScanTest, EventKeepsItsNameAsItStands) {
    addClip("Ålesund 2009.05.localized/a.mov");
    EXPECT_EQ(scannedEvent()->name(), "Ålesund 2009.05.localized");
}

TEST_F(EventScanTest, NamesThatAreNotUTF8Survive) {
    addClip("Trip \xff/a\xfe.mov");
    const auto event = scannedEvent();
    EXPECT_EQ(event->ID(), library() + "/Trip \xff");
    EXPECT_EQ(event->mediaObjects().front()->ID(), library() + "/Trip \xff/a\xfe.mov");
}

TEST_F(EventScanTest, EmptyEventIsSkippedEntirely) {
    home().makeFolder(inLibrary("Empty"));
    EXPECT_THAT(scan()->childGroups(), IsEmpty());
    EXPECT_THAT(flatNames(), IsEmpty());
}

TEST_F(EventScanTest, EventWithoutClipsIsOnlyInTheFlatList) {
    home().writeFile(inLibrary("Documents/readme.txt"));
    home().writeFile(inLibrary("Hidden/.a.mov"));
    EXPECT_THAT(scan()->childGroups(), IsEmpty());
    EXPECT_THAT(flatNames(), ElementsAre("Documents", "Hidden"));
}

TEST_F(EventScanTest, PackageIsAnEventLikeAnyFolder) {
    addClip("Trip.qnproject/a.mov");
    EXPECT_EQ(scannedEvent()->name(), "Trip.qnproject");
}

TEST_F(EventScanTest, LinkToAFolderIsNoEvent) {
    home().writeFile("elsewhere/a.mov");
    home().makeLink(inLibrary("Linked"), home().path("elsewhere"));
    home().makeLink(inLibrary("Loop"), library());
    home().makeLink(inLibrary("Dangling"), home().path("nothing"));
    EXPECT_THAT(scan()->childGroups(), IsEmpty());
    EXPECT_THAT(flatNames(), IsEmpty());
}

TEST_F(EventScanTest, EventWhoseFlagsCannotBeHadIsSkippedWhateverCameBefore) {
    addClip("A/a.mov");
    const std::string unknown = home().makeFolder(inLibrary("B"));
    addClip("B/b.mov");
    files.flags[unknown] = std::nullopt;
    EXPECT_THAT(names(scan()->childGroups()), ElementsAre("A"));
}

TEST_F(EventScanTest, EventsAreThoseWithTheContainerFlagAlone) {
    for (const char* name : {"0", "2", "8", "10", "64", "72"})
        addClip(std::string(name) + "/a.mov");
    for (const std::uint32_t flags : {0, 2, 8, 10, 64, 72})
        files.flags[library() + "/" + std::to_string(flags)] = flags;
    EXPECT_THAT(names(scan()->childGroups()), ElementsAre("10", "8"));
}

TEST_F(EventScanTest, EventThatCannotBeListedIsSkipped) {
    home().makeFolder(inLibrary("Real"));
    addClip("Real/a.mov");
    files.listings[library()] = {"Gone", "", "Real"};
    files.flags[library() + "/Gone"] = platform::itemIsContainer;
    EXPECT_THAT(names(scan()->childGroups()), ElementsAre("Real"));
    EXPECT_THAT(flatNames(), ElementsAre("Real"));
}

TEST_F(EventScanTest, EventsAndClipsStandInListingOrder) {
    for (const char* clip : {"B/1.mov", "B/2.mov", "A/1.mov", "C/1.mov"})
        addClip(clip);
    files.listings[library()] = {"C", "A", "B"};
    files.listings[library() + "/B"] = {"2.mov", "1.mov"};
    const auto scanned = scan();
    EXPECT_THAT(names(scanned->childGroups()), ElementsAre("C", "A", "B"));
    EXPECT_THAT(clipNames(scanned->childGroups()[2]), ElementsAre("2", "1"));
    EXPECT_THAT(flatNames(), ElementsAre("C", "A", "B"));
}

// --- Clips -------------------------------------------------------------------------------------------------

TEST_F(EventScanTest, ClipHasItsFields) {
    const std::string path = addClip("Trip/a.mov");
    environment.metadata.setMovie(path, {1920, 1080}, 12.5);
    const auto event = scannedEvent();
    const VXMediaObjectRef clip = event->mediaObjects().front();
    EXPECT_EQ(clip->mediaType(), 3);
    EXPECT_EQ(clip->ID(), path);
    EXPECT_EQ(clip->name(), "a");
    EXPECT_EQ(clip->mediaSourceType(), 2);
    EXPECT_EQ(clip->path(), path);
    EXPECT_EQ(clip->attributes(), (Dictionary{{"VXReelixProjectPathKey", library() + "/Trip"}}));
    EXPECT_EQ(clip->icon(), iconCache().smallApplicationIcon.get());
    ASSERT_TRUE(clip->spotlightProperties());
    EXPECT_EQ(clip->spotlightProperties()->valueForKey(vexo::kMDItemPixelWidth), platform::Value(1920.0));
    EXPECT_EQ(clip->duration(), 12.5);
}

TEST_F(EventScanTest, ScanOfSupportedClipsReadsNoMetadata) {
    addClip("Trip/a.mov");
    addClip("Trip/b.mov", "2009-07-04 18;30;05");
    scan();
    EXPECT_EQ(environment.metadata.questions(), 0);
}

TEST_F(EventScanTest, ClipWithoutADateIsNamedByItsFileWithoutExtension) {
    addClip("Trip/Our Boat.tar.mov");
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("Our Boat.tar"));
}

TEST_F(EventScanTest, ClipWithADateIsNamedInTheLocalizedFormatAndTheUsersLocale) {
    const ScopedEnvironment locale("LC_ALL", "de_DE.UTF-8");
    environment.bundle->replacedStrings["ReelixClipNameDisplayFormat"] = "%e. %B %Y, %H:%M";
    addClip("Trip/a.mov", "2009-05-04 18;30;05");
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("4. Mai 2009, 18:30"));
}

TEST_F(EventScanTest, AttributeWinsOverTheFileName) {
    sortOldestFirst();
    addClip("Trip/clip-2009-07-04 18;30;05.mov", "2008-12-31 23;59;59");
    const auto event = scannedEvent();
    EXPECT_THAT(clipNames(event), ElementsAre("Dec 31, 2008, 23:59:59"));
    EXPECT_EQ(attributesText(*event), "2008, 2008-12-31T23:59:59Z to 2008-12-31T23:59:59Z");
}

TEST_F(EventScanTest, FileNameCountsWhereTheAttributeDoesNotParse) {
    addClip("Trip/clip-2009-07-04 18;30;05.mov", "2008-12-31 23:59:59");
    const auto event = scannedEvent();
    EXPECT_THAT(clipNames(event), ElementsAre("Jul 4, 2009, 18:30:05"));
    EXPECT_EQ(attributesText(*event), "2009, 2009-07-04T18:30:05Z to 2009-07-04T18:30:05Z");
}

TEST_F(EventScanTest, FileNameWinsOverTheCreationDate) {
    addClipMadeAt("Trip/clip-2009-07-04 18;30;05.mov", "2012-01-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "2009, 2009-07-04T18:30:05Z to 2009-07-04T18:30:05Z");
}

TEST_F(EventScanTest, CreationDateCountsLast) {
    addClipMadeAt("Trip/a.mov", "2012-03-04 05;06;07");
    const auto event = scannedEvent();
    EXPECT_THAT(clipNames(event), ElementsAre("a"));
    EXPECT_EQ(attributesText(*event), "2012, 2012-03-04T05:06:07Z to 2012-03-04T05:06:07Z");
}

TEST_F(EventScanTest, YearOfACreationDateIsTheLocalOne) {
    addClipMadeAt("Trip/a.mov", "2011-12-31 23;00;00");
    const ScopedEnvironment zone("TZ", "TEST-2");
    EXPECT_EQ(attributesText(*scannedEvent()), "2012, 2011-12-31T23:00:00Z to 2011-12-31T23:00:00Z");
}

TEST_F(EventScanTest, FilesOfOtherKindsAreNoClips) {
    home().makeFolder(inLibrary("Trip/folder.mov"));
    home().makeFolder(inLibrary("Trip/package.qnproject"));
    home().makeFifo(inLibrary("Trip/fifo"));
    home().makeLink(inLibrary("Trip/dangling.mov"), home().path("nothing"));
    home().makeLink(inLibrary("Trip/link to folder"), library());
    home().writeFile(inLibrary("Trip/readme.txt"));
    home().writeFile(inLibrary("Trip/.hidden.mov"));
    home().writeFile(inLibrary("Trip/listed.mov"));
    home().writeFile(inLibrary("Trip/.hidden"), "listed.mov\n");
    addClip("Trip/clip.mov");
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("clip"));
}

TEST_F(EventScanTest, LinkToAMovieIsAClip) {
    const std::string target = home().writeFile("elsewhere/target.mov");
    setExtendedAttribute(target, "user.date", "2009-07-04 18;30;05");
    home().makeLink(inLibrary("Trip/link.mov"), target);
    const auto event = scannedEvent();
    EXPECT_EQ(event->mediaObjects().front()->path(), library() + "/Trip/link.mov");
    EXPECT_THAT(clipNames(event), ElementsAre("Jul 4, 2009, 18:30:05"));
}

TEST_F(EventScanTest, ClipsAreEntriesThatAreNeitherContainersNorInvisible) {
    for (const char* name : {"0", "2", "8", "10", "64", "72"})
        addClip("Trip/" + std::string(name) + ".mov");
    for (const std::uint32_t flags : {0, 2, 8, 10, 64, 72})
        files.flags[library() + "/Trip/" + std::to_string(flags) + ".mov"] = flags;
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("0", "2"));
}

TEST_F(EventScanTest, ClipWhoseFlagsOrAttributesCannotBeReadIsSkipped) {
    files.flags[addClip("Trip/a.mov")] = std::nullopt;
    files.attributes[addClip("Trip/b.mov")] = std::nullopt;
    files.attributes[addClipWithMetadata("Trip/c.bin", mediaTypes({"Video"}))] = std::nullopt;
    addClip("Trip/d.mov");
    files.listings[library() + "/Trip"] = {"", "a.mov", "b.mov", "c.bin", "gone.mov", "d.mov"};
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("d"));
}

// --- Clips by metadata -------------------------------------------------------------------------------------

TEST_F(EventScanTest, FileThatIsNoMovieByNameOrMetadataIsSkipped) {
    addClip("Trip/a.bin", "2009-07-04 18;30;05");
    EXPECT_THAT(scan()->childGroups(), IsEmpty());
}

TEST_F(EventScanTest, FileWithVideoAmongItsMediaTypesIsAClip) {
    addClipWithMetadata("Trip/a.bin", mediaTypes({"Sound", "Video"}));
    addClipWithMetadata("Trip/b.bin", mediaTypes({"MPEG1 Muxed"}));
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("a.bin", "b.bin"));
}

TEST_F(EventScanTest, MediaTypesAreComparedExactly) {
    addClipWithMetadata("Trip/a.bin", mediaTypes({"video", "Videos", "MPEG1", 1, Array{"Video"}}));
    addClipWithMetadata("Trip/b.bin", mediaTypes({}));
    EXPECT_THAT(scan()->childGroups(), IsEmpty());
}

TEST_F(EventScanTest, FileWithAMovieInItsContentTypeTreeIsAClip) {
    addClipWithMetadata("Trip/a.bin", contentTypes({"public.data", "public.movie"}));
    addClipWithMetadata("Trip/b.bin", contentTypes({"public.video"}));
    addClipWithMetadata("Trip/c.bin", contentTypes({"public.data", "public.audio"}));
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("a.bin", "b.bin"));
}

TEST_F(EventScanTest, MediaTypesWithoutVideoWinOverTheContentTypeTree) {
    Dictionary properties = mediaTypes({"Sound"});
    properties.merge(contentTypes({"public.movie"}));
    addClipWithMetadata("Trip/a.bin", properties);
    EXPECT_THAT(scan()->childGroups(), IsEmpty());
}

TEST_F(EventScanTest, MediaTypesThatAreNoListLeaveTheDecisionToTheContentTypeTree) {
    Dictionary properties = contentTypes({"public.movie"});
    properties.insert_or_assign(std::string(vexo::kMDItemMediaTypes), "Sound");
    addClipWithMetadata("Trip/a.bin", properties);
    EXPECT_THAT(clipNames(scannedEvent()), ElementsAre("a.bin"));
}

TEST_F(EventScanTest, ClipByMetadataKeepsItsWholeNameWhateverItsDate) {
    addClipWithMetadata("Trip/a.mpg", mediaTypes({"MPEG1 Muxed"}), "2009-07-04 18;30;05");
    addClipWithMetadata("Trip/clip-2010-07-04 18;30;05.mpg", mediaTypes({"Video"}));
    const auto event = scannedEvent();
    EXPECT_THAT(clipNames(event), ElementsAre("a.mpg", "clip-2010-07-04 18;30;05.mpg"));
    EXPECT_EQ(attributesText(*event), "2010, 2009-07-04T18:30:05Z to 2010-07-04T18:30:05Z");
}

TEST_F(EventScanTest, ClipByMetadataHasTheFieldsOfAnyClip) {
    const std::string path = addClipWithMetadata("Trip/a.mpg", mediaTypes({"MPEG1 Muxed"}));
    const auto event = scannedEvent();
    const VXMediaObjectRef clip = event->mediaObjects().front();
    EXPECT_EQ(clip->mediaType(), 3);
    EXPECT_EQ(clip->ID(), path);
    EXPECT_EQ(clip->mediaSourceType(), 2);
    EXPECT_EQ(clip->path(), path);
    EXPECT_EQ(clip->attributes(), (Dictionary{{"VXReelixProjectPathKey", library() + "/Trip"}}));
    EXPECT_EQ(clip->icon(), iconCache().smallApplicationIcon.get());
    EXPECT_TRUE(clip->spotlightProperties()->valueForKey(vexo::kMDItemMediaTypes));
}

// --- Attributes of events ----------------------------------------------------------------------------------

TEST_F(EventScanTest, EventIsFiledUnderItsNewestYearWhenTheNewestComeFirst) {
    addClip("Trip/a.mov", "2009-01-01 00;00;00");
    addClip("Trip/b.mov", "2007-02-02 00;00;00");
    addClip("Trip/c.mov", "2008-03-03 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "2009, 2007-02-02T00:00:00Z to 2009-01-01T00:00:00Z");
}

// More clips than are read at a time.
TEST_F(EventScanTest, LargeEventHasItsClipsInOrderAndTheYearsOfThemAll) {
    constexpr std::size_t clips = 300;
    std::vector<std::string> listing;
    for (std::size_t i = 0; i < clips; ++i) {
        const char* const date = i == 130   ? "2007-02-02 00;00;00"
                                 : i == 299 ? "2009-01-01 00;00;00"
                                            : "2008-03-03 00;00;00";
        listing.push_back(std::to_string(i * 7 % clips) + ".mov");
        addClip("Trip/" + listing.back(), date);
    }
    files.listings[library() + "/Trip"] = listing;

    const auto event = scannedEvent();
    std::vector<std::string> shown;
    for (const auto& clip : event->mediaObjects())
        shown.push_back(platform::path::lastComponent(clip->ID()));
    EXPECT_EQ(shown, listing);
    EXPECT_EQ(attributesText(*event), "2009, 2007-02-02T00:00:00Z to 2009-01-01T00:00:00Z");
}

TEST_F(EventScanTest, FolderThatCantBeReadToItsEndIsNoEvent) {
    for (std::size_t i = 0; i <= PathFolder::itemsATime; ++i)
        addClip("Long/" + std::to_string(i) + ".mov", "2008-03-03 00;00;00");
    addClip("Trip/a.mov", "2009-01-01 00;00;00");
    files.beforeReading = [&](const std::string& path, std::size_t itemsTold) {
        return path != library() + "/Long" || itemsTold == 0;
    };
    EXPECT_THAT(names(scan()->childGroups()), ElementsAre("Trip"));
    EXPECT_THAT(flatNames(), ElementsAre("Trip"));
}

TEST_F(EventScanTest, LibraryThatCantBeReadToItsEndIsNone) {
    for (std::size_t i = 0; i <= PathFolder::itemsATime; ++i)
        addClip("Trip " + std::to_string(i) + "/a.mov", "2008-03-03 00;00;00");
    EXPECT_EQ(scan()->childGroups().size(), PathFolder::itemsATime + 1);
    files.beforeReading = [&](const std::string& path, std::size_t itemsTold) {
        return path != library() || itemsTold == 0;
    };
    EXPECT_EQ(scan(), nullptr);
    EXPECT_THAT(flatNames(), IsEmpty());
}

// The last reading of a folder may bring nothing.
TEST_F(EventScanTest, EventMayEndWhereAReadingEnds) {
    for (std::size_t i = 0; i < 2 * PathFolder::itemsATime; ++i)
        addClip("Trip/" + std::to_string(i) + ".mov", "2008-03-03 00;00;00");
    EXPECT_EQ(scannedEvent()->mediaObjects().size(), 2 * PathFolder::itemsATime);
}

TEST_F(EventScanTest, EventIsFiledUnderItsOldestYearWhenTheOldestComeFirst) {
    sortOldestFirst();
    addClip("Trip/a.mov", "2009-01-01 00;00;00");
    addClip("Trip/b.mov", "2007-02-02 00;00;00");
    addClip("Trip/c.mov", "2008-03-03 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "2007, 2007-02-02T00:00:00Z to 2009-01-01T00:00:00Z");
}

TEST_F(EventScanTest, OrderAtTheTimeOfTheScanCounts) {
    addClip("Trip/a.mov", "2009-01-01 00;00;00");
    addClip("Trip/b.mov", "2007-02-02 00;00;00");
    files.beforeListing = [this](const std::string& folder) {
        if (folder.ends_with("/Trip"))
            sortOldestFirst();
    };
    EXPECT_EQ(attributesText(*scannedEvent()), "2007, 2007-02-02T00:00:00Z to 2009-01-01T00:00:00Z");
}

TEST_F(EventScanTest, OfClipsOfOneYearTheFirstListedSuppliesBothDates) {
    addClip("Trip/a.mov", "2008-06-01 00;00;00");
    addClip("Trip/b.mov", "2008-01-01 00;00;00");
    addClip("Trip/c.mov", "2008-12-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "2008, 2008-06-01T00:00:00Z to 2008-06-01T00:00:00Z");
    files.listings[library() + "/Trip"] = {"c.mov", "b.mov", "a.mov"};
    EXPECT_EQ(attributesText(*scannedEvent()), "2008, 2008-12-01T00:00:00Z to 2008-12-01T00:00:00Z");
}

TEST_F(EventScanTest, DatesInAttributesArePlain) {
    addClip("Trip/a.mov", "2008-06-01 00;00;00");
    const auto attributes = scannedEvent()->attributes();
    ASSERT_EQ(attributes->size(), 3u);
    for (const char* key : {"ReelixEventOldestClipDate", "ReelixEventNewestClipDate"}) {
        const platform::DateRef date = attributes->at(key).date();
        ASSERT_TRUE(date) << key;
        EXPECT_EQ(std::dynamic_pointer_cast<const platform::CalendarDate>(date), nullptr) << key;
    }
    EXPECT_EQ(attributes->at("ReelixEventCreationYear"), platform::Value(2008));
}

TEST_F(EventScanTest, ClipsThatAreSkippedCountForNothing) {
    addClip("Trip/a.txt", "1999-01-01 00;00;00");
    addClip("Trip/b.mov", "2008-06-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "2008, 2008-06-01T00:00:00Z to 2008-06-01T00:00:00Z");
}

TEST_F(EventScanTest, EachEventIsDatedByItself) {
    addClip("A/a.mov", "2005-06-01 00;00;00");
    addClip("B/b.mov", "2008-06-01 00;00;00");
    const auto scanned = scan();
    EXPECT_EQ(attributesText(*scanned->childGroups()[0]),
              "2005, 2005-06-01T00:00:00Z to 2005-06-01T00:00:00Z");
    EXPECT_EQ(attributesText(*scanned->childGroups()[1]),
              "2008, 2008-06-01T00:00:00Z to 2008-06-01T00:00:00Z");
}

TEST_F(EventScanTest, EventWithoutAnyDateHasNoAttributesWhenTheNewestComeFirst) {
    addClipMadeAt("Trip/a.mov", "");
    const auto event = scannedEvent();
    EXPECT_THAT(*event->attributes(), IsEmpty());
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(EventScanTest, EventWithoutAnyDateHasTheYearMinusOneWhenTheOldestComeFirst) {
    sortOldestFirst();
    addClipMadeAt("Trip/a.mov", "");
    EXPECT_EQ(attributesText(*scannedEvent()), "-1, none to none");
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(EventScanTest, OldestDateIsTheNewestWhereTheLowestYearHasNone) {
    addClipMadeAt("Trip/a.mov", "");
    addClip("Trip/b.mov", "2008-06-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "2008, 2008-06-01T00:00:00Z to 2008-06-01T00:00:00Z");
    sortOldestFirst();
    EXPECT_EQ(attributesText(*scannedEvent()), "-1, 2008-06-01T00:00:00Z to 2008-06-01T00:00:00Z");
}

TEST_F(EventScanTest, HighestYearZeroSetsNothingWhenTheNewestComeFirst) {
    addClip("Trip/a.mov", "0000-06-01 00;00;00");
    const auto event = scannedEvent();
    EXPECT_THAT(clipNames(event), ElementsAre("Jun 1, 0000, 00:00:00"));
    EXPECT_THAT(*event->attributes(), IsEmpty());
}

TEST_F(EventScanTest, YearZeroHasNoNewestDateWhenTheOldestComeFirst) {
    sortOldestFirst();
    addClip("Trip/a.mov", "0000-06-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "0, 0000-06-01T00:00:00Z to none");
}

TEST_F(EventScanTest, AttributeYearsFrom0To9999Count) {
    for (const std::string year : {"1899", "1900", "2100", "2101", "9998"}) {
        const std::string clip = addClip("Trip/a.mov", year + "-06-01 00;00;00");
        EXPECT_EQ(attributesText(*scannedEvent()),
                  year + ", " + year + "-06-01T00:00:00Z to " + year + "-06-01T00:00:00Z");
    }
}

TEST_F(EventScanTest, Year9999IsNoLowestYear) {
    addClip("Trip/a.mov", "9999-06-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "9999, 9999-06-01T00:00:00Z to 9999-06-01T00:00:00Z");
    EXPECT_THAT(environment.log.lines(), IsEmpty());
    sortOldestFirst();
    EXPECT_THAT(*scannedEvent()->attributes(), IsEmpty());
    EXPECT_THAT(environment.log.lines(), ElementsAre("Woooow"));
}

TEST_F(EventScanTest, Year9998IsTheLastLowestYear) {
    sortOldestFirst();
    addClip("Trip/a.mov", "9998-06-01 00;00;00");
    addClip("Trip/b.mov", "9999-06-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "9998, 9998-06-01T00:00:00Z to 9999-06-01T00:00:00Z");
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(EventScanTest, MarkOfAnUnusableYearIsLoggedOncePerEventAndTheEventIsShown) {
    sortOldestFirst();
    addClip("A/a.mov", "9999-06-01 00;00;00");
    addClip("A/b.mov", "9999-06-01 00;00;00");
    addClip("B/a.mov", "9999-06-01 00;00;00");
    EXPECT_THAT(names(scan()->childGroups()), ElementsAre("A", "B"));
    EXPECT_THAT(environment.log.lines(), ElementsAre("Woooow", "Woooow"));
}

TEST_F(EventScanTest, YearBeyond9999TakesTheYearOfTheCreationDateAndKeepsTheClipsDate) {
    for (const std::string year : {"10000", "12000"}) {
        const std::string clip = addClipMadeAt("Trip/a.mov", "2012-03-04 05;06;07");
        setExtendedAttribute(clip, "user.date", year + "-06-01 00;00;00");
        const auto event = scannedEvent();
        EXPECT_THAT(clipNames(event), ElementsAre("Jun 1, " + year + ", 00:00:00"));
        EXPECT_EQ(attributesText(*event),
                  "2012, +" + year + "-06-01T00:00:00Z to +" + year + "-06-01T00:00:00Z");
    }
}

TEST_F(EventScanTest, YearBeyond9999WithoutACreationDateCountsAsMinusOne) {
    sortOldestFirst();
    setExtendedAttribute(addClipMadeAt("Trip/a.mov", ""), "user.date", "12000-06-01 00;00;00");
    EXPECT_EQ(attributesText(*scannedEvent()), "-1, +12000-06-01T00:00:00Z to none");
}

TEST_F(EventScanTest, SecondScanMakesNewGroupsAndForgetsWhatIsGone) {
    addClip("A/a.mov", "2008-06-01 00;00;00");
    addClip("B/b.mov", "2009-06-01 00;00;00");
    const auto first = scan();
    home().remove(inLibrary("A"));
    addClip("B/c.mov", "2010-06-01 00;00;00");
    const auto second = scan();
    EXPECT_NE(first, second);
    EXPECT_THAT(names(first->childGroups()), ElementsAre("A", "B"));
    EXPECT_THAT(names(second->childGroups()), ElementsAre("B"));
    EXPECT_THAT(clipNames(second), ElementsAre("Jun 1, 2009, 00:00:00", "Jun 1, 2010, 00:00:00"));
}

}  // namespace
}  // namespace testing_support
