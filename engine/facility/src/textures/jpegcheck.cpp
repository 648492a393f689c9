#include "jpegcheck.h"

#include <algorithm>
#include <cstdint>

namespace orv::detail
{

namespace
{

const int END_OF_FILE = -1;

// A scan takes as many steps for each of its blocks as it has coefficients, and a few more. The usual ten scans of a
// progressive file take some 200 steps for each block of the picture; files with more scans must have more bytes. A
// complete file has at least one bit for each block.
const uint64_t STEPS_PER_VISIT = 4;
const uint64_t MOST_STEPS_PER_BLOCK = 224;
const uint64_t MOST_STEPS_PER_BYTE = 128;

class JpegChecker
{
public:
    JpegChecker(const unsigned char* file, std::size_t size) : m_file(file), m_size(size) {}

    bool check()
    {
        if (m_size < 2 || m_file[0] != 0xFF || findMarker() != 0xD8) // start of image
            return true;
        for (int marker = findMarker(); marker != END_OF_FILE && marker != 0xD9; marker = findMarker())
        {
            const bool isAlone = marker <= 0x01 || (marker >= 0xD0 && marker <= 0xD8);
            if (!isAlone && !checkSegment(marker))
                return false;
        }
        return true;
    }

private:
    static constexpr int MOST_COMPONENTS = 4;

    /// Also skips the coded data after a scan's header: markers within it have no length.
    int findMarker()
    {
        while (m_position < m_size && m_file[m_position] != 0xFF)
            ++m_position;
        while (m_position < m_size && m_file[m_position] == 0xFF)
            ++m_position;
        return m_position < m_size ? m_file[m_position++] : END_OF_FILE;
    }

    bool checkSegment(int marker)
    {
        const std::size_t start = m_position;
        const int length = readByte() << 8 | readByte();
        bool isSound = true;
        if (marker == 0xC4)
            isSound = checkTables(length - 2);
        else if (marker == 0xDA)
            isSound = checkScan();
        else if (marker >= 0xC0 && marker <= 0xC2)
            readFrame(marker == 0xC2);
        m_position = start + std::size_t(length < 2 ? 2 : length);
        return isSound;
    }

    bool checkTables(int left)
    {
        while (left > 0)
        {
            const int header = readByte();
            int symbols = 0;
            for (int i = 0; i < 16; ++i)
                symbols += readByte();
            if (symbols > 256)
                return false;
            if (header >> 4 <= 1)
                m_defined[header >> 4] |= 1u << (header & 15);
            m_position += std::size_t(symbols);
            left -= 17 + symbols;
        }
        return true;
    }

    struct Component
    {
        int id = -1;
        uint64_t blocksOfUnit = 0; ///< in each of the picture's units, which hold blocks of all components
        uint64_t blocks = 0;       ///< of the component alone
    };

    /// The decoder refuses sizes, counts and samplings that are 0, and a second frame.
    void readFrame(bool isProgressive)
    {
        m_isProgressive = isProgressive;
        readByte(); // bits of a sample
        const uint64_t height = uint64_t(readByte()) << 8 | uint64_t(readByte());
        const uint64_t width = uint64_t(readByte()) << 8 | uint64_t(readByte());
        const int count = std::min(readByte(), MOST_COMPONENTS);
        uint64_t across[MOST_COMPONENTS] = {};
        uint64_t down[MOST_COMPONENTS] = {};
        uint64_t most[2] = {1, 1};
        for (int i = 0; i < count; ++i)
        {
            m_components[i].id = readByte();
            const auto sampling = unsigned(readByte());
            readByte(); // quantisation table
            across[i] = sampling >> 4;
            down[i] = sampling & 15;
            most[0] = std::max(most[0], across[i]);
            most[1] = std::max(most[1], down[i]);
        }
        m_units = divide(width, 8 * most[0]) * divide(height, 8 * most[1]);
        uint64_t blocks = 0;
        for (int i = 0; i < count; ++i)
        {
            Component& component = m_components[i];
            component.blocksOfUnit = across[i] * down[i];
            component.blocks =
                divide(divide(width * across[i], most[0]), 8) * divide(divide(height * down[i], most[1]), 8);
            blocks += m_units * component.blocksOfUnit;
        }
        m_mostSteps =
            MOST_STEPS_PER_BLOCK * std::min(blocks, 8 * uint64_t(m_size)) + MOST_STEPS_PER_BYTE * m_size;
    }

    static uint64_t divide(uint64_t count, uint64_t size) { return (count + size - 1) / size; }

    bool checkScan()
    {
        unsigned used[2] = {0, 0}; // DC and AC tables
        const int components = readByte();
        uint64_t blocks = 0;
        for (int i = 0; i < components; ++i)
        {
            const int id = readByte();
            const auto found = std::find_if(m_components, m_components + MOST_COMPONENTS,
                                            [id](const Component& component) { return component.id == id; });
            if (found != m_components + MOST_COMPONENTS)
                blocks += components == 1 ? found->blocks : m_units * found->blocksOfUnit;
            const int tables = readByte();
            used[0] |= 1u << (tables >> 4);
            used[1] |= 1u << (tables & 15);
        }
        const int first = readByte();
        const int last = readByte();
        const int coefficients = m_isProgressive ? (first == 0 ? 1 : last - first + 1) : 64;
        m_steps += blocks * (STEPS_PER_VISIT + uint64_t(std::max(coefficients, 0)));
        if (m_steps > m_mostSteps)
            return false;
        const bool isRefinement = readByte() >> 4 != 0;
        const bool needsDc = !m_isProgressive || (first == 0 && !isRefinement);
        const bool needsAc = !m_isProgressive || first != 0;
        return (!needsDc || (used[0] & ~m_defined[0]) == 0) && (!needsAc || (used[1] & ~m_defined[1]) == 0);
    }

    /// 0 beyond the end, as the decoder reads it.
    int readByte() { return m_position < m_size ? m_file[m_position++] : 0; }

    const unsigned char* m_file;
    std::size_t m_size;
    std::size_t m_position = 0;
    bool m_isProgressive = false;
    unsigned m_defined[2] = {0, 0}; ///< bits: DC and AC tables seen so far
    Component m_components[MOST_COMPONENTS];
    uint64_t m_units = 0;
    uint64_t m_steps = 0;
    uint64_t m_mostSteps = 0;
};

} // namespace

bool isSoundJpeg(const unsigned char* file, std::size_t size)
{
    return JpegChecker(file, size).check();
}

} // namespace orv::detail
