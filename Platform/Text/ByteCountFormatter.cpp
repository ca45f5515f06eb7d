// SPDX-License-Identifier: MIT
#include <Platform/Text/ByteCountFormatter.h>
