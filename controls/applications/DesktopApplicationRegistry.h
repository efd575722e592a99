#pragma once

#include <filesystem>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "controls/applications/ApplicationIndex.h"
#include "roles/ApplicationRegistry.h"
#include "threads/MutexProtected.h"

namespace tarn {

/// The applications that are installed in data folders. An application is called by its desktop entry,
/// without ".desktop".
///
/// An extension belongs to the first of these that is there:
/// 1. what the AppStream metadata of the add-on with its identifier extends, if that is installed: the first
///    with a desktop entry, else the first that it names;
/// 2. the application that is called like the extension itself;
/// 3. the application that is called like the extension without its last parts, the longest first, of two
///    parts at least: "org.example.Player.Watch" belongs to "org.example.Player".
///
/// The folders are read at the first lookup, and again at the first one after something in them has changed,
/// even within a file; a lookup in between costs a few system calls.
class DesktopApplicationRegistry final : public ApplicationRegistry {
public:
    /// Earlier folders have precedence. `languages` are the user's, for the names of applications.
    DesktopApplicationRegistry(std::vector<std::filesystem::path> dataFolders,
                               std::vector<std::string> languages);

    std::optional<std::string>
    applicationContainingExtension(const std::string& extensionIdentifier) override;

    /// The application's name for a person; none when it is not installed or has none. Any thread may call.
    std::optional<std::string> applicationName(const std::string& application);

private:
    template <class Use>
    auto withCurrentIndex(Use&& use);

    const std::vector<std::filesystem::path> dataFolders_;
    const std::vector<std::string> languages_;
    MutexProtected<std::optional<ApplicationIndex>> index_; // none before the first lookup
};

/// The registry of the running user: the data folders of the environment, names in `languages`.
std::unique_ptr<DesktopApplicationRegistry> systemApplicationRegistry(std::vector<std::string> languages);

} // namespace tarn
