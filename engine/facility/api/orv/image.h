#pragma once

#include "orv/export.h"
#include "orv/shared.h"
#include "orv/sharedptr.h"

namespace orv
{

class Stream;

/// A picture in memory: rows from top to bottom, channelCount() bytes per pixel, no padding.
class ORV_API Image : public Shared
{
public:
    using Ptr = SharedPtr<Image>;

    ORV_CLASS_NAME("Image")

    /// @param data  width x height x channels bytes, copied; null gives zeroed pixels.
    /// Negative sizes, no channels or a size beyond memory leave the image without data (logged).
    Image(int width, int height, int channels, const unsigned char* data);

    /// Decodes a whole JPEG, PNG, BMP or TGA file, keeping its channel count; 16-bit channels become 8-bit.
    /// An image that cannot be decoded has no data, and neither has one wider or higher than 16384 pixels,
    /// one beyond LoadLimits, or one that is larger than its file could possibly hold.
    explicit Image(Stream& stream);

    ~Image() override;

    /// A copy of a rectangle.
    ///
    /// Extents that reach outside the source are moved and cut to fit, to at least one pixel (logged as a
    /// warning).
    /// @return empty if the source has no data (logged).
    static SharedPtr<Image> crop(const Image& source, int x, int y, int width, int height);

    int width() const { return m_width; }   ///< pixels
    int height() const { return m_height; } ///< pixels
    int channelCount() const { return m_channelCount; }
    const unsigned char* data() const { return m_data; } ///< null when there is none

private:
    int m_width = 0;
    int m_height = 0;
    int m_channelCount = 0;
    unsigned char* m_data = nullptr;
    bool m_decoded = false; ///< m_data belongs to the decoder's allocator
};

} // namespace orv
