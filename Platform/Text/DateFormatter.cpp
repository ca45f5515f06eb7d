// SPDX-License-Identifier: MIT
#include <Platform/Text/DateFormatter.h>
