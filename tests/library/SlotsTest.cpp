// A host built elsewhere calls through slot numbers. These tests do the same with the built library, and hold
// the contract's headers against the same numbers.

#include <dlfcn.h>
#include <gmock/gmock.h>

#include <climits>
#include <cstdint>
#include <cstring>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "base/RectF.h"
#include "base/String.h"
#include "desktop/engine/PluginLibrary.h"
#include "gl/ITask.h"
#include "gl/ManagedObject.h"
#include "pencommon/IPen.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/Pen.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenStrokeDrawableRT.h"

namespace {

using Qelt::IPenMorphable;
using Qelt::Pen;
using Qelt::PenDrawableRT;
using Qelt::PenStrokeDrawableRT;
using testing::ElementsAre;

void* codeAt(const void* object, int slot) {
  return (*static_cast<void* const* const*>(object))[slot];
}

template <typename Result, typename... Arguments>
Result callSlot(void* object, int slot, Arguments... arguments) {
  const auto function = reinterpret_cast<Result (*)(void*, Arguments...)>(codeAt(object, slot));
  return function(object, arguments...);
}

// The slot a pointer to a virtual member names. The ABI keeps an offset into the table in its first word; on
// x86-64 that word also carries the mark "virtual", on 64-bit ARM the second word does.
template <typename Member>
int slotOf(Member member) {
  std::uintptr_t words[2];
  static_assert(sizeof(words) == sizeof(member));
  std::memcpy(words, &member, sizeof(words));
#if defined(__aarch64__)
  EXPECT_EQ(words[1] & 1, 1u) << "not virtual";
#else
  EXPECT_EQ(words[0]-- & 1, 1u) << "not virtual";
#endif
  return static_cast<int>(words[0] / sizeof(void*));
}

std::string libraryOf(const void* code) {
  Dl_info info;
  if (dladdr(code, &info) == 0) return "?";
  const std::string path = info.dli_fname;
  return path.substr(path.rfind('/') + 1);
}

class Slots : public testing::Test {
 protected:
  QeltDesktop::PluginLibrary mLibrary{QELT_PLUGIN_PATH};
  std::unique_ptr<Pen> mPen{mLibrary.createPen()};
};

TEST_F(Slots, ThePenAnswersAtItsSlots) {
  void* pen = mPen.get();
  EXPECT_EQ((callSlot<float>(pen, 3)), 0.477f);  // size of a fresh pen
  for (const float size : {3.0f, 40.0f, -1.0f}) {
    callSlot<void>(pen, 2, size);
    EXPECT_EQ((callSlot<float>(pen, 3)), size);
    EXPECT_EQ((callSlot<float>(pen, 4)), 0.477f);  // smallest
    EXPECT_EQ((callSlot<float>(pen, 5)), 6.571f);  // largest
  }
  EXPECT_EQ((callSlot<int>(pen, 7)), static_cast<int>(0xFF000000u));
  callSlot<void>(pen, 13, 0.25f);
  EXPECT_EQ((callSlot<float>(pen, 14)), 0.25f);
  for (const int slot : {6, 11, 15}) {  // colour, particle density, rendering level
    callSlot<void>(pen, slot, 0x12345678);
    EXPECT_EQ((callSlot<int>(pen, slot + 1)), 0x12345678) << slot;
  }
  for (const int attribute : {-1, 0, 1, 2, 3, 4, 5, 32, 36, INT_MAX, INT_MIN}) {
    const bool expected = attribute >= 0 && attribute <= 4 && attribute != 3;
    EXPECT_EQ((callSlot<bool>(pen, 18, attribute)), expected) << attribute;
  }
  EXPECT_EQ((callSlot<void*>(pen, 25)), static_cast<void*>(mPen->GetMorphable()));
  EXPECT_EQ((callSlot<void*>(pen, 26)), nullptr);
}

// The pen has them itself, and through the interface that morphing goes by.
TEST_F(Slots, TheMorphingOptionsAreThePens) {
  void* pen = mPen.get();
  EXPECT_TRUE((callSlot<bool>(pen, 30)));   // curves
  EXPECT_FALSE((callSlot<bool>(pen, 32)));  // fixed width
  EXPECT_EQ((callSlot<float>(pen, 34)), 0.0f);
  float width = -1.0f;
  for (const auto& [object, first] : {std::pair<void*, int>(pen, 29), {mPen->GetMorphable(), 2}}) {
    for (const bool isOn : {true, false}) {
      for (const int option : {0, 2}) {
        EXPECT_TRUE((callSlot<bool>(object, first + option, isOn)));
        EXPECT_EQ((callSlot<bool>(object, first + option + 1)), isOn) << first << " + " << option;
        EXPECT_EQ((callSlot<bool>(pen, 30 + option)), isOn) << first << " + " << option;
      }
    }
    EXPECT_TRUE((callSlot<bool>(object, first + 4, ++width)));
    EXPECT_EQ((callSlot<float>(object, first + 5)), width);
    EXPECT_EQ((callSlot<float>(pen, 34)), width);
  }
}

// What the pen leaves to the host's base, a later host may change without a new pen.
TEST_F(Slots, ThePenOverridesOnlyItsOwn) {
  const std::set<int> itsOwn{0, 1, 4, 5, 18, 19, 20, 21, 22, 25, 26, 29, 30, 31, 32, 33, 34};
  for (int slot = 0; slot <= 34; ++slot) {
    EXPECT_EQ(libraryOf(codeAt(mPen.get(), slot)),
              itsOwn.contains(slot) ? "libQeltPencil2.so" : "libQeltPenCommon.so")
        << "slot " << slot;
  }
}

// What the numbers above rest on, and those that a render thread calls by.
TEST(ContractSlots, AreThoseOfHostsBuiltElsewhere) {
  const auto slotsOf = [](auto... members) { return std::vector<int>{slotOf(members)...}; };
  EXPECT_THAT(slotsOf(&Pen::SetSize, &Pen::GetMaxSize, &Pen::SetScreenResolution, &Pen::GetAdvancedSetting,
                      &Pen::SetEnhancedAntiAlias),
              ElementsAre(2, 5, 8, 10, 17));
  EXPECT_THAT(slotsOf(&Pen::GetStrokeDrawableGL, &Pen::GetPredictionStrokeDrawableGL,
                      &Pen::GetOutlineDrawableGL, &Pen::GetPreviewDrawableGL, &Pen::GetTestDrawableGL,
                      &Pen::GetStrokeRect, &Pen::setPenDataManager),
              ElementsAre(19, 20, 21, 22, 23, 27, 28));
  EXPECT_THAT(slotsOf(&IPenMorphable::SetCurveEnabled, &IPenMorphable::GetFixedWidth), ElementsAre(2, 7));
  EXPECT_THAT(slotsOf(&Qelt::ITask::run, &Qelt::ITask::isGlobalLockAllowed), ElementsAre(2, 3));
  EXPECT_THAT(slotsOf(&Qelt::ManagedObject::OnRelease, &Qelt::ManagedObject::OnRestore), ElementsAre(2, 3));
  EXPECT_THAT(slotsOf(&PenDrawableRT::ReleaseGLObject, &PenDrawableRT::RestoreGLObject, &PenDrawableRT::Init,
                      &PenDrawableRT::Release, &PenDrawableRT::AddPoint, &PenDrawableRT::CreatePenCanvas,
                      &PenDrawableRT::ClearPenCanvas, &PenDrawableRT::Clear, &PenDrawableRT::Update,
                      &PenDrawableRT::Draw, &PenDrawableRT::GetDepthMapBitmapSettable,
                      &PenDrawableRT::GetReferenceBitmapSettable),
              ElementsAre(4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15));
  EXPECT_THAT(slotsOf(&PenStrokeDrawableRT::SetBuffer, &PenStrokeDrawableRT::SendDataToGPU,
                      &PenStrokeDrawableRT::SetCacheBuffer),
              ElementsAre(16, 17, 18));
}

}  // namespace
