#pragma once

#include "orv/assetcachepool.h"
#include "orv/background.h"
#include "orv/font.h"
#include "orv/rendercontext.h"
#include "orv/text.h"

#include <memory>
#include <string>
#include <vector>

namespace view
{

/// The text over the picture: lines at the top, a message at the bottom, and a table over everything.
class HeadsUp
{
public:
    struct Row
    {
        std::string left;
        std::string right;
    };

    /// @param context  of the picture; shared.
    /// @param font     a TrueType file.
    /// @param size     of the text in pixels.
    /// @return empty, after logging why, if the font cannot be used.
    static std::unique_ptr<HeadsUp> create(const orv::RenderContext::Ptr& context, const std::string& font,
                                           unsigned size);

    ~HeadsUp();
    HeadsUp(const HeadsUp&) = delete;
    HeadsUp& operator=(const HeadsUp&) = delete;

    /// @return whether it has changed and has to be drawn.
    bool setLines(const std::string& lines);
    bool setMessage(const std::string& message);
    void setTable(const std::vector<Row>& rows); ///< empty for none

    /// The number of rows of a table of that height.
    int countRows(int height) const;

    /// Draws over a viewport of that size. Only changed parts are laid out again.
    void draw(int width, int height);

private:
    HeadsUp() = default;
    void layOut();
    void write(const char* text, float x, float y);

    orv::RenderContext::Ptr m_context;
    orv::SharedPtr<orv::AssetCachePool> m_pool; ///< a separate one: the scene's may be replaced
    orv::Background m_panel;
    orv::Font::Ptr m_font;
    orv::Text::Ptr m_ink;
    orv::Text::Ptr m_shadow; ///< outline, so that it is readable on any background
    std::string m_lines;
    std::string m_message;
    std::vector<Row> m_rows;
    int m_width = 0;
    int m_height = 0;
    bool m_changed = true;
};

} // namespace view
