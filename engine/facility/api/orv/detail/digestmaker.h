#pragma once

#include <array>
#include <cstdint>

namespace orv
{

class Stream;

namespace detail
{

/// An MD5 computation between its start and its end; md5.h works on it.
struct Md5State
{
    std::array<uint32_t, 4> words;       ///< The running digest: A, B, C, D.
    uint64_t length;                     ///< Bytes taken in so far.
    std::array<unsigned char, 64> block; ///< The unfinished block: the first length % 64 bytes count.
};

/// Fingerprints texts with MD5, to tell whether data derived from them is still current. Not a safeguard against
/// anyone who forges.
class DigestMaker
{
public:
    /// 16 bytes, zero at first.
    struct Digest
    {
        std::array<unsigned char, 16> bytes{};

        /// @return false, digest unchanged, if the stream has fewer than 16 bytes left.
        bool read(Stream& stream);
        bool write(Stream& stream) const;

        bool operator==(const Digest& other) const { return bytes == other.bytes; }
    };

    DigestMaker();

    /// Refused with an error once digest() was called.
    void append(const char* data, unsigned int length);

    /// Ends the computation; every call returns the same value.
    const Digest& digest();

private:
    Md5State m_state;
    Digest m_digest;
    bool m_finished = false;
};

} // namespace detail
} // namespace orv
