// The numbers of the pcap and pcapng file formats that the capture reader
// and the frame saver share.
#pragma once

#include <cstdint>

namespace rnsap::cli::capture_format {

inline constexpr uint32_t kPcapMicrosecondMagic = 0xa1b2c3d4;
inline constexpr uint32_t kPcapNanosecondMagic = 0xa1b23c4d;

inline constexpr uint32_t kSectionHeaderBlock = 0x0a0d0d0a;
inline constexpr uint32_t kInterfaceDescriptionBlock = 1;
inline constexpr uint32_t kPacketBlock = 2;  // obsolete, still read
inline constexpr uint32_t kSimplePacketBlock = 3;
inline constexpr uint32_t kEnhancedPacketBlock = 6;
inline constexpr uint32_t kByteOrderMagic = 0x1a2b3c4d;

inline constexpr uint16_t kEndOfOptions = 0;
inline constexpr uint16_t kTimeResolutionOption = 9;
inline constexpr uint16_t kTimeOffsetOption = 14;

}  // namespace rnsap::cli::capture_format
