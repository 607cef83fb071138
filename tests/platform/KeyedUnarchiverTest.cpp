#include "platform/KeyedUnarchiver.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <thread>

#include "platform/PropertyList.h"

using namespace platform;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

Data contentOf(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    const std::string text{std::istreambuf_iterator<char>(file), {}};
    EXPECT_FALSE(text.empty()) << path;
    const auto bytes = std::as_bytes(std::span(text));
    return {bytes.begin(), bytes.end()};
}

std::unique_ptr<ByteSource> sample(const std::string& name) {
    return std::make_unique<MemoryByteSource>(contentOf(VEXO_SAMPLES_DIR "/archives/" + name + ".plist"),
                                              name);
}

Value uid(int number) {
    return Dictionary{{"CF$UID", number}};
}

// Objects 1 and 2 are the classes NSDictionary and Thing; the ones given follow from 3 on, which is the root.
Dictionary archiveOf(const Array& objects) {
    Array all{"$null", Dictionary{{"$classname", "NSDictionary"}, {"$classes", Array{"NSDictionary"}}},
              Dictionary{{"$classname", "Thing"}, {"$classes", Array{"Thing", "Base"}}}};
    all.insert(all.end(), objects.begin(), objects.end());
    return {{"$archiver", "NSKeyedArchiver"},
            {"$version", 100000},
            {"$objects", all},
            {"$top", Dictionary{{"root", uid(3)}}}};
}

Dictionary dictionaryOf(const Array& keys, const Array& values) {
    return {{"$class", uid(1)}, {"NS.keys", keys}, {"NS.objects", values}};
}

std::unique_ptr<ByteSource> sourceOf(const Value& archive) {
    return std::make_unique<MemoryByteSource>(dataWithPropertyList(archive, PropertyListFormat::binary),
                                              "a/b");
}

// What an object of an unknown class is decoded to: it remembers what its own keys hold.
class Thing final : public ArchivedObject {
  public:
    explicit Thing(KeyedUnarchiver& coder) : coder_(coder), name_(coder.decodeObjectForKey("name")) {}

    std::string description() const override { return name_ ? name_->description() : "nameless"; }
    ArchivedObjectRef objectForKey(std::string_view) const override { return coder_.reject("a thing"); }

  private:
    KeyedUnarchiver& coder_;
    const ArchivedObjectRef name_;
};

// Answers one class for every unknown one and remembers what it was asked.
class Delegate final : public KeyedUnarchiverDelegate {
  public:
    explicit Delegate(ArchivedClass answer = [](KeyedUnarchiver& coder) -> ArchivedObjectRef {
        return std::make_shared<Thing>(coder);
    })
        : answer_(answer) {}

    ArchivedClass cannotDecodeObjectOfClassName(KeyedUnarchiver& unarchiver, std::string_view className,
                                                const std::vector<std::string>& originalClasses) override {
        asker = &unarchiver;
        classNames.emplace_back(className);
        ancestors = originalClasses;
        return answer_;
    }

    KeyedUnarchiver* asker = nullptr;
    std::vector<std::string> classNames;
    std::vector<std::string> ancestors;

  private:
    const ArchivedClass answer_;
};

// The text of the ArchiveError that `step` raises.
std::string errorOf(const std::function<void()>& step) {
    try {
        step();
    } catch (const ArchiveError& error) {
        return error.what();
    }
    return "no error";
}

std::string errorOfRoot(const Value& archive) {
    return errorOf([&] { KeyedUnarchiver(sourceOf(archive), nullptr).decodeObjectForKey("root"); });
}

// Collects what a scope is told.
class Reports {
  public:
    RejectedArchivesAsUnreadable::Report reporter() const {
        return [](const ArchiveError& error, void* self) {
            static_cast<Reports*>(self)->texts.push_back(error.what());
        };
    }
    std::vector<std::string> texts;
};

// Counts what is read of the bytes beneath, and may lose their end.
class WatchedSource final : public ByteSource {
  public:
    struct Watch {
        std::uint64_t reads = 0;
        std::uint64_t bytes = 0;
        std::uint64_t readableSize = ~std::uint64_t{0};
    };
    WatchedSource(Data bytes, Watch& watch) : memory_(std::move(bytes), "watched"), watch_(watch) {}

    std::uint64_t size() const override { return memory_.size(); }
    std::string name() const override { return memory_.name(); }
    [[nodiscard]] bool read(std::uint64_t offset, std::span<std::byte> buffer) override {
        ++watch_.reads;
        watch_.bytes += buffer.size();
        return offset + buffer.size() <= watch_.readableSize && memory_.read(offset, buffer);
    }

  private:
    MemoryByteSource memory_;
    Watch& watch_;
};

// A project's document with a trailer and as many clips as asked for, each with a name of 60 bytes.
Data projectDocument(int clipCount) {
    Array clips;
    Array objects{dictionaryOf({uid(4), uid(5)}, {uid(6), uid(7)}),
                  "clips",
                  "editInfo",
                  dictionaryOf({}, {}),
                  dictionaryOf({uid(8)}, {uid(9)}),
                  "trailer",
                  "Sunset"};
    for (int clip = 0; clip < clipCount; ++clip) {
        clips.push_back(uid(static_cast<int>(objects.size()) + 3));
        objects.push_back(std::string(50, 'x') + std::to_string(1000000000 + clip));
    }
    objects[3] = dictionaryOf(clips, clips);
    return dataWithPropertyList(archiveOf(objects), PropertyListFormat::binary);
}

std::string trailerOf(KeyedUnarchiver& unarchiver) {
    const ArchivedObjectRef info = unarchiver.decodeObjectForKey("root")->objectForKey("editInfo");
    const ArchivedObjectRef trailer = info->objectForKey("trailer");
    return trailer ? trailer->description() : "no trailer";
}

std::string trailerOfSample(const std::string& name) {
    KeyedUnarchiver unarchiver(sample(name), nullptr);
    return trailerOf(unarchiver);
}

std::string bigEndian(std::uint64_t number, int width) {
    std::string text;
    for (int i = width; i-- > 0;)
        text += static_cast<char>(number >> (8 * i));
    return text;
}

}  // namespace

TEST(KeyedUnarchiver, ReachesTheTrailerOfAProject) {
    EXPECT_EQ(trailerOfSample("with-trailer"), "{theme = Grüße \U0001F3AC; }");
    EXPECT_EQ(trailerOfSample("with-trailer-xml"), "{theme = Grüße \U0001F3AC; }");
    EXPECT_EQ(trailerOfSample("without-trailer"), "no trailer");
}

TEST(KeyedUnarchiver, ANilEntryCountsAsAbsent) {
    EXPECT_EQ(trailerOfSample("nil-trailer"), "no trailer");
}

TEST(KeyedUnarchiver, AKeyThatIsMissingDecodesAsNil) {
    KeyedUnarchiver unarchiver(sample("with-trailer"), nullptr);
    EXPECT_EQ(unarchiver.decodeObjectForKey("leaf"), nullptr);
    EXPECT_EQ(unarchiver.decodeObjectForKey("root")->objectForKey("leaf"), nullptr);
}

TEST(KeyedUnarchiver, WhatIsReadDoesNotGrowWithTheDocument) {
    std::map<int, WatchedSource::Watch> watches;
    const Data small = projectDocument(600);
    const Data large = projectDocument(60000);
    ASSERT_LT(small.size(), 60'000u);
    ASSERT_GT(large.size(), 5'000'000u);
    for (const Data* document : {&small, &large}) {
        WatchedSource::Watch& watch = watches[document == &large];
        KeyedUnarchiver unarchiver(std::make_unique<WatchedSource>(*document, watch), nullptr);
        EXPECT_EQ(trailerOf(unarchiver), "Sunset");
    }
    EXPECT_LE(watches[1].reads, 2 * watches[0].reads);
    EXPECT_LE(watches[1].bytes, 2 * watches[0].bytes);
    RecordProperty("readsOfSmall", std::to_string(watches[0].reads) + "/" + std::to_string(watches[0].bytes));
    RecordProperty("readsOfLarge", std::to_string(watches[1].reads) + "/" + std::to_string(watches[1].bytes));
}

TEST(KeyedUnarchiver, SharedReferencesAreOneObject) {
    KeyedUnarchiver unarchiver(sample("shared"), nullptr);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_NE(root->objectForKey("one"), nullptr);
    EXPECT_EQ(root->objectForKey("one"), root->objectForKey("other"));
    EXPECT_EQ(unarchiver.decodeObjectForKey("root"), root);
}

TEST(KeyedUnarchiver, ADictionaryMayHoldItself) {
    KeyedUnarchiver unarchiver(sample("cyclic"), nullptr);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_EQ(root->objectForKey("self"), root);
    EXPECT_THAT(root->description(), HasSubstr("{self = {self = "));
    EXPECT_THAT(root->description(), HasSubstr("{self = …; name = circle; }"));
}

TEST(KeyedUnarchiver, KeysMayBeStringObjectsAndShared) {
    KeyedUnarchiver unarchiver(sample("string-keys"), nullptr);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_EQ(root->objectForKey("editInfo")->objectForKey("editInfo")->description(), "inner");
    EXPECT_EQ(root->objectForKey("größe")->description(), "by bytes");
}

TEST(KeyedUnarchiver, DecodesTheClassesOfPlainValues) {
    KeyedUnarchiver unarchiver(sample("values"), nullptr);
    EXPECT_EQ(
        unarchiver.decodeObjectForKey("root")->description(),
        "{array = (a, 2); set = (a, 2); date = 2001-01-01T00:00:00Z; data = {length = 2, bytes = 0x00ff}; "
        "true = 1; integer = -7; real = 0.1; boxed = 12; null = <null>; url = file:///a; "
        "uuid = 00010203-0405-0607-0809-0A0B0C0D0E0F; }");
}

TEST(KeyedUnarchiver, ReadsArchivesOfAnotherLibrary) {
    for (const std::string name : {"foreign", "foreign-xml"}) {
        Delegate delegate;
        KeyedUnarchiver unarchiver(sample(name), &delegate);
        const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
        const std::map<std::string, std::string> expected{
            {"list", "(7, 1.5, 1, <null>)"},
            {"unknown", "a thing"},
            {"set", "(one)"},
            {"mutableString", "changeable"},
            {"text", "Grüße"},
            {"data", "{length = 5, bytes = 0x68656c6c6f}"},
            {"url", "http://example.org/"},
        };
        for (const auto& [key, description] : expected)
            EXPECT_EQ(root->objectForKey(key)->description(), description) << name;
        EXPECT_EQ(root->objectForKey("editInfo"), root->objectForKey("sameEditInfo"));
        EXPECT_EQ(root->objectForKey("editInfo")->objectForKey("trailer")->description(), "yes");
        EXPECT_EQ(root->objectForKey("editInfo")->objectForKey("date")->description(),
                  "2001-01-02T00:00:00Z");
        EXPECT_THAT(delegate.classNames, ElementsAre("Unknown"));
    }
}

TEST(KeyedUnarchiver, LongCollectionsAreDescribedInPart) {
    Array keys;
    for (int i = 0; i < 20000; ++i)
        keys.push_back(uid(4));
    KeyedUnarchiver unarchiver(sourceOf(archiveOf({dictionaryOf(keys, keys), "text"})), nullptr);
    const std::string description = unarchiver.decodeObjectForKey("root")->description();
    EXPECT_TRUE(description.ends_with("text = text; …}"));
    EXPECT_LT(description.size(), 200'000u);
    EXPECT_EQ(unarchiver.decodeObjectForKey("root")->description(), description);
}

TEST(KeyedUnarchiver, LongDataIsDescribedInPart) {
    KeyedUnarchiver unarchiver(sourceOf(archiveOf({Data(1000, std::byte{0xAB})})), nullptr);
    std::string digits;
    for (int i = 0; i < 24; ++i)
        digits += "ab";
    EXPECT_EQ(unarchiver.decodeObjectForKey("root")->description(),
              "{length = 1000, bytes = 0x" + digits + "…}");
}

TEST(KeyedUnarchiver, UnknownClassesAreLeftToTheDelegate) {
    Delegate delegate;
    KeyedUnarchiver unarchiver(sample("unknown-class"), &delegate);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_THAT(delegate.classNames, IsEmpty());
    const ArchivedObjectRef thing = root->objectForKey("thing");
    EXPECT_THAT(delegate.classNames, ElementsAre("RLXThing"));
    EXPECT_THAT(delegate.ancestors, ElementsAre("RLXThing", "RLXBase", "NSObject"));
    EXPECT_EQ(delegate.asker, &unarchiver);
    EXPECT_EQ(thing->description(), "a thing");
    EXPECT_EQ(root->objectForKey("thing"), thing);
    EXPECT_EQ(delegate.classNames.size(), 1u);
}

TEST(KeyedUnarchiver, AnUnknownClassThatNobodyTakesIsRejected) {
    Delegate refusing(nullptr);
    for (KeyedUnarchiverDelegate* delegate :
         {static_cast<KeyedUnarchiverDelegate*>(nullptr), static_cast<KeyedUnarchiverDelegate*>(&refusing)}) {
        KeyedUnarchiver unarchiver(sample("unknown-class"), delegate);
        const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
        EXPECT_EQ(errorOf([&] { root->objectForKey("thing"); }),
                  "unknown-class: the class RLXThing is unknown");
        EXPECT_EQ(root->objectForKey("plain")->description(), "plain");
    }
}

TEST(KeyedUnarchiver, AClassMayMakeNothing) {
    Delegate delegate([](KeyedUnarchiver&) -> ArchivedObjectRef { return nullptr; });
    KeyedUnarchiver unarchiver(sample("unknown-class"), &delegate);
    EXPECT_EQ(unarchiver.decodeObjectForKey("root")->objectForKey("thing"), nullptr);
}

TEST(KeyedUnarchiver, AfterAClassFailedTopLevelKeysAreDecodedAgain) {
    Delegate delegate(
        [](KeyedUnarchiver&) -> ArchivedObjectRef { throw std::logic_error("the class's own"); });
    KeyedUnarchiver unarchiver(sample("unknown-class"), &delegate);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_THROW(root->objectForKey("thing"), std::logic_error);
    EXPECT_EQ(unarchiver.decodeObjectForKey("root"), root);
}

TEST(KeyedUnarchiver, AnObjectThatIsNeededToMakeItselfIsRejected) {
    Delegate delegate;
    const Dictionary thing{{"$class", uid(2)}, {"name", uid(3)}};
    KeyedUnarchiver unarchiver(sourceOf(archiveOf({thing})), &delegate);
    EXPECT_EQ(errorOf([&] { unarchiver.decodeObjectForKey("root"); }),
              "a/b: an object of the class Thing is needed to make itself");
}

TEST(KeyedUnarchiver, ObjectsOfUnknownClassesMayNestButNotWithoutEnd) {
    const auto chain = [](int length) {
        Array things;
        for (int i = 0; i < length; ++i)
            things.push_back(Dictionary{{"$class", uid(2)}, {"name", uid(4 + i)}});
        things.push_back("end");
        return archiveOf(things);
    };
    Delegate delegate;
    KeyedUnarchiver shortOne(sourceOf(chain(500)), &delegate);
    EXPECT_EQ(shortOne.decodeObjectForKey("root")->description(), "end");
    KeyedUnarchiver longOne(sourceOf(chain(600)), &delegate);
    EXPECT_EQ(errorOf([&] { longOne.decodeObjectForKey("root"); }), "a/b: objects are nested too deeply");
}

TEST(KeyedUnarchiver, AskingAnythingButADictionaryForAKeyRaises) {
    KeyedUnarchiver text(sample("root-is-text"), nullptr);
    EXPECT_EQ(errorOf([&] { text.decodeObjectForKey("root")->objectForKey("editInfo"); }),
              "root-is-text: an object is asked for its key editInfo and is no dictionary");
    KeyedUnarchiver values(sample("values"), nullptr);
    const ArchivedObjectRef root = values.decodeObjectForKey("root");
    for (const char* key : {"array", "set", "date", "data", "true", "boxed", "null", "url", "uuid"})
        EXPECT_THROW(root->objectForKey(key)->objectForKey("x"), ArchiveError) << key;
}

TEST(KeyedUnarchiver, WhatIsNoKeyedArchiveIsRejectedWhenItIsOpened) {
    const std::map<std::string, std::string> expected{
        {"truncated", "the trailer is damaged"},    {"trailing-garbage", "the trailer is damaged"},
        {"self-reference", "no keyed archive"},     {"other-archiver", "made by an unknown archiver"},
        {"other-version", "of an unknown version"},
    };
    for (const auto& [name, problem] : expected)
        EXPECT_EQ(errorOf([&, &file = name] { KeyedUnarchiver(sample(file), nullptr); }),
                  name + ": " + problem);
    EXPECT_EQ(errorOf([] { KeyedUnarchiver(std::make_unique<MemoryByteSource>(Data{}, "e"), nullptr); }),
              "e: there is no value");
}

TEST(KeyedUnarchiver, AnArchiveWithoutItsPartsIsRejectedWhenItIsOpened) {
    for (const char* key : {"$archiver", "$version", "$objects", "$top"}) {
        Dictionary archive = archiveOf({"x"});
        archive.erase(key);
        EXPECT_EQ(errorOfRoot(archive),
                  std::string("a/b: no keyed archive, or damaged: ") + key + " is missing");
        archive.emplace(key, 0.5);
        EXPECT_EQ(errorOfRoot(archive),
                  std::string("a/b: no keyed archive, or damaged: ") + key + " is of the wrong kind");
    }
}

TEST(KeyedUnarchiver, DamagedObjectsAreRejectedWhenTheyAreReached) {
    const auto rootError = [](const Value& root, const Value& other = "x") {
        return errorOfRoot(archiveOf({root, other}));
    };
    EXPECT_EQ(rootError(uid(4)), "a/b: an object is of the wrong kind");
    EXPECT_EQ(rootError(Array{}), "a/b: an object is of the wrong kind");
    EXPECT_EQ(rootError(Dictionary{{"key", "value"}}),
              "a/b: no keyed archive, or damaged: $class is missing");
    EXPECT_EQ(rootError(Dictionary{{"$class", uid(99)}}), "a/b: a reference leads to no object");
    EXPECT_EQ(rootError(Dictionary{{"$class", uid(4)}}),
              "a/b: no keyed archive, or damaged: $class is of the wrong kind");
    EXPECT_EQ(rootError(Dictionary{{"$class", uid(4)}}, Dictionary{}),
              "a/b: no keyed archive, or damaged: $classname is missing");
    EXPECT_EQ(rootError(Dictionary{{"$class", uid(4)}}, Dictionary{{"$classname", std::string(2000, 'x')}}),
              "a/b: a class's name is damaged");
    EXPECT_EQ(rootError(Dictionary{{"$class", uid(4)}},
                        Dictionary{{"$classname", "X"}, {"$classes", Array(100, "X")}}),
              "a/b: a class's list of its ancestors is damaged");
    EXPECT_EQ(
        rootError(Dictionary{{"$class", uid(4)}}, Dictionary{{"$classname", "X"}, {"$classes", Array{1}}}),
        "a/b: a class's name is damaged");
    EXPECT_EQ(rootError(Dictionary{{"$class", uid(1)}}),
              "a/b: no keyed archive, or damaged: NS.keys is missing");
    EXPECT_EQ(rootError(dictionaryOf({uid(4)}, {})), "a/b: a dictionary has not as many keys as values");
    const struct {
        const char* className;
        Dictionary fields;
    } cases[] = {
        {"NSArray", {}},
        {"NSArray", {{"NS.objects", "x"}}},
        {"NSString", {}},
        {"NSString", {{"NS.string", 1}}},
        {"NSString", {{"NS.bytes", "text"}}},
        {"NSDate", {}},
        {"NSDate", {{"NS.time", "now"}}},
        {"NSNumber", {{"NS.intval", "1"}}},
        {"NSData", {{"NS.data", "x"}}},
        {"NSURL", {}},
        {"NSUUID", {{"NS.uuidbytes", Data(15)}}},
    };
    for (Dictionary fields; const auto& [className, given] : cases) {
        fields = given;
        fields.emplace("$class", uid(4));
        EXPECT_THAT(rootError(fields, Dictionary{{"$classname", className}}), testing::StartsWith("a/b: "))
            << className;
        EXPECT_NE(rootError(fields, Dictionary{{"$classname", className}}),
                  std::string("a/b: the class ") + className + " is unknown");
    }
}

TEST(KeyedUnarchiver, DamagedEntriesAreRejectedWhenTheyAreReached) {
    KeyedUnarchiver unarchiver(
        sourceOf(archiveOf(
            {dictionaryOf({uid(4), uid(5), uid(99)}, {uid(99), "inline", uid(4)}), "far", "inline"})),
        nullptr);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_EQ(errorOf([&] { root->objectForKey("far"); }), "a/b: a reference leads to no object");
    EXPECT_EQ(errorOf([&] { root->objectForKey("inline"); }),
              "a/b: something else stands in place of a reference");
    EXPECT_EQ(errorOf([&] { root->objectForKey("other"); }), "a/b: a reference leads to no object");
    EXPECT_EQ(errorOf([&] { std::ignore = root->description(); }), "a/b: a reference leads to no object");
}

TEST(KeyedUnarchiver, AQuestionThatReadsTooManyObjectsIsRejected) {
    // A dictionary of 700,000 times the same key, none of which is the one asked for.
    constexpr std::uint64_t count = 700'000;
    const std::string many = "\xAF\x12" + bigEndian(count, 4) + std::string(count, '\x0D');
    const std::vector<std::string> parts{
        std::string("\xD4\x01\x02\x03\x04\x05\x06\x07\x08"),  // 0: the archive
        "\x59$archiver",
        "\x58$version",
        "\x58$objects",
        "\x54$top",  // 1 to 4
        "\x5FX",
        "\x12" + bigEndian(100000, 4),   // 5, 6
        "\xA4\x09\x0A\x0B\x09",          // 7: a text, the root, its class, a text
        "\xD1\x0C\x0D",                  // 8: the top
        "\x51x",                         // 9
        "\xD3\x0E\x0F\x10\x11\x12\x12",  // 10: the root
        "\xD1\x13\x14",                  // 11: the class
        "\x54root",
        std::string("\x80\x01"),  // 12, 13
        "\x56$class",
        "\x57NS.keys",
        "\x5ANS.objects",  // 14 to 16
        "\x80\x02",
        many,  // 17, 18
        "\x5A$classname",
        "\x5C"
        "NSDictionary",  // 19, 20
    };
    std::string file = "bplist00";
    std::string table;
    for (std::string part : parts) {
        if (part == "\x5FX")
            part = "\x5F\x10\x0FNSKeyedArchiver";
        table += bigEndian(file.size(), 4);
        file += part;
    }
    const std::size_t tableOffset = file.size();
    file += table + std::string(6, '\0') + "\x04\x01" + bigEndian(parts.size(), 8) + bigEndian(0, 8) +
            bigEndian(tableOffset, 8);
    const auto bytes = std::as_bytes(std::span(file));
    KeyedUnarchiver unarchiver(std::make_unique<MemoryByteSource>(Data(bytes.begin(), bytes.end()), "big"),
                               nullptr);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    EXPECT_EQ(errorOf([&] { root->objectForKey("x"); }), "big: too many objects have to be read");
}

TEST(KeyedUnarchiver, ADocumentThatIsTruncatedWhileOpenIsRejected) {
    WatchedSource::Watch watch;
    KeyedUnarchiver unarchiver(std::make_unique<WatchedSource>(projectDocument(3000), watch), nullptr);
    watch.readableSize = 0;
    EXPECT_EQ(errorOf([&] { trailerOf(unarchiver); }), "watched: the file can't be read to its end");

    EXPECT_EQ(errorOf([&] {
                  KeyedUnarchiver(std::make_unique<WatchedSource>(projectDocument(1), watch), nullptr);
              }),
              "watched: the file can't be read to its end");
}

TEST(KeyedUnarchiver, ObjectsStayUsableWhenDecodingIsFinished) {
    KeyedUnarchiver unarchiver(sample("with-trailer"), nullptr);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    unarchiver.finishDecoding();
    EXPECT_NE(root->objectForKey("editInfo")->objectForKey("trailer"), nullptr);
    EXPECT_EQ(errorOf([&] { unarchiver.decodeObjectForKey("root"); }),
              "with-trailer: decoding has been finished");
}

TEST(RejectedArchives, AreReportedOnceAndDecodeAsNilWithinAScope) {
    Reports reports;
    const RejectedArchivesAsUnreadable scope(reports.reporter(), &reports);
    KeyedUnarchiver unarchiver(sample("truncated"), nullptr);
    EXPECT_THAT(reports.texts, ElementsAre("truncated: the trailer is damaged"));
    EXPECT_EQ(unarchiver.decodeObjectForKey("root"), nullptr);
    EXPECT_EQ(unarchiver.decodeObjectForKey("other"), nullptr);
    EXPECT_EQ(reports.texts.size(), 1u);
}

TEST(RejectedArchives, AnswerNilFromTheFirstErrorOn) {
    Reports reports;
    Delegate delegate;
    const RejectedArchivesAsUnreadable scope(reports.reporter(), &reports);
    KeyedUnarchiver unarchiver(sample("unknown-class"), &delegate);
    const ArchivedObjectRef root = unarchiver.decodeObjectForKey("root");
    const ArchivedObjectRef thing = root->objectForKey("thing");
    EXPECT_EQ(root->objectForKey("plain")->objectForKey("x"), nullptr);
    EXPECT_THAT(reports.texts, ElementsAre(HasSubstr("its key x and is no dictionary")));
    EXPECT_EQ(thing->objectForKey("x"), nullptr);
    EXPECT_EQ(root->objectForKey("plain"), nullptr);
    EXPECT_EQ(root->description(), "");
    EXPECT_EQ(unarchiver.decodeObjectForKey("root"), nullptr);
    EXPECT_EQ(reports.texts.size(), 1u);
}

TEST(RejectedArchives, DecodeAsNilWhenTheErrorWasInsideAClass) {
    Reports reports;
    Delegate delegate;
    const RejectedArchivesAsUnreadable scope(reports.reporter(), &reports);
    KeyedUnarchiver unarchiver(sourceOf(archiveOf({Dictionary{{"$class", uid(2)}, {"name", uid(99)}}})),
                               &delegate);
    EXPECT_EQ(unarchiver.decodeObjectForKey("root"), nullptr);
    EXPECT_THAT(reports.texts, ElementsAre("a/b: a reference leads to no object"));
}

TEST(RejectedArchives, RaiseAgainWhenTheScopeHasEnded) {
    Reports reports;
    std::unique_ptr<KeyedUnarchiver> unarchiver;
    {
        const RejectedArchivesAsUnreadable scope(reports.reporter(), &reports);
        unarchiver = std::make_unique<KeyedUnarchiver>(sample("truncated"), nullptr);
    }
    EXPECT_EQ(errorOf([&] { unarchiver->decodeObjectForKey("root"); }), "truncated: the trailer is damaged");
    EXPECT_EQ(reports.texts.size(), 1u);
}

TEST(RejectedArchives, AreEachReportedToTheInnermostScope) {
    Reports outerReports;
    Reports innerReports;
    const RejectedArchivesAsUnreadable outer(outerReports.reporter(), &outerReports);
    {
        const RejectedArchivesAsUnreadable inner(innerReports.reporter(), &innerReports);
        KeyedUnarchiver(sample("truncated"), nullptr);
    }
    KeyedUnarchiver(sample("other-version"), nullptr);
    EXPECT_THAT(innerReports.texts, ElementsAre(HasSubstr("truncated")));
    EXPECT_THAT(outerReports.texts, ElementsAre(HasSubstr("other-version")));
}

TEST(RejectedArchives, AScopeCountsForItsOwnThreadAlone) {
    Reports reports;
    const RejectedArchivesAsUnreadable scope(reports.reporter(), &reports);
    std::string error;
    std::thread([&] { error = errorOf([] { KeyedUnarchiver(sample("truncated"), nullptr); }); }).join();
    EXPECT_EQ(error, "truncated: the trailer is damaged");
    EXPECT_THAT(reports.texts, IsEmpty());
}

TEST(RejectedArchives, HealthyArchivesAreReadAsEverWithinAScope) {
    Reports reports;
    const RejectedArchivesAsUnreadable scope(reports.reporter(), &reports);
    EXPECT_EQ(trailerOfSample("with-trailer"), "{theme = Grüße \U0001F3AC; }");
    EXPECT_THAT(reports.texts, IsEmpty());
}
