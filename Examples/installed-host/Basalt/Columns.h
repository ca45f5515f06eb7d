// SPDX-License-Identifier: MIT
#pragma once

namespace Host {

inline int columnCount() {
  return 2;
}

}  // namespace Host
