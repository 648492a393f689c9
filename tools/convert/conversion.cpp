#include "conversion.h"

#include "figures.h"
#include "model.h"
#include "reportprint.h"

#include <exception>
#include <filesystem>
#include <new>

#include <sys/stat.h>

namespace convert
{

namespace
{

bool sendBytes(const void* data, uint64_t size, std::FILE* stream)
{
    return std::fwrite(&size, sizeof size, 1, stream) == 1 &&
           (size == 0 || std::fwrite(data, 1, size, stream) == size); // data may be null then
}

/// @param bytes  a string or a vector of bytes.
template <class Bytes>
bool receiveBytes(Bytes& bytes, std::FILE* stream)
{
    uint64_t size = 0;
    struct stat whole = {};
    if (std::fread(&size, sizeof size, 1, stream) != 1 || fstat(fileno(stream), &whole) != 0 ||
        size > uint64_t(whole.st_size))
        return false;
    bytes.resize(size);
    return size == 0 || std::fread(bytes.data(), 1, size, stream) == size;
}

bool isExpected(const std::filesystem::path& path, const std::string& out)
{
    const std::filesystem::path scene(out);
    const std::string start = getPictureStem(scene.stem().string());
    return path == scene || (path.parent_path() == scene.parent_path() &&
                             path.filename().string().compare(0, start.size(), start) == 0);
}

void convertOrThrow(const std::string& path, ModelFiles& files, const std::string& out,
                    const Options& options, Conversion& conversion)
{
    const std::filesystem::path target(out);
    ConvertedModel model;
    if (!convertModel(path, files, target.stem().string(), options, model, conversion.error))
        return;
    OutputFile scene{out, {}};
    if (!glo::writeGlo(model.scene, scene.bytes, conversion.error))
        return;
    countScene(model.scene, model.report);
    for (OutputFile& texture : model.textures)
        conversion.files.push_back(
            {(target.parent_path() / texture.path).string(), std::move(texture.bytes)});
    conversion.files.push_back(std::move(scene));
    conversion.text = toText(path, conversion.files, model);
    conversion.json = toJson(path, conversion.files, model);
}

} // namespace

Conversion convertFile(const std::string& model, ModelFiles& files, const std::string& out,
                       const Options& options)
{
    Conversion conversion;
    try
    {
        convertOrThrow(model, files, out, options, conversion);
    }
    catch (const std::bad_alloc&)
    {
        conversion.error = "there is not enough memory";
    }
    catch (const std::exception& exception)
    {
        conversion.error = exception.what();
    }
    return conversion;
}

bool send(const Conversion& conversion, std::FILE* stream)
{
    bool sent = true;
    for (const std::string* text : {&conversion.error, &conversion.text, &conversion.json})
        sent = sent && sendBytes(text->data(), text->size(), stream);
    for (const OutputFile& file : conversion.files)
        sent = sent && sendBytes(file.path.data(), file.path.size(), stream) &&
               sendBytes(file.bytes.data(), file.bytes.size(), stream);
    return sent && sendBytes(nullptr, 0, stream);
}

bool receive(Conversion& conversion, const std::string& out, std::FILE* stream)
{
    for (std::string* text : {&conversion.error, &conversion.text, &conversion.json})
    {
        if (!receiveBytes(*text, stream))
            return false;
    }
    for (;;)
    {
        OutputFile file;
        if (!receiveBytes(file.path, stream))
            return false;
        if (file.path.empty())
            return true;
        if (!isExpected(file.path, out) || !receiveBytes(file.bytes, stream))
            return false;
        conversion.files.push_back(std::move(file));
    }
}

} // namespace convert
