// SPDX-License-Identifier: Apache-2.0
// Asio's own code, compiled once for all files.
#include <asio/impl/src.hpp>
