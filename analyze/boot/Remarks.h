#ifndef VANTOR_ANALYZE_BOOT_REMARKS_H
#define VANTOR_ANALYZE_BOOT_REMARKS_H

#include <cstddef>
#include <string>
#include <vector>

namespace vantor::analyze {

// Names of which the same is to be said, for one sentence that does not grow with them.
class RemarkList {
public:
    void Add(const std::string& name);

    // Appends a remark: the first names, how many there are besides, and `what`. Nothing when there
    // are no names.
    void Tell(const std::string& what, std::vector<std::string>& remarks) const;

private:
    std::vector<std::string> first;
    std::size_t count = 0;
};

}  // namespace vantor::analyze

#endif
