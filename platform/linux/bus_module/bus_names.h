#pragma once

namespace zal {

// How the agent is called on a bus: docs/bus.md.

inline constexpr const char* kBusName = "com.vendel.lirra";
inline constexpr const char* kObjectPath = "/com/vendel/lirra";
inline constexpr const char* kInterfaceName = "com.vendel.Lirra";
/// All signals of that interface and object, whoever sends them.
inline constexpr const char* kSignalRule =
    "type='signal',path='/com/vendel/lirra',interface='com.vendel.Lirra'";

}  // namespace zal
