#pragma once

#include "orv/stream.h"

#include <fstream>

namespace orv::detail
{

/// Reads a regular file. A read past the end sets the end-of-file flag, the next seek() clears it; in between the stream
/// stays valid and at its end, as a memory stream does.
class FileInputStream : public Stream
{
public:
    /// Measures the file. A size that no int32_t can hold leaves the stream failed.
    explicit FileInputStream(const char* path);

    bool valid() const override;
    bool eof() const override;
    int32_t size() const override;
    int32_t seek(unsigned int position) override;
    int32_t tell() const override;
    int32_t read(void* buffer, unsigned int count) override;
    int32_t write(const void* buffer, unsigned int count) override;

private:
    std::ifstream m_file;
    int32_t m_size = 0;
    int32_t m_position = 0; ///< -1 if it does not fit
    bool m_isAtEnd = false;
};

/// Creates or empties a file and writes it, unbuffered: write() returns the bytes that the system accepted.
class FileOutputStream : public Stream
{
public:
    explicit FileOutputStream(const char* path);

    /// Looks at the bad flag only, which a failed opening does not set.
    bool valid() const override;
    bool eof() const override;
    int32_t size() const override;
    int32_t seek(unsigned int position) override;
    int32_t tell() const override;
    int32_t read(void* buffer, unsigned int count) override;
    int32_t write(const void* buffer, unsigned int count) override;

private:
    mutable std::ofstream m_file;
};

} // namespace orv::detail
