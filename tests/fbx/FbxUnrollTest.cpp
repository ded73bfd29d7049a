// The Euler unroll filter: same rotations, no jumps.
#include "fbx/FbxAnimation.h"
#include "fbx/FbxScene.h"
#include "plugin/host/AnvilRotation.h"
#include <algorithm>
#include <cmath>
#include <gtest/gtest.h>

using namespace AnvilFbx;

namespace {

// Largest difference between two rotations' quaternions, up to sign.
double distance(const AnvilRotation& a, const AnvilRotation& b) {
  double ax, ay, az, aw, bx, by, bz, bw;
  a.getAsQuaternion(ax, ay, az, aw);
  b.getAsQuaternion(bx, by, bz, bw);
  const double dot = ax * bx + ay * by + az * bz + aw * bw;
  return 1.0 - std::fabs(dot);
}

struct Case {
  AnvilRotation::RotOrder host;
  EFbxRotationOrder fbx;
};

class UnrollTest : public testing::TestWithParam<Case> {};

TEST_P(UnrollTest, KeepsEveryRotationAndRemovesJumps) {
  FbxManager* pManager = FbxManager::Create();
  FbxScene* pScene = FbxScene::Create(pManager, "s");
  FbxNode* pNode = FbxNode::Create(pManager, "n");
  FbxAnimLayer* pLayer = FbxAnimLayer::Create(pScene, "l");
  FbxAnimCurve* curves[3];
  const char* axes[] = {"X", "Y", "Z"};
  for (int a = 0; a < 3; ++a)
    curves[a] = pNode->LclRotation.GetCurve(pLayer, axes[a], true);
  // A spin about a tilted axis through several turns: principal Euler angles wrap and flip.
  std::vector<AnvilRotation> rotations;
  for (int k = 0; k < 200; ++k) {
    AnvilRotation r(Vec3(0.3, 1.0, 0.2), k * 7.0);
    r *= AnvilRotation(Vec3(1.0, 0.0, 0.0), 80.0 * std::sin(k * 0.05));
    rotations.push_back(r);
    Vec3 euler;
    r.getAsEuler(GetParam().host, euler);
    for (int a = 0; a < 3; ++a) {
      const int i = curves[a]->KeyAdd(FbxTime(k));
      curves[a]->KeySetValue(i, float(euler[a]));
    }
  }
  // The principal angles jump by 180 degrees or more somewhere: the case the filter is for.
  double largestJump = 0.0;
  for (int k = 1; k < 200; ++k)
    for (int a = 0; a < 3; ++a)
      largestJump =
          std::max(largestJump,
                   double(std::fabs(curves[a]->KeyGetValue(k) - curves[a]->KeyGetValue(k - 1))));
  ASSERT_GE(largestJump, 180.0);
  FbxAnimCurveFilterUnroll filter;
  filter.SetRotationOrder(GetParam().fbx);
  ASSERT_TRUE(filter.Apply(curves, 3));
  for (int k = 0; k < 200; ++k) {
    const Vec3 euler(curves[0]->KeyGetValue(k), curves[1]->KeyGetValue(k),
                     curves[2]->KeyGetValue(k));
    AnvilRotation back;
    back.setAsEuler(GetParam().host, euler);
    EXPECT_LT(distance(back, rotations[size_t(k)]), 1e-5) << k;
    if (k == 0) continue;
    for (int a = 0; a < 3; ++a) {
      EXPECT_LT(std::fabs(curves[a]->KeyGetValue(k) - curves[a]->KeyGetValue(k - 1)), 180.0)
          << "key " << k << " axis " << a;
    }
  }
  EXPECT_FALSE(filter.Apply(curves, 2));
  pScene->Destroy();
  pManager->Destroy();
}

INSTANTIATE_TEST_SUITE_P(Orders, UnrollTest,
                         testing::Values(Case{AnvilRotation::XYZ, eEulerXYZ},
                                         Case{AnvilRotation::ZYX, eEulerZYX},
                                         Case{AnvilRotation::YZX, eEulerYZX}));

} // namespace
