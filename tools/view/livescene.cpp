#include "livescene.h"

#include "companions.h"
#include "loadlog.h"

#include "stage/scenesize.h"

namespace view
{

LiveScene::LiveScene(const SceneFile& file, ConvertedModel* conversion)
{
    setFile(file, conversion);
}

void LiveScene::setFile(const SceneFile& file, ConvertedModel* conversion)
{
    m_file = file;
    m_conversion = conversion;
    m_model = conversion ? file.path : "";
    if (conversion)
        m_file.path = conversion->getScenePath();
}

bool LiveScene::load(std::string& error)
{
    std::unique_ptr<Stage> stage = loadStage(error);
    if (!stage)
        return false;
    takeStage(std::move(stage));
    watchFiles(true);
    return true;
}

bool LiveScene::open(const SceneFile& file, ConvertedModel* conversion, std::string& error)
{
    SceneFile before = m_file;
    if (m_conversion)
        before.path = m_model;
    ConvertedModel* const conversionBefore = m_conversion;
    const std::set<std::string> folders = m_studio.getFolders();
    m_studio.limitFolders({}); // the other file's folder may have files of the same name
    setFile(file, conversion);
    std::unique_ptr<Stage> stage = loadStage(error);
    if (!stage)
    {
        setFile(before, conversionBefore);
        m_studio.limitFolders(folders);
        return false;
    }
    m_player.reset();
    takeStage(std::move(stage));
    watchFiles(true);
    return true;
}

std::unique_ptr<Stage> LiveScene::loadStage(std::string& error)
{
    m_studio.forgetAssets();
    loadlog::reset();
    std::unique_ptr<Stage> stage = Stage::load(m_studio, m_file, error);
    m_studio.flush(); // left over from a failed load
    return stage;
}

void LiveScene::takeStage(std::unique_ptr<Stage> stage)
{
    auto player = std::make_unique<Player>(stage->getAnimation(), stage->getClips());
    if (m_player)
    {
        player->continueFrom(*m_player);
        stage->setBackground(m_stage->getBackground());
    }
    m_player = std::move(player);
    m_stage = std::move(stage);
    m_triangleCount = uint64_t(measureScene(m_stage->getScene()).triangles);
    m_errorCount = loadlog::getErrorCount();
}

/// @param isLoaded  if false, the files needed before may be needed again.
void LiveScene::watchFiles(bool isLoaded)
{
    std::set<std::string> files = isLoaded ? std::set<std::string>() : m_watched;
    if (m_conversion)
        files.merge(findCompanions(m_model));
    for (const std::string& file : m_studio.getAskedFiles())
    {
        if (!m_conversion || !m_conversion->isMade(file))
            files.insert(file);
    }
    m_watched = files;
    m_watcher.watch(files);
}

bool LiveScene::reload(std::string& error)
{
    std::unique_ptr<Stage> stage;
    if (!m_conversion || m_conversion->run(error))
    {
        stage = loadStage(error);
        if (loadlog::getErrorCount() > m_errorCount)
        {
            error = loadlog::getMessage();
            stage.reset();
        }
    }
    const bool isLoaded = bool(stage);
    watchFiles(isLoaded);
    if (isLoaded)
        takeStage(std::move(stage));
    return isLoaded;
}

} // namespace view
