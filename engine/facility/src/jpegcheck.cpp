#include "jpegcheck.h"

namespace orv::detail
{

namespace
{

const int END_OF_FILE = -1;

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
    /// Also passes over the coded data after a scan's header: markers within it stand alone.
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
            m_isProgressive = marker == 0xC2;
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

    bool checkScan()
    {
        unsigned used[2] = {0, 0}; // DC and AC tables
        const int components = readByte();
        for (int i = 0; i < components; ++i)
        {
            readByte(); // which component
            const int tables = readByte();
            used[0] |= 1u << (tables >> 4);
            used[1] |= 1u << (tables & 15);
        }
        const int first = readByte();
        readByte(); // last coefficient
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
};

} // namespace

bool hasSoundHuffmanTables(const unsigned char* file, std::size_t size)
{
    return JpegChecker(file, size).check();
}

} // namespace orv::detail
