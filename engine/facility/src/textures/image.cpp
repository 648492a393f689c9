#include "orv/image.h"

#include "imagedecoder.h"
#include "orv/filetostring.h"
#include "orv/log.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <limits>
#include <new>

namespace orv
{

Image::Image(int width, int height, int channels, const unsigned char* data)
{
    if (width < 0 || height < 0 || channels <= 0)
    {
        ORV_LOG_ERROR("Invalid image construction inputs.");
        return;
    }

    const uint64_t rowBytes = uint64_t(width) * uint64_t(channels); // a size_t may have 32 bits
    const uint64_t maxRows =
        rowBytes > 0 ? uint64_t(std::numeric_limits<std::ptrdiff_t>::max()) / rowBytes : 0;
    if (rowBytes == 0 || uint64_t(height) <= maxRows)
        m_data = new (std::nothrow) unsigned char[std::size_t(rowBytes * uint64_t(height))]();
    if (!m_data)
    {
        ORV_LOG_ERROR("No memory for an image of %d x %d pixels of %d bytes.", width, height, channels);
        return;
    }
    m_width = width;
    m_height = height;
    m_channelCount = channels;
    if (data)
        std::memcpy(m_data, data, std::size_t(rowBytes * uint64_t(height)));
}

Image::Image(Stream& stream)
{
    const FileToString file(stream);
    if (!file.getStart())
    {
        ORV_LOG_ERROR("Failed to allocate memory for file!");
        return;
    }

    const auto* bytes = reinterpret_cast<const unsigned char*>(file.getStart());
    m_data = detail::decodeImage(bytes, std::size_t(file.getEnd() - file.getStart()), m_width, m_height,
                                 m_channelCount);
    m_decoded = true;
}

Image::~Image()
{
    if (m_decoded)
        detail::freeDecodedImage(m_data);
    else
        delete[] m_data;
}

SharedPtr<Image> Image::crop(const Image& source, int x, int y, int width, int height)
{
    if (!source.m_data || source.m_width == 0 || source.m_height == 0)
    {
        ORV_LOG_ERROR("Cannot crop: source image has no data.");
        return {};
    }

    const int left = std::clamp(x, 0, source.m_width - 1);
    const int top = std::clamp(y, 0, source.m_height - 1);
    const int columns = std::clamp(width, 1, source.m_width - left);
    const int rows = std::clamp(height, 1, source.m_height - top);
    if (left != x || top != y || columns != width || rows != height)
        ORV_LOG_WARN("Invalid crop extents adjusted to fit source.");

    auto result = makeShared<Image>(columns, rows, source.m_channelCount, nullptr);
    if (!result || !result->m_data)
        return {};
    const auto channels = std::size_t(source.m_channelCount);
    const std::size_t rowBytes = std::size_t(columns) * channels;
    for (int row = 0; row < rows; ++row)
    {
        const std::size_t pixel = std::size_t(top + row) * std::size_t(source.m_width) + std::size_t(left);
        std::memcpy(result->m_data + std::size_t(row) * rowBytes, source.m_data + pixel * channels, rowBytes);
    }
    return result;
}

} // namespace orv
