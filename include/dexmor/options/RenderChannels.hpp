#pragma once
// The render channels the frame buffer can show. The options set keeps a list of
// channel ids; its XML shows them by name.
#include <cstdint>
#include <string_view>

namespace OrvexKavorCore {

// The ids that have a name: 100 ("Atmosphere") to 133 ("SSS2").
inline constexpr std::uint32_t kFirstRenderChannel = 100;
inline constexpr std::uint32_t kLastRenderChannel = 133;

// The name of the channel `id` ("RGB color" for 126), or the empty text for an id
// without a name.
std::string_view renderChannelName(std::uint32_t id);

} // namespace OrvexKavorCore
