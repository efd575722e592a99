#pragma once

#include "controls/BusHandles.h"

namespace tarn {

inline constexpr char mprisPath[] = "/org/mpris/MediaPlayer2";
inline constexpr char mprisRootInterface[] = "org.mpris.MediaPlayer2";
inline constexpr char mprisPlayerInterface[] = "org.mpris.MediaPlayer2.Player";

/// The members of the two interfaces; the object that they are registered with must be an MprisObject.
const sd_bus_vtable* mprisRootTable();
const sd_bus_vtable* mprisPlayerTable();

} // namespace tarn
