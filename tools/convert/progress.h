#pragma once

#include <string>

#include <assimp/ProgressHandler.hpp>

namespace convert
{

/// Shows progress on one line of standard error, if that is a terminal and some time has passed.
/// @param share  0 to 1; below 0 if unknown.
void showProgress(const std::string& what, float share = -1.0f);

/// Continues on another descriptor, so that standard error can be closed.
/// @return that descriptor; -1 if no progress is shown.
int moveProgress();

/// Clears the line.
void clearProgress();

/// Shows an importer's progress.
class ImportProgress : public Assimp::ProgressHandler
{
public:
    bool Update(float percentage) override;
    void UpdateFileRead(int step, int steps) override;
    void UpdatePostProcess(int step, int steps) override;
};

} // namespace convert
