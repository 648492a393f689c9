#pragma once

#include "orv/colour.h"
#include "orv/export.h"
#include "orv/font.h"
#include "orv/matrix.h"
#include "orv/shaderuniform.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"
#include "orv/vector.h"

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace orv
{

class Appearance;
class AssetCachePool;
class RenderContext;
class ShaderProgram;
class Solid;
class VertexBuffer;
class VertexBufferCache;

/// Any number of strings in one font and colour, drawn together: over a frame, or in the scene.
///
///     const auto text = makeShared<Text>(*pool, get(*pool->getFontCache(), "sans.ttf", 24), Colour4f::WHITE);
///     text->add("Hello, world", 10.0f, 10.0f);
///     block->render();
///     text->draw(*context);
///
/// Places are in pixels: x to the right, y downwards, from the upper left corner of the viewport. Glyphs are
/// put on whole pixels, so that each of the atlas falls on one of the screen.
/// Strings are UTF-8. "\n" begins a new line; bytes that are not UTF-8, other control characters, and characters
/// that the font does not have draw nothing and take no room.
/// Threads: draw() and createSolid() belong to the GL thread; no locks.
class ORV_API Text : public Shared
{
public:
    ORV_CLASS_NAME("Text")
    using Ptr = SharedPtr<Text>;

    /// Which part of each line stands at the place that was given.
    enum class Alignment : int32_t
    {
        LEFT = 0,
        CENTRE = 1,
        RIGHT = 2
    };

    /// @param pool  for the shader program; its cache of vertex buffers is held as well.
    /// @param font  shared; an empty one is an error, and nothing is ever drawn.
    Text(AssetCachePool& pool, const Font::Ptr& font, const Colour4f& colour);
    ~Text() override;

    /// From the top of a line to the top of the next, in whole pixels.
    static float getLineHeight(const Font& font);

    /// The room that a string takes, in pixels: as wide as its longest line, as high as its lines, the last
    /// without the gap below it; 0, 0 for an empty or null one. The tips of slanted letters may reach out of it.
    static Vector2f measure(const Font& font, const char* utf8);

    /// Adds a string. @param y  top of its first line, not the baseline.
    void add(const char* utf8, float x, float y, Alignment alignment = Alignment::LEFT);

    void clear(); ///< Takes all strings out again.

    /// Straight, not premultiplied; a is the opacity. Solids made before keep their colour.
    void setColour(const Colour4f& colour);

    const Font::Ptr& getFont() const { return m_font; } ///< Empty where there was none.

    /// Draws over what the viewport shows, blended, whatever the depth buffer holds; nothing is written there.
    ///
    /// One GL draw for all strings. Without a change since the last time nothing is made again. The vertices have a GL
    /// buffer, which stays when the strings change and goes with the pool's flush() after the text.
    void draw(RenderContext& context);

    /// A copy of the strings as they are, to be put into a scene.
    ///
    /// One unit is one pixel, x to the right, y upwards, in the plane z = 0: what was added at (x, y) is at
    /// (x, -y). Scale the node to the size wanted. Both sides are visible; it blends, so the renderer draws it
    /// after opaque solids, and it does not write depth.
    /// @param pool  where the mesh is made, unnamed.
    /// @return empty, after an error, without a font, any glyph, or memory.
    SharedPtr<Solid> createSolid(AssetCachePool& pool) const;

private:
    struct Glyph
    {
        float x, y;                      ///< upper left corner, whole pixels
        const Font::CharacterData* data; ///< m_font's
    };

    ORV_LOCAL void addLine(std::string_view line, float x, float top, Alignment alignment);
    ORV_LOCAL SharedPtr<Appearance> makeAppearance() const;
    ORV_LOCAL SharedPtr<Solid> makeSolid(const SharedPtr<Appearance>& appearance, float ySign,
                                         VertexBufferCache& cache, SharedPtr<VertexBuffer>& buffer) const;

    Font::Ptr m_font;
    Colour4f m_colour;
    SharedPtr<ShaderProgram> m_program;
    std::vector<Glyph> m_glyphs;
    SharedPtr<Appearance> m_overlay;                 ///< what draw() draws with
    SharedPtr<ShaderUniform<Matrix4f>> m_projection; ///< m_overlay's, from pixels to clip space
    SharedPtr<VertexBufferCache> m_cache;            ///< the pool's
    SharedPtr<VertexBuffer> m_buffer;                ///< what draw() draws, filled again for every change
    SharedPtr<Solid> m_solid;                        ///< of that buffer; empty without glyphs
    bool m_changed = false;                          ///< m_solid does not show m_glyphs yet
};

} // namespace orv
