#pragma once

namespace config::hw {

/// Whether this product is a watch. Any thread.
bool watch();

}  // namespace config::hw
