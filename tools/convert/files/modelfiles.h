#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <set>
#include <string>
#include <vector>

namespace convert
{

class FileGate;

struct FileCloser
{
    void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

/// The files that belong to a model. Every file that is read for it, the model itself included, is opened by this
/// object, which asks a FileGate in this process or in another one.
class ModelFiles
{
public:
    /// @param model  the file that the user named.
    /// @param gate   outlives this object.
    ModelFiles(const std::string& model, FileGate& gate);

    /// @param socket  to a process that calls answerRequest(); stays the caller's.
    ModelFiles(const std::string& model, int socket);

    ModelFiles(const ModelFiles&) = delete;
    ModelFiles& operator=(const ModelFiles&) = delete;

    /// Opens a file for reading, as a stream of bytes.
    /// @param path    absolute or from the current folder.
    /// @param reason  see FileGate::open; a refusal is remembered.
    File open(const std::string& path, int* reason = nullptr);

    /// Reads a whole file.
    /// @param most  bytes above which a file is not read.
    /// @return false, with bytes empty, if it cannot be had.
    bool read(const std::string& path, std::vector<uint8_t>& bytes, uint64_t most = UINT64_MAX);

    /// Reads a file as models name them: from the model's folder or absolute, as a path in the manner of any system or
    /// as a URI ("my%20mesh.bin", "file:///tmp/mesh.bin"). As it stands is tried first.
    bool readNamed(const std::string& name, std::vector<uint8_t>& bytes, uint64_t most = UINT64_MAX);

    /// See FileGate::list.
    std::vector<std::string> list(const std::string& folder);

    /// With a slash at its end; empty for the current one.
    const std::string& getFolder() const { return m_folder; }

    /// Paths of what was refused, as they were asked for.
    const std::set<std::string>& getRefused() const { return m_refused; }

private:
    int request(char kind, const std::string& path, int& descriptor);

    FileGate* m_gate;
    int m_socket;
    std::string m_folder;
    std::set<std::string> m_refused;
};

/// "%20" and the like become what they stand for.
std::string decodeUrl(const std::string& text);

/// A name as models write it, a URI or a path in the manner of any system, as a path of this system.
std::string toPath(const std::string& name);

/// Receives one request of a ModelFiles in another process and answers it.
/// @param socket  the other end of its socket, of the kind that keeps messages apart (SOCK_SEQPACKET).
void answerRequest(FileGate& gate, int socket);

} // namespace convert
