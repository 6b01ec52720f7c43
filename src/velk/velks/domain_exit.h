#pragma once

// What a session undoes when its terminal leaves the domain. No step depends on the success of the one
// before.

/// Runs the restore script and waits for it without a time limit.
void runRestoreScript();

/// Lifts all restrictions of the desktop and stops the session policy service; waits for systemctl.
void restoreDesktop();

/// Does not wait for the reply.
void switchIdentityServiceOff();
