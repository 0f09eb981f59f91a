// Version 5 shows only what the list names, so nobody meets this page.
