// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {
class SoundOutput;
}

/// The one function of the sound module, which is loaded on first use so that only hosts that play
/// a sound pay for GStreamer. The caller owns the output.
extern "C" Varnel::Platform::SoundOutput* varnelMakeSoundOutput();
