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

/// What became of a material that was to take shadows.
enum class ShadowAnswer
{
    TAKES,     ///< with the program that was found
    STAYS,     ///< nothing of it is lit, or its program is another
    NO_ROOM,   ///< it has all textures that every device has, or too many values for this one
    NO_PROGRAM ///< the driver refuses it
};

/// The programs for shadows of one pool.
class ShadowPrograms
{
public:
    /// Registers the assets unless that was done.
    explicit ShadowPrograms(const SharedPtr<AssetCachePool>& pool);

    /// @param program  receives the one to draw the material with instead; of TAKES alone.
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
