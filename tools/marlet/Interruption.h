#pragma once

/// Lets SIGINT, SIGTERM and SIGHUP end the command as they do by default, but only when what a write has built so far is
/// removed. To be called once, at the start.
void handleInterruptions();

/// Ends the process by the signal that came while something was written, if one did.
void endIfInterrupted();
