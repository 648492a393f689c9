#include "sequence.h"

#include "support/tempdir.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <random>

namespace
{

std::vector<uint8_t> makeSequence(unsigned seed, size_t size)
{
    std::minstd_rand random(seed + 1);
    std::vector<uint8_t> bytes(size);
    for (uint8_t& byte : bytes)
        byte = uint8_t(random() >> 8);
    return bytes;
}

} // namespace

// Faults caught: nodes that never die or die too soon, joints lost by an order of attaching and moving, a draw with what
// the application or another draw has bound, names of a lost context used in the next one.
TEST(SequenceTest, agreesWithTheModel)
{
    for (unsigned seed = 0; seed < 1500 && !HasFailure(); ++seed)
        EXPECT_EQ("", sequence::play(makeSequence(seed, 40 + seed % 8 * 80))) << seed;
}

// Faults caught: those that fuzzing once found.
TEST(SequenceTest, corpus)
{
    for (const auto& entry : std::filesystem::directory_iterator(ORV_SOURCE_FOLDER "/fuzz/corpus/sequence"))
        EXPECT_EQ("", sequence::play(support::readFile(entry.path()))) << entry.path();
}
