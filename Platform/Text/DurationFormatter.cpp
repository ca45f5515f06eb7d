// SPDX-License-Identifier: MIT
#include <Platform/Text/DurationFormatter.h>
