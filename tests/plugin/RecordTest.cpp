// Bounded reads of binary record fields.
#include "frame/Record.h"

#include <gtest/gtest.h>

namespace {

using TarselCli::System::RecordText;
using TarselCli::System::RecordUnsigned;

TEST(RecordText, StopsAtTheFirstNulOrTheEndOfTheRecord) {
    const char record[8] = {'a', 'b', '\0', 'c', 'd', 'e', 'f', 'g'};
    EXPECT_EQ(RecordText(record, sizeof record, 0), "ab");
    EXPECT_EQ(RecordText(record, sizeof record, 2), "");
    // No NUL before the end: the text ends with the record, nothing beyond it is read.
    EXPECT_EQ(RecordText(record, sizeof record, 3), "cdefg");
    EXPECT_EQ(RecordText(record, sizeof record, 8), "");
    EXPECT_EQ(RecordText(record, sizeof record, 100), "");
}

TEST(RecordUnsigned, ReadsLittleEndianWithinBounds) {
    const char record[6] = {'\x01', '\x02', '\x03', '\x04', '\xff', '\xff'};
    EXPECT_EQ(RecordUnsigned(record, sizeof record, 0, 4), 0x04030201u);
    EXPECT_EQ(RecordUnsigned(record, sizeof record, 4, 2), 0xffffu);
    EXPECT_EQ(RecordUnsigned(record, sizeof record, 0, 1), 1u);
    // A field that would cross the end reads as 0 rather than past the buffer.
    EXPECT_EQ(RecordUnsigned(record, sizeof record, 4, 4), 0u);
    EXPECT_EQ(RecordUnsigned(record, sizeof record, 7, 1), 0u);
    EXPECT_EQ(RecordUnsigned(record, sizeof record, 0, 9), 0u);
}

}  // namespace
