#pragma once

#include "orv/sharedptr.h"

#include <string>

namespace orv
{

class Appearance;
class AssetCachePool;
class MemoryStreamSource;
class ShaderProgram;

namespace detail
{

/// The built-in assets for shadows, "shadow#...", which are compiled in. @return empty without memory for the source.
SharedPtr<MemoryStreamSource> createShadowAssets();

/// The result of asking for a material's shadow program.
enum class ShadowAnswer
{
    TAKES,     ///< with the program that was found
    STAYS,     ///< it is not lit, or has another program
    NO_ROOM,   ///< it uses all eight textures, or too many uniforms for this device
    NO_PROGRAM ///< the driver refuses it
};

/// The programs for shadows of one pool.
class ShadowPrograms
{
public:
    /// Registers the assets once.
    explicit ShadowPrograms(const SharedPtr<AssetCachePool>& pool);

    /// @param program  receives the program with shadows; only set for TAKES.
    ShadowAnswer findLit(const Appearance& appearance, SharedPtr<ShaderProgram>& program) const;

    /// The program to draw a material's solids into the map with.
    /// @return empty where there is none.
    SharedPtr<ShaderProgram> findDepth(const ShaderProgram& program) const;

private:
    std::string getName(const ShaderProgram& program) const;

    SharedPtr<AssetCachePool> m_pool;
};

} // namespace detail
} // namespace orv
