#pragma once

#include "finding.h"

namespace velk::check {

/// The files that the agent meets the platform with: the platform's authority, the terminal's certificate
/// and its key.
Findings checkCertificates();

} // namespace velk::check
