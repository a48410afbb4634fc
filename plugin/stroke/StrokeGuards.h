#pragma once

#include "pencommon/PenStrokeDrawableRT.h"
#include "render/BatchGuard.h"

// Each version hands its batches over with guards of its own, all alike.
namespace Qelt {

class Pencil2V1ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V2ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V3ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V4ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V5ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V7ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V8ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

// Kept: version 8 has no cache guard of its own and uses version 7's.
class Pencil2V1CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V2CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V3CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V4CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V5CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V7CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

}  // namespace Qelt
