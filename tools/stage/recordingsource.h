#pragma once

#include "orv/filestreamsource.h"
#include "orv/streamsource.h"

#include <set>
#include <string>

namespace view
{

/// The files below a folder, and a record of requests: the files that a scene depends on, missing ones too.
class RecordingSource : public orv::StreamSource
{
public:
    explicit RecordingSource(const std::string& folder) : m_folder(folder), m_files(folder.c_str()) {}

    bool exists(const char* name) const override
    {
        if (!m_isUsed)
            return false;
        m_asked.insert(m_folder + "/" + (name ? name : ""));
        return m_files.exists(name);
    }

    orv::SharedPtr<orv::Stream> open(const char* name, bool writable) override
    {
        return m_isUsed ? m_files.open(name, writable) : orv::SharedPtr<orv::Stream>();
    }

    const char* getName() const override { return m_files.getName(); }

    const std::set<std::string>& getAsked() const { return m_asked; } ///< paths, since the last forget()
    void forget() { m_asked.clear(); }

    /// An unused one has no files.
    bool isUsed() const { return m_isUsed; }
    void setUsed(bool used) { m_isUsed = used; }

private:
    std::string m_folder;
    orv::FileStreamSource m_files;
    mutable std::set<std::string> m_asked;
    bool m_isUsed = true;
};

} // namespace view
