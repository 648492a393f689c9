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

void RenderBlockGroup::render()
{
    for (const SharedPtr<RenderBlockBase>& block : m_blocks)
        block->render();
}

void RenderBlockGroup::update(float time)
{
    for (const SharedPtr<RenderBlockBase>& block : m_blocks)
        block->update(time);
}

void RenderBlockGroup::setStereo(float focalDistance, float eyeSeparation)
{
    for (const SharedPtr<RenderBlockBase>& block : m_blocks)
        block->setStereo(focalDistance, eyeSeparation);
}

} // namespace orv
