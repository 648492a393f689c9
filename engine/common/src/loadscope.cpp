#include "orv/detail/loadscope.h"

#include "orv/detail/logbudget.h"
#include "orv/loadlimits.h"
#include "orv/log.h"
#include "orv/sharedptr.h"

#include <algorithm>
#include <functional>
#include <map>
#include <new>
#include <string_view>
#include <utility>

namespace orv
{

namespace
{

LoadLimits g_limits;

} // namespace

void setLoadLimits(const LoadLimits& limits)
{
    g_limits = limits;
}

const LoadLimits& getLoadLimits()
{
    return g_limits;
}

namespace detail
{

namespace
{

// Reading again costs only a little time.
constexpr uint64_t REREAD_BYTES = uint64_t(2) << 20;
constexpr uint64_t REREAD_PER_BYTE = 8;
constexpr uint64_t TEXTURE_PER_BYTE = 63;
constexpr uint64_t PICTURE_PER_BYTE = 64;
constexpr uint64_t MOST_PICTURE_BYTES = uint64_t(256) << 20; ///< however large the file is
constexpr uint64_t PROGRAM_PER_BYTE = 1;

thread_local LoadLedger* t_ledger = nullptr;

/// The values stay empty; caches have such a map as well.
using Names = std::map<std::string, SharedPtr<Shared>>;

template <class Number>
std::string toKey(Number number)
{
    return std::string(reinterpret_cast<const char*>(&number), sizeof(number));
}

std::string toFailure(const void* cache, const std::string& name)
{
    return toKey(cache) + name;
}

} // namespace

struct LoadLedger
{
    explicit LoadLedger(const char* what) : name(what), log(what) {}

    /// Logs the first refusal of a kind.
    void refuse(bool& isRefused, const char* what, uint64_t limit)
    {
        if (!isRefused)
            ORV_LOG_ERROR("%s %s more than %llu bytes; the rest is refused", name, what,
                          static_cast<unsigned long long>(limit));
        isRefused = true;
    }

    bool take(uint64_t& taken, uint64_t bytes, uint64_t limit, bool& isRefused, const char* what)
    {
        if (bytes > limit || taken > limit - bytes)
        {
            refuse(isRefused, what, limit);
            return false;
        }
        taken += bytes;
        return true;
    }

    const char* name;
    LogBudget log;
    Names contents; ///< by hash and size
    Names failures;
    uint64_t read = 0;
    uint64_t readAgain = 0;
    uint64_t textures = 0;
    uint64_t programs = 0;
    bool isReadingRefused = false;
    bool isTextureRefused = false;
    bool isProgramRefused = false;
    bool isExplained = false; ///< the log has named the searched places
};

LoadScope::LoadScope(const char* name)
{
    if (t_ledger)
        return;
    m_ledger.reset(new (std::nothrow) LoadLedger(name ? name : ""));
    if (!m_ledger)
        logNoMemory("LoadScope"); // the load goes on without limits
    t_ledger = m_ledger.get();
}

LoadScope::~LoadScope()
{
    if (m_ledger)
        t_ledger = nullptr;
}

void LoadScope::addRead(const void* data, std::size_t size)
{
    if (!t_ledger || size == 0)
        return;
    const std::string_view text(static_cast<const char*>(data), size);
    const bool isNew =
        t_ledger->contents.try_emplace(toKey(std::hash<std::string_view>()(text)) + toKey(size)).second;
    (isNew ? t_ledger->read : t_ledger->readAgain) += size;
}

void LoadScope::addRead(uint64_t size)
{
    if (t_ledger)
        t_ledger->read += size;
}

bool LoadScope::mayRead()
{
    if (!t_ledger)
        return true;
    const uint64_t limit = REREAD_BYTES + REREAD_PER_BYTE * t_ledger->read;
    if (t_ledger->readAgain <= limit)
        return true;
    t_ledger->refuse(t_ledger->isReadingRefused, "reads the same files over and over,", limit);
    return false;
}

bool LoadScope::takePicture(uint64_t bytes, uint64_t fileSize)
{
    const uint64_t limit =
        std::max(g_limits.pictureBytes, std::min(PICTURE_PER_BYTE * fileSize, MOST_PICTURE_BYTES));
    if (bytes <= limit)
        return takeTexture(bytes);
    ORV_LOG_ERROR("A file of %llu bytes may decode to %llu bytes, not to %llu (see LoadLimits)",
                  static_cast<unsigned long long>(fileSize), static_cast<unsigned long long>(limit),
                  static_cast<unsigned long long>(bytes));
    return false;
}

bool LoadScope::takeTexture(uint64_t bytes)
{
    return !t_ledger || t_ledger->take(t_ledger->textures, bytes,
                                       g_limits.textureBytes + TEXTURE_PER_BYTE * t_ledger->read,
                                       t_ledger->isTextureRefused, "asks for textures of");
}

bool LoadScope::takeProgram(uint64_t bytes)
{
    return !t_ledger || t_ledger->take(t_ledger->programs, bytes,
                                       g_limits.programBytes + PROGRAM_PER_BYTE * t_ledger->read,
                                       t_ledger->isProgramRefused, "asks for shader programs of");
}

void LoadScope::addFailure(const void* cache, const std::string& name)
{
    if (t_ledger)
        t_ledger->failures.try_emplace(toFailure(cache, name));
}

bool LoadScope::hasFailed(const void* cache, const std::string& name)
{
    return t_ledger && !t_ledger->failures.empty() &&
           t_ledger->failures.find(toFailure(cache, name)) != t_ledger->failures.end();
}

bool LoadScope::mayExplain()
{
    return !t_ledger || !std::exchange(t_ledger->isExplained, true);
}

void LoadScope::forgetFailures()
{
    if (t_ledger)
        t_ledger->failures.clear();
}

} // namespace detail

} // namespace orv
