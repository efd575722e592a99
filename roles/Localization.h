#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace tarn {

/// A folder of resources with one sub-folder per language.
class Bundle {
public:
    using Strings = std::map<std::string, std::string, std::less<>>;

    virtual ~Bundle() = default;

    /// The languages it has, as they are named in it.
    virtual std::vector<std::string> localizations() const = 0;

    /// Path of `name`.`type` for a localization; none when there is no such resource.
    virtual std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                                       const std::string& localization) const = 0;

    /// The text for `key` in table `table` by the bundle's own choice of language. Without an entry:
    /// `defaultValue`, or the key itself when that is empty.
    virtual std::string localizedString(const std::string& key, const std::string& defaultValue,
                                        const std::string& table) const = 0;
};

/// Bundles and the user's languages. Any thread may call.
class Localization {
public:
    virtual ~Localization() = default;

    /// Most preferred first; may be empty.
    virtual std::vector<std::string> preferredLanguages() const = 0;

    /// Where the strings tables of the error domain are.
    virtual std::string errorBundlePath() const = 0;

    /// Null when there is no bundle at the path. The bundle is used no longer than this object lives.
    virtual std::shared_ptr<const Bundle> openBundle(const std::string& path) const = 0;

    virtual bool fileExists(const std::string& path) const = 0;

    /// The entries of a strings file; none when it cannot be read as one.
    virtual std::optional<Bundle::Strings> readStringsFile(const std::string& path) const = 0;

    /// Those of `localizations` that suit `preferences` best, best first; empty when none does.
    virtual std::vector<std::string>
    preferredLocalizations(const std::vector<std::string>& localizations,
                           const std::vector<std::string>& preferences) const = 0;
};

} // namespace tarn
