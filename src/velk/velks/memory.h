#pragma once

// Return freed memory to the system that the C library would keep.

/// Returns the memory of large texts as soon as they are freed. Without a fixed threshold the C library keeps
/// ever larger blocks, and one burst of long policies would enlarge the agent for its lifetime.
void keepNoLargeBlocks();

/// Returns the memory of bursts of small objects, such as 200,000 signals queued by Qt, once the event loop
/// is about to wait. Needs the application's event dispatcher.
void giveMemoryBackAfterWork();

/// Returns what is free now.
void giveMemoryBack();
