#include "simulated/SimulatedLocalization.h"

#include <utility>

#include "localization/BundleText.h"
#include "localization/LanguageChoice.h"

namespace tarn {

namespace {

std::string tablePath(const std::string& bundle, const std::string& language, const std::string& table) {
    return bundle + "/" + language + "/" + table + ".strings";
}

class SimulatedBundle final : public Bundle {
public:
    SimulatedBundle(const SimulatedLocalization& localization, std::string path,
                    const std::set<std::string>& languages)
        : localization_(localization),
          path_(std::move(path)),
          languages_(languages.begin(), languages.end()) {}

    std::vector<std::string> localizations() const override { return languages_; }

    std::optional<std::string> pathForResource(const std::string& name, const std::string& type,
                                               const std::string& localization) const override {
        std::string path = path_ + "/" + localization + "/" + name + "." + type;
        return localization_.fileExists(path) ? std::optional(std::move(path)) : std::nullopt;
    }

    std::string localizedString(const std::string& key, const std::string& defaultValue,
                                const std::string& table) const override {
        return textOfBundle(*this, localization_, key, defaultValue, table);
    }

private:
    const SimulatedLocalization& localization_;
    const std::string path_;
    const std::vector<std::string> languages_;
};

} // namespace

void SimulatedLocalization::setTable(const std::string& bundlePath, const std::string& language,
                                     std::optional<Bundle::Strings> strings) {
    bundles_[bundlePath].insert(language);
    files_[bundlePath];
    files_[tablePath(bundlePath, language, "Localizable")] = std::move(strings);
}

void SimulatedLocalization::addFile(const std::string& path) { files_[path]; }

std::shared_ptr<const Bundle> SimulatedLocalization::openBundle(const std::string& path) const {
    const auto bundle = bundles_.find(path);
    return bundle == bundles_.end() ? nullptr
                                    : std::make_shared<const SimulatedBundle>(*this, path, bundle->second);
}

bool SimulatedLocalization::fileExists(const std::string& path) const { return files_.contains(path); }

std::optional<Bundle::Strings> SimulatedLocalization::readStringsFile(const std::string& path) const {
    const auto file = files_.find(path);
    return file == files_.end() ? std::nullopt : file->second;
}

std::vector<std::string>
SimulatedLocalization::preferredLocalizations(const std::vector<std::string>& localizations,
                                              const std::vector<std::string>& preferences) const {
    return choosePreferredLocalizations(localizations, preferences);
}

} // namespace tarn
