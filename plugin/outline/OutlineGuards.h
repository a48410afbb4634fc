#pragma once

#include "pencommon/PenOutlineDrawableRT.h"
#include "render/BatchGuard.h"

// Each version hands its two streams over with a guard of its own, all alike.
namespace Qelt {

class Pencil2OutlineV1ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV2ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV3ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV4ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV5ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

}  // namespace Qelt
