#pragma once

// Measures against memory that nobody needs any more and the C library would keep.

/// Gives the memory of large texts back to the system once they are gone. Without a fixed limit the C library
/// keeps ever larger blocks for later, and one burst of long policies would stay with the agent for its life.
void keepNoLargeBlocks();

/// Does the same for what a burst of small things took: Qt queues signals as fast as they come, and what it
/// took for 200,000 of them would stay with the agent. Needs the application's event dispatcher.
void giveMemoryBackAfterWork();

/// Gives back what is free now.
void giveMemoryBack();
