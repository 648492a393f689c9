#include "loaders.h"

#include "nulldriver.h"
#include "seeds.h"
#include "watch.h"

#include "glcalls/glcalls.h"

#include "orv/animationcontroller.h"
#include "orv/animationgroup.h"
#include "orv/appearance.h"
#include "orv/camera.h"
#include "orv/detail/digestmaker.h"
#include "orv/detail/programattrib.h"
#include "orv/fontcache.h"
#include "orv/fontface.h"
#include "orv/glo.h"
#include "orv/glyphcache.h"
#include "orv/light.h"
#include "orv/loadlimits.h"
#include "orv/memorystream.h"
#include "orv/rendercontext.h"
#include "orv/shaderprogramcache.h"
#include "orv/solid.h"
#include "orv/textlayout.h"
#include "orv/texture2dcache.h"
#include "orv/texturecubecache.h"
#include "orv/vertexbuffercache.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <map>
#include <set>

namespace hostile
{

using namespace orv;

namespace
{

/// Counts the calls and bytes of a stream in memory.
class CountedStream : public MemoryStream
{
public:
    CountedStream(const Bytes& file, size_t& reads, size_t& bytesRead)
        : MemoryStream(file.data(), int(file.size()))
        , m_reads(reads)
        , m_bytesRead(bytesRead)
    {
    }

    int32_t read(void* buffer, unsigned int count) override
    {
        ++m_reads;
        const int32_t size = MemoryStream::read(buffer, count);
        m_bytesRead += size_t(std::max(size, 0));
        return size;
    }

private:
    size_t& m_reads;
    size_t& m_bytesRead;
};

/// Low limits for loads, so that small files reach them.
constexpr LoadLimits LIMITS = {1 << 20, 1 << 20, 1 << 18};

constexpr size_t LOADS = 2; ///< in one attack, as a picture and as a cube
constexpr int MOST_RECORDS = 100;
constexpr size_t BUILT_IN_BYTES = 49500; ///< of the built-in files, which count as read

} // namespace

/// The attacked file, under every name that begins with "file." and as the stored binary of "sound.sp$", and valid
/// files to which it can refer. Names may have any number of "./" before them.
class Files : public StreamSource
{
public:
    bool exists(const char* name) const override { return find(name) != nullptr; }

    SharedPtr<Stream> open(const char* name, bool writable) override
    {
        const Bytes* file = find(name);
        if (!file || writable)
            return {};
        m_opened.insert(file);
        return makeShared<CountedStream>(*file, m_reads, m_bytesRead);
    }

    const char* getName() const override { return "hostile"; }

    void attackWith(const Bytes& file)
    {
        m_attacker = Bytes(file.begin(), file.end()); // no spare capacity: detects reads beyond it
        m_reads = 0;
        m_bytesRead = 0;
        m_opened.clear();
    }

    size_t reads() const { return m_reads; }
    size_t bytesRead() const { return m_bytesRead; }

    /// The bytes of all files that were opened, each once.
    size_t size() const
    {
        size_t bytes = 0;
        for (const Bytes* file : m_opened)
            bytes += file->size();
        return bytes;
    }

private:
    const Bytes* find(std::string name) const
    {
        name.erase(0, name.find_first_not_of("./"));
        if (name.rfind("file.", 0) == 0 || name == "sound.sp$c")
            return &m_attacker;
        const auto found = m_sound.find(name);
        return found != m_sound.end() ? &found->second : nullptr;
    }

    const std::map<std::string, Bytes> m_sound = makeSoundFiles();
    Bytes m_attacker;
    size_t m_reads = 0;
    size_t m_bytesRead = 0;
    std::set<const Bytes*> m_opened;
};

namespace
{

// --- Loaders -----------------------------------------------------------------------------------------------

/// As one picture and, if its size divides, as the six of a cube.
bool loadImage(Session& session, const Bytes&, std::string& fault)
{
    const SharedPtr<Texture2D> texture = session.pool().getTexture2DCache()->get("file.png");
    const bool divides = !texture || (texture->getWidth() % 3 == 0 && texture->getHeight() % 2 == 0);
    const SharedPtr<TextureCube> cube =
        divides ? session.pool().getTextureCubeCache()->get("file.png") : nullptr;
    if (texture && (texture->getWidth() < 1 || texture->getHeight() < 1 || texture->getId() == 0))
        fault = "a texture without pixels";
    if (cube && (!texture || cube->getWidth() * 3 != texture->getWidth()))
        fault = "a cube of another size than its picture's";
    return texture || cube;
}

bool loadCubeName(Session& session, const Bytes& file, std::string& fault)
{
    const std::string name(file.begin(), file.end());
    const SharedPtr<TextureCube> cube = session.pool().getTextureCubeCache()->get(name.c_str());
    if (cube && cube->getWidth() != cube->getHeight())
        fault = "a cube with faces that are not square";
    return bool(cube);
}

bool loadShaderProgram(Session& session, const Bytes&, std::string& fault)
{
    const SharedPtr<ShaderProgram> program = session.pool().getShaderProgramCache()->get("file.sp$ONE$$TWO");
    for (int i = 0; program && i < program->getUniformCount(); ++i)
    {
        if (!program->getUniformPropertyName(i))
            fault = "a uniform without a property name";
    }
    return bool(program);
}

bool loadAppearanceFile(Session& session, const Bytes&, std::string& fault)
{
    const SharedPtr<Appearance> appearance = loadAppearance(session.pool(), "file.ap");
    if (!appearance)
        fault = "no appearance, where there always is one";
    else
        appearance->enable(*session.renderer().getRenderContext());
    return bool(appearance);
}

bool loadScene(Session& session, const Bytes&, std::string& fault)
{
    const auto root = makeShared<SceneNode>("root");
    const Glo::Ptr glo = loadGloFile(session.pool(), root, "file.glo");
    if (root->getChildCount() != (glo && glo->getTopNode() ? 1u : 0u))
        fault = "something under the parent that the file's top node is not";
    if (!glo)
        return false;

    AnimationController controller(glo->getAnimationGroup());
    for (const float step : {0.0f, 0.5f, 1e9f, -1e30f})
        controller.update(step);
    const FlagMask all;
    session.renderer().render(glo->getCamera(0).get(), *root, all, all);
    for (const SharedPtr<SceneNode>& detached : {glo->getTopNode()})
    {
        if (detached)
            detached->setParent({}, true);
    }
    return true;
}

/// Draws the glyphs of some characters and of the first numbers, at two sizes, on small pages.
/// @return false if the face is refused.
bool drawFace(Session& session, const Bytes& file, std::string& fault)
{
    MemoryStream stream(file.data(), int(file.size()));
    const FontFace::Ptr face = FontFace::load(stream, "file.ttf");
    if (!face)
        return false;
    const auto cache = makeShared<GlyphCache>(session.pool(), GlyphCacheOptions{64, 2});
    cache->addFont(face);
    const auto text = makeShared<TextLayout>(session.pool(), cache, Colour4f::WHITE);
    for (const float size : {16.0f, 60.0f})
    {
        std::string ascii;
        for (char c = ' '; c < 127; ++c)
            ascii += c;
        text->add((ascii + "\xE4\xB8\x96\xF0\x9F\x98\x80").c_str(), size, 0.0f, 0.0f);
        const Vector2f room = text->measure(ascii.c_str(), size);
        if (!std::isfinite(room.x + room.y))
            fault = "a text without end";
    }
    for (unsigned i = 0; i < 64; ++i)
    {
        const TextLayout::Glyph glyph = {0, i, 0.0f, 0.0f};
        if (i < face->getGlyphCount())
            text->addGlyphs(&glyph, 1, 30.0f, 0.0f, 0.0f);
        if (face->findGlyph(i * 331) >= std::max(1u, face->getGlyphCount()))
            fault = "a glyph that is not there";
    }
    const auto context = makeShared<RenderContext>();
    context->setViewport(0, 0, 64, 64);
    const std::size_t vertices = nulldriver::given().vertices;
    text->draw(*context);
    nulldriver::given().vertices = vertices; // the text's vertices do not come from the file
    if (cache->getPageCount() > 2)
        fault = "more pages than allowed";
    return true;
}

bool loadFont(Session& session, const Bytes& file, std::string& fault)
{
    const Font::Ptr font = session.pool().getFontCache()->get("file.ttf;16");
    const bool hasFace = drawFace(session, file, fault);
    if (!font)
        return hasFace;
    const float height = float(font->getTexture()->getHeight());
    for (int c = font->getFirstChar(); c < font->getFirstChar() + font->getCharCount(); ++c)
    {
        const Font::CharacterData& data = font->getCharacterData(c);
        const bool isInside = 0 <= data.x0 && data.x0 <= data.x1 && data.x1 <= 512 && 0 <= data.y0 &&
                              data.y0 <= data.y1 && data.y1 <= height;
        if (!isInside || !std::isfinite(data.xoff + data.yoff + data.xadvance))
            fault = "a character outside of the atlas";
    }
    return true;
}

bool loadPvr(Session& session, const Bytes&, std::string& fault)
{
    const SharedPtr<Texture2D> texture = session.pool().getTexture2DCache()->get("file.pvr");
    if (texture && (texture->getWidth() < 1 || texture->getHeight() < 1 || texture->getId() == 0))
        fault = "a texture without pixels";
    return bool(texture);
}

bool loadVertexStream(Session& session, const Bytes& file, std::string& fault)
{
    const VertexBuffer::Ptr buffer = session.pool().getVertexBufferCache()->create(nullptr);
    const bool loaded = buffer->load(session.openFile());
    if (!loaded && (!buffer->getAttribs().empty() || buffer->getId() != 0))
        fault = "a refused buffer that is not empty";
    std::vector<detail::ProgramAttrib> inputs;
    for (const detail::AttribRecord& record : buffer->getAttribs())
    {
        buffer->enableAttrib(unsigned(inputs.size() % 8), record.name.c_str());
        if (inputs.size() < 8)
            inputs.push_back({record.name, int(inputs.size())});
        if (record.array)
            fault = "an attribute with a pointer out of the file";
        if (record.usage == 0 && size_t(record.offset) > file.size())
            fault = "an attribute outside the data";
    }
    buffer->bindAttribs(*session.renderer().getRenderContext(), 1, inputs.data(), int(inputs.size()));
    return loaded;
}

/// A stored binary of a valid program, which is compiled if the binary cannot be used.
bool loadProgramBinary(Session& session, const Bytes&, std::string& fault)
{
    const SharedPtr<ShaderProgram> program = session.pool().getShaderProgramCache()->get("sound.sp$");
    if (!program || !program->getId())
        fault = "no program from sources because of a bad binary";
    return bool(program);
}

/// A stored digest, and the file's own digest, which must not depend on how it is read in pieces.
bool loadDigest(Session& session, const Bytes& file, std::string& fault)
{
    const char* text = reinterpret_cast<const char*>(file.data());
    const unsigned size = unsigned(file.size());
    detail::DigestMaker whole;
    whole.append(text, size);
    for (const unsigned cut : {size / 3, size - size / 64})
    {
        detail::DigestMaker parts;
        parts.append(text, cut);
        parts.append(text + cut, size - cut);
        if (!(parts.digest() == whole.digest()))
            fault = "a digest that depends on how the text comes";
    }
    detail::DigestMaker::Digest stored;
    const bool loaded = stored.read(*session.openFile());
    if (loaded != (size >= 16) ||
        (loaded && !std::equal(stored.bytes.begin(), stored.bytes.end(), file.begin())))
        fault = "a stored digest that is not the one in the file";
    return loaded;
}

/// Pixels packed as densely as the format and the limits allow, and up to seven times them while they are unpacked (from
/// an interlaced PNG of 16 bits).
size_t getImageHeap(const Bytes& file)
{
    const auto startsWith = [&file](const char* start)
    { return file.size() >= 4 && std::memcmp(file.data(), start, std::strlen(start)) == 0; };
    size_t density = startsWith("\xff\xd8") ? 1400 : startsWith("BM") ? 32 : 256;
    if (startsWith("\x89PNG"))
        density = file.size() > 24 && file[24] >= 8 ? 1032 * 4 : 1032 * 32;
    const size_t allowed = std::max<size_t>(64, LIMITS.pictureBytes / std::max<size_t>(1, file.size()) + 1);
    return std::min(density, allowed) * 7;
}

/// Two bits a pixel become four bytes. Other files are tried as other images; TGA accepts most.
size_t getPvrHeap(const Bytes& file)
{
    const bool mayBeImage = file.size() > 2 && file[2] != 0 && file[2] != 'R';
    return mayBeImage ? getImageHeap(file) : 16 + 4;
}

template <size_t COUNT>
size_t heapOf(const Bytes&)
{
    return COUNT;
}

} // namespace

const std::vector<Loader> LOADERS = {
    {"image", loadImage, getImageHeap, 1 << 17, false},
    // And a picture of 256 KB, which takes four times that during decoding.
    {"cubename", loadCubeName, heapOf<64>, 5 << 18, false},
    {"program", loadShaderProgram, heapOf<64>, 1 << 16, false},
    // "property a int 0" takes 16 bytes and makes a uniform, its name and its place in two tables.
    {"appearance", loadAppearanceFile, heapOf<64>, 5 << 18, false},
    // Objects made by references have the same limit in any file, see GloCredit.
    {"scene", loadScene, heapOf<64>, 6 << 20, false},
    // The requested size determines the atlas, here at most 512 x 4096.
    {"font", loadFont, heapOf<64>, 4 << 20, false},
    {"pvr", loadPvr, getPvrHeap, 1 << 17, false},
    {"vertices", loadVertexStream, heapOf<8>, 1 << 12, false},
    {"binary", loadProgramBinary, heapOf<4>, 1 << 17, true},
    {"digest", loadDigest, heapOf<0>, 1 << 12, true},
};

const Loader* findLoader(const std::string& name)
{
    for (const Loader& loader : LOADERS)
    {
        if (name == loader.name)
            return &loader;
    }
    return nullptr;
}

// --- Session -----------------------------------------------------------------------------------------------

Session::Session()
    : m_files(makeShared<Files>())
    , m_pool(makeShared<AssetCachePool>())
    , m_context(makeShared<RenderContext>())
{
    setLoadLimits(LIMITS);
    m_pool->registerSource(m_files);
    m_renderer = makeShared<SimpleRenderer>(m_context, m_pool);
}

Session::~Session()
{
    m_renderer.reset();
    m_pool->flush();
    m_pool->flush();
    setLoadLimits({});
}

SharedPtr<Stream> Session::openFile()
{
    return m_files->open("file.", false);
}

std::string Session::attack(const Loader& loader, const Bytes& file)
{
    const std::string namesBefore = glcalls::describeLiveNames();
    m_files->attackWith(file);
    messages().clear();
    nulldriver::given() = {};
    heap().start();
    const size_t liveBefore = heap().live;

    std::string fault;
    m_loaded = loader.load(*this, file, fault);
    const size_t peak = heap().peak - std::min(heap().peak, liveBefore);
    m_pool->flush();
    m_pool->flush(); // assets used by those of the first round

    if (fault.empty())
        fault = findFault(loader, file, peak);
    if (fault.empty() && glcalls::describeLiveNames() != namesBefore)
        fault = "left in GL: " + glcalls::describeLiveNames() + "; before: " + namesBefore;
    return fault;
}

std::string Session::findFault(const Loader& loader, const Bytes& file, size_t peak) const
{
    const size_t fileSize = file.size();
    const size_t most = loader.spareHeap + loader.heapPerByte(file) * fileSize;
    if (!m_loaded && messages().errors == 0 && !loader.mayBeSilent)
        return "refused without a message";
    if (m_files->reads() > 64 + 2 * fileSize)
        return std::to_string(m_files->reads()) + " reads of a file of " + std::to_string(fileSize) +
               " bytes";
    std::string fault = findCost();
    if (!fault.empty())
        return fault;
    if (heap().isReported && std::max(peak, heap().largest) > most)
        return "took " + std::to_string(peak) + " bytes, " + std::to_string(heap().largest) +
               " at once, for a file of " + std::to_string(fileSize) + " bytes";
    return {};
}

/// The rule for every loader: the work, counted instead of timed, is limited by the bytes that were read.
std::string Session::findCost() const
{
    const size_t size = m_files->size();
    const nulldriver::Given& given = nulldriver::given();
    const struct
    {
        const char* what;
        size_t count;
        size_t most;
    } costs[] = {
        {"records", size_t(messages().all), LOADS * MOST_RECORDS},
        {"bytes read", m_files->bytesRead(), LOADS * ((size_t(2) << 20) + 10 * size)},
        {"bytes of pixels", given.pixels, LOADS * (size_t(LIMITS.textureBytes) + 63 * size)},
        {"bytes of vertices", given.vertices, LOADS * size},
        {"bytes of sources", given.sources, LOADS * (size_t(LIMITS.programBytes) + size + BUILT_IN_BYTES)},
        {"blocks of memory", heap().isReported ? heap().blocks : 0, LOADS * (20000 + size)},
    };
    for (const auto& cost : costs)
    {
        if (cost.count > cost.most)
            return std::to_string(cost.count) + " " + cost.what + ", more than " + std::to_string(cost.most) +
                   ", for files of " + std::to_string(size) + " bytes";
    }
    return {};
}

} // namespace hostile
