#pragma once

#include "render/glotest.h"
#include "support/logcapture.h"
#include "support/tempdir.h"

#include "orv/appearance.h"
#include "orv/filestreamsource.h"
#include "orv/texture2d.h"

#include <cstdio>

#include <sys/wait.h>

inline const char* const MODELS = "/usr/share/assimp/models/";

struct Outcome
{
    int exitCode;
    std::string output; // of both streams
};

/// Runs orv-convert in a folder of its own, and loads from there.
class ConvertTest : public GloTest
{
protected:
    void SetUp() override
    {
        GloTest::SetUp();
        m_pool->registerSource(orv::makeShared<orv::FileStreamSource>(m_folder.path().c_str()));
    }

    Outcome convert(const std::string& arguments) const
    {
        const std::string command = "cd '" + m_folder.path() + "' && " ORV_CONVERT " " + arguments + " 2>&1";
        std::FILE* pipe = popen(command.c_str(), "r");
        std::string output;
        char buffer[1024];
        for (size_t got; (got = fread(buffer, 1, sizeof buffer, pipe)) > 0;)
            output.append(buffer, got);
        return {WEXITSTATUS(pclose(pipe)), output};
    }

    /// Converts, then loads with the engine, which must not complain.
    orv::Glo::Ptr convertAndLoad(const std::string& arguments, const char* name)
    {
        m_outcome = convert(arguments);
        EXPECT_EQ(0, m_outcome.exitCode) << m_outcome.output;
        support::LogCapture log;
        const orv::Glo::Ptr loaded = orv::loadGloFile(*m_pool, m_root, name, true);
        EXPECT_TRUE(loaded) << log.text();
        EXPECT_EQ(0, log.count('E')) << log.text();
        return loaded;
    }

    bool reports(const char* text) const { return m_outcome.output.find(text) != std::string::npos; }

    static orv::SharedPtr<orv::Texture2D> getTexture(const orv::SharedPtr<orv::Appearance>& appearance)
    {
        orv::SharedPtr<orv::Texture2D> texture;
        EXPECT_TRUE(appearance->getPropertyUniform("M_DIFFUSE_TEXTURE")->getValue(texture, 0));
        return texture;
    }

    support::TempDir m_folder;
    Outcome m_outcome;
};
