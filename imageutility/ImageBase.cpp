// Buffers, views and copies, for all pixel kinds alike.
#include "imageutility/ImageUtility.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <new>
#include <utility>

#include "platform/Status.h"
#include "platform/WrapMath.h"

namespace KYVImageUtility {

CImageBase::CImageBase() : CImageBase(nullptr, 0, 0, 0, 0) {}

CImageBase::CImageBase(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch,
                       int32_t bytesPerPixel)
    : m_pBuffer(pixels), m_nWidth(width), m_nHeight(height), m_nPitch(pitch),
      m_nBytesPerPixel(bytesPerPixel), m_bOwnsBuffer(0),
      m_nDecodeOption(0), m_cpuLevel{1, kyv::InstructionSet::Scalar} {}

CImageBase::CImageBase(int32_t width, int32_t height, int32_t pitch, int32_t bytesPerPixel,
                       uint32_t* result)
    : CImageBase(nullptr, width, height, pitch, bytesPerPixel) {
    Allocate(result);
}

CImageBase::CImageBase(const CImageBase& other, uint32_t* result)
    : CImageBase(other.m_pBuffer, other.m_nWidth, other.m_nHeight, other.m_nPitch,
                 other.m_nBytesPerPixel) {
    if (!other.m_bOwnsBuffer) {
        if (result) {
            *result = kyv::kOk;
        }
        return;
    }
    Allocate(result);
    if (m_pBuffer && other.m_pBuffer) {
        std::memcpy(m_pBuffer, other.m_pBuffer, static_cast<size_t>(m_nPitch) * m_nHeight);
    }
}

CImageBase::~CImageBase() {
    Release();
}

// The constructors' allocation: failure leaves a null buffer.
void CImageBase::Allocate(uint32_t* result) {
    const int64_t bytes = int64_t{m_nPitch} * m_nHeight;
    m_bOwnsBuffer = 1;
    m_pBuffer = nullptr;
    if (m_nPitch >= 0 && m_nHeight >= 0 && bytes <= std::numeric_limits<int32_t>::max()) {
        m_pBuffer = new (std::nothrow) uint8_t[static_cast<size_t>(bytes)];
    }
    if (result) {
        *result = m_pBuffer ? kyv::kOk : kyv::kOutOfMemory;
    }
}

void CImageBase::Release() {
    if (m_bOwnsBuffer) {
        delete[] m_pBuffer;
    }
    m_pBuffer = nullptr;
}

int32_t CImageBase::GetPixelCount() const {
    return kyv::WrapMul(m_nWidth, m_nHeight);
}

uint8_t* CImageBase::GetPixelAddress(uint32_t x, uint32_t y) const {
    const int32_t offset = kyv::WrapAdd(kyv::WrapMul(static_cast<int32_t>(y), m_nPitch),
                                        kyv::WrapMul(static_cast<int32_t>(x), m_nBytesPerPixel));
    return m_pBuffer ? m_pBuffer + offset : nullptr;
}

bool CImageBase::IsSameSize(const CImageBase& other) const {
    return m_nWidth == other.m_nWidth && m_nHeight == other.m_nHeight;
}

void CImageBase::FillBytes(uint8_t value) {
    if (m_pBuffer && m_nPitch > 0 && m_nHeight > 0) {
        std::memset(m_pBuffer, value, static_cast<size_t>(m_nPitch) * m_nHeight);
    }
}

int32_t CImageBase::SetCpuLevel(int32_t level) {
    m_cpuLevel = kyv::ResolveLevel(level);
    return 0;
}

int32_t CImageBase::PackedPitch(int32_t width, int32_t bytesPerPixel) {
    const int64_t pitch = int64_t{width} * bytesPerPixel;
    return width >= 0 && pitch <= std::numeric_limits<int32_t>::max() ? static_cast<int32_t>(pitch)
                                                                      : -1;
}

void CImageBase::CreateBuffer(int32_t width, int32_t height, int32_t bytesPerPixel) {
    Release();
    const int32_t pitch = PackedPitch(width, bytesPerPixel);
    if (pitch < 0 || height < 0) {
        m_nWidth = m_nHeight = m_nPitch = 0;
        throw std::bad_alloc();
    }
    m_nBytesPerPixel = bytesPerPixel;
    m_nWidth = width;
    m_nHeight = height;
    m_nPitch = pitch;
    m_bOwnsBuffer = 1;
    m_pBuffer = new uint8_t[static_cast<size_t>(pitch) * height];
}

void CImageBase::AttachBuffer(uint8_t* pixels, int32_t width, int32_t height, int32_t pitch,
                              int32_t bytesPerPixel) {
    Release();
    m_pBuffer = pixels;
    m_nWidth = width;
    m_nHeight = height;
    m_nPitch = pitch;
    m_nBytesPerPixel = bytesPerPixel;
    m_bOwnsBuffer = 0;
}

void CImageBase::CopyRowsFrom(const CImageBase& source) {
    if (!m_pBuffer || !source.m_pBuffer || !IsSameSize(source) || m_nWidth <= 0) {
        return;
    }
    const size_t rowBytes = static_cast<size_t>(m_nWidth) * m_nBytesPerPixel;
    for (int32_t y = 0; y < m_nHeight; ++y) {
        std::memmove(Row(y), source.Row(y), rowBytes);
    }
}

void CImageBase::SwapBuffers(CImageBase& other) {
    std::swap(m_pBuffer, other.m_pBuffer);
    std::swap(m_nWidth, other.m_nWidth);
    std::swap(m_nHeight, other.m_nHeight);
    std::swap(m_nPitch, other.m_nPitch);
    std::swap(m_nBytesPerPixel, other.m_nBytesPerPixel);
    std::swap(m_bOwnsBuffer, other.m_bOwnsBuffer);
}

int32_t CImageBase::MakeView(CImageBase& view, int32_t x, int32_t y, int32_t w, int32_t h) const {
    if (!m_pBuffer) {
        return 0;
    }
    const int64_t right = int64_t{x} + w;
    const int64_t bottom = int64_t{y} + h;
    int32_t left = 0;
    int32_t top = 0;
    int32_t width = m_nWidth;
    int32_t height = m_nHeight;
    const bool meets = x < m_nWidth && y < m_nHeight && right > 0 && bottom > 0;
    if (meets) {
        left = std::max(x, 0);
        top = std::max(y, 0);
        // A negative w or h makes an empty view, never one of negative size.
        width =
            static_cast<int32_t>(std::max<int64_t>(std::min<int64_t>(m_nWidth, right) - left, 0));
        height =
            static_cast<int32_t>(std::max<int64_t>(std::min<int64_t>(m_nHeight, bottom) - top, 0));
    }
    view.m_pBuffer = Row(top) + static_cast<ptrdiff_t>(left) * m_nBytesPerPixel;
    view.m_nWidth = width;
    view.m_nHeight = height;
    view.m_nPitch = m_nPitch;
    view.m_nBytesPerPixel = m_nBytesPerPixel;
    view.m_bOwnsBuffer = 0;
    return meets ? 1 : 0;
}

} // namespace KYVImageUtility
