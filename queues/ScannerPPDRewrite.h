#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace ventras {

class PrintSystemService;

/// Records a multifunction device's scanner in the PPD of its print queue, replacing what was recorded
/// before; a queue that already names this scanner is left alone. Any thread may call; it blocks.
/// @param modulePath driver module that serves the scanner; absent = not known
/// @return 0, whatever became of the new PPD: the old one goes on serving. -1 without a queue or a UUID.
std::int32_t rewriteQueuePPDForScanner(PrintSystemService& printSystem,
                                       const std::optional<std::string>& queueName,
                                       const std::optional<std::string>& uuid,
                                       const std::optional<std::string>& modulePath);

}  // namespace ventras
