#include "datauri.h"

#include "convert/lowercase.h"
#include "modelfiles.h"

#include <array>

namespace convert
{

namespace
{

constexpr int8_t NO_DIGIT = -1;

constexpr std::array<int8_t, 256> makeDigits()
{
    std::array<int8_t, 256> digits{};
    digits.fill(NO_DIGIT);
    for (size_t i = 0; i < 26; ++i)
    {
        digits['A' + i] = int8_t(i);
        digits['a' + i] = int8_t(26 + i);
    }
    for (size_t i = 0; i < 10; ++i)
        digits['0' + i] = int8_t(52 + i);
    digits[size_t('+')] = digits[size_t('-')] = 62;
    digits[size_t('/')] = digits[size_t('_')] = 63;
    return digits;
}

constexpr std::array<int8_t, 256> DIGITS = makeDigits();

std::vector<uint8_t> decodeBase64(const std::string& text, size_t start)
{
    std::vector<uint8_t> bytes;
    bytes.reserve((text.size() - start) / 4 * 3 + 3);
    uint32_t bits = 0;
    int count = 0;
    for (size_t i = start; i < text.size(); ++i)
    {
        const int8_t digit = DIGITS[static_cast<unsigned char>(text[i])];
        if (digit == NO_DIGIT)
            continue; // padding, line ends
        bits = bits << 6 | uint32_t(digit);
        count += 6;
        if (count >= 8)
        {
            count -= 8;
            bytes.push_back(uint8_t(bits >> count));
        }
    }
    return bytes;
}

} // namespace

bool isDataUri(const std::string& uri)
{
    return toLowerCase(uri.substr(0, 5)) == "data:";
}

std::optional<std::vector<uint8_t>> readDataUri(const std::string& uri)
{
    const size_t comma = uri.find(',');
    if (comma == std::string::npos)
        return std::nullopt;
    const std::string head = toLowerCase(uri.substr(0, comma));
    if (head.find(";base64") == std::string::npos)
    {
        const std::string plain = decodeUrl(uri.substr(comma + 1));
        return std::vector<uint8_t>(plain.begin(), plain.end());
    }
    if (uri.find('%', comma) == std::string::npos)
        return decodeBase64(uri, comma + 1);
    return decodeBase64(decodeUrl(uri.substr(comma + 1)), 0);
}

} // namespace convert
