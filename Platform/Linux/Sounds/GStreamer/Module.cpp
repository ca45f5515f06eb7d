// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Sounds/GStreamer/Module.h>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Linux/Sounds/GStreamer/Output.h>

// Without an audio device the automatic sink still takes the sound's time, in silence.
extern "C" VARNEL_API Varnel::Platform::SoundOutput* varnelMakeSoundOutput() {
  return new Varnel::Platform::GStreamer::Output(
      [] { return gst_element_factory_make("autoaudiosink", nullptr); });
}
