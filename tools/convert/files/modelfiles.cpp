#include "modelfiles.h"

#include "filegate.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <climits>
#include <cstring>

#include <sys/mman.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

namespace convert
{

namespace
{

constexpr char OPEN = 'o'; // kinds of requests
constexpr char LIST = 'l';

/// A file in memory with names, each followed by a NUL.
int pack(const std::vector<std::string>& names, int& descriptor)
{
    const int file = memfd_create("orv-convert", MFD_CLOEXEC);
    if (file < 0)
        return errno;
    std::string text;
    for (const std::string& name : names)
        text.append(name.c_str(), name.size() + 1);
    for (size_t done = 0; done < text.size();)
    {
        const ssize_t written = write(file, text.data() + done, text.size() - done);
        if (written <= 0)
            break;
        done += size_t(written);
    }
    lseek(file, 0, SEEK_SET);
    descriptor = file;
    return 0;
}

int answer(FileGate& gate, char kind, const std::string& path, int& descriptor)
{
    return kind == LIST ? pack(gate.list(path), descriptor) : gate.open(path, descriptor);
}

/// A message of one int, and a descriptor if there is one.
struct Message
{
    explicit Message(int* reason) : data{reason, sizeof *reason}
    {
        header.msg_iov = &data;
        header.msg_iovlen = 1;
    }

    void attach(int descriptor)
    {
        useControl();
        cmsghdr* part = CMSG_FIRSTHDR(&header);
        part->cmsg_level = SOL_SOCKET;
        part->cmsg_type = SCM_RIGHTS;
        part->cmsg_len = CMSG_LEN(sizeof descriptor);
        std::memcpy(CMSG_DATA(part), &descriptor, sizeof descriptor);
    }

    void detach(int& descriptor)
    {
        const cmsghdr* part = CMSG_FIRSTHDR(&header);
        if (part && part->cmsg_type == SCM_RIGHTS)
            std::memcpy(&descriptor, CMSG_DATA(part), sizeof descriptor);
    }

    void useControl()
    {
        header.msg_control = control;
        header.msg_controllen = sizeof control;
    }

    iovec data;
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(int))] = {};
    msghdr header = {};
};

int ask(int socket, char kind, const std::string& path, int& descriptor)
{
    const std::string text = kind + path;
    if (text.size() > PATH_MAX)
        return ENAMETOOLONG;
    if (send(socket, text.data(), text.size(), MSG_NOSIGNAL) < 0)
        return errno;
    int reason = EIO;
    Message message(&reason);
    message.useControl();
    if (recvmsg(socket, &message.header, MSG_CMSG_CLOEXEC) < 0)
        return errno;
    message.detach(descriptor);
    return reason;
}

} // namespace

std::string decodeUrl(const std::string& text)
{
    std::string decoded;
    for (size_t i = 0; i < text.size(); ++i)
    {
        const bool coded = text[i] == '%' && i + 2 < text.size() &&
                           std::isxdigit(static_cast<unsigned char>(text[i + 1])) &&
                           std::isxdigit(static_cast<unsigned char>(text[i + 2]));
        decoded += coded ? char(std::stoi(text.substr(i + 1, 2), nullptr, 16)) : text[i];
        i += coded ? 2 : 0;
    }
    return decoded;
}

std::string toPath(const std::string& name)
{
    const std::string scheme = "file://";
    std::string path = decodeUrl(name);
    if (path.compare(0, scheme.size(), scheme) == 0)
        path.erase(0, scheme.size());
    std::replace(path.begin(), path.end(), '\\', '/');
    return path;
}

void answerRequest(FileGate& gate, int socket)
{
    char text[PATH_MAX + 1];
    const ssize_t size = recv(socket, text, sizeof text, 0);
    if (size <= 0)
        return;
    int descriptor = -1;
    int reason = answer(gate, text[0], std::string(text + 1, size_t(size) - 1), descriptor);
    Message message(&reason);
    if (descriptor >= 0)
        message.attach(descriptor);
    sendmsg(socket, &message.header, MSG_NOSIGNAL); // the asking process may have ended
    if (descriptor >= 0)
        close(descriptor);
}

ModelFiles::ModelFiles(const std::string& model, FileGate& gate)
    : m_gate(&gate)
    , m_socket(-1)
    , m_folder(model.substr(0, model.find_last_of('/') + 1))
{
}

ModelFiles::ModelFiles(const std::string& model, int socket)
    : m_gate(nullptr)
    , m_socket(socket)
    , m_folder(model.substr(0, model.find_last_of('/') + 1))
{
}

int ModelFiles::request(char kind, const std::string& path, int& descriptor)
{
    return m_gate ? answer(*m_gate, kind, path, descriptor) : ask(m_socket, kind, path, descriptor);
}

File ModelFiles::open(const std::string& path, int* reason)
{
    int descriptor = -1;
    const int why = request(OPEN, path, descriptor);
    if (reason)
        *reason = why;
    if (why == FileGate::REFUSED)
        m_refused.insert(path);
    if (descriptor < 0)
        return nullptr;
    File file(fdopen(descriptor, "rb"));
    if (!file)
        close(descriptor);
    return file;
}

bool ModelFiles::read(const std::string& path, std::vector<uint8_t>& bytes, uint64_t most)
{
    bytes.clear();
    const File file = open(path);
    struct stat status = {};
    if (!file || fstat(fileno(file.get()), &status) != 0 || uint64_t(status.st_size) > most)
        return false;
    bytes.resize(size_t(status.st_size));
    if (bytes.empty() || std::fread(bytes.data(), bytes.size(), 1, file.get()) == 1)
        return true;
    bytes.clear();
    return false;
}

bool ModelFiles::readNamed(const std::string& name, std::vector<uint8_t>& bytes, uint64_t most)
{
    const std::string path = toPath(name);
    const std::string fromFolder = !path.empty() && path[0] == '/' ? path : m_folder + path;
    return read(m_folder + name, bytes, most) || read(fromFolder, bytes, most);
}

std::vector<std::string> ModelFiles::list(const std::string& folder)
{
    int descriptor = -1;
    std::vector<std::string> names;
    if (request(LIST, folder, descriptor) != 0 || descriptor < 0)
        return names;
    const File file(fdopen(descriptor, "rb"));
    std::string name;
    for (int c; file && (c = std::fgetc(file.get())) != EOF;)
    {
        name += char(c);
        if (c != '\0')
            continue;
        name.pop_back();
        names.push_back(name);
        name.clear();
    }
    return names;
}

} // namespace convert
