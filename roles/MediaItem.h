#pragma once

#include <cstdint>
#include <memory>
#include <optional>

#include "roles/Error.h"
#include "roles/MediaTime.h"
#include "roles/Observable.h"

namespace tarn {

class MediaAsset;

enum class MediaStatus : std::int32_t { unknown = 0, readyToPlay = 1, failed = 2 };

/// One playing of an asset: its status and its position. Observable: "status" (std::int64_t).
///
/// Any thread may call. Status and position change while a queue player holds the item; the changes are
/// reported on the player thread, or on the thread whose call caused them. Three notifications about it go
/// through the notification centre with the item as sender.
class MediaItem : public Observable {
public:
    static constexpr char didPlayToEndTime[] = "MediaItemDidPlayToEndTime";
    static constexpr char failedToPlayToEndTime[] = "MediaItemFailedToPlayToEndTime";
    static constexpr char timeJumped[] = "MediaItemTimeJumped";
    static constexpr char statusKeyPath[] = "status";

    virtual MediaStatus status() const = 0;

    /// Why status() is failed; none otherwise.
    virtual std::optional<Error> error() const = 0;

    virtual const std::shared_ptr<MediaAsset>& asset() const = 0;

    /// What is heard now, or where playing would go on.
    virtual MediaTime currentTime() const = 0;

    /// Moves the position, clamped to the item's length. A time that is not numeric is refused with one error
    /// line.
    virtual void seekToTime(MediaTime time) = 0;
};

} // namespace tarn
