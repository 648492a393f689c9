#include "orv/detail/bindings.h"

#include "countedgl.h"

#include "orv/detail/texturetarget.h"
#include "orv/renderdevice.h"

#include <GLES2/gl2ext.h>

#include <algorithm>
#include <bit>
#include <iterator>

namespace orv
{
namespace detail
{

static_assert(TEXTURE_TARGET_2D == GL_TEXTURE_2D && TEXTURE_TARGET_CUBE_MAP == GL_TEXTURE_CUBE_MAP &&
              TEXTURE_TARGET_EXTERNAL == GL_TEXTURE_EXTERNAL_OES);

void Bindings::openScope()
{
    ++m_scopes;
    forget();
}

void Bindings::closeScope()
{
    tidy();
    if (--m_scopes == 0)
        forget();
}

unsigned Bindings::getProgramInUse() const
{
    const bool isKnown = m_epoch == g_bindingEpoch;
    if (isKnown && m_program != UNKNOWN)
        return m_program;
    GLint program = 0;
    glGetIntegerv(GL_CURRENT_PROGRAM, &program);
    if (isKnown)
        m_program = unsigned(program);
    return unsigned(program);
}

void Bindings::setAttribOnes(unsigned location)
{
    static const GLfloat ONES[4] = {1.0f, 1.0f, 1.0f, 1.0f};
    check();
    const uint32_t bit = location < 32 ? 1u << location : 0u;
    if ((m_attribOnes & bit) != 0)
        return;
    glVertexAttrib4fv(location, ONES);
    m_attribOnes |= bit;
}

void Bindings::forget()
{
    m_epoch = m_scopes != 0 ? g_bindingEpoch : NO_EPOCH;
    m_attribArraysKnown = false;
    m_attribOnes = 0;
    m_inputProgram = 0;
    m_inputBuffer = 0;
    m_readyProgram = 0;
    m_program = UNKNOWN;
    m_arrayBuffer = UNKNOWN;
    m_elementBuffer = UNKNOWN;
    m_activeUnit = UNKNOWN;
    for (; m_usedUnits != 0; m_usedUnits &= m_usedUnits - 1u)
        std::fill_n(m_textures + std::countr_zero(m_usedUnits) * TEXTURE_TARGETS, TEXTURE_TARGETS, UNKNOWN);
}

/// Arrays left enabled would be read by the application's own draws, perhaps from deleted buffers.
void Bindings::tidy()
{
    if (!m_isUsed)
        return;
    setAttribArrays(0);
    bindArrayBuffer(0);
    bindElementBuffer(0);
    if (m_activeUnit != 0)
        selectUnit(0);
    m_isUsed = false;
}

int Bindings::getTextureSlot(int unit, unsigned target)
{
    constexpr GLenum TARGETS[TEXTURE_TARGETS] = {GL_TEXTURE_2D, GL_TEXTURE_CUBE_MAP, GL_TEXTURE_EXTERNAL_OES};
    const auto found = std::find(std::begin(TARGETS), std::end(TARGETS), target);
    if (unsigned(unit) >= unsigned(TEXTURE_UNITS) || found == std::end(TARGETS))
        return -1;
    return unit * TEXTURE_TARGETS + int(found - std::begin(TARGETS));
}

void Bindings::sendProgram(unsigned name)
{
    glUseProgram(name);
    m_program = name;
    m_readyProgram = 0;
}

void Bindings::sendTexture(int unit, unsigned target, unsigned name, int slot)
{
    if (m_activeUnit != unsigned(unit)) [[unlikely]]
        return sendTextureElsewhere(unit, target, name, slot);
    if (slot >= 0)
        m_textures[slot] = name;
    glBindTexture(target, name);
}

[[gnu::noinline]] void Bindings::sendTextureElsewhere(int unit, unsigned target, unsigned name, int slot)
{
    selectUnit(unsigned(unit));
    sendTexture(unit, target, name, slot);
}

void Bindings::selectUnit(unsigned unit)
{
    glActiveTexture(GL_TEXTURE0 + unit);
    m_activeUnit = unit;
    m_isUsed = true;
    if (unit < unsigned(TEXTURE_UNITS))
        m_usedUnits |= 1u << unit;
}

void Bindings::sendArrayBuffer(unsigned name)
{
    m_isUsed = true;
    glBindBuffer(GL_ARRAY_BUFFER, name);
    m_arrayBuffer = name;
}

void Bindings::sendElementBuffer(unsigned name)
{
    m_isUsed = true;
    glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, name);
    m_elementBuffer = name;
}

void Bindings::sendAttribArrays(uint32_t enabledMask)
{
    m_isUsed = true;
    if (m_allAttribArrays == 0)
    {
        const int count = RenderDevice::getMaxVertexAttributeVectors();
        m_allAttribArrays = count < 32 ? (1u << count) - 1u : ~0u;
    }
    uint32_t different = m_attribArraysKnown ? enabledMask ^ m_attribArrays : m_allAttribArrays | enabledMask;
    for (; different != 0; different &= different - 1u)
    {
        const auto location = unsigned(std::countr_zero(different));
        if ((enabledMask >> location & 1u) != 0)
            glEnableVertexAttribArray(location);
        else
            glDisableVertexAttribArray(location);
    }
    m_attribArrays = enabledMask;
    m_attribArraysKnown = true;
    // A draw leaves the constant value of an enabled array's location undefined.
    m_attribOnes &= ~enabledMask;
}

} // namespace detail
} // namespace orv
