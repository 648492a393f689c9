#pragma once

#include "orv/shared.h"
#include "orv/sharedptr.h"

namespace orv
{

/// Writes a value into one property of one object.
template <class T>
class Animator : public Shared
{
public:
    ORV_CLASS_NAME("Animator")
    using Ptr = SharedPtr<Animator<T>>;

    virtual void apply(const T& value) = 0;
};

} // namespace orv
