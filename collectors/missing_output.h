#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace zal {

/// A program that a command asked for and did not get.
struct MissingProgram {
  std::string program;  ///< as the command names it
  std::string reason;   ///< as the shell puts it: "not found", "Permission denied"
  bool operator==(const MissingProgram&) const = default;
};

/// The programs that an output complains of when it holds nothing else; none when anything else
/// stands in it. Understands the shells that a Linux host has as /bin/sh, in English, and "timeout":
///
///     sh: 1: /usr/bin/voltra: not found
[[nodiscard]] std::vector<MissingProgram> missingPrograms(std::string_view output);

/// An output file that holds nothing for the want of a program.
struct MissingOutput {
  std::string file;  ///< relative to the gathered directory
  MissingProgram missing;
  bool operator==(const MissingOutput&) const = default;
};

/// All such files below a gathered directory, in order of their names; a file that wants several
/// programs stands there once for each. Files of more than 4 KiB are not looked at, links not
/// followed, what cannot be read is passed over. Any thread; reads from a disk.
[[nodiscard]] std::vector<MissingOutput> missingOutputs(const std::string& directory);

}  // namespace zal
