// SPDX-License-Identifier: MIT
#include <Platform/Linux/GStreamer/Player.h>

#include <gst/base/gsttypefindhelper.h>

#include <string_view>

namespace Varnel::Platform::GStreamer {
namespace {

using Capabilities = UniqueHandle<GstCaps*, gst_caps_unref>;

bool start() {
  static const bool started = gst_init_check(nullptr, nullptr, nullptr);
  return started;
}

// Tells the kind of a file by its first bytes. Sounds may lie in containers of films.
bool looksLikeSound(const std::string& bytes) {
  const Capabilities found(gst_type_find_helper_for_data(
      nullptr, reinterpret_cast<const guint8*>(bytes.data()), bytes.size(), nullptr));
  if (!found) return false;
  const std::string_view type(gst_structure_get_name(gst_caps_get_structure(found.get(), 0)));
  return type.starts_with("audio/") || type.starts_with("video/") || type == "application/ogg";
}

}  // namespace

std::shared_ptr<PlayableSound> Player::load(std::string bytes) {
  if (!start() || !looksLikeSound(bytes)) return nullptr;
  return std::make_shared<Sound>(Bytes(g_bytes_new(bytes.data(), bytes.size())), makeSink_);
}

}  // namespace Varnel::Platform::GStreamer
