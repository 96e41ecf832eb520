#include "ctl/Output.h"

#include <cstdio>

#include "ctl/Json.h"

namespace ventras {

void Output::print(const Object& object) {
    if (isForProgram()) {
        printJson(object);
        return;
    }
    if (!isFirst_)
        write("\n");
    write(textLines(object));
}

void Output::print(const Array& rows, std::span<const Column> columns) {
    if (isForProgram())
        printJson(rows);
    else
        write(textTable(rows, columns));
}

void Output::printText(const std::string& text) {
    if (isForProgram())
        printJson(text);
    else
        write(textOf(text) + "\n");
}

void Output::printNull() {
    if (isForProgram())
        printJson(Value{});
}

void Output::printJson(const Value& value) {
    write(toJson(value) + "\n");
}

void Output::write(std::string_view text) {
    isFirst_ = false;
    failed_ |= std::fwrite(text.data(), 1, text.size(), stdout) != text.size();
}

bool Output::flush() {
    failed_ |= std::fflush(stdout) != 0;
    return !failed_;
}

}  // namespace ventras
