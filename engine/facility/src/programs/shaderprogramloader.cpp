#include "orv/shaderprogramloader.h"

#include "shaderprogramfile.h"

#include "orv/detail/digestmaker.h"
#include "orv/detail/littleendian.h"
#include "orv/detail/loadscope.h"
#include "orv/filetostring.h"
#include "orv/shaderprogramcache.h"
#include "orv/textsuffix.h"

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <new>
#include <string>
#include <string_view>

namespace orv
{

namespace
{

using detail::DigestMaker;

const char* const ERROR_PROGRAM = "orv#error.sp";
const uint32_t BINARY_VERSION = 1;
const std::size_t PROGRAM_BYTES = 4096; ///< counted for each program besides its source

bool readWord(Stream& stream, uint32_t& word)
{
    unsigned char bytes[4];
    if (stream.read(bytes, sizeof(bytes)) != int32_t(sizeof(bytes)))
        return false;
    word = detail::readLittleEndian(bytes);
    return true;
}

bool writeWord(Stream& stream, uint32_t word)
{
    unsigned char bytes[4];
    detail::writeLittleEndian(bytes, word);
    return stream.write(bytes, sizeof(bytes)) == int32_t(sizeof(bytes));
}

/// One "#define" line for each piece after a "$", in order; a piece may be empty.
std::string makeDefines(std::string_view pieces)
{
    std::string lines;
    while (!pieces.empty())
    {
        pieces.remove_prefix(1);
        const std::string_view piece = pieces.substr(0, pieces.find('$'));
        lines.append("#define ").append(piece).append("\n");
        pieces.remove_prefix(piece.size());
    }
    return lines;
}

/// One load of one name.
class ProgramReader
{
public:
    ProgramReader(ShaderProgramCache& cache, const std::string& name, bool binaryCaching)
        : m_cache(cache)
        , m_name(name)
        , m_binaryName(name + "c")
        , m_binaryCaching(binaryCaching)
    {
    }

    /// @return false for a missing or invalid file, or beyond the load's limit for programs (logged).
    bool readSources()
    {
        const std::size_t fileNameSize = std::min(m_name.find('$'), m_name.size());
        const std::string fileName = m_name.substr(0, fileNameSize);
        const SharedPtr<Stream> stream = m_cache.getStream(fileName.c_str());
        if (!stream)
            return false;
        FileToString text(*stream);
        if (!m_file.read(text.getRange(), fileName.c_str()))
            return false;

        m_vertex = makeDefines(std::string_view(m_name).substr(fileNameSize));
        m_fragment = m_vertex;
        if (!appendSource(m_vertex, m_file.vertexSource) || !appendSource(m_fragment, m_file.fragmentSource))
            return false;
        const auto fileSize = std::size_t(text.getEnd() - text.getStart());
        return detail::LoadScope::takeProgram(PROGRAM_BYTES + fileSize + m_vertex.size() + m_fragment.size());
    }

    void openBinary()
    {
        if (!m_binaryCaching)
            return;
        m_binary = m_cache.getStream(m_binaryName.c_str());
        if (m_binary)
        {
            ORV_LOG_INFO("Precompiled shader binary \"%s\" found", m_binaryName.c_str());
        }
        else
        {
            m_binary = m_cache.getCacheStream(m_binaryName.c_str(), false);
            if (m_binary)
                ORV_LOG_INFO("Cached shader binary \"%s\" found", m_binaryName.c_str());
        }
        if (m_binary && !m_binaryDigest.read(*m_binary))
            m_binary.reset();
    }

    SharedPtr<ShaderProgram> makeProgram()
    {
        DigestMaker maker;
        maker.append(m_vertex.data(), unsigned(m_vertex.size()));
        maker.append(m_fragment.data(), unsigned(m_fragment.size()));
        const DigestMaker::Digest& digest = maker.digest();

        SharedPtr<ShaderProgram> program;
        if (m_binary && m_binaryDigest == digest)
            program = loadBinary();
        m_binary.reset(); // closed, since the same file may be written next
        if (!program)
            program = compile(digest);
        return program;
    }

    void namePropertiesOf(ShaderProgram& program) const
    {
        for (int i = 0; i < program.getUniformCount(); ++i)
        {
            const char* uniform = program.getUniformInstanceName(i);
            const auto property = m_file.properties.find(uniform);
            if (property != m_file.properties.end())
                program.setUniformPropertyName(i, property->second.c_str());
            else
                ORV_LOG_WARN(
                    "ShaderProgram file: %s uniform \"%s\" is not declared in the shader program file",
                    m_name.c_str(), uniform);
        }
    }

private:
    bool appendSource(std::string& text, const std::string& fileName) const
    {
        const SharedPtr<Stream> stream = m_cache.getStream(fileName.c_str());
        if (!stream)
        {
            ORV_LOG_ERROR("Reading vertex shader file: %s", fileName.c_str()); // for both kinds
            m_cache.getAssetPath()->explainMissing(fileName.c_str());
            return false;
        }
        const FileToString source(*stream);
        if (source.getStart())
            text.append(source.getStart(), source.getEnd());
        return true;
    }

    SharedPtr<ShaderProgram> loadBinary() const
    {
        Stream& stream = *m_binary;
        uint32_t version = 0;
        uint32_t format = 0;
        if (!readWord(stream, version))
        {
            ORV_LOG_WARN("Failed to read -cached- shader \"%s\"", m_binaryName.c_str());
            return {};
        }
        if (version != BINARY_VERSION)
        {
            ORV_LOG_WARN("Unrecognized cached shader version\"%s\"", m_binaryName.c_str());
            return {};
        }
        const bool hasFormat = readWord(stream, format);
        const int32_t size = std::max(std::max(stream.size(), 0) - std::max(stream.tell(), 0), 0);
        const std::unique_ptr<char[]> bytes(new (std::nothrow) char[std::size_t(size) + 1]);
        if (!hasFormat || !bytes)
        {
            ORV_LOG_WARN("Failed to load cached shader \"%s\"", m_binaryName.c_str());
            return {};
        }
        const int32_t length = std::clamp(stream.read(bytes.get(), unsigned(size)), 0, size);
        SharedPtr<ShaderProgram> program =
            m_cache.create(unsigned(length), format, bytes.get(), m_name.c_str());
        if (program)
            ORV_LOG_INFO("Loaded precompiled shader binary \"%s\".", m_binaryName.c_str());
        return program;
    }

    SharedPtr<ShaderProgram> compile(const DigestMaker::Digest& digest) const
    {
        SharedPtr<ShaderProgram> program =
            m_cache.create(m_vertex.c_str(), m_fragment.c_str(), m_name.c_str());
        if (!program)
        {
            ORV_LOG_INFO("Failed to compile shader \"%s\" from source.", m_name.c_str());
            return {};
        }
        ORV_LOG_INFO("Compiled shader from source \"%s\".", m_name.c_str());
        if (!m_binaryCaching)
            return program;

        const SharedPtr<Stream> stream = m_cache.getCacheStream(m_binaryName.c_str(), true);
        if (!stream)
            ORV_LOG_INFO("Failed to write compiled shader to file \"%s\".",
                         m_binaryName.c_str()); // as without a source
        else if (writeBinary(*stream, digest, *program))
            ORV_LOG_INFO("Wrote compiled shader to file \"%s\".", m_binaryName.c_str());
        else
            ORV_LOG_WARN("Failed to write compiled shader to file \"%s\".", m_binaryName.c_str());
        return program;
    }

    /// @return false if the stream did not take everything; true also if the driver gives no binary.
    static bool writeBinary(Stream& stream, const DigestMaker::Digest& digest, const ShaderProgram& program)
    {
        unsigned int length = 0;
        unsigned int format = 0;
        char* binary = nullptr;
        if (!program.getBinary(length, format, binary))
            return true;
        const std::unique_ptr<char[]> owner(binary);
        return digest.write(stream) && writeWord(stream, BINARY_VERSION) && writeWord(stream, format) &&
               stream.write(binary, length) == int32_t(length);
    }

    ShaderProgramCache& m_cache;
    const std::string m_name; ///< as requested, with its defines
    const std::string m_binaryName;
    const bool m_binaryCaching;
    SharedPtr<Stream> m_binary; ///< positioned after its digest
    DigestMaker::Digest m_binaryDigest;
    detail::ShaderProgramFile m_file;
    std::string m_vertex; ///< final sources, defines included
    std::string m_fragment;
};

} // namespace

ShaderProgramLoader::ShaderProgramLoader()
    : m_binaryCaching(getShaderProgramBinariesSupported() && !std::getenv("ORV_NO_PROGRAM_CACHE"))
{
    ORV_LOG_INFO("Shader program binary caching is %s.", m_binaryCaching ? "enabled" : "disabled");
}

bool ShaderProgramLoader::isKnown(const char* name)
{
    return endsWithI(name, ".sp");
}

void ShaderProgramLoader::setBinaryCachingEnabled(bool enabled)
{
    if (enabled && !getShaderProgramBinariesSupported())
    {
        ORV_LOG_ERROR("Shader program binaries are not supported; please check support using "
                      "getShaderProgramBinariesSupported()");
        return;
    }
    m_binaryCaching = enabled;
}

SharedPtr<ShaderProgram> ShaderProgramLoader::load(AssetCache<ShaderProgram>& cache, const char* name)
{
    const detail::LoadScope scope(name);
    ShaderProgramCache& programs = static_cast<ShaderProgramCache&>(cache);
    const std::string requested = detail::normalizeAssetName(name);
    ProgramReader reader(programs, requested, m_binaryCaching);
    reader.openBinary();
    if (!reader.readSources())
        return {};

    SharedPtr<ShaderProgram> program = reader.makeProgram();
    if (program)
    {
        reader.namePropertiesOf(*program);
        return program;
    }
    if (requested != ERROR_PROGRAM)
        return load(cache, ERROR_PROGRAM);

    const bool errorShaderHasError = true;
    ORV_ASSERT(!errorShaderHasError);
    return {};
}

} // namespace orv
