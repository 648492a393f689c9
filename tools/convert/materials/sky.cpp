#include "sky.h"

#include "orv/vector.h"

#include <cmath>

namespace convert
{

using orv::Vector3f;

namespace
{

constexpr int SIDE = 64; // pixels of a face
constexpr float GAMMA = 2.2f;

const Vector3f ZENITH(111.0f, 159.0f, 216.0f); // sRGB
const Vector3f HORIZON(230.0f, 236.0f, 242.0f);
const Vector3f GROUND(92.0f, 84.0f, 76.0f);

enum class Face
{
    DOWN,
    ACROSS,
    UP
};

/// @param up  1 straight up, 0 at the horizon and below.
uint8_t mix(float horizon, float zenith, float up)
{
    const float light = std::lerp(std::pow(horizon, GAMMA), std::pow(zenith, GAMMA), up);
    return uint8_t(std::lround(std::pow(light, 1.0f / GAMMA)));
}

/// @param right, down  where the pixel's middle is on the face, -1 to 1.
/// @return the vertical component of the normalised direction.
float getHeight(Face face, float right, float down)
{
    const float across = -down / std::sqrt(1.0f + right * right + down * down);
    const float along = 1.0f / std::sqrt(1.0f + right * right + down * down);
    return face == Face::ACROSS ? across : face == Face::UP ? along : -along;
}

void putPixel(DecodedPicture& picture, int x, int y, float height)
{
    uint8_t* pixel = &picture.data[size_t(y * picture.width + x) * 3];
    const Vector3f& low = height > 0.0f ? HORIZON : GROUND;
    const Vector3f& high = height > 0.0f ? ZENITH : GROUND;
    const float up = height > 0.0f ? height : 0.0f;
    pixel[0] = mix(low.x, high.x, up);
    pixel[1] = mix(low.y, high.y, up);
    pixel[2] = mix(low.z, high.z, up);
}

} // namespace

DecodedPicture makeSky()
{
    // -x, -z, +x and below them -y, +y, +z
    constexpr Face CELLS[2][3] = {{Face::ACROSS, Face::ACROSS, Face::ACROSS},
                                  {Face::DOWN, Face::UP, Face::ACROSS}};
    DecodedPicture picture{3 * SIDE, 2 * SIDE, 3, std::vector<uint8_t>(size_t(3 * SIDE * 2 * SIDE * 3))};
    for (int y = 0; y < picture.height; ++y)
    {
        for (int x = 0; x < picture.width; ++x)
        {
            const float right = (float(x % SIDE) + 0.5f) / float(SIDE) * 2.0f - 1.0f;
            const float down = (float(y % SIDE) + 0.5f) / float(SIDE) * 2.0f - 1.0f;
            putPixel(picture, x, y, getHeight(CELLS[y / SIDE][x / SIDE], right, down));
        }
    }
    return picture;
}

} // namespace convert
