// Pixelize, the pixelize brush and red-eye removal: block anchors, shifts at and beyond their
// range, brush discs and squares clipped at the image edges, and the red-eye threshold.
#include <gtest/gtest.h>

#include <cstdint>

#include "photofx.h"
#include "support/images.h"

namespace {

using pfx::test::argb;
using pfx::test::Pixels;

}  // namespace
