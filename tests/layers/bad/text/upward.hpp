#pragma once
// A deliberate fault for the layer check's own test: the lowest layer
// including an editor's header.
#include "labour/frm_labour.hpp"
