// One page needs no list.
blink(times: 3)
