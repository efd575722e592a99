#include "system/ModuleFile.h"

#include <dlfcn.h>

#include <cstddef>
#include <filesystem>
#include <string>
#include <vector>

namespace tarn {

namespace {

// The folders in which the program itself looks for its libraries: those of its build tree, or of its
// installation. Asked for explicitly because sanitizers call dlopen() from a library of their own.
std::vector<std::string> programLibraryFolders() {
    std::vector<std::string> folders;
    void* program = dlopen(nullptr, RTLD_LAZY);
    Dl_serinfo sizes{};
    if (program == nullptr || dlinfo(program, RTLD_DI_SERINFOSIZE, &sizes) != 0)
        return folders;
    std::vector<std::max_align_t> storage(sizes.dls_size / sizeof(std::max_align_t) + 1);
    auto* info = reinterpret_cast<Dl_serinfo*>(storage.data());
    *info = sizes;
    if (dlinfo(program, RTLD_DI_SERINFO, info) == 0)
        for (unsigned i = 0; i < info->dls_cnt; ++i)
            folders.emplace_back(info->dls_serpath[i].dls_name);
    return folders;
}

} // namespace

std::optional<std::string> findBesideModules(const char* file) {
    for (const std::string& folder : programLibraryFolders()) {
        const auto path = std::filesystem::path(folder) / file;
        std::error_code ignored;
        if (path.is_absolute() && std::filesystem::exists(path, ignored))
            return path.string();
    }
    return std::nullopt;
}

ModuleSymbol loadFromModule(const char* file, const char* symbol) {
    const auto path = findBesideModules(file);
    if (!path)
        return {nullptr, "not found"};
    void* library = dlopen(path->c_str(), RTLD_NOW | RTLD_LOCAL);
    void* function = library != nullptr ? dlsym(library, symbol) : nullptr;
    return {function, function != nullptr ? "" : dlerror()};
}

} // namespace tarn
