// Python's plistlib reads what we write.

#include <cstdlib>
#include <fstream>

#include <gtest/gtest.h>

#include "tests/support/TemporaryFolder.h"
#include "wire/PropertyList.h"

namespace tarn {

namespace {

using Texts = std::map<std::string, std::string>;

/// "key=value" lines, in the order of the keys.
std::string readByPython(const Data& list) {
    const TemporaryFolder folder;
    const auto script = folder.path() / "read.py";
    const auto input = folder.path() / "list";
    const auto output = folder.path() / "texts";
    std::ofstream(script) << "import plistlib, sys\n"
                             "texts = plistlib.load(open(sys.argv[1], 'rb'), fmt=plistlib.FMT_BINARY)\n"
                             "with open(sys.argv[2], 'w', encoding='utf-8', newline='') as out:\n"
                             "    for key in sorted(texts): out.write(key + '=' + texts[key] + '\\n')\n";
    std::ofstream(input, std::ios::binary)
        .write(reinterpret_cast<const char*>(list.data()), static_cast<std::streamsize>(list.size()));
    const std::string command = "python3 " + script.string() + " " + input.string() + " " + output.string();
    if (std::system(command.c_str()) != 0) // NOLINT(cert-env33-c): the paths are ours
        return "unreadable";
    return contentOf(output);
}

TEST(PropertyList, IsReadByAnIndependentReader) {
    Texts many;
    for (int index = 100; index < 400; ++index) // references and offsets of two bytes
        many["key " + std::to_string(index)] = std::string(static_cast<std::size_t>(index), 'x');
    const Texts lists[] = {
        {{"LocalizedDescription", "Cannot play"}},
        {{"a", "Größe"}, {"b", "\xF0\x9F\x8E\xB5 and \xE6\xAD\x8C"}, {"c", ""}},
        {{"fourteen", std::string(14, 'x')},
         {"fifteen", std::string(15, 'x')},
         {"long", std::string(70000, 'x')}},
        {},
        many,
    };
    for (const auto& list : lists) {
        std::string expected;
        for (const auto& [key, value] : list)
            expected.append(key).append("=").append(value).append("\n");
        const auto outcome = binaryPropertyList(list);
        ASSERT_TRUE(outcome.data);
        EXPECT_EQ(readByPython(*outcome.data), expected);
    }
}

TEST(PropertyList, RefusesTextThatIsNotUtf8) {
    EXPECT_FALSE(binaryPropertyList({{"a", "\xFF"}}).data);
    const auto outcome = binaryPropertyList({{"\xC3", "a"}});
    EXPECT_FALSE(outcome.data);
    EXPECT_FALSE(outcome.error.userInfo.empty());
}

} // namespace

} // namespace tarn
