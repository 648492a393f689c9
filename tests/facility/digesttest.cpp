#include "orv/detail/digestmaker.h"

#include "orv/memorystream.h"

#include "support/logcapture.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <string>

using namespace orv;
using Digest = detail::DigestMaker::Digest;

namespace
{

std::string toHex(const Digest& digest)
{
    std::string text;
    for (const unsigned char byte : digest.bytes)
    {
        char pair[3];
        std::snprintf(pair, sizeof(pair), "%02x", byte);
        text += pair;
    }
    return text;
}

Digest compute(const std::string& text, unsigned int pieceSize)
{
    detail::DigestMaker maker;
    for (size_t i = 0; i < text.size(); i += pieceSize)
    {
        const std::string piece = text.substr(i, pieceSize);
        maker.append(piece.data(), unsigned(piece.size()));
    }
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
                 {"abcdefghijklmnopqrstuvwxyz", "c3fcd3d76192e4007dfb496cca67e13b"},
                 {"12345678901234567890123456789012345678901234567890123456789012345678901234567890",
                  "57edf4a22be3c955ac49da2e2107b67a"},
                 {std::string(55, 'a'), "ef1772b6dff9a122358552954ad0df65"},
                 {std::string(56, 'a'), "3b0c8ac703f828b04c6c197006d17218"},
                 {std::string(64, 'a'), "014842d480b571495a4a0363793f7367"},
                 {std::string(1000000, 'a'), "7707d6ae4e027c70eea2a935c2296f21"}};
    for (const auto& test : cases)
    {
        for (const unsigned int pieceSize : {1u, 7u, 64u, 65u, 5000000u})
            EXPECT_EQ(test.digest, toHex(compute(test.message, pieceSize))) << test.message.size();
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
