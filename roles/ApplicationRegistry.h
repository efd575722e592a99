#pragma once

#include <optional>
#include <string>

namespace tarn {

/// The installed applications. Any thread may call; lookups are answered from memory.
class ApplicationRegistry {
public:
    virtual ~ApplicationRegistry() = default;

    /// The application that contains the app extension; none when the extension is not known.
    virtual std::optional<std::string>
    applicationContainingExtension(const std::string& extensionIdentifier) = 0;
};

} // namespace tarn
