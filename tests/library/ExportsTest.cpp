#include <gmock/gmock.h>

#include <algorithm>
#include <iterator>
#include <regex>
#include <string>
#include <vector>

#include "support/Command.h"

namespace {

// Everything a host may link against, and nothing else.
constexpr char kNames[] = "createPenInst; versionTable; Qelt::g_backgroundPtn; Qelt::g_pointPtn";
// Of each shader szVertexShader and szFragmentShader.
constexpr char kShaders[] =
    "Pencil2StrokeShaderV1; Pencil2StrokeShaderV2; Pencil2OutlineShader; Pencil2PreviewShader; "
    "Pencil2PredictionShader";
// Of each matrix class its members; @ is the class itself.
constexpr char kMatrix3[] =
    "Matrix3(); Matrix3(float const&); Matrix3(float const*); Matrix3(@ const&); operator=(@ const&); "
    "identitySelf(); zeroSelf(); isIdentity() const; operator==(@ const&) const; "
    "operator!=(@ const&) const; transposeSelf(); transpose() const; inverseSelf(); inverse() const; "
    "calculaeMatrix(double*) const; translateMatrix(float, float); scaleMatrix(float, float); "
    "rotateMatrix(float); setTranslate(float, float); setScale(float, float); "
    "setScale(float, float, float, float); setRotate(float); setRotate(float, float, float); "
    "preTranslate(float, float); preScale(float, float); preScale(float, float, float, float); "
    "preRotate(float); preRotate(float, float, float); preConcat(@ const&); postTranslate(float, float); "
    "postScale(float, float); postScale(float, float, float, float); postRotate(float); "
    "postRotate(float, float, float); postConcat(@ const&); "
    "mapRect(Qelt::RectF*, Qelt::RectF const&) const; mapRect(Qelt::Rect*, Qelt::Rect const&) const; "
    "getScaleX() const; getScaleY() const; getSkewX() const; getSkewY() const; getTranslateX() const; "
    "getTranslateY() const; operator()(int, int); operator()(int, int) const; operator[](int); "
    "operator[](int) const; data(); data() const; storageSize(); isRowMajor()";
constexpr char kMatrix4[] =
    "Matrix4(); Matrix4(float const&); Matrix4(float const*); Matrix4(@ const&); operator=(@ const&); "
    "identitySelf(); zeroSelf(); operator==(@ const&) const; operator!=(@ const&) const; transposeSelf(); "
    "transpose() const; inverseSelf(); inverse() const; calculaeMatrix(double*) const; "
    "operator*(@ const&) const; perspectiveMatrix(float, float, float, float); "
    "orthoMatrix(float, float, float, float, float, float); translateMatrix(float, float, float); "
    "translateMatrix(Qelt::Vector3<float> const&); scaleMatrix(float, float, float); "
    "scaleMatrix(Qelt::Vector3<float> const&); rotateMatrix(float, float, float); "
    "rotateMatrix(float, Qelt::Vector3<float>&); "
    "rotateMatrix(Qelt::Vector3<float>, Qelt::Vector3<float>); rotation() const; translation() const; "
    "rotate(float, float, float) const; rotateSelf(float, float, float); row(int) const; "
    "column(int) const; operator()(int, int); operator()(int, int) const; operator[](int); "
    "operator[](int) const; data(); data() const; storageSize(); isRowMajor()";

std::vector<std::string> split(const std::string& list) {
  static const std::regex kSeparator("; ");
  return {std::sregex_token_iterator(list.begin(), list.end(), kSeparator, -1), {}};
}

std::vector<std::string> promised() {
  std::vector<std::string> names = split(kNames);
  for (const std::string& shader : split(kShaders)) {
    names.push_back("Qelt::" + shader + "::szVertexShader");
    names.push_back("Qelt::" + shader + "::szFragmentShader");
  }
  const auto add = [&names](const std::string& matrix, const char* members) {
    for (const std::string& member : split(members)) {
      names.push_back(matrix + "::" + std::regex_replace(member, std::regex("@"), matrix));
    }
  };
  add("Qelt::Matrix3<float>", kMatrix3);
  add("Qelt::Matrix4<float>", kMatrix4);
  return names;
}

std::vector<std::string> without(const std::vector<std::string>& names,
                                 const std::vector<std::string>& others) {
  std::vector<std::string> rest;
  std::copy_if(names.begin(), names.end(), std::back_inserter(rest), [&](const std::string& name) {
    return std::find(others.begin(), others.end(), name) == others.end();
  });
  return rest;
}

#if defined(__aarch64__)
constexpr bool kIsArm = true;
#else
constexpr bool kIsArm = false;
#endif

// What a tool for ELF files prints of the library.
std::vector<std::string> linesOf(const std::string& tool) {
  return QeltTests::linesOf(tool + " " QELT_PLUGIN_PATH);
}

TEST(Exports, AreThePromisedNamesAndNothingElse) {
  const std::vector<std::string> exported = linesOf(QELT_NM " -DCj --defined-only");
  EXPECT_THAT(without(promised(), exported), testing::IsEmpty()) << "promised, but not there";
  EXPECT_THAT(without(exported, promised()), testing::IsEmpty()) << "there, but not promised";
}

TEST(Exports, TheLibraryCarriesItsPlainNameNeedsOnlyTheHostAndTheRuntimeAndRunsNothingAsItIsLoaded) {
  const std::regex entry(".*\\((NEEDED|SONAME)\\).*\\[(.*)\\]"), load("  LOAD .* 0x([0-9a-f]+)"),
      initialisers(".*\\(INIT_ARRAYSZ\\) *([0-9]+) .*");
  std::vector<std::string> needed, sonames;
  for (const std::string& line : linesOf(QELT_READELF " -dlW")) {
    std::smatch match;
    if (std::regex_match(line, match, load)) {
      EXPECT_GE(std::stoul(match[1], nullptr, 16), 0x4000u) << "pages of 16 KB";
    } else if (std::regex_match(line, match, initialisers) && !QELT_SANITIZED) {
      // The compiler's own start-up function is one; on 64-bit ARM its probe for atomic instructions is
      // another.
      EXPECT_LE(std::stoul(match[1]), kIsArm ? 16u : 8u);
    } else if (std::regex_match(line, match, entry)) {
      (match[1] == "NEEDED" ? needed : sonames).push_back(match[2]);
    }
  }
  EXPECT_THAT(sonames, testing::ElementsAre("libQeltPencil2.so"));
  if (QELT_SANITIZED) return;  // their runtimes bring libraries of their own
  EXPECT_THAT(without(needed, {"libQeltBase.so", "libQeltModel.so", "libQeltEngine.so", "libQeltGL.so",
                               "libQeltGraphics.so", "libQeltPenCommon.so", "liblog.so.0", "libstdc++.so.6",
                               "libm.so.6", "libgcc_s.so.1", "libc.so.6", "ld-linux-aarch64.so.1"}),
              testing::IsEmpty());
}

}  // namespace
