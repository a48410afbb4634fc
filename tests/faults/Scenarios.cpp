#include "Scenarios.h"

#include <stdexcept>

#include "pencommon/PenStrokeDrawableGL.h"

namespace QeltTests {

std::vector<Scenario> scenarios() {
  return {
      {"Pen",
       [](Stage& stage) {
         stage.makePen();
         stage.deletePen();
       }},
      {"LiveStroke", [](Stage& stage) { stage.live(); }, true},
      {"Straight", [](Stage& stage) { stage.straight(); }, true},
      {"LiveStrokeLeftOpen", [](Stage& stage) { stage.beginLive(); }},
      {"LiveStrokeQueuedAsThePenDies",
       [](Stage& stage) {
         stage.live(false);
         stage.deletePen();
       }},
      {"Redraws", [](Stage& stage) { stage.redraw(); }, true},
      {"RedrawsQueuedAsThePenDies",
       [](Stage& stage) {
         stage.redraw(false);
         stage.deletePen();
       }},
      {"RedrawAtAnotherScale",
       [](Stage& stage) {
         stage.redraw();
         stage.zoom(3.0f);
         stage.redraw(false);
       }},
      {"Outlines", [](Stage& stage) { stage.outline(); }, true},
      {"Preview", [](Stage& stage) { stage.preview(); }},
      {"Prediction", [](Stage& stage) { stage.predict(); }},
      {"AllQueuedAsThePenDies",
       [](Stage& stage) {
         stage.outline(false);
         stage.preview(false);
         stage.predict(false);
         stage.deletePen();
       }},
      {"VersionChange",
       [](Stage& stage) {
         stage.live(false);
         if (stage.pen() == nullptr) return;
         for (const int version : {3, 8}) {
           stage.pen()->setVersion(version);
           stage.live(false);
         }
       }},
      {"InitAndRelease",
       [](Stage& stage) {
         stage.prepareAll();
         stage.deletePen();
       },
       true, true},
      {"LivePicture", [](Stage& stage) { stage.live(); }, false, true},
      {"ContextLoss",
       [](Stage& stage) {
         stage.prepareAll();
         stage.loseAndRestoreContext();
       },
       false, true},
  };
}

Scenario scenario(const std::string& name) {
  for (const Scenario& one : scenarios()) {
    if (one.name == name) return one;
  }
  throw std::logic_error("no scenario " + name);
}

}  // namespace QeltTests
