#pragma once

namespace config::hw {

/// Whether this product is a watch.
bool watch();

}  // namespace config::hw
