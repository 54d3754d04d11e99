// Array records: reference counts, destruction, creation, shared copies.
