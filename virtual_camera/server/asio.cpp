// Asio's own code, compiled once for all files.
#include <asio/impl/src.hpp>
