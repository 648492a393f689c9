#include "orv/detail/textstatement.h"

#include "orv/appearance.h"
#include "orv/assetcachepool.h"
#include "orv/detail/assetpath.h"
#include "orv/detail/loadscope.h"
#include "orv/filetostring.h"
#include "orv/shaderprogramcache.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/tokenreader.h"

#include <string_view>

namespace orv
{

namespace
{

std::string_view toView(const CharRange& token)
{
    return std::string_view(token.start, std::size_t(token.end - token.start));
}

/// Reads one appearance file into one appearance, statement by statement.
class AppearanceFileReader
{
public:
    AppearanceFileReader(AssetCachePool& pool, Appearance& appearance, const char* name,
                         const CharRange& text)
        : m_pool(pool)
        , m_appearance(appearance)
        , m_name(name)
        , m_text(text)
    {
    }

    void read()
    {
        if (const char* problem = detail::readFormatVersion(m_text))
        {
            ORV_LOG_ERROR("Appearance file: %s %s", m_name, problem);
            return;
        }
        detail::Statement statement;
        while (detail::readStatement(m_text, statement) && readArguments(statement.tag))
            eatWhite(m_text);
        if (m_missingCount > 0)
            reportMissing();
    }

private:
    void reportMissing() const
    {
        ORV_LOG_ERROR("Appearance file: %s names %u assets that cannot be loaded; the first is %s", m_name,
                      m_missingCount, m_firstMissing);
        m_pool.explainMissing(m_firstMissing);
    }

    using Read = void (AppearanceFileReader::*)();
    using ReadProperty = void (AppearanceFileReader::*)(const char* property);

    struct StatementKind
    {
        std::string_view tag;
        Read read;
    };

    struct PropertyType
    {
        std::string_view word;
        ReadProperty read;
    };

    static const StatementKind STATEMENTS[];
    static const PropertyType PROPERTY_TYPES[];

    /// @return false when the rest of the file must be ignored.
    bool readArguments(const CharRange& tag);
    bool readProperty();

    template <class Enum, std::size_t N>
    Enum readWord(const RenderStateWord (&table)[N], const char* kind, Enum fallback)
    {
        return Enum(readKeyword(table, N, kind, int(fallback)));
    }

    int readKeyword(const RenderStateWord* table, std::size_t size, const char* kind, int fallback)
    {
        const CharRange word = readToken(m_text);
        const int value = findKeyword(table, size, toView(word));
        if (value >= 0)
            return value;
        ORV_LOG_ERROR("Appearance file: %s unexpected %s %s", m_name, kind, word.start);
        return fallback;
    }

    // The fallbacks differ from kind to kind on purpose.
    CullingMode readCulling() { return readWord(CULLING_MODES, "culling mode", CullingMode::CULL_NONE); }
    WindingOrder readWinding() { return readWord(WINDING_ORDERS, "winding mode", WindingOrder::WINDING_CCW); }
    BlendFactor readBlendFactor() { return readWord(BLEND_FACTORS, "blend factor", BlendFactor::ONE); }
    BlendFunction readBlendFunction()
    {
        return readWord(BLEND_FUNCTIONS, "blend function", BlendFunction::ADD);
    }
    StencilFace readFace() { return readWord(STENCIL_FACES, "stencil face", StencilFace::FRONT); }
    StencilOperation readStencilOperation()
    {
        return readWord(STENCIL_OPERATIONS, "stencil operation", StencilOperation::REPLACE);
    }

    float readNumber() { return readFloat(m_text, 0.0f); }

    // Braces here and below guarantee the order in which arguments are read.
    Vector4f readVector4() { return Vector4f{readNumber(), readNumber(), readNumber(), readNumber()}; }

    /// Most caches log nothing for missing files.
    template <class Cache>
    auto readAsset(Cache& cache)
    {
        const CharRange name = readToken(m_text);
        auto asset = cache.get(name.start);
        if (!asset && m_missingCount++ == 0)
            m_firstMissing = name.start;
        return asset;
    }

    void readShaderProgram() { m_appearance.setShaderProgram(readAsset(*m_pool.getShaderProgramCache())); }

    void readPolygonMode()
    {
        readCullingMode();
        readWindingOrder();
        readLineWidth();
    }

    void readCullingMode() { m_appearance.setCullingMode(readCulling()); }
    void readWindingOrder() { m_appearance.setWindingOrder(readWinding()); }

    void readLineWidth()
    {
        const float width = readFloat(m_text, 1.0f);
        if (width > 0.0f)
            m_appearance.setLineWidth(width);
        else
            ORV_LOG_ERROR("Appearance file: %s unexpected line width %g", m_name, double(width));
    }

    void readDepthOffset()
    {
        const float factor = readNumber();
        const float units = readNumber();
        m_appearance.setDepthOffset(factor, units);
    }

    void readDepthTest() { m_appearance.setDepthTestEnabled(readBool(m_text)); }
    void readDepthWrite() { m_appearance.setDepthWriteEnabled(readBool(m_text)); }

    void readDepthFunction()
    {
        m_appearance.setDepthTestFunction(readWord(COMPARISONS, "depth function", DepthFunction::ALWAYS));
    }

    void readColourMask()
    {
        const bool mask[] = {readBool(m_text), readBool(m_text), readBool(m_text), readBool(m_text)};
        m_appearance.setColourMask(mask[0], mask[1], mask[2], mask[3]);
    }

    void readBlendColour()
    {
        m_appearance.setBlendColour(Colour4f{readNumber(), readNumber(), readNumber(), readNumber()});
    }

    void readBlendFactors()
    {
        const BlendFactor factors[] = {readBlendFactor(), readBlendFactor(), readBlendFactor(),
                                       readBlendFactor()};
        m_appearance.setBlendFactors(factors[0], factors[1], factors[2], factors[3]);
    }

    void readBlendFunctions()
    {
        const BlendFunction functions[] = {readBlendFunction(), readBlendFunction()};
        m_appearance.setBlendFunctions(functions[0], functions[1]);
    }

    void readStencilFunction()
    {
        const StencilFace face = readFace();
        const StencilFunction function = readWord(COMPARISONS, "stencil function", StencilFunction::ALWAYS);
        const int reference = readInt(m_text, 0);
        const unsigned mask = readUInt(m_text, 0);
        m_appearance.setStencilFunction(face, function, reference, mask);
    }

    void readStencilOperations()
    {
        const StencilFace face = readFace();
        const StencilOperation operations[] = {readStencilOperation(), readStencilOperation(),
                                               readStencilOperation()};
        m_appearance.setStencilOperations(face, operations[0], operations[1], operations[2]);
    }

    void readStencilMask()
    {
        const StencilFace face = readFace();
        m_appearance.setStencilMask(face, unsigned(readInt(m_text, 0)));
    }

    void readTexture2D(const char* property)
    {
        m_appearance.setProperty(property, readAsset(*m_pool.getTexture2DCache()));
    }

    void readTextureCube(const char* property)
    {
        m_appearance.setProperty(property, readAsset(*m_pool.getTextureCubeCache()));
    }

    void readVector4f(const char* property) { m_appearance.setProperty(property, readVector4()); }

    void readVector3f(const char* property)
    {
        m_appearance.setProperty(property, Vector3f{readNumber(), readNumber(), readNumber()});
    }

    void readVector2f(const char* property)
    {
        m_appearance.setProperty(property, Vector2f{readNumber(), readNumber()});
    }

    void readFloatProperty(const char* property) { m_appearance.setProperty(property, readNumber()); }
    void readIntProperty(const char* property) { m_appearance.setProperty(property, readInt(m_text, 0)); }
    void readBoolProperty(const char* property) { m_appearance.setProperty(property, readBool(m_text)); }

    AssetCachePool& m_pool;
    Appearance& m_appearance;
    const char* m_name;
    CharRange m_text;
    unsigned m_missingCount = 0;
    const char* m_firstMissing = nullptr; ///< points into the text
};

const AppearanceFileReader::StatementKind AppearanceFileReader::STATEMENTS[] = {
    {"shader_program", &AppearanceFileReader::readShaderProgram},
    {"polygon_mode", &AppearanceFileReader::readPolygonMode},
    {"culling_mode", &AppearanceFileReader::readCullingMode},
    {"winding_order", &AppearanceFileReader::readWindingOrder},
    {"line_width", &AppearanceFileReader::readLineWidth},
    {"depth_offset", &AppearanceFileReader::readDepthOffset},
    {"depth_test", &AppearanceFileReader::readDepthTest},
    {"depth_function", &AppearanceFileReader::readDepthFunction},
    {"depth_write", &AppearanceFileReader::readDepthWrite},
    {"colour_mask", &AppearanceFileReader::readColourMask},
    {"blend_colour", &AppearanceFileReader::readBlendColour},
    {"blend_factors", &AppearanceFileReader::readBlendFactors},
    {"blend_functions", &AppearanceFileReader::readBlendFunctions},
    {"stencil_function", &AppearanceFileReader::readStencilFunction},
    {"stencil_operations", &AppearanceFileReader::readStencilOperations},
    {"stencil_mask", &AppearanceFileReader::readStencilMask},
    {"stencil_write_mask", &AppearanceFileReader::readStencilMask},
};

/// A colour is stored as a four-vector.
const AppearanceFileReader::PropertyType AppearanceFileReader::PROPERTY_TYPES[] = {
    {"Texture2D", &AppearanceFileReader::readTexture2D},
    {"TextureCube", &AppearanceFileReader::readTextureCube},
    {"Colour4f", &AppearanceFileReader::readVector4f},
    {"Vector4f", &AppearanceFileReader::readVector4f},
    {"Vector3f", &AppearanceFileReader::readVector3f},
    {"Vector2f", &AppearanceFileReader::readVector2f},
    {"float", &AppearanceFileReader::readFloatProperty},
    {"int", &AppearanceFileReader::readIntProperty},
    {"bool", &AppearanceFileReader::readBoolProperty},
};

bool AppearanceFileReader::readArguments(const CharRange& tag)
{
    if (toView(tag) == "property")
        return readProperty();
    for (const StatementKind& statement : STATEMENTS)
    {
        if (statement.tag != toView(tag))
            continue;
        (this->*statement.read)();
        return true;
    }
    ORV_LOG_ERROR("Appearance file: %s unexpected tag %s", m_name, tag.start);
    return false;
}

bool AppearanceFileReader::readProperty()
{
    const CharRange property = readToken(m_text);
    const CharRange word = readToken(m_text);
    for (const PropertyType& type : PROPERTY_TYPES)
    {
        if (type.word != toView(word))
            continue;
        (this->*type.read)(property.start);
        return true;
    }
    ORV_LOG_ERROR("Appearance file: %s unexpected type %s", m_name, word.start);
    return false;
}

} // namespace

void Appearance::apply(AssetCachePool& pool, const char* name)
{
    const detail::LoadScope scope(name);
    const std::string normalized = detail::normalizeAssetName(name);
    const SharedPtr<Stream> stream = pool.getStream(normalized.c_str());
    if (!stream)
    {
        ORV_LOG_ERROR("Appearance file: %s not found", normalized.c_str());
        pool.explainMissing(normalized.c_str());
        return;
    }
    const FileToString text(*stream);
    if (text.getRange().empty())
    {
        ORV_LOG_ERROR("Appearance file: %s empty", normalized.c_str());
        return;
    }
    AppearanceFileReader(pool, *this, normalized.c_str(), text.getRange()).read();
}

SharedPtr<Appearance> loadAppearance(AssetCachePool& pool, const char* name)
{
    SharedPtr<Appearance> appearance = makeShared<Appearance>();
    if (appearance)
        appearance->apply(pool, name);
    return appearance;
}

} // namespace orv
