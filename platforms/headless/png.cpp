#include "headless/png.h"
#include "headless/pngcompression.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

#include <sys/stat.h>
#include <unistd.h>

#define STBIW_ZLIB_COMPRESS headless::compressForPng
#define STB_IMAGE_WRITE_IMPLEMENTATION
#define STB_IMAGE_WRITE_STATIC
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#include <stb/stb_image_write.h>
#pragma GCC diagnostic pop

namespace headless
{

namespace
{

constexpr int PNG_FILTER = 3; // average; trying all filters on each line is not worth the time

/// @param file  stays open. @return false, with errno or 0, if not all of it is written.
bool writeTo(std::FILE* file, int width, int height, const uint8_t* rgba)
{
    const auto write = [](void* context, void* data, int size)
    { std::fwrite(data, 1, size_t(size), static_cast<std::FILE*>(context)); };
    stbi_write_force_png_filter = PNG_FILTER;
    errno = 0;
    const bool isMade = stbi_write_png_to_func(write, file, width, height, 4, rgba, width * 4) != 0;
    return std::fflush(file) == 0 && !std::ferror(file) && isMade; // a full disk may show only here
}

/// Whether it is a device, a pipe or an open file, which is written to and never replaced, by root neither.
bool isDevice(const std::string& path)
{
    struct stat status = {};
    const auto begins = [&path](const char* with) { return path.rfind(with, 0) == 0; };
    return begins("/dev/std") || begins("/dev/fd/") || begins("/proc/") ||
           (stat(path.c_str(), &status) == 0 && !S_ISREG(status.st_mode) && !S_ISDIR(status.st_mode));
}

bool fail(const std::string& path, std::string& error)
{
    error = path + ": cannot be written: " + (errno ? std::strerror(errno) : "the picture is too large");
    return false;
}

} // namespace

bool writePng(const std::string& path, int width, int height, const uint8_t* rgba, std::string& error)
{
    if (path == "-")
        return writeTo(stdout, width, height, rgba) || fail("standard output", error);
    const bool isReplaced = !isDevice(path);
    const std::string temporary = isReplaced ? path + ".tmp" + std::to_string(getpid()) : path;
    std::FILE* file = std::fopen(temporary.c_str(), "wb");
    if (!file)
        return fail(path, error);
    bool isWritten = writeTo(file, width, height, rgba);
    isWritten = std::fclose(file) == 0 && isWritten;
    isWritten = isWritten && (!isReplaced || std::rename(temporary.c_str(), path.c_str()) == 0);
    if (isWritten)
        return true;

    fail(path, error);
    if (isReplaced)
        std::remove(temporary.c_str());
    return false;
}

} // namespace headless
