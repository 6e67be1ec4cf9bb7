#pragma once

#include <string>

namespace zal::testing {

/// What a shell command prints, both streams; its status at the end when that is not 0.
[[nodiscard]] std::string printed(const std::string& command);

/// What other people's programs say against the archive: unzip, 7z, bsdtar and Python's zipfile test
/// it, each entry whole. Empty when nobody has anything to say.
[[nodiscard]] std::string complaintsAbout(const std::string& archive);

/// Unpacks with unzip into a new directory. Returned: what it has to say, usually nothing.
[[nodiscard]] std::string unpack(const std::string& archive, const std::string& directory);

}  // namespace zal::testing
