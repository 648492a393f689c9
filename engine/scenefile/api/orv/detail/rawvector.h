#pragma once

#include <memory>
#include <new>
#include <utility>
#include <vector>

namespace orv::detail
{

/// Leaves new elements as the memory is, where std::allocator would set them to zero first.
template <class T>
struct UnfilledAllocator : std::allocator<T>
{
    template <class Other>
    struct rebind
    {
        using other = UnfilledAllocator<Other>;
    };

    template <class Element>
    void construct(Element* element)
    {
        ::new (static_cast<void*>(element)) Element;
    }

    template <class Element, class... Arguments>
    void construct(Element* element, Arguments&&... arguments)
    {
        ::new (static_cast<void*>(element)) Element(std::forward<Arguments>(arguments)...);
    }
};

/// For plain data that is read as a whole: resize() does not write to it.
template <class T>
using RawVector = std::vector<T, UnfilledAllocator<T>>;

} // namespace orv::detail
