#pragma once

/// Marks what a host may link to; every other symbol of the library stays hidden.
#define MARLET_EXPORT __attribute__((visibility("default")))
