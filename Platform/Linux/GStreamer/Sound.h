// SPDX-License-Identifier: MIT
#pragma once

#include <gst/gst.h>

#include <functional>
#include <memory>
#include <string>

#include <Platform/Generic/UniqueHandle.h>
#include <Platform/Ports/SoundPlayer.h>

namespace Varnel::Platform::GStreamer {

using Bytes = UniqueHandle<GBytes*, g_bytes_unref>;
using Element = UniqueHandle<GstElement*, gst_object_unref>;

/// Makes the element that a sound is played into, as a floating reference.
using SinkMaker = std::function<GstElement*()>;

/// A sound that a pipeline plays from memory. The pipeline lives from `play` to the end; messages
/// of its bus arrive on the default main context, which is the main queue's.
class Sound final : public PlayableSound, public std::enable_shared_from_this<Sound> {
 public:
  Sound(Bytes bytes, SinkMaker makeSink);
  Sound(const Sound&) = delete;
  Sound& operator=(const Sound&) = delete;
  ~Sound() override;

  void setDelegate(std::weak_ptr<SoundDelegate> delegate) override;
  void play() override;
  void stop() override;
  [[nodiscard]] bool isPlaying() const override { return static_cast<bool>(pipeline_); }

 private:
  static gboolean heard(GstBus* bus, GstMessage* message, void* self) noexcept;
  [[nodiscard]] bool fillPipeline() const;
  void end(bool finished);

  Bytes bytes_;
  SinkMaker makeSink_;
  std::weak_ptr<SoundDelegate> delegate_;
  Element pipeline_;
};

}  // namespace Varnel::Platform::GStreamer
