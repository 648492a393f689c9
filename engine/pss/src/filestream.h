#pragma once

#include "orv/stream.h"

namespace orv::detail
{

/// An open file of the system, closed with this.
class FileDescriptor
{
public:
    /// @param number  negative if opening failed.
    explicit FileDescriptor(int number) : m_number(number) {}
    ~FileDescriptor() { close(); }
    FileDescriptor(const FileDescriptor&) = delete;
    FileDescriptor& operator=(const FileDescriptor&) = delete;

    int get() const { return m_number; }
    bool isOpen() const { return m_number >= 0; }
    void close();

private:
    int m_number;
};

/// Reads a regular file. A read past the end sets the end-of-file flag, the next seek() clears it; in between the stream
/// stays valid and at its end, as a memory stream does.
///
/// A read that goes beyond the buffer goes straight to the caller's memory, and fills the buffer with what follows.
class FileInputStream final : public Stream
{
public:
    /// Opens and measures the file. One whose size no int32_t can hold is not opened.
    explicit FileInputStream(const char* path);

    bool valid() const override;
    bool eof() const override;
    int32_t size() const override;
    int32_t seek(unsigned int position) override;
    int32_t tell() const override;
    int32_t read(void* buffer, unsigned int count) override;
    int32_t write(const void* buffer, unsigned int count) override;

private:
    static constexpr int32_t BUFFER_SIZE = 4096;

    int32_t readBuffered(unsigned char* bytes, int32_t count);
    int32_t readFile(unsigned char* bytes, int32_t count, int32_t position);

    FileDescriptor m_file;
    bool m_isBad = false; ///< the system refused a read
    bool m_isAtEnd = false;
    int32_t m_size = -1;
    int32_t m_position = 0;    ///< -1 if it does not fit
    int32_t m_bufferStart = 0; ///< where in the file the buffer begins; the descriptor stands at its end
    int32_t m_bufferedSize = 0;
    unsigned char m_buffer[BUFFER_SIZE];
};

/// Creates or empties a file and writes it, unbuffered: write() returns the bytes that the system accepted.
class FileOutputStream final : public Stream
{
public:
    explicit FileOutputStream(const char* path);

    /// False after a write that failed, not after an opening that did.
    bool valid() const override;
    bool eof() const override;
    int32_t size() const override;
    int32_t seek(unsigned int position) override;
    int32_t tell() const override;
    int32_t read(void* buffer, unsigned int count) override;
    int32_t write(const void* buffer, unsigned int count) override;

private:
    FileDescriptor m_file;
    bool m_isBad = false; ///< the system took less than a whole write
    int64_t m_position = 0;
};

} // namespace orv::detail
