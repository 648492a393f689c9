#include "orv/detail/digestmaker.h"

#include "md5.h"
#include "orv/log.h"
#include "orv/stream.h"

namespace orv::detail
{

bool DigestMaker::Digest::read(Stream& stream)
{
    std::array<unsigned char, 16> stored;
    if (stream.read(stored.data(), unsigned(stored.size())) != int32_t(stored.size()))
        return false;
    bytes = stored;
    return true;
}

bool DigestMaker::Digest::write(Stream& stream) const
{
    return stream.write(bytes.data(), unsigned(bytes.size())) == int32_t(bytes.size());
}

DigestMaker::DigestMaker()
{
    md5_init(m_state);
}

void DigestMaker::append(const char* data, unsigned int length)
{
    if (m_finished)
    {
        ORV_LOG_ERROR("Improper Attempt to append to message digest");
        return;
    }
    md5_append(m_state, reinterpret_cast<const unsigned char*>(data), length);
}

const DigestMaker::Digest& DigestMaker::digest()
{
    if (!m_finished)
        md5_finish(m_state, m_digest.bytes);
    m_finished = true;
    return m_digest;
}

} // namespace orv::detail
