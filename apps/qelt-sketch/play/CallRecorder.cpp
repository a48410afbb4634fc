#include "play/CallRecorder.h"

#include <cxxabi.h>

#include <cstdlib>
#include <memory>
#include <typeinfo>
#include <utility>

#include "gl/ITask.h"
#include "text/NumberText.h"

namespace QeltDesktop {
namespace {

void appendFloats(std::string& out, const std::vector<float>& values) {
  out += '[';
  for (std::size_t i = 0; i < values.size(); ++i) {
    if (i > 0) out += ',';
    appendJson(out, values[i]);
  }
  out += ']';
}

void appendText(std::string& out, const std::string& text) {
  out += '"';
  for (const char c : text) {
    if (c == '"' || c == '\\') out += '\\';
    out += c;
  }
  out += '"';
}

// In the batches of a drawable. A pen draws a rendering version that is not in the list like the first one.
int floatsPerVertex(DrawableKind drawable, int renderingVersion) {
  switch (drawable) {
    case DrawableKind::Outline:
      return Qelt::kOutlineFloatsPerVertex;
    case DrawableKind::Preview:
      return Qelt::kPreviewFloatsPerVertex;
    case DrawableKind::Prediction:
      return Qelt::kPredictionFloatsPerVertex;
    case DrawableKind::Stroke:
      break;
  }
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    if (version.number == renderingVersion) return version.floatsPerVertex;
  }
  return Qelt::kRenderingVersions.front().floatsPerVertex;
}

// A type's name as people write it: demangled, without the namespaces in front of it.
std::string readableTypeName(const char* mangled) {
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> text(abi::__cxa_demangle(mangled, nullptr, nullptr, &status),
                                                    &std::free);
  const std::string name = status == 0 ? text.get() : mangled;
  const std::size_t arguments = name.find('<');
  const std::size_t colons = name.rfind("::", arguments);
  return colons == std::string::npos ? name : name.substr(colons + 2);
}

}  // namespace

CallRecorder::CallRecorder(RenderQueue& queue, OutputFile& file, Progress& progress, DrawableKind wanted)
    : mQueue(queue), mWatch(queue), mFile(file), mProgress(progress), mWanted(wanted) {
  mQueue.onAccepted = [this](const Qelt::ITask& task) {
    if (mInCall) mPosted.push_back(&typeNameOf(task));
  };
  setBatchObserver([this](Batch batch) { mBatches.push_back(std::move(batch)); });
}

CallRecorder::~CallRecorder() {
  setBatchObserver({});
}

void CallRecorder::call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) {
  mPosted.clear();
  mBatches.clear();
  Qelt::RectF rect;
  mInCall = true;
  const bool result = make(&rect);
  mInCall = false;
  // The tasks that the call posted run now and hand over their batches.
  mWatch.finish();
  if (call.drawable == mWanted) writeLine(call, result, rect);
}

void CallRecorder::writeLine(const DrawableCall& call, bool result, const Qelt::RectF& rect) {
  std::string line = R"({"kind":"call","stroke":)" + std::to_string(call.stroke);
  line += R"(,"op":")";
  line += call.operation;
  line += R"(","action":)" + (call.action ? std::to_string(*call.action) : "null");
  line += R"(,"result":)";
  line += result ? "true" : "false";
  line += R"(,"rect":)";
  appendFloats(line, {rect.left, rect.top, rect.right, rect.bottom});
  line += R"(,"buffers":[)";
  const std::string stride = std::to_string(floatsPerVertex(call.drawable, call.renderingVersion));
  bool first = true;
  for (const Batch& batch : mBatches) {
    for (const std::vector<float>& buffer : batch.buffers) {
      line += first ? R"({"stride":)" : R"(,{"stride":)";
      first = false;
      line += stride;
      line += batch.cached ? R"(,"cached":true,"data":)" : R"(,"cached":false,"data":)";
      appendFloats(line, buffer);
      line += '}';
    }
  }
  line += R"(],"posted":[)";
  for (std::size_t i = 0; i < mPosted.size(); ++i) {
    if (i > 0) line += ',';
    appendText(line, *mPosted[i]);
  }
  line += "]}\n";
  mFile.write(line);
}

const std::string& CallRecorder::typeNameOf(const Qelt::ITask& task) {
  std::string& name = mTypeNames[typeid(task)];
  if (name.empty()) name = readableTypeName(typeid(task).name());
  return name;
}

}  // namespace QeltDesktop
