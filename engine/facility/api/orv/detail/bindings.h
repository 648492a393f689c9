#pragma once

#include "orv/detail/bindingepoch.h"
#include "orv/detail/programhandle.h"
#include "orv/export.h"
#include "orv/sharedptr.h"

#include <cstdint>

namespace orv
{
namespace detail
{

/// What is bound in one GL context: program, textures, buffers, vertex attribute arrays.
///
/// Inside a scope each operation does nothing when GL is known to hold what it asks for; what was remembered
/// is forgotten first if bindings were changed elsewhere (see bindingepoch.h). Outside of scopes nothing is
/// remembered. GL thread only.
class Bindings
{
public:
    Bindings() { forget(); }

    /// Scopes may be nested; what is bound counts as unknown from here.
    void openScope();
    /// Leaves GL as RenderContext::DrawScope promises.
    void closeScope();
    bool isScopeOpen() const { return m_scopes != 0; }
    ORV_API void forget();

    void useProgram(unsigned name)
    {
        check();
        if (name != m_program)
            sendProgram(name);
    }

    /// Whether the program of this revision was made ready and this object has not used another one since.
    bool isProgramReady(uint64_t programRevision) const { return m_readyProgram == programRevision; }

    void setProgramReady(uint64_t programRevision) { m_readyProgram = programRevision; }

    /// The program that GL draws with, 0 for none.
    unsigned getProgramInUse() const;

    /// The program object that was enabled last, for ShaderProgram::getCurrent(), which see.
    void setCurrentProgram(const SharedPtr<ProgramHandle>& handle) { m_currentProgram = handle; }
    const SharedPtr<ProgramHandle>& getCurrentProgram() const { return m_currentProgram; }

    /// @param unit    from 0; GL_TEXTURE0 + unit is active afterwards if GL had to be called.
    /// @param target  GL_TEXTURE_2D, GL_TEXTURE_CUBE_MAP or GL_TEXTURE_EXTERNAL_OES; what the unit's other
    ///                targets hold stays.
    void bindTexture(int unit, unsigned target, unsigned name)
    {
        bindTexture(unit, target, name, getTextureSlot(unit, target));
    }

    /// @param slot  what getTextureSlot() says of the two before.
    void bindTexture(int unit, unsigned target, unsigned name, int slot)
    {
        check();
        bindNextTexture(unit, target, name, slot);
    }

    /// The same after another operation, if nothing was bound elsewhere since.
    void bindNextTexture(int unit, unsigned target, unsigned name, int slot)
    {
        if (slot < 0 || m_textures[slot] != name)
            sendTexture(unit, target, name, slot);
    }

    /// @return where a unit's target is remembered, -1 for what is not.
    static int getTextureSlot(int unit, unsigned target);

    void bindArrayBuffer(unsigned name)
    {
        check();
        if (name != m_arrayBuffer)
            sendArrayBuffer(name);
    }

    void bindElementBuffer(unsigned name)
    {
        check();
        if (name != m_elementBuffer)
            sendElementBuffer(name);
    }

    /// Switches vertex attribute arrays so that those of the mask's bits are enabled and all others are not.
    void setAttribArrays(uint32_t enabledMask)
    {
        check();
        if (!m_attribArraysKnown || enabledMask != m_attribArrays)
            sendAttribArrays(enabledMask);
    }

    /// Gives a disabled attribute array's location the constant value (1, 1, 1, 1).
    void setAttribOnes(unsigned location);

    /// Whether arrays, pointers and constants are still those that were set up last for this pair.
    bool isVertexInputBound(uint64_t programRevision, uint64_t vertexBufferRevision) const
    {
        return m_epoch == g_bindingEpoch && m_inputProgram == programRevision &&
               m_inputBuffer == vertexBufferRevision;
    }

    void setVertexInputBound(uint64_t programRevision, uint64_t vertexBufferRevision)
    {
        check();
        m_inputProgram = programRevision;
        m_inputBuffer = vertexBufferRevision;
    }

private:
    static constexpr int TEXTURE_UNITS = 32; ///< remembered; higher units are bound every time
    static constexpr int TEXTURE_TARGETS = 3;
    static constexpr unsigned UNKNOWN = 0xFFFFFFFFu;   ///< no GL object has this name
    static constexpr uint64_t NO_EPOCH = ~uint64_t(0); ///< outside of scopes nothing is known

    void check()
    {
        if (m_epoch != g_bindingEpoch) [[unlikely]]
            forget();
    }

    void tidy();
    void sendProgram(unsigned name);
    void sendTexture(int unit, unsigned target, unsigned name, int slot);
    void sendTextureElsewhere(int unit, unsigned target, unsigned name, int slot);
    void selectUnit(unsigned unit);
    void sendArrayBuffer(unsigned name);
    void sendElementBuffer(unsigned name);
    void sendAttribArrays(uint32_t enabledMask);

    SharedPtr<ProgramHandle> m_currentProgram;
    unsigned m_scopes = 0;
    bool m_isUsed = false; ///< so there is something to tidy
    bool m_attribArraysKnown = false;
    uint32_t m_attribArrays = 0;
    uint32_t m_allAttribArrays = 0; ///< those that the GL has; 0 before it was asked
    uint32_t m_attribOnes = 0;      ///< locations known to hold the constant (1, 1, 1, 1)
    uint64_t m_epoch = NO_EPOCH;
    uint64_t m_inputProgram = 0;
    uint64_t m_inputBuffer = 0;
    uint64_t m_readyProgram = 0;
    mutable unsigned m_program = UNKNOWN;
    unsigned m_arrayBuffer = UNKNOWN;
    unsigned m_elementBuffer = UNKNOWN;
    unsigned m_activeUnit = UNKNOWN;
    uint32_t m_usedUnits = ~0u; ///< whose textures may not be UNKNOWN
    unsigned m_textures[TEXTURE_UNITS * TEXTURE_TARGETS];
};

} // namespace detail
} // namespace orv
