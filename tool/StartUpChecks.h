#pragma once

/// Why the tool cannot run on this device, for a person; null when it can. The product must have a
/// cellular radio, and the telephony or the baseband daemon must run, but a watch may do without
/// them. Any thread.
const char* WhyNotToStart();
