// SPDX-License-Identifier: MIT
#pragma once

#include <gst/gst.h>

#include <functional>
#include <memory>
#include <string>
#include <utility>

#include <Varnel/Platform/Generic/SoundOutput.h>

namespace Varnel::Platform::GStreamer {

/// Makes the element that a sound is played into, as a floating reference.
using SinkMaker = std::function<GstElement*()>;

/// Plays the sounds that the machine's decoders know, from memory, into elements of `makeSink`.
///
/// The sink may change the thread that starts a sound: some sinks block SIGPIPE on it.
class Output final : public SoundOutput {
 public:
  explicit Output(SinkMaker makeSink) : makeSink_(std::move(makeSink)) {}

  [[nodiscard]] std::unique_ptr<Playback> start(const std::string& bytes, Ended ended) override;

 private:
  SinkMaker makeSink_;
};

}  // namespace Varnel::Platform::GStreamer
