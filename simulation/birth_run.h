// What the births of one frame carry from one birth to the next. Births only ever take records,
// so within a frame's births the lowest free record only moves up, and once none is free the
// oldest record stays the oldest (a birth leaves NormalizedAge alone): each need not be searched
// for again from the start of the pool.
#pragma once

namespace sim {

struct BirthRunState {
  bool Running = false;  // inside the frame driver's births
  int FreeFrom = 0;      // every record below it is active
  int Oldest = -1;       // the oldest record, once no record is free; -1 until asked
};

}  // namespace sim
