#pragma once

#include <span>
#include <string>
#include <string_view>

#include "ctl/Text.h"
#include "ctl/Value.h"

namespace ventras {

/// Who will read the output.
enum class Reader { People, Program };

/// Prints values on standard output, each at once: another program may wait for a line before it sends the
/// next.
class Output {
public:
    explicit Output(Reader reader) : reader_(reader) {}

    bool isForProgram() const { return reader_ == Reader::Program; }

    /// One object: a JSON line, or a line for each member.
    void print(const Object& object);

    /// Rows of one kind: a JSON array, or a table.
    void print(const Array& rows, std::span<const Column> columns);

    /// One text: a JSON string, or a line.
    void printText(const std::string& text);

    /// That there is nothing: null for a program; people are told by a complaint.
    void printNull();

    /// One JSON line, whoever reads.
    void printJson(const Value& value);

    /// Sends off what has been printed. @return whether all of it, ever since, could be written.
    bool flush();

private:
    void write(std::string_view text);

    Reader reader_;
    bool isFirst_ = true;
    bool failed_ = false;
};

}  // namespace ventras
