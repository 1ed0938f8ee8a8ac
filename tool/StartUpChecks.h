#pragma once

/// The message that says why the tool cannot run on this device; null when it can. The product must
/// have a cellular radio, and, unless it is a watch, the telephony or the baseband daemon must run.
const char* WhyNotToStart();
