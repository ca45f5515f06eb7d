// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform::Linux {

/// The text that lies beside a file in the trash and tells other programs where it was. `path` is
/// absolute, or relative to the top folder of the volume; `deleted` is the moment on the user's
/// clocks, as if they ran on UTC.
[[nodiscard]] std::string trashInfoText(std::string_view path, Date deleted);

/// The path in such a text, whoever has written it; absent when there is none.
[[nodiscard]] std::optional<std::string> pathInTrashInfo(std::string_view text);

/// A name for a file in the trash that leaves room for the ending of its info file. The first
/// attempt has the file's own name, cut to the room; later ones differ from it and each other.
[[nodiscard]] std::string nameInTrash(std::string_view name, unsigned attempt, std::size_t maxName);

inline constexpr std::string_view trashInfoEnding = ".trashinfo";

}  // namespace Varnel::Platform::Linux
