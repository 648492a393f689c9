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

/// The files of a model. This object opens every file that is read for it, including the model itself, through a
/// FileGate in this process or another one.
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
    /// @return false, with bytes empty, if it cannot be read.
    bool read(const std::string& path, std::vector<uint8_t>& bytes, uint64_t most = UINT64_MAX);

    /// Reads a file by a name from a model: relative to the model's folder or absolute, a path of any system or a URI
    /// ("my%20mesh.bin", "file:///tmp/mesh.bin"). The unchanged name is tried first.
    bool readNamed(const std::string& name, std::vector<uint8_t>& bytes, uint64_t most = UINT64_MAX);

    /// See FileGate::list.
    std::vector<std::string> list(const std::string& folder);

    /// With a slash at its end; empty for the current one.
    const std::string& getFolder() const { return m_folder; }

    /// The refused paths, as requested.
    const std::set<std::string>& getRefused() const { return m_refused; }

private:
    int request(char kind, const std::string& path, int& descriptor);

    FileGate* m_gate;
    int m_socket;
    std::string m_folder;
    std::set<std::string> m_refused;
};

/// Decodes "%20" and the like.
std::string decodeUrl(const std::string& text);

/// Converts a name from a model, a URI or a path of any system, to a path of this system.
std::string toPath(const std::string& name);

/// Receives one request of a ModelFiles in another process and answers it.
/// @param socket  the other end of its socket (SOCK_SEQPACKET, which keeps messages separate).
void answerRequest(FileGate& gate, int socket);

} // namespace convert
