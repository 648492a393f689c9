#include "modelio.h"

#include "modelfiles.h"

#include <assimp/IOStream.hpp>

#include <cstring>

#include <sys/stat.h>

namespace convert
{

namespace
{

class ModelStream : public Assimp::IOStream
{
public:
    explicit ModelStream(File file) : m_file(std::move(file)) {}

    size_t Read(void* buffer, size_t size, size_t count) override
    {
        return size > 0 && count > 0 ? std::fread(buffer, size, count, m_file.get()) : 0;
    }

    size_t Write(const void*, size_t, size_t) override { return 0; }

    aiReturn Seek(size_t offset, aiOrigin origin) override
    {
        const int from = origin == aiOrigin_CUR ? SEEK_CUR : origin == aiOrigin_END ? SEEK_END : SEEK_SET;
        return std::fseek(m_file.get(), long(offset), from) == 0 ? aiReturn_SUCCESS : aiReturn_FAILURE;
    }

    size_t Tell() const override { return size_t(std::ftell(m_file.get())); }

    size_t FileSize() const override
    {
        struct stat status = {};
        return fstat(fileno(m_file.get()), &status) == 0 ? size_t(status.st_size) : 0;
    }

    void Flush() override {}

private:
    File m_file;
};

} // namespace

bool ModelIo::Exists(const char* path) const
{
    return m_files.open(path) != nullptr;
}

Assimp::IOStream* ModelIo::Open(const char* path, const char* mode)
{
    if (std::strchr(mode, 'r') == nullptr)
        return nullptr;
    File file = m_files.open(path);
    return file ? new ModelStream(std::move(file)) : nullptr;
}

void ModelIo::Close(Assimp::IOStream* stream)
{
    delete stream;
}

} // namespace convert
