#include "platform/linux/property_list/pugixml_property_list_writer.h"

#include <fcntl.h>
#include <unistd.h>

#include "platform/linux/files/descriptor.h"
#include "platform/linux/files/system_error.h"
#include "platform/linux/files/whole_file.h"
#include "platform/linux/property_list/property_list_text.h"

namespace zal {

std::error_code PugixmlPropertyListWriter::write(const ValueMap& dictionary, const std::string& path) {
  const std::string text = propertyListText(dictionary);
  const RootedPlace at = _paths.placeOf(path);
  if (at.error) return at.error;
  constexpr int kFlags = O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_CLOEXEC;
  Descriptor file(::openat(at.directory.get(), at.name.c_str(), kFlags, 0666));
  if (!file.isOpen()) return lastSystemError();
  if (const auto error = writeWhole(file.get(), text)) return error;
  if (::close(file.release()) != 0) return lastSystemError();  // where a full disk may show last
  return {};
}

}  // namespace zal
