#pragma once

#include <string_view>

namespace zal {

/// Whether what is written to the descriptor goes to the journal. `variable` is JOURNAL_STREAM,
/// "device:inode" of the stream that the service manager made. A program further down inherits the
/// variable, but may have got another output, such as a file or a terminal.
[[nodiscard]] bool isJournalStream(std::string_view variable, int descriptor);

}  // namespace zal
