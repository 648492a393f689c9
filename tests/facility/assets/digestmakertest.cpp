#include "orv/detail/digestmaker.h"

#include "orv/memorystream.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string>

using namespace orv;
using Digest = detail::DigestMaker::Digest;

namespace
{

Digest compute(const std::string& text, size_t pieceSize)
{
    detail::DigestMaker maker;
    for (size_t i = 0; i < text.size(); i += pieceSize)
        maker.append(&text[i], unsigned(std::min(pieceSize, text.size() - i)));
    return maker.digest();
}

} // namespace

// Fault caught: padding that goes wrong where the length comes near a whole block, or pieces that are not joined.
TEST(DigestMaker, isMd5WhateverThePieces)
{
    const struct
    {
        std::string message;
        const char* digest;
    } cases[] = {{"", "d41d8cd98f00b204e9800998ecf8427e"},
                 {"abc", "900150983cd24fb0d6963f7d28e17f72"},
                 {"12345678901234567890123456789012345678901234567890123456789012345678901234567890",
                  "57edf4a22be3c955ac49da2e2107b67a"},
                 {std::string(55, 'a'), "ef1772b6dff9a122358552954ad0df65"},
                 {std::string(56, 'a'), "3b0c8ac703f828b04c6c197006d17218"},
                 {std::string(64, 'a'), "014842d480b571495a4a0363793f7367"},
                 {std::string(1000000, 'a'), "7707d6ae4e027c70eea2a935c2296f21"}};
    for (const auto& test : cases)
    {
        for (const size_t pieceSize : {1, 7, 64, 65, 5000000})
        {
            const Digest digest = compute(test.message, pieceSize);
            for (size_t i = 0; i < 16; ++i)
                EXPECT_EQ(std::stoi(std::string(test.digest + 2 * i, 2), nullptr, 16), digest.bytes[i]) << i;
        }
    }
}

TEST(DigestMaker, isFinishedByItsDigest)
{
    support::LogCapture log;
    detail::DigestMaker maker;
    maker.append("abc", 3);
    const Digest first = maker.digest();
    EXPECT_EQ("", log.text());
    maker.append("d", 1);
    EXPECT_EQ(1, log.countMessage("Improper Attempt to append to message digest"));
    EXPECT_TRUE(first == maker.digest());
}

// Fault caught: a cache file cut inside its digest taken for a valid one.
TEST(DigestMaker, shortStreamLeavesTheDigest)
{
    const Digest digest = compute("abc", 3);
    MemoryStream whole(digest.bytes.data(), 16);
    MemoryStream cut(digest.bytes.data(), 15);
    Digest read;
    EXPECT_FALSE(read.read(cut));
    EXPECT_TRUE(read == Digest());
    EXPECT_TRUE(read.read(whole));
    EXPECT_TRUE(read == digest);
}
