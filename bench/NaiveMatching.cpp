#include "bench/NaiveMatching.h"

#include <glib.h>

#include <algorithm>
#include <array>
#include <memory>

#include "deviceid/PMStringAdditions.h"
#include "drivers/PPDKind.h"

namespace ventras::naive {
namespace {

using Text = std::optional<std::string>;

std::string lower(const std::string& text) {
    const std::unique_ptr<gchar, decltype(&g_free)> lowered{
        g_utf8_strdown(text.data(), static_cast<gssize>(text.size())), g_free};
    return lowered.get();
}

bool same(const std::string& text, const Text& other) {
    return other && lower(text) == lower(*other);
}

bool begins(const std::string& text, const Text& beginning) {
    return beginning && !beginning->empty() && lower(text).starts_with(lower(*beginning));
}

Text bare(const Text& text) {
    if (text && text->size() >= 3 && text->front() == '(' && text->back() == ')')
        return text->substr(1, text->size() - 2);
    return std::nullopt;
}

struct Inputs {
    Text product, bareProduct, idProduct, bareIDProduct, idModel, model;
};

bool matchesProduct(const std::string& s, const Inputs& in) {
    const std::array tests{in.product, in.bareProduct, in.idProduct, in.bareIDProduct, in.idModel, in.model};
    for (const auto& text : tests)
        if (same(s, text))
            return true;

    std::string spaced;
    if (s.find('/') != std::string::npos) {
        spaced = s;
        std::ranges::replace(spaced, '/', ' ');
    }
    for (const auto& text : tests)
        if (text && text->size() == s.size() && text->find('/') == std::string::npos && same(spaced, text))
            return true;
    return false;
}

bool matches(const PPDRecord& record, const Inputs& in) {
    for (const auto& s : record.product)
        if (!s.empty() && matchesProduct(s, in))
            return true;

    const auto q = record.deviceID ? PMStringAdditions::product(*record.deviceID) : "";
    if (!q.empty() &&
        (same(q, in.product) || same(q, in.idProduct) || same(q, in.idModel) || same(q, in.model)))
        return true;

    const auto r = record.deviceID ? PMStringAdditions::model(*record.deviceID).value_or("") : "";
    if (!r.empty() && (same(r, in.model) || same(r, in.idModel)))
        return true;

    const auto n = record.makeAndModel.value_or("");
    if (!n.empty() && (same(n, in.model) || same(n, in.idModel)))
        return true;
    if (!n.empty() && record.name && record.name->starts_with("gutenprint") &&
        (begins(n, in.model) || begins(n, in.idModel) || begins(n, in.bareIDProduct) ||
         begins(n, in.bareProduct)))
        return true;

    const auto k = record.modelNumber.value_or("");
    return !k.empty() &&
           (same(k, in.product) || same(k, in.model) || same(k, in.idModel) || same(k, in.idProduct));
}

}  // namespace

std::vector<std::size_t> matchingDrivers(const Text& deviceID, const Text& model, const Text& product,
                                         const std::vector<PPDRecord>& list) {
    Inputs in{.product = product,
              .bareProduct = bare(product),
              .idProduct = {},
              .bareIDProduct = {},
              .idModel = {},
              .model = model};
    if (deviceID) {
        in.idProduct = PMStringAdditions::product(*deviceID);
        in.bareIDProduct = bare(in.idProduct);
        in.idModel = PMStringAdditions::model(*deviceID);
    }

    std::vector<std::size_t> found;
    for (std::size_t i = 0; i < list.size(); ++i)
        if (matches(list[i], in))
            found.push_back(i);
    std::ranges::stable_sort(found, {}, [&](auto i) { return PPDKind::of(list[i]); });
    return found;
}

}  // namespace ventras::naive
