// SPDX-License-Identifier: MIT
#include <Varnel/GTK3/DisplayLabels.h>

namespace Varnel::GTK3 {

PathLabel::PathLabel() {
  set_ellipsize(Pango::ELLIPSIZE_MIDDLE);
  set_single_line_mode();
  set_xalign(0);
}

void PathLabel::setURL(const Platform::URL& url, PathKind kind) {
  set_text(pathText(url, kind));
  set_tooltip_text(shownText(url.path()));
}

SizeLabel::SizeLabel() {
  set_single_line_mode();
  set_xalign(1);
}

void SizeLabel::setBytes(std::int64_t bytes) {
  set_text(sizeText(bytes));
}

}  // namespace Varnel::GTK3
