// A media reader's answer as columns of the index's table. What a damaged file may hold there is checked when
// it is read.
#pragma once

#include <optional>
#include <string>

#include "framework/metadata/MediaProperties.h"

struct sqlite3_stmt;

namespace vexo {

inline constexpr int answerColumnCount = 14;

// "failure TEXT, mediaTypes TEXT, …", as a table is made with them.
inline constexpr const char* answerColumnDefinitions =
    "failure TEXT, mediaTypes TEXT, codecs TEXT, pixelWidth INTEGER, pixelHeight INTEGER, durationSeconds "
    "REAL,"
    " contentCreationDate REAL, frameRate REAL, audioChannelCount INTEGER, audioSampleRate INTEGER,"
    " totalBitRate INTEGER, title TEXT, acquisitionMake TEXT, acquisitionModel TEXT";
// Their names, in the same order.
inline constexpr const char* answerColumns =
    "failure, mediaTypes, codecs, pixelWidth, pixelHeight, durationSeconds, contentCreationDate, frameRate,"
    " audioChannelCount, audioSampleRate, totalBitRate, title, acquisitionMake, acquisitionModel";

// Binds an answer to the parameters from number `first` on.
void bindAnswer(sqlite3_stmt* statement, int first, const MediaReaderAnswer& answer);

// The answer in a row's columns from number `first` on; nil where they make no sense. A failure is one of the
// file's.
std::optional<MediaReaderAnswer> answerInRow(sqlite3_stmt* row, int first);

}  // namespace vexo
