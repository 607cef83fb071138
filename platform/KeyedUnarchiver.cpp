#include "platform/KeyedUnarchiver.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <unordered_map>

#include "platform/BinaryPropertyList.h"
#include "platform/Date.h"
#include "platform/PropertyListWriters.h"
#include "platform/XMLPropertyList.h"

namespace platform {

namespace {

using Kind = BinaryPropertyList::Kind;
using Content = BinaryPropertyList::Object;
using ObjectNumber = std::uint64_t;

constexpr ObjectNumber nilObject = 0;
constexpr std::int64_t knownVersion = 100000;
constexpr int deepestCall = 512;
// Objects of the property list that one call may read; a dictionary takes about four for each entry that is
// passed by.
constexpr std::uint64_t mostVisits = std::uint64_t{1} << 21;
constexpr std::uint64_t longestClassName = 1024;
constexpr std::uint64_t mostAncestors = 64;
constexpr int deepestDescription = 16;
constexpr std::size_t longestDescription = 64 * 1024;  // of a collection
constexpr std::string_view ellipsis = "…";

thread_local RejectedArchivesAsUnreadable* innermostScope = nullptr;

bool isBinary(ByteSource& source) {
    std::array<char, BinaryPropertyList::signature.size()> start;
    return source.size() >= start.size() && source.read(0, std::as_writable_bytes(std::span(start))) &&
           std::string_view(start.data(), start.size()).starts_with("bplist");
}

// XML is turned into the binary form, so that there is one way to find objects.
std::unique_ptr<ByteSource> binarySource(std::unique_ptr<ByteSource> source) {
    if (isBinary(*source))
        return source;
    return std::make_unique<MemoryByteSource>(binaryPropertyList(readXMLPropertyList(*source)),
                                              source->name());
}

struct ClassDescription {
    std::string name;
    std::vector<std::string> ancestors;  // itself first
};

}  // namespace

// The archive beneath an unarchiver. Functions that raise do so with PropertyListError, save for what a class
// of the delegate's raises; `attempt` turns either into what callers see.
struct KeyedUnarchiver::Implementation {
    Implementation(KeyedUnarchiver& unarchiver, std::unique_ptr<ByteSource> bytes,
                   KeyedUnarchiverDelegate* itsDelegate);

    // Runs one step that callers asked for. When it raises, either ArchiveError goes to the caller or, within
    // a scope that takes errors, the archive is rejected and the answer is nil.
    template <typename Step>
    auto attempt(Step step) -> decltype(step());
    void reject(const ArchiveError& error);

    void open();
    ArchivedObjectRef decode(std::string_view key);

    // The value of an entry that has to be there and of this kind.
    Content required(const Content& dictionary, std::string_view key, Kind kind);
    // What stands under a number.
    Content archived(ObjectNumber number);
    // The object that a reference names, or what stands in place of a reference.
    Content resolved(const Content& content);
    ObjectNumber numberOf(const Content& reference);

    ArchivedObjectRef object(const Content& reference);
    ArchivedObjectRef make(ObjectNumber number);
    ArchivedObjectRef makeOfClass(ObjectNumber number, const Content& content);
    ArchivedObjectRef makeByDelegate(ObjectNumber number, const Content& content,
                                     const ClassDescription& type);

    Content classOf(const Content& content);
    ClassDescription classDescription(const Content& content);
    std::string className(const Content& name);
    bool isKey(const Content& reference, std::string_view key);
    bool isString(const Content& content);
    Content textOfString(const Content& content);

    // The description of one more object of a collection.
    std::string descriptionOfElement(const Content& reference);
    bool mayDescribeMore() const { return describedBytes < longestDescription; }

    // An object that a class of the delegate's is making.
    struct Making {
        ObjectNumber number;
        Content content;
    };

    KeyedUnarchiver& owner;
    const std::string sourceName;
    KeyedUnarchiverDelegate* const delegate;

    std::unique_ptr<ByteSource> source;
    std::optional<BinaryPropertyList> list;
    Content objects;
    Content top;
    std::unordered_map<ObjectNumber, ArchivedObjectRef> decoded;
    std::vector<Making> makings;
    std::optional<ArchiveError> rejection;
    bool isFinished = false;

    int callDepth = 0;
    int descriptionDepth = 0;
    std::size_t describedBytes = 0;
};

namespace {

using Archive = KeyedUnarchiver::Implementation;

// One question to an archive. Classes that ask while they are being asked nest; all together share one
// allowance.
class Call {
  public:
    explicit Call(Archive& archive) : archive_(archive) {
        if (archive.callDepth >= deepestCall)
            throw PropertyListError("objects are nested too deeply");
        if (archive.callDepth++ > 0)
            return;
        archive.list->allowVisits(mostVisits);
        archive.describedBytes = 0;
    }
    ~Call() { --archive_.callDepth; }
    Call(const Call&) = delete;
    Call& operator=(const Call&) = delete;

  private:
    Archive& archive_;
};

// Counts one level of nesting for the length of a scope.
class Nested {
  public:
    explicit Nested(int& depth) : depth_(depth) { ++depth_; }
    ~Nested() { --depth_; }
    Nested(const Nested&) = delete;
    Nested& operator=(const Nested&) = delete;

  private:
    int& depth_;
};

// Holds an element in a list for the length of a scope.
template <typename T>
class Pushed {
  public:
    Pushed(std::vector<T>& list, T element) : list_(list) { list_.push_back(std::move(element)); }
    ~Pushed() { list_.pop_back(); }
    Pushed(const Pushed&) = delete;
    Pushed& operator=(const Pushed&) = delete;

  private:
    std::vector<T>& list_;
};

std::string descriptionOfNumber(const Value& number) {
    if (const bool* truth = number.boolean())
        return *truth ? "1" : "0";
    if (const std::int64_t* integer = number.integer())
        return fmt::format("{}", *integer);
    return fmt::format("{}", *number.real());
}

std::string descriptionOfData(const Data& data) {
    constexpr std::size_t mostShown = 24;
    std::string digits;
    for (const std::byte byte : std::span(data).first(std::min(data.size(), mostShown)))
        digits += fmt::format("{:02x}", std::to_integer<unsigned>(byte));
    return fmt::format("{{length = {}, bytes = 0x{}{}}}", data.size(), digits,
                       data.size() > mostShown ? ellipsis : "");
}

std::string descriptionOfUUID(const Data& data) {
    std::string text;
    for (std::size_t i = 0; i < data.size(); ++i) {
        const bool beginsGroup = i == 4 || i == 6 || i == 8 || i == 10;
        text += fmt::format("{}{:02X}", beginsGroup ? "-" : "", std::to_integer<unsigned>(data[i]));
    }
    return text;
}

// An object of a class that is decoded here.
class DecodedObject : public ArchivedObject {
  public:
    explicit DecodedObject(Archive& archive) : archive_(archive) {}

  protected:
    Archive& archive_;
};

class TextObject final : public DecodedObject {
  public:
    TextObject(Archive& archive, const Content& text) : DecodedObject(archive), text_(text) {}
    std::string description() const override {
        return archive_.attempt([this] { return archive_.list->text(text_); });
    }

  private:
    const Content text_;
};

class DataObject final : public DecodedObject {
  public:
    DataObject(Archive& archive, const Content& data) : DecodedObject(archive), data_(data) {}
    std::string description() const override {
        return archive_.attempt([this] { return descriptionOfData(archive_.list->data(data_)); });
    }

  private:
    const Content data_;
};

// An object of which nothing but its short description is ever asked.
class DescribedObject final : public DecodedObject {
  public:
    DescribedObject(Archive& archive, std::string description)
        : DecodedObject(archive), description_(std::move(description)) {}
    std::string description() const override { return description_; }

  private:
    const std::string description_;
};

class ListObject final : public DecodedObject {
  public:
    ListObject(Archive& archive, const Content& elements) : DecodedObject(archive), elements_(elements) {}
    std::string description() const override {
        return archive_.attempt([this] { return describe(); });
    }

  private:
    std::string describe() const {
        if (archive_.descriptionDepth >= deepestDescription)
            return std::string(ellipsis);
        const Call call(archive_);
        std::string text;
        for (std::uint64_t i = 0; i < elements_.count; ++i) {
            text += i > 0 ? ", " : "";
            if (!archive_.mayDescribeMore())
                return fmt::format("({}{})", text, ellipsis);
            text += archive_.descriptionOfElement(archive_.list->element(elements_, i));
        }
        return fmt::format("({})", text);
    }

    const Content elements_;
};

class DictionaryObject final : public DecodedObject {
  public:
    DictionaryObject(Archive& archive, const Content& keys, const Content& values)
        : DecodedObject(archive), keys_(keys), values_(values) {}

    ArchivedObjectRef objectForKey(std::string_view key) const override {
        return archive_.attempt([&] { return entry(key); });
    }
    std::string description() const override {
        return archive_.attempt([this] { return describe(); });
    }

  private:
    ArchivedObjectRef entry(std::string_view key) const {
        const Call call(archive_);
        for (std::uint64_t i = 0; i < keys_.count; ++i) {
            if (archive_.isKey(archive_.list->element(keys_, i), key))
                return archive_.object(archive_.list->element(values_, i));
        }
        return nullptr;
    }

    std::string describe() const {
        if (archive_.descriptionDepth >= deepestDescription)
            return std::string(ellipsis);
        const Call call(archive_);
        std::string text;
        for (std::uint64_t i = 0; i < keys_.count; ++i) {
            if (!archive_.mayDescribeMore())
                return fmt::format("{{{}{}}}", text, ellipsis);
            text += archive_.descriptionOfElement(archive_.list->element(keys_, i)) + " = ";
            text += archive_.descriptionOfElement(archive_.list->element(values_, i)) + "; ";
        }
        return fmt::format("{{{}}}", text);
    }

    const Content keys_;
    const Content values_;
};

bool isNumber(const Content& content) {
    return content.kind == Kind::boolean || content.kind == Kind::integer || content.kind == Kind::real;
}

// What is archived without a class around it.
ArchivedObjectRef makePlain(Archive& archive, const Content& content) {
    if (content.kind == Kind::text)
        return std::make_shared<TextObject>(archive, content);
    if (content.kind == Kind::data)
        return std::make_shared<DataObject>(archive, content);
    if (isNumber(content))
        return std::make_shared<DescribedObject>(archive, descriptionOfNumber(archive.list->scalar(content)));
    if (content.kind == Kind::date)
        return std::make_shared<DescribedObject>(archive,
                                                 iso8601String(*archive.list->scalar(content).date()));
    throw PropertyListError("an object is of the wrong kind");
}

ArchivedObjectRef makeString(Archive& archive, const Content& content) {
    return std::make_shared<TextObject>(archive, archive.textOfString(content));
}

ArchivedObjectRef makeData(Archive& archive, const Content& content) {
    return std::make_shared<DataObject>(archive, archive.required(content, "NS.data", Kind::data));
}

ArchivedObjectRef makeDate(Archive& archive, const Content& content) {
    const std::optional<Content> time = archive.list->find(content, "NS.time");
    if (!time || !isNumber(*time))
        throw PropertyListError("a date has no time");
    return std::make_shared<DescribedObject>(archive,
                                             iso8601String(Date(*archive.list->scalar(*time).doubleValue())));
}

ArchivedObjectRef makeNumber(Archive& archive, const Content& content) {
    for (const std::string_view key : {"NS.boolval", "NS.intval", "NS.dblval"}) {
        const std::optional<Content> number = archive.list->find(content, key);
        if (number && isNumber(*number))
            return makePlain(archive, *number);
    }
    throw PropertyListError("a number has no value");
}

ArchivedObjectRef makeNull(Archive& archive, const Content&) {
    return std::make_shared<DescribedObject>(archive, "<null>");
}

// A URL that is relative to another is described by its own part.
ArchivedObjectRef makeURL(Archive& archive, const Content& content) {
    return std::make_shared<TextObject>(archive, archive.required(content, "NS.relative", Kind::text));
}

ArchivedObjectRef makeUUID(Archive& archive, const Content& content) {
    const Content bytes = archive.required(content, "NS.uuidbytes", Kind::data);
    if (bytes.count != 16)
        throw PropertyListError("a UUID has the wrong length");
    return std::make_shared<DescribedObject>(archive, descriptionOfUUID(archive.list->data(bytes)));
}

ArchivedObjectRef makeList(Archive& archive, const Content& content) {
    return std::make_shared<ListObject>(archive, archive.required(content, "NS.objects", Kind::array));
}

ArchivedObjectRef makeDictionary(Archive& archive, const Content& content) {
    const Content keys = archive.required(content, "NS.keys", Kind::array);
    const Content values = archive.required(content, "NS.objects", Kind::array);
    if (keys.count != values.count)
        throw PropertyListError("a dictionary has not as many keys as values");
    return std::make_shared<DictionaryObject>(archive, keys, values);
}

struct KnownClass {
    std::string_view name;
    ArchivedObjectRef (*make)(Archive& archive, const Content& content);
};

constexpr KnownClass knownClasses[] = {
    {"NSArray", makeList},
    {"NSData", makeData},
    {"NSDate", makeDate},
    {"NSDictionary", makeDictionary},
    {"NSMutableArray", makeList},
    {"NSMutableData", makeData},
    {"NSMutableDictionary", makeDictionary},
    {"NSMutableSet", makeList},
    {"NSMutableString", makeString},
    {"NSNull", makeNull},
    {"NSNumber", makeNumber},
    {"NSSet", makeList},
    {"NSString", makeString},
    {"NSURL", makeURL},
    {"NSUUID", makeUUID},
};

}  // namespace

KeyedUnarchiver::Implementation::Implementation(KeyedUnarchiver& unarchiver,
                                                std::unique_ptr<ByteSource> bytes,
                                                KeyedUnarchiverDelegate* itsDelegate)
    : owner(unarchiver), sourceName(bytes->name()), delegate(itsDelegate), source(std::move(bytes)) {
    attempt([this] {
        open();
        return true;
    });
}

template <typename Step>
auto KeyedUnarchiver::Implementation::attempt(Step step) -> decltype(step()) {
    try {
        if (rejection)
            throw ArchiveError(*rejection);
        auto answer = step();
        // A class of the delegate's may have gone on after one of its own questions was rejected.
        if (!rejection)
            return answer;
    } catch (const PropertyListError& error) {
        reject(ArchiveError(sourceName, error.what()));
    } catch (const ArchiveError& error) {
        reject(error);
    }
    return {};
}

void KeyedUnarchiver::Implementation::reject(const ArchiveError& error) {
    const RejectedArchivesAsUnreadable* scope = RejectedArchivesAsUnreadable::current();
    if (!scope)
        throw error;
    if (rejection)
        return;
    rejection = error;
    scope->report(error);
}

void KeyedUnarchiver::Implementation::open() {
    source = binarySource(std::move(source));
    list.emplace(*source);
    list->allowVisits(mostVisits);
    const Content archive = list->top();
    if (archive.kind != Kind::dictionary)
        throw PropertyListError("no keyed archive");
    if (!list->isText(required(archive, "$archiver", Kind::text), "NSKeyedArchiver"))
        throw PropertyListError("made by an unknown archiver");
    if (list->scalar(required(archive, "$version", Kind::integer)) != Value(knownVersion))
        throw PropertyListError("of an unknown version");
    objects = required(archive, "$objects", Kind::array);
    top = required(archive, "$top", Kind::dictionary);
}

ArchivedObjectRef KeyedUnarchiver::Implementation::decode(std::string_view key) {
    const Call call(*this);
    if (isFinished)
        throw PropertyListError("decoding has been finished");
    const std::optional<Content> found = list->find(makings.empty() ? top : makings.back().content, key);
    return found ? object(*found) : nullptr;
}

Content KeyedUnarchiver::Implementation::required(const Content& dictionary, std::string_view key,
                                                  Kind kind) {
    const std::optional<Content> found = list->find(dictionary, key);
    if (!found)
        throw PropertyListError(fmt::format("no keyed archive, or damaged: {} is missing", key));
    const Content content = resolved(*found);
    if (content.kind != kind)
        throw PropertyListError(fmt::format("no keyed archive, or damaged: {} is of the wrong kind", key));
    return content;
}

Content KeyedUnarchiver::Implementation::archived(ObjectNumber number) {
    if (number >= objects.count)
        throw PropertyListError("a reference leads to no object");
    return list->element(objects, number);
}

Content KeyedUnarchiver::Implementation::resolved(const Content& content) {
    return content.kind == Kind::uid ? archived(list->uid(content)) : content;
}

ObjectNumber KeyedUnarchiver::Implementation::numberOf(const Content& reference) {
    if (reference.kind != Kind::uid)
        throw PropertyListError("something else stands in place of a reference");
    return list->uid(reference);
}

ArchivedObjectRef KeyedUnarchiver::Implementation::object(const Content& reference) {
    const ObjectNumber number = numberOf(reference);
    if (number == nilObject)
        return nullptr;
    if (const auto known = decoded.find(number); known != decoded.end())
        return known->second;
    ArchivedObjectRef made = make(number);
    if (made)
        made->unarchiver_ = &owner;
    decoded.emplace(number, made);
    return made;
}

ArchivedObjectRef KeyedUnarchiver::Implementation::make(ObjectNumber number) {
    const Content content = archived(number);
    return content.kind == Kind::dictionary ? makeOfClass(number, content) : makePlain(*this, content);
}

ArchivedObjectRef KeyedUnarchiver::Implementation::makeOfClass(ObjectNumber number, const Content& content) {
    const ClassDescription type = classDescription(classOf(content));
    const auto known = std::ranges::find(knownClasses, type.name, &KnownClass::name);
    if (known != std::end(knownClasses))
        return known->make(*this, content);
    return makeByDelegate(number, content, type);
}

ArchivedObjectRef KeyedUnarchiver::Implementation::makeByDelegate(ObjectNumber number, const Content& content,
                                                                  const ClassDescription& type) {
    if (std::ranges::find(makings, number, &Making::number) != makings.end())
        throw PropertyListError(fmt::format("an object of the class {} is needed to make itself", type.name));
    const ArchivedClass substitute =
        delegate ? delegate->cannotDecodeObjectOfClassName(owner, type.name, type.ancestors) : nullptr;
    if (!substitute)
        throw PropertyListError(fmt::format("the class {} is unknown", type.name));
    const Pushed making(makings, {number, content});
    return substitute(owner);
}

// A dictionary of the property list is an object only if it says of which class: dictionaries are archived as
// objects with keys and values.
Content KeyedUnarchiver::Implementation::classOf(const Content& content) {
    return required(content, "$class", Kind::dictionary);
}

ClassDescription KeyedUnarchiver::Implementation::classDescription(const Content& content) {
    ClassDescription description{className(required(content, "$classname", Kind::text)), {}};
    const std::optional<Content> ancestors = list->find(content, "$classes");
    if (!ancestors)
        return {description.name, {description.name}};
    if (ancestors->kind != Kind::array || ancestors->count > mostAncestors)
        throw PropertyListError("a class's list of its ancestors is damaged");
    for (std::uint64_t i = 0; i < ancestors->count; ++i)
        description.ancestors.push_back(className(list->element(*ancestors, i)));
    return description;
}

std::string KeyedUnarchiver::Implementation::className(const Content& name) {
    if (name.kind != Kind::text || name.count > longestClassName)
        throw PropertyListError("a class's name is damaged");
    return list->text(name);
}

bool KeyedUnarchiver::Implementation::isKey(const Content& reference, std::string_view key) {
    const Content content = archived(numberOf(reference));
    if (content.kind == Kind::dictionary && isString(content))
        return list->isText(textOfString(content), key);
    return list->isText(content, key);
}

bool KeyedUnarchiver::Implementation::isString(const Content& content) {
    const Content name = required(classOf(content), "$classname", Kind::text);
    return list->isText(name, "NSString") || list->isText(name, "NSMutableString");
}

Content KeyedUnarchiver::Implementation::textOfString(const Content& content) {
    if (list->find(content, "NS.string"))
        return required(content, "NS.string", Kind::text);
    // The bytes are UTF-8, which is how text of one byte a unit is read.
    Content text = required(content, "NS.bytes", Kind::data);
    text.kind = Kind::text;
    return text;
}

std::string KeyedUnarchiver::Implementation::descriptionOfElement(const Content& reference) {
    const Nested nested(descriptionDepth);
    const ArchivedObjectRef element = object(reference);
    std::string text = element ? element->description() : "<null>";
    describedBytes += text.size() + 1;
    return text;
}

KeyedUnarchiver::KeyedUnarchiver(std::unique_ptr<ByteSource> bytes, KeyedUnarchiverDelegate* delegate)
    : implementation_(std::make_unique<Implementation>(*this, std::move(bytes), delegate)) {}

KeyedUnarchiver::~KeyedUnarchiver() = default;

ArchivedObjectRef KeyedUnarchiver::decodeObjectForKey(std::string_view key) {
    return implementation_->attempt([&] { return implementation_->decode(key); });
}

void KeyedUnarchiver::finishDecoding() {
    implementation_->isFinished = true;
}

ArchivedObjectRef ArchivedObject::objectForKey(std::string_view key) const {
    const std::string problem = fmt::format("an object is asked for its key {} and is no dictionary", key);
    if (!unarchiver_)
        throw ArchiveError({}, problem);
    return unarchiver_->reject(problem);
}

ArchivedObjectRef KeyedUnarchiver::reject(const std::string& problem) {
    implementation_->reject(ArchiveError(implementation_->sourceName, problem));
    return nullptr;
}

RejectedArchivesAsUnreadable::RejectedArchivesAsUnreadable(Report reporter, void* context)
    : report_(reporter), context_(context), enclosing_(innermostScope) {
    innermostScope = this;
}

RejectedArchivesAsUnreadable::~RejectedArchivesAsUnreadable() {
    innermostScope = enclosing_;
}

RejectedArchivesAsUnreadable* RejectedArchivesAsUnreadable::current() {
    return innermostScope;
}

}  // namespace platform
