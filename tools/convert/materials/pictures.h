#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace convert
{

/// Pixels in memory: rows from top to bottom, 1 (grey), 2 (grey, alpha), 3 or 4 bytes per pixel.
struct DecodedPicture
{
    int width = 0;
    int height = 0;
    int channels = 0;
    std::vector<uint8_t> data;

    bool hasAlphaChannel() const { return channels == 2 || channels == 4; }
    size_t getPixelCount() const { return size_t(width) * size_t(height); }
};

/// Facts from a picture's first and last bytes.
struct PictureHeader
{
    int width =
        0; ///< this and the next two are 0 for a compressed texture, which the converter does not read
    int height = 0;
    int channels = 0;      ///< at least 4 if any pixel can be transparent and the picture is coloured
    std::string extension; ///< of the engine's format, ".png"; empty if the engine does not read it
    bool isWhole = false;  ///< has an end, so that it need not be decoded
};

/// @return false if it cannot be read.
bool readHeader(const std::vector<uint8_t>& bytes, PictureHeader& header);

/// @return false if it is damaged.
bool decodePicture(const std::vector<uint8_t>& bytes, const PictureHeader& header, DecodedPicture& picture);

std::vector<uint8_t> encodePng(const DecodedPicture& picture);

/// @param width, height  pixels, above 0. If wrapping, edges are filtered with the opposite edge.
void resize(DecodedPicture& picture, int width, int height, bool wraps);

/// Grey becomes red, green and blue; alpha stays.
void spreadGrey(DecodedPicture& picture);

void dropAlpha(DecodedPicture& picture);

/// Brightness becomes the alpha of the other picture.
/// @param opacity  any size.
void setAlpha(DecodedPicture& picture, DecodedPicture opacity);

/// A picture of heights becomes one of normals: red along u, green up. A coloured picture is unchanged: many programs
/// write normal maps as height maps.
/// @return whether it was one of heights.
bool makeNormals(DecodedPicture& heights);

/// Red, the occlusion, becomes grey.
/// @param strength  0 to 1; 0 is light everywhere.
/// @param isShare   convert linear light to sRGB: a half becomes 0.74.
void makeOcclusion(DecodedPicture& picture, float strength, bool isShare);

/// A summary of the alpha channel.
enum class Transparency
{
    NONE,
    SOME, ///< transparent in part
    ALL   ///< invisible everywhere, so alpha must mean something else
};
Transparency getTransparency(const DecodedPicture& picture);

/// Whether some alpha is below the threshold (0 to 1).
bool hasHoles(const DecodedPicture& picture, float threshold);

/// Whether alpha is nearly 1 or nearly 0, except for a few pixels along edges (one of twenty).
bool isAllOrNothing(const DecodedPicture& picture);

/// Mean of one channel (0 to 3), 0 to 1; grey counts as each of the first three.
float getMean(const DecodedPicture& picture, int channel);

} // namespace convert
