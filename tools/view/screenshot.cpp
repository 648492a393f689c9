#include "screenshot.h"

#include "headless/headless.h"
#include "headless/png.h"

#include <cstdint>
#include <filesystem>
#include <vector>

namespace view
{

std::string saveScreenshot(const std::string& stem, int width, int height)
{
    std::vector<uint8_t> pixels = headless::readSurface(width, height);
    for (size_t i = 3; i < pixels.size(); i += 4)
        pixels[i] = 255;

    std::string name;
    for (int number = 1; name.empty() || std::filesystem::exists(name); ++number)
    {
        const std::string digits = std::to_string(number);
        name = stem + "-" + std::string(digits.size() < 3 ? 3 - digits.size() : 0, '0') + digits + ".png";
    }
    std::string error;
    return headless::writePng(name, width, height, pixels.data(), error) ? "Saved " + name : error;
}

} // namespace view
