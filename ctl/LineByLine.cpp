#include "ctl/LineByLine.h"

#include <iostream>
#include <iterator>

#include "ctl/Complaint.h"
#include "ctl/Output.h"
#include "ctl/Translation.h"

namespace ventras {

Exit answerLines(Output& output, const std::function<std::optional<Value>(const std::string&)>& answer) {
    auto exit = Exit::Success;
    std::size_t number = 0;
    for (std::string line; std::getline(std::cin, line);) {
        ++number;
        const auto value = answer(line);
        output.printJson(value.value_or(Value{}));
        // Another program may wait for its answer before it sends the next line; one that sends many need not
        // wait.
        if (std::cin.rdbuf()->in_avail() <= 0 && !output.flush())
            break;
        if (value)
            continue;
        complain(translated("line %@ is not what this command reads", std::to_string(number)));
        exit = Exit::Usage;
    }
    return exit;
}

std::string readStandardInput() {
    return {std::istreambuf_iterator<char>(std::cin), {}};
}

}  // namespace ventras
