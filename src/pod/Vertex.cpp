// Vertex data of every type to and from floats, and boxes of positions.
#include <cstring>
#include <limits>

#include "pod/Types.h"
#include "Qex/geometry.h"
#include "Qex/math.h"
#include "Qex/pod.h"

namespace {

template <class T>
T Load(const void* source, int32_t i) {
    T value;
    memcpy(&value, static_cast<const uint8_t*>(source) + static_cast<size_t>(i) * sizeof(T), sizeof(T));
    return value;
}

template <class T>
void Store(void* destination, int32_t i, T value) {
    memcpy(static_cast<uint8_t*>(destination) + static_cast<size_t>(i) * sizeof(T), &value, sizeof(T));
}

template <class T>
void ReadComponents(float* out, const void* source, int32_t count, float divisor) {
    for (int32_t i = 0; i < count; ++i) out[i] = static_cast<float>(Load<T>(source, i)) / divisor;
}

// Truncates toward zero; what does not fit becomes the nearest value that does, NaN becomes 0. The product is
// rounded to a float first: k / divisor * divisor is k again then, and truncation does not make it k - 1.
template <class T>
void WriteComponents(void* destination, int32_t count, const float* values, float factor) {
    constexpr double low = std::numeric_limits<T>::min(), high = std::numeric_limits<T>::max();
    for (int32_t i = 0; i < count; ++i) {
        const float product = values[i] * factor;
        double value = static_cast<double>(product);
        if (!(value == value)) value = 0;
        value = value < low ? low : value > high ? high : value;
        Store(destination, i, static_cast<T>(static_cast<int64_t>(value)));
    }
}

// Shifts of the four values of a colour word.
const uint8_t* ColourShifts(uint32_t type) {
    static const uint8_t rgba[4] = {24, 16, 8, 0}, argb[4] = {16, 8, 0, 24};
    return type == QEX_POD_RGBA ? rgba : argb;
}

void ReadColour(float* out, const void* source, const uint8_t* shifts, float divisor) {
    const uint32_t word = Load<uint32_t>(source, 0);
    for (int i = 0; i < 4; ++i) out[i] = static_cast<float>(word >> shifts[i] & 0xFF) / divisor;
}

void WriteColour(void* destination, const uint8_t* shifts, const float* values, float factor) {
    uint32_t word = 0;
    for (int i = 0; i < 4; ++i) {
        const float clamped = values[i] > 0 ? values[i] < 1 ? values[i] : 1.0f : 0.0f;
        word |= static_cast<uint32_t>(clamped * factor) << shifts[i];
    }
    Store(destination, 0, word);
}

void ReadFields(float* out, const void* source, float divisor) {
    const uint32_t word = Load<uint32_t>(source, 0);
    for (int i = 0; i < 3; ++i) {
        const int32_t field = static_cast<int32_t>(word << (22 - 10 * i)) >> 22;
        out[i] = static_cast<float>(field) / divisor;
    }
}

void WriteFields(void* destination, const float* values, float factor) {
    uint32_t word = 0;
    for (int i = 0; i < 3; ++i) {
        float value = values[i] * factor;
        value = value > -512.0f ? value < 511.0f ? value : 511.0f : -512.0f;
        word |= (static_cast<uint32_t>(static_cast<int32_t>(value)) & 0x3FFu) << (10 * i);
    }
    Store(destination, 0, word);
}

// Components of an element of which `count` are asked for.
int32_t ComponentCount(const QexPODType& type, int32_t count) {
    return type.components ? type.components : count < 4 ? count : 4;
}

void SetBox(QexBoundingBox* box, const QexVec3& low, const QexVec3& high) {
    for (int i = 0; i < 8; ++i) {
        box->corners[i].x = i & 4 ? high.x : low.x;
        box->corners[i].y = i & 2 ? high.y : low.y;
        box->corners[i].z = i & 1 ? high.z : low.z;
    }
    box->centre = {(low.x + high.x) / 2, (low.y + high.y) / 2, (low.z + high.z) / 2};
    QexVec3_Subtract(&box->halfExtent, &high, &box->centre);
}

}  // namespace

extern "C" {

void QexPODVertex_ReadVec(float* out, const void* source, uint32_t type, int32_t count) {
    const QexPODType& row = QexPODType_Of(type);
    const int32_t n = ComponentCount(row, count);
    out[0] = out[1] = out[2] = 0;
    out[3] = 1;
    switch (row.storage) {
        case kPODFloat: ReadComponents<float>(out, source, n, 1); break;
        case kPODInt32:
        case kPODFixed: ReadComponents<int32_t>(out, source, n, row.divisor); break;
        case kPODUint32: ReadComponents<uint32_t>(out, source, n, row.divisor); break;
        case kPODInt16: ReadComponents<int16_t>(out, source, n, row.divisor); break;
        case kPODUint16: ReadComponents<uint16_t>(out, source, n, row.divisor); break;
        case kPODInt8:
        case kPODUint8: ReadComponents<uint8_t>(out, source, n, row.divisor); break;
        case kPODColour: ReadColour(out, source, ColourShifts(type), row.divisor); break;
        case kPODFields: ReadFields(out, source, row.divisor); break;
        default: break;
    }
}

void QexPODVertex_ReadInt(uint32_t* out, const void* source, uint32_t type) {
    if (type == QEX_POD_UNSIGNED_SHORT) *out = Load<uint16_t>(source, 0);
    if (type == QEX_POD_UNSIGNED_INT) *out = Load<uint32_t>(source, 0);
}

void QexVertexWriteVec(void* destination, uint32_t type, int32_t count, const float* values) {
    const QexPODType& row = QexPODType_Of(type);
    const int32_t n = ComponentCount(row, count);
    switch (row.storage) {
        case kPODFloat:
            for (int32_t i = 0; i < n; ++i) Store(destination, i, values[i]);
            break;
        case kPODInt32:
        case kPODFixed: WriteComponents<int32_t>(destination, n, values, row.divisor); break;
        case kPODUint32: WriteComponents<uint32_t>(destination, n, values, row.divisor); break;
        case kPODInt16: WriteComponents<int16_t>(destination, n, values, row.divisor); break;
        case kPODUint16: WriteComponents<uint16_t>(destination, n, values, row.divisor); break;
        case kPODInt8:
        case kPODUint8: WriteComponents<uint8_t>(destination, n, values, row.divisor); break;
        case kPODColour: WriteColour(destination, ColourShifts(type), values, row.divisor); break;
        case kPODFields: WriteFields(destination, values, row.divisor); break;
        default: break;
    }
}

void QexBoundingBox_ComputeInterleaved(QexBoundingBox* box, const void* data, int32_t count, uint32_t offset,
                                       uint32_t stride) {
    QexVec3 low = {0, 0, 0}, high = {0, 0, 0};
    const uint8_t* bytes = static_cast<const uint8_t*>(data) + offset;
    for (int32_t i = 0; i < count; ++i, bytes += stride) {
        QexVec3 p;
        memcpy(&p, bytes, sizeof p);
        if (i == 0) low = high = p;
        low = {p.x < low.x ? p.x : low.x, p.y < low.y ? p.y : low.y, p.z < low.z ? p.z : low.z};
        high = {p.x > high.x ? p.x : high.x, p.y > high.y ? p.y : high.y, p.z > high.z ? p.z : high.z};
    }
    SetBox(box, low, high);
}

}  // extern "C"
