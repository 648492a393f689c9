#pragma once

#include <string>

#include <assimp/ProgressHandler.hpp>

namespace convert
{

/// Says on one line of standard error what goes on, if that is a terminal and it has taken a while.
/// @param share  0 to 1; below 0 if unknown.
void showProgress(const std::string& what, float share = -1.0f);

/// Goes on by another descriptor, so that standard error can be closed.
/// @return that descriptor; -1 if there is nothing to say anyway.
int moveProgress();

/// Takes the line away.
void clearProgress();

/// Tells how far an importer is.
class ImportProgress : public Assimp::ProgressHandler
{
public:
    bool Update(float percentage) override;
    void UpdateFileRead(int step, int steps) override;
    void UpdatePostProcess(int step, int steps) override;
};

} // namespace convert
