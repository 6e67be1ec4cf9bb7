#pragma once

#include <cstdint>

namespace zal {

/// Which steps a per-service collection runs: a set of bits that clients send as one number.
using CollectionFlags = std::uint32_t;

inline constexpr CollectionFlags kCollectPushLogs = 0x00001;  ///< push-service state and captures
inline constexpr CollectionFlags kCollectNetwork = 0x00002;  ///< network dump, stack crash logs, full capture
inline constexpr CollectionFlags kCollectBaseband = 0x00004;  ///< baseband snapshot and logs
inline constexpr CollectionFlags kCollectSystemLogs = 0x00008;
inline constexpr CollectionFlags kCollectRegistration = 0x00010;  ///< registration and identity group
inline constexpr CollectionFlags kCollectStackshot = 0x00020;
inline constexpr CollectionFlags kCollectPings = 0x00040;  ///< pings of the network dump; nothing without it
inline constexpr CollectionFlags kCollectIdentity = 0x00080;
inline constexpr CollectionFlags kFileReport = 0x00400;         ///< of a dump for a user
inline constexpr CollectionFlags kCollectProximity = 0x00800;   ///< proximity and Bluetooth
inline constexpr CollectionFlags kCollectHandover = 0x01000;    ///< hand-over and sharing
inline constexpr CollectionFlags kCollectVideoCalls = 0x02000;  ///< the video-call log set
inline constexpr CollectionFlags kCollectMedia = 0x04000;       ///< media, radio, packet captures, VPN, Wi-Fi
inline constexpr CollectionFlags kCollectLocation = 0x08000;
inline constexpr CollectionFlags kCollectCloudSync = 0x10000;
inline constexpr CollectionFlags kCollectPrediction = 0x20000;

/// What the collections of single services take: everything usual, without a stackshot.
inline constexpr CollectionFlags kUsualCollection = 0x5F;
/// The same with a stackshot.
inline constexpr CollectionFlags kWideCollection = 0x7F;

}  // namespace zal
