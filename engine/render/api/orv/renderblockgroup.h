#pragma once

#include "orv/renderblock.h"

#include <vector>

namespace orv
{

/// Several blocks, in order. Blocks are shared. A block may remove itself and others while its group renders or updates
/// it; blocks that are added then have their turn the next time.
class ORV_API RenderBlockGroup : public RenderBlockBase
{
public:
    ORV_CLASS_NAME("RenderBlockGroup")
    using Ptr = SharedPtr<RenderBlockGroup>;

    /// Appends. Refused with an error is an empty one and one that contains this group, which would never be done.
    void addBlock(const SharedPtr<RenderBlockBase>& block);
    void removeBlock(const SharedPtr<RenderBlockBase>& block); ///< every occurrence; unknown ones are ignored

    void render() override;
    void update(float time) override;
    void setStereo(float focalDistance, float eyeSeparation) override;
    bool contains(const RenderBlockBase& other) const override;

private:
    template <class Use>
    ORV_LOCAL void forEachBlock(const Use& use);
    ORV_LOCAL void closeGaps();

    std::vector<SharedPtr<RenderBlockBase>> m_blocks;
    int m_walks = 0; ///< calls of forEachBlock() that have not ended
};

} // namespace orv
