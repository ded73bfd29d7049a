// Streams over page chains: bytes across pages, shared buffers by reference, shared reads.

#include "StoreFixture.h"

#include "Flow2/Flow2Store/VFlowBuffers.h"
#include "Flow2/Flow2Store/VFlowStreams.h"

#include <gtest/gtest.h>

#include <cstring>
#include <numeric>

namespace {

using namespace FlowTest;
using Flow2Store::VFlowInputStream;
using Flow2Store::VFlowOutputStream;

class FlowStreams : public StoreFixture {};

TEST_F(FlowStreams, BytesCrossPagesAndSharedBuffersPassByReference) {
  std::vector<std::uint8_t> big(10000);
  std::iota(big.begin(), big.end(), std::uint8_t(0));
  auto pShared = std::make_shared<Flow2Store::IStandardBuffer>(300);
  std::fill_n(pShared->GetMutableData(), 300, std::uint8_t(0xAB));

  VFlowOutputStream out(*m_Buffers);
  const std::uint32_t head = 7;
  ASSERT_TRUE(out.Write(&head, 4));
  ASSERT_TRUE(out.Write(big.data(), big.size()));
  ASSERT_TRUE(out.Write(std::shared_ptr<const ZMT::IBufferConst>(pShared)));
  void* pScratch = nullptr;
  ASSERT_EQ(out.GetScratch(pScratch, 6), 6u);
  std::memcpy(pScratch, "tail!", 6);
  EXPECT_EQ(out.GetTotal(), 4 + 10000 + 300 + 6u);
  EXPECT_EQ(out.GetSharedCount(), 1u);
  ZMT::IFlowBuffer* pChain = out.Detach();
  ASSERT_NE(pChain, nullptr);
  EXPECT_EQ(pChain->GetChainSize(), 4 + 10000 + 300 + 6u);
  EXPECT_TRUE(pChain->HasSharedBuffer());

  VFlowInputStream in(pChain);
  std::uint32_t gotHead = 0;
  std::vector<std::uint8_t> gotBig(big.size());
  ASSERT_TRUE(in.Read(&gotHead, 4));
  ASSERT_TRUE(in.Read(gotBig.data(), gotBig.size()));
  EXPECT_EQ(gotHead, 7u);
  EXPECT_EQ(gotBig, big);
  // The whole shared page comes back as the buffer itself, a part of it as an alias.
  std::shared_ptr<const ZMT::IBufferConst> pPart;
  ASSERT_TRUE(in.ReadShared(100, pPart));
  EXPECT_NE(pPart.get(), pShared.get());
  EXPECT_EQ(pPart->GetData(), pShared->GetData());
  ASSERT_TRUE(in.ReadShared(200, pPart));
  EXPECT_EQ(pPart->GetData(), pShared->GetData() + 100);
  EXPECT_EQ(pPart->GetSize(), 200u);
  std::string tail;
  ASSERT_TRUE(in.ReadTerminated(tail));
  EXPECT_EQ(tail, "tail!");
  EXPECT_TRUE(in.AtEnd());
  std::uint8_t more = 0;
  EXPECT_FALSE(in.Read(&more, 1)); // past the last page
  EXPECT_TRUE(in.IsFailed());
  EXPECT_TRUE(in.IsEnded());
  pChain->ReleaseChain();

  VFlowOutputStream whole(*m_Buffers);
  ASSERT_TRUE(whole.Write(std::shared_ptr<const ZMT::IBufferConst>(pShared)));
  ZMT::IFlowBuffer* pOne = whole.Detach();
  VFlowInputStream again(pOne);
  std::shared_ptr<const ZMT::IBufferConst> pAll;
  ASSERT_TRUE(again.ReadShared(300, pAll));
  EXPECT_EQ(pAll.get(), pShared.get());
  // A plain page can't be shared: the caller copies.
  pOne->ReleaseChain();
  VFlowOutputStream plain(*m_Buffers);
  plain.Write(&head, 4);
  ZMT::IFlowBuffer* pPlain = plain.Detach();
  VFlowInputStream copy(pPlain);
  EXPECT_FALSE(copy.ReadShared(4, pAll));
  EXPECT_TRUE(copy.Read(&gotHead, 4));
  pPlain->ReleaseChain();
}

} // namespace
