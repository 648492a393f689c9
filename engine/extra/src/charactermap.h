#pragma once

#include "orv/detail/fonttables.h"

namespace orv::detail
{

/// Which glyph a character has, by the best map of a font: Unicode, beyond 16 bits where there is one of those.
///
/// Read are the formats 0, 4, 6, 10, 12 and 13.
class CharacterMap
{
public:
    /// @param maps  the table "cmap". @return false if there is no map that can be read.
    bool read(FontBytes maps);

    /// @return 0, the glyph for what is missing, for what is not in the map and for what is damaged there.
    uint32_t find(uint32_t codePoint) const;

private:
    FontBytes m_map;
    unsigned m_format = 0;
};

} // namespace orv::detail
