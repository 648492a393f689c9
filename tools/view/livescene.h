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

/// The shown scene, loaded again when its files change, unless they are broken. GL thread only; the GL context has to
/// outlive it.
class LiveScene
{
public:
    /// @param conversion  for a model that is converted, else null; borrowed.
    LiveScene(const SceneFile& file, ConvertedModel* conversion);
    ~LiveScene() = default;

    LiveScene(const LiveScene&) = delete;
    LiveScene& operator=(const LiveScene&) = delete;

    /// The first load. @return false if there is nothing to show; no other function may be called then.
    bool load(std::string& error);

    /// Shows another file, played from its start.
    /// @return false, with nothing changed, if it cannot be loaded.
    bool open(const SceneFile& file, ConvertedModel* conversion, std::string& error);

    /// Whether a file of the scene has changed since the last load. Call it a few times a second.
    bool hasChanged() { return m_watcher.hasChanged(); }

    /// Replaces stage and player. Playing continues at the same place if the new scene has it; the background stays.
    /// @return false, with nothing changed, if the load fails or logs more errors than the last one.
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
    int m_errorCount = 0; ///< logged by the load of the shown scene
    Watcher m_watcher;
    std::set<std::string> m_watched;
};

} // namespace view
