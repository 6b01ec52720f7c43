#pragma once

#include "finding.h"

namespace velk::check {

/// The files for TLS with the platform: its authority, the terminal's certificate and its key.
Findings checkCertificates();

} // namespace velk::check
