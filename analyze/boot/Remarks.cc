#include "boot/Remarks.h"

namespace vantor::analyze {

namespace {

constexpr std::size_t most = 5;

}  // namespace

void RemarkList::Add(const std::string& name) {
    if (++count <= most) {
        first.push_back(name);
    }
}

void RemarkList::Tell(const std::string& what, std::vector<std::string>& remarks) const {
    if (count == 0) {
        return;
    }
    std::string text;
    for (const std::string& name : first) {
        text += (text.empty() ? "'" : ", '") + name + "'";
    }
    if (count > most) {
        text += " and " + std::to_string(count - most) + " more";
    }
    remarks.push_back(text + ": " + what);
}

}  // namespace vantor::analyze
