// Lets one memory allocation fail, and counts what a call leaves allocated. Takes the place of malloc, calloc, realloc
// and free in the test program, for the library too; under the address sanitizer it runs before the sanitizer's own.
//
//     test::EachAllocation faults;
//     while (faults.Next()) {
//         ... prepare ...
//         faults.Arm();
//         result = TheCall();
//         faults.Disarm();
//         if (faults.Fired())
//             ... the failure: code, nothing changed, faults.LeftAllocated() ...
//         else
//             ... success ...
//     }
//     EXPECT_EQ(faults.Count(), 1);    how many allocations the call makes
#ifndef TESTS_SUPPORT_FAILING_MALLOC_H
#define TESTS_SUPPORT_FAILING_MALLOC_H

namespace test {

// The first allocation fails in the first round, the second in the second, ... until a round needs fewer. Each round
// prepares again, so that every failure starts from the same state. One object at a time; only the thread that arms it
// is affected.
class EachAllocation {
  public:
    EachAllocation() = default;
    ~EachAllocation() { Disarm(); }
    EachAllocation(const EachAllocation &) = delete;
    EachAllocation &operator=(const EachAllocation &) = delete;

    bool Next();  // false when the last round has seen no failure
    void Arm();
    void Disarm();

    bool Fired() const { return fired_; }
    int LeftAllocated() const { return left_allocated_; }  // blocks allocated while armed less blocks freed
    int Count() const { return round_ - 1; }

  private:
    int round_ = 0;
    bool fired_ = true;
    int left_allocated_ = 0;
};

// The same by hand, for a call in a process of its own. Counting begins with StartCounting; after FailAllocation the
// Nth allocation fails, until StopFailing.
void StartCounting();
void FailAllocation(int n);
void StopFailing();
bool AllocationFailed();
bool FailedInside(const char *object);  // whether a library of that name was on the stack of the failed allocation
int StopCounting();                     // blocks allocated since StartCounting less blocks freed

// For what the test itself allocates inside the call: neither fails nor counts. Whether it was paused before.
bool PauseFailing(bool paused) noexcept;

}  // namespace test

#endif
