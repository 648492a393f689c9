#pragma once

#include "orv/assetloader.h"
#include "orv/export.h"
#include "orv/font.h"

namespace orv
{

/// Draws the characters 32 to 127 of a TrueType file into an atlas, 512 pixels wide and as high as they need.
///
/// Files are checked before the rasteriser, which trusts them, gets to see them: a damaged one is refused, and
/// so are outlines in PostScript form (CFF), collections of fonts, glyphs made by matching points, and glyphs
/// out of all proportion. So is, before any memory is taken, a size at which a glyph is wider than 510 pixels or
/// the atlas higher than GL's largest texture (or 16384). Memory taken on the way is below 8 MiB beside file and
/// atlas.
class ORV_API FontLoader : public AssetLoader<Font>
{
public:
    ~FontLoader() override;

    /// @param cache  a FontCache.
    /// @param name   "file.ttf;size". It is split at the first semicolon; the size is decimal digits alone.
    /// @return empty, after logging why.
    Font::Ptr load(AssetCache<Font>& cache, const char* name) override;

    /// By the file part: true for "sans.ttf;24", and for a bare "sans.TTF" as well, which load() refuses.
    bool isKnown(const char* name) override;
};

} // namespace orv
