#include "operations/PulledRecords.h"

#include <gtest/gtest.h>

namespace cimom::wbem {

TEST(PulledRecords, ComeInTheirOrderAndWhole) {
    const auto spool = std::make_shared<Spool>(1'000'000);
    for (int count = 0; count < 5; ++count) {
        std::string record;
        // The one in the middle is longer than what memory holds of a spool.
        appendRecord(record, "path " + std::to_string(count),
                     std::string(count == 2 ? 100'000 : static_cast<std::size_t>(count), 'x'));
        spool->append(record);
    }
    RecordReader reader(spool, 0, spool->size());
    EXPECT_EQ(reader.next(), (PulledRecord{"path 0", ""}));
    EXPECT_EQ(reader.next(), (PulledRecord{"path 1", "x"}));
    const std::size_t third = reader.position();
    reader.skip(2);
    EXPECT_EQ(reader.next(), (PulledRecord{"path 4", "xxxx"}));
    EXPECT_EQ(reader.next(), std::nullopt);
    RecordReader again(spool, third, spool->size());
    EXPECT_EQ(again.next(), (PulledRecord{"path 2", std::string(100'000, 'x')}));
    // Nor does a reader go beyond its own end.
    RecordReader one(spool, 0, third);
    one.skip(2);
    EXPECT_EQ(one.next(), std::nullopt);
}

}  // namespace cimom::wbem
