#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace ventras {

/// Watches how deep the collections of an IPP message nest and how many groups and values it has (RFC 8010
/// section 3.1) while its bytes go by. libcups calls itself for each level, keeps 400 bytes for a value of
/// one byte and 70 for an empty group, and its only limits are the ends of stack and memory. One thread at a
/// time.
class MessageLimits {
public:
    /// Deeper than the collections of any printer, which are media in lists, and sizes within media.
    static constexpr int kDeepest = 16;

    /// Values of all attributes; six of them tell of a driver in a catalogue.
    static constexpr int kMostValues = 250'000;

    /// Groups of attributes, empty ones too; a catalogue has one for each driver.
    static constexpr int kMostGroups = 100'000;

    /// Takes the next bytes of the message; those behind its end do not count.
    /// @return false when collections nest too deep or end without a beginning, when there are too many
    /// values or groups, or when there is a tag that nobody uses and that readers understand differently.
    bool follow(std::span<const std::uint8_t> bytes);

private:
    enum class Field { Header, Tag, NameLength, Name, ValueLength, Value, End };

    bool finishField();
    bool take(std::uint32_t tag);
    bool expect(Field field, std::size_t length);

    Field field_ = Field::Header;
    std::size_t missing_ = 8;  // bytes of the field
    std::uint32_t number_ = 0;
    int depth_ = 0;
    int values_ = 0;
    int groups_ = 0;
};

}  // namespace ventras
