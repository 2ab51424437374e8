// A stored value as any registry could hand it back: any row (also outside
// the table), any type, any length, any bytes. The data sits in a buffer of
// exactly its length, so a read past it is reported. An accepted number lies
// in its row's range and came from a REG_DWORD of 4 bytes.
#include <cstdlib>
#include <cstring>
#include <vector>
#include "settings/value_codec.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* input, size_t size) {
    if (size < 2) return 0;
    const int32_t index = input[0] % (StoredValueCount + 2) - 1;
    const uint32_t type = input[1] % 12;
    const std::vector<uint8_t> data(input + 2, input + size);
    const uint32_t length = static_cast<uint32_t>(data.size());
    int32_t number = 0;
    const StoredValue row = StoredValueAt(index);
    if (AcceptStoredData(index, true, type, data.data(), length, &number) &&
        (type != StoredValueType || length != StoredValueBytes || number < row.Low || number > row.High))
        std::abort();
    // Four characters say at most -999 .. 9999.
    if (DecodeStoredNumber(data.data(), length, &number) && (number < -999 || number > 9999)) std::abort();
    char text[5];
    StoredText(data.data(), length, text);
    if (std::strlen(text) > 4 || std::memchr(text, 0, 5) == nullptr) std::abort();
    return 0;
}
