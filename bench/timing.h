#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <filesystem>
#include <string>
#include <type_traits>
#include <vector>

/// Without the time to drop what the work returns.
template <class Work>
double measureMs(const Work& work)
{
    using Clock = std::chrono::steady_clock;
    const Clock::time_point start = Clock::now();
    const auto getMs = [start]
    { return std::chrono::duration<double, std::milli>(Clock::now() - start).count(); };
    if constexpr (std::is_void_v<decltype(work())>)
    {
        work();
        return getMs();
    }
    else
    {
        [[maybe_unused]] const auto result = work();
        return getMs();
    }
}

inline double getMedian(std::vector<double> values)
{
    const auto middle = values.begin() + std::ptrdiff_t(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

/// The path of this program, which some benchmarks start again.
inline std::string getProgram()
{
    return std::filesystem::read_symlink("/proc/self/exe").string();
}
