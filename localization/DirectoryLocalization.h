#pragma once

#include "roles/Localization.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// Localization from folders of the file system. A bundle that was found once is not looked up again, nor is
/// a strings file that could be read: one text of an error must not cost two dozen system calls.
class DirectoryLocalization final : public Localization {
public:
    DirectoryLocalization(std::string errorBundlePath, std::vector<std::string> preferredLanguages);

    std::vector<std::string> preferredLanguages() const override { return preferredLanguages_; }
    std::string errorBundlePath() const override { return errorBundlePath_; }
    std::shared_ptr<const Bundle> openBundle(const std::string& path) const override;
    bool fileExists(const std::string& path) const override;
    std::optional<Bundle::Strings> readStringsFile(const std::string& path) const override;
    std::vector<std::string>
    preferredLocalizations(const std::vector<std::string>& localizations,
                           const std::vector<std::string>& preferences) const override;

private:
    const std::string errorBundlePath_;
    const std::vector<std::string> preferredLanguages_;
    mutable MutexProtected<std::map<std::string, std::shared_ptr<const Bundle>>> openBundles_;
    mutable MutexProtected<std::map<std::string, Bundle::Strings>> readFiles_;
};

/// The tables that are installed, or built, with the running program, in the language of its environment.
std::unique_ptr<Localization> systemLocalization();

} // namespace tarn
