#pragma once

// What a session undoes when its terminal leaves the domain. No step looks at how the one before ended.

/// Runs the restore script and waits for its end, however long it takes.
void runRestoreScript();

/// Gives the desktop back its unrestricted state and stops the session policy service; waits for systemctl.
void restoreDesktop();

/// Does not wait for the reply.
void switchIdentityServiceOff();
