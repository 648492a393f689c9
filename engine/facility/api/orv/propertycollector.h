#pragma once

#include "orv/export.h"
#include "orv/sharedptr.h"

namespace orv
{

class ShaderUniformBase;

/// Visitor of an appearance's properties; see Appearance::collectProperties.
class ORV_API PropertyCollector
{
public:
    virtual ~PropertyCollector() = default;

    /// @param uniformIndex  the program uniform that the property feeds, -1 when it feeds none.
    /// @return true to go on, false to end the walk.
    virtual bool collect(const SharedPtr<ShaderUniformBase>& uniform, const char* name, int uniformIndex) = 0;
};

} // namespace orv
