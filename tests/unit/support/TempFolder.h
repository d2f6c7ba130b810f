#ifndef VANTOR_SUPPORT_TEMPFOLDER_H
#define VANTOR_SUPPORT_TEMPFOLDER_H

#include <sys/types.h>

#include <string>
#include <vector>

namespace vantor::support {

// A folder of the test's own under the system's temporary folder, removed with all it holds.
class TempFolder {
public:
    TempFolder();
    ~TempFolder();
    TempFolder(const TempFolder&) = delete;
    TempFolder& operator=(const TempFolder&) = delete;

    const std::string& Path() const { return path; }
    std::string File(const std::string& name) const { return path + "/" + name; }

    // The names in the folder, sorted.
    std::vector<std::string> Entries() const;

private:
    std::string path;
};

// These throw std::runtime_error when the file cannot be read or written.
std::string ReadFile(const std::string& path);
void WriteFile(const std::string& path, const std::string& content, mode_t mode = 0644);

// The permission bits of the file.
mode_t ModeOf(const std::string& path);

}  // namespace vantor::support

#endif
