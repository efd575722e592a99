#pragma once

#include <map>
#include <set>
#include <string>

#include "roles/Localization.h"

namespace tarn {

/// Bundles in memory and languages as a test sets them, before it hands the object on. At first the user
/// reads English and the error bundle has no entries, so that an error's text is its key.
///
/// The path of a table is "<bundle>/<language>/<table>.strings"; one that was set to none cannot be read.
class SimulatedLocalization final : public Localization {
public:
    SimulatedLocalization() { setTable(errorBundlePath_, "en", Bundle::Strings()); }

    /// Makes the bundle if there is none.
    void setTable(const std::string& bundlePath, const std::string& language,
                  std::optional<Bundle::Strings> strings);
    void setPreferredLanguages(std::vector<std::string> languages) {
        preferredLanguages_ = std::move(languages);
    }
    void setErrorBundlePath(std::string path) { errorBundlePath_ = std::move(path); }

    /// A file that is there and is no bundle.
    void addFile(const std::string& path);

    std::vector<std::string> preferredLanguages() const override { return preferredLanguages_; }
    std::string errorBundlePath() const override { return errorBundlePath_; }
    std::shared_ptr<const Bundle> openBundle(const std::string& path) const override;
    bool fileExists(const std::string& path) const override;
    std::optional<Bundle::Strings> readStringsFile(const std::string& path) const override;
    std::vector<std::string>
    preferredLocalizations(const std::vector<std::string>& localizations,
                           const std::vector<std::string>& preferences) const override;

private:
    std::string errorBundlePath_ = "/errors.bundle";
    std::vector<std::string> preferredLanguages_ = {"en"};
    std::map<std::string, std::set<std::string>> bundles_;
    std::map<std::string, std::optional<Bundle::Strings>> files_;
};

} // namespace tarn
