#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

namespace orv::detail
{

struct LoadLedger;

/// The span of one load: whatever begins loading has one on its stack, and those inside join the outermost.
///
/// The outermost holds what the load has read and made so far, which files could not be loaded (asked for again, they
/// fail again at once), and the LogBudget; it all goes with it. Without a scope nothing is counted or refused.
/// Threads: each has loads of its own.
class LoadScope
{
public:
    /// @param name  of what is loaded, for messages; borrowed. Null counts as an empty text.
    explicit LoadScope(const char* name);
    ~LoadScope();
    LoadScope(const LoadScope&) = delete;
    LoadScope& operator=(const LoadScope&) = delete;

    /// Counts what was read of a file; the same content again is told from new one.
    static void addRead(const void* data, std::size_t size);

    /// The same for a file that is read piece by piece, once.
    static void addRead(uint64_t size);

    /// @return false, after one message, when the same contents were read too often.
    static bool mayRead();

    // Each asks for bytes before they are made. @return false if the load may not have them (logged).
    static bool takePicture(uint64_t bytes,
                            uint64_t fileSize); ///< of a texture that is decoded; without a scope too
    static bool takeTexture(uint64_t bytes);    ///< logs the first refusal
    static bool takeProgram(uint64_t bytes);    ///< logs the first refusal

    /// What could not be loaded, by the cache that was asked and the normalised name.
    static void addFailure(const void* cache, const std::string& name);
    static bool hasFailed(const void* cache, const std::string& name);
    static void forgetFailures(); ///< as when a source is added

    /// Whether it has to be said where files are looked for: once in a load.
    static bool mayExplain();

private:
    std::unique_ptr<LoadLedger> m_ledger; ///< of the outermost
};

} // namespace orv::detail
