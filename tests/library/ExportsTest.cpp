#include <gmock/gmock.h>

#include <algorithm>
#include <cstdint>
#include <iterator>
#include <string>
#include <vector>

#include "desktop/engine/PluginLibrary.h"
#include "support/ElfFile.h"

namespace {

// Everything a host may link against, and nothing else.
const std::vector<std::string> kPromised = {
    "createPenInst",
    "versionTable",
    "Qelt::g_backgroundPtn",
    "Qelt::g_pointPtn",
    "Qelt::Pencil2StrokeShaderV1::szVertexShader",
    "Qelt::Pencil2StrokeShaderV1::szFragmentShader",
    "Qelt::Pencil2StrokeShaderV2::szVertexShader",
    "Qelt::Pencil2StrokeShaderV2::szFragmentShader",
    "Qelt::Pencil2OutlineShader::szVertexShader",
    "Qelt::Pencil2OutlineShader::szFragmentShader",
    "Qelt::Pencil2PreviewShader::szVertexShader",
    "Qelt::Pencil2PreviewShader::szFragmentShader",
    "Qelt::Pencil2PredictionShader::szVertexShader",
    "Qelt::Pencil2PredictionShader::szFragmentShader",

    "Qelt::Matrix3<float>::Matrix3()",
    "Qelt::Matrix3<float>::Matrix3(float const&)",
    "Qelt::Matrix3<float>::Matrix3(float const*)",
    "Qelt::Matrix3<float>::Matrix3(Qelt::Matrix3<float> const&)",
    "Qelt::Matrix3<float>::operator=(Qelt::Matrix3<float> const&)",
    "Qelt::Matrix3<float>::identitySelf()",
    "Qelt::Matrix3<float>::zeroSelf()",
    "Qelt::Matrix3<float>::isIdentity() const",
    "Qelt::Matrix3<float>::operator==(Qelt::Matrix3<float> const&) const",
    "Qelt::Matrix3<float>::operator!=(Qelt::Matrix3<float> const&) const",
    "Qelt::Matrix3<float>::transposeSelf()",
    "Qelt::Matrix3<float>::transpose() const",
    "Qelt::Matrix3<float>::inverseSelf()",
    "Qelt::Matrix3<float>::inverse() const",
    "Qelt::Matrix3<float>::calculaeMatrix(double*) const",
    "Qelt::Matrix3<float>::translateMatrix(float, float)",
    "Qelt::Matrix3<float>::scaleMatrix(float, float)",
    "Qelt::Matrix3<float>::rotateMatrix(float)",
    "Qelt::Matrix3<float>::setTranslate(float, float)",
    "Qelt::Matrix3<float>::setScale(float, float)",
    "Qelt::Matrix3<float>::setScale(float, float, float, float)",
    "Qelt::Matrix3<float>::setRotate(float)",
    "Qelt::Matrix3<float>::setRotate(float, float, float)",
    "Qelt::Matrix3<float>::preTranslate(float, float)",
    "Qelt::Matrix3<float>::preScale(float, float)",
    "Qelt::Matrix3<float>::preScale(float, float, float, float)",
    "Qelt::Matrix3<float>::preRotate(float)",
    "Qelt::Matrix3<float>::preRotate(float, float, float)",
    "Qelt::Matrix3<float>::preConcat(Qelt::Matrix3<float> const&)",
    "Qelt::Matrix3<float>::postTranslate(float, float)",
    "Qelt::Matrix3<float>::postScale(float, float)",
    "Qelt::Matrix3<float>::postScale(float, float, float, float)",
    "Qelt::Matrix3<float>::postRotate(float)",
    "Qelt::Matrix3<float>::postRotate(float, float, float)",
    "Qelt::Matrix3<float>::postConcat(Qelt::Matrix3<float> const&)",
    "Qelt::Matrix3<float>::mapRect(Qelt::RectF*, Qelt::RectF const&) const",
    "Qelt::Matrix3<float>::mapRect(Qelt::Rect*, Qelt::Rect const&) const",
    "Qelt::Matrix3<float>::getScaleX() const",
    "Qelt::Matrix3<float>::getScaleY() const",
    "Qelt::Matrix3<float>::getSkewX() const",
    "Qelt::Matrix3<float>::getSkewY() const",
    "Qelt::Matrix3<float>::getTranslateX() const",
    "Qelt::Matrix3<float>::getTranslateY() const",
    "Qelt::Matrix3<float>::operator()(int, int)",
    "Qelt::Matrix3<float>::operator()(int, int) const",
    "Qelt::Matrix3<float>::operator[](int)",
    "Qelt::Matrix3<float>::operator[](int) const",
    "Qelt::Matrix3<float>::data()",
    "Qelt::Matrix3<float>::data() const",
    "Qelt::Matrix3<float>::storageSize()",
    "Qelt::Matrix3<float>::isRowMajor()",

    "Qelt::Matrix4<float>::Matrix4()",
    "Qelt::Matrix4<float>::Matrix4(float const&)",
    "Qelt::Matrix4<float>::Matrix4(float const*)",
    "Qelt::Matrix4<float>::Matrix4(Qelt::Matrix4<float> const&)",
    "Qelt::Matrix4<float>::operator=(Qelt::Matrix4<float> const&)",
    "Qelt::Matrix4<float>::identitySelf()",
    "Qelt::Matrix4<float>::zeroSelf()",
    "Qelt::Matrix4<float>::operator==(Qelt::Matrix4<float> const&) const",
    "Qelt::Matrix4<float>::operator!=(Qelt::Matrix4<float> const&) const",
    "Qelt::Matrix4<float>::transposeSelf()",
    "Qelt::Matrix4<float>::transpose() const",
    "Qelt::Matrix4<float>::inverseSelf()",
    "Qelt::Matrix4<float>::inverse() const",
    "Qelt::Matrix4<float>::calculaeMatrix(double*) const",
    "Qelt::Matrix4<float>::operator*(Qelt::Matrix4<float> const&) const",
    "Qelt::Matrix4<float>::perspectiveMatrix(float, float, float, float)",
    "Qelt::Matrix4<float>::orthoMatrix(float, float, float, float, float, float)",
    "Qelt::Matrix4<float>::translateMatrix(float, float, float)",
    "Qelt::Matrix4<float>::translateMatrix(Qelt::Vector3<float> const&)",
    "Qelt::Matrix4<float>::scaleMatrix(float, float, float)",
    "Qelt::Matrix4<float>::scaleMatrix(Qelt::Vector3<float> const&)",
    "Qelt::Matrix4<float>::rotateMatrix(float, float, float)",
    "Qelt::Matrix4<float>::rotateMatrix(float, Qelt::Vector3<float>&)",
    "Qelt::Matrix4<float>::rotateMatrix(Qelt::Vector3<float>, Qelt::Vector3<float>)",
    "Qelt::Matrix4<float>::rotation() const",
    "Qelt::Matrix4<float>::translation() const",
    "Qelt::Matrix4<float>::rotate(float, float, float) const",
    "Qelt::Matrix4<float>::rotateSelf(float, float, float)",
    "Qelt::Matrix4<float>::row(int) const",
    "Qelt::Matrix4<float>::column(int) const",
    "Qelt::Matrix4<float>::operator()(int, int)",
    "Qelt::Matrix4<float>::operator()(int, int) const",
    "Qelt::Matrix4<float>::operator[](int)",
    "Qelt::Matrix4<float>::operator[](int) const",
    "Qelt::Matrix4<float>::data()",
    "Qelt::Matrix4<float>::data() const",
    "Qelt::Matrix4<float>::storageSize()",
    "Qelt::Matrix4<float>::isRowMajor()",
};

std::vector<std::string> without(const std::vector<std::string>& names,
                                 const std::vector<std::string>& others) {
  std::vector<std::string> rest;
  std::copy_if(names.begin(), names.end(), std::back_inserter(rest), [&](const std::string& name) {
    return std::find(others.begin(), others.end(), name) == others.end();
  });
  return rest;
}

TEST(Exports, AreThePromisedNamesAndNothingElse) {
  const QeltTests::ElfFile library(QELT_PLUGIN_PATH);
  EXPECT_THAT(without(kPromised, library.exported), testing::IsEmpty()) << "promised, but not there";
  EXPECT_THAT(without(library.exported, kPromised), testing::IsEmpty()) << "there, but not promised";
}

TEST(Exports, TheLibraryCarriesItsPlainNameAndNeedsOnlyTheHostAndTheRuntime) {
  const QeltTests::ElfFile library(QELT_PLUGIN_PATH);
  EXPECT_EQ(library.soname, "libQeltPencil2.so");
  for (const std::uint64_t alignment : library.alignments) EXPECT_GE(alignment, 0x4000u) << "pages of 16 KB";
  if (QELT_SANITIZED) return;  // their runtimes bring libraries of their own
  EXPECT_THAT(
      without(library.needed, {"libQeltBase.so", "libQeltModel.so", "libQeltEngine.so", "libQeltGL.so",
                               "libQeltGraphics.so", "libQeltPenCommon.so", "liblog.so.0", "libstdc++.so.6",
                               "libm.so.6", "libgcc_s.so.1", "libc.so.6", "ld-linux-aarch64.so.1"}),
      testing::IsEmpty());
}

TEST(Exports, TheVersionTablePairsStrokesAndOutlines) {
  const QeltDesktop::PluginLibrary library(QELT_PLUGIN_PATH);
  const auto* table = static_cast<const std::int32_t*>(library.symbol("versionTable"));
  ASSERT_NE(table, nullptr);
  const std::vector<std::int32_t> pairs(table, table + 18);
  EXPECT_THAT(pairs, testing::ElementsAre(0, 0, 1, 1, 2, 2, 3, 3, 4, 4, 5, 5, 6, 4, 7, 4, 8, 4));
}

}  // namespace
