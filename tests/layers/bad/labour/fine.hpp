#pragma once
// Allowed: an editor using a lower layer.
#include "text/error.hpp"
