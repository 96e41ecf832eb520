#pragma once

#include <optional>
#include <string>
#include <string_view>

/// What a make, a model, a product text and a command set mean, whichever way the device told them: as an
/// IEEE 1284 device ID (PMStringAdditions) or as a dictionary (PMDictionaryAdditions). Any thread may call.
namespace ventras::DeviceIdentity {

using View = std::optional<std::string_view>;

/// The make in a product text such as "(HP LaserJet 4)"; absent when the text is, or is empty or one word.
View makeFromProduct(View product);

/// The model in a product text; absent as for the make.
View modelFromProduct(View product);

/// The product text with the maker's name once and short: "(Hewlett-Packard HP LaserJet)" gives "(HP
/// LaserJet)". Without a product text it is made from make and model; empty when one of these is absent too.
std::string normalizedProduct(View product, View make, View model);

/// Make and model, trimmed and joined, with the maker's name once and short; the one of them that is there
/// when the other is not; absent when neither is.
std::optional<std::string> nameFrom(View make, View model);

/// "MANUFACTURER:make;MODEL:model", trimmed, with the make not repeated in the model; absent when either is.
std::optional<std::string> scanIDFrom(View make, View model);

/// Whether a command set names PostScript; an absent one is taken to.
bool listsPostscript(View commandSet);

/// Whether a command set names PCL; an absent one does not.
bool listsPCL(View commandSet);

}  // namespace ventras::DeviceIdentity
