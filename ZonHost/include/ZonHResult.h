#pragma once
#include <cstdint>

// Result codes of the host's document and writer operations that report
// failure by value rather than by raising (opening, option lists, multi-part
// writing). Zero is success.
using ZonHResult = std::int32_t;

inline constexpr ZonHResult ZON_S_OK = 0;
// The generic failure code of the host framework.
inline constexpr ZonHResult ZON_E_FAIL = static_cast<ZonHResult>(0x80004005u);

inline constexpr bool ZonSucceeded(ZonHResult result) { return result >= 0; }
inline constexpr bool ZonFailed(ZonHResult result) { return result < 0; }
