// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/label.h>

#include <cstdint>

#include <Varnel/GTK3/DisplayTexts.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::GTK3 {

/// A label that shows a path in its short form, on one line, with what does not fit left out in its
/// middle; the pointer shows the full path. Main thread only.
///
///     PathLabel label;
///     label.setURL(folder, PathKind::folder);  // ~/Documents/
class VARNEL_API PathLabel final : public Gtk::Label {
 public:
  PathLabel();

  void setURL(const Platform::URL& url, PathKind kind);
};

/// A label that shows a size in the user's formats. Main thread only.
class VARNEL_API SizeLabel final : public Gtk::Label {
 public:
  SizeLabel();

  void setBytes(std::int64_t bytes);
};

}  // namespace Varnel::GTK3
