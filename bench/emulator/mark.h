// System calls by which a program in the emulator tells the plugin what to count.
// No kernel has them; they fail and do nothing else.
#pragma once

inline constexpr long kMarkCall = 0x51510;
inline constexpr long kMarkBegin = 1;
inline constexpr long kMarkEnd = 2;
