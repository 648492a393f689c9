// The fuzzing target for the converter and its reader of glTF: any file must give a scene or a reason, without a crash,
// a hang or exhausted memory. It is converted in this process, where the sanitizers are, without the limits of
// orv-convert. Other files are missing, except those inside the file.

#include "convert/conversion.h"
#include "convert/files/filegate.h"
#include "convert/files/modelfiles.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#include <unistd.h>

namespace
{

/// A file in a temporary folder.
class Scratch
{
public:
    Scratch()
    {
        char folder[] = "/dev/shm/orv-fuzz-XXXXXX";
        if (!mkdtemp(folder))
            std::abort();
        m_folder = folder;
    }
    ~Scratch()
    {
        unlink(path().c_str());
        rmdir(m_folder.c_str());
    }
    Scratch(const Scratch&) = delete;
    Scratch& operator=(const Scratch&) = delete;

    std::string path() const { return m_folder + "/model.gltf"; }

    void write(const uint8_t* data, size_t size) const
    {
        std::FILE* file = std::fopen(path().c_str(), "wb");
        if (!file || std::fwrite(data, 1, size, file) != size || std::fclose(file) != 0)
            std::abort();
    }

private:
    std::string m_folder;
};

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size)
{
    static const Scratch scratch;
    scratch.write(data, size);
    convert::FileGate gate(scratch.path());
    convert::ModelFiles files(scratch.path(), gate);
    convert::Options options;
    options.fps = 2.0;
    const convert::Conversion made = convert::convertFile(scratch.path(), files, "out.glo", options);
    if (made.error.empty() == made.files.empty()) // a scene or a reason
    {
        std::fprintf(stderr, "neither a scene nor a reason: %s\n", made.error.c_str());
        std::abort();
    }
    return 0;
}
