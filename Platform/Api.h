// SPDX-License-Identifier: MIT
#pragma once

/// Marks what the shared library exports. Everything else stays hidden in it.
#define VARNEL_API __attribute__((visibility("default")))
