// SPDX-License-Identifier: MIT
#include <Platform/Linux/GStreamer/Module.h>

#include <Platform/Api.h>
#include <Platform/Linux/GStreamer/Output.h>

// Without an audio device the automatic sink keeps time all the same, in silence.
extern "C" VARNEL_API Varnel::Platform::SoundOutput* varnelMakeSoundOutput() {
  return new Varnel::Platform::GStreamer::Output(
      [] { return gst_element_factory_make("autoaudiosink", nullptr); });
}
