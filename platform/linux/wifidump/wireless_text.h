#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace zal::wifidump {

/// The interfaces that `iw dev` lists, in its order.
[[nodiscard]] std::vector<std::string> interfacesOf(std::string_view iwDev);

/// Of a kernel log the last lines that have to do with wireless: the wireless layer's, the drivers' and
/// those that name one of the interfaces.
[[nodiscard]] std::string wirelessLines(std::string_view kernelLog,
                                        const std::vector<std::string>& interfaces,
                                        std::size_t mostLines = 500);

}  // namespace zal::wifidump
