#pragma once

#include "convertedmodel.h"
#include "watcher.h"

#include "stage/player.h"
#include "stage/stage.h"
#include "stage/studio.h"

#include <cstdint>
#include <memory>
#include <set>
#include <string>

namespace view
{

/// What is shown, as its files are at the moment: loaded again when they change, unless they are broken.
/// GL thread only; the GL context has to outlive it.
class LiveScene
{
public:
    /// @param conversion  of a model that is no scene file, null for others; borrowed.
    LiveScene(const SceneFile& file, ConvertedModel* conversion);
    ~LiveScene() = default;

    LiveScene(const LiveScene&) = delete;
    LiveScene& operator=(const LiveScene&) = delete;

    /// The first time. @return false if there is nothing to show; nothing else may be asked for then.
    bool load(std::string& error);

    /// Shows another file from now on, played from its start.
    /// @return false, with everything as it was, if it cannot be loaded.
    bool open(const SceneFile& file, ConvertedModel* conversion, std::string& error);

    /// Whether a file that matters has changed since the last load. Ask a few times a second.
    bool hasChanged() { return m_watcher.hasChanged(); }

    /// Stage and player are others afterwards. What was played goes on where it was, as far as the new scene has it;
    /// the background stays.
    /// @return false, with everything as it was, if the files are broken, or have more wrong with them than before.
    bool reload(std::string& error);

    Studio& getStudio() { return m_studio; }
    Stage& getStage() { return *m_stage; }
    Player& getPlayer() { return *m_player; }
    uint64_t getTriangleCount() const { return m_triangleCount; }

private:
    void setFile(const SceneFile& file, ConvertedModel* conversion);
    std::unique_ptr<Stage> loadStage(std::string& error);
    void takeStage(std::unique_ptr<Stage> stage);
    void watchFiles(bool isLoaded);

    SceneFile m_file;
    std::string m_model; ///< the file that m_file was converted from; "" if it was not
    ConvertedModel* m_conversion = nullptr;
    Studio m_studio;
    std::unique_ptr<Stage> m_stage;
    std::unique_ptr<Player> m_player;
    uint64_t m_triangleCount = 0;
    int m_errorCount = 0; ///< logged by the load of what is shown
    Watcher m_watcher;
    std::set<std::string> m_watched;
};

} // namespace view
