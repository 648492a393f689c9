#pragma once

#include <memory>
#include <string>
#include <vector>

namespace view
{

/// A model, and the scene that orv-convert makes from it in a temporary folder, which this object removes.
class ConvertedModel
{
public:
    /// Finds the converter: beside this program, where a build puts it, or on the PATH; and makes the folder.
    /// @param arguments  further ones for the converter.
    static std::unique_ptr<ConvertedModel> create(const std::string& model,
                                                  std::vector<std::string> arguments, std::string& error);
    ~ConvertedModel();

    ConvertedModel(const ConvertedModel&) = delete;
    ConvertedModel& operator=(const ConvertedModel&) = delete;

    /// Converts the model as it is now. The converter's messages go to standard error.
    /// @return false, with the scene as it was, if it cannot be converted.
    bool run(std::string& error);

    const std::string& getScenePath() const { return m_scene; }

    /// Whether a path is inside the folder.
    bool isMade(const std::string& path) const
    {
        return path.compare(0, m_folder.size() + 1, m_folder + "/") == 0;
    }

private:
    ConvertedModel() = default;

    std::string m_program;
    std::string m_model;
    std::vector<std::string> m_arguments;
    std::string m_folder;
    std::string m_scene;
};

} // namespace view
