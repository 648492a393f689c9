// The mutator of the target "scene": changes records, with the same list of fields as reader and writer, so that sizes
// and counts stay correct and most names exist in the file. One input in four, and unreadable ones, have their bytes
// changed by libFuzzer.

#include "glo/glowriter.h"
#include "orv/detail/gloreader.h"

#include "orv/memorystream.h"

#include <algorithm>
#include <cstring>
#include <iterator>
#include <limits>
#include <optional>
#include <random>
#include <type_traits>
#include <utility>
#include <vector>

extern "C" size_t LLVMFuzzerMutate(uint8_t* data, size_t size, size_t mostSize);

namespace
{

using namespace orv::detail::glo;

class Dice
{
public:
    explicit Dice(unsigned seed) : m_engine(seed + 1) {}

    /// @return 0 to count - 1; count is above 0.
    size_t roll(size_t count) { return size_t(m_engine() >> 8) % count; }

    template <class List>
    const auto& choose(const List& list)
    {
        return list[roll(std::size(list))];
    }

private:
    std::minstd_rand m_engine;
};

constexpr uint32_t NUMBERS[] = {0,  1,   2,     3,     4,          5,          8,         20,
                                21, 255, 65535, 65536, 0x7fffffff, 0x80000000, 0xffffffff};
constexpr float FLOATS[] = {0.0f,
                            -0.0f,
                            1.0f,
                            -1.0f,
                            0.5f,
                            3.1415927f,
                            1e-30f,
                            1e30f,
                            std::numeric_limits<float>::infinity(),
                            -std::numeric_limits<float>::infinity(),
                            std::numeric_limits<float>::quiet_NaN()};
constexpr const char* TEXTS[] = {"",          "face.png",  "grid.png",  "none.png",   "a_position",
                                 "a_normal",  "a_uv0",     "a_joints",  "a_weights",  "a_colour",
                                 "m zun_ppl", "m DYNAMIC", "node-node", "zun_mirror", "node",
                                 "light",     "material"};
constexpr const char* VERSIONS[] = {"0.14.0", "0.13.0", "0.12.0", "0.11.0", "0.10.0", "0.9.0", "0.6.0"};
constexpr size_t MOST_KEY_BYTES = 1024;

/// The Io for fields() (see glofields.h) that visits all values of a scene that can be changed. A walk counts them and
/// gathers the names; the next changes one.
class SceneWalk
{
public:
    SceneWalk(Dice& dice, size_t chosen, const std::vector<std::string>& names)
        : m_dice(dice)
        , m_chosen(chosen)
        , m_knownNames(names)
    {
    }

    size_t places() const { return m_places; }
    std::vector<std::string>& foundNames() { return m_foundNames; }

    FileVersion version() const { return m_version; }

    bool acceptVersion(std::string& text)
    {
        if (isChosen())
            text = m_dice.choose(VERSIONS);
        parseVersion(text.c_str(), m_version);
        return true;
    }

    bool acceptTool(std::string& text)
    {
        if (isChosen())
            text = m_dice.choose(AUTHORING_TOOLS).text;
        return true;
    }

    /// Counts are written correctly anyway, and flags by optionalChunk(), except for missing chunks.
    bool u32(const char* label, uint32_t& value)
    {
        const std::string name = label;
        const bool isOptional = name == "material sampler flag " || name == "leaf node count " ||
                                name == "Index buffer chunk count ";
        if (isOptional && value == 0 && isChosen())
            value = 1;
        else if (!isOptional && isChosen())
            value = m_dice.roll(2) ? m_dice.choose(NUMBERS) : value ^ 1u << m_dice.roll(8);
        return true;
    }

    bool i32(const char*, int32_t& value)
    {
        if (isChosen())
            value = int32_t(m_dice.choose(NUMBERS));
        return true;
    }

    bool f32(const char*, float& value) { return floats(nullptr, &value, 1); }

    bool floats(const char*, float* values, int count)
    {
        if (isChosen())
            values[m_dice.roll(size_t(count))] =
                m_dice.roll(2) ? m_dice.choose(FLOATS) : float(int(m_dice.roll(200)) - 100) / 10;
        return true;
    }

    bool text(const char*, std::string& value)
    {
        m_foundNames.push_back(value);
        if (!isChosen())
            return true;
        if (m_dice.roll(4) == 0)
            value = m_dice.choose(TEXTS);
        else if (m_dice.roll(8) == 0)
            value += char('a' + m_dice.roll(26));
        else
            value = m_dice.choose(m_knownNames);
        return true;
    }

    template <class Fields>
    bool block(const char*, uint32_t, Fields&& blockFields)
    {
        blockFields(*this);
        return true;
    }

    void u32(uint32_t& value) { u32("", value); }
    void f32(float& value) { floats(nullptr, &value, 1); }

    template <class Record>
    bool chunk(Record& record)
    {
        return fields(*this, record);
    }

    template <class Optional>
    bool optionalChunk(Optional& record)
    {
        if (record && isChosen())
        {
            record.reset();
            return true;
        }
        return chunk(record ? *record : record.emplace());
    }

    template <class Record>
    bool chunks(uint32_t, std::vector<Record>& records, bool)
    {
        return each(0, records, [this](Record& record) { return changeWhole(record) && chunk(record); });
    }

    template <class Element, class Fields>
    bool each(uint32_t, std::vector<Element>& elements, Fields&& elementFields)
    {
        if (isChosen())
            changeList(elements);
        for (Element& element : elements)
            elementFields(element);
        return true;
    }

    bool body(GloScene& scene)
    {
        chunk(scene.info);
        chunks(0, scene.geometries, true);
        chunks(0, scene.skins, true);
        chunks(0, scene.lights, true);
        chunks(0, scene.cameras, true);
        chunks(0, scene.materials, true);
        chunks(0, scene.animations, true);
        return chunk(scene.scene ? *scene.scene : scene.scene.emplace());
    }

    bool bytes(VertexData& data)
    {
        if (isChosen() && m_dice.roll(4) == 0)
            data.bytes.resize(m_dice.roll(2 * data.bytes.size() + 4));
        if (isChosen())
            changeBytes(data.bytes.data(), data.bytes.size());
        return true;
    }

    bool indices(IndexData& data)
    {
        if (isChosen())
            changeList(data.indices);
        if (isChosen() && !data.indices.empty())
            data.indices[m_dice.roll(data.indices.size())] =
                uint16_t(m_dice.roll(2) ? m_dice.roll(8) : 65535);
        return true;
    }

    bool keys(Channel& channel)
    {
        channel.type %= type::COUNT;
        channel.coefficientCount %= 100;
        const size_t keySize = 4 + channel.coefficientCount * type::SIZES[channel.type];
        channel.keyCount = uint32_t(std::min<size_t>(channel.keyCount, MOST_KEY_BYTES / keySize));
        channel.keys.resize(keySize * channel.keyCount);
        if (isChosen())
            changeBytes(channel.keys.data(), channel.keys.size());
        return true;
    }

    bool fail(const char*) { return true; }

private:
    bool isChosen() { return m_places++ == m_chosen; }

    static void changeBytes(uint8_t* bytes, size_t size)
    {
        if (size > 0)
            LLVMFuzzerMutate(bytes, size, size);
    }

    template <class Element, class Allocator>
    void changeList(std::vector<Element, Allocator>& elements)
    {
        const size_t at = elements.empty() ? 0 : m_dice.roll(elements.size());
        switch (elements.empty() ? 0 : m_dice.roll(4))
        {
        case 0: elements.push_back(Element()); break;
        case 1: elements.push_back(Element(elements[at])); break;
        case 2: elements.erase(elements.begin() + ptrdiff_t(at)); break;
        default: std::swap(elements[at], elements.front());
        }
    }

    template <class Record>
    bool changeWhole(Record&)
    {
        return true;
    }

    /// A valid channel target with its number of values.
    bool changeWhole(Channel& channel)
    {
        if (!isChosen())
            return true;
        const ChannelKind& kind = m_dice.choose(CHANNEL_KINDS);
        channel.targetType = kind.targetType;
        channel.property = kind.property;
        channel.targetName = m_dice.choose(m_knownNames);
        channel.coefficientCount = m_dice.roll(2) ? kind.fewestCoefficients : kind.mostCoefficients;
        channel.type = type::FLOAT;
        channel.keyCount = uint32_t(1 + m_dice.roll(4));
        return true;
    }

    Dice& m_dice;
    size_t m_chosen;
    size_t m_places = 0;
    FileVersion m_version;
    const std::vector<std::string>& m_knownNames;
    std::vector<std::string> m_foundNames;
};

constexpr size_t NO_PLACE = size_t(-1);

void changeScene(GloScene& scene, Dice& dice)
{
    const std::vector<std::string> none;
    SceneWalk first(dice, NO_PLACE, none);
    fields(first, scene);
    std::vector<std::string>& names = first.foundNames();
    names.push_back("");
    SceneWalk second(dice, dice.roll(first.places()), names);
    fields(second, scene);
}

class GeometryList final : public orv::detail::GeometryReceiver
{
public:
    bool receive(Geometry& geometry, FileVersion) override
    {
        m_geometries.push_back(std::move(geometry));
        return true;
    }

    std::vector<Geometry>& get() { return m_geometries; }

private:
    std::vector<Geometry> m_geometries;
};

std::optional<GloScene> readScene(const uint8_t* data, size_t size)
{
    const auto stream = orv::makeShared<orv::MemoryStream>(data, int(size));
    GeometryList geometries;
    orv::detail::GloReader reader(*stream, geometries, "fuzz");
    if (!reader.read())
        return std::nullopt;
    reader.scene().geometries = std::move(geometries.get());
    return std::move(reader.scene());
}

/// @return 0 if the scene cannot be written or has grown too large.
size_t writeScene(const GloScene& scene, uint8_t* data, size_t mostSize)
{
    std::vector<uint8_t> file;
    std::string error;
    if (!glo::writeGlo(scene, file, error) || file.size() > mostSize)
        return 0;
    std::memcpy(data, file.data(), file.size());
    return file.size();
}

template <class Record>
void append(std::vector<Record>& records, const std::vector<Record>& more)
{
    records.insert(records.end(), more.begin(), more.end());
}

} // namespace

extern "C" size_t LLVMFuzzerCustomMutator(uint8_t* data, size_t size, size_t mostSize, unsigned seed)
{
    Dice dice(seed);
    if (std::optional<GloScene> scene = dice.roll(4) ? readScene(data, size) : std::nullopt)
    {
        for (size_t changes = 1 + dice.roll(4); changes > 0; --changes)
            changeScene(*scene, dice);
        if (const size_t written = writeScene(*scene, data, mostSize))
            return written;
    }
    return LLVMFuzzerMutate(data, size, mostSize);
}

/// The first scene with some definitions of the second, and sometimes its nodes.
extern "C" size_t LLVMFuzzerCustomCrossOver(const uint8_t* data1, size_t size1, const uint8_t* data2,
                                            size_t size2, uint8_t* out, size_t mostSize, unsigned seed)
{
    Dice dice(seed);
    std::optional<GloScene> scene = readScene(data1, size1);
    const std::optional<GloScene> other = readScene(data2, size2);
    if (!scene || !other)
        return 0;
    const size_t parts = dice.roll(128);
    const auto takes = [parts](size_t bit) { return (parts >> bit & 1) != 0; };
    if (takes(0))
        append(scene->geometries, other->geometries);
    if (takes(1))
        append(scene->skins, other->skins);
    if (takes(2))
        append(scene->lights, other->lights);
    if (takes(3))
        append(scene->cameras, other->cameras);
    if (takes(4))
        append(scene->materials, other->materials);
    if (takes(5))
        append(scene->animations, other->animations);
    if (takes(6) && scene->scene && other->scene)
        scene->scene->top.children.push_back(other->scene->top);
    return writeScene(*scene, out, mostSize);
}
