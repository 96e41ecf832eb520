#pragma once

#include <chrono>
#include <memory>

#include "catalogue/CatalogueAgent.h"

namespace ventras {

/// Offers an agent on the session bus as service "com.quillon.lorvextool.agent": object
/// /com/quillon/lorvextool/agent with method Command(u command, a{sv} arguments) -> a{sv}. The main thread's.
class AgentService {
public:
    explicit AgentService(CatalogueAgent& agent) : agent_(agent) {}

    /// Serves until nothing has been asked for so long, or the bus goes away. The bus starts the service anew
    /// when it is needed.
    /// @return false when the bus is not there, or another process has the name.
    bool run(std::chrono::milliseconds idleLimit);

private:
    CatalogueAgent& agent_;
};

}  // namespace ventras
