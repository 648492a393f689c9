#pragma once

#include <cstdint>

/// Watches operator new of the program that uses this; what a GL driver takes from malloc() does not count.
namespace support
{

/// Allocations by this thread so far.
uint64_t countAllocations();

/// Those of all threads that were not given back.
int64_t countLiveAllocations();

/// The allocation of that number from here on (1 is the next) yields null; only those count that ask for null
/// instead of an exception, in the program's own code. 0 ends it.
void refuseAllocation(uint64_t number);

/// Whether refuseAllocation() has hit one.
bool isAllocationRefused();

} // namespace support
