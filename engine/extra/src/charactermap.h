#pragma once

#include "orv/detail/fonttables.h"

namespace orv::detail
{

/// Maps characters to glyphs by a font's best map: Unicode, if possible beyond 16 bits.
///
/// Supports the formats 0, 4, 6, 10, 12 and 13.
class CharacterMap
{
public:
    /// @param maps  the table "cmap". @return false if there is no map that can be read.
    bool read(FontBytes maps);

    /// @return 0, the glyph for missing characters, if the character is not in the map or its entry is damaged.
    uint32_t find(uint32_t codePoint) const;

private:
    FontBytes m_map;
    unsigned m_format = 0;
};

} // namespace orv::detail
