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
    m_blocks.push_back(block);
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
