// SPDX-License-Identifier: MIT
#pragma once

#include <Basalt/Columns.h>

namespace Host {

/// A header of the host's own, in a folder named as one of the framework's is.
inline const char* windowTitle() {
  return columnCount() == 2 ? "Two columns" : "Columns";
}

}  // namespace Host
