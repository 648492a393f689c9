#pragma once

#include "orv/detail/glorecords.h"

#include <cstddef>
#include <cstdint>

namespace orv::detail::glo
{

/// References in a scene file multiply: a geometry of a thousand sets that a thousand nodes refer to is a million solids.
/// So the memory of objects made by reference is limited by the file's size. The loader refuses a file above the limit;
/// the inspector reports it by the same rule.
class GloCredit
{
public:
    explicit GloCredit(uint64_t fileSize) : m_left(SPARE + PER_BYTE * fileSize) {}

    /// @return false if that is too much; then nothing is taken.
    bool spend(uint64_t bytes)
    {
        if (bytes > m_left)
            return false;
        m_left -= bytes;
        return true;
    }

    /// A node's solids for the primitive sets of its geometry.
    static constexpr uint64_t solids(size_t count) { return SOLID * uint64_t(count); }

    /// What a channel of a light definition moves.
    static constexpr uint64_t lightChannels(size_t lights) { return CHANNEL * uint64_t(lights); }

    /// Looking for the joints of a skin reference and binding its solids to them. Counts are at most 2^31.
    static uint64_t links(const SkinReference& reference, const Skin& skin, size_t solidCount)
    {
        const uint64_t each =
            SEARCH * (1 + uint64_t(reference.skeletons.size())) + JOINT * uint64_t(solidCount);
        return each * skin.attachments.size();
    }

private:
    static constexpr uint64_t SPARE = uint64_t(4) << 20; ///< for any file
    static constexpr uint64_t PER_BYTE = 32;

    // The approximate memory of each; SEARCH stands for the time of a search below one of the skeletons.
    static constexpr uint64_t SOLID = 480;
    static constexpr uint64_t JOINT = 160;
    static constexpr uint64_t CHANNEL = 512;
    static constexpr uint64_t SEARCH = 8;

    uint64_t m_left;
};

} // namespace orv::detail::glo
