#pragma once

#include <string>
#include <vector>

namespace ventras {

/// Arguments or variables as exec wants them: with a null pointer behind. Any thread may call.
/// @param texts stay the caller's, who keeps them as they are while the pointers are used
inline std::vector<char*> argumentPointers(std::vector<std::string>& texts) {
    std::vector<char*> pointers;
    for (auto& text : texts)
        pointers.push_back(text.data());
    pointers.push_back(nullptr);
    return pointers;
}

}  // namespace ventras
