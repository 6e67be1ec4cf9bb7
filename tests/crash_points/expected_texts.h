#pragma once

#include <string>

namespace zal::testing {

// What is told and looked for.
inline constexpr const char* kSessionType = "Vistel";
inline constexpr double kFirstMoment = 1714651388.0;
inline constexpr const char* kEntryMark = "entry number ";
inline constexpr const char* kRecordMark = "record number ";
inline constexpr const char* kGatheredFile = "tmp/gathered.txt";
/// On a file system of its own, from which it has to be copied.
inline constexpr const char* kFarDirectory = "elsewhere";
inline constexpr const char* kFarFile = "elsewhere/far.txt";
inline constexpr const char* kGatheredText = "a trace that a client has collected";

inline std::string entryText(int number) { return kEntryMark + std::to_string(number) + "."; }
inline std::string recordText(int number) { return kRecordMark + std::to_string(number) + "."; }

}  // namespace zal::testing
