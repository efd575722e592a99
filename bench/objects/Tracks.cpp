#include "bench/objects/Tracks.h"

#include <malloc.h>

#include <cstdio>

#include "log/SystemLog.h"

namespace tarn {

namespace {

class NoLog final : public LogSink {
public:
    void write(const LogRecord&) override {}
};

std::string nameOfTrack(std::size_t track) {
    char name[64];
    std::snprintf(name, sizeof name, "6f1c2a34-9d7b-4c1e-8a55-%012zu", track);
    return name;
}

std::string URLOf(const std::string& name) { return "file:///home/user/Music/Band/Album/" + name + ".flac"; }

std::size_t heapInUse() { return mallinfo2().uordblks + mallinfo2().hblkhd; }

} // namespace

/// The client hears everything and keeps nothing.
class Tracks::Sink final : public EventSink {
public:
    void sendData(const Data&) override {}
};

Tracks::Tracks(std::size_t count)
    : sink_(std::make_shared<Sink>()),
      assets_(std::make_shared<VLTorviAudioFilePlayerAssetManager>(device_.roles())),
      items_(std::make_shared<VLTorviAudioFilePlayerItemManager>(device_.roles())) {
    SystemLog::setSink(std::make_shared<NoLog>());
    assets_->setAudioServer(sink_);
    items_->setAudioServer(sink_);
    items_->setAssetManager(assets_);
    for (std::size_t track = 0; track < count; ++track) {
        names_.emplace_back(nameOfTrack(track));
        device_.media.addFile(
            URLOf(*names_.back()),
            {.title = "Title of a track", .albumTitle = "Title of its album", .artist = "Name of the band"});
    }
    assetObjects_.reserve(count);
    itemObjects_.reserve(count);
    std::size_t before = heapInUse();
    for (const auto& name : names_)
        mirror(*name);
    bytesPerTrack_ = static_cast<double>(heapInUse() - before) / static_cast<double>(count);
    for (std::size_t track = 0; track < count; ++track)
        addToBareMaps(track);
}

void Tracks::mirror(const std::string& name) {
    assets_->upsertAssetWithIdentifer(name, URLOf(name), {}, {}, {}, {}, Reply());
    auto asset = assets_->assetWithIdentifier(name);
    items_->upsertItemWithIdentifier(name, asset, Reply());
    assetObjects_.push_back(asset.get());
    itemObjects_.push_back(items_->playerItemWithIdentifier(name).get());
}

void Tracks::addToBareMaps(std::size_t track) {
    auto object = std::make_shared<int>();
    bareMaps_.objectOfName.withLocked([&](auto& map) { map.emplace(*names_[track], object); });
    bareMaps_.objectOfAddress.withLocked([&](auto& map) { map.emplace(assetObjects_[track], object); });
    bareMaps_.nameOfAddress.withLocked([&](auto& map) { map.emplace(itemObjects_[track], *names_[track]); });
    // As far apart as the objects of the tracks are.
    bareMaps_.distance.push_back(std::make_unique<char[]>(static_cast<std::size_t>(bytesPerTrack_)));
}

} // namespace tarn
