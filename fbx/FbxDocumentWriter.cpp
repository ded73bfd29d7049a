#include "FbxDocumentWriter.h"
#include "FbxAnimation.h"
#include "FbxNode.h"
#include "FbxScene.h"
#include <bit>
#include <cstring>
#include <string>
#include <unordered_set>

namespace AnvilFbx {

// The ids that belong to the fixed creation time (the same triple other open writers use).
const uint8_t kFbxFileId[16] = {0x28, 0xB3, 0x2A, 0xEB, 0xB6, 0x24, 0xCC, 0xC2,
                                0xBF, 0xC8, 0xB0, 0x2A, 0xA9, 0x2B, 0xFC, 0xF1};
const uint8_t kFbxFooterId[16] = {0xFA, 0xBC, 0xAB, 0x09, 0xD0, 0xC8, 0xD4, 0x66,
                                  0xB1, 0x76, 0xFB, 0x83, 0x1C, 0xF7, 0x26, 0x7E};

namespace {

constexpr int64_t kDocumentId = 1;
constexpr const char* kCreator = "Anvil FBX writer";

// "name\0\1Class": the binary form of an object's name.
std::string objectName(const std::string& i_rName, const char* i_pClass) {
  std::string text = i_rName;
  text.push_back('\0');
  text.push_back('\1');
  text += i_pClass;
  return text;
}

class DocumentWriter {
public:
  DocumentWriter(const FbxScene& i_rScene, VFbxRecordWriter& io_rWriter)
      : m_rScene(i_rScene), m_rWriter(io_rWriter) {
    collectNodes(m_rScene.GetRootNode());
    m_nodeSet.insert(m_nodes.begin(), m_nodes.end());
  }

  void write() {
    m_rWriter.writeHeader();
    headerExtension();
    m_rWriter.begin("FileId");
    m_rWriter.propR(std::span<const uint8_t>(kFbxFileId, 16));
    m_rWriter.end();
    leafS("CreationTime", kFbxCreationTime);
    leafS("Creator", kCreator);
    globalSettings();
    documents();
    m_rWriter.begin("References");
    m_rWriter.end(true);
    definitions();
    objects();
    connections();
    takes();
    m_rWriter.finish(kFbxFooterId);
  }

private:
  // --- small record helpers -------------------------------------------------------------
  void leafI(const char* i_pName, int32_t i_value) {
    m_rWriter.begin(i_pName);
    m_rWriter.propI(i_value);
    m_rWriter.end();
  }
  void leafS(const char* i_pName, std::string_view i_text) {
    m_rWriter.begin(i_pName);
    m_rWriter.propS(i_text);
    m_rWriter.end();
  }
  void leafD(const char* i_pName, std::initializer_list<double> i_values) {
    m_rWriter.begin(i_pName);
    for (double v : i_values)
      m_rWriter.propD(v);
    m_rWriter.end();
  }
  void beginP(const char* i_pName, const char* i_pType, const char* i_pLabel,
              const char* i_pFlags) {
    m_rWriter.begin("P");
    m_rWriter.propS(i_pName);
    m_rWriter.propS(i_pType);
    m_rWriter.propS(i_pLabel);
    m_rWriter.propS(i_pFlags);
  }
  void pInt(const char* i_pName, int32_t i_value) {
    beginP(i_pName, "int", "Integer", "");
    m_rWriter.propI(i_value);
    m_rWriter.end();
  }
  void pEnum(const char* i_pName, int32_t i_value) {
    beginP(i_pName, "enum", "", "");
    m_rWriter.propI(i_value);
    m_rWriter.end();
  }
  void pBool(const char* i_pName, bool i_value) {
    beginP(i_pName, "bool", "", "");
    m_rWriter.propI(i_value ? 1 : 0);
    m_rWriter.end();
  }
  void pDouble(const char* i_pName, double i_value) {
    beginP(i_pName, "double", "Number", "");
    m_rWriter.propD(i_value);
    m_rWriter.end();
  }
  void pNumber(const char* i_pName, double i_value, const char* i_pType = "Number") {
    beginP(i_pName, i_pType, "", "A");
    m_rWriter.propD(i_value);
    m_rWriter.end();
  }
  void pTime(const char* i_pName, FbxTime i_time) {
    beginP(i_pName, "KTime", "Time", "");
    m_rWriter.propL(i_time.Get());
    m_rWriter.end();
  }
  void pString(const char* i_pName, std::string_view i_text, const char* i_pLabel = "") {
    beginP(i_pName, "KString", i_pLabel, "");
    m_rWriter.propS(i_text);
    m_rWriter.end();
  }
  void pVector3D(const char* i_pName, double x, double y, double z) {
    beginP(i_pName, "Vector3D", "Vector", "");
    m_rWriter.propD(x);
    m_rWriter.propD(y);
    m_rWriter.propD(z);
    m_rWriter.end();
  }
  void pCompound(const char* i_pName) {
    beginP(i_pName, "Compound", "", "");
    m_rWriter.end();
  }

  // --- the document's sections ------------------------------------------------------------
  void headerExtension() {
    const uint32_t version = m_rWriter.version();
    m_rWriter.begin("FBXHeaderExtension");
    leafI("FBXHeaderVersion", version >= 7700 ? 1004 : 1003);
    leafI("FBXVersion", int32_t(version));
    leafI("EncryptionType", 0);
    m_rWriter.begin("CreationTimeStamp");
    leafI("Version", 1000);
    leafI("Year", 1970);
    leafI("Month", 1);
    leafI("Day", 1);
    leafI("Hour", 10);
    leafI("Minute", 0);
    leafI("Second", 0);
    leafI("Millisecond", 0);
    m_rWriter.end(true);
    leafS("Creator", kCreator);
    if (version >= 7700) {
      // 127: key times count 46,186,158,000 ticks to the second.
      m_rWriter.begin("OtherFlags");
      leafI("TCDefinition", 127);
      m_rWriter.end(true);
    }
    sceneInfo();
    m_rWriter.end(true);
  }

  void sceneInfo() {
    const FbxDocumentInfo* pInfo = m_rScene.GetSceneInfo();
    auto field = [&](std::string FbxDocumentInfo::*i_pField) -> std::string {
      return pInfo ? pInfo->*i_pField : std::string();
    };
    m_rWriter.begin("SceneInfo");
    m_rWriter.propS(objectName("GlobalInfo", "SceneInfo"));
    m_rWriter.propS("UserData");
    leafS("Type", "UserData");
    leafI("Version", 100);
    m_rWriter.begin("MetaData");
    leafI("Version", 100);
    leafS("Title", field(&FbxDocumentInfo::mTitle));
    leafS("Subject", field(&FbxDocumentInfo::mSubject));
    leafS("Author", field(&FbxDocumentInfo::mAuthor));
    leafS("Keywords", field(&FbxDocumentInfo::mKeywords));
    leafS("Revision", field(&FbxDocumentInfo::mRevision));
    leafS("Comment", field(&FbxDocumentInfo::mComment));
    m_rWriter.end(true);
    m_rWriter.begin("Properties70");
    pString("DocumentUrl", m_rScene.name(), "Url");
    pString("SrcDocumentUrl", m_rScene.name(), "Url");
    pCompound("Original");
    pString("Original|ApplicationVendor", "Anvil");
    pString("Original|ApplicationName", "Anvil");
    pString("Original|ApplicationVersion", "1.0");
    beginP("Original|DateTime_GMT", "DateTime", "", "");
    m_rWriter.propS("01/01/1970 10:00:00.000");
    m_rWriter.end();
    pString("Original|FileName", m_rScene.name());
    pCompound("LastSaved");
    pString("LastSaved|ApplicationVendor", "Anvil");
    pString("LastSaved|ApplicationName", "Anvil");
    pString("LastSaved|ApplicationVersion", "1.0");
    beginP("LastSaved|DateTime_GMT", "DateTime", "", "");
    m_rWriter.propS("01/01/1970 10:00:00.000");
    m_rWriter.end();
    m_rWriter.end(true);
    m_rWriter.end(true);
  }

  // The file's mode and rate. Modes past 14 are unknown to some readers (they take the file's
  // times as seconds), so those rates travel as custom rates.
  void timeMode(int32_t& o_rMode, double& o_rRate) const {
    const FbxGlobalSettings& settings = m_rScene.GetGlobalSettings();
    const FbxTime::EMode mode = settings.GetTimeMode();
    if (mode == FbxTime::eCustom) {
      o_rMode = FbxTime::eCustom;
      o_rRate = settings.GetCustomFrameRate();
      return;
    }
    o_rRate = FbxTime::GetFrameRate(mode);
    o_rMode = mode >= FbxTime::eFrames96 ? int32_t(FbxTime::eCustom) : int32_t(mode);
    if (o_rRate == 0.0) { // the default mode: no rate of its own
      o_rMode = FbxTime::eFrames30;
      o_rRate = 30.0;
    }
  }

  void globalSettings() {
    const FbxGlobalSettings& settings = m_rScene.GetGlobalSettings();
    const FbxAxisSystem& axes = settings.GetAxisSystem();
    int32_t mode = 0;
    double rate = 0.0;
    timeMode(mode, rate);
    FbxTimeSpan span;
    if (!m_rScene.stacks().empty()) span = m_rScene.stacks().front()->GetLocalTimeSpan();

    m_rWriter.begin("GlobalSettings");
    leafI("Version", 1000);
    m_rWriter.begin("Properties70");
    pInt("UpAxis", axes.m_upAxis);
    pInt("UpAxisSign", axes.m_upSign);
    pInt("FrontAxis", axes.m_frontAxis);
    pInt("FrontAxisSign", axes.m_frontSign);
    pInt("CoordAxis", axes.m_coordAxis);
    pInt("CoordAxisSign", axes.m_coordSign);
    pInt("OriginalUpAxis", axes.m_upAxis);
    pInt("OriginalUpAxisSign", axes.m_upSign);
    pDouble("UnitScaleFactor", settings.GetUnitScaleFactor());
    pDouble("OriginalUnitScaleFactor", settings.GetUnitScaleFactor());
    beginP("AmbientColor", "ColorRGB", "Color", "");
    for (int i = 0; i < 3; ++i)
      m_rWriter.propD(0.0);
    m_rWriter.end();
    pString("DefaultCamera", "Producer Perspective");
    pEnum("TimeMode", mode);
    pEnum("TimeProtocol", 2);
    pEnum("SnapOnFrameMode", 0);
    pTime("TimeSpanStart", span.GetStart());
    pTime("TimeSpanStop", span.GetStop());
    pDouble("CustomFrameRate", rate);
    pCompound("TimeMarker");
    pInt("CurrentTimeMarker", -1);
    m_rWriter.end(true);
    m_rWriter.end(true);
  }

  void documents() {
    m_rWriter.begin("Documents");
    leafI("Count", 1);
    m_rWriter.begin("Document");
    m_rWriter.propL(kDocumentId);
    m_rWriter.propS("Scene");
    m_rWriter.propS("Scene");
    m_rWriter.begin("Properties70");
    beginP("SourceObject", "object", "", "");
    m_rWriter.end();
    pString("ActiveAnimStackName",
            m_rScene.stacks().empty() ? std::string() : m_rScene.stacks().front()->name());
    m_rWriter.end(true);
    m_rWriter.begin("RootNode");
    m_rWriter.propL(0);
    m_rWriter.end();
    m_rWriter.end(true);
    m_rWriter.end(true);
  }

  void definitions() {
    size_t attributes = 0, textures = 0, layers = 0, curveNodes = 0, curves = 0;
    for (const FbxNode* pNode : m_nodes) {
      if (pNode->GetNodeAttribute()) ++attributes;
      if (cameraOf(pNode) && cameraOf(pNode)->GetBackgroundTexture()) ++textures;
    }
    for (const FbxAnimStack* pStack : m_rScene.stacks())
      for (const FbxAnimLayer* pLayer : pStack->layers()) {
        ++layers;
        for (const FbxAnimCurveNode* pCurveNode : pLayer->curveNodes()) {
          if (!inTree(pCurveNode)) continue;
          ++curveNodes;
          for (int c = 0; c < 3; ++c)
            if (written(pCurveNode->curve(c))) ++curves;
        }
      }
    const std::pair<const char*, size_t> types[] = {
        {"GlobalSettings", 1},
        {"Model", m_nodes.size()},
        {"NodeAttribute", attributes},
        {"Texture", textures},
        {"AnimationStack", m_rScene.stacks().size()},
        {"AnimationLayer", layers},
        {"AnimationCurveNode", curveNodes},
        {"AnimationCurve", curves},
    };
    size_t total = 0;
    for (const auto& [pType, count] : types)
      total += count;
    m_rWriter.begin("Definitions");
    leafI("Version", 100);
    leafI("Count", int32_t(total));
    for (const auto& [pType, count] : types) {
      if (count == 0) continue;
      m_rWriter.begin("ObjectType");
      m_rWriter.propS(pType);
      leafI("Count", int32_t(count));
      m_rWriter.end(true);
    }
    m_rWriter.end(true);
  }

  // A curve node whose node never joined the tree has nothing to animate.
  bool inTree(const FbxAnimCurveNode* i_pCurveNode) const {
    return m_nodeSet.count(i_pCurveNode->targetNode()) != 0;
  }

  static const FbxCamera* cameraOf(const FbxNode* i_pNode) {
    const FbxNodeAttribute* pAttribute = i_pNode->GetNodeAttribute();
    return pAttribute && pAttribute->GetAttributeType() == FbxNodeAttribute::eCamera
               ? static_cast<const FbxCamera*>(pAttribute)
               : nullptr;
  }
  // Curves without keys are left out: readers reject or skip them.
  static bool written(const FbxAnimCurve* i_pCurve) {
    return i_pCurve && i_pCurve->KeyGetCount() > 0;
  }

  static const char* subtypeOf(const FbxNodeAttribute* i_pAttribute) {
    if (!i_pAttribute) return "Null";
    switch (i_pAttribute->GetAttributeType()) {
    case FbxNodeAttribute::eSkeleton: {
      static const char* const kTypes[] = {"Root", "Limb", "LimbNode", "Effector"};
      return kTypes[static_cast<const FbxSkeleton*>(i_pAttribute)->GetSkeletonType()];
    }
    case FbxNodeAttribute::eMarker:
      return "Marker";
    case FbxNodeAttribute::eCamera:
      return "Camera";
    default:
      return "Null";
    }
  }

  void objects() {
    m_rWriter.begin("Objects");
    for (const FbxNode* pNode : m_nodes)
      if (const FbxNodeAttribute* pAttribute = pNode->GetNodeAttribute())
        nodeAttribute(*pAttribute);
    for (const FbxNode* pNode : m_nodes)
      model(*pNode);
    for (const FbxNode* pNode : m_nodes)
      if (const FbxCamera* pCamera = cameraOf(pNode))
        if (const FbxFileTexture* pTexture = pCamera->GetBackgroundTexture()) texture(*pTexture);
    for (const FbxAnimStack* pStack : m_rScene.stacks())
      stack(*pStack);
    for (const FbxAnimStack* pStack : m_rScene.stacks())
      for (const FbxAnimLayer* pLayer : pStack->layers()) {
        m_rWriter.begin("AnimationLayer");
        m_rWriter.propL(pLayer->GetUniqueID());
        m_rWriter.propS(objectName(pLayer->name(), "AnimLayer"));
        m_rWriter.propS("");
        m_rWriter.end(true);
        for (const FbxAnimCurveNode* pCurveNode : pLayer->curveNodes())
          if (inTree(pCurveNode)) curveNode(*pCurveNode);
      }
    m_rWriter.end(true);
  }

  void nodeAttribute(const FbxNodeAttribute& i_rAttribute) {
    m_rWriter.begin("NodeAttribute");
    m_rWriter.propL(i_rAttribute.GetUniqueID());
    m_rWriter.propS(objectName(i_rAttribute.name(), "NodeAttribute"));
    m_rWriter.propS(subtypeOf(&i_rAttribute));
    switch (i_rAttribute.GetAttributeType()) {
    case FbxNodeAttribute::eSkeleton:
      m_rWriter.begin("Properties70");
      pDouble("Size", 100.0);
      m_rWriter.end(true);
      leafS("TypeFlags", "Skeleton");
      break;
    case FbxNodeAttribute::eMarker:
      m_rWriter.begin("Properties70");
      pEnum("Look", 1); // hard cross
      pDouble("Size", 100.0);
      m_rWriter.end(true);
      leafS("TypeFlags", "Marker");
      break;
    case FbxNodeAttribute::eCamera:
      camera(static_cast<const FbxCamera&>(i_rAttribute));
      break;
    default:
      leafS("TypeFlags", "Null");
      break;
    }
    m_rWriter.end(true);
  }

  void camera(const FbxCamera& i_rCamera) {
    m_rWriter.begin("Properties70");
    pEnum("FilmFormatIndex", i_rCamera.GetApertureFormat());
    pDouble("FilmWidth", i_rCamera.FilmWidth);
    pDouble("FilmHeight", i_rCamera.FilmHeight);
    pDouble("FilmAspectRatio",
            i_rCamera.FilmHeight > 0.0 ? i_rCamera.FilmWidth / i_rCamera.FilmHeight : 1.0);
    pEnum("ApertureMode", i_rCamera.GetApertureMode());
    pEnum("GateFit", 2); // horizontal: the film width decides the view
    pNumber("FocalLength", i_rCamera.FocalLength);
    pNumber("FieldOfView", i_rCamera.horizontalFieldOfView(), "FieldOfView");
    pNumber("FieldOfViewX", i_rCamera.horizontalFieldOfView(), "FieldOfViewX");
    pNumber("FieldOfViewY", i_rCamera.verticalFieldOfView(), "FieldOfViewY");
    pEnum("AspectRatioMode", i_rCamera.GetAspectRatioMode());
    pDouble("AspectWidth", i_rCamera.GetAspectWidth());
    pDouble("AspectHeight", i_rCamera.GetAspectHeight());
    pDouble("PixelAspectRatio", i_rCamera.PixelAspectRatio);
    pEnum("ViewFrustumBackPlaneMode", i_rCamera.ViewFrustumBackPlaneMode ? 1 : 2);
    pNumber("BackPlaneDistance", i_rCamera.BackPlaneDistance);
    pNumber("BackPlaneOffsetX", i_rCamera.BackPlaneOffsetX);
    pNumber("BackPlaneOffsetY", i_rCamera.BackPlaneOffsetY);
    pDouble("BackgroundAlphaTreshold", i_rCamera.BackgroundAlphaTreshold);
    pBool("ShowBackplate", i_rCamera.ShowBackplate);
    if (i_rCamera.GetBackgroundTexture()) {
      beginP("Background Texture", "object", "", "");
      m_rWriter.end();
    }
    m_rWriter.end(true);
    leafS("TypeFlags", "Camera");
    leafI("GeometryVersion", 124);
    leafD("Position", {0.0, 0.0, 0.0});
    leafD("Up", {0.0, 1.0, 0.0});
    leafD("LookAt", {1.0, 0.0, 0.0});
    leafI("ShowInfoOnMoving", 1);
    leafI("ShowAudio", 0);
    leafD("AudioColor", {0.0, 1.0, 0.0});
    leafD("CameraOrthoZoom", {1.0});
  }

  void transformP(const FbxAnimatableDouble3& i_rProperty, bool i_animated) {
    beginP(i_rProperty.GetName(), i_rProperty.GetName(), "", i_animated ? "A+" : "A");
    for (double v : i_rProperty.Get())
      m_rWriter.propD(v);
    m_rWriter.end();
  }

  bool animated(const FbxAnimatableDouble3& i_rProperty) const {
    for (const FbxAnimStack* pStack : m_rScene.stacks())
      for (const FbxAnimLayer* pLayer : pStack->layers())
        if (i_rProperty.GetCurveNode(pLayer)) return true;
    return false;
  }

  void model(const FbxNode& i_rNode) {
    m_rWriter.begin("Model");
    m_rWriter.propL(i_rNode.GetUniqueID());
    m_rWriter.propS(objectName(i_rNode.name(), "Model"));
    m_rWriter.propS(subtypeOf(i_rNode.GetNodeAttribute()));
    leafI("Version", 232);
    m_rWriter.begin("Properties70");
    pEnum("RotationOrder", i_rNode.GetRotationOrder());
    pBool("RotationActive", i_rNode.GetRotationActive());
    pEnum("InheritType", i_rNode.GetTransformationInheritType());
    pEnum("QuaternionInterpolate", i_rNode.GetQuaternionInterpolation());
    const FbxVector4& pre = i_rNode.GetPreRotation();
    const FbxVector4& post = i_rNode.GetPostRotation();
    const FbxVector4& pivot = i_rNode.GetRotationPivot();
    pVector3D("PreRotation", pre[0], pre[1], pre[2]);
    pVector3D("PostRotation", post[0], post[1], post[2]);
    pVector3D("RotationPivot", pivot[0], pivot[1], pivot[2]);
    FbxNode& node = const_cast<FbxNode&>(i_rNode);
    pBool("TranslationActive", node.GetTranslationLimits().GetActive());
    pBool("ScalingActive", node.GetScalingLimits().GetActive());
    transformP(i_rNode.LclTranslation, animated(i_rNode.LclTranslation));
    transformP(i_rNode.LclRotation, animated(i_rNode.LclRotation));
    transformP(i_rNode.LclScaling, animated(i_rNode.LclScaling));
    beginP("Visibility", "Visibility", "", "A");
    m_rWriter.propD(i_rNode.GetVisibility() ? 1.0 : 0.0);
    m_rWriter.end();
    beginP("Visibility Inheritance", "Visibility Inheritance", "", "");
    m_rWriter.propI(1);
    m_rWriter.end();
    if (i_rNode.GetNodeAttribute()) pInt("DefaultAttributeIndex", 0);
    m_rWriter.end(true);
    m_rWriter.begin("Shading");
    m_rWriter.propC('Y');
    m_rWriter.end();
    leafS("Culling", "CullingOff");
    m_rWriter.end(true);
  }

  void texture(const FbxFileTexture& i_rTexture) {
    m_rWriter.begin("Texture");
    m_rWriter.propL(i_rTexture.GetUniqueID());
    m_rWriter.propS(objectName(i_rTexture.name(), "Texture"));
    m_rWriter.propS("");
    leafS("Type", "TextureVideoClip");
    leafI("Version", 202);
    leafS("TextureName", objectName(i_rTexture.name(), "Texture"));
    m_rWriter.begin("Properties70");
    pEnum("TextureTypeUse", i_rTexture.GetTextureUse());
    pEnum("CurrentMappingType", i_rTexture.GetMappingType());
    pBool("UseMaterial", i_rTexture.GetMaterialUse() == FbxFileTexture::eDefaultMaterial);
    m_rWriter.end(true);
    leafS("FileName", i_rTexture.GetFileName());
    leafS("RelativeFilename", i_rTexture.GetFileName());
    leafD("ModelUVTranslation", {0.0, 0.0});
    leafD("ModelUVScaling", {1.0, 1.0});
    leafS("Texture_Alpha_Source", "None");
    m_rWriter.begin("Cropping");
    for (int i = 0; i < 4; ++i)
      m_rWriter.propI(0);
    m_rWriter.end();
    m_rWriter.end(true);
  }

  void stack(const FbxAnimStack& i_rStack) {
    m_rWriter.begin("AnimationStack");
    m_rWriter.propL(i_rStack.GetUniqueID());
    m_rWriter.propS(objectName(i_rStack.name(), "AnimStack"));
    m_rWriter.propS("");
    m_rWriter.begin("Properties70");
    pString("Description", i_rStack.GetDescription());
    pTime("LocalStart", i_rStack.GetLocalTimeSpan().GetStart());
    pTime("LocalStop", i_rStack.GetLocalTimeSpan().GetStop());
    pTime("ReferenceStart", i_rStack.GetReferenceTimeSpan().GetStart());
    pTime("ReferenceStop", i_rStack.GetReferenceTimeSpan().GetStop());
    m_rWriter.end(true);
    m_rWriter.end(true);
  }

  void curveNode(const FbxAnimCurveNode& i_rCurveNode) {
    static const char* const kChannels[] = {"d|X", "d|Y", "d|Z"};
    m_rWriter.begin("AnimationCurveNode");
    m_rWriter.propL(i_rCurveNode.GetUniqueID());
    m_rWriter.propS(objectName(i_rCurveNode.name(), "AnimCurveNode"));
    m_rWriter.propS("");
    m_rWriter.begin("Properties70");
    for (int c = 0; c < 3; ++c)
      pNumber(kChannels[c], i_rCurveNode.defaults()[size_t(c)]);
    m_rWriter.end(true);
    m_rWriter.end(true);
    for (int c = 0; c < 3; ++c)
      if (written(i_rCurveNode.curve(c))) curve(*i_rCurveNode.curve(c));
  }

  void curve(const FbxAnimCurve& i_rCurve) {
    m_rWriter.begin("AnimationCurve");
    m_rWriter.propL(i_rCurve.GetUniqueID());
    m_rWriter.propS(objectName(i_rCurve.name(), "AnimCurve"));
    m_rWriter.propS("");
    leafD("Default", {double(i_rCurve.values().front())});
    leafI("KeyVer", 4009);
    m_rWriter.begin("KeyTime");
    m_rWriter.propArrayView(std::span<const int64_t>(i_rCurve.times()));
    m_rWriter.end();
    m_rWriter.begin("KeyValueFloat");
    m_rWriter.propArrayView(std::span<const float>(i_rCurve.values()));
    m_rWriter.end();
    // Attributes run-length encoded: one entry per run of keys with equal flags.
    std::vector<int32_t>& flags = m_flags;
    std::vector<int32_t>& counts = m_counts;
    flags.clear();
    counts.clear();
    for (const FbxAnimCurve::FlagRun& run : i_rCurve.flagRuns()) {
      flags.push_back(int32_t(run.flags));
      counts.push_back(int32_t(run.count));
    }
    // Slopes 0, weights 1/3 each (packed as 0x0D05 twice), no velocity.
    const float weights = std::bit_cast<float>(uint32_t(0x0D050D05));
    std::vector<float>& data = m_attributeData;
    data.clear();
    for (size_t i = 0; i < flags.size(); ++i)
      data.insert(data.end(), {0.0f, 0.0f, weights, 0.0f});
    m_rWriter.begin("KeyAttrFlags");
    m_rWriter.propArray(std::span<const int32_t>(flags));
    m_rWriter.end();
    m_rWriter.begin("KeyAttrDataFloat");
    m_rWriter.propArray(std::span<const float>(data));
    m_rWriter.end();
    m_rWriter.begin("KeyAttrRefCount");
    m_rWriter.propArray(std::span<const int32_t>(counts));
    m_rWriter.end();
    m_rWriter.end(true);
  }

  void connection(int64_t i_child, int64_t i_parent, const char* i_pProperty = nullptr) {
    m_rWriter.begin("C");
    m_rWriter.propS(i_pProperty ? "OP" : "OO");
    m_rWriter.propL(i_child);
    m_rWriter.propL(i_parent);
    if (i_pProperty) m_rWriter.propS(i_pProperty);
    m_rWriter.end();
  }

  void connections() {
    static const char* const kChannels[] = {"d|X", "d|Y", "d|Z"};
    m_rWriter.begin("Connections");
    const FbxNode* pRoot = m_rScene.GetRootNode();
    for (const FbxNode* pNode : m_nodes) {
      const FbxNode* pParent = pNode->GetParent();
      connection(pNode->GetUniqueID(), pParent == pRoot ? 0 : pParent->GetUniqueID());
      if (const FbxNodeAttribute* pAttribute = pNode->GetNodeAttribute())
        connection(pAttribute->GetUniqueID(), pNode->GetUniqueID());
      if (const FbxCamera* pCamera = cameraOf(pNode))
        if (const FbxFileTexture* pTexture = pCamera->GetBackgroundTexture())
          connection(pTexture->GetUniqueID(), pCamera->GetUniqueID(), "Background Texture");
    }
    for (const FbxAnimStack* pStack : m_rScene.stacks())
      for (const FbxAnimLayer* pLayer : pStack->layers()) {
        connection(pLayer->GetUniqueID(), pStack->GetUniqueID());
        for (const FbxAnimCurveNode* pCurveNode : pLayer->curveNodes()) {
          if (!inTree(pCurveNode)) continue;
          connection(pCurveNode->GetUniqueID(), pLayer->GetUniqueID());
          connection(pCurveNode->GetUniqueID(), pCurveNode->targetNode()->GetUniqueID(),
                     pCurveNode->targetProperty());
          for (int c = 0; c < 3; ++c)
            if (written(pCurveNode->curve(c)))
              connection(pCurveNode->curve(c)->GetUniqueID(), pCurveNode->GetUniqueID(),
                         kChannels[c]);
        }
      }
    m_rWriter.end(true);
  }

  void takes() {
    m_rWriter.begin("Takes");
    leafS("Current", m_rScene.stacks().empty() ? std::string() : m_rScene.stacks().front()->name());
    for (const FbxAnimStack* pStack : m_rScene.stacks()) {
      m_rWriter.begin("Take");
      m_rWriter.propS(pStack->name());
      leafS("FileName", pStack->name() + ".tak");
      m_rWriter.begin("LocalTime");
      m_rWriter.propL(pStack->GetLocalTimeSpan().GetStart().Get());
      m_rWriter.propL(pStack->GetLocalTimeSpan().GetStop().Get());
      m_rWriter.end();
      m_rWriter.begin("ReferenceTime");
      m_rWriter.propL(pStack->GetReferenceTimeSpan().GetStart().Get());
      m_rWriter.propL(pStack->GetReferenceTimeSpan().GetStop().Get());
      m_rWriter.end();
      m_rWriter.end(true);
    }
    m_rWriter.end(true);
  }

  // Every node below the root, parents before children.
  void collectNodes(const FbxNode* i_pNode) {
    for (int i = 0; i < i_pNode->GetChildCount(); ++i) {
      m_nodes.push_back(i_pNode->GetChild(i));
      collectNodes(i_pNode->GetChild(i));
    }
  }

  const FbxScene& m_rScene;
  VFbxRecordWriter& m_rWriter;
  std::vector<const FbxNode*> m_nodes;
  std::unordered_set<const FbxNode*> m_nodeSet;
  // A curve's attribute arrays, kept between curves to save allocations.
  std::vector<int32_t> m_flags, m_counts;
  std::vector<float> m_attributeData;
};

} // namespace

void WriteFbxDocument(const FbxScene& i_rScene, VFbxRecordWriter& io_rWriter) {
  DocumentWriter(i_rScene, io_rWriter).write();
}

} // namespace AnvilFbx
