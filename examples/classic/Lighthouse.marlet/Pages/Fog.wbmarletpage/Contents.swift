// Not in the list: it comes behind the listed pages.
var fog = 3
while fog > 0 { fog -= 1 }
