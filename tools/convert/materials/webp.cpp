#include "webp.h"

#include <cstring>

#include <webp/decode.h>

namespace convert
{

bool isWebp(const std::vector<uint8_t>& bytes)
{
    constexpr size_t MARK = 8; // offset of the container's type
    return bytes.size() >= 12 && std::memcmp(bytes.data(), "RIFF", 4) == 0 &&
           std::memcmp(bytes.data() + MARK, "WEBP", 4) == 0;
}

bool readWebpHeader(const std::vector<uint8_t>& bytes, PictureHeader& header)
{
    WebPBitstreamFeatures features;
    if (WebPGetFeatures(bytes.data(), bytes.size(), &features) != VP8_STATUS_OK)
        return false;
    header.width = features.width;
    header.height = features.height;
    header.channels = features.has_alpha ? 4 : 3;
    return true;
}

bool decodeWebp(const std::vector<uint8_t>& bytes, DecodedPicture& picture)
{
    PictureHeader header;
    if (!readWebpHeader(bytes, header))
        return false;
    picture = {header.width, header.height, header.channels, {}};
    const size_t row = size_t(picture.width) * size_t(picture.channels);
    picture.data.resize(row * size_t(picture.height));
    const auto decode = picture.channels == 4 ? WebPDecodeRGBAInto : WebPDecodeRGBInto;
    return decode(bytes.data(), bytes.size(), picture.data.data(), picture.data.size(), int(row)) != nullptr;
}

} // namespace convert
