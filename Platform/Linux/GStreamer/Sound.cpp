// SPDX-License-Identifier: MIT
#include <Platform/Linux/GStreamer/Sound.h>

#include <utility>

namespace Varnel::Platform::GStreamer {
namespace {

using Bus = UniqueHandle<GstBus*, gst_object_unref>;
using Buffer = UniqueHandle<GstBuffer*, gst_buffer_unref>;

Bus busOf(const Element& pipeline) {
  return Bus(gst_element_get_bus(pipeline.get()));
}

}  // namespace

Sound::Sound(Bytes bytes, SinkMaker makeSink)
    : bytes_(std::move(bytes)), makeSink_(std::move(makeSink)) {}

Sound::~Sound() {
  Sound::stop();
}

void Sound::setDelegate(std::weak_ptr<SoundDelegate> delegate) {
  delegate_ = std::move(delegate);
}

void Sound::play() {
  if (isPlaying()) return;
  pipeline_ = Element(gst_pipeline_new(nullptr));
  const Bus bus = busOf(pipeline_);
  gst_bus_add_watch(bus.get(), &Sound::heard, this);
  // A pipeline that does not start still has an end, which is told later as any other.
  if (!fillPipeline() ||
      gst_element_set_state(pipeline_.get(), GST_STATE_PLAYING) == GST_STATE_CHANGE_FAILURE)
    gst_bus_post(bus.get(),
                 gst_message_new_application(nullptr, gst_structure_new_empty("cannot-start")));
}

void Sound::stop() {
  if (!isPlaying()) return;
  gst_bus_remove_watch(busOf(pipeline_).get());
  gst_element_set_state(pipeline_.get(), GST_STATE_NULL);
  pipeline_ = Element();
}

bool Sound::fillPipeline() const {
  // The source pushes: parsers that pull for themselves may outrun the decoder's set-up, and their
  // sound would never end.
  GError* missing = nullptr;
  GstElement* made = gst_parse_bin_from_description_full(
      "appsrc name=source ! decodebin ! audioconvert ! audioresample name=last", FALSE, nullptr,
      GST_PARSE_FLAG_FATAL_ERRORS, &missing);
  g_clear_error(&missing);
  if (!made) return false;
  const auto bin = GST_BIN(made);
  gst_bin_add(GST_BIN(pipeline_.get()), made);
  GstElement* sink = makeSink_();
  if (!sink) return false;
  gst_bin_add(bin, sink);
  const Element last(gst_bin_get_by_name(bin, "last"));
  if (!gst_element_link(last.get(), sink)) return false;

  const Element source(gst_bin_get_by_name(bin, "source"));
  const Buffer buffer(gst_buffer_new_wrapped_bytes(bytes_.get()));
  GstFlowReturn taken = GST_FLOW_OK;
  g_signal_emit_by_name(source.get(), "push-buffer", buffer.get(), &taken);
  g_signal_emit_by_name(source.get(), "end-of-stream", &taken);
  return taken == GST_FLOW_OK;
}

gboolean Sound::heard(GstBus*, GstMessage* message, void* self) noexcept {
  // The delegate may let go of the sound.
  const auto sound = static_cast<Sound*>(self)->shared_from_this();
  switch (GST_MESSAGE_TYPE(message)) {
    case GST_MESSAGE_EOS:
      sound->end(true);
      break;
    case GST_MESSAGE_ERROR:
    case GST_MESSAGE_APPLICATION:
      sound->end(false);
      break;
    default:
      break;
  }
  // Whoever ended the sound has removed the watch.
  return G_SOURCE_CONTINUE;
}

void Sound::end(bool finished) {
  stop();
  if (const auto delegate = delegate_.lock()) delegate->sound(*this, finished);
}

}  // namespace Varnel::Platform::GStreamer
