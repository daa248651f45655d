PRAGMA ignore_check_constraints=1; UPDATE volume SET size_mb=-1, committed_mb=-1, unshared_mb=-9223372036854775807;
