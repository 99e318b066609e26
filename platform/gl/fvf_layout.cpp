#include "platform/gl/fvf_layout.h"

namespace {

constexpr DWORD kPositionMask = 0x400E;
constexpr DWORD kTexCountMask = 0xF00;
constexpr int kTexCountShift = 8;
constexpr UINT kMaxTexcoordSets = 8;
constexpr DWORD kKnownBits =
    D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_PSIZE | D3DFVF_DIFFUSE | D3DFVF_SPECULAR | kTexCountMask;

constexpr UINT kFloatBytes = 4;
constexpr UINT kColourBytes = 4;
constexpr UINT kTexcoordSetBytes = 2 * kFloatBytes;

// Appends a part of `bytes` bytes when `present`; answers its offset or -1.
int Place(bool present, UINT bytes, UINT* size) {
  if (!present) return -1;
  const int offset = static_cast<int>(*size);
  *size += bytes;
  return offset;
}

}  // namespace

bool DescribeFvf(DWORD fvf, FvfLayout* layout) {
  // Texture coordinate sizes live in the high 16 bits; all zero means two floats per set.
  if ((fvf & kPositionMask) != D3DFVF_XYZ || (fvf & ~kKnownBits) != 0) return false;
  const UINT sets = (fvf & kTexCountMask) >> kTexCountShift;
  if (sets > kMaxTexcoordSets) return false;
  FvfLayout out;
  out.size = 3 * kFloatBytes;
  out.normal = Place((fvf & D3DFVF_NORMAL) != 0, 3 * kFloatBytes, &out.size);
  out.point_size = Place((fvf & D3DFVF_PSIZE) != 0, kFloatBytes, &out.size);
  out.diffuse = Place((fvf & D3DFVF_DIFFUSE) != 0, kColourBytes, &out.size);
  out.specular = Place((fvf & D3DFVF_SPECULAR) != 0, kColourBytes, &out.size);
  out.texcoords = Place(sets > 0, sets * kTexcoordSetBytes, &out.size);
  out.texcoord_sets = sets;
  *layout = out;
  return true;
}
