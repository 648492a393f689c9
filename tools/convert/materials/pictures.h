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

/// What a picture's first bytes tell, and its last ones.
struct PictureHeader
{
    int width =
        0; ///< 0, as the next two, for a compressed texture, which the engine reads and the converter does not
    int height = 0;
    int channels = 0;      ///< at least 4 if any pixel can be transparent and the picture is coloured
    std::string extension; ///< of the engine's format, ".png"; empty where the engine does not read it
    bool isWhole = false;  ///< the end is there, so that decoding would bring no surprise
};

/// @return false if it cannot be read.
bool readHeader(const std::vector<uint8_t>& bytes, PictureHeader& header);

/// @return false if it is damaged.
bool decodePicture(const std::vector<uint8_t>& bytes, const PictureHeader& header, DecodedPicture& picture);

std::vector<uint8_t> encodePng(const DecodedPicture& picture);

/// @param width, height  pixels, above 0. Edges take in what lies beyond the opposite edge, if wrapping.
void resize(DecodedPicture& picture, int width, int height, bool wraps);

/// Grey becomes red, green and blue; alpha stays.
void spreadGrey(DecodedPicture& picture);

void dropAlpha(DecodedPicture& picture);

/// Brightness becomes alpha of the other picture.
/// @param opacity  any size.
void setAlpha(DecodedPicture& picture, DecodedPicture opacity);

/// A picture of heights becomes one of normals: red along u, green up. A picture that is coloured stays: many
/// programs write normals where heights belong.
/// @return whether it was one of heights.
bool makeNormals(DecodedPicture& heights);

/// Red, which says how much light reaches a place from all around, becomes grey.
/// @param strength  0 to 1; 0 is light everywhere.
/// @param isShare   the light is wanted in the screen's values, of which half of it is 0.74.
void makeOcclusion(DecodedPicture& picture, float strength, bool isShare);

/// What the alpha channel amounts to.
enum class Transparency
{
    NONE,
    SOME, ///< here more, there less
    ALL   ///< invisible all over, so alpha surely means something else
};
Transparency getTransparency(const DecodedPicture& picture);

/// Whether some alpha is below the threshold (0 to 1).
bool hasHoles(const DecodedPicture& picture, float threshold);

/// Whether alpha is nearly full or nearly none, but for a few pixels along the edges (one of twenty).
bool isAllOrNothing(const DecodedPicture& picture);

/// Of one channel (0 to 3), 0 to 1; grey is all of the first three.
float getMean(const DecodedPicture& picture, int channel);

} // namespace convert
