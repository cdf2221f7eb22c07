// Decoding of a MOX core's status word into its information record.
#include "ZinMOX/ZinMOX_Core.h"
#include "framework/ZinMOX_Framework.h"

namespace ZinRT {

const unsigned int ZinMOX_Core::BEFORE_062_ASYNC_INPUT_COUNT_BIT_OFFSET = 40;
const unsigned int ZinMOX_Core::BEFORE_062_SYNC_INPUT_COUNT_BIT_OFFSET = 48;
const unsigned int ZinMOX_Core::BEFORE_062_ASYNC_OUTPUT_COUNT_BIT_OFFSET = 56;
const unsigned int ZinMOX_Core::BEFORE_062_SYNC_OUTPUT_COUNT_BIT_OFFSET = 64;
const unsigned int ZinMOX_Core::BEFORE_062_PORT_BIT_LEN = 8;
const unsigned int ZinMOX_Core::BEFORE_101_ASYNC_INPUT_COUNT_BIT_OFFSET = 40;
const unsigned int ZinMOX_Core::BEFORE_101_SYNC_INPUT_COUNT_BIT_OFFSET = 56;
const unsigned int ZinMOX_Core::BEFORE_101_ASYNC_OUTPUT_COUNT_BIT_OFFSET = 72;
const unsigned int ZinMOX_Core::BEFORE_101_SYNC_OUTPUT_COUNT_BIT_OFFSET = 88;
const unsigned int ZinMOX_Core::BEFORE_101_PORT_BIT_LEN = 16;
const unsigned int ZinMOX_Core::QX_MAJOR_VERSION_BIT_OFFSET = 40;
const unsigned int ZinMOX_Core::QX_MAJOR_VERSION_BIT_LEN = 4;
const unsigned int ZinMOX_Core::QX_MINOR_VERSION_BIT_OFFSET = 44;
const unsigned int ZinMOX_Core::QX_MINOR_VERSION_BIT_LEN = 8;
const unsigned int ZinMOX_Core::QX_MINOR_VERSION_ALPHA_BIT_OFFSET = 52;
const unsigned int ZinMOX_Core::QX_MINOR_VERSION_ALPHA_BIT_LEN = 8;
const unsigned int ZinMOX_Core::ASYNC_INPUT_COUNT_BIT_OFFSET = 60;
const unsigned int ZinMOX_Core::SYNC_INPUT_COUNT_BIT_OFFSET = 76;
const unsigned int ZinMOX_Core::ASYNC_OUTPUT_COUNT_BIT_OFFSET = 92;
const unsigned int ZinMOX_Core::SYNC_OUTPUT_COUNT_BIT_OFFSET = 108;
const unsigned int ZinMOX_Core::PORT_BIT_LEN = 16;

namespace {

// Version keys from which the two newer layouts apply.
constexpr uint32_t FIRST_KEY_OF_101_LAYOUT = 0x62;
constexpr uint32_t FIRST_KEY_OF_FULL_LAYOUT = 0xA0;

// Where a layout keeps the four port counts.
struct CountFields {
  unsigned int asyncInputOffset, syncInputOffset, asyncOutputOffset, syncOutputOffset, length;
};

// Fields are read in ascending bit order.
void readCounts(Zin_ByteBuffer& status, const CountFields& fields, ZINMOX_CORE_INFO* result) {
  result->async_input_count = status.getBits(fields.asyncInputOffset, fields.length);
  result->sync_input_count = status.getBits(fields.syncInputOffset, fields.length);
  result->async_output_count = status.getBits(fields.asyncOutputOffset, fields.length);
  result->sync_output_count = status.getBits(fields.syncOutputOffset, fields.length);
}

}  // namespace

void ZinMOX_Core::getMoxCoreStatus(uint32_t /*handle*/, ZIN_CORE_REF /*coreRef*/,
                                   const ZIN_CORE_INFO& coreInfo, Zin_ByteBuffer& status,
                                   uint32_t /*statusBitCount*/, ZINMOX_CORE_INFO* result) {
  result->manufacturer_id = coreInfo.manufacturerId;
  result->core_type = coreInfo.coreType;
  result->core_major_version = coreInfo.coreMajorVersion;
  result->core_minor_version = coreInfo.coreMinorVersion;
  result->core_revision = coreInfo.coreRevision;
  result->qx_major_version = 0;
  result->qx_minor_version = 0;
  result->qx_minor_version_alpha = 0;

  // The minor version is ORed in, not added: a minor version of 16 or more overlaps the major.
  const uint32_t key = (coreInfo.coreMajorVersion << 4) | coreInfo.coreMinorVersion;
  if (key < FIRST_KEY_OF_101_LAYOUT) {
    readCounts(status,
               {BEFORE_062_ASYNC_INPUT_COUNT_BIT_OFFSET, BEFORE_062_SYNC_INPUT_COUNT_BIT_OFFSET,
                BEFORE_062_ASYNC_OUTPUT_COUNT_BIT_OFFSET, BEFORE_062_SYNC_OUTPUT_COUNT_BIT_OFFSET,
                BEFORE_062_PORT_BIT_LEN},
               result);
  } else if (key < FIRST_KEY_OF_FULL_LAYOUT) {
    readCounts(status,
               {BEFORE_101_ASYNC_INPUT_COUNT_BIT_OFFSET, BEFORE_101_SYNC_INPUT_COUNT_BIT_OFFSET,
                BEFORE_101_ASYNC_OUTPUT_COUNT_BIT_OFFSET, BEFORE_101_SYNC_OUTPUT_COUNT_BIT_OFFSET,
                BEFORE_101_PORT_BIT_LEN},
               result);
  } else {
    result->qx_major_version =
        status.getBits(QX_MAJOR_VERSION_BIT_OFFSET, QX_MAJOR_VERSION_BIT_LEN);
    result->qx_minor_version =
        status.getBits(QX_MINOR_VERSION_BIT_OFFSET, QX_MINOR_VERSION_BIT_LEN);
    result->qx_minor_version_alpha =
        status.getBits(QX_MINOR_VERSION_ALPHA_BIT_OFFSET, QX_MINOR_VERSION_ALPHA_BIT_LEN);
    readCounts(status,
               {ASYNC_INPUT_COUNT_BIT_OFFSET, SYNC_INPUT_COUNT_BIT_OFFSET,
                ASYNC_OUTPUT_COUNT_BIT_OFFSET, SYNC_OUTPUT_COUNT_BIT_OFFSET, PORT_BIT_LEN},
               result);
  }
}

}  // namespace ZinRT
