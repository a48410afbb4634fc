#pragma once

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <memory>
#include <random>
#include <vector>

#include "core/InkPage.h"
#include "core/PageRecord.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "text/Refusal.h"

namespace QeltTests {

using QeltDesktop::InkPage;
using QeltDesktop::PageMemory;
using QeltDesktop::PagePicture;
using QeltDesktop::PageStyle;
using QeltDesktop::PluginLibrary;
using QeltDesktop::RenderQueue;
using QeltDesktop::Sample;
using QeltDesktop::StrokeId;

inline const PluginLibrary& plugin() {
  static const PluginLibrary* const library = new PluginLibrary(QELT_PLUGIN_PATH);
  return *library;
}

// Works until the page is at rest.
inline void settle(InkPage& page, double milliseconds = 50.0) {
  for (int slice = 0; page.work(milliseconds); ++slice) ASSERT_LT(slice, 1'000'000) << "never at rest";
  EXPECT_FALSE(page.isBusy());
}

inline void draw(InkPage& page, const PageStyle& style, const std::vector<Sample>& samples,
                 std::size_t most = ~std::size_t{0}) {
  page.begin(style, samples.front());
  for (std::size_t next = 1; next < std::min(samples.size(), most); next += 3) {
    const std::size_t count = std::min<std::size_t>(3, samples.size() - next);
    page.move({&samples[next], count}, {&samples[samples.size() - 1], 1});
  }
}

inline StrokeId drawWhole(InkPage& page, const PageStyle& style, const std::vector<Sample>& samples) {
  draw(page, style, samples);
  return page.end(samples.back());
}

inline std::vector<Sample> line(float x0, float y0, float x1, float y1, int count = 12) {
  std::vector<Sample> samples;
  for (int i = 0; i < count; ++i) {
    const float along = count > 1 ? static_cast<float>(i) / static_cast<float>(count - 1) : 0.0f;
    samples.push_back({.x = x0 + along * (x1 - x0),
                       .y = y0 + along * (y1 - y0),
                       .pressure = 0.3f + 0.5f * along,
                       .tilt = 0.9f * along,
                       .orientation = along,
                       .time = 4.0 * i});
  }
  return samples;
}

// A page with the shown strokes of another, in the same window and view, drawn at one go.
inline PagePicture drawnAfresh(const InkPage& page, RenderQueue& queue) {
  InkPage fresh(plugin(), queue, page.width(), page.height());
  fresh.setView(page.view());
  for (const StrokeId id : page.strokes()) fresh.addRecord(page.record(id));
  settle(fresh, 1000.0);
  return fresh.windowPicture();
}

// How many bytes differ; all of them where the sizes do.
inline std::size_t differing(const PagePicture& a, const PagePicture& b) {
  if (a.rgba.size() != b.rgba.size() || a.width != b.width) return std::max(a.rgba.size(), b.rgba.size());
  std::size_t count = 0;
  for (std::size_t i = 0; i < a.rgba.size(); ++i) count += a.rgba[i] != b.rgba[i] ? 1 : 0;
  return count;
}

inline std::size_t inked(const PagePicture& picture) {
  std::size_t count = 0;
  for (std::size_t i = 3; i < picture.rgba.size(); i += 4) count += picture.rgba[i] != 0 ? 1 : 0;
  return count;
}

}  // namespace QeltTests
