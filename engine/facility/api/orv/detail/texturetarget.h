#pragma once

/// GL's texture targets, for headers of the interface, which include none of GL's. rendercontext.cpp checks them
/// against GL's own names.
namespace orv::detail
{

inline constexpr unsigned TEXTURE_TARGET_2D = 0x0DE1;
inline constexpr unsigned TEXTURE_TARGET_CUBE_MAP = 0x8513;
inline constexpr unsigned TEXTURE_TARGET_EXTERNAL = 0x8D65;

} // namespace orv::detail
