#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <variant>
#include <vector>

#include "roles/Data.h"

namespace tarn {

struct DictionaryValue;

using Dictionary = std::map<std::string, DictionaryValue, std::less<>>;
using DictionaryList = std::vector<DictionaryValue>;

/// One value of a dictionary; numbers keep the type that they had.
struct DictionaryValue {
    std::variant<std::string, Data, bool, std::int32_t, std::int64_t, std::uint32_t, std::uint64_t, float,
                 double, DictionaryList, Dictionary>
        value;

    bool operator==(const DictionaryValue&) const = default;
};

/// For people who read logs: `{`, one `key = value;` a line, `}`; data as hexadecimal digits.
std::string description(const Dictionary& dictionary);

} // namespace tarn
