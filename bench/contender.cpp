#include "contender.h"

#include <cstdio>
#include <cstdlib>

void giveUp(const char* reason)
{
    std::fprintf(stderr, "drawbench: %s\n", reason);
    std::exit(EXIT_FAILURE);
}

Contender::Contender()
{
    headless::Options options;
    options.width = WIDTH;
    options.height = HEIGHT;
    std::string error;
    m_surface = headless::Context::create(options, error);
    if (!m_surface)
        giveUp(error.c_str());
}
