#pragma once
// The host's own user messages, by number, from the message file beside the program
// (program/ZVListas.config, its English list), so that they read as the module's do.
#include <QString>

namespace zvhost {

// The message's text; `fallback` when the file or the number is missing. `folder` is the
// program's folder (empty: the running program's).
QString programMessage(int number, const QString& fallback, const QString& folder = {});

// Message numbers the host uses.
inline constexpr int kMessageNoDwgWriter = 920;

}  // namespace zvhost
