// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Sounds/GStreamer/Output.h>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform::GStreamer {
namespace {

using Buffer = UniqueHandle<GstBuffer*, gst_buffer_unref>;
using Bus = UniqueHandle<GstBus*, gst_object_unref>;
using Bytes = UniqueHandle<GBytes*, g_bytes_unref>;
using Element = UniqueHandle<GstElement*, gst_object_unref>;

bool fill(GstBin* pipeline, const std::string& bytes, const SinkMaker& makeSink) {
  // The source pushes. Parsers that pull may outrun the decoder's set-up, and their sound would
  // never end.
  GError* missing = nullptr;
  GstElement* made = gst_parse_bin_from_description_full(
      "appsrc name=source ! decodebin ! audioconvert ! audioresample name=last", FALSE, nullptr,
      GST_PARSE_FLAG_FATAL_ERRORS, &missing);
  g_clear_error(&missing);
  if (!made) return false;
  const auto bin = GST_BIN(made);
  gst_bin_add(pipeline, made);
  GstElement* sink = makeSink();
  if (!sink) return false;
  gst_bin_add(bin, sink);
  const Element last(gst_bin_get_by_name(bin, "last"));
  if (!gst_element_link(last.get(), sink)) return false;

  const Element source(gst_bin_get_by_name(bin, "source"));
  const Bytes copy(g_bytes_new(bytes.data(), bytes.size()));
  const Buffer buffer(gst_buffer_new_wrapped_bytes(copy.get()));
  GstFlowReturn taken = GST_FLOW_OK;
  g_signal_emit_by_name(source.get(), "push-buffer", buffer.get(), &taken);
  g_signal_emit_by_name(source.get(), "end-of-stream", &taken);
  return taken == GST_FLOW_OK;
}

// Runs on the thread of the pipeline that sent the message.
GstBusSyncReply heard(GstBus*, GstMessage* message, gpointer ended) noexcept {
  const GstMessageType type = GST_MESSAGE_TYPE(message);
  if (type == GST_MESSAGE_EOS || type == GST_MESSAGE_ERROR)
    (*static_cast<SoundOutput::Ended*>(ended))(type == GST_MESSAGE_EOS);
  gst_message_unref(message);
  return GST_BUS_DROP;
}

void release(gpointer ended) noexcept {
  delete static_cast<SoundOutput::Ended*>(ended);
}

class Pipeline final : public SoundOutput::Playback {
 public:
  Pipeline() : pipeline_(gst_pipeline_new(nullptr)) {}
  ~Pipeline() override { gst_element_set_state(pipeline_.get(), GST_STATE_NULL); }
  Pipeline(const Pipeline&) = delete;
  Pipeline& operator=(const Pipeline&) = delete;

  bool start(const std::string& bytes, const SinkMaker& makeSink, SoundOutput::Ended ended) {
    const Bus bus(gst_element_get_bus(pipeline_.get()));
    gst_bus_set_sync_handler(bus.get(), &heard, new SoundOutput::Ended(std::move(ended)), &release);
    return fill(GST_BIN(pipeline_.get()), bytes, makeSink) &&
           gst_element_set_state(pipeline_.get(), GST_STATE_PLAYING) != GST_STATE_CHANGE_FAILURE;
  }

 private:
  const Element pipeline_;
};

}  // namespace

std::unique_ptr<SoundOutput::Playback> Output::start(const std::string& bytes, Ended ended) {
  if (!gst_init_check(nullptr, nullptr, nullptr)) return nullptr;
  auto pipeline = std::make_unique<Pipeline>();
  if (!pipeline->start(bytes, makeSink_, std::move(ended))) return nullptr;
  return pipeline;
}

}  // namespace Varnel::Platform::GStreamer
