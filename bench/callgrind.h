#pragma once

#include <cstdint>
#include <string>
#include <vector>

/// Counts instructions by running this program again under valgrind's callgrind.
namespace callgrind
{

/// Whether valgrind can be run.
bool isAvailable();

/// Runs this program.
/// @param arguments  for the shell.
/// @param excluded   prefixes of the names of functions that are not counted.
/// @return for each call of measure() that the program makes, in order, the instructions inside; empty, with the reason
/// on standard error, if that does not work.
std::vector<uint64_t> count(const std::string& arguments, const std::vector<std::string>& excluded);

using Work = void (*)(void* object, int number);

/// Calls work(object, number) and counts its instructions when callgrind runs this program.
void measure(Work work, void* object, int number);

} // namespace callgrind
