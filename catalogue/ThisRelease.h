#pragma once

#include <string>

namespace ventras {

/// The distribution release that runs this, such as "debian 12": ID and VERSION_ID of os-release(5). A
/// rolling distribution has only an ID. Any thread may call.
std::string thisRelease();

}  // namespace ventras
