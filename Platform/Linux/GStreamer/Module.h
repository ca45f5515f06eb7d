// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {
class SoundPlayer;
}

/// The one function of the sound module, which is loaded on first use so that only hosts that play
/// a sound pay for GStreamer. The caller owns the player.
extern "C" Varnel::Platform::SoundPlayer* varnelMakeSoundPlayer();
