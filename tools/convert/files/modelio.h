#pragma once

#include <assimp/IOSystem.hpp>

namespace convert
{

class ModelFiles;

/// Lets libassimp read a model's files, but write none.
class ModelIo : public Assimp::IOSystem
{
public:
    /// @param files  outlives this object.
    explicit ModelIo(ModelFiles& files) : m_files(files) {}

    bool Exists(const char* path) const override;
    char getOsSeparator() const override { return '/'; }
    Assimp::IOStream* Open(const char* path, const char* mode) override;
    void Close(Assimp::IOStream* stream) override;
    bool CreateDirectory(const std::string&) override { return false; }
    bool DeleteFile(const std::string&) override { return false; }
    bool ChangeDirectory(const std::string&) override { return false; }

private:
    ModelFiles& m_files;
};

} // namespace convert
