#include "framework/metadata/AnswerColumns.h"

#include <sqlite3.h>

#include <cstdint>
#include <string_view>
#include <vector>

#include "framework/metadata/MediaLimits.h"
#include "platform/Text.h"

namespace vexo {

namespace {

// Names of a list stand on a line each.
constexpr char separator = '\n';

// Binds one parameter after the other. What is nil stays bound to nothing.
class Binder {
  public:
    Binder(sqlite3_stmt* statement, int first) : statement_(statement), next_(first) {}

    void put(const std::string& text) {
        sqlite3_bind_text(statement_, next_++, text.data(), static_cast<int>(text.size()), SQLITE_TRANSIENT);
    }
    void put(const std::vector<std::string>& names) {
        std::string text;
        for (const std::string& name : names)
            text += (text.empty() ? "" : std::string(1, separator)) + name;
        put(text);
    }
    void put(double number) { sqlite3_bind_double(statement_, next_++, number); }
    void put(std::int64_t number) { sqlite3_bind_int64(statement_, next_++, number); }
    void put(int number) { sqlite3_bind_int64(statement_, next_++, number); }
    template <typename Value>
    void put(const std::optional<Value>& value) {
        if (value)
            put(*value);
        else
            sqlite3_bind_null(statement_, next_++);
    }

  private:
    sqlite3_stmt* const statement_;
    int next_;
};

// Reads one column after the other. What makes no sense is remembered.
class RowReader {
  public:
    RowReader(sqlite3_stmt* row, int first) : row_(row), next_(first) {}

    bool makesSense() const { return makesSense_; }

    std::optional<std::string> text() {
        const int column = next_++;
        if (isNull(column))
            return std::nullopt;
        return std::string(bytes(column, longestText));
    }
    std::vector<std::string> names() {
        const int column = next_++;
        std::string_view rest = isNull(column) ? "" : bytes(column, longestList * (longestName + 1));
        std::vector<std::string> names;
        while (!rest.empty()) {
            const std::size_t end = std::min(rest.find(separator), rest.size());
            names.emplace_back(rest.substr(0, end));
            rest.remove_prefix(std::min(end + 1, rest.size()));
        }
        return names;
    }
    std::optional<double> real(const Range& range) {
        return number<double>(SQLITE_FLOAT, range, sqlite3_column_double);
    }
    template <typename Number>
    std::optional<Number> whole(const Range& range) {
        return number<Number>(SQLITE_INTEGER, range, sqlite3_column_int64);
    }

  private:
    template <typename Number, typename Read>
    std::optional<Number> number(int type, const Range& range, Read read) {
        const int column = next_++;
        if (isNull(column))
            return std::nullopt;
        makesSense_ &= sqlite3_column_type(row_, column) == type;  // reading may convert it
        const auto value = read(row_, column);
        makesSense_ &= range.contains(static_cast<double>(value));
        return makesSense_ ? std::optional(static_cast<Number>(value)) : std::nullopt;
    }
    bool isNull(int column) const { return sqlite3_column_type(row_, column) == SQLITE_NULL; }
    std::string_view bytes(int column, std::size_t longest) {
        const auto* begin = reinterpret_cast<const char*>(sqlite3_column_text(row_, column));
        const auto size = static_cast<std::size_t>(sqlite3_column_bytes(row_, column));
        const std::string_view text = begin ? std::string_view(begin, size) : std::string_view();
        makesSense_ &= size <= longest && platform::isValidUTF8(text);
        return makesSense_ ? text : std::string_view();
    }

    sqlite3_stmt* const row_;
    int next_;
    bool makesSense_ = true;
};

MediaProperties propertiesIn(RowReader& row) {
    MediaProperties properties;
    properties.mediaTypes = row.names();
    properties.codecs = row.names();
    properties.pixelWidth = row.whole<int>(pixelCounts);
    properties.pixelHeight = row.whole<int>(pixelCounts);
    properties.durationSeconds = row.real(durations);
    properties.contentCreationDate = row.real(dates);
    properties.frameRate = row.real(frameRates);
    properties.audioChannelCount = row.whole<int>(channelCounts);
    properties.audioSampleRate = row.whole<int>(sampleRates);
    properties.totalBitRate = row.whole<std::int64_t>(bitRates);
    properties.title = row.text();
    properties.acquisitionMake = row.text();
    properties.acquisitionModel = row.text();
    return properties;
}

void bindProperties(Binder& parameters, const MediaProperties& properties) {
    parameters.put(properties.mediaTypes);
    parameters.put(properties.codecs);
    parameters.put(properties.pixelWidth);
    parameters.put(properties.pixelHeight);
    parameters.put(properties.durationSeconds);
    parameters.put(properties.contentCreationDate);
    parameters.put(properties.frameRate);
    parameters.put(properties.audioChannelCount);
    parameters.put(properties.audioSampleRate);
    parameters.put(properties.totalBitRate);
    parameters.put(properties.title);
    parameters.put(properties.acquisitionMake);
    parameters.put(properties.acquisitionModel);
}

}  // namespace

void bindAnswer(sqlite3_stmt* statement, int first, const MediaReaderAnswer& answer) {
    const auto* failure = std::get_if<MediaFailure>(&answer);
    Binder parameters(statement, first);
    parameters.put(failure ? std::optional(failure->reason) : std::nullopt);
    bindProperties(parameters, failure ? MediaProperties() : std::get<MediaProperties>(answer));
}

std::optional<MediaReaderAnswer> answerInRow(sqlite3_stmt* row, int first) {
    RowReader reader(row, first);
    auto failure = reader.text();
    if (failure)
        return reader.makesSense() ? std::optional(MediaFailure{*std::move(failure), FailureCause::file})
                                   : std::nullopt;
    MediaProperties properties = propertiesIn(reader);
    const bool isAnswer = reader.makesSense() && !properties.mediaTypes.empty();
    return isAnswer ? std::optional(std::move(properties)) : std::nullopt;
}

}  // namespace vexo
