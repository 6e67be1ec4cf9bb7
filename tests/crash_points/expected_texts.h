#pragma once

#include <string>

namespace zal::testing {

// What is told and looked for.
inline constexpr const char* kSessionType = "Vistel";
inline constexpr double kFirstMoment = 1714651388.0;
inline constexpr const char* kEntryMark = "entry number ";
inline constexpr const char* kRecordMark = "record number ";
inline constexpr const char* kGatheredFile = "tmp/gathered.txt";
inline constexpr const char* kGatheredText = "a trace that a client has collected";

inline std::string entryText(int number) { return kEntryMark + std::to_string(number) + "."; }
inline std::string recordText(int number) { return kRecordMark + std::to_string(number) + "."; }

}  // namespace zal::testing
