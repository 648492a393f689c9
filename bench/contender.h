#pragma once

#include "drawscene.h"

#include "headless/headless.h"

#include <memory>

[[noreturn]] void giveUp(const char* reason);

/// One way of drawing a scene, with a GL context of its own.
class Contender
{
public:
    Contender();
    virtual ~Contender() = default;

    /// Moves what moves and draws it all.
    /// @param frame  counts up from 0.
    virtual void draw(int frame) = 0;

    headless::Context& surface() { return *m_surface; }

    static constexpr int WIDTH = 320;
    static constexpr int HEIGHT = 240;

private:
    std::unique_ptr<headless::Context> m_surface;
};

/// The engine; the scene is borrowed by all of these.
std::unique_ptr<Contender> makeWalkContender(const DrawScene& scene);       ///< in the order of the scene
std::unique_ptr<Contender> makeByMaterialContender(const DrawScene& scene); ///< whose order is by material
std::unique_ptr<Contender> makeGroupedContender(const DrawScene& scene);    ///< grouped by the renderer

/// The reference: code written by hand for this scene only.
std::unique_ptr<Contender> makeHandContender(const DrawScene& scene);
