#pragma once

#include <cstdint>

/// Watches operator new of the program; a GL driver's malloc() is not counted.
namespace support
{

/// Allocations by this thread so far.
uint64_t countAllocations();

/// Those of all threads that were not given back.
int64_t countLiveAllocations();

/// The allocation of that number from here on (1 is the next) returns null; only nothrow allocations in the program's
/// own code count. 0 ends it.
void refuseAllocation(uint64_t number);

/// Whether refuseAllocation() has refused one.
bool isAllocationRefused();

} // namespace support
