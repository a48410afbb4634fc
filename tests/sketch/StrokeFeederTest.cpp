#include "StrokeFeeder.h"

#include <gtest/gtest.h>

#include <cmath>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "Ink.h"

namespace QeltDesktop {
namespace {

// Points at x = 0, 1, 2, ..., each different in everything.
std::vector<Sample> samplesOf(int points) {
  std::vector<Sample> samples;
  for (int i = 0; i < points; ++i) {
    const auto number = static_cast<float>(i);
    samples.push_back({.x = number,
                       .y = 10.0f * number,
                       .pressure = 0.01f * number,
                       .tilt = 0.002f * number,
                       .orientation = -0.03f * number,
                       .time = 4.0 * i});
  }
  return samples;
}

// A page of one trace.
Page pageOf(const std::vector<Sample>& samples, std::optional<int> tool = {}) {
  Page page;
  page.traces.add(samples, {}, tool);
  return page;
}

constexpr Pointer kStylus{2, 16386};

// "down 0; move 1 2 3; up 3": what each event holds, by x.
std::string described(int points, int batch, bool penStaysDown = false) {
  const Page page = pageOf(samplesOf(points));
  const Trace trace = page.traces[0];
  std::string text;
  feedLive(trace, kStylus, batch, penStaysDown, [&](LiveEvent& live) {
    const Qelt::MotionEvent& event = live.event;
    const char* const names[] = {"down", "up", "move"};
    if (!text.empty()) text += "; ";
    text += names[event.GetAction()];
    const auto add = [&](float x) {
      text += ' ';
      text += std::to_string(std::lround(x));
    };
    for (int i = 0; i < event.GetHistorySize(); ++i) add(event.GetHistoricalX(i));
    add(event.GetX(0));
    EXPECT_EQ(event.GetX(0), trace.samples[live.sample].x);
  });
  return text;
}

TEST(StrokeFeeder, BatchesLiveSamples) {
  EXPECT_EQ(described(10, 4), "down 0; move 1 2 3 4; move 5 6 7 8; move 9; up 9");
  EXPECT_EQ(described(9, 4), "down 0; move 1 2 3 4; move 5 6 7 8; up 8");
  EXPECT_EQ(described(3, 1), "down 0; move 1; move 2; up 2");
  EXPECT_EQ(described(3, 1000), "down 0; move 1 2; up 2");
  EXPECT_EQ(described(1, 4), "down 0; up 0");
  EXPECT_EQ(described(6, 4, true), "down 0; move 1 2 3 4; move 5");
}

TEST(StrokeFeeder, RecordedEventAndStoredStrokeHoldEveryPoint) {
  const Page page = pageOf(samplesOf(3));
  const Trace trace = page.traces[0];
  const Qelt::MotionEvent event = recordedEvent(trace, kStylus);
  const auto stroke = storedStroke(trace, kStylus);
  ASSERT_EQ(event.GetHistorySize(), 3);
  ASSERT_EQ(stroke->GetPointCount(), 3);
  EXPECT_EQ(stroke->GetToolType(), 2);
  for (int i = 0; i < 3; ++i) {
    const Sample sample = trace.samples[static_cast<std::size_t>(i)];
    EXPECT_EQ(event.GetHistoricalX(i), sample.x);
    EXPECT_EQ(event.GetHistoricalY(i), sample.y);
    EXPECT_EQ(event.GetHistoricalPressure(i), sample.pressure);
    EXPECT_EQ(event.GetHistoricalTilt(i), sample.tilt);
    EXPECT_EQ(event.GetHistoricalOrientation(i), sample.orientation);
    EXPECT_EQ(stroke->GetPoint()[i].x, sample.x);
    EXPECT_EQ(stroke->GetPoint()[i].y, sample.y);
    EXPECT_EQ(stroke->GetTimeStamp()[i], 4 * i);
    EXPECT_EQ(stroke->GetPressure()[i], sample.pressure);
    EXPECT_EQ(stroke->GetTilt()[i], sample.tilt);
    EXPECT_EQ(stroke->GetOrientation()[i], sample.orientation);
  }
  EXPECT_EQ(event.GetX(0), 2.0f);
  // So does the up event of a live stroke, of its last point.
  feedLive(trace, {1, 77}, 4, false, [&](LiveEvent& live) {
    EXPECT_EQ(live.event.GetToolType(0), 1);
    EXPECT_EQ(live.event.GetSource(), 77);
    if (live.event.GetAction() != Qelt::kActionUp) return;
    for (const Qelt::MotionEvent* whole : {&event, &std::as_const(live.event)}) {
      EXPECT_EQ(whole->GetPressure(0), trace.samples[2].pressure);
      EXPECT_EQ(whole->GetTilt(0), trace.samples[2].tilt);
      EXPECT_EQ(whole->GetOrientation(0), trace.samples[2].orientation);
      EXPECT_EQ(whole->GetDownTime(), 0);
      EXPECT_EQ(whole->GetEventTime(), 8);
    }
  });
  EXPECT_EQ(recordedEvent(pageOf(samplesOf(1)).traces[0], kStylus).GetHistorySize(), 1);

  // Times that no clock shows.
  const Page odd = pageOf({{.time = -1e300}, {.time = 1e300}});
  EXPECT_LT(recordedEvent(odd.traces[0], kStylus).GetDownTime(), 0);
  EXPECT_GT(recordedEvent(odd.traces[0], kStylus).GetEventTime(), 0);
}

TEST(StrokeFeeder, PredictionGoesOnInEqualSteps) {
  const Sample previous{.x = 10.0f, .y = 5.0f}, last{.x = 12.0f, .y = 4.0f};
  const Qelt::MotionEvent event = predictedEvent(previous, last, kStylus, 3);
  EXPECT_EQ(event.GetAction(), Qelt::kActionMove);
  ASSERT_EQ(event.GetHistorySize(), 2);
  EXPECT_EQ(event.GetHistoricalX(0), 14.0f);
  EXPECT_EQ(event.GetHistoricalY(0), 3.0f);
  EXPECT_EQ(event.GetHistoricalX(1), 16.0f);
  EXPECT_EQ(event.GetX(0), 18.0f);
  EXPECT_EQ(event.GetY(0), 1.0f);
  EXPECT_EQ(predictedEvent(previous, last, kStylus, 1).GetHistorySize(), 0);
}

TEST(StrokeFeeder, ToolsHaveTheirSources) {
  const auto expectPointer = [](std::optional<int> ofTrace, std::optional<int> tool,
                                std::optional<int> source, const Pointer& wanted) {
    const Page page = pageOf(samplesOf(1), ofTrace);
    const Trace trace = page.traces[0];
    EXPECT_EQ(pointerFor(trace, tool, source).tool, wanted.tool);
    EXPECT_EQ(pointerFor(trace, tool, source).source, wanted.source);
  };
  expectPointer({}, {}, {}, {2, 16386});
  expectPointer(1, {}, {}, {1, 4098});
  expectPointer(1, 3, {}, {3, 8194});
  expectPointer(1, 2, 4098, {2, 4098});
}

TEST(StrokeFeeder, CutsTheLastTraceOnly) {
  Page page = pageOf(samplesOf(5));
  page.traces.add(samplesOf(5));
  cutLastTrace(page, 9);
  EXPECT_EQ(page.traces[1].samples.size(), 5u);
  cutLastTrace(page, 2);
  EXPECT_EQ(page.traces[0].samples.size(), 5u);
  EXPECT_EQ(page.traces[1].samples.size(), 2u);
}

}  // namespace
}  // namespace QeltDesktop
