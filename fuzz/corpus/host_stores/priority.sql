UPDATE provider_array SET priority=9223372036854775807, is_active=1;
