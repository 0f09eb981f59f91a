#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "ExitStatus.h"
#include "Terminal.h"

/// How a command ends that fails behind the change it was to make, or for want of memory. Both count for the whole
/// process.

/// Makes a command's one change, at `path`: `write` makes all of it or throws. A library error of it ends the command
/// with `ExitStatus::failedWrite`. Whatever else can fail comes before; where something fails behind it all the same,
/// the command says that the change is made.
void commit(const std::string& path, const std::function<void()>& write);
bool isChangeMade();

/// Complains, and gives the status to end with: `status`, or `ExitStatus::changeMade` behind a commit.
ExitStatus failing(ExitStatus status, std::string_view sentence, const Terminal& terminal);

/// From now on it is noted when memory runs out, however the failure is dealt with: what was answered without memory
/// isn't to be trusted. Where the failure can't be thrown, it ends the process as `endingWithoutMemory` has it.
void watchMemory();
void noteOutOfMemory() noexcept;
bool wasOutOfMemory() noexcept;
/// Says on standard error that there is not enough memory, and gives the status to end with. Takes no memory.
ExitStatus endingWithoutMemory() noexcept;
