#include "orv/renderblockgroup.h"

#include "orv/log.h"

#include <algorithm>

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
        if (block->contains(other))
            return true;
    }
    return this == &other;
}

void RenderBlockGroup::removeBlock(const SharedPtr<RenderBlockBase>& block)
{
    m_blocks.erase(std::remove(m_blocks.begin(), m_blocks.end(), block), m_blocks.end());
}

/// Calls use(block) for each block. It may drop the group, remove the block, and add others, whose turn comes the next
/// time.
template <class Use>
void RenderBlockGroup::forEachBlock(const Use& use)
{
    const SharedPtr<RenderBlockGroup> self(sharedGetCount() > 0 ? this : nullptr);
    size_t next = 0;
    for (size_t left = m_blocks.size(); left > 0 && next < m_blocks.size(); --left)
    {
        const SharedPtr<RenderBlockBase> block = m_blocks[next];
        use(*block);
        if (next < m_blocks.size() && m_blocks[next] == block)
            ++next; // otherwise the following block has taken its place
    }
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
