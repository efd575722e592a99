#include "client/tool/Info.h"

#include <iostream>
#include <memory>
#include <utility>

#include <tarn/Client.h>

#include "client/tool/display/Columns.h"
#include "client/tool/display/OutputLine.h"
#include "client/tool/display/TimeText.h"
#include "log/SystemLog.h"
#include "media/AssetOpener.h"

namespace tarn::tool {

namespace {

/// What the service would write down concerns nobody here.
class Silence final : public LogSink {
    void write(const LogRecord&) override {}
};

class NoGrantedFiles final : public FileAccess {
    SharedFile open(const std::string&) override { return nullptr; }
};

std::string textOf(const Error& error) {
    const auto text = [&](const char* key) {
        const auto found = error.userInfo.find(key);
        return found == error.userInfo.end() ? std::string() : found->second;
    };
    const std::string reason = text(localizedFailureReasonKey);
    return text(localizedDescriptionKey) + (reason.empty() ? "" : " (" + reason + ")");
}

/// What is shown, with the names that it has in JSON and for people.
std::vector<std::pair<const char*, std::optional<std::string>>> textsOf(const MediaAsset& asset) {
    std::vector<std::pair<const char*, std::optional<std::string>>> texts{
        {"title", {}}, {"artist", {}}, {"albumTitle", {}}};
    const std::string_view keys[] = {MediaMetadataItem::commonKeyTitle, MediaMetadataItem::commonKeyArtist,
                                     MediaMetadataItem::commonKeyAlbumName};
    for (const MediaMetadataItem& item : asset.commonMetadata())
        for (std::size_t i = 0; i < texts.size(); ++i)
            if (item.key() == keys[i])
                texts[i].second = item.stringValue();
    return texts;
}

void printLine(const char* name, const std::string& text) {
    std::cout << "  " << name << printable(text) << "\n";
}

void print(const std::string& path, const MediaAsset& asset) {
    constexpr const char* labels[] = {"title     ", "artist    ", "album     "};
    std::cout << printable(path) << "\n";
    const auto texts = textsOf(asset);
    for (std::size_t i = 0; i < texts.size(); ++i)
        if (texts[i].second && !texts[i].second->empty())
            printLine(labels[i], *texts[i].second);
    printLine("duration  ", timeText(asset.duration().seconds()));
}

void printJSON(const std::string& path, const MediaAsset& asset) {
    Dictionary fields;
    fields["path"].value = path;
    fields["duration"].value = asset.duration().seconds();
    for (const auto& [name, text] : textsOf(asset))
        if (text)
            fields[name].value = *text;
    std::cout << outputLine(LineFormat::JSON, "file", fields) << "\n";
}

} // namespace

int runInfo(const InfoOptions& options) {
    SystemLog::setSink(std::make_shared<Silence>());
    MediaProcess process;
    FilePorter porter(process);
    FileExaminer examiner(process, porter);
    NoGrantedFiles access;
    const AssetOpener opener(access, porter, examiner);
    int status = 0;
    for (const std::string& path : options.paths) {
        const MediaAssetOutcome outcome = opener.open(client::fileURL(path));
        if (outcome.asset) {
            options.asJSON ? printJSON(path, *outcome.asset) : print(path, *outcome.asset);
        } else {
            status = 1;
            std::cerr << "tarnctl: " << printable(path + ": " + textOf(outcome.error)) << "\n";
        }
    }
    return status;
}

} // namespace tarn::tool
