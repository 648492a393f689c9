#include "orv/renderblockgroup.h"

#include "orv/log.h"

#include <algorithm>
#include <utility>

namespace orv
{

void RenderBlockGroup::addBlock(const SharedPtr<RenderBlockBase>& block)
{
    if (!block)
    {
        ORV_LOG_ERROR("Cannot add an empty render block to a group.");
        return;
    }
    if (block->contains(*this))
    {
        ORV_LOG_ERROR("Cannot add a render block to a group that it contains.");
        return;
    }
    m_blocks.push_back(block);
}

bool RenderBlockGroup::contains(const RenderBlockBase& other) const
{
    for (const SharedPtr<RenderBlockBase>& block : m_blocks)
    {
        if (block && block->contains(other))
            return true;
    }
    return this == &other;
}

void RenderBlockGroup::removeBlock(const SharedPtr<RenderBlockBase>& block)
{
    SharedPtr<RenderBlockBase> removed; // no destructor runs while the list changes
    for (SharedPtr<RenderBlockBase>& each : m_blocks)
    {
        if (each == block)
            removed = std::exchange(each, nullptr);
    }
    closeGaps();
}

/// Calls use(block) for each block. It may drop the group, remove blocks, and add others, whose turn comes the next
/// time.
template <class Use>
void RenderBlockGroup::forEachBlock(const Use& use)
{
    const SharedPtr<RenderBlockGroup> self(sharedGetCount() > 0 ? this : nullptr);
    ++m_walks;
    for (size_t i = 0, count = m_blocks.size(); i < count; ++i)
    {
        if (const SharedPtr<RenderBlockBase> block = m_blocks[i])
            use(*block);
    }
    --m_walks;
    closeGaps();
}

/// Walks count places, so removed blocks leave theirs empty until no walk is left.
void RenderBlockGroup::closeGaps()
{
    if (m_walks == 0)
        m_blocks.erase(std::remove(m_blocks.begin(), m_blocks.end(), nullptr), m_blocks.end());
}

void RenderBlockGroup::render()
{
    forEachBlock([](RenderBlockBase& block) { block.render(); });
}

void RenderBlockGroup::update(float time)
{
    forEachBlock([time](RenderBlockBase& block) { block.update(time); });
}

void RenderBlockGroup::setStereo(float focalDistance, float eyeSeparation)
{
    forEachBlock([=](RenderBlockBase& block) { block.setStereo(focalDistance, eyeSeparation); });
}

} // namespace orv
