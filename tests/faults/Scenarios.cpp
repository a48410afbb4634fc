#include "Scenarios.h"

#include "pencommon/PenStrokeDrawableGL.h"

namespace QeltTests {

std::vector<Scenario> scenarios() {
  return {
      {"Pen",
       [](Stage& stage) {
         stage.makePen();
         stage.deletePen();
       },
       false},
      {"LiveStroke", [](Stage& stage) { stage.live(); }, true},
      {"LiveStrokeLeftOpen", [](Stage& stage) { stage.beginLive(); }, false},
      {"LiveStrokeQueuedAsThePenDies",
       [](Stage& stage) {
         stage.live(false);
         stage.deletePen();
       },
       false},
      {"Redraws", [](Stage& stage) { stage.redraw(); }, true},
      {"RedrawsQueuedAsThePenDies",
       [](Stage& stage) {
         stage.redraw(false);
         stage.deletePen();
       },
       false},
      {"RedrawAtAnotherScale",
       [](Stage& stage) {
         stage.redraw();
         stage.zoom(3.0f);
         stage.redraw(false);
       },
       false},
      {"Outlines", [](Stage& stage) { stage.outline(); }, true},
      {"Preview", [](Stage& stage) { stage.preview(); }, false},
      {"Prediction", [](Stage& stage) { stage.predict(); }, false},
      {"AllQueuedAsThePenDies",
       [](Stage& stage) {
         stage.outline(false);
         stage.preview(false);
         stage.predict(false);
         stage.deletePen();
       },
       false},
      {"VersionChange",
       [](Stage& stage) {
         stage.live(false);
         if (stage.pen() == nullptr) return;
         for (const int version : {3, 8}) {
           stage.pen()->setVersion(version);
           stage.live(false);
         }
       },
       false},
  };
}

std::vector<Scenario> pictureScenarios() {
  return {
      {"InitAndRelease",
       [](Stage& stage) {
         stage.prepareAll();
         stage.deletePen();
       },
       false},
      {"LivePicture", [](Stage& stage) { stage.live(); }, false},
      {"ContextLoss",
       [](Stage& stage) {
         stage.prepareAll();
         stage.loseAndRestoreContext();
       },
       false},
  };
}

}  // namespace QeltTests
