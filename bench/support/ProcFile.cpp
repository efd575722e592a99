#include "bench/support/ProcFile.h"

#include <fstream>

namespace tarn {

long numberInProcFile(const std::filesystem::path& file, const std::string& key) {
    std::ifstream stream(file);
    for (std::string word; stream >> word;)
        if (long number = 0; word == key && stream >> number)
            return number;
    return 0;
}

} // namespace tarn
